#include "MisbehavingPlugin.h"

#include "IFrameworkTools.h"

#include <stdexcept>

bool MisbehavingPlugin::InitialPluginBase(IFrameworkTools *tools)
{
    return tools && tools->GetTunnelClient();
}

void MisbehavingPlugin::Request(const QString &command, const QVariant &payload,
                                const RequestSenderInfo &, ResponseCallback reply)
{
    if (command == QLatin1String("Never"))
        return;
    if (command == QLatin1String("Throw"))
        throw std::runtime_error("thrown on purpose");
    reply(true, QStringLiteral("0"), QString(), payload);
    if (command == QLatin1String("Twice"))
        reply(true, QStringLiteral("0"), QString(), payload);
}
