#include "XML2Json.h"

#include <QJsonDocument>
#include <QString>
#include <QVariant>

#include <gtest/gtest.h>

#include <ostream>

// Failure messages show the tree as JSON.
void PrintTo(const QVariant &value, std::ostream *out)
{
    if (!value.isValid()) {
        *out << "<invalid>";
        return;
    }
    *out << QJsonDocument::fromVariant(QVariantList{value})
                .toJson(QJsonDocument::Compact)
                .toStdString();
}

namespace {

QVariant parse(const QString &xml)
{
    return XML2Json().parse(xml);
}

QVariantMap map(std::initializer_list<std::pair<QString, QVariant>> entries)
{
    return QVariantMap(entries);
}

QVariant one(const QString &key, const QVariant &value)
{
    return map({{key, value}});
}

// --- Shapes -----------------------------------------------------------------

struct ShapeRow
{
    const char *name;
    QString xml;
    QVariant expected;
};

std::ostream &operator<<(std::ostream &out, const ShapeRow &row)
{
    return out << row.name;
}

class Shape : public testing::TestWithParam<ShapeRow>
{};

TEST_P(Shape, GivesTheTree)
{
    const QVariant tree = parse(GetParam().xml);
    EXPECT_EQ(tree, GetParam().expected);
}

QString manyDistinctTags()
{
    QString xml = QStringLiteral("<a>");
    for (int i = 0; i < 20; ++i)
        xml += QStringLiteral("<c%1>%1</c%1>").arg(i);
    xml += QStringLiteral("<c3>again</c3></a>");
    return xml;
}

QVariant manyDistinctTagsTree()
{
    QVariantMap children;
    for (int i = 0; i < 20; ++i)
        children.insert(QStringLiteral("c%1").arg(i), QString::number(i));
    children.insert(QStringLiteral("c3"),
                    QVariantList{QStringLiteral("3"), QStringLiteral("again")});
    return one(QStringLiteral("a"), children);
}

const ShapeRow shapeRows[] = {
    {"root with text is a one-key map of a string", "<a>x</a>", one("a", "x")},
    {"lone child is the value itself", "<a><b>x</b></a>", one("a", one("b", "x"))},
    {"repeated child is a list in document order", "<a><b>1</b><b>2</b><b>3</b></a>",
     one("a", one("b", QVariantList{"1", "2", "3"}))},
    {"repeats interleaved with other tags keep their order", "<a><b>1</b><c>x</c><b>2</b></a>",
     one("a", map({{"b", QVariantList{"1", "2"}}, {"c", "x"}}))},
    {"repeats at every level are lists, lone ones values",
     "<r><t><e>1</e><e>2</e></t><t><e>3</e></t></r>",
     one("r", one("t", QVariantList{one("e", QVariantList{"1", "2"}), one("e", "3")}))},
    {"many distinct tags still group repeats", manyDistinctTags(), manyDistinctTagsTree()},
    {"attributes become @ keys", "<Ele B=\"0\" E=\"86400\"/>",
     one("Ele", map({{"@B", "0"}, {"@E", "86400"}}))},
    {"attributes sit beside child elements", "<a id=\"7\"><b>x</b></a>",
     one("a", map({{"@id", "7"}, {"b", "x"}}))},
    {"attributes and text put the text under #text", "<a id=\"7\">x</a>",
     one("a", map({{"@id", "7"}, {"#text", "x"}}))},
    {"white space beside attributes is layout", "<a id=\"7\">\n  </a>", one("a", one("@id", "7"))},
    {"self-closed element is an empty string", "<a><b/></a>", one("a", one("b", ""))},
    {"open-and-closed empty element is an empty string", "<a><b></b></a>", one("a", one("b", ""))},
    {"white space between elements is layout", "<a>\n  <b>1</b>\n  <b>2</b>\n</a>\n",
     one("a", one("b", QVariantList{"1", "2"}))},
    {"white space inside a text element is kept", "<a><b> x  y </b><c> </c></a>",
     one("a", map({{"b", " x  y "}, {"c", " "}}))},
    {"CDATA is text, markup inside it literal", "<a><![CDATA[<b>&amp;</b>]]></a>",
     one("a", "<b>&amp;</b>")},
    {"CDATA joins the text around it", "<a>x<![CDATA[y]]>z</a>", one("a", "xyz")},
    {"predefined entities are expanded", "<a>&lt;&gt;&amp;&apos;&quot;</a>", one("a", "<>&'\"")},
    {"character references are expanded", "<a>&#65;&#x42;&#x20AC;</a>",
     one("a", QStringLiteral("AB\u20AC"))},
    {"entities in attribute values are expanded", "<a v=\"&lt;&#65;\"/>",
     one("a", one("@v", "<A"))},
    {"mixed content keeps its text under #text", "<a>Hello <b>x</b> world</a>",
     one("a", map({{"b", "x"}, {"#text", "Hello  world"}}))},
    {"comments and processing instructions are skipped", "<a><!-- c --><?pi x?><b>1</b></a>",
     one("a", one("b", "1"))},
    {"XML declaration and surrounding space are accepted",
     "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<a>x</a>\n", one("a", "x")},
    {"prefixes stay in the keys, xmlns is an attribute",
     "<n:a xmlns:n=\"urn:x\"><n:b>1</n:b></n:a>",
     one("n:a", map({{"@xmlns:n", "urn:x"}, {"n:b", "1"}}))},
    {"non-ASCII text survives", QStringLiteral("<a>\u00e9\u6771</a>"),
     one("a", QStringLiteral("\u00e9\u6771"))},
};

INSTANTIATE_TEST_SUITE_P(XML2Json, Shape, testing::ValuesIn(shapeRows));

TEST(XML2JsonShape, EmptyElementIsAnEmptyStringNotANullOne)
{
    const QVariant value = parse("<a/>").toMap().value("a");
    EXPECT_EQ(value.typeId(), QMetaType::QString);
    EXPECT_FALSE(value.toString().isNull());
}

// --- Time card answers --------------------------------------------------------

QString camXml(int n)
{
    return QStringLiteral("<Cam><Name>C_%1</Name><GrpID>%1</GrpID></Cam>").arg(n);
}

QVariant camTree(int n)
{
    return map({{"Name", QStringLiteral("C_%1").arg(n)}, {"GrpID", QString::number(n)}});
}

QString eleXml(int days)
{
    QString dayList;
    for (int d = 1; d <= days; ++d)
        dayList += QStringLiteral("<Ele B=\"%1.0\"/>").arg(d);
    return QStringLiteral(
               "<Ele><Frame><Name>Customize time frame</Name><DLMod>SingleDay</DLMod>"
               "<RepeatMod>Weekly</RepeatMod><DayList>%1</DayList>"
               "<Intervals><Ele B=\"28800\" E=\"64800\"/></Intervals></Frame>"
               "<RecMode>Event</RecMode><Motion>1</Motion><DigiInput>0</DigiInput></Ele>")
        .arg(dayList);
}

QVariant eleTree(int days)
{
    QVariantList dayList;
    for (int d = 1; d <= days; ++d)
        dayList.append(one("@B", QStringLiteral("%1.0").arg(d)));
    const QVariant dayValue = days == 1 ? dayList.front() : QVariant(dayList);
    const QVariantMap frame =
        map({{"Name", "Customize time frame"},
             {"DLMod", "SingleDay"},
             {"RepeatMod", "Weekly"},
             {"DayList", one("Ele", dayValue)},
             {"Intervals", one("Ele", map({{"@B", "28800"}, {"@E", "64800"}}))}});
    return map({{"Frame", frame}, {"RecMode", "Event"}, {"Motion", "1"}, {"DigiInput", "0"}});
}

QVariant lonelyOrList(const QVariantList &values)
{
    return values.size() == 1 ? values.front() : QVariant(values);
}

// A time card with eles Mapping elements (each with days day entries) and
// cams cameras; no CamList element when cams is 0.
QString tmcardXml(int id, int eles, int days, int cams)
{
    QString mapping;
    for (int i = 0; i < eles; ++i)
        mapping += eleXml(days);
    QString camList;
    for (int i = 0; i < cams; ++i)
        camList += camXml(id * 10 + i);
    return QStringLiteral("<Tmcard><Revision>3</Revision><TmcardID>%1</TmcardID>"
                          "<Name>Card %1</Name><Mapping>%2</Mapping>%3</Tmcard>")
        .arg(QString::number(id), mapping,
             cams ? QStringLiteral("<CamList>%1</CamList>").arg(camList) : QString());
}

QVariant tmcardTree(int id, int eles, int days, int cams)
{
    QVariantList mapping;
    for (int i = 0; i < eles; ++i)
        mapping.append(eleTree(days));
    QVariantList camList;
    for (int i = 0; i < cams; ++i)
        camList.append(camTree(id * 10 + i));
    QVariantMap tmcard = map({{"Revision", "3"},
                              {"TmcardID", QString::number(id)},
                              {"Name", QStringLiteral("Card %1").arg(id)},
                              {"Mapping", one("Ele", lonelyOrList(mapping))}});
    if (cams)
        tmcard.insert("CamList", one("Cam", lonelyOrList(camList)));
    return tmcard;
}

struct TimecardShape
{
    int eles;
    int days;
    int cams;
};

struct AnswerRow
{
    const char *name;
    QList<TimecardShape> cards;
};

std::ostream &operator<<(std::ostream &out, const AnswerRow &row)
{
    return out << row.name;
}

class TimecardAnswer : public testing::TestWithParam<AnswerRow>
{};

TEST_P(TimecardAnswer, ReadsAsTheReadersExpect)
{
    QString xml = QStringLiteral("<GetRecTmcardRes>");
    QVariantList cards;
    int id = 1;
    for (const TimecardShape &card : GetParam().cards) {
        xml += tmcardXml(id, card.eles, card.days, card.cams);
        cards.append(tmcardTree(id, card.eles, card.days, card.cams));
        ++id;
    }
    xml += QStringLiteral("</GetRecTmcardRes>");

    EXPECT_EQ(parse(xml), one("GetRecTmcardRes", one("Tmcard", lonelyOrList(cards))));
}

const AnswerRow answerRows[] = {
    {"one Tmcard, one Ele, one day, one Cam: maps all the way down", {{1, 1, 1}}},
    {"one Tmcard with several Ele, days and Cam: lists inside a map", {{3, 5, 4}}},
    {"several Tmcard: a list of maps", {{1, 7, 0}, {2, 1, 1}, {1, 2, 3}}},
    {"Tmcard without cameras has no CamList key", {{1, 7, 0}}},
};

INSTANTIATE_TEST_SUITE_P(XML2Json, TimecardAnswer, testing::ValuesIn(answerRows));

TEST(XML2JsonAnswer, PrettyPrintedAnswerReadsLikeTheCompactOne)
{
    const QString compact = "<InsRecTmcardRes><TmcardID>12</TmcardID></InsRecTmcardRes>";
    const QString pretty =
        "<?xml version=\"1.0\"?>\r\n<InsRecTmcardRes>\r\n\t<TmcardID>12</TmcardID>"
        "\r\n</InsRecTmcardRes>\r\n";
    EXPECT_EQ(parse(pretty), parse(compact));
    EXPECT_EQ(parse(compact), one("InsRecTmcardRes", one("TmcardID", "12")));
}

// --- Refused input --------------------------------------------------------------

struct RefusedRow
{
    const char *name;
    QString xml;
};

std::ostream &operator<<(std::ostream &out, const RefusedRow &row)
{
    return out << row.name;
}

class Refused : public testing::TestWithParam<RefusedRow>
{};

TEST_P(Refused, GivesAnInvalidVariant)
{
    EXPECT_FALSE(parse(GetParam().xml).isValid());
}

QString billionLaughs()
{
    QString xml = QStringLiteral("<?xml version=\"1.0\"?><!DOCTYPE lolz [<!ENTITY lol \"lol\">");
    for (int i = 1; i < 10; ++i) {
        QString refs;
        for (int j = 0; j < 10; ++j)
            refs += QStringLiteral("&lol%1;").arg(i == 1 ? QString() : QString::number(i - 1));
        xml += QStringLiteral("<!ENTITY lol%1 \"%2\">").arg(i).arg(refs);
    }
    return xml + QStringLiteral("]><lolz>&lol9;</lolz>");
}

const QString validAnswer =
    "<GetRecTmcardRes><Tmcard><TmcardID>1</TmcardID></Tmcard></GetRecTmcardRes>";

const RefusedRow refusedRows[] = {
    {"empty input", ""},
    {"white space only", " \n\t "},
    {"text without an element", "hello"},
    {"unclosed root", "<a><b>1</b>"},
    {"truncated answer", validAnswer.left(validAnswer.size() - 3)},
    {"mismatched end tag", "<a><b>1</c></a>"},
    {"two root elements", "<a/><b/>"},
    {"text after the root", "<a/>tail"},
    {"undeclared entity", "<a>&nbsp;</a>"},
    {"character reference to NUL", "<a>&#0;</a>"},
    {"duplicate attribute", "<a x=\"1\" x=\"2\"/>"},
    {"unquoted attribute", "<a x=1/>"},
    {"valid answer followed by a broken one", validAnswer + "<a"},
    {"any DTD, even a harmless one", "<!DOCTYPE a><a>x</a>"},
    {"internal entity declared in a DTD", "<!DOCTYPE a [<!ENTITY e \"x\">]><a>&e;</a>"},
    {"external entity", "<!DOCTYPE a [<!ENTITY e SYSTEM \"file:///etc/passwd\">]><a>&e;</a>"},
    {"external DTD", "<!DOCTYPE a SYSTEM \"http://127.0.0.1/a.dtd\"><a>x</a>"},
    {"billion laughs", billionLaughs()},
};

INSTANTIATE_TEST_SUITE_P(XML2Json, Refused, testing::ValuesIn(refusedRows));

// --- Size and depth -----------------------------------------------------------

QString nested(int depth)
{
    QString xml;
    xml.reserve(depth * 7);
    for (int i = 0; i < depth; ++i)
        xml += QStringLiteral("<a>");
    xml += QStringLiteral("x");
    for (int i = 0; i < depth; ++i)
        xml += QStringLiteral("</a>");
    return xml;
}

int depthOf(QVariant tree)
{
    int depth = 0;
    while (tree.typeId() == QMetaType::QVariantMap) {
        tree = tree.toMap().value("a");
        ++depth;
    }
    return depth;
}

TEST(XML2JsonDepth, ThousandLevelsAreRead)
{
    const QVariant tree = parse(nested(1000));
    ASSERT_TRUE(tree.isValid());
    EXPECT_EQ(depthOf(tree), 1000);
}

TEST(XML2JsonDepth, DeeperDocumentsAreRefused)
{
    EXPECT_FALSE(parse(nested(1001)).isValid());
    EXPECT_FALSE(parse(nested(100000)).isValid());
}

TEST(XML2JsonDepth, UnclosedDeepNestingIsRefused)
{
    EXPECT_FALSE(parse(QStringLiteral("<a>").repeated(100000)).isValid());
}

TEST(XML2JsonSize, HundredThousandSiblingsFormOneListInOrder)
{
    constexpr int Count = 100000;
    QString xml = QStringLiteral("<CamList>");
    for (int i = 0; i < Count; ++i)
        xml += QStringLiteral("<Cam>%1</Cam>").arg(i);
    xml += QStringLiteral("</CamList>");

    const QVariantList cams = parse(xml).toMap().value("CamList").toMap().value("Cam").toList();
    ASSERT_EQ(cams.size(), Count);
    EXPECT_EQ(cams.front(), QVariant("0"));
    EXPECT_EQ(cams.at(Count / 2), QVariant(QString::number(Count / 2)));
    EXPECT_EQ(cams.back(), QVariant(QString::number(Count - 1)));
}

} // namespace
