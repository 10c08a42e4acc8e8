#include "Plugin.h"

namespace Gui {
namespace Clip {

CPlugin::CPlugin(QObject *parent) : QObject(parent)
{
}

CPlugin::~CPlugin() = default;

CitI::IInterface *CPlugin::GetInterface(const Port::XUID &)
{
    return nullptr;
}

void CPlugin::configure()
{
}

void CPlugin::createDockWidgets()
{
}

} // namespace Clip
} // namespace Gui
