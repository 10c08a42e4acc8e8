#include "ProjectObject.h"
#include "DataStore.h"
#include "FileManager.h"

#include "host/String.h"

namespace OrbProject {

ProjectObject::ProjectObject(ModelPointer model) : m_model(std::move(model))
{
}

Port::StringBase ProjectObject::getProjectFile()
{
    return Gui::Clip::String::convert(m_model->file);
}

void ProjectObject::getProjectDirectory(Port::StringBase &directory)
{
    directory = Gui::Clip::String::convert(m_model->directory);
}

CitI::IInterface *ProjectObject::getDesignData()
{
    return createDesignData(m_model);
}

CitI::IInterface *ProjectObject::getFileManager()
{
    return createFileManager(m_model);
}

ProjectObject *ProjectObject::from(CitI::IInterface *object)
{
    return dynamic_cast<ProjectObject *>(object);
}

} // namespace OrbProject
