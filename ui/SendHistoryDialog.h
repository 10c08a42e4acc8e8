#pragma once

#include "host/gui/Dialog.h"
#include "transmit/SendHistory.h"

#include <QList>

class CrvC_DataCollectionHtmlViewer;
class QLabel;
class QPushButton;
class QTreeWidget;
class QUrl;

// "Sent reports": the user's send history, newest first. The selected
// report's page is shown as it was sent (a large page only in its beginning,
// as in the review dialog); a failed upload can be sent again, an entry
// deleted, the whole history cleared. The history is read and changed on the
// recorder's worker (CrvC_SendRecorder::run), never on the GUI thread.
class CrvC_SendHistoryDialog : public Gui::Clip::Dialog
{
    Q_OBJECT
public:
    enum Column { TimeColumn, MethodColumn, DestinationColumn, SizeColumn, OutcomeColumn };

    explicit CrvC_SendHistoryDialog(QWidget *parent = nullptr);
    ~CrvC_SendHistoryDialog() override;

    QTreeWidget *list() const { return m_list; }
    CrvC_DataCollectionHtmlViewer *pageViewer() const { return m_page; }
    QLabel *messageLabel() const { return m_message; }
    QPushButton *retryButton() const { return m_retry; }
    QPushButton *deleteButton() const { return m_delete; }
    QPushButton *clearButton() const { return m_clear; }

public Q_SLOTS:
    // Reads the history again; listLoaded() follows.
    void refresh();
    void retrySelected();
    void deleteSelected();
    // Asks, then removes every entry.
    void clearAll();

Q_SIGNALS:
    void listLoaded();
    void pageShown();

private:
    void showEntries(const QList<CrvC_SendHistory::Entry> &entries, const QString &error);
    void onSelectionChanged();
    void onPageLinkClicked(const QUrl &url);
    qint64 selectedId() const;
    const CrvC_SendHistory::Entry *selectedEntry() const;
    void change(std::function<bool(CrvC_SendHistory &)> change);

    QTreeWidget *m_list = nullptr;
    QLabel *m_details = nullptr;
    CrvC_DataCollectionHtmlViewer *m_page = nullptr;
    QLabel *m_message = nullptr;
    QPushButton *m_retry = nullptr;
    QPushButton *m_delete = nullptr;
    QPushButton *m_clear = nullptr;
    QList<CrvC_SendHistory::Entry> m_entries;
    qint64 m_shownId = 0;
};
