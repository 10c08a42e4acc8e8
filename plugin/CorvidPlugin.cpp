#include "CorvidPlugin.h"
#include "CollectionCycle.h"
#include "ui/PropPageCreator.h"

#include "host/FileSupervisor.h"
#include "host/InstanceTable.h"
#include "host/String.h"

#include <QCoreApplication>

using Gui::Clip::String;

CrvC_CorvidPlugin::CrvC_CorvidPlugin()
{
    setObjectName(QStringLiteral("CrvC_CorvidPlugin"));
    Gui::Clip::FileSupervisor::getInstance()->registerEditor(
        Gui::Clip::FileSupervisor::fileEditorCategory(), static_cast<GuiI::IFileEditorManager *>(this));
    connect(QCoreApplication::instance(), SIGNAL(dataRequested(Gui::Clip::DataCollector&)),
            this, SLOT(onDataRequested(Gui::Clip::DataCollector&)));
    CitP::InstanceTable::RegisterInstance(GuiI::IFileEditorManager::iid(),
                                          static_cast<GuiI::IFileEditorManager *>(this));
}

CrvC_CorvidPlugin::~CrvC_CorvidPlugin()
{
    CitP::InstanceTable::UnRegisterInstance(static_cast<GuiI::IFileEditorManager *>(this));
    Gui::Clip::FileSupervisor::getInstance()->unregisterEditor(
        static_cast<GuiI::IFileEditorManager *>(this));
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
    return String::convert(fileName).endsWith(QLatin1String("_usage.xml")) ? PreferredEditor
                                                                           : NotSuitable;
}

void CrvC_CorvidPlugin::onDataRequested(Gui::Clip::DataCollector &collector)
{
    CrvC_PropPageCreator::addPreferenceItem(collector);
}
