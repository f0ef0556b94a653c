// The schedule data object as the host streams it: every row ends with the
// object written out, so each row shows the bytes the host would carry.

#include "RecordingScheduleDataObject.h"

#include <QDataStream>

#include <gtest/gtest.h>

#include <functional>

using namespace Qt::StringLiterals;
using PluginRecordingScheduleSettingCommon::RecordingScheduleType;

namespace {

class ForeignObject final : public IRawDataObject
{
public:
    void ReadDataFromDataStream(QDataStream &) override {}
    void WriteDataToDataStream(QDataStream &) const override {}
};

RecordingScheduleDataObject made(int type, const QString &content)
{
    RecordingScheduleDataObject object;
    object.setRecScheduleType(static_cast<RecordingScheduleType>(type));
    object.setCustomizeContent(content);
    return object;
}

void readFrom(RecordingScheduleDataObject &object, const char *hex)
{
    QDataStream stream(QByteArray::fromHex(hex));
    object.ReadDataFromDataStream(stream);
}

struct Row
{
    const char *name;
    std::function<void(RecordingScheduleDataObject &)> act; // on a type 5 "before" object
    QByteArray written;                                     // hex
};

void PrintTo(const Row &row, std::ostream *os)
{
    *os << row.name;
}

class DataObject : public ::testing::TestWithParam<Row>
{};

TEST_P(DataObject, StreamsAsExpected)
{
    RecordingScheduleDataObject object = made(5, u"before"_s);
    GetParam().act(object);
    QByteArray bytes;
    QDataStream stream(&bytes, QIODeviceBase::WriteOnly);
    object.WriteDataToDataStream(stream);
    EXPECT_EQ(bytes.toHex(), GetParam().written);
}

const Row Rows[] = {
    {"new_object_is_type_0_without_content",
     [](RecordingScheduleDataObject &o) { o = RecordingScheduleDataObject(); }, "00000000ffffffff"},
    {"customised_schedule_is_the_int_then_the_string",
     [](RecordingScheduleDataObject &o) { o = made(2, u"ab"_s); }, "000000020000000400610062"},
    {"what_was_written_reads_back", [](auto &o) { readFrom(o, "000000020000000400610062"); },
     "000000020000000400610062"},
    {"a_type_no_enumerator_names_is_kept", [](auto &o) { readFrom(o, "7fffffffffffffff"); },
     "7fffffffffffffff"},
    {"a_stream_ending_inside_the_int_leaves_type_0", [](auto &o) { readFrom(o, "0000"); },
     "0000000000000000"},
    {"assigning_through_the_interface_copies_both_fields",
     [](RecordingScheduleDataObject &o) {
         static_cast<IRawDataObject &>(o) = static_cast<const IRawDataObject &>(made(1, u"a"_s));
     },
     "00000001000000020061"},
    {"assigning_itself_changes_nothing",
     [](RecordingScheduleDataObject &o) {
         static_cast<IRawDataObject &>(o) = static_cast<const IRawDataObject &>(o);
     },
     "000000050000000c006200650066006f00720065"},
    // The failed cast inside the assignment is caught: nothing escapes.
    {"assigning_another_kind_of_data_object_changes_nothing",
     [](RecordingScheduleDataObject &o) { static_cast<IRawDataObject &>(o) = ForeignObject(); },
     "000000050000000c006200650066006f00720065"},
};

INSTANTIATE_TEST_SUITE_P(Frame, DataObject, ::testing::ValuesIn(Rows),
                         [](const auto &info) { return std::string(info.param.name); });

} // namespace
