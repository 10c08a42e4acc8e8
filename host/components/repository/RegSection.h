#pragma once

#include "RepositoryStore.h"

#include "host/Repository.h"

#include <memory>
#include <vector>

namespace Prjrep {

// A section or sub-section of an open repository. Owns the sub-sections
// opened through it.
class RegSection : public IRegSection
{
public:
    RegSection(std::shared_ptr<RepositoryStore> store, qint64 id, const Port::StringBase &name, int mode);
    ~RegSection() override;

    CitI::IInterface *GetInterface(const Port::XUID &iid) override;
    Port::StringBase getName() override;
    int openSubSection(const Port::StringBase &name, int mode, IRegSection **subSection) override;
    void releaseSubSection(IRegSection *subSection) override;
    int getValue(const Port::StringBase &key, Port::StringBase &value) override;
    int setValue(const Port::StringBase &key, const Port::StringBase &value) override;
    int replaceValue(const Port::StringBase &key, const Port::StringBase *expected,
                     const Port::StringBase &value) override;

    // Whether `mode` is one a section can be opened with, and whether it may
    // create what is missing. Used for sections and sub-sections alike.
    static int checkMode(int mode, bool storeWritable);

private:
    int write(const Port::StringBase &key, const Port::StringBase &value,
              RepositoryStore::Condition condition, const QString &expected);

    std::shared_ptr<RepositoryStore> m_store;
    qint64 m_id;
    Port::StringBase m_name;
    int m_mode;
    std::vector<std::unique_ptr<RegSection>> m_subSections;
};

} // namespace Prjrep
