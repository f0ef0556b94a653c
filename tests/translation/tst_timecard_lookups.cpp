// The identifier lookups that the default schedule workflow relies on.

#include "PluginRecordingScheduleSettingSrv.h"
#include "TimecardTrees.h"

#include <gtest/gtest.h>

using namespace TimecardTrees;

class PluginRecordingScheduleSettingSrvTest
{
public:
    static QList<int> withCameras(const QList<QVariant> &timecards)
    {
        return PluginRecordingScheduleSettingSrv().TimecardIDThatHasCameraList(timecards);
    }
    static QList<int> withCamerasExceptDefault(const QList<QVariant> &timecards)
    {
        return PluginRecordingScheduleSettingSrv().TimecardIDThatHasCameraListExceptDefaultSchedule(
            timecards);
    }
    static QList<int> toRemoveCamerasFrom(const QList<QVariant> &timecards)
    {
        return PluginRecordingScheduleSettingSrv().TimecardIDThatNeedsToRemoveCameraList(timecards);
    }
};

namespace {

using Lookup = PluginRecordingScheduleSettingSrvTest;

Map card(const QString &id, bool withCameras)
{
    Map result{{"TmcardID", id}};
    if (withCameras)
        result.insert("CamList", cameraList({camera("C_1", "1")}));
    return result;
}

struct LookupCase
{
    const char *name;
    QList<QVariant> timecards;
    QList<int> withCameras;
    QList<int> exceptDefault;
    QList<int> toRemoveFrom;
};

void PrintTo(const LookupCase &c, std::ostream *os)
{
    *os << c.name;
}

class TimecardLookups : public ::testing::TestWithParam<LookupCase>
{};

TEST_P(TimecardLookups, FindTheTimecardsWithCameras)
{
    EXPECT_EQ(Lookup::withCameras(GetParam().timecards), GetParam().withCameras);
    EXPECT_EQ(Lookup::withCamerasExceptDefault(GetParam().timecards), GetParam().exceptDefault);
    EXPECT_EQ(Lookup::toRemoveCamerasFrom(GetParam().timecards), GetParam().toRemoveFrom);
}

INSTANTIATE_TEST_SUITE_P(
    TimecardLookups, TimecardLookups,
    ::testing::Values(
        LookupCase{"NoTimecardsFallsBackToTheDefault", {}, {}, {}, {1}},
        LookupCase{"ListOrderIsKeptAndDefaultLeftOutOnlyOnce",
                   {card("3", true), card("1", true), card("5", false)},
                   {3, 1},
                   {3},
                   {3, 1}},
        LookupCase{"OnlyDefaultHasCameras", {card("1", true), card("2", false)}, {1}, {}, {1}},
        LookupCase{"NoneWithCamerasFallsBackToTheDefault", {card("4", false)}, {}, {}, {1}},
        LookupCase{"DuplicatesAreKept", {card("6", true), card("6", true)}, {6, 6}, {6, 6}, {6, 6}},
        LookupCase{
            "EmptyCameraListCounts",
            {Map{{"TmcardID", "8"}, {"CamList", ""}}, Map{{"TmcardID", "9"}, {"CamList", Map()}}},
            {8, 9},
            {8, 9},
            {8, 9}},
        LookupCase{"MissingIdentifierIsZero", {Map{{"CamList", ""}}}, {0}, {0}, {0}},
        LookupCase{"IdentifierThatIsNoIntegerIsZero",
                   {card("1.0", true), card("x", true)},
                   {0, 0},
                   {0, 0},
                   {0, 0}},
        LookupCase{
            "OverlongIdentifierIsZeroNotAWrappedOne", {card("4294967297", true)}, {0}, {0}, {0}},
        LookupCase{"EntryThatIsNoMapIsSkipped", {QStringLiteral("CamList")}, {}, {}, {1}}),
    [](const auto &info) { return std::string(info.param.name); });

} // namespace
