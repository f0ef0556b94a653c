#pragma once

// The texts this plug-in shares with its clients and with the recording
// server, character for character ("Continous" included).

#include <QString>

#include <algorithm>
#include <limits>

namespace PluginRecordingScheduleSettingCommon {

// The plug-in's identity; also the plug-in identifier of every tunnel send.
inline const QString PluginId = QStringLiteral("942E5F3F02EE4D7C879BADCD754F983C");

namespace Command {
inline const QString DefaultContinousSchedule = QStringLiteral("DefaultContinousSchedule");
inline const QString DefaultEventSchedule = QStringLiteral("DefaultEventSchedule");
inline const QString DefaultNotRecordingSchedule = QStringLiteral("DefaultNotRecordingSchedule");
inline const QString CustomizeSchedule = QStringLiteral("CustomizeSchedule");
inline const QString GetScheduleRecInfo = QStringLiteral("GetScheduleRecInfo");
inline const QString GetCurrentScheduleInfo = QStringLiteral("GetCurrentScheduleInfo");
inline const QString AddSchedule = QStringLiteral("AddSchedule");
inline const QString UpdateSchedule = QStringLiteral("UpdateSchedule");
inline const QString UpdateCamRecSchedule = QStringLiteral("UpdateCamRecSchedule");
inline const QString GetAllScheduleRecInfo = QStringLiteral("GetAllScheduleRecInfo");
inline const QString DelSchedule = QStringLiteral("DelSchedule");
} // namespace Command

// Keys of request payloads, of the maps inside their lists and of replies.
namespace PayloadKey {
inline const QString CamRecGroupList = QStringLiteral("camRecGroupList");
inline const QString Timeframes = QStringLiteral("timeframes");
inline const QString TimeCardID = QStringLiteral("TimeCardID");
inline const QString ScheduleName = QStringLiteral("ScheduleName");
inline const QString Revision = QStringLiteral("Revision");
inline const QString CameraList = QStringLiteral("CameraList");
inline const QString ScheduleAddCam = QStringLiteral("scheduleAddCam");
inline const QString ScheduleRmvCam = QStringLiteral("scheduleRmvCam");
inline const QString ScheduleID = QStringLiteral("scheduleID");
inline const QString CamIDList = QStringLiteral("camIDList");
inline const QString RecScheduleType = QStringLiteral("RecScheduleType");
inline const QString CustomizeContent = QStringLiteral("CustomizeContent");
} // namespace PayloadKey

// Words the dispatcher binds into the default schedule workflows.
namespace ScheduleTypeWord {
inline const QString Continous = QStringLiteral("Continous");
inline const QString Event = QStringLiteral("Event");
inline const QString NotRecording = QStringLiteral("NotRecording");
inline const QString Customize = QStringLiteral("Customize");
} // namespace ScheduleTypeWord

// Reply result codes.
namespace ResultCode {
inline const QString Success = QStringLiteral("0");
inline const QString Failure = QStringLiteral("-1");
} // namespace ResultCode

// Response codes of the recording server that the plug-in acts on.
namespace ServerResponse {
// An insert refused: a time card of one of the fixed names exists already.
inline const QString FixedNameTaken = QStringLiteral("9");
} // namespace ServerResponse

// The recording server's time card commands.
namespace TunnelCommand {
inline const QString GetRecTmcard = QStringLiteral("GetRecTmcard");
inline const QString InsRecTmcard = QStringLiteral("InsRecTmcard");
inline const QString UpdRecTmcard = QStringLiteral("UpdRecTmcard");
inline const QString DelTmcard = QStringLiteral("DelTmcard");
} // namespace TunnelCommand

// Element and attribute names of time card answers, as keys of the variant tree.
namespace TimecardKey {
inline const QString GetRecTmcardRes = QStringLiteral("GetRecTmcardRes");
inline const QString InsRecTmcardRes = QStringLiteral("InsRecTmcardRes");
inline const QString Tmcard = QStringLiteral("Tmcard");
inline const QString Name = QStringLiteral("Name");
inline const QString Revision = QStringLiteral("Revision");
inline const QString GrpID = QStringLiteral("GrpID");
inline const QString TmcardID = QStringLiteral("TmcardID");
inline const QString Mapping = QStringLiteral("Mapping");
inline const QString Ele = QStringLiteral("Ele");
inline const QString Cam = QStringLiteral("Cam");
inline const QString CamList = QStringLiteral("CamList");
inline const QString Frame = QStringLiteral("Frame");
inline const QString RepeatMod = QStringLiteral("RepeatMod");
inline const QString DayList = QStringLiteral("DayList");
inline const QString Intervals = QStringLiteral("Intervals");
inline const QString RecMode = QStringLiteral("RecMode");
inline const QString AttrBegin = QStringLiteral("@B");
inline const QString AttrEnd = QStringLiteral("@E");
inline const QString DigiInput = QStringLiteral("DigiInput");
inline const QString StopUntilDIFalling = QStringLiteral("StopUntilDIFalling");
inline const QString StopUntilDIRising = QStringLiteral("StopUntilDIRising");
inline const QString Weekly = QStringLiteral("Weekly");
} // namespace TimecardKey

// The fixed names of the plug-in's own time cards.
namespace TimecardName {
inline const QString Customize = QStringLiteral("KOLT2 Customize Recording");
inline const QString DefaultContinuous = QStringLiteral("KOLT2 Default Continuous Recording");
inline const QString DefaultEvent = QStringLiteral("KOLT2 Default Event Recording");
} // namespace TimecardName

// The recording mode that carries trigger elements.
namespace RecordingMode {
inline const QString Event = QStringLiteral("Event");
} // namespace RecordingMode

// Keys of the schedule content document.
namespace DocKey {
inline const QString Rectangles = QStringLiteral("Rectangles");
inline const QString Bottom = QStringLiteral("Bottom");
inline const QString Left = QStringLiteral("Left");
inline const QString Right = QStringLiteral("Right");
inline const QString Top = QStringLiteral("Top");
inline const QString RecordingMode = QStringLiteral("RecordingMode");
inline const QString TriggerEvents = QStringLiteral("triggerEvents");
} // namespace DocKey

// Request templates; markers %1 to %5 are filled in one pass.
namespace Template {
inline const QString GetAllTimecards =
    QStringLiteral("<GetRecTmcard><TmcardAll>true</TmcardAll></GetRecTmcard>");
inline const QString GetTimecardById =
    QStringLiteral("<GetRecTmcard><TmcardID>%1</TmcardID></GetRecTmcard>");
inline const QString InsertTimecard = QStringLiteral(
    "<InsRecTmcard><Tmcard><Revision>0</Revision><TmcardID>0</TmcardID><Name>%1</Name>"
    "<Mapping>%2</Mapping>%3</Tmcard></InsRecTmcard>");
inline const QString UpdateTimecard = QStringLiteral(
    "<UpdRecTmcard><Tmcard><Revision>%1</Revision><TmcardID>%2</TmcardID><Name>%3</Name>"
    "<Mapping>%4</Mapping>%5</Tmcard></UpdRecTmcard>");
inline const QString UpdateTimecardText = QStringLiteral("<UpdRecTmcard>%1</UpdRecTmcard>");
inline const QString DeleteTimecard =
    QStringLiteral("<DelTmcard><Revision>%1</Revision><TmcardID>%2</TmcardID></DelTmcard>");
inline const QString Camera = QStringLiteral("<Cam><Name>%1</Name><RecGrpID>%2</RecGrpID></Cam>");
inline const QString CameraList = QStringLiteral("<CamList>%1</CamList>");
inline const QString MappingElement = QStringLiteral("<Ele>%1<RecMode>%2</RecMode>%3</Ele>");
inline const QString Frame = QStringLiteral(
    "<Frame><Name>%1</Name><DLMod>SingleDay</DLMod><RepeatMod>Weekly</RepeatMod>"
    "<DayList>%2</DayList><Intervals>%3</Intervals><Holiday>false</Holiday><Range><Period>"
    "<TmS>2016-03-29 00:00:00.000</TmS><TmE>2035-01-01 00:00:00.000</TmE></Period>"
    "<End>false</End></Range><RepeatFreq>1</RepeatFreq></Frame>");
inline const QString DayEntry = QStringLiteral("<Ele B=\"%1.0\"/>");
inline const QString IntervalEntry = QStringLiteral("<Ele B=\"%1\" E=\"%2\"/>");
inline const QString CustomizeFrameName = QStringLiteral("Customize time frame");
inline const QString DefaultContinuousMapping = QStringLiteral(
    "<Ele><Frame><Name>Always</Name><Holiday>false</Holiday><RepeatMod>Weekly</RepeatMod>"
    "<DLMod>SingleDay</DLMod><Intervals><Ele B=\"0\" E=\"86400\"/></Intervals><DayList>"
    "<Ele B=\"1.0\"/><Ele B=\"2.0\"/><Ele B=\"3.0\"/><Ele B=\"4.0\"/><Ele B=\"5.0\"/>"
    "<Ele B=\"6.0\"/><Ele B=\"7.0\"/></DayList><Range><Period><TmS>2016-03-29 00:00:00.000"
    "</TmS><TmE>2035-01-01 00:00:00.000</TmE></Period><End>false</End></Range><RepeatFreq>1"
    "</RepeatFreq></Frame><RecMode>Continuous</RecMode><AllEvent>true</AllEvent><Motion>true"
    "</Motion><ContMotNum>1</ContMotNum><DigiInput>3</DigiInput></Ele>");
inline const QString DefaultEventMapping = QStringLiteral(
    "<Ele><Frame><Name>Always</Name><Holiday>false</Holiday><RepeatMod>Weekly</RepeatMod>"
    "<DLMod>SingleDay</DLMod><Intervals><Ele B=\"0\" E=\"86400\"/></Intervals><DayList>"
    "<Ele B=\"1.0\"/><Ele B=\"2.0\"/><Ele B=\"3.0\"/><Ele B=\"4.0\"/><Ele B=\"5.0\"/>"
    "<Ele B=\"6.0\"/><Ele B=\"7.0\"/></DayList><Range><Period><TmS>2016-03-29 00:00:00.000"
    "</TmS><TmE>2035-01-01 00:00:00.000</TmE></Period><End>false</End></Range><RepeatFreq>1"
    "</RepeatFreq></Frame><RecMode>Event</RecMode><AllEvent>true</AllEvent><Motion>true"
    "</Motion><ContMotNum>1</ContMotNum><DigiInput>3</DigiInput></Ele>");
} // namespace Template

// Time-outs of tunnel sends, in milliseconds.
namespace Timeout {
constexpr int Minimum = 15000;
constexpr int PerCamera = 2000;

// PerCamera for each camera, never below Minimum. Counted in 64 bits and held
// to the int range: a count of cameras times 2000 in int overflows from
// 1,073,742 cameras on.
constexpr int forCameras(qint64 cameras)
{
    const qint64 total = qint64(PerCamera) * std::clamp<qint64>(cameras, 0, qint64(1) << 32);
    return int(std::clamp<qint64>(total, Minimum, std::numeric_limits<int>::max()));
}
} // namespace Timeout

} // namespace PluginRecordingScheduleSettingCommon
