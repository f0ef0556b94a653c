// Feeds arbitrary bodies to the recording server. The first byte picks the
// command (or a seed); the rest is the body as UTF-8. Checked on every input:
// nothing crashes, every answer is well-formed XML with a numeric code, and a
// refused request or seed leaves the database exactly as it was.

#include "RecordingServer.h"

#include <QString>
#include <QXmlStreamReader>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <memory>

namespace {

const char *const kCommands[] = {"GetRecTmcard", "InsRecTmcard", "UpdRecTmcard", "DelTmcard",
                                 "Bogus"};

RecordingServer &server()
{
    static const std::unique_ptr<RecordingServer> instance = [] {
        auto created = std::make_unique<RecordingServer>(QStringLiteral(":memory:"));
        if (created->open().refused())
            std::abort();
        return created;
    }();
    return *instance;
}

void check(bool condition, const char *what, const ServerAnswer &answer = {})
{
    if (condition)
        return;
    std::fprintf(stderr, "%s\ncode %s\n%s\n", what, qPrintable(answer.code),
                 qPrintable(answer.content));
    std::abort();
}

// Well-formed, and only characters XML can carry: the reader lets a lone
// surrogate through (a refusal quoting input cut in the middle of a pair).
bool wellFormed(const QString &xml)
{
    for (qsizetype i = 0; i < xml.size(); ++i) {
        const char16_t c = xml[i].unicode();
        if (QChar::isHighSurrogate(c) && i + 1 < xml.size() && xml[i + 1].isLowSurrogate())
            ++i;
        else if (QChar::isSurrogate(c) || c >= 0xFFFE ||
                 (c < 0x20 && c != '\t' && c != '\n' && c != '\r'))
            return false;
    }
    QXmlStreamReader reader(xml);
    while (!reader.atEnd())
        reader.readNext();
    return !reader.hasError();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size)
{
    if (size == 0)
        return 0;
    RecordingServer &recServer = server();
    const QString body = QString::fromUtf8(reinterpret_cast<const char *>(data + 1),
                                           static_cast<qsizetype>(size - 1));
    QString before = recServer.dump();
    // Keep the state small: what the fuzzer inserted is not what it is after.
    if (before.size() > 200000) {
        check(!recServer.seed(QStringLiteral("<GetRecTmcardRes></GetRecTmcardRes>")).refused(),
              "reset");
        before = recServer.dump();
    }
    const unsigned selector = data[0] % 6;
    if (selector == 5) {
        if (recServer.seed(body).refused())
            check(recServer.dump() == before, "refused seed changed the state");
        return 0;
    }
    const QString command = QString::fromLatin1(kCommands[selector]);
    const ServerAnswer answer = recServer.handle(command, body);
    bool numeric = false;
    answer.code.toInt(&numeric);
    check(numeric, "code not numeric", answer);
    check(wellFormed(answer.content), "answer not well-formed", answer);
    if (answer.code != QLatin1String("0") || selector == 0)
        check(recServer.dump() == before, "refusal or read changed the state", answer);
    return 0;
}
