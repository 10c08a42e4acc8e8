#pragma once

#include "Interface.h"

#include <QObject>

namespace Gui {
namespace Clip {

// Interface identifier of the plug-ins that orb loads (Q_PLUGIN_METADATA IID).
#define ORB_PLUGIN_IID "com.vantor.orb.CPlugin/1.0"

// Base of every plug-in object. The host loads a plug-in library with
// QPluginLoader; its instance must derive from CPlugin. Plug-ins register
// whatever they offer (file editors, instances) in their constructor and
// undo it in their destructor, which runs when the host unloads them.
class ORBHOST_EXPORT CPlugin : public QObject, public CitI::IInterface
{
    Q_OBJECT
public:
    explicit CPlugin(QObject *parent = nullptr);
    ~CPlugin() override;

    // The interface of this plug-in named by `iid`, or null.
    CitI::IInterface *GetInterface(const Port::XUID &iid) override;
    // Called by the host once every plug-in is loaded.
    virtual void configure();
    // Called by the host when its main window is created.
    virtual void createDockWidgets();
};

} // namespace Clip
} // namespace Gui
