#pragma once

#include "OrbHostExport.h"

#include <QString>

namespace Port {

// Random identifiers for records that must not point to a person or a
// machine (a user's or a project's identifier in a usage report).
class ORBHOST_EXPORT Identifier
{
public:
    // A new random (version 4) UUID as 32 lower-case hexadecimal digits,
    // without braces or dashes.
    static QString newIdentifier();
};

} // namespace Port
