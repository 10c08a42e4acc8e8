// The send history: retention, which failed uploads the start of a cycle
// sends again, and corvid-history on good, empty and damaged histories.

#include "common/TestEnvironment.h"

#include "common/TestServer.h"
#include "host/Settings.h"
#include "project/CorvidSettings.h"
#include "transmit/SendHistory.h"
#include "transmit/SendRetry.h"

#include <QRandomGenerator>
#include <QSqlDatabase>
#include <QSqlQuery>
#include <QtTest>

using namespace CorvidTest;
using Method = CrvC_SendHistory::Method;
using State = CrvC_SendHistory::State;

class TestSendHistory : public QObject
{
    Q_OBJECT
    std::unique_ptr<Environment> m_env;

    static QByteArray randomPage(int size)
    {
        QByteArray page(size, Qt::Uninitialized);
        for (char &c : page)
            c = char(QRandomGenerator::global()->bounded(256));
        return page;
    }

    // An entry whose attempts all ended in `last` (the earlier ones failed).
    // (From a file when `file` is given.)
    static qint64 add(CrvC_SendHistory &history, Method method, const QDateTime &time, int tries, State last,
                      const QByteArray &page = "<HTML>Ä</HTML>\n", const QString &file = QString())
    {
        CrvC_SendHistory::Entry entry;
        entry.time = time;
        entry.method = method;
        entry.destination = method == Method::Upload ? "https://h.example/upload" : "usage@v.example";
        qint64 attempt = 0;
        const qint64 id = file.isEmpty() || !writeFile(file, page) ? history.addEntry(entry, page, &attempt)
                                                                   : history.addEntry(entry, file, &attempt);
        for (int i = 1; i <= tries && id; ++i) {
            if (last != State::Sending || i < tries)
                history.finishAttempt(attempt, i < tries ? State::Failed : last,
                                      last == State::Handed ? "/usr/bin/thunderbird" : "refused", 4);
            if (i < tries)
                attempt = history.addAttempt(id, true);
        }
        return id;
    }

    // Runs `sql` on the history file behind the store's back.
    static QVariant sql(const QString &statement)
    {
        QVariant result;
        {
            QSqlDatabase db = QSqlDatabase::addDatabase("QSQLITE", "raw");
            db.setDatabaseName(CrvC_SendHistory().fileName());
            QSqlQuery query(db);
            if (db.open() && query.exec(statement) && query.next())
                result = query.value(0);
        }
        QSqlDatabase::removeDatabase("raw");
        return result;
    }

private Q_SLOTS:
    void initTestCase() { m_env.reset(new Environment); }
    void init()
    {
        m_env->clearSettings();
        QDir(CrvC_SendHistory::defaultDirectory()).removeRecursively();
    }

    void retention_data()
    {
        QTest::addColumn<qint64>("maxBytes");
        QTest::addColumn<int>("pageSize");
        QTest::addColumn<int>("added");
        QTest::addColumn<int>("kept"); // the newest
        QTest::addColumn<int>("pages");
        QTest::newRow("the 101st entry removes the oldest")
            << CrvC_SendHistory::MaxBytes << 300 << 101 << 100 << 100;
        QTest::newRow("stored bytes") << qint64(25000) << 10000 << 4 << 2 << 2;
        QTest::newRow("a page too large to keep") << qint64(5000) << 10000 << 2 << 2 << 0;
    }

    void retention()
    {
        QFETCH(qint64, maxBytes);
        QFETCH(int, pageSize);
        QFETCH(int, added);
        QFETCH(int, kept);
        CrvC_SendHistory history(CrvC_SendHistory::defaultDirectory(),
                                 {CrvC_SendHistory::MaxEntries, maxBytes});
        QList<QByteArray> pages;
        for (int i = 0; i < added; ++i) {
            pages << randomPage(pageSize);
            QVERIFY2(add(history, Method::Upload, QDateTime::currentDateTimeUtc(), 1, State::Sent,
                         pages.last(), m_env->home() + "/page.html"),
                     qPrintable(history.error()));
        }
        QList<CrvC_SendHistory::Entry> entries;
        QVERIFY(history.entries(&entries));
        QCOMPARE(entries.size(), kept);
        QCOMPARE(entries.first().id, qint64(added));
        QCOMPARE(entries.last().id, qint64(added - kept + 1));
        QTEST(sql("SELECT count(*) FROM pages").toInt(), "pages");
        QCOMPARE(sql("PRAGMA auto_vacuum").toInt(), 2); // removed pages leave the file
        QCOMPARE(sql("SELECT count(DISTINCT entry) FROM attempts").toInt(), kept);
        QByteArray page;
        QCOMPARE(history.page(added, &page), entries.first().pageKept);
        QCOMPARE(page, entries.first().pageKept ? pages.last() : QByteArray());
        QCOMPARE(entries.first().bytes, qint64(pageSize));
        QCOMPARE(entries.first().sha256,
                 QCryptographicHash::hash(pages.last(), QCryptographicHash::Sha256).toHex());
    }

