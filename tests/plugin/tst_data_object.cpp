// The schedule data object as the host streams it: a 32-bit int, then the
// QString, nothing else.

#include "RecordingScheduleDataObject.h"

#include <QBuffer>
#include <QDataStream>

#include <gtest/gtest.h>

using PluginRecordingScheduleSettingCommon::RecordingScheduleType;

namespace {

QByteArray written(const RecordingScheduleDataObject &object)
{
    QByteArray bytes;
    QDataStream stream(&bytes, QIODevice::WriteOnly);
    object.WriteDataToDataStream(stream);
    return bytes;
}

RecordingScheduleDataObject read(const QByteArray &bytes, QDataStream::Status *status = nullptr)
{
    RecordingScheduleDataObject object;
    object.setRecScheduleType(RecordingScheduleType::NoSchedule);
    object.setCustomizeContent(QStringLiteral("before"));
    QDataStream stream(bytes);
    object.ReadDataFromDataStream(stream);
    if (status)
        *status = stream.status();
    return object;
}

struct StreamCase
{
    const char *name;
    qint32 type;
    QString content;
};

void PrintTo(const StreamCase &c, std::ostream *os)
{
    *os << c.name;
}

class StreamRoundTrip : public ::testing::TestWithParam<StreamCase>
{};

TEST_P(StreamRoundTrip, ReadsBackWhatWasWritten)
{
    RecordingScheduleDataObject original;
    original.setRecScheduleType(static_cast<RecordingScheduleType>(GetParam().type));
    original.setCustomizeContent(GetParam().content);

    QDataStream::Status status = QDataStream::Ok;
    const RecordingScheduleDataObject copy = read(written(original), &status);
    EXPECT_EQ(status, QDataStream::Ok);
    EXPECT_EQ(copy.getRecScheduleType(), original.getRecScheduleType());
    EXPECT_EQ(copy.getCustomizeContent(), GetParam().content);
    EXPECT_EQ(copy.getCustomizeContent().isNull(), GetParam().content.isNull());
}

INSTANTIATE_TEST_SUITE_P(
    DataObject, StreamRoundTrip,
    ::testing::Values(
        StreamCase{"DefaultObjectIsTypeZeroWithoutContent", 0, QString()},
        StreamCase{"CustomisedScheduleKeepsItsDocument", 2,
                   QStringLiteral("{\"Rectangles\":[{\"Bottom\":24,\"Left\":0,\"RecordingMode\":"
                                  "\"Continuous\",\"Right\":7,\"Top\":0}]}")},
        StreamCase{"EmptyButNotNullContentStaysEmpty", 1, QStringLiteral("")},
        StreamCase{"NonLatinContentSurvives", 4, QStringLiteral("\u65e5\u7a0b \u00e9 \U0001F600")},
        StreamCase{"TypeNoEnumeratorNamesIsKept", 3, QStringLiteral("x")},
        StreamCase{"NegativeTypeIsKept", -1, QStringLiteral("x")},
        StreamCase{"LargestTypeIsKept", 2147483647, QString()}),
    [](const auto &info) { return std::string(info.param.name); });

TEST(DataObject, StreamHoldsTheIntThenTheStringAndNothingElse)
{
    RecordingScheduleDataObject object;
    object.setRecScheduleType(RecordingScheduleType::Customized);
    object.setCustomizeContent(QStringLiteral("ab"));

    QByteArray expected;
    QDataStream stream(&expected, QIODevice::WriteOnly);
    stream << qint32(2) << QStringLiteral("ab");
    EXPECT_EQ(written(object), expected);
    EXPECT_EQ(written(object).toHex(), QByteArray("0000000200000004006100 62").replace(' ', ""));
}

TEST(DataObject, StreamFollowsTheStreamsByteOrder)
{
    RecordingScheduleDataObject object;
    object.setRecScheduleType(RecordingScheduleType::DefaultEvent);
    QByteArray bytes;
    QDataStream out(&bytes, QIODevice::WriteOnly);
    out.setByteOrder(QDataStream::LittleEndian);
    object.WriteDataToDataStream(out);
    EXPECT_EQ(bytes.left(4).toHex(), QByteArray("01000000"));

    RecordingScheduleDataObject back;
    QDataStream in(bytes);
    in.setByteOrder(QDataStream::LittleEndian);
    back.ReadDataFromDataStream(in);
    EXPECT_EQ(back.getRecScheduleType(), RecordingScheduleType::DefaultEvent);
}

struct ShortStream
{
    const char *name;
    QByteArray bytes;
};

void PrintTo(const ShortStream &c, std::ostream *os)
{
    *os << c.name;
}

class EarlyEnd : public ::testing::TestWithParam<ShortStream>
{};

TEST_P(EarlyEnd, LeavesTypeZeroAndReportsTheFailure)
{
    QDataStream::Status status = QDataStream::Ok;
    const RecordingScheduleDataObject object = read(GetParam().bytes, &status);
    EXPECT_EQ(object.getRecScheduleType(), RecordingScheduleType::DefaultContinuous);
    EXPECT_EQ(status, QDataStream::ReadPastEnd);
}

INSTANTIATE_TEST_SUITE_P(DataObject, EarlyEnd,
                         ::testing::Values(ShortStream{"EmptyStream", QByteArray()},
                                           ShortStream{"StreamEndsInsideTheInt",
                                                       QByteArray::fromHex("0000")}),
                         [](const auto &info) { return std::string(info.param.name); });

TEST(DataObject, StreamEndingInsideTheStringReportsTheFailure)
{
    QDataStream::Status status = QDataStream::Ok;
    const RecordingScheduleDataObject object =
        read(QByteArray::fromHex("00000002000000080061"), &status);
    EXPECT_EQ(status, QDataStream::ReadPastEnd);
    EXPECT_TRUE(object.getCustomizeContent().isEmpty());
}

class ForeignObject final : public IRawDataObject
{
public:
    void ReadDataFromDataStream(QDataStream &) override {}
    void WriteDataToDataStream(QDataStream &) const override {}
};

TEST(DataObject, AssignmentFromAnotherKindOfObjectChangesNothing)
{
    RecordingScheduleDataObject target;
    target.setRecScheduleType(RecordingScheduleType::Customized);
    target.setCustomizeContent(QStringLiteral("kept"));
    const ForeignObject foreign;
    IRawDataObject &asRaw = target;
    IRawDataObject &result = (asRaw = foreign);
    EXPECT_EQ(&result, &asRaw);
    EXPECT_EQ(target.getRecScheduleType(), RecordingScheduleType::Customized);
    EXPECT_EQ(target.getCustomizeContent(), QStringLiteral("kept"));
}

TEST(DataObject, AssignmentThroughTheInterfaceCopiesBothFields)
{
    RecordingScheduleDataObject source;
    source.setRecScheduleType(RecordingScheduleType::Other);
    source.setCustomizeContent(QStringLiteral("doc"));
    RecordingScheduleDataObject target;
    IRawDataObject &asRaw = target;
    const IRawDataObject &sourceRaw = source;
    asRaw = sourceRaw;
    EXPECT_EQ(target.getRecScheduleType(), RecordingScheduleType::Other);
    EXPECT_EQ(target.getCustomizeContent(), QStringLiteral("doc"));
}

TEST(DataObject, SelfAssignmentThroughTheInterfaceChangesNothing)
{
    RecordingScheduleDataObject object;
    object.setRecScheduleType(RecordingScheduleType::DefaultEvent);
    object.setCustomizeContent(QStringLiteral("same"));
    IRawDataObject &asRaw = object;
    const IRawDataObject &same = object;
    EXPECT_EQ(&(asRaw = same), &asRaw);
    EXPECT_EQ(object.getRecScheduleType(), RecordingScheduleType::DefaultEvent);
    EXPECT_EQ(object.getCustomizeContent(), QStringLiteral("same"));
}

TEST(DataObject, CopiesAreIndependent)
{
    RecordingScheduleDataObject original;
    original.setRecScheduleType(RecordingScheduleType::Customized);
    original.setCustomizeContent(QStringLiteral("a"));
    RecordingScheduleDataObject copy(original);
    copy.setCustomizeContent(QStringLiteral("b"));
    EXPECT_EQ(original.getCustomizeContent(), QStringLiteral("a"));
    EXPECT_EQ(copy.getRecScheduleType(), RecordingScheduleType::Customized);
}

} // namespace
