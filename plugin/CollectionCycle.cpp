#include "CollectionCycle.h"
#include "project/CorvidSettings.h"
#include "transmit/SendRetry.h"

#include "host/AutoRelease.h"
#include "host/FileEditorManager.h"
#include "host/InstanceTable.h"
#include "host/MsgManData.h"
#include "host/ProjectManager.h"
#include "host/String.h"

#include <QDir>
#include <QFileInfo>

using Gui::Clip::String;

namespace {

CrvC_CollectionCycle::Dialogs &dialogs()
{
    static CrvC_CollectionCycle::Dialogs hooks;
    return hooks;
}

} // namespace

void CrvC_CollectionCycle::setDialogs(Dialogs hooks)
{
    dialogs() = std::move(hooks);
}

QString CrvC_CollectionCycle::designName(const QString &fileName, CitI::IInterface *context,
                                         bool *directoryEntered)
{
    if (directoryEntered)
        *directoryEntered = true;
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
    // A folder that is gone or a link loop leaves the old current directory,
    // whose files must not be taken for this design's.
    const bool entered = QDir::setCurrent(file.absolutePath());
    if (directoryEntered)
        *directoryEntered = entered;
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
    auto *manager =
        service ? static_cast<GuiI::IProjectManager *>(service->GetInterface(GuiI::IProjectManager::iid()))
                : nullptr;
    if (manager) {
        Prjrep::AutoRelease<CitI::IInterface> project(manager->getCurrentProject());
        if (project) {
            targetFamily = String::convert(manager->getTargetFamily(project.get()));
            if (auto *file =
                    static_cast<Dpm::IProjectFile *>(project->GetInterface(Dpm::IProjectFile::iid())))
                projectFile = String::convert(file->getProjectFile());
        }
    }
}

void CrvC_CollectionCycle::openUsageFile(const QString &fileName, CitI::IInterface *context)
{
    bool entered = true;
    const QString design = designName(fileName, context, &entered);
    Port_MsgManData::debugStub("Corvid: open %s (design \"%s\")\n", qUtf8Printable(fileName),
                               qUtf8Printable(design));
    if (!entered) {
        Port_MsgManData::debugStub("Corvid: cannot enter the folder of %s; nothing collected\n",
                                   qUtf8Printable(fileName));
        return;
    }
    if (!fileName.endsWith(QLatin1String(".xml")))
        return;

    QString projectFile;
    QString targetFamily;
    currentProject(projectFile, targetFamily);

    // The switch holds with and without a current project: a user or an
    // administrator who switched collection off gets nothing built or sent.
    if (!CrvC_Settings::isCollectionEnabled()) {
        Port_MsgManData::debugStub("Corvid: collection is switched off\n");
        return;
    }
    // Failed uploads of earlier cycles go again first, within the same
    // consent; Corvid keeps no timer of its own for them.
    CrvC_SendRetry::retryPending();
    startCollection(projectFile, design, targetFamily);
}

void CrvC_CollectionCycle::startCollection(const QString &projectFile, const QString &designName,
                                           const QString &targetFamily)
{
    const bool atOnce = CrvC_Settings::dontShowSendProgressDlg();
    Port_MsgManData::debugStub("Corvid: collect design \"%s\", project \"%s\", family \"%s\" (%s)\n",
                               qUtf8Printable(designName), qUtf8Printable(projectFile),
                               qUtf8Printable(targetFamily), atOnce ? "send at once" : "countdown");
    const Starter &start = atOnce ? dialogs().sendAtOnce : dialogs().countDown;
    if (start)
        start(projectFile, designName, targetFamily);
    else
        Port_MsgManData::debugStub("Corvid: no dialogs installed\n");
}