    void pending_data()
    {
        QTest::addColumn<int>("method");
        QTest::addColumn<double>("ageDays");
        QTest::addColumn<int>("tries");
        QTest::addColumn<int>("last");
        QTest::addColumn<bool>("retried");
        const int upload = int(Method::Upload), failed = int(State::Failed);
        QTest::newRow("failed upload") << upload << 0.0 << 1 << failed << true;
        QTest::newRow("two retries made") << upload << 1.0 << 3 << failed << true;
        QTest::newRow("three retries made") << upload << 1.0 << 4 << failed << false;
        QTest::newRow("13 days old") << upload << 13.9 << 1 << failed << true;
        QTest::newRow("14 days old") << upload << 14.01 << 1 << failed << false;
        QTest::newRow("e-mail") << int(Method::Email) << 0.0 << 1 << failed << false;
        QTest::newRow("sent") << upload << 0.0 << 2 << int(State::Sent) << false;
        QTest::newRow("cut off while sending") << upload << 0.1 << 1 << int(State::Sending) << true;
        QTest::newRow("still sending") << upload << 0.01 << 1 << int(State::Sending) << false;
    }

    void pending()
    {
        QFETCH(int, method);
        QFETCH(double, ageDays);
        QFETCH(int, tries);
        QFETCH(int, last);
        QFETCH(bool, retried);
        CrvC_SendHistory history;
        const QDateTime now = QDateTime::currentDateTimeUtc();
        const qint64 id =
            add(history, Method(method), now.addSecs(qint64(-ageDays * 86400)), tries, State(last));
        // A newer failed upload: the older one goes first.
        const qint64 newer = add(history, Method::Upload, now.addSecs(-60), 1, State::Failed);
        QList<QPair<qint64, qint64>> claimed;
        QVERIFY(history.claimPending(now, &claimed));
        QList<qint64> ids;
        for (const auto &pair : claimed)
            ids << pair.first;
        const QList<qint64> expected = retried ? QList<qint64>{id, newer} : QList<qint64>{newer};
        QCOMPARE(ids, expected);
        // Claimed means under way: a second host finds nothing left.
        QVERIFY(history.claimPending(now, &claimed));
        QCOMPARE(claimed.size(), 0);
    }

    void retryNeedsCollection_data()
    {
        QTest::addColumn<bool>("collect");
        QTest::newRow("collection on: retried") << true;
        QTest::newRow("collection off: left alone") << false;
    }

    void retryNeedsCollection()
    {
        QFETCH(bool, collect);
        CrvC_Settings::setValue(CrvC_Settings::CollectDeviceUsage, collect);
        CrvC_Settings::setValue(CrvC_Settings::CorvidTimeStamp,
                                QDateTime::currentDateTime().toString(Qt::ISODate));
        Gui::Clip::Settings("WebUpdate", true, true, true).setValue("ProxyChoice", 0);
        TestServer::putStageBinFirstInPath();
        qputenv("CORVID_SERVER", "https://127.0.0.1:1"); // nobody listens
        CrvC_SendHistory history;
        const qint64 id = add(history, Method::Upload, QDateTime::currentDateTimeUtc(), 1, State::Failed);
        CrvC_SendRetry::retryPending();
        CrvC_SendHistory::Entry entry;
        if (collect) {
            QTRY_VERIFY_WITH_TIMEOUT(history.entry(id, &entry) && entry.attempts.size() == 2
                                         && entry.attempts.last().state == State::Failed,
                                     30000);
            QVERIFY(entry.attempts.last().automatic);
            QVERIFY2(entry.outcome().startsWith("failed: Could not connect to 127.0.0.1:1."),
                     qPrintable(entry.outcome()));
        } else {
            QTest::qWait(500);
            QVERIFY(history.entry(id, &entry));
            QCOMPARE(entry.attempts.size(), 1);
        }
    }

