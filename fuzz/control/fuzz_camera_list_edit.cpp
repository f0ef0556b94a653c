// Any text as the server's answer to a time card read: the camera list edits
// never crash, send only well-formed XML and answer their caller exactly once.
#include "FuzzTunnel.h"
#include "RecordingSettingControl.h"

#include <cstddef>
#include <cstdint>

class RecordingSettingControlTest
{
public:
    static void removeFrom(RecordingSettingControl &control, const QList<QVariant> &removal,
                           const QString &answer, ControlResultCallback done)
    {
        control.HdlrRmvDefTimecardCameraList(true, false, {}, removal, answer, std::move(done));
    }
};

namespace {

void check(bool condition, const char *what)
{
    if (!condition) {
        std::fprintf(stderr, "%s\n", what);
        std::abort();
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size)
{
    const QString input =
        QString::fromUtf8(reinterpret_cast<const char *>(data), static_cast<qsizetype>(size));
    // First line: the cameras to remove, comma-separated; the rest: the answer.
    const qsizetype lineEnd = input.indexOf(QLatin1Char('\n'));
    const QString answer = lineEnd < 0 ? input : input.mid(lineEnd + 1);
    QList<QVariant> removal;
    const QStringList names =
        (lineEnd < 0 ? QString() : input.left(lineEnd)).split(QLatin1Char(','));
    for (const QString &name : names)
        removal << QMap<QString, QVariant>{{"Name", name}};

    FuzzTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    int calls = 0;
    RecordingSettingControlTest::removeFrom(control, removal, answer,
                                            [&calls](bool, bool) { ++calls; });
    check(calls == 1, "removal did not answer exactly once");

    int edits = 0;
    const bool sent = control.UpdateTimecardCameraList(
        answer, removal, [&edits](bool, bool) { ++edits; }, 0);
    check(edits == (sent ? 1 : 0), "camera list update answered wrongly");
    return 0;
}
