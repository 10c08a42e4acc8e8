#pragma once

#include "Interface.h"

#include <functional>

namespace CitP {

// Creates host objects by identifier. Objects come from creators registered
// in-process (RegisterCreator) or from component libraries loaded with
// LoadLibraryFactory.
//
// A component library is a shared library "lib<Name>.so" in the installation's
// library directory (<root>/lib, roots as Port::VantorPath) that exports
//     extern "C" CitI::IInterface *CitP_CreateInstance(const Port::XUID &id);
// answering a new object holding one reference, or null for identifiers it
// does not provide.
class ORBHOST_EXPORT Factory
{
public:
    using Creator = std::function<CitI::IInterface *()>;

    // Loads the component library `name` ("libPrjrep_Repository"; the ".so"
    // suffix is optional). True when it is loaded (also when it already was).
    static bool LoadLibraryFactory(const char *name);

    // A new object for `id`, holding one reference that the caller owns, or
    // null when no creator or loaded library provides it.
    static CitI::IInterface *CreateInstance(const Port::XUID &id);
    // The same for callers that keep the object in a reference-counting
    // wrapper (Prjrep::AutoRelease); kept apart because host code tells the
    // two kinds of call apart.
    static CitI::IInterface *CreateInstanceRef(const Port::XUID &id);

    // In-process providers (services of the host itself, test doubles).
    static void RegisterCreator(const Port::XUID &id, Creator creator);
    static void UnRegisterCreator(const Port::XUID &id);
};

} // namespace CitP
