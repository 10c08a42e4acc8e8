#pragma once

#include <QObject>

namespace Gui {
namespace Clip {
class DataCollector;
class PropItem;
} // namespace Clip
} // namespace Gui

using Gui::Clip::PropItem;

// Corvid's entry in the host's preference sheet: adds the item "Corvid" when
// the host builds the sheet, and makes the item's page when it is first shown.
class CrvC_PropPageCreator : public QObject
{
    Q_OBJECT
public:
    static const char *const ItemName;  // "gc-rv-deviceuagecollection-pref-item"
    static const char *const HelpTopic; // "gc-corvid-preferences"

    explicit CrvC_PropPageCreator(QObject *parent = nullptr);
    ~CrvC_PropPageCreator() override;

    // Adds Corvid's item to the sheet of a preference-sheet request (data
    // type 32); any other request, or one without a sheet, is left alone.
    static void addPreferenceItem(Gui::Clip::DataCollector &collector);

public Q_SLOTS:
    // Makes the page of `item` as a child of `parent`, once per item.
    void OnCreatePrefPage(QWidget *parent, PropItem *item);
};
