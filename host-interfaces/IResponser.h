#pragma once

#include <QString>
#include <QVariant>

// The host's responder for blocking requests.
class IResponser
{
public:
    virtual ~IResponser() = default;
    virtual void Respond(bool flag, const QString &resultCode, const QString &text,
                         const QVariant &data) = 0;
};
