#pragma once

#include "RegSection.h"

#include "host/RefObject.h"

#include <map>
#include <utility>

namespace Prjrep {

// The repository object of the component library: opens the sections of
// project repositories and owns them until close().
class RepositoryObject : public CitP::RefObject, public IRepository
{
public:
    RepositoryObject();
    ~RepositoryObject() override;

    CitI::IInterface *GetInterface(const Port::XUID &iid) override;
    int openSection(const Port::StringBase &projectFile, const Port::StringBase &name, int mode,
                    CitI::IInterface **section) override;
    void close() override;

private:
    std::vector<std::unique_ptr<RegSection>> m_sections;
    // Open connections by repository file and writability.
    std::map<std::pair<QString, bool>, std::shared_ptr<RepositoryStore>> m_stores;
};

} // namespace Prjrep
