#include "SendHistoryDialog.h"

#include "DataCollectionDialog.h"
#include "DataCollectionHtmlViewer.h"
#include "transmit/SendRecorder.h"
#include "transmit/SendRetry.h"

#include <QDir>
#include <QFile>
#include <QHBoxLayout>
#include <QHeaderView>
#include <QLabel>
#include <QMessageBox>
#include <QPointer>
#include <QPushButton>
#include <QSplitter>
#include <QTreeWidget>
#include <QUrl>
#include <QVBoxLayout>

#include <memory>

using Entry = CrvC_SendHistory::Entry;

CrvC_SendHistoryDialog::CrvC_SendHistoryDialog(QWidget *parent)
    : Gui::Clip::Dialog(parent, nullptr, "CrvC_SendHistoryDialog")
{
    setWindowTitle(tr("Sent Reports"));
    auto *layout = new QVBoxLayout(this);

    m_list = new QTreeWidget(this);
    m_list->setObjectName(QStringLiteral("historyList"));
    m_list->setRootIsDecorated(false);
    m_list->setUniformRowHeights(true);
    m_list->setHeaderLabels({tr("Time"), tr("Method"), tr("Destination"), tr("Size"), tr("Outcome")});
    m_list->header()->setStretchLastSection(true);
    connect(m_list, &QTreeWidget::itemSelectionChanged, this, &CrvC_SendHistoryDialog::onSelectionChanged);

    m_details = new QLabel(this);
    m_details->setWordWrap(true);
    m_details->setTextInteractionFlags(Qt::TextSelectableByMouse);
    m_page = new CrvC_DataCollectionHtmlViewer(this);
    m_page->setOpenLinks(false);
    connect(m_page, &QTextBrowser::anchorClicked, this, &CrvC_SendHistoryDialog::onPageLinkClicked);

    auto *pagePane = new QWidget(this);
    auto *pageLayout = new QVBoxLayout(pagePane);
    pageLayout->setContentsMargins(0, 0, 0, 0);
    pageLayout->addWidget(m_details);
    pageLayout->addWidget(m_page, 1);
    auto *splitter = new QSplitter(Qt::Vertical, this);
    splitter->addWidget(m_list);
    splitter->addWidget(pagePane);
    splitter->setStretchFactor(1, 2);
    layout->addWidget(splitter, 1);

    m_message = new QLabel(this);
    m_message->setWordWrap(true);
    layout->addWidget(m_message);
    QString where = CrvC_SendHistory::defaultDirectory();
    if (where.startsWith(QDir::homePath() + QLatin1Char('/')))
        where.replace(0, QDir::homePath().size(), QStringLiteral("~"));
    auto *folder = new QLabel(tr("Kept in %1").arg(QDir::toNativeSeparators(where)), this);
    folder->setTextInteractionFlags(Qt::TextSelectableByMouse);
    layout->addWidget(folder);

    m_retry = new QPushButton(tr("&Retry"), this);
    m_retry->setToolTip(tr("Upload the selected report again now"));
    m_delete = new QPushButton(tr("&Delete"), this);
    m_clear = new QPushButton(tr("C&lear All"), this);
    auto *close = new QPushButton(tr("&Close"), this);
    auto *buttons = new QHBoxLayout();
    buttons->addWidget(m_retry);
    buttons->addWidget(m_delete);
    buttons->addWidget(m_clear);
    buttons->addStretch(1);
    buttons->addWidget(close);
    layout->addLayout(buttons);
    connect(m_retry, &QPushButton::clicked, this, &CrvC_SendHistoryDialog::retrySelected);
    connect(m_delete, &QPushButton::clicked, this, &CrvC_SendHistoryDialog::deleteSelected);
    connect(m_clear, &QPushButton::clicked, this, &CrvC_SendHistoryDialog::clearAll);
    connect(close, &QPushButton::clicked, this, &QDialog::accept);
    setCancelButton(close);

    resize(820, 640);
    onSelectionChanged();
    refresh();
}

CrvC_SendHistoryDialog::~CrvC_SendHistoryDialog() = default;

void CrvC_SendHistoryDialog::refresh()
{
    auto entries = std::make_shared<QList<Entry>>();
    auto error = std::make_shared<QString>();
    CrvC_SendRecorder::run(
        [entries, error](CrvC_SendHistory &history) {
            if (!history.entries(entries.get()))
                *error = history.error();
        },
        this, [this, entries, error] { showEntries(*entries, *error); });
}

void CrvC_SendHistoryDialog::showEntries(const QList<Entry> &entries, const QString &error)
{
    const qint64 selected = selectedId();
    m_entries = entries;
    m_list->clear();
    for (const Entry &entry : entries) {
        const QString host = QUrl(entry.destination).host();
        auto *item = new QTreeWidgetItem(
            m_list, {entry.time.toLocalTime().toString(QStringLiteral("yyyy-MM-dd HH:mm:ss")),
                     CrvC_SendHistory::methodName(entry.method), host.isEmpty() ? entry.destination : host,
                     CrvC_SendRecorder::sizeText(entry.bytes), entry.outcome()});
        item->setData(0, Qt::UserRole, entry.id);
        item->setTextAlignment(SizeColumn, Qt::AlignRight | Qt::AlignVCenter);
        if (entry.id == selected)
            item->setSelected(true);
    }
    for (int column = 0; column < OutcomeColumn; ++column)
        m_list->resizeColumnToContents(column);
    if (!error.isEmpty())
        m_message->setText(error);
    else if (entries.isEmpty())
        m_message->setText(tr("No report has been sent from this account."));
    if (m_list->selectedItems().isEmpty() && m_list->topLevelItemCount() > 0)
        m_list->topLevelItem(0)->setSelected(true);
    onSelectionChanged();
    Q_EMIT listLoaded();
}

