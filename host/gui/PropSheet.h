#pragma once

#include "host/OrbHostExport.h"

#include <QDialog>

#include <memory>
#include <vector>

class QListWidget;
class QStackedWidget;

namespace Gui {
namespace Clip {

class PropItem;

// The host's preference sheet: a list of items on the left, the page of the
// selected item on the right, OK, Apply and Cancel below. Pages are created
// on first display and driven by PropSheetEvent: 1000 when a page is shown,
// 1004 on Apply and OK (to every page created so far).
class ORBHOSTGUI_EXPORT PropSheet : public QDialog
{
    Q_OBJECT
public:
    explicit PropSheet(QWidget *parent = nullptr);
    ~PropSheet() override;

    // Takes ownership of `item`. `expanded` and `state` are kept for callers
    // that group items; this sheet shows a flat list.
    void addItem(PropItem *item, bool expanded, int state);

    int itemCount() const { return int(m_items.size()); }
    PropItem *item(int index) const { return m_items.at(std::size_t(index)).get(); }
    PropItem *findItem(const QString &name) const;

    // Shows the page of item `index`, creating it first when needed.
    void showItem(int index);
    // Sends 1004 to every page created so far.
    void apply();

    void accept() override;

private:
    std::vector<std::unique_ptr<PropItem>> m_items;
    QListWidget *m_list;
    QStackedWidget *m_pages;
};

} // namespace Clip
} // namespace Gui
