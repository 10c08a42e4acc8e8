#pragma once

#include "HostObject.h"
#include "ProjectModel.h"

#include "host/DesignData.h"
#include "host/ProjectManager.h"

namespace OrbProject {

// A project of the host: the object that the project manager hands out as the
// current project. Answers the project file interface, Dpm::IProject2 and
// Dpm::IProject.
class ProjectObject : public HostObject<Dpm::IProjectFile, Dpm::IProject2, Dpm::IProject>
{
public:
    explicit ProjectObject(ModelPointer model);

    const ModelPointer &model() const { return m_model; }

    Port::StringBase getProjectFile() override;
    void getProjectDirectory(Port::StringBase &directory) override;
    CitI::IInterface *getDesignData() override;
    CitI::IInterface *getFileManager() override;

    // The project object behind `object` (any of its interfaces), or null
    // when it is not one of ours.
    static ProjectObject *from(CitI::IInterface *object);

private:
    ModelPointer m_model;
};

} // namespace OrbProject
