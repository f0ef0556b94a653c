#include "RecordingServer.h"

bool parseAnswerLayout(const QString &text, AnswerLayout *layout)
{
    const QString word = text.trimmed().toLower();
    if (word == QLatin1String("compact"))
        *layout = AnswerLayout::Compact;
    else if (word == QLatin1String("indented"))
        *layout = AnswerLayout::Indented;
    else if (word == QLatin1String("crlf"))
        *layout = AnswerLayout::Crlf;
    else
        return false;
    return true;
}

RecordingServer::RecordingServer(const QString &databasePath, AnswerLayout layout)
    : m_path(databasePath), m_layout(layout)
{}

RecordingServer::~RecordingServer() = default;

bool RecordingServer::open(QString *error)
{
    if (error)
        *error = QStringLiteral("not implemented yet");
    return false;
}

bool RecordingServer::isOpen() const
{
    return m_open;
}

ServerAnswer RecordingServer::handle(const QString &, const QString &)
{
    return {serverCodeText(ServerCode::StorageFailure), QString()};
}

bool RecordingServer::seed(const QString &, QString *error)
{
    if (error)
        *error = QStringLiteral("not implemented yet");
    return false;
}

QString RecordingServer::dump()
{
    return QStringLiteral("<GetRecTmcardRes></GetRecTmcardRes>");
}

void RecordingServer::setStatementHook(std::function<void(int)> hook)
{
    m_statementHook = std::move(hook);
}

QString RecordingServer::defaultTimecardName()
{
    return QStringLiteral("Default Schedule");
}

QString RecordingServer::defaultTimecardMapping()
{
    return QString();
}
