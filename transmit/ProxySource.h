#pragma once

#include <QString>

// The four places a proxy may come from when the user has not fixed one, asked
// in a fixed order by CrvC_ProxyDiscovery: the user's proxy environment, an
// automatically detected auto-config script, a configured auto-config script
// and a manually configured proxy. The last three are governed by the
// connection flags of the desktop's proxy settings.
//
// CrvC_SystemProxySource asks the running system; tests hand in fakes.
class CrvC_ProxySource
{
public:
    enum ConnectionFlag {
        ManualProxy = 0x2,   // a manual proxy is set
        ScriptAddress = 0x4, // an auto-config script address is set
        AutoDetect = 0x8     // the script address is found by automatic detection
    };

    virtual ~CrvC_ProxySource();

    // Proxy of the user's environment variables, "DIRECT" when they exclude
    // the maker's server from it, or empty.
    virtual QString environmentProxy() = 0;
    // The ConnectionFlag bits of the desktop's settings.
    virtual int connectionFlags() = 0;
    // Answer of the automatically detected script for the maker's server, or empty.
    virtual QString autoDetectedScriptProxy() = 0;
    // Answer of the configured script for the maker's server, or empty.
    virtual QString configuredScriptProxy() = 0;
    // The manually configured proxy text, or empty.
    virtual QString manualProxy() = 0;
};
