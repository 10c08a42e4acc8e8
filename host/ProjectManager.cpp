#include "ProjectManager.h"

namespace GuiI {

const Port::XUID &IProjectManager::serviceId()
{
    static const Port::XUID id(0x70B54DDC, 0x735384C2, 0x4BEB9D5F, 0xA6EA596B);
    return id;
}

const Port::XUID &IProjectManager::iid()
{
    return serviceId();
}

} // namespace GuiI

namespace Dpm {

const Port::XUID &IProjectFile::iid()
{
    static const Port::XUID id("{155462E3-6B65-42e1-94AB-FC281C0EF860}");
    return id;
}

const Port::XUID &IProject2::iid()
{
    static const Port::XUID id("{630dab3a-c8de-4702-a188-cc9357f712f2}");
    return id;
}

} // namespace Dpm
