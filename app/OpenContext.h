#pragma once

#include "host/FileEditorManager.h"
#include "host/RefObject.h"

// The context of an open request made from the command line: names the
// project and the design that the opened file belongs to.
class OpenContext : public CitP::RefObject, public GuiI::IOpenContext, public GuiI::IDesignNameProvider
{
public:
    OpenContext(const QString &projectName, const QString &designName);

    CitI::IInterface *GetInterface(const Port::XUID &iid) override;
    void AddRef() override { RefObject::AddRef(); }
    void Release() override { RefObject::Release(); }

    Port::StringBase getProjectName() override;
    Port::StringBase getDesignText() override;

private:
    Port::StringBase m_projectName;
    Port::StringBase m_designName;
};
