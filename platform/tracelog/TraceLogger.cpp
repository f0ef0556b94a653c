#include "TraceLogger.h"

#include <chrono>
#include <cstdlib>
#include <cstring>
#include <ctime>

namespace {

constexpr std::uint32_t MaxModules = 0xffffff;
constexpr std::size_t MaxSourceName = 128;

// What wants() accepted, waiting for the write() that follows on this thread.
struct Pending
{
    const TraceLogger *logger = nullptr;
    std::uint32_t selector = 0;
    int sourceLine = 0;
    char sourceFile[MaxSourceName] = {};
};
thread_local Pending t_pending;

const char *baseName(const char *path)
{
    const char *slash = std::strrchr(path, '/');
    return slash ? slash + 1 : path;
}

std::string timestamp()
{
    using namespace std::chrono;
    const auto now = system_clock::now();
    const std::time_t seconds = system_clock::to_time_t(now);
    const auto millis = duration_cast<milliseconds>(now.time_since_epoch()).count() % 1000;
    std::tm utc{};
    gmtime_r(&seconds, &utc);
    char text[32];
    const std::size_t length = std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%S", &utc);
    std::snprintf(text + length, sizeof text - length, ".%03dZ", static_cast<int>(millis));
    return text;
}

std::string format(const char *format, std::va_list args)
{
    char small[512];
    std::va_list again;
    va_copy(again, args);
    const int needed = std::vsnprintf(small, sizeof small, format, args);
    if (needed < 0) {
        va_end(again);
        return "(record could not be formatted)";
    }
    if (static_cast<std::size_t>(needed) < sizeof small) {
        va_end(again);
        return std::string(small, static_cast<std::size_t>(needed));
    }
    const std::size_t kept = std::min(static_cast<std::size_t>(needed), TraceLogger::MaxText);
    std::string text(kept + 1, '\0');
    std::vsnprintf(text.data(), text.size(), format, again);
    va_end(again);
    text.resize(kept);
    if (static_cast<std::size_t>(needed) > kept)
        text += "...(cut)";
    return text;
}

// A record is one line: control characters in its text are written escaped,
// so an answer's text cannot forge or split records.
void appendEscaped(std::string &line, const std::string &text)
{
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte >= 0x20 && byte != 0x7f && byte != '\\') {
            line += c;
        } else if (c == '\\') {
            line += "\\\\";
        } else if (c == '\n') {
            line += "\\n";
        } else if (c == '\r') {
            line += "\\r";
        } else if (c == '\t') {
            line += "\\t";
        } else {
            char escaped[5];
            std::snprintf(escaped, sizeof escaped, "\\x%02x", byte);
            line += escaped;
        }
    }
}

int parseLevel(const char *text)
{
    if (!text || !*text)
        return TraceLogger::DefaultThreshold;
    char *end = nullptr;
    const long level = std::strtol(text, &end, 10);
    if (*end != '\0' || level < 0 || level > 255)
        return TraceLogger::DefaultThreshold;
    return static_cast<int>(level);
}

} // namespace

TraceLogger::TraceLogger(Destination destination, int threshold)
    : m_destination(destination), m_threshold(threshold)
{}

TraceLogger::~TraceLogger()
{
    if (m_destination.owned && m_destination.stream)
        std::fclose(m_destination.stream);
}

std::unique_ptr<TraceLogger> TraceLogger::fromEnvironment()
{
    Destination destination;
    const char *file = std::getenv("QIRNLOG_FILE");
    if (file && std::strcmp(file, "stderr") == 0) {
        destination.stream = stderr;
    } else if (file && *file) {
        // An unwritable path turns logging off rather than failing the host.
        destination.stream = std::fopen(file, "ae");
        destination.owned = destination.stream != nullptr;
    }
    return std::make_unique<TraceLogger>(destination, parseLevel(std::getenv("QIRNLOG_LEVEL")));
}

std::int32_t TraceLogger::registerModule(const char *name)
{
    if (!name)
        return 0;
    const std::lock_guard<std::mutex> lock(m_mutex);
    for (std::size_t i = 0; i < m_modules.size(); ++i) {
        if (m_modules[i] == name)
            return static_cast<std::int32_t>(i + 1);
    }
    if (m_modules.size() >= MaxModules)
        return 0;
    m_modules.emplace_back(name);
    return static_cast<std::int32_t>(m_modules.size());
}

bool TraceLogger::wants(std::uint32_t selector, const char *sourceFile, int sourceLine)
{
    const auto level = static_cast<int>(selector & 0xff);
    if (!m_destination.stream || level > m_threshold)
        return false;
    t_pending.logger = this;
    t_pending.selector = selector;
    t_pending.sourceLine = sourceLine;
    std::snprintf(t_pending.sourceFile, sizeof t_pending.sourceFile, "%s",
                  sourceFile ? baseName(sourceFile) : "-");
    return true;
}

void TraceLogger::write(const char *recordFormat, std::va_list args)
{
    if (t_pending.logger != this || !recordFormat)
        return;
    const Pending pending = t_pending;
    t_pending.logger = nullptr;

    std::string line = timestamp();
    line += ' ';
    line += moduleName(pending.selector >> 8);
    line += ' ';
    line += std::to_string(pending.selector & 0xff);
    line += ' ';
    line += pending.sourceFile;
    line += ':';
    line += std::to_string(pending.sourceLine);
    line += ' ';
    appendEscaped(line, format(recordFormat, args));
    line += '\n';

    const std::lock_guard<std::mutex> lock(m_mutex);
    std::fwrite(line.data(), 1, line.size(), m_destination.stream);
    std::fflush(m_destination.stream);
}

std::string TraceLogger::moduleName(std::uint32_t moduleId) const
{
    {
        const std::lock_guard<std::mutex> lock(m_mutex);
        if (moduleId >= 1 && moduleId <= m_modules.size())
            return m_modules[moduleId - 1];
    }
    return "#" + std::to_string(moduleId);
}
