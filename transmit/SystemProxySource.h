#pragma once

#include "DesktopProxySettings.h"
#include "ProxySource.h"

#include <QStringList>

// The running system's proxy settings: the proxy environment variables, the
// desktop's settings (CrvC_DesktopProxySettings, read once per object),
// automatic detection over DNS (WPAD) and auto-config scripts evaluated by
// CrvC_ProxyScript for the maker's server (CrvC_MakerServer).
//
// Every step ends by the deadline given at construction; reading the
// desktop's settings and automatic detection each have a shorter limit of
// their own. A step whose time is up answers nothing.
class CrvC_SystemProxySource : public CrvC_ProxySource
{
public:
    static const int DesktopLimitMs = 3000;
    static const int AutoDetectLimitMs = 4000;

    explicit CrvC_SystemProxySource(const CrvC_ProxyDeadline &deadline = CrvC_ProxyDeadline());

    QString environmentProxy() override;
    int connectionFlags() override;
    QString autoDetectedScriptProxy() override;
    QString configuredScriptProxy() override;
    QString manualProxy() override;

    // The first of https_proxy, HTTPS_PROXY, http_proxy, HTTP_PROXY,
    // all_proxy, ALL_PROXY that is set, reduced to host:port; "DIRECT" when
    // no_proxy (or NO_PROXY) names the maker's server.
    static QString proxyFromEnvironment();
    // Whether the no_proxy list `noProxy` names `host` at `port`: its
    // comma-separated entries are "*", a host name, or a domain that matches
    // itself and its sub-domains (with or without a leading "."), each
    // optionally with ":port".
    static bool bypassesProxy(const QString &noProxy, const QString &host, int port);

    // Script addresses that automatic detection tries for the machine's
    // fully qualified name: "pc.dept.corp.example" gives
    // http://wpad.dept.corp.example/wpad.dat, then
    // http://wpad.corp.example/wpad.dat; never a top-level domain alone.
    static QStringList wpadCandidates(const QString &fullyQualifiedName);
    // The machine's fully qualified DNS name (its host name when none, or when
    // the resolver has not answered by the deadline).
    static QString fullyQualifiedName(const CrvC_ProxyDeadline &deadline = CrvC_ProxyDeadline());

private:
    QString scriptAnswer(const QString &scriptUrl, const CrvC_ProxyDeadline &deadline) const;
    const CrvC_DesktopProxySettings &desktop();

    CrvC_ProxyDeadline m_deadline;
    bool m_desktopRead = false;
    CrvC_DesktopProxySettings m_desktop;
};
