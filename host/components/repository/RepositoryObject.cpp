#include "RepositoryObject.h"

#include "host/String.h"

#include <QDir>
#include <QFileInfo>

using Gui::Clip::String;

namespace Prjrep {

RepositoryObject::RepositoryObject() = default;

RepositoryObject::~RepositoryObject()
{
    close();
}

CitI::IInterface *RepositoryObject::GetInterface(const Port::XUID &iid)
{
    if (iid == IRepository::iid())
        return static_cast<IRepository *>(this);
    return RefObject::GetInterface(iid);
}

int RepositoryObject::openSection(const Port::StringBase &projectFile, const Port::StringBase &name, int mode,
                                  CitI::IInterface **section)
{
    if (!section)
        return StatusFailed;
    *section = nullptr;
    if (name.IsEmpty())
        return StatusFailed;
    const bool writable = mode & ModeWrite;
    int status = RegSection::checkMode(mode, writable);
    if (status != StatusOk)
        return status;
    const QFileInfo project(String::convert(projectFile));
    if (!project.isFile())
        return StatusNotFound;

    const QString fileName = RepositoryStore::fileNameFor(QDir::cleanPath(project.absoluteFilePath()));
    std::shared_ptr<RepositoryStore> &store = m_stores[{fileName, writable}];
    if (!store)
        store = RepositoryStore::open(fileName, writable, mode & ModeCreate, &status);
    if (!store) {
        m_stores.erase({fileName, writable});
        return status;
    }
    qint64 id = 0;
    status = store->findSection(0, String::convert(name), mode & ModeCreate, &id);
    if (status != StatusOk)
        return status;
    m_sections.push_back(std::make_unique<RegSection>(store, id, name, mode));
    *section = m_sections.back().get();
    return StatusOk;
}

void RepositoryObject::close()
{
    m_sections.clear();
    m_stores.clear();
}

} // namespace Prjrep