qint64 CrvC_SendHistoryDialog::selectedId() const
{
    const QList<QTreeWidgetItem *> items = m_list->selectedItems();
    return items.isEmpty() ? 0 : items.first()->data(0, Qt::UserRole).toLongLong();
}

const Entry *CrvC_SendHistoryDialog::selectedEntry() const
{
    const qint64 id = selectedId();
    for (const Entry &entry : m_entries) {
        if (entry.id == id)
            return &entry;
    }
    return nullptr;
}

void CrvC_SendHistoryDialog::onSelectionChanged()
{
    const Entry *entry = selectedEntry();
    m_retry->setEnabled(entry && entry->retryable());
    m_delete->setEnabled(entry != nullptr);
    m_clear->setEnabled(!m_entries.isEmpty());
    if (!entry) {
        m_shownId = 0;
        m_details->clear();
        m_page->clear();
        return;
    }
    QString details = tr("Project: %1   Design: %2\nDestination: %3, %4 bytes, SHA-256 %5")
                          .arg(entry->project, entry->design, entry->destination)
                          .arg(entry->bytes)
                          .arg(QString::fromLatin1(entry->sha256));
    if (!entry->domain.isEmpty() || !entry->regid.isEmpty())
        details += tr("\nForm fields: domain=%1, regid=%2").arg(entry->domain, entry->regid);
    for (const CrvC_SendHistory::Attempt &attempt : entry->attempts)
        details +=
            tr("\n%1  %2%3")
                .arg(attempt.started.toLocalTime().toString(QStringLiteral("yyyy-MM-dd HH:mm:ss")),
                     CrvC_SendHistory::stateName(attempt.state),
                     attempt.detail.isEmpty() ? QString() : QLatin1String(": ") + attempt.detail.left(200));
    m_details->setText(details);
    if (entry->id == m_shownId)
        return;
    m_shownId = entry->id;
    m_page->clear();
    const qint64 id = entry->id;
    auto text = std::make_shared<QString>();
    CrvC_SendRecorder::run(
        [id, text](CrvC_SendHistory &history) {
            // Enough of the page to fill the viewer and to tell whether it
            // is cut: a character takes at most four bytes.
            QByteArray page;
            const int shown = 4 * (CrvC_DataCollectionDialog::ContentsLimit + 1);
            *text = history.page(id, &page)
                        ? CrvC_DataCollectionDialog::contentsText(QString::fromUtf8(page.left(shown)))
                        : QLatin1String("<P>") + history.error().toHtmlEscaped() + QLatin1String("</P>");
        },
        this,
        [this, id, text] {
            if (id != m_shownId)
                return;
            m_page->setHtml(*text);
            Q_EMIT pageShown();
        });
}

void CrvC_SendHistoryDialog::onPageLinkClicked(const QUrl &url)
{
    if (url.toString() != QLatin1String(CrvC_DataCollectionDialog::BrowseContentsUrl)) {
        Gui::Clip::HelpManager::runWebBrowser(url.toString());
        return;
    }
    // The whole page goes to a file of its own in the history's folder, for
    // the browser; the next one replaces it.
    const qint64 id = m_shownId;
    auto file = std::make_shared<QString>();
    CrvC_SendRecorder::run(
        [id, file](CrvC_SendHistory &history) {
            QByteArray page;
            QFile out(history.viewFileName());
            if (history.page(id, &page) && out.open(QIODevice::WriteOnly) && out.write(page) == page.size())
                *file = out.fileName();
        },
        this,
        [file] {
            if (!file->isEmpty())
                Gui::Clip::HelpManager::runWebBrowser(QUrl::fromLocalFile(*file).toString());
        });
}

void CrvC_SendHistoryDialog::retrySelected()
{
    const qint64 id = selectedId();
    if (!id)
        return;
    m_retry->setEnabled(false);
    m_message->setText(tr("Sending report %1 again...").arg(id));
    QPointer<CrvC_SendHistoryDialog> self(this);
    CrvC_SendRetry::retry(id, [self](bool, const QString &message) {
        if (!self)
            return;
        self->m_message->setText(message);
        self->refresh();
    });
    refresh(); // shows the attempt under way
}

void CrvC_SendHistoryDialog::change(std::function<bool(CrvC_SendHistory &)> change)
{
    auto error = std::make_shared<QString>();
    CrvC_SendRecorder::run(
        [change, error](CrvC_SendHistory &history) {
            if (!change(history))
                *error = history.error();
        },
        this,
        [this, error] {
            m_message->setText(*error);
            refresh();
        });
}

void CrvC_SendHistoryDialog::deleteSelected()
{
    const qint64 id = selectedId();
    if (id)
        change([id](CrvC_SendHistory &history) { return history.remove(id); });
}

void CrvC_SendHistoryDialog::clearAll()
{
    if (Gui::Clip::MessageBox::warning(this, windowTitle(),
                                       tr("Remove every sent report and its page from the history?"),
                                       QMessageBox::Yes | QMessageBox::No, QMessageBox::No)
        != QMessageBox::Yes)
        return;
    change([](CrvC_SendHistory &history) { return history.clear(); });
}
