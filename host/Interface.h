#pragma once

#include "OrbHostExport.h"
#include "XUID.h"

namespace CitI {

// Root of every host interface. GetInterface answers the interface named by
// the identifier (a sub-object of the same object, not separately counted),
// or null when the object has none.
class ORBHOST_EXPORT IInterface
{
public:
    virtual IInterface *GetInterface(const Port::XUID &iid) = 0; // slot 0
    virtual ~IInterface();                                       // slot 1
};

// Reference counting of host objects. Every object handed out by the factory
// or by a "...Ref" operation answers this interface; the receiver owns one
// reference and gives it back with Release (see Prjrep::AutoRelease).
class ORBHOST_EXPORT IObject : public IInterface
{
public:
    static const Port::XUID &iid();
    virtual void AddRef() = 0;
    virtual void Release() = 0;
};

// Adds one reference to the object behind `i`, if it is counted.
ORBHOST_EXPORT void addRef(IInterface *i);
// Gives one reference of the object behind `i` back, if it is counted.
ORBHOST_EXPORT void release(IInterface *i);

} // namespace CitI
