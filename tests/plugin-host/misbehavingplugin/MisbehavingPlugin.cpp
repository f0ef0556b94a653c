// A plug-in that breaks the host's contract on purpose, to show what
// plugin-host does about it. By command: "Twice" replies twice, "Never" does
// not reply, "Throw" throws out of Request; any other command is answered
// once with (true, "0", "", payload).

#include "IFrameworkTools.h"
#include "IPluginObjectBase.h"

#include <stdexcept>

class MisbehavingPlugin final : public IPluginObjectBase
{
    Q_OBJECT
    Q_PLUGIN_METADATA(IID PLUGIN_SERVER_INTERFACE_IID FILE "MisbehavingPlugin.json")
    Q_INTERFACES(IPluginObjectBase)

public:
    bool InitialPluginBase(IFrameworkTools *tools) override { return tools->GetTunnelClient(); }
    void Request(const QString &command, const QVariant &payload, const RequestSenderInfo &,
                 ResponseCallback reply) override
    {
        if (command == QLatin1String("Never"))
            return;
        if (command == QLatin1String("Throw"))
            throw std::runtime_error("thrown on purpose");
        reply(true, QStringLiteral("0"), QString(), payload);
        if (command == QLatin1String("Twice"))
            reply(true, QStringLiteral("0"), QString(), payload);
    }
    void RequestBlock(const QString &, const QVariant &, const RequestSenderInfo &,
                      IResponser &) override
    {}
    void SubscribeEventBlock(const QString &, const QString &, const QVariant &,
                             const RequestSenderInfo &, IResponser &) override
    {}
    void UnsubscribeEventBlock(const QString &, const QVariant &, IResponser &) override {}
};

#include "MisbehavingPlugin.moc"
