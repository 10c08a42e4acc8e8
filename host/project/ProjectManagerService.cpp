#include "ProjectManagerService.h"
#include "PartitionService.h"
#include "ProjectObject.h"
#include "PropertyFilter.h"

#include "host/Factory.h"
#include "host/InstanceTable.h"
#include "host/String.h"

namespace OrbProject {

ProjectManagerService &ProjectManagerService::instance()
{
    static ProjectManagerService service;
    return service;
}

ProjectManagerService::ProjectManagerService()
{
    CitP::InstanceTable::RegisterInstance(serviceId(), this);
    CitP::Factory::RegisterCreator(Dpm::IPartitionService::objectId(), [] {
        return static_cast<Dpm::IPartitionService *>(
            new PartitionService(ProjectManagerService::instance().currentModel()));
    });
    CitP::Factory::RegisterCreator(Dpm::IFilter::objectId(),
                                   [] { return static_cast<Dpm::IFilter *>(new PropertyFilter); });
}

ProjectManagerService::~ProjectManagerService()
{
    CitP::Factory::UnRegisterCreator(Dpm::IFilter::objectId());
    CitP::Factory::UnRegisterCreator(Dpm::IPartitionService::objectId());
    CitP::InstanceTable::UnRegisterInstance(this);
    setCurrentProject(nullptr);
}

CitI::IInterface *ProjectManagerService::GetInterface(const Port::XUID &iid)
{
    return iid == GuiI::IProjectManager::iid() ? this : nullptr;
}

Port::StringBase ProjectManagerService::getTargetFamily(CitI::IInterface *project)
{
    const ProjectObject *object = ProjectObject::from(project);
    return object ? Gui::Clip::String::convert(object->model()->document.target.family) : Port::StringBase();
}

CitI::IInterface *ProjectManagerService::getCurrentProject()
{
    QMutexLocker lock(&m_mutex);
    if (!m_current)
        return nullptr;
    m_current->AddRef();
    return static_cast<Dpm::IProject *>(m_current);
}

void ProjectManagerService::setCurrentProject(ProjectObject *project)
{
    ProjectObject *previous;
    {
        QMutexLocker lock(&m_mutex);
        previous = std::exchange(m_current, project);
    }
    if (previous)
        previous->Release();
}

ModelPointer ProjectManagerService::currentModel() const
{
    QMutexLocker lock(&m_mutex);
    return m_current ? m_current->model() : ModelPointer();
}

} // namespace OrbProject
