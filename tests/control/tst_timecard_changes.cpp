// The operations that change time cards: time-outs, camera lists, refusals,
// the edit of a time card read from the server, and the lookups by name.
#include "ControlTestSupport.h"

#include <QRegularExpression>

namespace {

QList<QVariant> cameras(int count)
{
    QList<QVariant> list;
    for (int i = 1; i <= count; ++i)
        list << camera(QStringLiteral("C_%1").arg(i), "1");
    return list;
}

// The cameras of a sent body as "name:group" in order.
QString sentCameras(const TestTunnel &tunnel)
{
    QStringList found;
    const QRegularExpression cam("<Cam><Name>([^<]*)</Name><RecGrpID>([^<]*)</RecGrpID></Cam>");
    for (const auto &match : cam.globalMatch(tunnel.sent().last().body))
        found << match.captured(1) + ":" + match.captured(2);
    return found.join(' ');
}

TEST(Timeouts, TwoSecondsPerGivenCameraWhereTheOperationAllowsIt)
{
    TestTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    const QMap<QString, QVariant> summary{{"Revision", "1"}, {"TmcardID", "1"}};
    const QString answer = "<GetRecTmcardRes><Tmcard><Name>n</Name></Tmcard></GetRecTmcardRes>";
    control.UpdateSchedule("1", "1", "n", "{}", cameras(10), {});
    control.UpdateCustomizeTimecard(summary, "{}", cameras(10), {});
    control.CreateDefaultContinuousTimecard(cameras(7), {});
    control.CreateDefaultEventTimecard(cameras(8), {});
    control.UpdateDefaultEventTimecard(summary, cameras(8), {});
    control.UpdateTimecardCameraList(
        answer, {}, [](bool, bool) {}, 9000);
    control.UpdateTimecardCameraList(
        answer, {}, [](bool, bool) {}, 40000);
    QList<int> timeouts;
    for (const auto &sent : tunnel.sent())
        timeouts << sent.timeoutMs;
    EXPECT_EQ(timeouts, QList<int>({20000, 15000, 15000, 16000, 15000, 15000, 40000}));
}

TEST(CameraLists, FixedTimecardUpdatesMergeCamerasByName)
{
    const struct
    {
        const char *name;
        QList<QVariant> given;
        QVariant present;
        QString expected;
    } rows[] = {
        {"given first then present",
         {camera("C_7", "2")},
         QList<QVariant>{camera("C_1", "1")},
         "C_7:2 C_1:1"},
        {"camera given and present stands once, as given",
         {camera("C_1", "4")},
         QList<QVariant>{camera("C_1", "1"), camera("C_2", "1")},
         "C_1:4 C_2:1"},
        {"camera given twice stands once",
         {camera("C_3", "1"), camera("C_3", "2")},
         QVariant(),
         "C_3:1"},
        {"lone present camera is read as a list of one", {}, camera("C_5", "5"), "C_5:5"},
        {"no cameras at all send no camera list", {}, QVariant(), ""},
    };
    for (const auto &row : rows) {
        TestTunnel tunnel;
        RecordingSettingControl control(&tunnel);
        QMap<QString, QVariant> summary{{"Revision", "5"}, {"TmcardID", "2"}};
        if (row.present.isValid())
            summary.insert("CamList", row.present);
        for (int op = 0; op < 3; ++op) {
            if (op == 0)
                control.UpdateDefaultContinuousTimecard(summary, row.given, {});
            else if (op == 1)
                control.UpdateDefaultEventTimecard(summary, row.given, {});
            else
                control.UpdateCustomizeTimecard(summary, "{}", row.given, {});
            EXPECT_EQ(sentCameras(tunnel), row.expected) << row.name << " op " << op;
            EXPECT_EQ(tunnel.sent().last().body.contains("<CamList>"), !row.expected.isEmpty())
                << row.name;
        }
    }
}

TEST(CameraLists, CreateAndUpdateScheduleSendExactlyTheGivenCameras)
{
    TestTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    control.CreateCustomizeTimecard("{}", {}, {});
    EXPECT_FALSE(tunnel.sent().last().body.contains("CamList"));
    control.UpdateSchedule("1", "2", "n", "{}", {camera("C_2", "1"), camera("C_2", "1")}, {});
    EXPECT_EQ(sentCameras(tunnel), "C_2:1 C_2:1");
}

TEST(DeleteSchedule, SendsRevisionAndIdentifierOrRefusesWhenEitherIsEmpty)
{
    TestTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    int calls = 0;
    const ControlResultCallback done = [&](bool, bool) { ++calls; };
    EXPECT_FALSE(control.DeleteSchedule({{"TmcardID", "4"}}, done));
    EXPECT_FALSE(control.DeleteSchedule({{"Revision", "3"}, {"TmcardID", ""}}, done));
    EXPECT_TRUE(tunnel.sent().isEmpty());
    EXPECT_EQ(calls, 0);
    EXPECT_TRUE(control.DeleteSchedule({{"Revision", 3}, {"TmcardID", "4"}, {"Name", "x"}}, done));
    EXPECT_EQ(tunnel.sent().last().body,
              "<DelTmcard><Revision>3</Revision><TmcardID>4</TmcardID></DelTmcard>");
    EXPECT_EQ(calls, 1);
}

struct EditRow
{
    const char *name;
    QString answer;
    QList<QVariant> cameras;
    QString expected; // null: nothing is sent
};

void PrintTo(const EditRow &row, std::ostream *out)
{
    *out << row.name;
}

const QString Head = QStringLiteral("<Tmcard><Revision>7</Revision><TmcardID>3</TmcardID>"
                                    "<Name>50%1 off</Name><Mapping><Ele>x</Ele></Mapping>");
const QString OldCameras =
    QStringLiteral("<CamList><Cam><Name>C_1</Name><GrpID>1</GrpID></Cam></CamList>");
const QString NewCameras =
    QStringLiteral("<CamList><Cam><Name>C_9</Name><RecGrpID>4</RecGrpID></Cam></CamList>");

QString answerOf(const QString &timecard)
{
    return "<GetRecTmcardRes>" + timecard + "</GetRecTmcardRes>";
}

QString updateOf(const QString &timecard)
{
    return "<UpdRecTmcard>" + timecard + "</UpdRecTmcard>";
}

class CameraListEdit : public ::testing::TestWithParam<EditRow>
{};

TEST_P(CameraListEdit, TimecardGoesBackWithOnlyItsCameraListReplaced)
{
    const EditRow &row = GetParam();
    TestTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    int requester = 0;
    control.SetClientID(&requester);
    Completion done;
    const bool sent = control.UpdateTimecardCameraList(row.answer, row.cameras, done.result(), 0);
    EXPECT_EQ(sent, !row.expected.isNull());
    EXPECT_EQ(done.calls, sent ? 1 : 0);
    if (!sent) {
        EXPECT_TRUE(tunnel.sent().isEmpty());
        return;
    }
    EXPECT_EQ(tunnel.sent().last().body, row.expected);
    EXPECT_EQ(tunnel.sent().last().clientId, &requester);
}

// clang-format off
INSTANTIATE_TEST_SUITE_P(Answers, CameraListEdit, ::testing::Values(
    EditRow{"CamerasReplaced", answerOf(Head + OldCameras + "</Tmcard>"), {camera("C_9", "4")}, updateOf(Head + NewCameras + "</Tmcard>")},
    EditRow{"EmptyListRemovesTheCameraList", answerOf(Head + OldCameras + "</Tmcard>"), {}, updateOf(Head + "</Tmcard>")},
    EditRow{"NoCameraListGetsOneLast", answerOf(Head + "</Tmcard>"), {camera("C_9", "4")}, updateOf(Head + NewCameras + "</Tmcard>")},
    EditRow{"EmptyCameraListElementIsReplaced", answerOf(Head + "<CamList/></Tmcard>"), {camera("C_9", "4")}, updateOf(Head + NewCameras + "</Tmcard>")},
    EditRow{"ElementAfterTheCameraListIsKept", answerOf(Head + OldCameras + "<Extra>1</Extra></Tmcard>"), {camera("C_9", "4")}, updateOf(Head + NewCameras + "<Extra>1</Extra></Tmcard>")},
    EditRow{"DeclarationAndWhiteSpaceSkipped", "\n <?xml version=\"1.0\"?>\n" + answerOf(Head + OldCameras + "</Tmcard>") + "\n", {camera("C_9", "4")}, updateOf(Head + NewCameras + "</Tmcard>")},
    EditRow{"AnswerOfAnotherKindIsRefused", "<InsRecTmcardRes><Tmcard></Tmcard></InsRecTmcardRes>", {}, QString()},
    EditRow{"TruncatedAnswerIsRefused", answerOf(Head + OldCameras).chopped(1), {}, QString()},
    EditRow{"UnclosedCameraListIsRefused", answerOf(Head + "<CamList><Cam><Name>C_1</Name></Cam></Tmcard>"), {}, QString()},
    EditRow{"IllFormedTimecardIsRefused", answerOf("<Tmcard><Name>a</Tmcard>"), {}, QString()},
    EditRow{"EmptyAnswerIsRefused", QString(""), {}, QString()}),
    [](const auto &info) { return std::string(info.param.name); });
// clang-format on

TEST(CameraListEdit, WithoutCompletionNothingIsSent)
{
    TestTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    EXPECT_FALSE(control.UpdateTimecardCameraList(answerOf(Head + "</Tmcard>"), {}, {}, 0));
    EXPECT_TRUE(tunnel.sent().isEmpty());
}

QVariant timecard(const QString &name, const QString &revision, const QVariant &cameraList)
{
    QMap<QString, QVariant> entry{
        {"Name", name}, {"Revision", revision}, {"TmcardID", "1" + revision}};
    if (cameraList.isValid())
        entry.insert("CamList", cameraList);
    return entry;
}

TEST(Lookups, FixedTimecardsAreFoundByTheirExactName)
{
    RecordingSettingControl control(nullptr);
    const QVariant one = QMap<QString, QVariant>{{"Cam", camera("C_1", "1")}};
    const QVariant two =
        QMap<QString, QVariant>{{"Cam", QList<QVariant>{camera("C_1", "1"), camera("C_2", "2")}}};
    const QList<QVariant> list{
        timecard("KOLT2 Default Continuous Recording", "4", one),
        timecard("kolt2 default event recording", "5", two),
        timecard("KOLT2 Customize Recording", "6", QVariant()),
        timecard("KOLT2 Customize Recording", "7", two),
    };
    EXPECT_EQ(control.GetDefaultContinousTimecardInfo(list),
              (QMap<QString, QVariant>{{"Revision", "4"},
                                       {"TmcardID", "14"},
                                       {"CamList", QList<QVariant>{camera("C_1", "1")}}}));
    EXPECT_TRUE(control.GetDefaultEventTimecardInfo(list).isEmpty());
    const auto customize = control.GetCustomizeTimecardInfo(list);
    EXPECT_EQ(customize.value("Revision"), "7") << "a later time card of the name overwrites";
    EXPECT_EQ(customize.value("CamList").toList().size(), 2);
    EXPECT_FALSE(control.GetCustomizeTimecardInfo(list.mid(0, 3)).contains("CamList"));
    EXPECT_TRUE(control.GetDefaultContinousTimecardInfo({}).isEmpty());
}

} // namespace
