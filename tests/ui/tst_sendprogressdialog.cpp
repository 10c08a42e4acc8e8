#include "common/TestEnvironment.h"
#include "DialogTestSupport.h"
#include "ModalDialogs.h"
#include "ui/DataCollectionDialog.h"
#include "ui/SendClipDlg.h"
#include "ui/SendClipDlgImp.h"

#include <QDir>
#include <QPointer>
#include <QtTest>

// The countdown: five ticks, then the send; Details and Cancel open the
// review dialog instead; its check box is stored only when the countdown
// completes; closing sends nothing. Ticks are driven by hand.
class TestSendProgressDialog : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void init() { m_env->clearSettings(); }
    void countdown_data();
    void countdown();
    void stopped_data();
    void stopped();
    void closing();
    void timerIsOneSecondRepeating();

private:
    // A countdown for a fresh report, with its timer stopped.
    CrvC_SendClipDlg *newCountdown();
    static bool deleted(const QPointer<CrvC_SendClipDlg> &dialog);

    std::unique_ptr<CorvidTest::Environment> m_env;
};

void TestSendProgressDialog::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
    QDir().mkpath(m_env->home() + QLatin1String("/work"));
    QVERIFY(QDir::setCurrent(m_env->home() + QLatin1String("/work")));
}

CrvC_SendClipDlg *TestSendProgressDialog::newCountdown()
{
    auto *dialog = new CrvC_SendClipDlg(nullptr, m_env->home() + QLatin1String("/p.orb"),
                                        QStringLiteral("top"), QStringLiteral("Kestrel"));
    dialog->timer()->stop();
    dialog->show();
    return dialog;
}

bool TestSendProgressDialog::deleted(const QPointer<CrvC_SendClipDlg> &dialog)
{
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    return dialog.isNull();
}

void TestSendProgressDialog::countdown_data()
{
    QTest::addColumn<QVariant>("storedBefore"); // "DontShowSendProgressDlg" before
    QTest::addColumn<bool>("ticked");           // the user's check box at the end

    QTest::newRow("box left clear") << QVariant() << false;
    QTest::newRow("box ticked") << QVariant() << true;
    QTest::newRow("stored true, box cleared") << QVariant(true) << false;
}

void TestSendProgressDialog::countdown()
{
    QFETCH(QVariant, storedBefore);
    QFETCH(bool, ticked);
    CorvidTest::store(CrvC_Settings::DontShowSendProgressDlg, storedBefore);
    CorvidTest::SendRecorder recorder;
    QPointer<CrvC_SendClipDlg> dialog = newCountdown();
    QCOMPARE(dialog->imp()->dontShowAgain->isChecked(), storedBefore.toBool());
    QCOMPARE(dialog->imp()->progressBar->maximum(), 5);
    dialog->imp()->dontShowAgain->setChecked(ticked);

    for (int tick = 1; tick <= 4; ++tick) {
        dialog->OnTimeOut();
        QCOMPARE(dialog->imp()->progressBar->value(), tick);
        QVERIFY(recorder.sends.isEmpty());
        QCOMPARE(CorvidTest::stored(CrvC_Settings::DontShowSendProgressDlg), storedBefore);
    }
    const QString report = QFileInfo(dialog->reviewDialog()->reportPath()).absoluteFilePath();
    dialog->OnTimeOut();
    QCOMPARE(recorder.sends, QStringList{QStringLiteral("upload")});
    QCOMPARE(recorder.files, QStringList{report});
    QCOMPARE(CorvidTest::stored(CrvC_Settings::DontShowSendProgressDlg), QVariant(ticked));
    QVERIFY(deleted(dialog));
}

void TestSendProgressDialog::stopped_data()
{
    QTest::addColumn<QString>("button");
    QTest::addColumn<bool>("sendInReview"); // else the user declines there

    QTest::newRow("Details, declined") << "details" << false;
    QTest::newRow("Cancel, declined") << "cancel" << false;
    QTest::newRow("Details, sent") << "details" << true;
    QTest::newRow("Cancel, sent") << "cancel" << true;
}

void TestSendProgressDialog::stopped()
{
    QFETCH(QString, button);
    QFETCH(bool, sendInReview);
    CorvidTest::SendRecorder recorder;
    QPointer<CrvC_SendClipDlg> dialog = newCountdown();
    dialog->timer()->start();
    dialog->OnTimeOut();
    dialog->OnTimeOut();
    dialog->imp()->dontShowAgain->setChecked(true);

    bool reviewShown = false;
    bool timerStopped = false;
    CrvC_SendClipDlg *countdown = dialog;
    CorvidTest::onNextModal<CrvC_DataCollectionDialog>([&](CrvC_DataCollectionDialog *review) {
        reviewShown = review == countdown->reviewDialog();
        timerStopped = !countdown->timer()->isActive();
        // Ticks still queued change nothing while the review is open.
        (sendInReview ? review->sendButton() : review->declineButton())->click();
    });
    (button == QLatin1String("details") ? dialog->imp()->detailsButton : dialog->imp()->cancelButton)->click();

    QVERIFY(reviewShown);
    QVERIFY(timerStopped);
    QCOMPARE(recorder.sends.size(), sendInReview ? 1 : 0);
    QVERIFY(!CorvidTest::stored(CrvC_Settings::DontShowSendProgressDlg).isValid());
    QVERIFY(deleted(dialog));
}

void TestSendProgressDialog::closing()
{
    CorvidTest::SendRecorder recorder;
    QPointer<CrvC_SendClipDlg> dialog = newCountdown();
    dialog->OnTimeOut();
    dialog->imp()->dontShowAgain->setChecked(true);
    dialog->close();
    QVERIFY(deleted(dialog));
    QVERIFY(recorder.sends.isEmpty());
    QVERIFY(!CorvidTest::stored(CrvC_Settings::DontShowSendProgressDlg).isValid());
}

void TestSendProgressDialog::timerIsOneSecondRepeating()
{
    CorvidTest::SendRecorder recorder;
    QPointer<CrvC_SendClipDlg> dialog = new CrvC_SendClipDlg(nullptr, QString(), QStringLiteral("top"), QString());
    QVERIFY(dialog->testAttribute(Qt::WA_DeleteOnClose));
    QVERIFY(!dialog->isModal());
    QVERIFY(dialog->timer()->isActive());
    QCOMPARE(dialog->timer()->interval(), 1000);
    QVERIFY(!dialog->timer()->isSingleShot());
    QVERIFY(dialog->reviewDialog()->isHidden());
    dialog->close();
    QVERIFY(deleted(dialog));
}

QTEST_MAIN(TestSendProgressDialog)
#include "tst_sendprogressdialog.moc"
