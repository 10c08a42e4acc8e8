#pragma once

#include "host/RefObject.h"

namespace OrbProject {

// A reference-counted host object answering the listed interfaces (each by
// its iid()) and CitI::IObject.
template<typename... Interfaces>
class HostObject : public CitP::RefObject, public Interfaces...
{
public:
    CitI::IInterface *GetInterface(const Port::XUID &iid) override
    {
        CitI::IInterface *found = nullptr;
        auto match = [&](CitI::IInterface *candidate, const Port::XUID &id) {
            if (!found && iid == id)
                found = candidate;
        };
        (match(static_cast<Interfaces *>(this), Interfaces::iid()), ...);
        return found ? found : RefObject::GetInterface(iid);
    }
};

} // namespace OrbProject
