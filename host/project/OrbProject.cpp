#include "OrbProject.h"
#include "ProjectManagerService.h"
#include "ProjectObject.h"
#include "RepositoryAccess.h"

#include <QDateTime>
#include <QDir>
#include <QFile>
#include <QFileInfo>

namespace OrbProject {
namespace {

bool fail(QString *error, const QString &message)
{
    if (error)
        *error = message;
    return false;
}

} // namespace

void registerProjectManager()
{
    ProjectManagerService::instance();
}

bool openCurrentProject(const QString &orbFile, QString *error)
{
    registerProjectManager();
    auto model = std::make_shared<ProjectModel>();
    if (!model->document.read(orbFile, error))
        return false;
    const QFileInfo info(orbFile);
    model->file = QDir::cleanPath(info.absoluteFilePath());
    model->directory = QDir::cleanPath(info.absolutePath());
    model->properties = model->document.effectiveProperties();
    ProjectManagerService::instance().setCurrentProject(new ProjectObject(std::move(model)));
    return true;
}

void closeCurrentProject()
{
    ProjectManagerService::instance().setCurrentProject(nullptr);
}

QString currentProjectFile()
{
    const ModelPointer model = ProjectManagerService::instance().currentModel();
    return model ? model->file : QString();
}

QString currentProjectName()
{
    const ModelPointer model = ProjectManagerService::instance().currentModel();
    return model ? model->document.name : QString();
}

bool createProject(const QString &orbFile, const ProjectDocument::Target &target, QString *error)
{
    registerProjectManager();
    if (QFileInfo::exists(orbFile))
        return fail(error, QStringLiteral("%1: already exists").arg(orbFile));
    ProjectDocument document;
    document.name = QFileInfo(orbFile).completeBaseName();
    document.target = target;
    if (!document.write(orbFile, error))
        return false;
    if (!initializeRepository(orbFile, error)) {
        QFile::remove(orbFile);
        return false;
    }
    return true;
}

bool initializeRepository(const QString &orbFile, QString *error)
{
    registerProjectManager();
    ProjectDocument document;
    if (!document.read(orbFile, error))
        return false;
    QString stamp;
    if (RepositoryAccess::read(orbFile, QLatin1String(RepositoryAccess::CreationSection),
                               QLatin1String(RepositoryAccess::CreationSubSection),
                               QLatin1String(RepositoryAccess::CreationKey), &stamp)
        && !stamp.isEmpty()) {
        return true;
    }
    const QDateTime now = QDateTime::currentDateTime();
    stamp = now.toOffsetFromUtc(now.offsetFromUtc()).toString(Qt::ISODate);
    return RepositoryAccess::write(orbFile, QLatin1String(RepositoryAccess::CreationSection),
                                   QLatin1String(RepositoryAccess::CreationSubSection),
                                   QLatin1String(RepositoryAccess::CreationKey), stamp, error);
}

} // namespace OrbProject
