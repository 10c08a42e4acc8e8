#pragma once

#include "ProjectDocument.h"

#include <QString>

// The host's project model: what the host application and its command-line
// tools call to create projects and to make one the current project. Once a
// project is current, host services and plug-ins reach it through the
// project manager service (GuiI::IProjectManager in CitP::InstanceTable).
namespace OrbProject {

// Registers the project manager service (and the factory creators of the
// partition service and the property filter) if that has not happened yet.
// Every function below does this as well.
ORBPROJECT_EXPORT void registerProjectManager();

// Reads `orbFile` and makes it the current project. False, with a message
// naming the file and the problem, when the file is missing or not a
// well-formed project file; the current project is then left as it was.
// Nothing is written.
ORBPROJECT_EXPORT bool openCurrentProject(const QString &orbFile, QString *error = nullptr);
// Leaves no project current. Objects already handed out stay usable.
ORBPROJECT_EXPORT void closeCurrentProject();

// Absolute path of the current project file, empty when none is current.
ORBPROJECT_EXPORT QString currentProjectFile();
// Design name of the current project, empty when none is current.
ORBPROJECT_EXPORT QString currentProjectName();

// Writes a new project file `orbFile` (design name: the file's base name)
// for `target` and gives it a repository holding its creation time
// (initializeRepository). Fails when the file exists already; on failure no
// project file is left behind.
ORBPROJECT_EXPORT bool createProject(const QString &orbFile, const ProjectDocument::Target &target,
                                     QString *error = nullptr);

// Makes sure the project `orbFile` (which must be a well-formed project
// file) has a repository with its creation time: section "ProjectConsole",
// sub-section "/_ProjRepoInternal_", key "PROJECT_CREATION_TIMESTAMP", the
// current local date and time in ISO 8601. A creation time already stored is
// kept. A project that never got one reads as "UNINITIALIZED" to its users.
ORBPROJECT_EXPORT bool initializeRepository(const QString &orbFile, QString *error = nullptr);

} // namespace OrbProject
