#pragma once

#include "host/OrbHostExport.h"

#include <QApplication>

namespace Gui {
namespace Clip {

class DataCollector;

// The host's application object. Plug-ins reach it as QCoreApplication::instance()
// and connect to dataRequested to contribute to what the host collects, such
// as the items of the preference sheet.
class ORBHOSTGUI_EXPORT ApplicationBase : public QApplication
{
    Q_OBJECT
public:
    ApplicationBase(int &argc, char **argv);
    ~ApplicationBase() override;

    // The host's help file (data/help/orb_help.html of the installation).
    static QString getHelpFileName();

    // Emits dataRequested; slots add their data to `collector`.
    void requestData(DataCollector &collector);

Q_SIGNALS:
    void dataRequested(Gui::Clip::DataCollector &collector);
};

} // namespace Clip
} // namespace Gui
