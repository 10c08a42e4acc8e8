#include "TestEnvironment.h"

#include "host/Settings.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QStandardPaths>

namespace CorvidTest {

Environment::Environment()
    : m_dir(new QTemporaryDir)
{
    QStandardPaths::setTestModeEnabled(true);
    const QString root = m_dir->path();
    QDir().mkpath(root + QLatin1String("/home"));
    QDir().mkpath(root + QLatin1String("/install/data/reports"));
    qputenv("HOME", QFile::encodeName(root + QLatin1String("/home")));
    qputenv("XDG_CONFIG_HOME", QFile::encodeName(root + QLatin1String("/home/.config")));
    qputenv("XDG_DATA_HOME", QFile::encodeName(root + QLatin1String("/home/.local/share")));
    qputenv("XDG_CACHE_HOME", QFile::encodeName(root + QLatin1String("/home/.cache")));
    qputenv("VANTOR", QFile::encodeName(installRoot()));
    qunsetenv("APPDATA");
    qunsetenv("TEMP");
    clearSettings();
}

Environment::~Environment() = default;

QString Environment::home() const
{
    return m_dir->path() + QLatin1String("/home");
}

QString Environment::installRoot() const
{
    return m_dir->path() + QLatin1String("/install");
}

bool Environment::writeDataFile(const QString &relativePath, const QByteArray &contents) const
{
    return writeFile(installRoot() + QLatin1String("/data/") + relativePath, contents);
}

void Environment::clearSettings() const
{
    QFile::remove(Gui::Clip::Settings::userFileName());
}

bool writeFile(const QString &path, const QByteArray &contents)
{
    QDir().mkpath(QFileInfo(path).absolutePath());
    QFile file(path);
    return file.open(QIODevice::WriteOnly) && file.write(contents) == contents.size();
}

QByteArray readFile(const QString &path)
{
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

} // namespace CorvidTest
