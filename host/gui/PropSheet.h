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
// on first display and driven by PropSheetEvent: 1000 when a page is first
// shown, 1001 when it is shown again (so a page keeps what the user changed
// while another page was shown), and on Apply and OK, to every page created
// so far, 1003 and then 1004. A page that ignores the 1003 event refuses
// its values: the sheet shows it, stores nothing and stays open.
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
    // Sends 1003 to every page created so far and, when none refuses, 1004;
    // false when a page refused.
    bool apply();

    void accept() override;

private:
    std::vector<std::unique_ptr<PropItem>> m_items;
    QListWidget *m_list;
    QStackedWidget *m_pages;
};

} // namespace Clip
} // namespace Gui
