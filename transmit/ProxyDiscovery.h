#pragma once

#include <QString>

class CrvC_ProxySource;

// Finds the proxy for the transfers to the maker's server: the user's stored
// choice in the host's "WebUpdate" settings first, then the system's proxy
// settings. The answer is one proxy entry ("host:port") or empty for none.
class CrvC_ProxyDiscovery
{
public:
    // Never fails; empty means a direct connection. Asks the source installed
    // with setSource, or the running system.
    static QString findProxy();
    // The same with an explicit source for the system's settings.
    static QString findProxy(CrvC_ProxySource &source);

    // The system steps in order; the first non-empty answer wins and is
    // cleaned up to one entry.
    static QString detectSystemProxy(CrvC_ProxySource &source);

    // One entry of a proxy list or a script answer: "PROXY h:8080; DIRECT"
    // gives "h:8080", "h1:8080;h2:8080" gives "h1:8080". A "DIRECT" answer
    // gives an empty text (no proxy).
    static QString cleanUp(const QString &text);

    // "http://user@h:3128/" gives "h:3128"; text that is not a URL is
    // returned trimmed.
    static QString hostAndPort(const QString &text);

    // Installs the source that findProxy() asks instead of the system (not
    // owned; nullptr restores the system). For tests and embedders.
    static void setSource(CrvC_ProxySource *source);
};
