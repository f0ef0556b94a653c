// The schedule data object as the host streams it. Each row acts on an object
// of type 5 holding "before", then writes it out: the bytes the host carries.

#include "RecordingScheduleDataObject.h"

#include <QDataStream>

#include <gtest/gtest.h>

#include <functional>

using namespace Qt::StringLiterals;
using PluginRecordingScheduleSettingCommon::RecordingScheduleType;
using Object = RecordingScheduleDataObject;

namespace {

struct Foreign final : IRawDataObject
{
    void ReadDataFromDataStream(QDataStream &) override {}
    void WriteDataToDataStream(QDataStream &) const override {}
};

Object made(int type, const QString &content)
{
    Object object;
    object.setRecScheduleType(static_cast<RecordingScheduleType>(type));
    object.setCustomizeContent(content);
    return object;
}

void read(Object &object, const char *hex)
{
    QDataStream stream(QByteArray::fromHex(hex));
    object.ReadDataFromDataStream(stream);
}

void assign(IRawDataObject &to, const IRawDataObject &from)
{
    to = from;
}

struct Row
{
    const char *name;
    std::function<void(Object &)> act;
    QByteArray written; // in hex
    friend void PrintTo(const Row &row, std::ostream *os) { *os << row.name; }
};

class DataObject : public ::testing::TestWithParam<Row>
{};

TEST_P(DataObject, IsWrittenAs)
{
    Object object = made(5, u"before"_s);
    GetParam().act(object);
    QByteArray bytes;
    QDataStream stream(&bytes, QIODeviceBase::WriteOnly);
    object.WriteDataToDataStream(stream);
    EXPECT_EQ(bytes.toHex(), GetParam().written);
}

const QByteArray Before = "000000050000000c006200650066006f00720065";

const Row Rows[] = {
    {"a_new_object_is_type_0_without_content", [](Object &o) { o = Object(); }, "00000000ffffffff"},
    {"the_int_then_the_string", [](Object &o) { o = made(2, u"ab"_s); },
     "000000020000000400610062"},
    {"what_was_written_reads_back", [](Object &o) { read(o, "000000020000000400610062"); },
     "000000020000000400610062"},
    {"a_type_no_enumerator_names_is_kept", [](Object &o) { read(o, "7fffffffffffffff"); },
     "7fffffffffffffff"},
    {"a_stream_ending_inside_the_int_leaves_type_0", [](Object &o) { read(o, "0000"); },
     "0000000000000000"},
    {"assignment_through_the_interface_copies_both_fields",
     [](Object &o) { assign(o, made(1, u"a"_s)); }, "00000001000000020061"},
    {"assignment_of_itself_changes_nothing", [](Object &o) { assign(o, o); }, Before},
    // The failed cast inside the assignment is caught: nothing escapes.
    {"assignment_of_another_kind_of_data_object_changes_nothing",
     [](Object &o) { assign(o, Foreign()); }, Before},
};

INSTANTIATE_TEST_SUITE_P(Frame, DataObject, ::testing::ValuesIn(Rows),
                         [](const auto &info) { return std::string(info.param.name); });

} // namespace
