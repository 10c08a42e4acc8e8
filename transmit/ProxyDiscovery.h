#pragma once

#include <QString>

// Finds the proxy for the transfers to the maker's server: the user's stored
// choice in the host's "WebUpdate" settings first, then the system's proxy
// settings. The answer is one proxy entry ("host:port") or empty for none.
class CrvC_ProxyDiscovery
{
public:
    // Never fails; empty means a direct connection.
    static QString findProxy();
};
