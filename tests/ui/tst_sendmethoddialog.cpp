#include "common/TestEnvironment.h"
#include "DialogTestSupport.h"
#include "ModalDialogs.h"
#include "ui/SendToClipDlg.h"
#include "ui/SendToClipDlgImp.h"

#include <QtTest>

// The send method dialog: how it opens for the stored choice, the program
// list following the method, what OK stores and sends, and that Cancel
// stores and sends nothing.
class TestSendMethodDialog : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase() { m_env.reset(new CorvidTest::Environment); }
    void init() { m_env->clearSettings(); }
    void opens_data();
    void opens();
    void programListFollowsMethod();
    void finish_data();
    void finish();
    void asksOnlyWhenNeeded_data();
    void asksOnlyWhenNeeded();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
};

using CorvidTest::store;
using CorvidTest::stored;

const QString Report = QStringLiteral("/p/device_usage_statistics.html");

void TestSendMethodDialog::opens_data()
{
    QTest::addColumn<QVariant>("useSsl");
    QTest::addColumn<QVariant>("dontShow");
    QTest::addColumn<bool>("forEmail"); // opened after a failed upload
    QTest::addColumn<bool>("emailChecked");
    QTest::addColumn<bool>("boxChecked");

    const QVariant none;
    QTest::newRow("nothing stored") << none << none << false << false << true;
    QTest::newRow("e-mail stored") << QVariant(false) << none << false << true << true;
    QTest::newRow("upload, asking") << QVariant(true) << QVariant(false) << false << false << false;
    QTest::newRow("after a failed upload") << none << QVariant(false) << true << true << false;
}

void TestSendMethodDialog::opens()
{
    QFETCH(QVariant, useSsl);
    QFETCH(QVariant, dontShow);
    QFETCH(bool, forEmail);
    QFETCH(bool, emailChecked);
    store(CrvC_Settings::UseSSL, useSsl);
    store(CrvC_Settings::DontShowSendToDlg, dontShow);

    bool email = false, ssl = false, listEnabled = false, listEditable = true, box = false;
    QString title;
    CorvidTest::onNextModal<CrvC_SendToClipDlg>([&](CrvC_SendToClipDlg *dialog) {
        CrvC_SendToClipDlgImp *imp = dialog->imp();
        email = imp->emailRadioButton->isChecked();
        ssl = imp->sslRadioButton->isChecked();
        listEnabled = imp->selectEmailTool->isEnabled();
        listEditable = imp->selectEmailTool->isEditable();
        box = imp->dontShowAgain->isChecked();
        title = dialog->windowTitle();
        dialog->reject();
    });
    if (forEmail) {
        CrvC_SendToClipDlg::showSendMethodDialogForEmail(nullptr, Report);
    } else {
        CrvC_SendToClipDlg dialog(nullptr, Report);
        dialog.exec();
    }
    QCOMPARE(title, QStringLiteral("Send To Vantor"));
    QCOMPARE(email, emailChecked);
    QCOMPARE(ssl, !emailChecked);
    QCOMPARE(listEnabled, emailChecked);
    QVERIFY(!listEditable);
    QTEST(box, "boxChecked");
}

void TestSendMethodDialog::programListFollowsMethod()
{
    CrvC_SendToClipDlg dialog(nullptr, Report);
    QVERIFY(!dialog.imp()->selectEmailTool->isEnabled());
    dialog.imp()->emailRadioButton->setChecked(true);
    QVERIFY(dialog.imp()->selectEmailTool->isEnabled());
    dialog.imp()->sslRadioButton->setChecked(true);
    QVERIFY(!dialog.imp()->selectEmailTool->isEnabled());
}

