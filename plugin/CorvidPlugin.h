#pragma once

#include "host/FileEditorManager.h"
#include "host/Plugin.h"

namespace Gui {
namespace Clip {
class DataCollector;
}
} // namespace Gui

// The plug-in object the host loads: adds the Corvid page to the host's
// preference sheet, offers itself to the file supervisor as the editor of
// the usage files the design tools write ("*_usage.xml"), and starts the
// collection cycle when the host opens one.
class CrvC_CorvidPlugin : public Gui::Clip::CPlugin, public GuiI::IFileEditorManager
{
    Q_OBJECT
    Q_PLUGIN_METADATA(IID ORB_PLUGIN_IID FILE "CorvidPlugin.json")
    Q_INTERFACES(GuiI::IFileEditorManager)
public:
    CrvC_CorvidPlugin();
    ~CrvC_CorvidPlugin() override;

    CitI::IInterface *GetInterface(const Port::XUID &iid) override;

    // GuiI::IFileEditorManager
    Port::StringBase getDisplayName() override;
    int getOpenDocumentCount() override;
    Port::StringBase getNewFileFilter() override;
    int openFile(const Port::StringBase &fileName, int options, CitI::IInterface *context) override;
    int getInterfaceVersion() override;
    bool canCreateFiles() override;
    int getMaxFilesPerOpen() override;
    int createFile(const Port::StringBase &fileName) override;
    int saveAll() override;
    int closeAll() override;
    int getModifiedDocumentCount() override;
    Port::StringBase getHelpTopic() override;
    int getFileSuitability(const Port::StringBase &fileName) override;

public Q_SLOTS:
    void onDataRequested(Gui::Clip::DataCollector &collector);
};
