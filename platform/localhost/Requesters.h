#pragma once

#include "RequestSenderInfo.h"

#include <QtGlobal>

#include <map>
#include <mutex>

// The requesters of the local host, known by the client number that
// sessions name. A number's identity is the number itself held in a
// pointer-sized value, so that logs of the tunnel show the number back; the
// plug-in only stores and forwards it.
class Requesters
{
public:
    // A record that stays valid, unchanged, for the directory's lifetime.
    const RequestSenderInfo &sender(qint64 client);

    static void *identityOf(qint64 client);
    static qint64 clientOf(const void *identity);

private:
    std::mutex m_mutex;
    std::map<qint64, RequestSenderInfo> m_senders;
};
