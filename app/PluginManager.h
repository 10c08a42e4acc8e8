#pragma once

#include <QList>
#include <QString>
#include <QStringList>

class QPluginLoader;

// Loads the host's plug-ins and unloads them again in reverse order.
class PluginManager
{
public:
    PluginManager();
    ~PluginManager();

    // The plug-in directories: those of ORB_PLUGIN_PATH (colon-separated),
    // then <installation>/lib/orb/plugins.
    static QStringList pluginDirectories();

    // Loads every plug-in library found; returns the number loaded. Failures
    // are written to standard error and skipped.
    int loadAll();
    void unloadAll();
    QStringList loadedFiles() const;

private:
    QList<QPluginLoader *> m_loaders;
};
