#include "DialogTestSupport.h"
#include "ModalDialogs.h"
#include "common/TestEnvironment.h"
#include "report/BackgroundBuild.h"
#include "transmit/DataCollectionEmail.h"
#include "ui/DataCollectionDialog.h"
#include "ui/DataCollectionHtmlViewer.h"
#include "ui/SendClipDlg.h"
#include "ui/SendClipDlgImp.h"
#include "ui/SendToClipDlg.h"
#include "ui/SendToClipDlgImp.h"

#include <QDir>
#include <QPointer>
#include <QSemaphore>
#include <QtTest>

using CorvidTest::store;
using CorvidTest::stored;

// Holds every report build on its thread until released.
class HeldBuilds
{
public:
    HeldBuilds()
    {
        CrvC_BackgroundBuild::setStartHook([this] { m_gate.acquire(); });
    }
    ~HeldBuilds() { finish(); }
    // Lets one build go and waits, events running, until `review` has its page.
    bool release(CrvC_DataCollectionDialog *review)
    {
        m_gate.release();
        // A review that sends once its page is ready goes away right after.
        const QPointer<CrvC_DataCollectionDialog> guard(review);
        return QTest::qWaitFor([&guard] { return !guard || guard->reportReady(); }, 20000);
    }
    // Lets every build go and waits for their threads (also a build whose window is gone).
    void finish()
    {
        m_gate.release(100);
        CrvC_BackgroundBuild::waitForAll();
        CrvC_BackgroundBuild::setStartHook({});
        m_gate.acquire(m_gate.available());
    }

private:
    QSemaphore m_gate;
};

const QString Report = QStringLiteral("/p/device_usage_statistics.html");

// The send method dialog (how it opens, what OK and Cancel store and send,
// when it is shown at all) and the countdown (five ticks then the send,
// Details and Cancel open the review, closing sends nothing). Ticks are
// driven by hand.
class TestSendDialogs : public QObject
{
    Q_OBJECT
    std::unique_ptr<CorvidTest::Environment> m_env;
    QByteArray m_path;

