#include "Interface.h"
#include "RefObject.h"

namespace CitI {

IInterface::~IInterface() = default;

const Port::XUID &IObject::iid()
{
    static const Port::XUID id("{6b1f0d52-3c47-4a8e-9f0e-2d6c5a7b8e91}");
    return id;
}

void addRef(IInterface *i)
{
    if (auto *o = i ? static_cast<IObject *>(i->GetInterface(IObject::iid())) : nullptr)
        o->AddRef();
}

void release(IInterface *i)
{
    if (auto *o = i ? static_cast<IObject *>(i->GetInterface(IObject::iid())) : nullptr)
        o->Release();
}

} // namespace CitI

namespace CitP {

RefObject::~RefObject() = default;

CitI::IInterface *RefObject::GetInterface(const Port::XUID &iid)
{
    return iid == CitI::IObject::iid() ? static_cast<CitI::IObject *>(this) : nullptr;
}

void RefObject::AddRef()
{
    m_refs.fetch_add(1);
}

void RefObject::Release()
{
    if (m_refs.fetch_sub(1) == 1)
        delete this;
}

} // namespace CitP
