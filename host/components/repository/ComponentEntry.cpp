// Entry point of the component library libPrjrep_Repository.

#include "RepositoryObject.h"

extern "C" Q_DECL_EXPORT CitI::IInterface *CitP_CreateInstance(const Port::XUID &id)
{
    if (id == Prjrep::IRepository::objectId())
        return static_cast<Prjrep::IRepository *>(new Prjrep::RepositoryObject);
    return nullptr;
}
