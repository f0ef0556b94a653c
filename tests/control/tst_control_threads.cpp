// The control with answers delivered on the tunnel's own thread while the
// host's thread keeps sending, changing the client identity and replacing
// the control.
#include "ControlTestSupport.h"

#include <QSharedPointer>

#include <atomic>

namespace {

const QMap<QString, QVariant> Summary{{"Revision", "5"}, {"TmcardID", "2"}};

TEST(Lifetime, ControlReplacedWhileAnswersArriveOnTheTunnelsThread)
{
    TestTunnel tunnel(TestTunnel::Delivery::OtherThread);
    std::atomic<int> calls{0};
    std::atomic<int> flagged{0};
    int identities[2] = {};
    int sends = 0;
    QSharedPointer<RecordingSettingControl> control;
    for (int round = 0; round < 200; ++round) {
        if (round % 10 == 0)
            control = QSharedPointer<RecordingSettingControl>::create(&tunnel);
        control->SetClientID(&identities[round % 2]);
        const ControlResultCallback done = [&](bool, bool flag) {
            ++calls;
            flagged += flag ? 0 : 1;
        };
        sends += control->DeleteSchedule(Summary, done) ? 1 : 0;
        sends += control->RemoveTimecardCameraList(round, {camera("C_1", "1")}, done) ? 1 : 0;
    }
    control.reset();
    tunnel.waitIdle();
    EXPECT_EQ(sends, 400);
    EXPECT_EQ(calls, sends);
    EXPECT_EQ(flagged, sends);
}

} // namespace
