#pragma once

#include "ProjectModel.h"

#include "host/ProjectManager.h"

#include <QMutex>

namespace OrbProject {

class ProjectObject;

// The host's project manager service: holds the current project. Registered
// in CitP::InstanceTable under GuiI::IProjectManager::serviceId() when first
// used; it also registers the factory creators of the partition service and
// the property filter object.
class ProjectManagerService : public GuiI::IProjectManager
{
public:
    static ProjectManagerService &instance();

    CitI::IInterface *GetInterface(const Port::XUID &iid) override;
    Port::StringBase getTargetFamily(CitI::IInterface *project) override;
    CitI::IInterface *getCurrentProject() override;

    // Makes `project` current, taking over the caller's reference; null
    // leaves no project current. The previous project is released.
    void setCurrentProject(ProjectObject *project);
    // The current project's model, null when none is current.
    ModelPointer currentModel() const;

private:
    ProjectManagerService();
    ~ProjectManagerService() override;

    mutable QMutex m_mutex;
    ProjectObject *m_current = nullptr; // one reference held
};

} // namespace OrbProject
