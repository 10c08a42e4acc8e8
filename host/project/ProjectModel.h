#pragma once

#include "ProjectDocument.h"

#include <memory>

namespace OrbProject {

// A loaded project as the host objects see it; never changed once loaded, so
// the objects handed out for it share it and keep it alive.
struct ProjectModel
{
    QString file;      // absolute path of the project file
    QString directory; // absolute, without a trailing "/"
    ProjectDocument document;
    QList<ProjectDocument::DesignProperty> properties; // document.effectiveProperties()
};

using ModelPointer = std::shared_ptr<const ProjectModel>;

} // namespace OrbProject
