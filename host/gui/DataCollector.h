#pragma once

#include "host/OrbHostExport.h"

namespace Gui {
namespace Clip {

class PropSheet;

// What the application asks its plug-ins for with dataRequested.
class ORBHOSTGUI_EXPORT DataCollector
{
public:
    // Desired data types.
    enum DataType { PreferenceSheet = 32 };

    explicit DataCollector(int desiredDataType, PropSheet *sheet = nullptr)
        : m_type(desiredDataType), m_sheet(sheet)
    {
    }

    int getDesiredDataType() const { return m_type; }
    // The preference sheet being built (type 32), else null.
    PropSheet *getPropSheet() const { return m_sheet; }

private:
    int m_type;
    PropSheet *m_sheet;
};

} // namespace Clip
} // namespace Gui
