#pragma once

#include "Interface.h"

#include <atomic>

namespace CitP {

// Base for host objects that are reference counted: starts with one reference
// (the creator's) and deletes itself when the last one is released.
// Subclasses answer their own interfaces in GetInterface and fall back to
// RefObject::GetInterface for CitI::IObject.
class ORBHOST_EXPORT RefObject : public CitI::IObject
{
public:
    CitI::IInterface *GetInterface(const Port::XUID &iid) override;
    void AddRef() override;
    void Release() override;
    int refCount() const { return m_refs.load(); }

protected:
    RefObject() = default;
    ~RefObject() override;

private:
    std::atomic<int> m_refs{1};
};

} // namespace CitP
