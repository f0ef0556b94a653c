#include "LivePlugin.h"

#include "RequestSenderInfo.h"

#include <QFile>
#include <QJsonDocument>
#include <QJsonObject>

#include <gtest/gtest.h>

LivePlugin::LivePlugin()
{
    LocalTunnelOptions options;
    options.exchangeLogPath = m_dir.filePath(QStringLiteral("exchanges.jsonl"));
    m_tunnel = std::make_unique<LocalTunnel>(
        recordingServerBackend(m_dir.filePath(QStringLiteral("server.db")), AnswerLayout::Compact,
                               &m_server),
        options);
    m_framework = std::make_unique<LocalFrameworkTools>(m_tunnel.get());
    EXPECT_TRUE(m_plugin.InitialPluginBase(m_framework.get()));
}

void LivePlugin::seed(const QString &getRecTmcardRes)
{
    Refusal refusal;
    m_tunnel->runOnBackend([&] { refusal = m_server->seed(getRecTmcardRes); });
    ASSERT_FALSE(refusal.refused()) << refusal.text().toStdString();
}

QString LivePlugin::dump()
{
    QString text;
    m_tunnel->runOnBackend([&] { text = m_server->dump(); });
    return text;
}

ReplyCollector::Reply LivePlugin::request(const QString &command, const QVariant &payload)
{
    const int number = ++m_requests;
    m_plugin.Request(command, payload, RequestSenderInfo{}, m_replies.replyFunction(number));
    // Completions run in the tunnel's handlers: once it is idle, every reply is in.
    m_tunnel->waitIdle();
    EXPECT_EQ(m_replies.replyCount(number), 1) << command.toStdString();
    return m_replies.waitForFirst(number, std::chrono::milliseconds(0))
        .value_or(ReplyCollector::Reply{});
}

QList<LivePlugin::Sent> LivePlugin::sent() const
{
    QList<Sent> result;
    QFile log(m_dir.filePath(QStringLiteral("exchanges.jsonl")));
    log.open(QIODevice::ReadOnly); // none yet: nothing sent
    while (!log.atEnd()) {
        const QJsonObject line = QJsonDocument::fromJson(log.readLine()).object();
        result.append(
            {line[u"command"].toString(), line[u"body"].toString(), line[u"timeoutMs"].toInt()});
    }
    return result;
}
