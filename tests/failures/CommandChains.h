#pragma once

// Every command as the chain of exchanges it makes with the recording server,
// and a scripted server that answers them all. The failure walk and the
// threaded runs are both driven by this one table.

#include "TestTunnel.h"

#include <QVariantMap>

#include <ostream>
#include <vector>

using namespace Qt::StringLiterals;

// One exchange: the tunnel command sent; whether the answer's content is read
// (only then can an unreadable answer fail the step); and whether the control
// sends it on its own straight after its read, so that it goes even when the
// plug-in is gone, and a refusal hands on that read's flag.
struct Exchange
{
    QString command;
    bool readsAnswer = false;
    bool afterControlRead = false;
};

inline const Exchange Read{u"GetRecTmcard"_s, true};
inline const Exchange Insert{u"InsRecTmcard"_s, false};
inline const Exchange InsertNamed{u"InsRecTmcard"_s, true}; // the new identifier is read
inline const Exchange Update{u"UpdRecTmcard"_s, false};
inline const Exchange RemovalUpdate{u"UpdRecTmcard"_s, false, true};
inline const Exchange Delete{u"DelTmcard"_s, false};

struct Chain
{
    const char *name;
    QString command;
    QVariantMap payload;
    std::vector<Exchange> exchanges;
};

inline void PrintTo(const Chain &chain, std::ostream *os)
{
    *os << chain.name;
}

inline QVariantList cameras(const QStringList &names)
{
    QVariantList list;
    for (const QString &name : names)
        list << QVariantMap{{u"Name"_s, name}, {u"GrpID"_s, u"1"_s}};
    return list;
}

inline QVariantList entries(const QString &timecardId, const QString &camera)
{
    return {QVariantMap{{u"scheduleID"_s, timecardId}, {u"camIDList"_s, cameras({camera})}}};
}

inline const QString Weekdays =
    uR"({"Rectangles":[{"Left":0,"Right":5,"Top":8,"Bottom":18,"RecordingMode":"Continuous"}]})"_s;

// The server holds the default event time card 4 (C_8), "Lobby" 5 (C_1) and
// "Hall" 7 (C_3); neither the default continuous nor the customised one.
inline const std::vector<Chain> Chains = {
    {"add_schedule",
     u"AddSchedule"_s,
     {{u"ScheduleName"_s, u"Yard"_s}, {u"timeframes"_s, Weekdays}},
     {InsertNamed}},
    {"update_schedule",
     u"UpdateSchedule"_s,
     {{u"TimeCardID"_s, u"5"_s}, {u"ScheduleName"_s, u"Lobby"_s}, {u"timeframes"_s, Weekdays}},
     {Read, Update}},
    {"del_schedule", u"DelSchedule"_s, {{u"TimeCardID"_s, u"5"_s}}, {Read, Delete}},
    {"cameras_moved_between_schedules",
     u"UpdateCamRecSchedule"_s,
     {{u"scheduleRmvCam"_s, entries(u"5"_s, u"C_1"_s)},
      {u"scheduleAddCam"_s, entries(u"7"_s, u"C_1"_s)}},
     {Read, Update, Read, Update}},
    {"cameras_onto_existing_default_event",
     u"UpdateCamRecSchedule"_s,
     {{u"scheduleAddCam"_s, entries(u"-2"_s, u"C_2"_s)}},
     {Read, Read, Update}},
    {"cameras_onto_missing_default_continuous",
     u"UpdateCamRecSchedule"_s,
     {{u"scheduleAddCam"_s, entries(u"-3"_s, u"C_2"_s)}},
     {Read, Insert}},
    {"continuous_takes_camera_off_lobby",
     u"DefaultContinousSchedule"_s,
     {{u"camRecGroupList"_s, cameras({u"C_1"_s})}},
     {Read, Read, RemovalUpdate, Read, Insert}},
    {"event_onto_existing",
     u"DefaultEventSchedule"_s,
     {{u"camRecGroupList"_s, cameras({u"C_2"_s})}},
     {Read, Update}},
    {"customize_created",
     u"CustomizeSchedule"_s,
     {{u"timeframes"_s, Weekdays}, {u"camRecGroupList"_s, cameras({u"C_2"_s})}},
     {Read, Insert}},
    {"not_recording_clears_every_list",
     u"DefaultNotRecordingSchedule"_s,
     {{u"camRecGroupList"_s, cameras({u"C_1"_s})}},
     {Read, Read, RemovalUpdate, Read, RemovalUpdate, Read, RemovalUpdate}},
    {"schedule_rec_info", u"GetScheduleRecInfo"_s, {}, {Read}},
    {"current_schedule_info", u"GetCurrentScheduleInfo"_s, {}, {Read}},
    {"all_schedule_rec_info", u"GetAllScheduleRecInfo"_s, {}, {Read}},
};

inline QString timecard(int id, const QString &name, const QString &camera)
{
    return u"<Tmcard><Revision>2</Revision><TmcardID>%1</TmcardID><Name>%2</Name><Mapping>"
           "</Mapping><CamList><Cam><Name>%3</Name><GrpID>1</GrpID></Cam></CamList></Tmcard>"_s
               .arg(id)
               .arg(name, camera);
}

// Answers as the server holding the time cards above would; nothing changes
// them, so answers depend on the request alone, whichever thread asks.
inline TestTunnel::Answer serverAnswer(const TestTunnel::Sent &sent)
{
    if (sent.command == u"InsRecTmcard")
        return {true, u"0"_s, u"<InsRecTmcardRes><TmcardID>9</TmcardID></InsRecTmcardRes>"_s};
    if (sent.command != u"GetRecTmcard")
        return {};
    const QString held[] = {timecard(4, u"KOLT2 Default Event Recording"_s, u"C_8"_s),
                            timecard(5, u"Lobby"_s, u"C_1"_s), timecard(7, u"Hall"_s, u"C_3"_s)};
    QString answer;
    for (const QString &card : held) {
        const QString id = card.section(u"TmcardID>"_s, 1, 1).chopped(2);
        if (sent.body.contains(u"<TmcardAll>true"_s) ||
            sent.body.contains(u"<TmcardID>%1<"_s.arg(id)))
            answer += card;
    }
    return {true, u"0"_s, u"<GetRecTmcardRes>%1</GetRecTmcardRes>"_s.arg(answer)};
}
