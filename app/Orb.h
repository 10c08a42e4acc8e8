#pragma once

#include <QString>

namespace CitI {
class IInterface;
}

// The host application's own operations, shared by the command line and the
// main window.
namespace Orb {

// Hands `fileName` to the file editor that claims it best (the file
// supervisor's highest suitability) with `context`; false when no editor
// claims it.
bool openFile(const QString &fileName, CitI::IInterface *context);

// Name of the current project, empty when none is open.
QString currentProjectName();

// One line about the current project for the main window.
QString currentProjectDescription();

} // namespace Orb
