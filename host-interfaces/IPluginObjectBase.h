#pragma once

#include "ResponseCallback.h"

#include <QObject>
#include <QString>
#include <QVariant>

class IFrameworkTools;
class IResponser;
struct RequestSenderInfo;

#define PLUGIN_SERVER_INTERFACE_IID "com.NORAVEL.PluginServer.PluginInterface"

// The base of every plug-in the plug-in server loads. It carries no
// meta-object of its own: a plug-in's meta-object sits directly on QObject's
// and is recognised through the interface identifier.
class IPluginObjectBase : public QObject
{
public:
    explicit IPluginObjectBase(QObject *parent = nullptr) : QObject(parent) {}
    ~IPluginObjectBase() override = default;

    virtual bool InitialPluginBase(IFrameworkTools *tools) = 0;
    virtual void Request(const QString &command, const QVariant &payload,
                         const RequestSenderInfo &sender, ResponseCallback reply) = 0;
    virtual void RequestBlock(const QString &command, const QVariant &payload,
                              const RequestSenderInfo &sender, IResponser &responser) = 0;
    virtual void SubscribeEventBlock(const QString &event, const QString &filter,
                                     const QVariant &payload, const RequestSenderInfo &sender,
                                     IResponser &responser) = 0;
    virtual void UnsubscribeEventBlock(const QString &event, const QVariant &payload,
                                       IResponser &responser) = 0;

    // Host notifications a plug-in may take up; the defaults ignore them.
    virtual void PluginLoaded() {}
    virtual void PluginUnloading() {}
    virtual void HostEvent(const QString & /*name*/, const QVariant & /*value*/) {}
    virtual void ConfigurationChanged(const QVariant & /*settings*/) {}
    virtual QVariant PluginInformation(const QString & /*key*/) { return {}; }
    virtual void Idle() {}
};

Q_DECLARE_INTERFACE(IPluginObjectBase, PLUGIN_SERVER_INTERFACE_IID)
