#include "ServerFixture.h"

#include <csignal>
#include <unistd.h>

// A write killed between two of its statements leaves the database as it was
// before the write. The child process is killed for real (SIGKILL) from the
// statement hook, so nothing of the transaction is committed or rolled back
// by the process itself; recovery happens when the file is opened again.

struct CrashRow
{
    const char *behaviour;
    const char *command;
    int killAtStatement;
};

class CrashMidWrite : public ServerFixture, public ::testing::WithParamInterface<CrashRow>
{
protected:
    QString bodyFor(const QString &command) const
    {
        QString cameras;
        for (int i = 0; i < 20000; ++i)
            cameras += QStringLiteral("<Cam><Name>C_%1</Name><RecGrpID>1</RecGrpID></Cam>").arg(i);
        cameras = QStringLiteral("<CamList>%1</CamList>").arg(cameras);
        if (command == QLatin1String("InsRecTmcard"))
            return insertBody(QStringLiteral("New"), weekdayMapping(), cameras);
        if (command == QLatin1String("UpdRecTmcard"))
            return updateBody(1, 2, QStringLiteral("Changed"), QString(), cameras);
        return QStringLiteral(
            "<DelTmcard><Revision>1</Revision><TmcardID>2</TmcardID></DelTmcard>");
    }
};

TEST_P(CrashMidWrite, LeavesThePreviousStateIntact)
{
    GTEST_FLAG_SET(death_test_style, "fast");
    ASSERT_EQ(
        ask(QStringLiteral("InsRecTmcard"), insertBody(QStringLiteral("Lobby"), weekdayMapping(),
                                                       cameraList({{"C_1", 1}, {"C_2", 2}})))
            .code,
        QStringLiteral("0"));
    const QString before = server->dump();
    const QString command = QString::fromUtf8(GetParam().command);
    const QString body = bodyFor(command);
    const int killAt = GetParam().killAtStatement;
    // The child opens a connection of its own: none is carried over the fork.
    close();
    EXPECT_EXIT(
        {
            RecordingServer child(path());
            if (!child.open())
                _exit(3);
            child.setStatementHook([killAt](int statement) {
                if (statement == killAt)
                    raise(SIGKILL);
            });
            child.handle(command, body);
            _exit(0); // not killed: the write had fewer statements
        },
        ::testing::KilledBySignal(SIGKILL), "");
    reopen();
    EXPECT_EQ(server->dump(), before);
    // And the database still takes writes.
    EXPECT_EQ(
        ask(QStringLiteral("UpdRecTmcard"), updateBody(1, 2, QStringLiteral("After"), QString()))
            .code,
        QStringLiteral("0"));
}

INSTANTIATE_TEST_SUITE_P(
    Statements, CrashMidWrite,
    ::testing::Values(CrashRow{"insert_after_the_time_card_row", "InsRecTmcard", 1},
                      CrashRow{"insert_among_its_cameras", "InsRecTmcard", 15000},
                      CrashRow{"update_after_the_revision_check", "UpdRecTmcard", 1},
                      CrashRow{"update_after_cameras_were_cleared", "UpdRecTmcard", 3},
                      CrashRow{"update_among_the_new_cameras", "UpdRecTmcard", 19000},
                      CrashRow{"delete_after_the_cameras_went", "DelTmcard", 2}),
    [](const ::testing::TestParamInfo<CrashRow> &info) {
        return std::string(info.param.behaviour);
    });
