#include "ExchangeLog.h"

#include <QByteArray>
#include <QFile>
#include <QJsonDocument>
#include <QJsonObject>

#include <cerrno>
#include <cstring>

ExchangeLog::~ExchangeLog()
{
    if (m_file)
        std::fclose(m_file);
}

std::optional<QString> ExchangeLog::open(const QString &path)
{
    m_path = path;
    m_file = std::fopen(QFile::encodeName(path).constData(), "a");
    if (m_file)
        return std::nullopt;
    return QStringLiteral("exchange log %1: %2")
        .arg(path, QString::fromLocal8Bit(std::strerror(errno)));
}

void ExchangeLog::write(const ExchangeRecord &record)
{
    if (!m_file)
        return;
    const QJsonObject object{
        {QStringLiteral("seq"), static_cast<qint64>(record.seq)},
        {QStringLiteral("outcome"), record.outcome},
        {QStringLiteral("command"), record.command},
        {QStringLiteral("pluginId"), record.pluginId},
        {QStringLiteral("kind"), record.kind},
        {QStringLiteral("identity"),
         QStringLiteral("0x%1").arg(reinterpret_cast<quintptr>(record.identity), 0, 16)},
        {QStringLiteral("ownIdentity"), record.ownIdentity},
        {QStringLiteral("timeoutMs"), record.timeoutMs},
        {QStringLiteral("flag"), record.flag},
        {QStringLiteral("body"), record.body},
        {QStringLiteral("ok"), record.ok},
        {QStringLiteral("code"), record.code},
        {QStringLiteral("content"), record.content},
        {QStringLiteral("faults"), record.faults},
        {QStringLiteral("elapsedMs"), record.elapsedMs},
    };
    QByteArray line = QJsonDocument(object).toJson(QJsonDocument::Compact);
    line += '\n';
    const std::lock_guard<std::mutex> lock(m_mutex);
    const std::size_t size = static_cast<std::size_t>(line.size());
    errno = 0;
    const bool written =
        std::fwrite(line.constData(), 1, size, m_file) == size && std::fflush(m_file) == 0;
    if (!written && !m_writeFailure)
        m_writeFailure =
            QStringLiteral("exchange log %1: %2")
                .arg(m_path, QString::fromLocal8Bit(std::strerror(errno != 0 ? errno : EIO)));
}

std::optional<QString> ExchangeLog::writeFailure() const
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    return m_writeFailure;
}