void TestSendMethodDialog::finish_data()
{
    QTest::addColumn<QString>("button");
    QTest::addColumn<bool>("chooseEmail");
    QTest::addColumn<bool>("clearBox");
    QTest::addColumn<QVariant>("useSsl"); // stored afterwards
    QTest::addColumn<QVariant>("dontShow");
    QTest::addColumn<QStringList>("started");

    const QVariant none;
    QTest::newRow("OK, unchanged") << "ok" << false << false << none << QVariant(true) << QStringList{"upload"};
    QTest::newRow("OK, asking again") << "ok" << false << true << none << QVariant(false) << QStringList{"upload"};
    // No mail program is remembered: nothing can start, and nothing is shown.
    QTest::newRow("OK, e-mail without program") << "ok" << true << false << QVariant(false) << QVariant(true)
                                                << QStringList();
    QTest::newRow("Cancel") << "cancel" << true << true << none << none << QStringList();
    QTest::newRow("closed") << "close" << true << false << none << none << QStringList();
}

void TestSendMethodDialog::finish()
{
    QFETCH(QString, button);
    QFETCH(bool, chooseEmail);
    QFETCH(bool, clearBox);
    CorvidTest::SendRecorder recorder;
    CrvC_SendToClipDlg dialog(nullptr, Report);
    if (chooseEmail) {
        dialog.imp()->emailRadioButton->setChecked(true);
        dialog.imp()->selectEmailTool->clear();
    }
    if (clearBox)
        dialog.imp()->dontShowAgain->setChecked(false);
    CorvidTest::onNextModal<CrvC_SendToClipDlg>([&](CrvC_SendToClipDlg *open) {
        if (button == QLatin1String("ok"))
            open->imp()->okButton->click();
        else if (button == QLatin1String("cancel"))
            open->imp()->cancelButton->click();
        else
            open->close();
    });
    QCOMPARE(dialog.exec(), int(button == QLatin1String("ok") ? QDialog::Accepted : QDialog::Rejected));
    QTEST(stored(CrvC_Settings::UseSSL), "useSsl");
    QTEST(stored(CrvC_Settings::DontShowSendToDlg), "dontShow");
    QVERIFY(!stored(CrvC_Settings::SelectedEmailTool).isValid());
    QTEST(recorder.sends, "started");
}

void TestSendMethodDialog::asksOnlyWhenNeeded_data()
{
    QTest::addColumn<QVariant>("useSsl");
    QTest::addColumn<QVariant>("dontShow");
    QTest::addColumn<QVariant>("tool");
    QTest::addColumn<bool>("asked");
    QTest::addColumn<QStringList>("started");

    const QVariant none;
    QTest::newRow("nothing stored") << none << none << none << false << QStringList{"upload"};
    QTest::newRow("e-mail, automatic") << QVariant(false) << QVariant(true) << QVariant("mutt") << false
                                       << QStringList{"email mutt"};
    QTest::newRow("e-mail, automatic, no program") << QVariant(false) << QVariant(true) << none << true
                                                   << QStringList();
    QTest::newRow("e-mail, asking") << QVariant(false) << none << QVariant("mutt") << true << QStringList();
}

void TestSendMethodDialog::asksOnlyWhenNeeded()
{
    QFETCH(QVariant, useSsl);
    QFETCH(QVariant, dontShow);
    QFETCH(QVariant, tool);
    store(CrvC_Settings::UseSSL, useSsl);
    store(CrvC_Settings::DontShowSendToDlg, dontShow);
    store(CrvC_Settings::SelectedEmailTool, tool);
    CorvidTest::SendRecorder recorder;

    bool asked = false;
    QPointer<QTimer> poll = CorvidTest::onNextModal<CrvC_SendToClipDlg>([&](CrvC_SendToClipDlg *dialog) {
        asked = true;
        dialog->reject();
    });
    CrvC_SendToClipDlg::showSendMethodDialog(nullptr, Report);
    delete poll;
    QTEST(asked, "asked");
    QTEST(recorder.sends, "started");
}

QTEST_MAIN(TestSendMethodDialog)
#include "tst_sendmethoddialog.moc"
