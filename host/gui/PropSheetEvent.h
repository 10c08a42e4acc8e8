#pragma once

#include "host/OrbHostExport.h"

#include <QEvent>

namespace Gui {
namespace Clip {

// Events the preference sheet sends to a page widget.
class ORBHOSTGUI_EXPORT PropSheetEvent : public QEvent
{
public:
    enum PageEvent {
        ActivatePage = 1000,    // the page is shown: load the settings
        ReactivatePage = 1001,  // the page is shown again
        DeactivatePage = 1002,  // another page is shown
        ValidateChanges = 1003, // before applying
        ApplyChanges = 1004,    // Apply or OK: store the settings
        ShowHelp = 1005         // the user asked for the page's help
    };

    explicit PropSheetEvent(PageEvent type) : QEvent(QEvent::Type(type)) {}
};

} // namespace Clip
} // namespace Gui
