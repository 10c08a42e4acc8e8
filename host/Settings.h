#pragma once

#include "OrbHostExport.h"

#include <QString>
#include <QVariant>

namespace Gui {
namespace Clip {

// The host's persistent settings store, opened on one group.
//
// Per-user values live in an INI file "orb/orb.ini" in the user's generic
// configuration location (QStandardPaths::GenericConfigLocation, so tests
// with QStandardPaths::setTestModeEnabled get a private one). Installation-
// wide values are read from <root>/data/orb_settings.ini of the first
// installation root that has it (Port::VantorPath); they are never written.
//
// The three flags:
//   writable   setValue stores values; when false setValue does nothing.
//   create     the group may be created by setValue; when false, values are
//              only stored into a group that already holds keys.
//   perUser    the per-user store; when false the installation-wide one
//              (read-only, whatever `writable` says).
// Corvid opens its own group with (true, true, true) and the host's proxy
// group "WebUpdate" with (false, false, true).
//
// Each object reads the store when asked and writes through at once, so
// short-lived objects see each other's changes, also across processes.
class ORBHOST_EXPORT Settings
{
public:
    Settings(const QString &group, bool writable, bool create, bool perUser);
    ~Settings();
    Settings(const Settings &) = delete;
    Settings &operator=(const Settings &) = delete;

    QVariant getValue(const QString &key, const QVariant &defaultValue = QVariant()) const;
    void setValue(const QString &key, const QVariant &value);
    bool contains(const QString &key) const;
    // Removes `key`, under the same conditions as setValue.
    void remove(const QString &key);

    // Path of the per-user settings file.
    static QString userFileName();

private:
    QString m_group;
    bool m_writable;
    bool m_create;
    bool m_perUser;
};

} // namespace Clip
} // namespace Gui
