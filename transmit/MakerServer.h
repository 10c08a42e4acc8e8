#pragma once

#include <QString>

// The maker's web server: the redirect service that names the current upload
// address, and the address that proxy discovery asks about. A fixed default,
// replaced by the environment variable CORVID_SERVER ("https://host[:port]")
// for the demo, the tests and private installations.
class CrvC_MakerServer
{
public:
    static const char *const DefaultUrl; // "https://www.vantor.example"

    // CORVID_SERVER when set and not empty, otherwise DefaultUrl; no
    // trailing "/".
    static QString baseUrl();
    // The host name of baseUrl(), without scheme and port.
    static QString host();
};
