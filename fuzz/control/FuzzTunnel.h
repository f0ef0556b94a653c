#pragma once

#include "IKoltTunnelClient.h"

#include <QXmlStreamReader>

#include <cstdio>
#include <cstdlib>

// Takes every request, stops the run on a body that is not one well-formed
// XML element, and answers at once with success.
class FuzzTunnel final : public IKoltTunnelClient
{
public:
    bool IsConnected() const override { return true; }
    void *GetClientID() override { return this; }
    QString GetServerAddress() const override { return {}; }
    bool SendRequest(const QString &, void *, int, const QString &, TunnelRequest &request) override
    {
        QXmlStreamReader reader(request.body);
        while (!reader.atEnd())
            reader.readNext();
        if (reader.hasError()) {
            std::fprintf(stderr, "ill-formed body: %s\n", qPrintable(request.body));
            std::abort();
        }
        bodies.append(request.body);
        request.onResponse(true, {}, {}, QStringLiteral("0"), {}, false);
        return true;
    }
    QStringList bodies;
};
