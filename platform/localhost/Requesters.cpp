#include "Requesters.h"

const RequestSenderInfo &Requesters::sender(qint64 client)
{
    const std::lock_guard<std::mutex> lock(m_mutex);
    const auto found = m_senders.find(client);
    if (found != m_senders.end())
        return found->second;
    RequestSenderInfo info;
    info.clientId = identityOf(client);
    info.userName = QStringLiteral("client %1").arg(client);
    info.address = QStringLiteral("local");
    // std::map never moves its nodes: the reference stays valid.
    return m_senders.emplace(client, std::move(info)).first->second;
}

void *Requesters::identityOf(qint64 client)
{
    // The identity is opaque to the plug-in and never dereferenced: the
    // client's number itself, so that the exchange log can name the client.
    // NOLINTNEXTLINE(performance-no-int-to-ptr)
    return reinterpret_cast<void *>(static_cast<quintptr>(client));
}

qint64 Requesters::clientOf(const void *identity)
{
    return static_cast<qint64>(reinterpret_cast<quintptr>(identity));
}
