#pragma once

#include "ProxyDeadline.h"

#include <QString>

// The desktop's proxy settings as connection flags (CrvC_ProxySource::
// ConnectionFlag), a configured auto-config script address and a manual
// proxy ("host:port").
//
// GNOME keeps them in GSettings (schema org.gnome.system.proxy: "mode" is
// "none", "manual" or "auto"; "autoconfig-url"; the HTTPS proxy's "host" and
// "port" under org.gnome.system.proxy.https). KDE keeps them in kioslaverc,
// group [Proxy Settings]: ProxyType 1 manual ("httpsProxy", else "httpProxy"),
// 2 script ("Proxy Config Script"), 3 automatic detection.
class CrvC_DesktopProxySettings
{
public:
    int flags = 0;
    QString scriptUrl;
    QString manualProxy;

    // The settings of the user's desktop: KDE's when XDG_CURRENT_DESKTOP names
    // KDE, otherwise GNOME's; when GNOME's cannot be read (no gsettings, no
    // schema), KDE's file. Empty settings when neither has any. gsettings
    // runs no longer than `deadline`.
    static CrvC_DesktopProxySettings current(const CrvC_ProxyDeadline &deadline = CrvC_ProxyDeadline());

    // GNOME: runs gsettings when it exists and the schema is installed.
    static CrvC_DesktopProxySettings fromGnome(bool *available = nullptr,
                                               const CrvC_ProxyDeadline &deadline = CrvC_ProxyDeadline());
    // GNOME's values (as gsettings prints them, e.g. "'auto'") to settings.
    static CrvC_DesktopProxySettings fromGnomeValues(const QString &mode, const QString &autoconfigUrl,
                                                     const QString &httpsHost, const QString &httpsPort);
    // One value printed by "gsettings get": 'text' unquoted, numbers as they are.
    static QString gsettingsValue(const QString &printed);

    // KDE: the file kioslaverc in the user's configuration directory
    // ($XDG_CONFIG_HOME, else ~/.config).
    static QString kioslavercPath();
    static CrvC_DesktopProxySettings fromKioslaverc(const QString &path);
    // KDE's proxy entries: "http://h:3128", "h:3128" or "h 3128" give "h:3128".
    static QString kdeProxyAddress(const QString &value);
};
