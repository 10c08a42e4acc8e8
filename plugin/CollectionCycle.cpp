#include "CollectionCycle.h"
#include "project/CorvidSettings.h"

#include "host/AutoRelease.h"
#include "host/FileEditorManager.h"
#include "host/InstanceTable.h"
#include "host/MsgManData.h"
#include "host/ProjectManager.h"
#include "host/String.h"

#include <QDir>
#include <QFileInfo>

using Gui::Clip::String;

QString CrvC_CollectionCycle::designName(const QString &fileName, CitI::IInterface *context)
{
    if (context) {
        auto *open = static_cast<GuiI::IOpenContext *>(context->GetInterface(GuiI::IOpenContext::iid()));
        auto *provider = open ? static_cast<GuiI::IDesignNameProvider *>(
                                    open->GetInterface(GuiI::IDesignNameProvider::iid()))
                              : nullptr;
        if (!provider)
            return QString();
        const QStringList parts =
            String::convert(provider->getDesignText()).split(QLatin1Char('|'), Qt::SkipEmptyParts);
        return parts.size() >= 2 ? parts.at(1) : QString();
    }
    const QFileInfo file(fileName);
    QDir::setCurrent(file.absolutePath());
    QString name = file.baseName();
    const qsizetype cut = name.lastIndexOf(QLatin1Char('_'));
    if (cut >= 0)
        name.truncate(cut);
    return name;
}

void CrvC_CollectionCycle::currentProject(QString &projectFile, QString &targetFamily)
{
    projectFile.clear();
    targetFamily.clear();
    auto *service = CitP::InstanceTable::GetInstance(GuiI::IProjectManager::serviceId());
    auto *manager = service ? static_cast<GuiI::IProjectManager *>(
                                  service->GetInterface(GuiI::IProjectManager::iid()))
                            : nullptr;
    if (manager) {
        Prjrep::AutoRelease<CitI::IInterface> project(manager->getCurrentProject());
        if (project) {
            targetFamily = String::convert(manager->getTargetFamily(project.get()));
            if (auto *file = static_cast<Dpm::IProjectFile *>(
                    project->GetInterface(Dpm::IProjectFile::iid())))
                projectFile = String::convert(file->getProjectFile());
        }
    }
}

void CrvC_CollectionCycle::openUsageFile(const QString &fileName, CitI::IInterface *context)
{
    const QString design = designName(fileName, context);
    Port_MsgManData::debugStub("Corvid: open %s (design \"%s\")\n", qUtf8Printable(fileName),
                               qUtf8Printable(design));
    if (!fileName.endsWith(QLatin1String(".xml")))
        return;

    QString projectFile;
    QString targetFamily;
    currentProject(projectFile, targetFamily);

    if (!projectFile.isEmpty() && !CrvC_Settings::isCollectionEnabled()) {
        Port_MsgManData::debugStub("Corvid: collection is switched off\n");
        return;
    }
    startCollection(projectFile, design, targetFamily);
}

void CrvC_CollectionCycle::startCollection(const QString &projectFile, const QString &designName,
                                           const QString &targetFamily)
{
    Port_MsgManData::debugStub("Corvid: collect design \"%s\", project \"%s\", family \"%s\"\n",
                               qUtf8Printable(designName), qUtf8Printable(projectFile),
                               qUtf8Printable(targetFamily));
}
