#include "PluginLibrary.h"

#include "IPluginObjectBase.h"

#include <QFileInfo>
#include <QJsonObject>

PluginLibrary::PluginLibrary(const QString &fileName, const QString &interfaceId,
                             const QString &pluginId)
    : m_fileName(QFileInfo(fileName).absoluteFilePath())
    , m_interfaceId(interfaceId)
    , m_pluginId(pluginId)
{}

PluginLibrary::~PluginLibrary()
{
    releasePlugin();
}

bool PluginLibrary::fail(const QString &reason)
{
    m_error = QStringLiteral("%1: %2").arg(m_fileName, reason);
    return false;
}

QString PluginLibrary::metaDataMismatch()
{
    const QJsonObject metaData = m_loader.metaData();
    if (metaData.isEmpty()) {
        // Loading tells why the file is no plug-in in Qt's own words.
        m_loader.load();
        return m_loader.errorString();
    }
    const QString iid = metaData.value(QStringLiteral("IID")).toString();
    if (iid != m_interfaceId)
        return QStringLiteral("the plug-in's interface is \"%1\", not \"%2\"")
            .arg(iid, m_interfaceId);
    const QString pluginId = metaData.value(QStringLiteral("MetaData"))
                                 .toObject()
                                 .value(QStringLiteral("PluginID"))
                                 .toString();
    if (pluginId != m_pluginId)
        return QStringLiteral("the plug-in's PluginID is \"%1\", not \"%2\"")
            .arg(pluginId, m_pluginId);
    return QString();
}

bool PluginLibrary::load()
{
    const QFileInfo info(m_fileName);
    if (!info.exists())
        return fail(QStringLiteral("no such file"));
    if (!info.isFile() || !info.isReadable())
        return fail(QStringLiteral("not a readable file"));

    m_loader.setFileName(m_fileName);
    const QString mismatch = metaDataMismatch();
    if (!mismatch.isEmpty())
        return fail(mismatch);
    m_instance = m_loader.instance();
    if (!m_instance)
        return fail(m_loader.errorString());
    m_plugin = qobject_cast<IPluginObjectBase *>(m_instance.data());
    if (!m_plugin)
        return fail(
            QStringLiteral("the plug-in object does not implement \"%1\"").arg(m_interfaceId));
    return true;
}

void PluginLibrary::releasePlugin()
{
    m_plugin = nullptr;
    delete m_instance.data();
}
