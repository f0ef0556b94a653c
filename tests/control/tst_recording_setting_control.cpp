// RecordingSettingControl through its interface, against a scripted tunnel: the bytes
// sent for given inputs, the requests made, and the one completion each operation gives.
#include "RecordingScheduleSettingConstants.h"
#include "RecordingSettingControl.h"
#include "TestLog.h"
#include "TestTunnel.h"

#include <gtest/gtest.h>

#include <limits>
#include <tuple>

namespace {

using Answer = TestTunnel::Answer;

// The control as the plug-in owns it: shared, reached through its interface.
QSharedPointer<IRecordingSettingControl> makeControl(IKoltTunnelClient *tunnel)
{
    return QSharedPointer<RecordingSettingControl>::create(tunnel);
}

QVariant camera(const QString &name, const QString &group)
{
    return QMap<QString, QVariant>{{"Name", name}, {"GrpID", group}};
}

// What the completions handed out were called with, and how often.
struct Done
{
    int calls = 0;
    bool ok = false;
    bool flag = false;

    // A completion of (ok, flag) followed by values of these types.
    template <typename... Values> std::function<void(bool, bool, Values...)> take()
    {
        return [this](bool ok_, bool flag_, Values...) {
            ++calls;
            ok = ok_;
            flag = flag_;
        };
    }
};

using Send = std::function<bool(IRecordingSettingControl &, Done &)>;

// clang-format off
const QString Removal = "RecordingSettingControl::HdlrRmvDefTimecardCameraList, HdlrRmvDefTimecardCameraList failed.";
const QString Period = "<Range><Period><TmS>2016-03-29 00:00:00.000</TmS><TmE>2035-01-01 00:00:00.000</TmE></Period><End>false</End></Range><RepeatFreq>1</RepeatFreq>";
const QString Zero = R"(<Ele B="0" E="0"/>)";
const QString Continuous = "<RecMode>Continuous</RecMode>";
const QString Event = "<RecMode>Event</RecMode><Motion>0</Motion><ContMotNum>1</ContMotNum>";
// The 29 plain trigger elements after DigiInput, none of them set.
const QString Rest = "<PIR>0</PIR><Tampering>0</Tampering><PPTZTrigger>0</PPTZTrigger><StopUntilDIFalling>0</StopUntilDIFalling><StopUntilDIRising>0</StopUntilDIRising><LineDetection>0</LineDetection><FieldDetection>0</FieldDetection><Loitering>0</Loitering><CrowdDetection>0</CrowdDetection><MissingObject>0</MissingObject><AbandonObject>0</AbandonObject><FaceDetection>0</FaceDetection><ZoneDetection>0</ZoneDetection><SmartTracking>0</SmartTracking><RunningDetection>0</RunningDetection><ParkingViolationDetection>0</ParkingViolationDetection><RestrictedZoneDetection>0</RestrictedZoneDetection><TemperatureThresholdWarning>0</TemperatureThresholdWarning><TemperatureThresholdAlarm>0</TemperatureThresholdAlarm><TemperatureDifferenceWarning>0</TemperatureDifferenceWarning><TemperatureDifferenceAlarm>0</TemperatureDifferenceAlarm><TemperatureRiseWarning>0</TemperatureRiseWarning><TemperatureRiseAlarm>0</TemperatureRiseAlarm><TemperatureSectionAlarm>0</TemperatureSectionAlarm><ThermalIntrusion>0</ThermalIntrusion><ThermalMultiLoitering>0</ThermalMultiLoitering><FireSpotDetection>0</FireSpotDetection><SmokerDetection>0</SmokerDetection><SmokeAndFlameDetection>0</SmokeAndFlameDetection>";
const QString EveryKey = R"({"motion":true,"di":true,"traditional":true,"recordingStateTrigger":true,"recordingStateNormal":true,"pir":true,"tampering":true,"pptz":true,"activatedToNormal":true,"normalToActivated":true,"lineDetection":true,"fieldDetection":true,"loitering":true,"crowdDetection":true,"missingObject":true,"abandonObject":true,"faceDetection":true,"zoneDetection":true,"smartTracking":true,"runningDetection":true,"parkingViolationDetection":true,"restrictedZoneDetection":true,"temperatureThresholdWarning":true,"temperatureThresholdAlarm":true,"temperatureDifferenceWarning":true,"temperatureDifferenceAlarm":true,"temperatureRiseWarning":true,"temperatureRiseAlarm":true,"temperatureSectionAlarm":true,"thermalIntrusion":true,"thermalMultiLoitering":true,"fireSpotDetection":true,"smokerDetection":true,"smokeAndFlameDetection":true})";

// One composed time frame.
QString ele(const QString &days, const QString &interval, const QString &modeAndTriggers) { return "<Ele><Frame><Name>Customize time frame</Name><DLMod>SingleDay</DLMod><RepeatMod>Weekly</RepeatMod><DayList>" + days + "</DayList><Intervals>" + interval + "</Intervals><Holiday>false</Holiday>" + Period + "</Frame>" + modeAndTriggers + "</Ele>"; }
// The whole-week time frame of the default time cards.
QString always(const QString &mode) { return R"(<Ele><Frame><Name>Always</Name><Holiday>false</Holiday><RepeatMod>Weekly</RepeatMod><DLMod>SingleDay</DLMod><Intervals><Ele B="0" E="86400"/></Intervals><DayList><Ele B="1.0"/><Ele B="2.0"/><Ele B="3.0"/><Ele B="4.0"/><Ele B="5.0"/><Ele B="6.0"/><Ele B="7.0"/></DayList>)" + Period + "</Frame><RecMode>" + mode + "</RecMode><AllEvent>true</AllEvent><Motion>true</Motion><ContMotNum>1</ContMotNum><DigiInput>3</DigiInput></Ele>"; }
QString insert(const QString &name, const QString &mapping, const QString &cameraList = {}) { return "<InsRecTmcard><Tmcard><Revision>0</Revision><TmcardID>0</TmcardID><Name>" + name + "</Name><Mapping>" + mapping + "</Mapping>" + cameraList + "</Tmcard></InsRecTmcard>"; }
QString update(const QString &name, const QString &mapping, const QString &cameraList) { return "<UpdRecTmcard><Tmcard><Revision>5</Revision><TmcardID>2</TmcardID><Name>" + name + "</Name><Mapping>" + mapping + "</Mapping>" + cameraList + "</Tmcard></UpdRecTmcard>"; }
// C_1 to C_n, in recording group 1.
QList<QVariant> cameras(int n) { QList<QVariant> list; for (int i = 1; i <= n; ++i) list << camera(QStringLiteral("C_%1").arg(i), "1"); return list; }

// Time card 3 as the server answers a read of it, and as it goes back.
const QString Head = "<Tmcard><Revision>7</Revision><TmcardID>3</TmcardID><Name>50%1 off</Name><Mapping><Ele>x</Ele></Mapping>";
const QString Read3 = "<GetRecTmcard><TmcardID>3</TmcardID></GetRecTmcard>";
const QString Three = "<CamList><Cam><Name>C_1</Name><GrpID>1</GrpID></Cam><Cam><Name>C_2</Name><GrpID>2</GrpID></Cam><Cam><Name>C_3</Name><GrpID>3</GrpID></Cam></CamList>";
const QString Kept13 = "<CamList><Cam><Name>C_1</Name><RecGrpID>1</RecGrpID></Cam><Cam><Name>C_3</Name><RecGrpID>3</RecGrpID></Cam></CamList>";
const QString New9 = "<CamList><Cam><Name>C_9</Name><RecGrpID>4</RecGrpID></Cam></CamList>";
// Another request created the default continuous time card (2, with C_6) first.
const QString Taken = "RecordingSettingControl::HdlrTunnelReqCallback, HdlrTunnelReqCallback failed: success:1, reqRespCode:9";
const QString ReadAll = "<GetRecTmcard><TmcardAll>true</TmcardAll></GetRecTmcard>";
const QString Won = "<GetRecTmcardRes><Tmcard><Revision>5</Revision><TmcardID>2</TmcardID><Name>KOLT2 Default Continuous Recording</Name><Mapping/><CamList><Cam><Name>C_6</Name><GrpID>1</GrpID></Cam></CamList></Tmcard></GetRecTmcardRes>";
const QString C2 = "<CamList><Cam><Name>C_2</Name><RecGrpID>1</RecGrpID></Cam></CamList>";
QString answer(const QString &cameraList, const QString &after = {}) { return "<GetRecTmcardRes>" + Head + cameraList + after + "</Tmcard></GetRecTmcardRes>"; }
QString back(const QString &cameraList, const QString &after = {}) { return "<UpdRecTmcard>" + Head + cameraList + after + "</Tmcard></UpdRecTmcard>"; }
// clang-format on

// AddSchedule "S" with one rectangle of these fields (recording "Continuous"
// unless they name a mode), or with this document.
Send add(const QString &fields)
{
    const QString mode = fields.contains("RecordingMode") ? "" : R"("RecordingMode":"Continuous",)";
    const QString document =
        fields.startsWith('{') ? fields : R"({"Rectangles":[{)" + mode + fields + "}]}";
    return [document](IRecordingSettingControl &c, Done &) {
        return c.AddSchedule("S", document, {});
    };
}

struct Row
{
    std::string name;
    Send send;
    QString bodies;      // everything sent, in order
    QString heard = {};  // what the completion heard: "", "ok" or "failed"
    QString record = {}; // the last error record
    QString answer = {}; // the server's answer to the first exchange
    QString code = "0";  // its result code
    QString then = {};   // the answer to the second exchange
    friend void PrintTo(const Row &row, std::ostream *out) { *out << row.name; }
};

class Messages : public testing::TestWithParam<Row>
{};

TEST_P(Messages, GoOutExactlyAsWritten)
{
    const Row &row = GetParam();
    TestLog log;
    log.attach();
    TestTunnel tunnel; // answers at once; an empty completion must not be called
    tunnel.setResponder([&, n = 0](const TestTunnel::Sent &) mutable -> TestTunnel::Answer {
        if (++n == 1 || (n == 2 && !row.then.isEmpty()))
            return {true, n == 1 ? row.code : "0", n == 1 ? row.answer : row.then, true};
        return {};
    });
    Done done;
    EXPECT_EQ(row.send(*makeControl(&tunnel), done), !row.bodies.isEmpty());
    QString bodies;
    for (const TestTunnel::Sent &sent : tunnel.sent())
        bodies += sent.body;
    EXPECT_EQ(bodies, row.bodies);
    const char *heard[] = {"", done.ok ? "ok" : "failed", "more than once"};
    EXPECT_EQ(QString(heard[done.calls < 2 ? done.calls : 2]), row.heard);
    const QStringList records = log.texts(2);
    EXPECT_EQ(records.isEmpty() ? QString() : records.last(), row.record);
}

// clang-format off
INSTANTIATE_TEST_SUITE_P(Operations, Messages, testing::Values(
    Row{"day_six_to_seven_is_day_seven", add(R"("Left":6,"Right":7)"), insert("S", ele(R"(<Ele B="7.0"/>)", Zero, Continuous))},
    Row{"equal_bounds_give_no_day", add(R"("Left":3,"Right":3)"), insert("S", ele("", Zero, Continuous))},
    Row{"days_before_the_week_start_at_day_one", add(R"("Left":-5,"Right":2)"), insert("S", ele(R"(<Ele B="1.0"/><Ele B="2.0"/>)", Zero, Continuous))},
    Row{"days_after_the_week_stop_at_day_seven", add(R"("Left":5,"Right":2000000000)"), insert("S", ele(R"(<Ele B="6.0"/><Ele B="7.0"/>)", Zero, Continuous))},
    Row{"bounds_beyond_the_int_range_saturate", add(R"("Left":-1e300,"Right":1e300)"), insert("S", ele(R"(<Ele B="1.0"/><Ele B="2.0"/><Ele B="3.0"/><Ele B="4.0"/><Ele B="5.0"/><Ele B="6.0"/><Ele B="7.0"/>)", Zero, Continuous))},
    Row{"quarter_hours_and_the_end_of_the_day", add(R"("Top":8.25,"Bottom":24)"), insert("S", ele("", R"(<Ele B="29700" E="86400"/>)", Continuous))},
    Row{"six_digit_hours_round_to_the_nearest_second", add(R"("Top":0.333333,"Bottom":23.9997)"), insert("S", ele("", R"(<Ele B="1200" E="86399"/>)", Continuous))},
    Row{"hours_beyond_the_int_range_are_held_to_the_day", add(R"("Top":-1e300,"Bottom":1e300)"), insert("S", ele("", R"(<Ele B="0" E="86400"/>)", Continuous))},
    Row{"hours_past_the_day_are_held_to_it", add(R"("Top":-0.5,"Bottom":24.5)"), insert("S", ele("", R"(<Ele B="0" E="86400"/>)", Continuous))},
    Row{"every_trigger_key_sets_its_element", add(R"("RecordingMode":"Event","triggerEvents":)" + EveryKey), insert("S", ele("", Zero, "<RecMode>Event</RecMode><Motion>1</Motion><ContMotNum>1</ContMotNum><DigiInput>3</DigiInput>" + QString(Rest).replace(">0<", ">1<")))},
    Row{"digital_input_on_its_trigger_state", add(R"("RecordingMode":"Event","triggerEvents":{"di":true,"traditional":true,"recordingStateTrigger":true})"), insert("S", ele("", Zero, Event + "<DigiInput>1</DigiInput>" + Rest))},
    Row{"digital_input_on_its_normal_state", add(R"("RecordingMode":"Event","triggerEvents":{"di":true,"traditional":true,"recordingStateNormal":true})"), insert("S", ele("", Zero, Event + "<DigiInput>2</DigiInput>" + Rest))},
    Row{"digital_input_states_count_only_when_traditional", add(R"("RecordingMode":"Event","triggerEvents":{"di":true,"recordingStateTrigger":true})"), insert("S", ele("", Zero, Event + "<DigiInput>0</DigiInput>" + Rest))},
    Row{"only_the_exact_mode_Event_gets_triggers", add(R"("RecordingMode":"event","triggerEvents":{"motion":true})"), insert("S", ele("", Zero, "<RecMode>event</RecMode>"))},
    Row{"event_without_trigger_events_gets_none", add(R"("RecordingMode":"Event")"), insert("S", ele("", Zero, "<RecMode>Event</RecMode>")), {}, "trigget events map is empty"},
    Row{"two_rectangles_give_two_frames_in_order", add(R"({"Rectangles":[{"RecordingMode":"B"},{"RecordingMode":"A"}]})"), insert("S", ele("", Zero, "<RecMode>B</RecMode>") + ele("", Zero, "<RecMode>A</RecMode>"))},
    Row{"entries_that_are_not_rectangles_with_a_mode_are_skipped", add(R"({"Rectangles":[null,1,"a",{},{"RecordingMode":""},{"RecordingMode":7},{"Right":1,"RecordingMode":"A"}]})"), insert("S", ele(R"(<Ele B="1.0"/>)", Zero, "<RecMode>A</RecMode>"))},
    Row{"document_that_is_not_JSON_sends_no_frame", add("{Rectangles"), insert("S", ""), {}, "Time frames parse error. {Rectangles"},
    Row{"name_and_mode_are_escaped", [](auto &c, Done &) { return c.AddSchedule("A</Name><TmcardID>5</TmcardID><Name>B & co", R"({"Rectangles":[{"RecordingMode":"<R&D>"}]})", {}); }, insert("A&lt;/Name&gt;&lt;TmcardID&gt;5&lt;/TmcardID&gt;&lt;Name&gt;B &amp; co", ele("", Zero, "<RecMode>&lt;R&amp;D&gt;</RecMode>"))},
    Row{"quotes_carriage_return_and_characters_XML_cannot_carry", [](auto &c, Done &) { return c.AddSchedule(QString("'a\"\r") + QChar(1) + QChar(0xD800), "{}", {}); }, insert("&apos;a&quot;&#13;" + QString(2, QChar(0xFFFD)), "")},
    Row{"schedule_update_escapes_every_text_fills_markers_once_and_keeps_cameras_as_given", [](auto &c, Done &) { return c.UpdateSchedule("5'", "2\"", "50%1 off %2", "{}", {camera("C&1", "<3>"), camera("C&1", "<3>")}, {}); }, R"(<UpdRecTmcard><Tmcard><Revision>5&apos;</Revision><TmcardID>2&quot;</TmcardID><Name>50%1 off %2</Name><Mapping></Mapping><CamList>)" R"(<Cam><Name>C&amp;1</Name><RecGrpID>&lt;3&gt;</RecGrpID></Cam><Cam><Name>C&amp;1</Name><RecGrpID>&lt;3&gt;</RecGrpID></Cam></CamList></Tmcard></UpdRecTmcard>)"},
    Row{"customised_time_card_without_cameras_has_no_camera_list", [](auto &c, Done &) { return c.CreateCustomizeTimecard("{}", {}, {}); }, insert("KOLT2 Customize Recording", "")},
    // The insert refused with code 9 once failed the request, its cameras on no time card.
    Row{"fixed_time_card_created_meanwhile_gets_the_cameras_by_one_update", [](auto &c, Done &d) { return c.CreateDefaultContinuousTimecard({camera("C_2", "1")}, d.take()); }, insert("KOLT2 Default Continuous Recording", always("Continuous"), C2) + ReadAll + update("KOLT2 Default Continuous Recording", always("Continuous"), "<CamList><Cam><Name>C_2</Name><RecGrpID>1</RecGrpID></Cam><Cam><Name>C_6</Name><RecGrpID>1</RecGrpID></Cam></CamList>"), "ok", Taken, {}, "9", Won},
    Row{"fixed_time_card_gone_again_by_the_second_read_is_not_created_again", [](auto &c, Done &d) { return c.CreateDefaultContinuousTimecard({camera("C_2", "1")}, d.take()); }, insert("KOLT2 Default Continuous Recording", always("Continuous"), C2) + ReadAll, "failed", Taken, {}, "9", "<GetRecTmcardRes/>"},
    Row{"default_event_time_card", [](auto &c, Done &) { return c.CreateDefaultEventTimecard({}, {}); }, insert("KOLT2 Default Event Recording", always("Event"))},
    Row{"camera_given_and_present_stands_once_as_given", [](auto &c, Done &) { return c.UpdateDefaultEventTimecard({{"Revision", "5"}, {"TmcardID", "2"}, {"CamList", QList<QVariant>{camera("C_1", "1"), camera("C_2", "1")}}}, {camera("C_1", "4")}, {}); }, update("KOLT2 Default Event Recording", always("Event"), "<CamList><Cam><Name>C_1</Name><RecGrpID>4</RecGrpID></Cam><Cam><Name>C_2</Name><RecGrpID>1</RecGrpID></Cam></CamList>")},
    Row{"camera_given_twice_stands_once", [](auto &c, Done &) { return c.UpdateCustomizeTimecard({{"Revision", "5"}, {"TmcardID", "2"}}, "{}", {camera("C_3", "1"), camera("C_3", "2")}, {}); }, update("KOLT2 Customize Recording", "", "<CamList><Cam><Name>C_3</Name><RecGrpID>1</RecGrpID></Cam></CamList>")},
    Row{"delete_escapes_revision_and_identifier", [](auto &c, Done &) { return c.DeleteSchedule({{"Revision", "<3>"}, {"TmcardID", "4&"}, {"Name", "x"}}, {}); }, "<DelTmcard><Revision>&lt;3&gt;</Revision><TmcardID>4&amp;</TmcardID></DelTmcard>"},
    Row{"delete_without_a_revision_sends_nothing", [](auto &c, Done &) { return c.DeleteSchedule({{"TmcardID", "4"}}, {}); }, ""},
    Row{"removed_camera_leaves_kept_ones_get_RecGrpID", [](auto &c, Done &d) { return c.RemoveTimecardCameraList(3, {camera("C_2", "4")}, d.take()); }, Read3 + back(Kept13), "ok", {}, answer(Three)},
    Row{"removing_every_camera_drops_the_camera_list", [](auto &c, Done &d) { return c.RemoveTimecardCameraList(3, {camera("C_3", "4"), camera("C_1", "4"), camera("C_2", "4")}, d.take()); }, Read3 + back(""), "ok", {}, answer(Three)},
    Row{"names_are_compared_exactly", [](auto &c, Done &d) { return c.RemoveTimecardCameraList(3, {camera("C_1", "4")}, d.take()); }, Read3 + back("<CamList><Cam><Name>C_10</Name><RecGrpID>1</RecGrpID></Cam></CamList>"), "ok", {}, answer("<CamList><Cam><Name>C_10</Name><GrpID>1</GrpID></Cam></CamList>")},
    Row{"white_space_inside_the_camera_list_is_tolerated", [](auto &c, Done &d) { return c.RemoveTimecardCameraList(3, {camera("C_2", "4")}, d.take()); }, Read3 + back("<CamList><Cam><Name>C_1</Name><RecGrpID>1</RecGrpID></Cam></CamList>"), "ok", {}, answer("<CamList>\r\n  <Cam>\n    <Name>C_1</Name>\n    <GrpID>1</GrpID>\n  </Cam>\n  <Cam><Name>C_2</Name> <GrpID>2</GrpID></Cam>\n</CamList>")},
    Row{"any_camera_name_is_kept", [](auto &c, Done &d) { return c.RemoveTimecardCameraList(3, {camera("C_2", "4")}, d.take()); }, Read3 + back("<CamList><Cam><Name>Lobby &amp; Hall</Name><RecGrpID>12</RecGrpID></Cam><Cam><Name>cam-3</Name><RecGrpID>1</RecGrpID></Cam></CamList>"), "ok", {}, answer("<CamList><Cam><Name>Lobby &amp; Hall</Name><GrpID>12</GrpID></Cam><Cam><Name>cam-3</Name><GrpID>1</GrpID><Extra/></Cam></CamList>")},
    Row{"removal_keeps_elements_after_the_camera_list", [](auto &c, Done &d) { return c.RemoveTimecardCameraList(3, {camera("C_2", "4")}, d.take()); }, Read3 + back(Kept13, "<Extra>1</Extra>"), "ok", {}, answer(Three, "<Extra>1</Extra>")},
    Row{"removal_from_a_time_card_without_cameras_sends_it_unchanged", [](auto &c, Done &d) { return c.RemoveTimecardCameraList(3, {camera("C_1", "4")}, d.take()); }, Read3 + back(""), "ok", {}, answer("")},
    Row{"white_space_around_the_answer_is_ignored", [](auto &c, Done &d) { return c.RemoveTimecardCameraList(3, {camera("C_2", "4")}, d.take()); }, Read3 + back(Kept13), "ok", {}, "\r\n " + answer(Three) + " \n"},
    Row{"removal_checks_the_answer_frame", [](auto &c, Done &d) { return c.RemoveTimecardCameraList(3, {camera("C_1", "4")}, d.take()); }, Read3, "failed", Removal, "<InsRecTmcardRes>" + Head + Three + "</Tmcard></InsRecTmcardRes>"},
    Row{"camera_list_that_cannot_be_read_sends_nothing", [](auto &c, Done &d) { return c.RemoveTimecardCameraList(3, {camera("C_1", "4")}, d.take()); }, Read3, "failed", Removal, answer("<!-- <CamList> -->" + Three)},
    Row{"failed_read_sends_nothing", [](auto &c, Done &d) { return c.RemoveTimecardCameraList(3, {camera("C_1", "4")}, d.take()); }, Read3, "failed", Removal, "<GetRecTmcardRes>"},
    Row{"cameras_replaced", [](auto &c, Done &d) { return c.UpdateTimecardCameraList(answer(Three), {camera("C_9", "4")}, d.take(), 0); }, back(New9), "ok"},
    Row{"empty_list_removes_the_camera_list", [](auto &c, Done &d) { return c.UpdateTimecardCameraList(answer(Three), {}, d.take(), 0); }, back(""), "ok"},
    Row{"time_card_without_cameras_gets_the_list_last", [](auto &c, Done &d) { return c.UpdateTimecardCameraList(answer(""), {camera("C_9", "4")}, d.take(), 0); }, back(New9), "ok"},
    Row{"update_keeps_elements_after_the_camera_list", [](auto &c, Done &d) { return c.UpdateTimecardCameraList(answer(Three, "<Extra>1</Extra>"), {camera("C_9", "4")}, d.take(), 0); }, back(New9, "<Extra>1</Extra>"), "ok"},
    Row{"declaration_and_white_space_before_the_answer_are_skipped", [](auto &c, Done &d) { return c.UpdateTimecardCameraList("\n<?xml version=\"1.0\"?>\n" + answer(Three), {camera("C_9", "4")}, d.take(), 0); }, back(New9), "ok"},
    Row{"update_checks_the_answer_frame", [](auto &c, Done &d) { return c.UpdateTimecardCameraList("<InsRecTmcardRes>" + Head + "</Tmcard></InsRecTmcardRes>", {}, d.take(), 0); }, ""},
    Row{"unclosed_camera_list_is_refused", [](auto &c, Done &d) { return c.UpdateTimecardCameraList(answer("<CamList><Cam><Name>C_1</Name></Cam>"), {}, d.take(), 0); }, ""},
    Row{"update_from_an_empty_answer_is_refused", [](auto &c, Done &d) { return c.UpdateTimecardCameraList("", {}, d.take(), 0); }, ""}),
    [](const auto &row) { return row.param.name; });
// clang-format on

const QMap<QString, QVariant> Summary{{"Revision", "5"}, {"TmcardID", "2"}};

struct Operation
{
    std::string name;
    QString sent;       // the last request: command, time-out, whose identity
    QString handler;    // the answer handler named in its error records
    QString unreadable; // the record when its answer cannot be read; empty: the answer is not read
    std::function<bool(IRecordingSettingControl &, Done &)> start;
    friend void PrintTo(const Operation &op, std::ostream *out) { *out << op.name; }
};

class SendPath : public testing::TestWithParam<Operation>
{};

// What the server answers to a request that it accepts.
const QMap<QString, QString> Contents{
    {"GetRecTmcard", answer(Three)},
    {"InsRecTmcard", "<InsRecTmcardRes><TmcardID>42</TmcardID></InsRecTmcardRes>"}};

TEST_P(SendPath, OneRequestThenOneCompletionWithTheTunnelsFlag)
{
    const Operation &op = GetParam();
    const QString command = op.sent.section(' ', 0, 0);
    const Answer answers[] = {{true, "0", {}, false},         // accepted
                              {true, "00", {}, true},         // a code other than exactly "0"
                              {false, "0", {}, true},         // a failed exchange
                              {true, "0", "<Tmcard>", true}}; // an answer that cannot be read
    for (const Answer &told : answers) {
        TestLog log;
        log.attach();
        TestTunnel tunnel(TestTunnel::Delivery::Held);
        // Earlier requests are answered as the server would, the last one as told.
        tunnel.setResponder([&](const TestTunnel::Sent &sent) {
            Answer given = sent.command == command ? told : Answer{true, "0", {}, told.flag};
            if (given.content.isEmpty())
                given.content = Contents.value(sent.command);
            return given;
        });
        auto control = makeControl(&tunnel);
        int first = 0, requester = 0;
        control->SetClientID(&first);
        control->SetClientID(&requester); // the last writer wins
        Done done;
        ASSERT_TRUE(op.start(*control, done));
        const QWeakPointer<IRecordingSettingControl> watch = control;
        control.reset();
        EXPECT_FALSE(watch.isNull()) << "each request holds its control";
        tunnel.deliverAll();
        EXPECT_TRUE(watch.isNull());

        const TestTunnel::Sent sent = tunnel.sent().last();
        const char *identity = sent.clientId == &requester       ? "requester"
                               : sent.clientId == tunnel.ownId() ? "tunnel"
                                                                 : "other";
        EXPECT_EQ(QString("%1 %2 %3").arg(sent.command).arg(sent.timeoutMs).arg(identity), op.sent);
        EXPECT_EQ(sent.pluginId, "942E5F3F02EE4D7C879BADCD754F983C");
        EXPECT_TRUE(sent.kind == 1 && !sent.requestFlag && sent.extra.isEmpty());
        QStringList records;
        if (!told.ok || told.code != "0")
            records << QString("RecordingSettingControl::%1, %1 failed: success:%2, reqRespCode:%3")
                           .arg(op.handler, told.ok ? "1" : "0", told.code);
        else if (!told.content.isEmpty() && !op.unreadable.isEmpty())
            records << "RecordingSettingControl::" + op.unreadable;
        EXPECT_EQ(log.texts(2), records);
        EXPECT_EQ(done.calls, 1);
        EXPECT_EQ(done.ok, records.isEmpty());
        EXPECT_EQ(done.flag, told.flag);
    }
    TestTunnel refusing; // refuses the last request: a removal has sent its read by then
    refusing.setResponder([](auto &) {
        return TestTunnel::Answer{true, "0", answer(Three), true};
    });
    refusing.setRefusal([&](const TestTunnel::Sent &sent) { return sent.command == command; });
    Done refused;
    const bool started = op.start(*makeControl(&refusing), refused);
    EXPECT_EQ(started, !refusing.sent().isEmpty());
    EXPECT_EQ(refused.calls, started ? 1 : 0) << "once, when the operation has started";
    EXPECT_FALSE(refused.ok || op.start(*makeControl(nullptr), refused));
}

const QString Result = "HdlrTunnelReqCallback";

// clang-format off
INSTANTIATE_TEST_SUITE_P(EveryOperation, SendPath, testing::Values(
    Operation{"read_all", "GetRecTmcard 15000 tunnel", "HdlrTunnelReqGetRecTimecard", "HdlrTunnelReqGetRecTimecard, parse Get Recording Timecard failed.", [](auto &c, Done &d) { return c.GetAllScheduleTimecardInfo(d.take<const QList<QVariant> &, const QString &>()); }},
    Operation{"read_one", "GetRecTmcard 15000 tunnel", "HdlrTunnelReqGetRecTimecard", "HdlrTunnelReqGetRecTimecard, parse Get Recording Timecard failed.", [](auto &c, Done &d) { return c.GetScheduleTimecardInfoById(3, d.take<const QList<QVariant> &, const QString &>()); }},
    Operation{"remove_ten_cameras", "UpdRecTmcard 20000 tunnel", Result, {}, [](auto &c, Done &d) { return c.RemoveTimecardCameraList(3, cameras(10), d.take()); }},
    Operation{"create_default_continuous_with_eight_cameras", "InsRecTmcard 16000 tunnel", Result, {}, [](auto &c, Done &d) { return c.CreateDefaultContinuousTimecard(cameras(8), d.take()); }},
    Operation{"create_default_event_with_seven_cameras", "InsRecTmcard 15000 tunnel", Result, {}, [](auto &c, Done &d) { return c.CreateDefaultEventTimecard(cameras(7), d.take()); }},
    Operation{"create_customised_with_ten_cameras", "InsRecTmcard 15000 tunnel", Result, {}, [](auto &c, Done &d) { return c.CreateCustomizeTimecard("{}", cameras(10), d.take()); }},
    Operation{"update_default_continuous_with_ten_cameras", "UpdRecTmcard 15000 tunnel", Result, {}, [](auto &c, Done &d) { return c.UpdateDefaultContinuousTimecard(Summary, cameras(10), d.take()); }},
    Operation{"update_default_event_with_eight_cameras", "UpdRecTmcard 15000 tunnel", Result, {}, [](auto &c, Done &d) { return c.UpdateDefaultEventTimecard(Summary, cameras(8), d.take()); }},
    Operation{"update_customised_with_ten_cameras", "UpdRecTmcard 15000 tunnel", Result, {}, [](auto &c, Done &d) { return c.UpdateCustomizeTimecard(Summary, "{}", cameras(10), d.take()); }},
    Operation{"add_schedule", "InsRecTmcard 15000 requester", "HdlrAddScheduleCallback", "HdlrAddScheduleCallback, parse InsRecTmcardRes failed.", [](auto &c, Done &d) { return c.AddSchedule("S", "{}", d.take<const QString &>()); }},
    Operation{"update_schedule_with_ten_cameras", "UpdRecTmcard 20000 requester", Result, {}, [](auto &c, Done &d) { return c.UpdateSchedule("5", "2", "S", "{}", cameras(10), d.take()); }},
    Operation{"delete_schedule", "DelTmcard 15000 requester", Result, {}, [](auto &c, Done &d) { return c.DeleteSchedule(Summary, d.take()); }},
    Operation{"camera_list_update_below_the_least_time_out", "UpdRecTmcard 15000 requester", Result, {}, [](auto &c, Done &d) { return c.UpdateTimecardCameraList(answer(Three), {}, d.take(), 9000); }},
    Operation{"camera_list_update_with_a_longer_time_out", "UpdRecTmcard 40000 requester", Result, {}, [](auto &c, Done &d) { return c.UpdateTimecardCameraList(answer(Three), {}, d.take(), 40000); }}),
    [](const auto &op) { return op.param.name; });
// clang-format on

// The time-out of a send that goes through the cameras of a time card, for
// the control and the camera-assignment workflow alike. The workflow once
// counted in int, which overflows from 1,073,742 cameras on.
TEST(CameraTimeOut, GrowsWithTheCamerasAndSaturates)
{
    const std::tuple<const char *, qint64, int> rows[] = {
        {"no cameras, or a negative count, get the least time-out", -5, 15000},
        {"eight cameras get 2000 ms each", 8, 16000},
        {"1,073,742 cameras saturate instead of wrapping", 1073742, 2147483647},
        {"the largest count saturates", std::numeric_limits<qint64>::max(), 2147483647}};
    for (const auto &[name, cameras, ms] : rows)
        EXPECT_EQ(PluginRecordingScheduleSettingCommon::Timeout::forCameras(cameras), ms) << name;
}

} // namespace