    void commandLine_data()
    {
        QTest::addColumn<QString>("history"); // "two sends", "none", or the damage done
        QTest::addColumn<QStringList>("arguments");
        QTest::addColumn<int>("exitCode");
        QTest::addColumn<QString>("output");   // a regular expression
        QTest::addColumn<int>("entriesAfter"); // -1: not checked
        const QString two = "two sends";
        QTest::newRow("list, newest first")
            << two << QStringList{"list"} << 0
            << "^ +2  \\d{4}-\\d\\d-\\d\\d \\d\\d:\\d\\d:\\d\\d  upload  h.example +16 bytes  sent\\n"
               " +1  .*e-mail  usage@v.example .*handed to /usr/bin/thunderbird\\n$"
            << 2;
        QTest::newRow("list --json")
            << two << QStringList{"list", "--json"} << 0
            << "\"design\": \"led\",\\n *\"destination\": \"https://h.example/upload\","
               "(.|\\n)*\"sha256\": \"[0-9a-f]{64}\",(.|\\n)*\"time\": \"\\d{4}-\\d\\d-\\d\\dT"
            << 2;
        QTest::newRow("show") << two << QStringList{"show", "2"} << 0 << "^<HTML>Ä</HTML>\\n$" << 2;
        QTest::newRow("show, no such entry") << two << QStringList{"show", "7"} << 1 << "has no entry 7" << 2;
        QTest::newRow("no history") << "none" << QStringList{"list"} << 0 << "no report has been sent" << 0;
        QTest::newRow("not a database") << "not a database" << QStringList{"list"} << 1
                                        << "history.sqlite is damaged: file is not a database" << -1;
        QTest::newRow("newer version")
            << "newer version" << QStringList{"list"} << 1 << "is damaged: written by a newer version" << -1;
        QTest::newRow("page altered") << "page altered" << QStringList{"show", "2"} << 1
                                      << "corvid-history: .* does not match its SHA-256\\n$" << -1;
        QTest::newRow("clear") << two << QStringList{"clear"} << 0 << "cleared" << 0;
        QTest::newRow("clear a damaged history")
            << "not a database" << QStringList{"clear"} << 0 << "cleared" << 0;
        QTest::newRow("usage error") << two << QStringList{"list", "--xml"} << 2 << "list takes only --json"
                                     << 2;
        QTest::newRow("retry an e-mail")
            << two << QStringList{"retry", "1"} << 1 << "not a failed upload" << 2;
    }

    void commandLine()
    {
        QFETCH(QString, history);
        QFETCH(QStringList, arguments);
        QFETCH(int, entriesAfter);
        if (history != "none") {
            CrvC_SendHistory store; // closed before the damage is done
            const QDateTime now = QDateTime::currentDateTimeUtc();
            add(store, Method::Email, now.addSecs(-60), 1, State::Handed);
            CrvC_SendHistory::Entry entry;
            QVERIFY(store.entry(add(store, Method::Upload, now, 1, State::Sent), &entry));
            QVERIFY(store.setDestination(entry.id, entry.destination, "example.org", "REG-1"));
            sql("UPDATE entries SET design = 'led'");
        }
        if (history == "page altered")
            sql("UPDATE pages SET data = x'0000000a3c48544d4c3e41'");
        if (history == "newer version")
            sql("PRAGMA user_version = 9");
        if (history == "not a database")
            QVERIFY(writeFile(CrvC_SendHistory().fileName(), QByteArray(4096, 'x')));
        const ToolRun run = runStaged("corvid-history", arguments, m_env->home(), Environment::locations());
        QTEST(run.exitCode, "exitCode");
        QFETCH(QString, output);
        QVERIFY2(QRegularExpression(output).match(run.output).hasMatch(), qPrintable(run.output));
        if (arguments.first() == "show" && run.exitCode == 0)
            QCOMPARE(run.standardOutput, QByteArray("<HTML>Ä</HTML>\n"));
        QList<CrvC_SendHistory::Entry> entries;
        if (entriesAfter >= 0) {
            CrvC_SendHistory after;
            QVERIFY2(after.entries(&entries), qPrintable(after.error()));
            QCOMPARE(entries.size(), entriesAfter);
        }
    }
};

QTEST_GUILESS_MAIN(TestSendHistory)
#include "tst_sendhistory.moc"
