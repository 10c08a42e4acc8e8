#include "PropSheet.h"
#include "PropItem.h"
#include "PropSheetEvent.h"

#include <QCoreApplication>
#include <QDialogButtonBox>
#include <QHBoxLayout>
#include <QLabel>
#include <QListWidget>
#include <QPushButton>
#include <QSignalBlocker>
#include <QStackedWidget>
#include <QVBoxLayout>

namespace Gui {
namespace Clip {

PropSheet::PropSheet(QWidget *parent)
    : QDialog(parent), m_list(new QListWidget(this)), m_pages(new QStackedWidget(this))
{
    setWindowTitle(tr("Preferences"));
    m_list->setMaximumWidth(200);
    auto *buttons =
        new QDialogButtonBox(QDialogButtonBox::Ok | QDialogButtonBox::Apply | QDialogButtonBox::Cancel, this);
    connect(buttons, &QDialogButtonBox::accepted, this, &PropSheet::accept);
    connect(buttons, &QDialogButtonBox::rejected, this, &PropSheet::reject);
    connect(buttons->button(QDialogButtonBox::Apply), &QPushButton::clicked, this, &PropSheet::apply);
    connect(m_list, &QListWidget::currentRowChanged, this, &PropSheet::showItem);

    auto *body = new QHBoxLayout;
    body->addWidget(m_list);
    body->addWidget(m_pages, 1);
    auto *layout = new QVBoxLayout(this);
    layout->addLayout(body);
    layout->addWidget(buttons);
}

PropSheet::~PropSheet() = default;

void PropSheet::addItem(PropItem *item, bool, int)
{
    if (!item)
        return;
    item->setPropSheet(this);
    m_items.emplace_back(item);
    auto *entry = new QListWidgetItem(item->title(), m_list);
    entry->setToolTip(item->subTitle());
    // A placeholder until the page is made.
    m_pages->addWidget(new QLabel(item->subTitle(), m_pages));
}

PropItem *PropSheet::findItem(const QString &name) const
{
    for (const auto &item : m_items) {
        if (item->name() == name)
            return item.get();
    }
    return nullptr;
}

void PropSheet::showItem(int index)
{
    if (index < 0 || index >= itemCount())
        return;
    PropItem *entry = item(index);
    QWidget *page = entry->page();
    const bool firstShow = !page;
    if (!page) {
        QWidget *container = m_pages->widget(index);
        auto *holder = new QWidget(m_pages);
        auto *layout = new QVBoxLayout(holder);
        layout->setContentsMargins(0, 0, 0, 0);
        page = entry->createPage(holder);
        if (!page) {
            delete holder;
            return;
        }
        layout->addWidget(page);
        m_pages->insertWidget(index, holder);
        m_pages->removeWidget(container);
        delete container;
    }
    m_pages->setCurrentIndex(index);
    if (m_list->currentRow() != index) {
        const QSignalBlocker blocker(m_list);
        m_list->setCurrentRow(index);
    }
    PropSheetEvent event(firstShow ? PropSheetEvent::ActivatePage : PropSheetEvent::ReactivatePage);
    QCoreApplication::sendEvent(page, &event);
}

bool PropSheet::apply()
{
    for (int index = 0; index < itemCount(); ++index) {
        if (QWidget *page = item(index)->page()) {
            PropSheetEvent event(PropSheetEvent::ValidateChanges);
            event.accept();
            QCoreApplication::sendEvent(page, &event);
            if (!event.isAccepted()) {
                showItem(index);
                return false;
            }
        }
    }
    for (const auto &item : m_items) {
        if (QWidget *page = item->page()) {
            PropSheetEvent event(PropSheetEvent::ApplyChanges);
            QCoreApplication::sendEvent(page, &event);
        }
    }
    return true;
}

void PropSheet::accept()
{
    if (apply())
        QDialog::accept();
}

} // namespace Clip
} // namespace Gui
