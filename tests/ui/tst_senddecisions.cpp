#include "DialogTestSupport.h"
#include "common/TestEnvironment.h"
#include "project/PreferenceValues.h"

#include <QtTest>

using CorvidTest::store;
using CorvidTest::stored;
using Values = CrvC_PreferenceValues::Values;

// The decisions behind the dialogs, without widgets: whether the send step
// asks, what it starts, what the send method dialog's OK and the preference
// page's apply store, and the order of the page's mail list.
class TestSendDecisions : public QObject
{
    Q_OBJECT
    std::unique_ptr<CorvidTest::Environment> m_env;

private Q_SLOTS:
    void initTestCase() { m_env.reset(new CorvidTest::Environment); }
    void init() { m_env->clearSettings(); }

    void sendStep_data()
    {
        QTest::addColumn<QVariant>("useSsl"); // invalid: not stored
        QTest::addColumn<QVariant>("dontShow");
        QTest::addColumn<QVariant>("tool");
        QTest::addColumn<bool>("withoutAsking");
        QTest::addColumn<QString>("sendReport"); // what sendReport starts; empty: nothing
        const QVariant none, yes(true), no(false), mutt("/usr/bin/mutt");
        QTest::newRow("nothing stored") << none << none << none << true << "upload";
        QTest::newRow("upload, asking on") << yes << no << none << true << "upload";
        QTest::newRow("e-mail, flag not stored") << no << none << mutt << false << "email /usr/bin/mutt";
        QTest::newRow("e-mail, automatic") << no << yes << mutt << true << "email /usr/bin/mutt";
        QTest::newRow("e-mail, automatic, no program") << no << yes << none << false << "";
        QTest::newRow("e-mail, automatic, empty program") << no << yes << QVariant("") << false << "";
    }

    void sendStep()
    {
        QFETCH(QVariant, useSsl);
        QFETCH(QVariant, dontShow);
        QFETCH(QVariant, tool);
        QFETCH(bool, withoutAsking);
        QFETCH(QString, sendReport);
        store(CrvC_Settings::UseSSL, useSsl);
        store(CrvC_Settings::DontShowSendToDlg, dontShow);
        store(CrvC_Settings::SelectedEmailTool, tool);
        const QString report = "/p/device_usage_statistics.html";
        const QStringList started = sendReport.isEmpty() ? QStringList() : QStringList{sendReport};

        CorvidTest::SendRecorder recorder;
        QCOMPARE(CrvC_SendDispatcher::sendWithoutAsking(report), withoutAsking);
        QCOMPARE(recorder.sends, withoutAsking ? started : QStringList());
        recorder.sends.clear();
        QCOMPARE(CrvC_SendDispatcher::sendReport(report), !started.isEmpty());
        QCOMPARE(recorder.sends, started);
        QVERIFY(recorder.files.size() == recorder.files.count(report));
    }

    void storeChoice()
    {
        // The dialog opened with the upload and program "a": of the method
        // and the program only a change is written, the box always.
        for (const QString &tool : {QString("b"), QString()}) {
            CrvC_SendDispatcher::Choice initial, chosen;
            initial.emailTool = "a";
            chosen.emailTool = tool;
            CrvC_SendDispatcher::storeChoice(initial, chosen);
            QCOMPARE(stored(CrvC_Settings::SelectedEmailTool), QVariant(tool));
            QVERIFY(!stored(CrvC_Settings::UseSSL).isValid());
            QCOMPARE(stored(CrvC_Settings::DontShowSendToDlg), QVariant(true));
        }
    }

    void preferenceApply_data()
    {
        // The page opened with the defaults; the user's choices, and what
        // is stored afterwards (invalid: not written).
        QTest::addColumn<QByteArray>("installFile");
        QTest::addColumn<bool>("collect");
        QTest::addColumn<bool>("useSsl");
        QTest::addColumn<QString>("tool");
        QTest::addColumn<QVariant>("storedSsl");
        QTest::addColumn<QVariant>("storedTool");
        const QVariant none;
        QTest::newRow("e-mail with a program")
            << QByteArray() << true << false << "b" << QVariant(false) << QVariant("b");
        // The user's apply is newer than the installation's switch either way.
        QTest::newRow("installation off, user on")
            << QByteArray("collectusagestatistics=false\n") << true << true << "" << none << none;
        QTest::newRow("installation on, user off")
            << QByteArray("collectusagestatistics=true\ntimestamp=2020-01-01T00:00:00\n") << false << true
            << "" << none << none;
    }

    void preferenceApply()
    {
        QFETCH(QByteArray, installFile);
        QFETCH(bool, collect);
        QFETCH(bool, useSsl);
        QFETCH(QString, tool);
        QVERIFY(m_env->writeDataFile("reports/corvidsettings", installFile));
        Values shown;
        shown.collect = collect;
        shown.dontShowProgress = true;
        shown.useSsl = useSsl;
        shown.emailTool = tool;
        CrvC_PreferenceValues::apply(Values(), shown, QDateTime(QDate(2026, 3, 17), QTime(14, 5, 9)));

        QCOMPARE(stored(CrvC_Settings::CollectDeviceUsage), QVariant(collect));
        QCOMPARE(stored(CrvC_Settings::CorvidTimeStamp), QVariant("2026-03-17T14:05:09"));
        QCOMPARE(stored(CrvC_Settings::DontShowSendProgressDlg), QVariant(true));
        QTEST(stored(CrvC_Settings::UseSSL), "storedSsl");
        QTEST(stored(CrvC_Settings::SelectedEmailTool), "storedTool");
        QCOMPARE(CrvC_PreferenceValues::load().collect, collect);
        QVERIFY(m_env->writeDataFile("reports/corvidsettings", QByteArray()));
    }

    void mailListOrder_data()
    {
        QTest::addColumn<QStringList>("tools"); // the preferred one first
        QTest::addColumn<QStringList>("order");
        QTest::newRow("preferred last") << QStringList{"def", "a", "b"} << QStringList{"b", "a", "def"};
        QTest::newRow("empty preferred name") << QStringList{"", "a"} << QStringList{"a", ""};
        QTest::newRow("each name once") << QStringList{"a", "b", "a"} << QStringList{"b", "a"};
    }

    void mailListOrder()
    {
        QFETCH(QStringList, tools);
        QTEST(CrvC_PreferenceValues::mailListOrder(tools), "order");
    }
};

QTEST_GUILESS_MAIN(TestSendDecisions)
#include "tst_senddecisions.moc"
