#pragma once

#include <QPluginLoader>
#include <QPointer>
#include <QString>

class IPluginObjectBase;

// One plug-in file as the host loads it: the file's embedded metadata must
// name the expected interface and plug-in identifier before the library's
// code runs at all.
class PluginLibrary
{
public:
    PluginLibrary(const QString &fileName, const QString &interfaceId, const QString &pluginId);
    // Deletes the plug-in object; the library itself stays loaded, since
    // code of it may still run on other threads until the process ends.
    ~PluginLibrary();
    PluginLibrary(const PluginLibrary &) = delete;
    PluginLibrary &operator=(const PluginLibrary &) = delete;

    // Loads and checks the file; false with errorString() saying why.
    bool load();
    // The plug-in object, owned by the library; null until load() succeeds.
    IPluginObjectBase *plugin() const { return m_plugin; }
    // Deletes the plug-in object now; plugin() is null afterwards.
    void releasePlugin();
    QString errorString() const { return m_error; }

private:
    bool fail(const QString &reason);
    // Why the file's embedded metadata is not the expected plug-in's, or
    // empty; nothing of the library runs.
    QString metaDataMismatch();

    QPluginLoader m_loader;
    QString m_fileName;
    QString m_interfaceId;
    QString m_pluginId;
    QPointer<QObject> m_instance;
    IPluginObjectBase *m_plugin = nullptr;
    QString m_error;
};
