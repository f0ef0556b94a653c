// Any text as a schedule name, revision, camera and schedule content
// document: every request composed from it must be well-formed XML.
#include "FuzzTunnel.h"
#include "RecordingSettingControl.h"

#include <cstddef>
#include <cstdint>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size)
{
    const QString input =
        QString::fromUtf8(reinterpret_cast<const char *>(data), static_cast<qsizetype>(size));
    // First line: the texts that go into elements; the rest: the document.
    const qsizetype lineEnd = input.indexOf(QLatin1Char('\n'));
    const QString text = lineEnd < 0 ? input : input.left(lineEnd);
    const QString document = lineEnd < 0 ? input : input.mid(lineEnd + 1);
    const QList<QVariant> cameras{QMap<QString, QVariant>{{"Name", text}, {"GrpID", text}}};
    const QMap<QString, QVariant> summary{
        {"Revision", text}, {"TmcardID", text}, {"CamList", cameras}};

    FuzzTunnel tunnel;
    RecordingSettingControl control(&tunnel);
    control.AddSchedule(text, document, {});
    control.UpdateSchedule(text, text, text, document, cameras, {});
    control.CreateCustomizeTimecard(document, cameras, {});
    control.UpdateCustomizeTimecard(summary, document, cameras, {});
    control.UpdateDefaultEventTimecard(summary, cameras, {});
    control.DeleteSchedule(summary, {});
    return 0;
}
