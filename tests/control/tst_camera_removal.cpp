// Taking cameras off a time card: the update written from the server's own
// answer text, and the one completion the caller waits for.
#include "ControlTestSupport.h"
#include "TestLog.h"

namespace {

using Answer = TestTunnel::Answer;

const QString Head = QStringLiteral("<Tmcard><Revision>7</Revision><TmcardID>3</TmcardID>"
                                    "<Name>50%1 off</Name><Mapping><Ele>x</Ele></Mapping>");
const QString Failed = QStringLiteral(
    "RecordingSettingControl::HdlrRmvDefTimecardCameraList, HdlrRmvDefTimecardCameraList failed.");

QString cam(const QString &name, const QString &group)
{
    return "<Cam><Name>" + name + "</Name><GrpID>" + group + "</GrpID></Cam>";
}

QString kept(const QString &name, const QString &group)
{
    return "<Cam><Name>" + name + "</Name><RecGrpID>" + group + "</RecGrpID></Cam>";
}

QString answerOf(const QString &cameraList, const QString &after = QString())
{
    return "<GetRecTmcardRes>" + Head + cameraList + after + "</Tmcard></GetRecTmcardRes>";
}

QString updateOf(const QString &cameraList, const QString &after = QString())
{
    return "<UpdRecTmcard>" + Head + cameraList + after + "</Tmcard></UpdRecTmcard>";
}

QList<QVariant> removal(const QStringList &names)
{
    QList<QVariant> list;
    for (const QString &name : names)
        list << camera(name, "9");
    return list;
}

struct Row
{
    const char *name;
    QString answer;
    QStringList remove;
    QString expected; // null: no update goes out and the caller hears (false, flag)
};

void PrintTo(const Row &row, std::ostream *out)
{
    *out << row.name;
}

class CameraRemoval : public RecordingSettingControlTest, public ::testing::WithParamInterface<Row>
{};

TEST_P(CameraRemoval, UpdateKeepsEveryCameraNotNamedForRemoval)
{
    const Row &row = GetParam();
    TestLog log;
    log.attach();
    TestTunnel tunnel;
    tunnel.queueAnswer(Answer{true, "0", QString(), true});
    RecordingSettingControl control(&tunnel);
    Completion done;
    answerRemovalRead(control, true, true, removal(row.remove), row.answer, done.result());
    EXPECT_EQ(done.calls, 1);
    EXPECT_TRUE(done.flag);
    EXPECT_EQ(done.ok, !row.expected.isNull());
    if (row.expected.isNull()) {
        EXPECT_TRUE(tunnel.sent().isEmpty());
        EXPECT_EQ(log.texts(2), QStringList{Failed});
        return;
    }
    ASSERT_EQ(tunnel.commands(), QStringList{"UpdRecTmcard"});
    EXPECT_EQ(tunnel.sent().last().body, row.expected);
    EXPECT_EQ(tunnel.sent().last().clientId, tunnel.ownId());
}

const QString Three =
    "<CamList>" + cam("C_1", "1") + cam("C_2", "2") + cam("C_3", "3") + "</CamList>";

// clang-format off
INSTANTIATE_TEST_SUITE_P(Answers, CameraRemoval, ::testing::Values(
    Row{"MiddleCameraRemoved", answerOf(Three), {"C_2"}, updateOf("<CamList>" + kept("C_1", "1") + kept("C_3", "3") + "</CamList>")},
    Row{"RemovingEveryCameraDropsTheCameraList", answerOf(Three), {"C_3", "C_1", "C_2"}, updateOf("")},
    Row{"NoNamedCameraRewritesTheGroups", answerOf(Three), {"C_4"}, updateOf("<CamList>" + kept("C_1", "1") + kept("C_2", "2") + kept("C_3", "3") + "</CamList>")},
    Row{"NamesAreComparedExactly", answerOf("<CamList>" + cam("C_10", "1") + "</CamList>"), {"C_1"}, updateOf("<CamList>" + kept("C_10", "1") + "</CamList>")},
    Row{"LineBreaksAndIndentationKeepTheCameras", answerOf("<CamList>\n  <Cam>\n    <Name>C_1</Name>\n    <GrpID>1</GrpID>\n  </Cam>\n" "  <Cam>\r\n<Name>C_2</Name><GrpID>2</GrpID></Cam>\n</CamList>"), {"C_2"}, updateOf("<CamList>" + kept("C_1", "1") + "</CamList>")},
    Row{"CameraNamedOtherwiseIsKept", answerOf("<CamList>" + cam("Lobby &amp; Hall", "12") + cam("C_2", "2") + "<Cam><Name>cam-3</Name><GrpID>1</GrpID><Extra/></Cam></CamList>"), {"C_2"}, updateOf("<CamList>" + kept("Lobby &amp; Hall", "12") + kept("cam-3", "1") + "</CamList>")},
    Row{"ElementAfterTheCameraListIsKept", answerOf(Three, "<Extra>1</Extra>"), {"C_1", "C_2"}, updateOf("<CamList>" + kept("C_3", "3") + "</CamList>", "<Extra>1</Extra>")},
    Row{"NoCameraListSendsTheTimecardUnchanged", answerOf(""), {"C_1"}, updateOf("")},
    Row{"WhiteSpaceAroundTheAnswerIsIgnored", "\r\n " + answerOf(Three) + " \n", {"C_1", "C_3"}, updateOf("<CamList>" + kept("C_2", "2") + "</CamList>")},
    Row{"AnswerWithoutTimecardStillSendsAnUpdate", "<GetRecTmcardRes></GetRecTmcardRes>", {"C_1"}, "<UpdRecTmcard></UpdRecTmcard>"},
    Row{"AnswerOfAnotherKindSendsNothing", "<Other>" + Head + Three + "</Tmcard></Other>", {"C_1"}, QString()},
    Row{"UnreadableCameraListSendsNothing", answerOf("<CamList><Cam><Name>C_1</Cam></CamList>"), {"C_1"}, QString()},
    Row{"UnclosedCameraListSendsNothing", answerOf("<CamList>" + cam("C_1", "1")), {"C_2"}, QString()}),
    [](const auto &info) { return std::string(info.param.name); });
// clang-format on

TEST_F(RecordingSettingControlTest, FailedReadOrRefusedUpdateEndsInOneFailedCompletion)
{
    TestLog log;
    log.attach();
    TestTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    Completion readFailed;
    answerRemovalRead(control, false, true, removal({"C_1"}), QString(), readFailed.result());
    EXPECT_TRUE(tunnel.sent().isEmpty());

    tunnel.refuseNext();
    Completion refused;
    answerRemovalRead(control, true, true, removal({"C_1"}), answerOf(Three), refused.result());
    for (const Completion *done : {&readFailed, &refused}) {
        EXPECT_EQ(done->calls, 1);
        EXPECT_FALSE(done->ok);
        EXPECT_TRUE(done->flag);
    }
    EXPECT_EQ(log.texts(2), QStringList({Failed, Failed}));
}

TEST_F(RecordingSettingControlTest, UpdateTimeoutIsTwoSecondsPerRemovedCamera)
{
    TestTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    QList<int> timeouts;
    for (const int count : {10, 7, 8, 0}) {
        QStringList names;
        for (int i = 0; i < count; ++i)
            names << QStringLiteral("X_%1").arg(i);
        answerRemovalRead(control, true, false, removal(names), answerOf(Three), [](bool, bool) {});
        timeouts << tunnel.sent().last().timeoutMs;
    }
    EXPECT_EQ(timeouts, QList<int>({20000, 15000, 16000, 15000}));
}

TEST(CameraRemoval, ReadsTheTimecardByIdentifierThenUpdatesIt)
{
    REQUIRE_CONVERTER();
    TestTunnel tunnel;
    tunnel.queueAnswer(Answer{true, "0", "  " + answerOf(Three) + "\n", false});
    tunnel.queueAnswer(Answer{true, "0", QString(), true});
    RecordingSettingControl control(&tunnel);
    Completion done;
    ASSERT_TRUE(control.RemoveTimecardCameraList(3, removal({"C_2"}), done.result()));
    EXPECT_EQ(tunnel.commands(), QStringList({"GetRecTmcard", "UpdRecTmcard"}));
    EXPECT_EQ(tunnel.sent().first().body, "<GetRecTmcard><TmcardID>3</TmcardID></GetRecTmcard>");
    EXPECT_EQ(tunnel.sent().last().body,
              updateOf("<CamList>" + kept("C_1", "1") + kept("C_3", "3") + "</CamList>"));
    EXPECT_EQ(done.calls, 1);
    EXPECT_TRUE(done.ok);
    EXPECT_TRUE(done.flag);
}

TEST(CameraRemoval, RefusedReadReturnsFalseAndNeverCallsTheCompletion)
{
    TestTunnel tunnel;
    tunnel.refuseNext();
    RecordingSettingControl control(&tunnel);
    Completion done;
    EXPECT_FALSE(control.RemoveTimecardCameraList(3, removal({"C_2"}), done.result()));
    EXPECT_EQ(done.calls, 0);
}

} // namespace
