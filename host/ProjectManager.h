#pragma once

#include "Interface.h"
#include "StringBase.h"

// The host's project manager service and the project interfaces that
// plug-ins reach through it. The service is registered in the host instance
// table (CitP::InstanceTable) under GuiI::IProjectManager::serviceId() and
// answers GuiI::IProjectManager::iid() from GetInterface.

namespace GuiI {

class ORBHOST_EXPORT IProjectManager : public CitI::IInterface
{
public:
    static const Port::XUID &serviceId(); // words 0x70B54DDC, 0x735384C2, 0x4BEB9D5F, 0xA6EA596B
    static const Port::XUID &iid();       // the same identifier

    // operation 3 (slot 2): the device family of `project` ("" when unknown).
    virtual Port::StringBase getTargetFamily(CitI::IInterface *project) = 0;
    // operation 9 (slot 8): the current project with one reference for the
    // caller (release it, e.g. with Prjrep::AutoRelease), or null.
    virtual CitI::IInterface *getCurrentProject() = 0;
};

} // namespace GuiI

namespace Dpm {

// The project's file interface {155462E3-6B65-42e1-94AB-FC281C0EF860}.
class ORBHOST_EXPORT IProjectFile : public CitI::IInterface
{
public:
    static const Port::XUID &iid();
    // operation 3 (slot 2): path of the project file.
    virtual Port::StringBase getProjectFile() = 0;
};

// Dpm::IProject2 {630dab3a-c8de-4702-a188-cc9357f712f2}, reached from IProjectFile.
class ORBHOST_EXPORT IProject2 : public CitI::IInterface
{
public:
    static const Port::XUID &iid();
    // operation 15 (slot 14): the project directory (absolute, no trailing "/").
    virtual void getProjectDirectory(Port::StringBase &directory) = 0;
};

} // namespace Dpm
