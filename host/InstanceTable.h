#pragma once

#include "Interface.h"

namespace CitP {

// The host's table of singleton services and interfaces, by identifier.
// Entries are not owned or reference counted: whoever registers an object
// unregisters it before it goes away.
class ORBHOST_EXPORT InstanceTable
{
public:
    // The object registered under `id`, or null.
    static CitI::IInterface *GetInstance(const Port::XUID &id);
    // Registers `instance` under `id`, replacing an earlier entry. Returns false for null.
    static bool RegisterInstance(const Port::XUID &id, CitI::IInterface *instance);
    // Removes every entry that holds `instance`; false when there was none.
    static bool UnRegisterInstance(CitI::IInterface *instance);
};

} // namespace CitP
