#include "PluginManager.h"

#include "host/Plugin.h"
#include "host/VantorPath.h"

#include <QDir>
#include <QLibrary>
#include <QPluginLoader>

#include <cstdio>

PluginManager::PluginManager() = default;

PluginManager::~PluginManager()
{
    unloadAll();
}

QStringList PluginManager::pluginDirectories()
{
    QStringList dirs;
    for (const QString &dir :
         qEnvironmentVariable("ORB_PLUGIN_PATH").split(QLatin1Char(':'), Qt::SkipEmptyParts))
        dirs << dir;
    dirs << QString::fromStdString(Port::VantorPath::installationRoot()) + QLatin1String("/lib/orb/plugins");
    return dirs;
}

int PluginManager::loadAll()
{
    int loaded = 0;
    for (const QString &dirName : pluginDirectories()) {
        const QDir dir(dirName);
        for (const QString &entry : dir.entryList(QDir::Files, QDir::Name)) {
            const QString path = dir.absoluteFilePath(entry);
            if (!QLibrary::isLibrary(path))
                continue;
            auto *loader = new QPluginLoader(path);
            QObject *instance = loader->instance();
            if (!qobject_cast<Gui::Clip::CPlugin *>(instance)) {
                std::fprintf(stderr, "orb: %s is not a plug-in of this host: %s\n", qUtf8Printable(path),
                             qUtf8Printable(loader->errorString()));
                loader->unload();
                delete loader;
                continue;
            }
            m_loaders << loader;
            ++loaded;
        }
    }
    for (QPluginLoader *loader : m_loaders)
        static_cast<Gui::Clip::CPlugin *>(loader->instance())->configure();
    return loaded;
}

void PluginManager::unloadAll()
{
    // Unloading deletes the plug-in object, whose destructor undoes its registrations.
    while (!m_loaders.isEmpty()) {
        QPluginLoader *loader = m_loaders.takeLast();
        loader->unload();
        delete loader;
    }
}

QStringList PluginManager::loadedFiles() const
{
    QStringList files;
    for (const QPluginLoader *loader : m_loaders)
        files << loader->fileName();
    return files;
}
