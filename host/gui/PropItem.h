#pragma once

#include "host/OrbHostExport.h"

#include <QByteArray>
#include <QPointer>
#include <QString>

class QWidget;

namespace Gui {
namespace Clip {

class PropSheet;

// One entry of the preference sheet. Its page is made on first display by
// the creator's slot, called as slot(QWidget *container, PropItem *item): the
// slot creates the page widget as a child of `container`.
class ORBHOSTGUI_EXPORT PropItem
{
public:
    PropItem(const QString &name, const QString &title, const QString &subTitle, const char *internalName);
    ~PropItem();

    QString name() const { return m_name; }
    QString title() const { return m_title; }
    QString subTitle() const { return m_subTitle; }
    QByteArray internalName() const { return m_internalName; }

    // `slot` as produced by SLOT(...), e.g. SLOT(OnCreatePrefPage(QWidget*,PropItem*)).
    void setPropPageCreator(QObject *creator, const char *slot);
    void setHelpFileNameAndTopic(const QString &fileName, const QString &topic);
    QString helpFileName() const { return m_helpFile; }
    QString helpTopic() const { return m_helpTopic; }

    PropSheet *getPropSheet() const { return m_sheet; }
    void setPropSheet(PropSheet *sheet) { m_sheet = sheet; }

    // Calls the creator's slot with `container`; returns the page widget it
    // made (the newest child widget of `container`), or null.
    QWidget *createPage(QWidget *container);
    QWidget *page() const { return m_page; }

private:
    QString m_name;
    QString m_title;
    QString m_subTitle;
    QByteArray m_internalName;
    QPointer<QObject> m_creator;
    QByteArray m_slot;
    QString m_helpFile;
    QString m_helpTopic;
    PropSheet *m_sheet = nullptr;
    QPointer<QWidget> m_page;
};

} // namespace Clip
} // namespace Gui
