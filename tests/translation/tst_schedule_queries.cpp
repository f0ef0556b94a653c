// "GetScheduleRecInfo", "GetCurrentScheduleInfo" and "GetAllScheduleRecInfo"
// through Request, against a control that hands back scripted time cards.

#include "QtPrinters.h"
#include "QueryRunner.h"
#include "TestLog.h"
#include "TimecardTrees.h"

#include <gtest/gtest.h>

using namespace TimecardTrees;

namespace {

const QString GetScheduleRecInfo = QStringLiteral("GetScheduleRecInfo");
const QString GetCurrentScheduleInfo = QStringLiteral("GetCurrentScheduleInfo");
const QString GetAllScheduleRecInfo = QStringLiteral("GetAllScheduleRecInfo");

const QString Customize = QStringLiteral("KOLT2 Customize Recording");
const QString DefaultContinuous = QStringLiteral("KOLT2 Default Continuous Recording");
const QString DefaultEvent = QStringLiteral("KOLT2 Default Event Recording");

const QVariant SomeCameras = cameraList({camera("C_1", "2")});

Map customizeMapping()
{
    return mapping(frame(days({"1.0", "2.0"}), intervals({{"3600", "7200"}})),
                   QStringLiteral("Continuous"));
}

const QString CustomizeDocument = QStringLiteral(
    "{\"Rectangles\":[{\"Bottom\":2,\"Left\":0,\"RecordingMode\":\"Continuous\",\"Right\":2,"
    "\"Top\":1}]}");

// --- Which schedule is in force -------------------------------------------------

struct InForceCase
{
    const char *name;
    QList<QVariant> timecards;
    int scheduleRecInfo;     // "RecScheduleType" of "GetScheduleRecInfo"
    int currentScheduleInfo; // "RecScheduleType" of "GetCurrentScheduleInfo"
};

void PrintTo(const InForceCase &c, std::ostream *os)
{
    *os << c.name;
}

class ScheduleInForce : public ::testing::TestWithParam<InForceCase>
{};

TEST_P(ScheduleInForce, IsClassifiedByTheTimecardsWithCameras)
{
    for (const auto &[command, expectedType] :
         {std::pair{GetScheduleRecInfo, GetParam().scheduleRecInfo},
          std::pair{GetCurrentScheduleInfo, GetParam().currentScheduleInfo}}) {
        QueryRunner runner;
        const ReplyRecorder::Reply reply = runner.run(command, GetParam().timecards);
        ASSERT_EQ(runner.replies, 1);
        EXPECT_TRUE(reply.flag);
        EXPECT_EQ(reply.code, QStringLiteral("0"));
        EXPECT_TRUE(reply.text.isEmpty());
        const Map summary = reply.data.toMap();
        EXPECT_EQ(summary.keys(), (QStringList{QStringLiteral("CustomizeContent"),
                                               QStringLiteral("RecScheduleType")}));
        EXPECT_EQ(summary.value(QStringLiteral("RecScheduleType")).typeId(), QMetaType::Int);
        EXPECT_EQ(summary.value(QStringLiteral("RecScheduleType")).toInt(), expectedType)
            << command.toStdString();
        EXPECT_EQ(summary.value(QStringLiteral("CustomizeContent")).typeId(), QMetaType::QString);
        EXPECT_EQ(summary.value(QStringLiteral("CustomizeContent")).toString(),
                  expectedType == 2 ? CustomizeDocument : QString())
            << command.toStdString();
    }
}

INSTANTIATE_TEST_SUITE_P(
    ScheduleQueries, ScheduleInForce,
    ::testing::Values(
        InForceCase{"NoTimecardsIsNoSchedule", {}, 5, 5},
        InForceCase{"NoTimecardWithCamerasIsNoSchedule",
                    {timecard("1", DefaultContinuous, Map()), timecard("7", Customize, Map())},
                    5,
                    5},
        InForceCase{"CustomisedNextToDefaultTimecard",
                    {timecard("1", DefaultContinuous, Map(), SomeCameras),
                     timecard("7", Customize, customizeMapping(), SomeCameras)},
                    2,
                    4},
        InForceCase{"OnlyDefaultTimecardHasCameras",
                    {timecard("1", DefaultEvent, Map(), SomeCameras)},
                    5,
                    1},
        InForceCase{"OnlyDefaultTimecardWithAnotherName",
                    {timecard("1", QStringLiteral("Lobby"), Map(), SomeCameras)},
                    5,
                    4},
        InForceCase{"DefaultContinuousByName",
                    {timecard("3", DefaultContinuous, Map(), SomeCameras)},
                    0,
                    0},
        InForceCase{"DefaultEventByName", {timecard("3", DefaultEvent, Map(), SomeCameras)}, 1, 1},
        InForceCase{
            "CustomisedByName", {timecard("3", Customize, customizeMapping(), SomeCameras)}, 2, 2},
        InForceCase{
            "NameInOtherLetterCaseIsOther",
            {timecard("3", QStringLiteral("kolt2 customize recording"), Map(), SomeCameras)},
            4,
            4},
        InForceCase{"NamedScheduleIsOther",
                    {timecard("3", QStringLiteral("Lobby"), Map(), SomeCameras)},
                    4,
                    4},
        InForceCase{"TwoTimecardsWithCamerasAreOther",
                    {timecard("3", DefaultEvent, Map(), SomeCameras),
                     timecard("4", DefaultEvent, Map(), SomeCameras)},
                    4,
                    4},
        InForceCase{"SameIdentifierTwiceCountsTwice",
                    {timecard("3", Customize, Map(), SomeCameras),
                     timecard("3", Customize, Map(), SomeCameras)},
                    4,
                    4},
        InForceCase{"EmptyCameraListStillCounts",
                    {timecard("3", DefaultEvent, Map(), QStringLiteral(""))},
                    1,
                    1},
        InForceCase{"FirstTimecardWithTheIdentifierDecides",
                    {timecard("3", DefaultEvent, Map(), SomeCameras),
                     timecard("3", Customize, customizeMapping())},
                    1,
                    1},
        InForceCase{"TimecardWithCamerasButNoIdentifierIsZero",
                    {Map{{"Name", DefaultEvent}, {"CamList", SomeCameras}}},
                    1,
                    1},
        InForceCase{"OverlongIdentifierIsNotTheDefaultTimecard",
                    {timecard("4294967297", Customize, customizeMapping(), SomeCameras)},
                    2,
                    2},
        InForceCase{"EntryThatIsNoMapIsSkipped",
                    {QStringLiteral("junk"), timecard("3", DefaultEvent, Map(), SomeCameras)},
                    1,
                    1}),
    [](const auto &info) { return std::string(info.param.name); });

// --- All time cards ----------------------------------------------------------------

TEST(ScheduleQueries, AllTimecardsAreListedInOrderWithTextFields)
{
    QueryRunner runner;
    Map first = timecard("12", Customize, customizeMapping(),
                         cameraList({camera("C_12", "3"), camera("C_7", "1")}));
    first.insert("Revision", "41");
    const Map second = timecard("1", DefaultContinuous, defaultMapping("Continuous"));
    const ReplyRecorder::Reply reply = runner.run(GetAllScheduleRecInfo, {first, second});

    ASSERT_EQ(runner.replies, 1);
    EXPECT_TRUE(reply.flag);
    EXPECT_EQ(reply.code, QStringLiteral("0"));
    EXPECT_EQ(reply.data.typeId(), QMetaType::QVariantList);
    const QList<QVariant> entries = reply.data.toList();
    ASSERT_EQ(entries.size(), 2);

    const Map entry = entries[0].toMap();
    EXPECT_EQ(entry.keys(), (QStringList{"CameraList", "CustomizeContent", "Revision",
                                         "ScheduleName", "TimeCardID"}));
    EXPECT_EQ(entry["ScheduleName"], QVariant(Customize));
    EXPECT_EQ(entry["TimeCardID"].typeId(), QMetaType::QString);
    EXPECT_EQ(entry["TimeCardID"], QVariant(QStringLiteral("12")));
    EXPECT_EQ(entry["Revision"], QVariant(QStringLiteral("41")));
    EXPECT_EQ(entry["CustomizeContent"], QVariant(CustomizeDocument));
    EXPECT_EQ(entry["CameraList"], QVariant(QVariantList{camera("C_12", "3"), camera("C_7", "1")}));

    const Map defaultEntry = entries[1].toMap();
    EXPECT_EQ(defaultEntry["ScheduleName"], QVariant(DefaultContinuous));
    EXPECT_EQ(
        defaultEntry["CustomizeContent"],
        QVariant(QStringLiteral("{\"Rectangles\":[{\"Bottom\":24,\"Left\":0,"
                                "\"RecordingMode\":\"Continuous\",\"Right\":7,\"Top\":0}]}")));
    EXPECT_EQ(defaultEntry["CameraList"], QVariant(QVariantList()));
}

struct CameraCase
{
    const char *name;
    QVariant camList; // invalid: no "CamList"
    QList<QVariant> expected;
};

void PrintTo(const CameraCase &c, std::ostream *os)
{
    *os << c.name;
}

class CameraLists : public ::testing::TestWithParam<CameraCase>
{};

TEST_P(CameraLists, AreAlwaysAList)
{
    QueryRunner runner;
    const ReplyRecorder::Reply reply =
        runner.run(GetAllScheduleRecInfo, {timecard("5", "Lobby", Map(), GetParam().camList)});
    const QVariant cameras = reply.data.toList().value(0).toMap().value("CameraList");
    EXPECT_EQ(cameras.typeId(), QMetaType::QVariantList);
    EXPECT_EQ(cameras.toList(), GetParam().expected);
}

INSTANTIATE_TEST_SUITE_P(
    ScheduleQueries, CameraLists,
    ::testing::Values(
        CameraCase{
            "LoneCameraIsAListOfOne", cameraList({camera("C_3", "9")}), {camera("C_3", "9")}},
        CameraCase{
            "CamerasKeepTheirOrderAndEveryChild",
            cameraList({camera("C_3", "9"), Map{{"Name", "C_1"}, {"GrpID", "1"}, {"Extra", "x"}}}),
            {camera("C_3", "9"), Map{{"Name", "C_1"}, {"GrpID", "1"}, {"Extra", "x"}}}},
        CameraCase{"NoCameraListIsEmpty", QVariant(), {}},
        CameraCase{"EmptyCameraListTextIsEmpty", QStringLiteral(""), {}},
        CameraCase{"CameraListWithoutCamIsEmpty", Map(), {}},
        CameraCase{"EmptyLoneCamIsEmpty", Map{{"Cam", Map()}}, {}},
        CameraCase{"LoneCamThatIsTextIsEmpty", Map{{"Cam", "C_1"}}, {}}),
    [](const auto &info) { return std::string(info.param.name); });

TEST(ScheduleQueries, NoTimecardsIsAnEmptyListAndStillASuccess)
{
    QueryRunner runner;
    const ReplyRecorder::Reply reply = runner.run(GetAllScheduleRecInfo, {});
    EXPECT_EQ(reply.code, QStringLiteral("0"));
    EXPECT_EQ(reply.data.typeId(), QMetaType::QVariantList);
    EXPECT_TRUE(reply.data.toList().isEmpty());
}

TEST(ScheduleQueries, EntryThatIsNoMapStillGetsAnEntry)
{
    QueryRunner runner;
    const ReplyRecorder::Reply reply = runner.run(GetAllScheduleRecInfo, {QStringLiteral("junk")});
    const Map entry = reply.data.toList().value(0).toMap();
    EXPECT_EQ(entry["TimeCardID"], QVariant(QString()));
    EXPECT_EQ(entry["CustomizeContent"],
              QVariant(QStringLiteral("{\"Rectangles\":[{\"Bottom\":-1,\"Left\":-1,"
                                      "\"RecordingMode\":\"\",\"Right\":-1,\"Top\":-1}]}")));
}

// --- Failures ------------------------------------------------------------------------

class QueryFailure : public ::testing::TestWithParam<QString>
{};

TEST_P(QueryFailure, FailedFetchAnswersWithTheFetchsFlag)
{
    for (const bool flag : {false, true}) {
        TestLog log;
        log.attach();
        QueryRunner runner;
        const ReplyRecorder::Reply reply = runner.run(GetParam(), {}, false, flag);
        ASSERT_EQ(runner.replies, 1);
        EXPECT_EQ(reply.flag, flag);
        EXPECT_EQ(reply.code, QStringLiteral("-1"));
        EXPECT_TRUE(reply.text.isEmpty());
        EXPECT_FALSE(reply.data.isValid());
        EXPECT_EQ(log.texts(2), QStringList{QStringLiteral("Fail to get all schedule time card.")});
    }
}

TEST_P(QueryFailure, RefusedFetchIsAnsweredAtOnce)
{
    TestLog log;
    log.attach();
    QueryRunner runner;
    runner.control->setFetch(FakeControl::Fetch::Refuse);
    const ReplyRecorder::Reply reply = runner.run(GetParam(), {});
    ASSERT_EQ(runner.replies, 1);
    EXPECT_TRUE(reply.flag);
    EXPECT_EQ(reply.code, QStringLiteral("-1"));
    EXPECT_FALSE(reply.data.isValid());
    EXPECT_TRUE(log.texts(2).isEmpty());
}

INSTANTIATE_TEST_SUITE_P(ScheduleQueries, QueryFailure,
                         ::testing::Values(GetScheduleRecInfo, GetCurrentScheduleInfo,
                                           GetAllScheduleRecInfo),
                         [](const auto &info) { return info.param.toStdString(); });

} // namespace
