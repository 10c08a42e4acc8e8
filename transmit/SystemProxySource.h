#pragma once

#include "DesktopProxySettings.h"
#include "ProxySource.h"

#include <QStringList>

// The running system's proxy settings: the proxy environment variables, the
// desktop's settings (CrvC_DesktopProxySettings, read once per object),
// automatic detection over DNS (WPAD) and auto-config scripts evaluated by
// CrvC_ProxyScript for the maker's server (CrvC_MakerServer).
class CrvC_SystemProxySource : public CrvC_ProxySource
{
public:
    CrvC_SystemProxySource();

    QString environmentProxy() override;
    int connectionFlags() override;
    QString autoDetectedScriptProxy() override;
    QString configuredScriptProxy() override;
    QString manualProxy() override;

    // The first of https_proxy, HTTPS_PROXY, http_proxy, HTTP_PROXY,
    // all_proxy, ALL_PROXY that is set, reduced to host:port.
    static QString proxyFromEnvironment();

    // Script addresses that automatic detection tries for the machine's
    // fully qualified name: "pc.dept.corp.example" gives
    // http://wpad.dept.corp.example/wpad.dat, then
    // http://wpad.corp.example/wpad.dat; never a top-level domain alone.
    static QStringList wpadCandidates(const QString &fullyQualifiedName);
    // The machine's fully qualified DNS name (its host name when none).
    static QString fullyQualifiedName();

private:
    QString scriptAnswer(const QString &scriptUrl) const;
    const CrvC_DesktopProxySettings &desktop();

    bool m_desktopRead = false;
    CrvC_DesktopProxySettings m_desktop;
};
