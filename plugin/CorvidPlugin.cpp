#include "CorvidPlugin.h"
#include "CollectionCycle.h"
#include "ui/DataCollectionDialog.h"
#include "ui/PropPageCreator.h"
#include "ui/SendClipDlg.h"
#include "ui/SendToClipDlg.h"

#include "transmit/SendRecorder.h"
#include "transmit/UserNotice.h"

#include "host/FileSupervisor.h"
#include "host/InstanceTable.h"
#include "host/MsgManData.h"
#include "host/String.h"
#include "host/gui/Dialog.h"

#include <QCoreApplication>
#include <QEventLoopLocker>
#include <QMessageBox>

using Gui::Clip::String;

namespace {

// What the parts without widgets need of the user: the host's warning box,
// the send method dialog, and the windows of the collection cycle.
void installHandlers()
{
    CrvC_UserNotice::setHandlers(
        [](const QString &text, const QString &details) {
            Gui::Clip::MessageBox::warning(nullptr,
                                           QCoreApplication::translate("CrvC_CorvidPlugin", "Corvid"), text,
                                           details, QMessageBox::Ok);
        },
        [](const QString &reportFile) {
            CrvC_SendToClipDlg::showSendMethodDialogForEmail(nullptr, reportFile);
        });

    CrvC_CollectionCycle::Dialogs dialogs;
    dialogs.sendAtOnce = [](const QString &projectFile, const QString &designName,
                            const QString &targetFamily) {
        auto *review = new CrvC_DataCollectionDialog(nullptr);
        if (!review->startReport(projectFile, designName, targetFamily)) {
            delete review; // design-name prompt cancelled
            return;
        }
        // The host stays up until the page is written and its send has
        // started (the upload then keeps it up itself).
        auto *pending = new QEventLoopLocker;
        QObject::connect(review, &CrvC_DataCollectionDialog::reportFinished, review, [review, pending] {
            // Sends nothing when no page was written.
            review->sendData();
            review->deleteLater();
            delete pending;
        });
    };
    dialogs.countDown = [](const QString &projectFile, const QString &designName,
                           const QString &targetFamily) {
        auto *countdown = new CrvC_SendClipDlg(nullptr, projectFile, designName, targetFamily);
        // No build, no countdown: nothing is shown or sent.
        if (!countdown->reportStarted()) {
            Port_MsgManData::debugStub("Corvid: no report built, nothing sent\n");
            delete countdown;
            return;
        }
        countdown->show();
    };
    CrvC_CollectionCycle::setDialogs(dialogs);
}

// The library may be unloaded after the plug-in object: nothing may keep
// pointing into it.
void removeHandlers()
{
    CrvC_UserNotice::setHandlers({}, {});
    CrvC_CollectionCycle::setDialogs({});
    // The history's last writes, and their answers, run while their code is
    // still loaded.
    CrvC_SendRecorder::shutdown();
}

} // namespace

CrvC_CorvidPlugin::CrvC_CorvidPlugin()
{
    setObjectName(QStringLiteral("CrvC_CorvidPlugin"));
    Gui::Clip::FileSupervisor::getInstance()->registerEditor(Gui::Clip::FileSupervisor::fileEditorCategory(),
                                                             static_cast<GuiI::IFileEditorManager *>(this));
    connect(QCoreApplication::instance(), SIGNAL(dataRequested(Gui::Clip::DataCollector &)), this,
            SLOT(onDataRequested(Gui::Clip::DataCollector &)));
    CitP::InstanceTable::RegisterInstance(GuiI::IFileEditorManager::iid(),
                                          static_cast<GuiI::IFileEditorManager *>(this));
    installHandlers();
}

CrvC_CorvidPlugin::~CrvC_CorvidPlugin()
{
    removeHandlers();
    CitP::InstanceTable::UnRegisterInstance(static_cast<GuiI::IFileEditorManager *>(this));
    Gui::Clip::FileSupervisor::getInstance()->unregisterEditor(static_cast<GuiI::IFileEditorManager *>(this));
}

CitI::IInterface *CrvC_CorvidPlugin::GetInterface(const Port::XUID &iid)
{
    if (iid == GuiI::IFileEditorManager::iid())
        return static_cast<GuiI::IFileEditorManager *>(this);
    return Gui::Clip::CPlugin::GetInterface(iid);
}

Port::StringBase CrvC_CorvidPlugin::getDisplayName()
{
    return Port::StringBase("Corvid Plugin");
}

int CrvC_CorvidPlugin::getOpenDocumentCount()
{
    return 0;
}

Port::StringBase CrvC_CorvidPlugin::getNewFileFilter()
{
    return Port::StringBase();
}

int CrvC_CorvidPlugin::openFile(const Port::StringBase &fileName, int, CitI::IInterface *context)
{
    CrvC_CollectionCycle::openUsageFile(String::convert(fileName), context);
    return 0;
}

int CrvC_CorvidPlugin::getInterfaceVersion()
{
    return 1;
}

bool CrvC_CorvidPlugin::canCreateFiles()
{
    return false;
}

int CrvC_CorvidPlugin::getMaxFilesPerOpen()
{
    return 1;
}

int CrvC_CorvidPlugin::createFile(const Port::StringBase &)
{
    return 0;
}

int CrvC_CorvidPlugin::saveAll()
{
    return 0;
}

int CrvC_CorvidPlugin::closeAll()
{
    return 0;
}

int CrvC_CorvidPlugin::getModifiedDocumentCount()
{
    return 0;
}

Port::StringBase CrvC_CorvidPlugin::getHelpTopic()
{
    return Port::StringBase();
}

int CrvC_CorvidPlugin::getFileSuitability(const Port::StringBase &fileName)
{
    return String::convert(fileName).endsWith(QLatin1String("_usage.xml")) ? PreferredEditor : NotSuitable;
}

void CrvC_CorvidPlugin::onDataRequested(Gui::Clip::DataCollector &collector)
{
    CrvC_PropPageCreator::addPreferenceItem(collector);
}
