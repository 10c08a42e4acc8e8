#pragma once

#include "StringBase.h"

// Host environment queries.
namespace Port_Env {

// Full path of an installation data file: "reports/x" gives <root>/data/reports/x
// in the first installation root (Port::VantorPath) that has it, otherwise the
// path in the last root. Callers test the file's existence themselves.
ORBHOST_EXPORT Port::StringBase GetDataFileName(const char *relativePath);

// Short platform name: "lin64" on 64-bit Linux, "lin" on 32-bit Linux.
ORBHOST_EXPORT Port::StringBase GetPlatformPath();

} // namespace Port_Env
