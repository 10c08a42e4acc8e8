#pragma once

#include "StringBase.h"

namespace Port {

// Build values of the installation, read from the key=value file
// data/orb_version (found like every data file, Port_Env::GetDataFileName).
// Keys used by the host and its plug-ins: "product", "version",
// "Registration_ID", "configuration.<device prefix>".
class ORBHOST_EXPORT Version
{
public:
    // The value of `key`, or empty text when the key or the file is missing.
    static StringBase getValue(const char *key);
};

// What the host knows about its user.
class ORBHOST_EXPORT UserInformation
{
public:
    // The text shown when no registration text is set.
    static const char *const NoInformationText; // "No user information available."

    // The user's registration text: the host settings value
    // "UserInformation/Registration", or NoInformationText when unset or empty.
    static StringBase getRegistrationText();

    // Label of the product configuration in use for `targetDevice`: the value
    // of the longest build value "configuration.<prefix>" whose prefix starts
    // the device name (case-insensitive); empty when none matches.
    static StringBase getProductConfigurationLabel(const char *targetDevice);
};

} // namespace Port
