#include "common/TestEnvironment.h"
#include "DialogTestSupport.h"

#include <QtTest>

// The send step's decision without widgets: when a report goes out without
// the send method dialog, which method starts, and what the dialog's OK stores.
class TestSendDispatcher : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase() { m_env.reset(new CorvidTest::Environment); }
    void init() { m_env->clearSettings(); }
    void decision_data();
    void decision();
    void storeChoice_data();
    void storeChoice();
    void storedChoiceDefaults();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
};

using CorvidTest::store;
using CorvidTest::stored;

void TestSendDispatcher::decision_data()
{
    QTest::addColumn<QVariant>("useSsl"); // invalid: not stored
    QTest::addColumn<QVariant>("dontShow");
    QTest::addColumn<QVariant>("tool");
    QTest::addColumn<bool>("withoutAsking"); // false: the dialog must ask
    QTest::addColumn<QStringList>("started");

    const QVariant none;
    const QStringList upload{QStringLiteral("upload")};
    const QStringList mutt{QStringLiteral("email /usr/bin/mutt")};
    QTest::newRow("nothing stored") << none << none << none << true << upload;
    QTest::newRow("upload, asking on") << QVariant(true) << QVariant(false) << none << true << upload;
    QTest::newRow("upload, automatic") << QVariant(true) << QVariant(true) << none << true << upload;
    QTest::newRow("e-mail, flag not stored") << QVariant(false) << none << QVariant("/usr/bin/mutt") << false << QStringList();
    QTest::newRow("e-mail, asking on") << QVariant(false) << QVariant(false) << QVariant("/usr/bin/mutt") << false << QStringList();
    QTest::newRow("e-mail, automatic") << QVariant(false) << QVariant(true) << QVariant("/usr/bin/mutt") << true << mutt;
    QTest::newRow("e-mail, automatic, no program") << QVariant(false) << QVariant(true) << none << false << QStringList();
    QTest::newRow("e-mail, automatic, empty program") << QVariant(false) << QVariant(true) << QVariant(QString()) << false << QStringList();
}

void TestSendDispatcher::decision()
{
    QFETCH(QVariant, useSsl);
    QFETCH(QVariant, dontShow);
    QFETCH(QVariant, tool);
    QFETCH(QStringList, started);
    store(CrvC_Settings::UseSSL, useSsl);
    store(CrvC_Settings::DontShowSendToDlg, dontShow);
    store(CrvC_Settings::SelectedEmailTool, tool);

    CorvidTest::SendRecorder recorder;
    const QString report = QStringLiteral("/work/p/device_usage_statistics.html");
    QTEST(CrvC_SendDispatcher::sendWithoutAsking(report), "withoutAsking");
    QCOMPARE(recorder.sends, started);
    for (const QString &file : recorder.files)
        QCOMPARE(file, report);

    // The dialog's OK ends in sendReport, which starts the stored method
    // whatever the automatic flag says, unless there is no mail program.
    recorder.sends.clear();
    const bool noProgram = !useSsl.toBool() && useSsl.isValid() && tool.toString().isEmpty();
    QCOMPARE(CrvC_SendDispatcher::sendReport(report), !noProgram);
    QCOMPARE(recorder.sends.size(), noProgram ? 0 : 1);
}

void TestSendDispatcher::storeChoice_data()
{
    QTest::addColumn<bool>("initialSsl");
    QTest::addColumn<QString>("initialTool");
    QTest::addColumn<bool>("chosenSsl");
    QTest::addColumn<bool>("chosenDontShow");
    QTest::addColumn<QString>("chosenTool");
    QTest::addColumn<QVariant>("useSsl"); // what is stored afterwards; invalid: not written
    QTest::addColumn<QVariant>("tool");

    const QVariant none;
    QTest::newRow("unchanged") << true << "a" << true << true << "a" << none << none;
    QTest::newRow("unchanged, automatic off") << true << "a" << true << false << "a" << none << none;
    QTest::newRow("to e-mail") << true << "a" << false << true << "a" << QVariant(false) << none;
    QTest::newRow("to upload") << false << "a" << true << true << "a" << QVariant(true) << none;
    QTest::newRow("other program") << false << "a" << false << true << "b" << none << QVariant("b");
    QTest::newRow("remembered program gone") << false << "a" << false << true << "" << none << QVariant("");
}

void TestSendDispatcher::storeChoice()
{
    QFETCH(bool, initialSsl);
    QFETCH(QString, initialTool);
    QFETCH(bool, chosenSsl);
    QFETCH(bool, chosenDontShow);
    QFETCH(QString, chosenTool);

    CrvC_SendDispatcher::Choice initial;
    initial.useSsl = initialSsl;
    initial.emailTool = initialTool;
    CrvC_SendDispatcher::Choice chosen;
    chosen.useSsl = chosenSsl;
    chosen.dontShowAgain = chosenDontShow;
    chosen.emailTool = chosenTool;
    CrvC_SendDispatcher::storeChoice(initial, chosen);

    QTEST(stored(CrvC_Settings::UseSSL), "useSsl");
    QTEST(stored(CrvC_Settings::SelectedEmailTool), "tool");
    QCOMPARE(stored(CrvC_Settings::DontShowSendToDlg), QVariant(chosenDontShow));
}

void TestSendDispatcher::storedChoiceDefaults()
{
    // The dialog's check box starts ticked when nothing is stored, while the
    // send step itself treats a missing flag as "ask".
    const CrvC_SendDispatcher::Choice choice = CrvC_SendDispatcher::storedChoice();
    QVERIFY(choice.useSsl);
    QVERIFY(choice.dontShowAgain);
    QVERIFY(choice.emailTool.isEmpty());
    QVERIFY(!CrvC_Settings::dontShowSendToDlg());
}

QTEST_GUILESS_MAIN(TestSendDispatcher)
#include "tst_senddispatcher.moc"
