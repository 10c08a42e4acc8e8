// "Sent reports": the history dialog over three recorded sends. The list is
// newest first, the selected page shows as it was sent (a large one cut as in
// the review dialog), Retry only for a failed upload, Delete removes one.

#include "common/TestEnvironment.h"

#include "transmit/SendHistory.h"
#include "ui/DataCollectionDialog.h"
#include "ui/DataCollectionHtmlViewer.h"
#include "ui/SendHistoryDialog.h"

#include <QPushButton>
#include <QSignalSpy>
#include <QTreeWidget>
#include <QtTest>

using Method = CrvC_SendHistory::Method;
using State = CrvC_SendHistory::State;

class TestSendHistoryDialog : public QObject
{
    Q_OBJECT
    std::unique_ptr<CorvidTest::Environment> m_env;

    static void record(Method method, State state, const QByteArray &page, int minutesAgo)
    {
        CrvC_SendHistory history;
        CrvC_SendHistory::Entry entry;
        entry.time = QDateTime::currentDateTimeUtc().addSecs(-60 * minutesAgo);
        entry.method = method;
        entry.destination = method == Method::Upload ? "https://up.example/upload" : "usage@v.example";
        qint64 attempt = 0;
        history.addEntry(entry, page, &attempt);
        history.finishAttempt(attempt, state, state == State::Handed ? "/usr/bin/thunderbird" : "refused");
    }

    // Selects `row` and waits for its page.
    static void select(CrvC_SendHistoryDialog &dialog, int row)
    {
        QSignalSpy shown(&dialog, &CrvC_SendHistoryDialog::pageShown);
        dialog.list()->clearSelection();
        dialog.list()->topLevelItem(row)->setSelected(true);
        QVERIFY(shown.wait(10000));
    }

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new CorvidTest::Environment);
        record(Method::Email, State::Handed, "<P>mailed</P>", 30);
        record(Method::Upload, State::Failed, "<P>refused page</P>", 20);
        QByteArray large = "<HTML><BODY>\n";
        while (large.size() <= CrvC_DataCollectionDialog::ContentsLimit)
            large += "<P>one line of a large page</P>\n";
        record(Method::Upload, State::Sent, large + "</BODY></HTML>\n", 10);
    }

    void rows_data()
    {
        QTest::addColumn<int>("row");
        QTest::addColumn<QString>("outcome");
        QTest::addColumn<bool>("retry");
        QTest::addColumn<QString>("page");
        QTest::newRow("sent upload, newest") << 0 << "sent" << false << "too large to be shown here in full";
        QTest::newRow("failed upload") << 1 << "failed: refused" << true << "refused page";
        QTest::newRow("e-mail") << 2 << "handed to /usr/bin/thunderbird" << false << "mailed";
    }

    void rows()
    {
        QFETCH(int, row);
        CrvC_SendHistoryDialog dialog;
        QSignalSpy loaded(&dialog, &CrvC_SendHistoryDialog::listLoaded);
        QVERIFY(loaded.wait(10000));
        QCOMPARE(dialog.list()->topLevelItemCount(), 3);
        select(dialog, row);
        QTEST(dialog.list()->topLevelItem(row)->text(CrvC_SendHistoryDialog::OutcomeColumn), "outcome");
        QTEST(dialog.retryButton()->isEnabled(), "retry");
        QFETCH(QString, page);
        QVERIFY(dialog.pageViewer()->toPlainText().contains(page));
    }

    void deleteRemovesOne()
    {
        CrvC_SendHistoryDialog dialog;
        QSignalSpy loaded(&dialog, &CrvC_SendHistoryDialog::listLoaded);
        QVERIFY(loaded.wait(10000));
        select(dialog, 1);
        dialog.deleteSelected();
        QVERIFY(loaded.wait(10000));
        QCOMPARE(dialog.list()->topLevelItemCount(), 2);
        QList<CrvC_SendHistory::Entry> entries;
        QVERIFY(CrvC_SendHistory().entries(&entries));
        QCOMPARE(entries.size(), 2);
        QCOMPARE(entries.last().method, Method::Email);
    }
};

QTEST_MAIN(TestSendHistoryDialog)
#include "tst_sendhistorydialog.moc"
