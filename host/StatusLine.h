#pragma once

#include "OrbHostExport.h"

#include <QString>

#include <functional>

namespace Port {

// The host's status line: one short sentence about something that just
// happened, for the user to notice without a dialog. Plug-ins call show();
// the host decides where it appears: the main window puts it in its status
// bar, `orb open` (no window) on standard output. Until a display is set the
// text goes to the debug output. For the GUI thread.
class ORBHOST_EXPORT StatusLine
{
public:
    using Display = std::function<void(const QString &text)>;

    // Installs where the status line appears (an empty function restores the
    // debug output) and returns the previous display.
    static Display setDisplay(Display display);

    static void show(const QString &text);
    // The text shown last, empty before the first.
    static QString lastText();
};

} // namespace Port
