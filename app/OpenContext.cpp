#include "OpenContext.h"

#include "host/String.h"

OpenContext::OpenContext(const QString &projectName, const QString &designName)
    : m_projectName(Gui::Clip::String::convert(projectName))
    , m_designName(Gui::Clip::String::convert(designName))
{
}

CitI::IInterface *OpenContext::GetInterface(const Port::XUID &iid)
{
    if (iid == GuiI::IOpenContext::iid())
        return static_cast<GuiI::IOpenContext *>(this);
    if (iid == GuiI::IDesignNameProvider::iid())
        return static_cast<GuiI::IDesignNameProvider *>(this);
    return RefObject::GetInterface(iid);
}

Port::StringBase OpenContext::getProjectName()
{
    return m_projectName;
}

Port::StringBase OpenContext::getDesignText()
{
    return m_projectName + "|" + m_designName;
}