    // A mail program on PATH, or none at all; answers the program.
    QString mailPrograms(bool present)
    {
        const QString bin = m_env->home() + QLatin1String("/bin");
        qputenv("PATH", present ? QFile::encodeName(bin) + ':' + m_path : m_path);
        return present ? bin + QLatin1String("/thunderbird") : QString();
    }

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new CorvidTest::Environment);
        QDir().mkpath(m_env->home() + QLatin1String("/work"));
        QVERIFY(QDir::setCurrent(m_env->home() + QLatin1String("/work")));
        QVERIFY(CorvidTest::writeFile(m_env->home() + QLatin1String("/bin/thunderbird"), "#!/bin/sh\n"));
        m_path = qgetenv("PATH");
        if (CrvC_DataCollectionEmail().emailTools().size())
            QSKIP("this machine has a mail program in a fixed folder");
    }
    void init() { m_env->clearSettings(); }
    void cleanup() { qputenv("PATH", m_path); }

    void methodDialogOpens_data()
    {
        QTest::addColumn<QVariant>("useSsl");
        QTest::addColumn<QVariant>("dontShow");
        QTest::addColumn<QVariant>("tool");
        QTest::addColumn<QString>("entry"); // "ask": showSendMethodDialog; "email": ...ForEmail
        QTest::addColumn<bool>("programs");
        QTest::addColumn<bool>("shown");
        QTest::addColumn<bool>("emailChecked");
        QTest::addColumn<bool>("boxChecked");

        const QVariant none, yes(true), no(false);
        QTest::newRow("nothing stored: no dialog")
            << none << none << none << "ask" << true << false << false << false;
        QTest::newRow("e-mail stored")
            << no << none << QVariant("mutt") << "ask" << true << true << true << true;
        QTest::newRow("automatic, no program") << no << yes << none << "ask" << true << true << true << true;
        // After a failure the choice is for this report: the box starts cleared.
        QTest::newRow("after a failed upload")
            << none << yes << none << "email" << true << true << true << false;
        QTest::newRow("e-mail stored, no mail program")
            << no << none << none << "ask" << false << true << false << true;
        QTest::newRow("after a failed upload, no mail program")
            << none << none << none << "email" << false << true << false << false;
    }

    void methodDialogOpens()
    {
        QFETCH(QVariant, useSsl);
        QFETCH(QVariant, dontShow);
        QFETCH(QVariant, tool);
        QFETCH(QString, entry);
        QFETCH(bool, programs);
        mailPrograms(programs);
        store(CrvC_Settings::UseSSL, useSsl);
        store(CrvC_Settings::DontShowSendToDlg, dontShow);
        store(CrvC_Settings::SelectedEmailTool, tool);
        CorvidTest::SendRecorder recorder;

        bool shown = false, email = false, listEnabled = false, box = false, explained = false;
        QPointer<QTimer> poll = CorvidTest::onNextModal<CrvC_SendToClipDlg>([&](CrvC_SendToClipDlg *dialog) {
            shown = true;
            explained = dialog->noEmailToolNote() && !dialog->imp()->emailRadioButton->isEnabled();
            email = dialog->imp()->emailRadioButton->isChecked();
            listEnabled = dialog->imp()->selectEmailTool->isEnabled();
            box = dialog->imp()->dontShowAgain->isChecked();
            // The program list follows the method.
            dialog->imp()->sslRadioButton->setChecked(true);
            listEnabled = listEnabled && !dialog->imp()->selectEmailTool->isEnabled();
            dialog->reject();
        });
        if (entry == QLatin1String("ask"))
            CrvC_SendToClipDlg::showSendMethodDialog(nullptr, Report);
        else
            CrvC_SendToClipDlg::showSendMethodDialogForEmail(nullptr, Report);
        delete poll;

        QTEST(shown, "shown");
        QCOMPARE(recorder.sends, shown ? QStringList() : QStringList{QStringLiteral("upload")});
        if (!shown)
            return;
        QTEST(email, "emailChecked");
        QCOMPARE(listEnabled, email);
        QTEST(box, "boxChecked");
        QCOMPARE(explained, !programs);
    }

    void methodDialogEnds_data()
    {
        QTest::addColumn<QString>("button");
        QTest::addColumn<bool>("afterFailure"); // the offer after a failed upload, e-mail preselected
        QTest::addColumn<bool>("programs");
        QTest::addColumn<bool>("tick");       // "Send Corvid file automatically"
        QTest::addColumn<QVariant>("useSsl"); // stored afterwards
        QTest::addColumn<QVariant>("dontShow");
        QTest::addColumn<bool>("toolStored");
        QTest::addColumn<QString>("started"); // "email" stands for the e-mail through the program

        const QVariant none;
        // The program shown differs from the none remembered: it is stored too.
        QTest::newRow("OK, unchanged")
            << "ok" << false << true << true << none << QVariant(true) << true << "upload";
        QTest::newRow("failure offer, OK")
            << "ok" << true << true << false << none << none << false << "email";
        QTest::newRow("failure offer, ticked, OK")
            << "ok" << true << true << true << QVariant(false) << QVariant(true) << true << "email";
        // No mail program: the upload is the one choice left, for this report.
        QTest::newRow("failure offer, no mail program, OK")
            << "ok" << true << false << false << none << none << false << "upload";
        QTest::newRow("Cancel") << "cancel" << true << true << true << none << none << false << "";
        QTest::newRow("closed") << "close" << true << true << true << none << none << false << "";
    }

    void methodDialogEnds()
    {
        QFETCH(QString, button);
        QFETCH(bool, afterFailure);
        QFETCH(bool, programs);
        QFETCH(bool, tick);
        QFETCH(QString, started);
        const QString tool = mailPrograms(programs);
        CorvidTest::SendRecorder recorder;
        CrvC_SendToClipDlg dialog(nullptr, Report);
        if (afterFailure)
            dialog.offerAfterFailure();
        dialog.imp()->dontShowAgain->setChecked(tick);
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
        QFETCH(bool, toolStored);
        QCOMPARE(stored(CrvC_Settings::SelectedEmailTool), toolStored ? QVariant(tool) : QVariant());
        const QString expected = started == QLatin1String("email") ? QLatin1String("email ") + tool : started;
        QCOMPARE(recorder.sends, expected.isEmpty() ? QStringList() : QStringList{expected});
    }

    // The build is held on its thread until `built`: "at once" (before the ticks), "late" (after
    // the fifth tick), "in review" (while the review dialog is open), "after" (the window gone).
    void countdown_data()
    {
        QTest::addColumn<QString>("end"); // "ticks", "details", "cancel", "close"
        QTest::addColumn<QString>("built");
        QTest::addColumn<bool>("sendInReview");
        QTest::addColumn<int>("sends");
        QTest::addColumn<bool>("boxStored");

        QTest::newRow("five ticks") << "ticks"
                                    << "at once" << false << 1 << true;
        QTest::newRow("five ticks, page late: sent once written") << "ticks"
                                                                  << "late" << false << 1 << true;
        QTest::newRow("Details, declined") << "details"
                                           << "at once" << false << 0 << false;
        QTest::newRow("Details during the build, declined") << "details"
                                                            << "in review" << false << 0 << false;
        QTest::newRow("Cancel, sent in the review") << "cancel"
                                                    << "at once" << true << 1 << false;
        QTest::newRow("Cancel during the build, sent once shown") << "cancel"
                                                                  << "in review" << true << 1 << false;
        QTest::newRow("window closed") << "close"
                                       << "at once" << false << 0 << false;
        QTest::newRow("window closed during the build") << "close"
                                                        << "after" << false << 0 << false;
    }

    void countdown()
    {
        QFETCH(QString, end);
        QFETCH(QString, built);
        QFETCH(bool, sendInReview);
        CorvidTest::SendRecorder recorder;
        HeldBuilds held;
        QPointer<CrvC_SendClipDlg> dialog = new CrvC_SendClipDlg(
            nullptr, m_env->home() + QLatin1String("/p.orb"), QStringLiteral("top"), QString());
        QVERIFY(dialog->timer()->isActive());
        dialog->show();
        QVERIFY(!dialog->reviewDialog()->reportReady());
        const QString reportPath = dialog->reviewDialog()->reportPath();
        if (built == QLatin1String("at once"))
            QVERIFY(held.release(dialog->reviewDialog()));
        dialog->imp()->dontShowAgain->setChecked(true);
        for (int tick = 1; tick <= 4; ++tick) {
            dialog->OnTimeOut();
            QCOMPARE(dialog->imp()->progressBar->value(), tick);
        }
        QVERIFY(recorder.sends.isEmpty());

        bool reviewed = false, shownWhenReady = true;
        CrvC_SendClipDlg *countdown = dialog;
        QPointer<QTimer> poll =
            CorvidTest::onNextModal<CrvC_DataCollectionDialog>([&](CrvC_DataCollectionDialog *review) {
                reviewed = review == countdown->reviewDialog() && !countdown->timer()->isActive();
                if (built == QLatin1String("in review")) {
                    const auto page = [review] { return review->contentsViewer()->toPlainText(); };
                    shownWhenReady = !page().contains(QLatin1String("Device Usage Page"))
                                     && !review->sendButton()->isEnabled() && held.release(review)
                                     && page().contains(QLatin1String("Device Usage Page"));
                }
                (sendInReview ? review->sendButton() : review->declineButton())->click();
            });
        if (end == QLatin1String("ticks"))
            dialog->OnTimeOut();
        else if (end == QLatin1String("details"))
            dialog->imp()->detailsButton->click();
        else if (end == QLatin1String("cancel"))
            dialog->imp()->cancelButton->click();
        else
            dialog->close();
        delete poll;
        if (built == QLatin1String("late")) {
            QVERIFY(recorder.sends.isEmpty());
            QVERIFY(held.release(dialog->reviewDialog()));
        }
        const QByteArray page = CorvidTest::readFile(reportPath);
        held.finish();

        QVERIFY(shownWhenReady);
        QCOMPARE(reviewed, end == QLatin1String("details") || end == QLatin1String("cancel"));
        QTEST(int(recorder.sends.size()), "sends");
        if (!recorder.pages.isEmpty())
            QCOMPARE(recorder.pages.first(), page);
        QFETCH(bool, boxStored);
        QCOMPARE(stored(CrvC_Settings::DontShowSendProgressDlg), boxStored ? QVariant(true) : QVariant());
        QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
        QVERIFY(dialog.isNull());
    }

    // A second report started during the first's countdown does not change what the first
    // sends, even from another working directory; declined, it sends nothing, keeps no copy.
    void twoCycles_data()
    {
        QTest::addColumn<bool>("declineSecond");
        QTest::newRow("both sent") << false;
        QTest::newRow("second declined") << true;
    }

    void twoCycles()
    {
        QFETCH(bool, declineSecond);
        CorvidTest::SendRecorder recorder;
        QList<QPointer<CrvC_SendClipDlg>> cycles;
        QList<QByteArray> built;
        for (const QByteArray &device : {QByteArray("first"), QByteArray("second")}) {
            CorvidTest::writeFile(QStringLiteral("top_map.ktp"), "Target Device : " + device + '\n');
            cycles << new CrvC_SendClipDlg(nullptr, QString(), QStringLiteral("top"), QString());
            cycles.last()->timer()->stop();
            QTRY_VERIFY(cycles.last()->reviewDialog()->reportReady());
            built << CorvidTest::readFile(cycles.last()->reviewDialog()->reportPath());
            QVERIFY(built.last().contains(device));
        }
        const QString project = QDir::currentPath();
        const QString secondCopy = cycles.last()->reviewDialog()->builder().pagePath();
        if (declineSecond) {
            CorvidTest::onNextModal<CrvC_DataCollectionDialog>(
                [](CrvC_DataCollectionDialog *review) { review->declineButton()->click(); });
            cycles.last()->imp()->detailsButton->click();
            QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
        }
        QVERIFY(QDir::setCurrent(m_env->home()));
        for (const QPointer<CrvC_SendClipDlg> &cycle : cycles) {
            for (int tick = 0; cycle && tick < CrvC_SendClipDlg::Steps; ++tick)
                cycle->OnTimeOut();
        }
        QVERIFY(QDir::setCurrent(project));
        QCOMPARE(recorder.pages, declineSecond ? built.mid(0, 1) : built);
        QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
        QCOMPARE(QFileInfo::exists(secondCopy), !declineSecond);
    }
};

QTEST_MAIN(TestSendDialogs)
#include "tst_senddialogs.moc"
