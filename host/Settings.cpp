#include "Settings.h"
#include "Env.h"
#include "VantorPath.h"

#include <QSettings>
#include <QStandardPaths>

namespace Gui {
namespace Clip {
namespace {

QString installFileName()
{
    return QString::fromUtf8(Port_Env::GetDataFileName("orb_settings.ini").c_str());
}

} // namespace

Settings::Settings(const QString &group, bool writable, bool create, bool perUser)
    : m_group(group), m_writable(writable && perUser), m_create(create), m_perUser(perUser)
{
}

Settings::~Settings() = default;

QString Settings::userFileName()
{
    return QStandardPaths::writableLocation(QStandardPaths::GenericConfigLocation)
           + QLatin1String("/orb/orb.ini");
}

QVariant Settings::getValue(const QString &key, const QVariant &defaultValue) const
{
    QSettings store(m_perUser ? userFileName() : installFileName(), QSettings::IniFormat);
    store.beginGroup(m_group);
    return store.value(key, defaultValue);
}

bool Settings::contains(const QString &key) const
{
    QSettings store(m_perUser ? userFileName() : installFileName(), QSettings::IniFormat);
    store.beginGroup(m_group);
    return store.contains(key);
}

void Settings::setValue(const QString &key, const QVariant &value)
{
    if (!m_writable)
        return;
    QSettings store(userFileName(), QSettings::IniFormat);
    store.beginGroup(m_group);
    if (!m_create && store.childKeys().isEmpty())
        return;
    store.setValue(key, value);
    store.endGroup();
    store.sync();
}

void Settings::remove(const QString &key)
{
    if (!m_writable)
        return;
    QSettings store(userFileName(), QSettings::IniFormat);
    store.beginGroup(m_group);
    if (!store.contains(key))
        return;
    store.remove(key);
    store.endGroup();
    store.sync();
}

} // namespace Clip
} // namespace Gui
