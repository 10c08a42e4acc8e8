#include "Orb.h"

#include "host/FileSupervisor.h"
#include "host/String.h"
#include "host/project/OrbProject.h"

#include <QCoreApplication>

namespace Orb {

bool openFile(const QString &fileName, CitI::IInterface *context)
{
    const Port::StringBase name = Gui::Clip::String::convert(fileName);
    GuiI::IFileEditorManager *editor = Gui::Clip::FileSupervisor::getInstance()->findEditor(name);
    if (!editor)
        return false;
    editor->openFile(name, 0, context);
    return true;
}

QString currentProjectName()
{
    return OrbProject::currentProjectName();
}

QString currentProjectDescription()
{
    const QString name = currentProjectName();
    return name.isEmpty() ? QCoreApplication::translate("Orb", "No project is open.")
                          : QCoreApplication::translate("Orb", "Project: %1").arg(name);
}

} // namespace Orb
