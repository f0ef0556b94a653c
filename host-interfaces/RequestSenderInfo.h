#pragma once

#include <QString>

// The host's description of who sent a request.
struct RequestSenderInfo
{
    // Opaque, pointer-sized identity of the requesting client.
    void *clientId = nullptr;
    QString userName;
    QString address;
};
