// The converter's tree for answer texts, written as JSON; none when refused.

#include "XML2Json.h"

#include <QJsonDocument>

#include <gtest/gtest.h>

namespace {

struct Row
{
    const char *name;
    QString xml;
    QByteArray json;
    friend void PrintTo(const Row &row, std::ostream *out) { *out << row.name; }
};

const auto repeated = [](const char *text, int times) { return QString(text).repeated(times); };

const Row rows[] = {
    {"root_with_text_is_a_one_key_map_of_a_string", "<a>x</a>", R"({"a":"x"})"},
    {"repeated_tags_are_a_list_in_document_order_other_tags_between",
     "<a><b>1</b><c>x</c><b>2</b></a>", R"({"a":{"b":["1","2"],"c":"x"}})"},
    {"repeats_among_more_than_eight_distinct_tags_are_still_grouped",
     "<a><b1/><b2/><b3/><b4/><b5/><b6/><b7/><b8/><b9/><b1>x</b1></a>",
     R"({"a":{"b1":["","x"],"b2":"","b3":"","b4":"","b5":"","b6":"","b7":"","b8":"","b9":""}})"},
    {"attributes_are_at_keys_beside_the_children", "<Ele B=\"0\" E=\"86400\"><x>1</x></Ele>",
     R"({"Ele":{"@B":"0","@E":"86400","x":"1"}})"},
    {"text_beside_attributes_is_under_hash_text", "<a id=\"7\">x</a>",
     R"({"a":{"@id":"7","#text":"x"}})"},
    {"mixed_content_joins_its_text_under_hash_text", "<a>Hello <b>x</b> world</a>",
     R"({"a":{"b":"x","#text":"Hello  world"}})"},
    {"white_space_between_elements_is_layout", "<a>\r\n <b>1</b>\n\t<b>2</b>\n</a>\n",
     R"({"a":{"b":["1","2"]}})"},
    {"empty_elements_are_empty_strings", "<a><b/><c></c></a>", R"({"a":{"b":"","c":""}})"},
    {"entities_character_references_and_CDATA_are_text",
     "<a v=\"&lt;&#65;\">&amp;&#x42;<![CDATA[<b>]]></a>", R"({"a":{"@v":"<A","#text":"&B<b>"}})"},
    {"time_card_answer_lists_where_tags_repeat_values_where_lone",
     "<GetRecTmcardRes><Tmcard><TmcardID>1</TmcardID><Mapping><Ele><DayList><Ele B=\"1.0\"/>"
     "</DayList></Ele></Mapping><CamList><Cam><Name>C_1</Name></Cam></CamList></Tmcard><Tmcard>"
     "<TmcardID>2</TmcardID><Mapping><Ele/><Ele/></Mapping></Tmcard></GetRecTmcardRes>",
     R"({"GetRecTmcardRes":{"Tmcard":[{"TmcardID":"1","Mapping":{"Ele":{"DayList":{"Ele":)"
     R"({"@B":"1.0"}}}},"CamList":{"Cam":{"Name":"C_1"}}},{"TmcardID":"2","Mapping":)"
     R"({"Ele":["",""]}}]}})"},
    {"a_thousand_levels_are_read", repeated("<a>", 1000) + 'x' + repeated("</a>", 1000),
     repeated(R"({"a":)", 1000).toLatin1() + R"("x")" + QByteArray(1000, '}')},
    {"empty_input_is_refused", "", ""},
    {"unclosed_root_is_refused", "<a><b>1</b>", ""},
    {"any_DTD_is_refused_even_a_harmless_one", "<!DOCTYPE a><a>x</a>", ""},
    {"entities_declared_in_a_DTD_are_refused_before_they_expand",
     "<!DOCTYPE l [<!ENTITY a \"aaaaaaaa\"><!ENTITY b \"&a;&a;&a;&a;\">]><l>&b;&b;</l>", ""},
    {"a_thousand_and_one_levels_are_refused", repeated("<a>", 1001) + 'x' + repeated("</a>", 1001),
     ""},
    {"a_hundred_thousand_unclosed_levels_are_refused", repeated("<a>", 100000), ""},
};

class Converter : public testing::TestWithParam<Row>
{};

TEST_P(Converter, GivesTheTree)
{
    const QVariant tree = XML2Json().parse(GetParam().xml);
    const QByteArray json =
        tree.isValid() ? QJsonDocument::fromVariant(tree).toJson(QJsonDocument::Compact) : "";
    EXPECT_EQ(QJsonDocument::fromJson(json), QJsonDocument::fromJson(GetParam().json))
        << json.left(400).toStdString();
}

INSTANTIATE_TEST_SUITE_P(Texts, Converter, testing::ValuesIn(rows),
                         [](const auto &info) { return info.param.name; });

} // namespace
