#include "DialogTestSupport.h"
#include "ModalDialogs.h"
#include "common/TestEnvironment.h"
#include "project/ProjectRepositoryValues.h"
#include "transmit/MakerServer.h"
#include "transmit/SendUsingSSL.h"
#include "ui/DataCollectionDialog.h"
#include "ui/DataCollectionHtmlViewer.h"

#include <QDesktopServices>
#include <QDir>
#include <QInputDialog>
#include <QLabel>
#include <QPushButton>
#include <QTabWidget>
#include <QtTest>

namespace {

const char IntroductionPage[] =
    "<html><body><h1>Introduction</h1><a href='https://www.vantor.example/corvid'>more</a></body></html>";
const char HelpPage[] = "<html><body><h1>Help</h1><a href='#off'>off</a><a name='off'>Off</a></body></html>";

} // namespace

// The review dialog: how each way out ends exec() and whether it sends and
// counts, the tab buttons, the links of each tab, the design-name prompt and
// the cut of a page too large for the viewer.
class TestReviewDialog : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new CorvidTest::Environment);
        QVERIFY(m_env->writeDataFile(QStringLiteral("reports/corvid_introduction.html"), IntroductionPage));
        QVERIFY(m_env->writeDataFile(QStringLiteral("reports/corvid_help.html"), HelpPage));
        for (const char *scheme : {"http", "https", "file"})
            QDesktopServices::setUrlHandler(QLatin1String(scheme), this, "openUrl");
        // Without a project the page goes to the working directory.
        QDir().mkpath(m_env->home() + QLatin1String("/work"));
        QVERIFY(QDir::setCurrent(m_env->home() + QLatin1String("/work")));
    }

    void init()
    {
        m_env->clearSettings();
        m_opened.clear();
    }

    void cleanupTestCase()
    {
        for (const char *scheme : {"http", "https", "file"})
            QDesktopServices::unsetUrlHandler(QLatin1String(scheme));
    }

    void exits_data()
    {
        QTest::addColumn<QString>("action");
        QTest::addColumn<int>("result");
        QTest::addColumn<QString>("counter"); // the project's send counter afterwards
        QTest::addColumn<int>("tab");         // the tab shown at the end

        const int intro = CrvC_DataCollectionDialog::IntroductionTab;
        QTest::newRow("send") << "send" << int(QDialog::Accepted) << "2" << intro;
        QTest::newRow("decline") << "decline" << int(QDialog::Rejected) << QString() << intro;
        QTest::newRow("close") << "close" << int(QDialog::Rejected) << QString() << intro;
        QTest::newRow("Enter, then close") << "enter" << int(QDialog::Rejected) << QString() << intro;
        // These two only change the tab; the dialog is then declined.
        QTest::newRow("Verify Contents")
            << "verify" << int(QDialog::Rejected) << QString() << int(CrvC_DataCollectionDialog::ContentsTab);
        QTest::newRow("Help") << "help" << int(QDialog::Rejected) << QString()
                              << int(CrvC_DataCollectionDialog::HelpTab);
    }

    void exits()
    {
        QFETCH(QString, action);
        const QString project = newProject(QLatin1String(QTest::currentDataTag()));
        CorvidTest::SendRecorder recorder;
        CrvC_DataCollectionDialog dialog;
        dialog.createReport(project, QStringLiteral("top"), QStringLiteral("Kestrel"));

        QStringList sentWhileOpen;
        int tab = -1;
        CorvidTest::onNextModal<CrvC_DataCollectionDialog>([&](CrvC_DataCollectionDialog *open) {
            if (action == QLatin1String("verify") || action == QLatin1String("help")) {
                (action == QLatin1String("verify") ? open->verifyButton() : open->helpButton())->click();
                tab = open->isVisible() ? open->tabWidget()->currentIndex() : -2;
                open->declineButton()->click();
            } else if (action == QLatin1String("send")) {
                open->sendButton()->click();
                sentWhileOpen = recorder.sends;
            } else if (action == QLatin1String("decline")) {
                open->declineButton()->click();
            } else {
                if (action == QLatin1String("enter")) {
                    for (QWidget *focus : QWidgetList{open->contentsViewer(), open->sendButton()}) {
                        focus->setFocus();
                        QTest::keyClick(focus, Qt::Key_Return);
                    }
                }
                open->close();
            }
        });
        QVERIFY(!dialog.contentsCut() && !dialog.contentsAsText());
        QTEST(dialog.exec(), "result");
        QTEST(tab < 0 ? dialog.tabWidget()->currentIndex() : tab, "tab");

        const bool sends = action == QLatin1String("send");
        QCOMPARE(sentWhileOpen, sends ? QStringList{QStringLiteral("upload")} : QStringList());
        QCOMPARE(recorder.sends.size(), sends ? 1 : 0);
        if (sends)
            QCOMPARE(recorder.pages.first(), CorvidTest::readFile(dialog.reportPath()));
        QTEST(ProjectRepositoryValues::instance().getValue(
                  project, QLatin1String(ProjectRepositoryValues::SendIterationKey)),
              "counter");
    }

    void links()
    {
        CrvC_DataCollectionDialog dialog;
        const QUrl introduction = dialog.introductionViewer()->source();
        QVERIFY(introduction.isLocalFile());

        // Introduction: the link opens in the browser, the page stays.
        Q_EMIT dialog.introductionViewer()->anchorClicked(
            QUrl(QStringLiteral("https://www.vantor.example/corvid")));
        QCOMPARE(m_opened, QStringList{QStringLiteral("https://www.vantor.example/corvid")});
        QCOMPARE(dialog.introductionViewer()->source(), introduction);

        // Help: links are followed inside the tab, nothing opens outside.
        QVERIFY(dialog.helpViewer()->openLinks());
        QCOMPARE(m_opened.size(), 1);
        QVERIFY(!QApplication::overrideCursor());
    }

    void missingInstalledPages()
    {
        // Folders in place of the pages, in the first installation root: no page
        // to show, and the dialog still opens.
        const QString intro = m_env->installRoot() + QLatin1String("/data/reports/corvid_introduction.html");
        const QString help = m_env->installRoot() + QLatin1String("/data/reports/corvid_help.html");
        for (const QString &page : {intro, help}) {
            QVERIFY(QFile::rename(page, page + QLatin1String(".off")));
            QVERIFY(QDir().mkdir(page));
        }
        CrvC_DataCollectionDialog dialog;
        for (const QString &page : {intro, help}) {
            QVERIFY(QDir().rmdir(page));
            QVERIFY(QFile::rename(page + QLatin1String(".off"), page));
        }

        QVERIFY(dialog.introductionViewer()->toPlainText().startsWith(
            QLatin1String("The HTML page containing the Introduction for the Corvid feature is missing.")));
        QVERIFY(dialog.helpViewer()->toPlainText().startsWith(
            QLatin1String("The HTML page containing the Help for the Corvid feature is missing.")));
    }

    void designNamePrompt_data()
    {
        QTest::addColumn<QString>("typed"); // null: the prompt is cancelled
        QTest::addColumn<QString>("design");

        QTest::newRow("typed with blanks") << "  led  "
                                           << "led";
        QTest::newRow("cancelled: nothing written, sent or counted") << QString() << QString();
    }

    void designNamePrompt()
    {
        QFETCH(QString, typed);
        QFETCH(QString, design);
        // A design "led" with a synthesis report that names its device.
        CorvidTest::writeFile(QStringLiteral("led_map.ktp"),
                              "Target Device  : ks3s500\nTarget Package : fg320\n");
        CorvidTest::onNextModal<QInputDialog>([&](QInputDialog *prompt) {
            if (typed.isNull()) {
                prompt->reject();
            } else {
                prompt->setTextValue(typed);
                prompt->accept();
            }
        });
        CorvidTest::SendRecorder recorder;
        CrvC_DataCollectionDialog dialog;
        QFile::remove(dialog.reportPath());
        const QString project = newProject(QLatin1String(QTest::currentDataTag()));
        dialog.createReport(project, QString(), QStringLiteral("Kestrel"));
        dialog.sendData();

        QVERIFY(!QApplication::overrideCursor());
        QCOMPARE(QFileInfo(dialog.reportPath()).isFile(), !design.isEmpty());
        QCOMPARE(dialog.builder().data().targetDevice.isEmpty(), design.isEmpty());
        QCOMPARE(recorder.sends.size(), design.isEmpty() ? 0 : 1);
        const QString counter = ProjectRepositoryValues::instance().getValue(
            project, QLatin1String(ProjectRepositoryValues::SendIterationKey));
        QCOMPARE(counter.isEmpty(), design.isEmpty());
    }

    // What the line above the buttons says is what the upload sends.
    void destination_data()
    {
        QTest::addColumn<bool>("useSsl");
        QTest::addColumn<QVariant>("tool");
        QTest::addColumn<QString>("start"); // how the line begins

        QTest::newRow("upload") << true << QVariant() << "HTTPS upload to " + CrvC_MakerServer::host() + ",";
        QTest::newRow("e-mail") << false << QVariant("/usr/bin/mutt")
                                << "E-mail to " + CrvC_SendDispatcher::emailRecipient()
                                       + " with /usr/bin/mutt";
        QTest::newRow("no mail program: asked") << false << QVariant() << "You choose how";
    }

    void destination()
    {
        QFETCH(bool, useSsl);
        QFETCH(QVariant, tool);
        QFETCH(QString, start);
        CrvC_Settings::setValue(CrvC_Settings::UseSSL, useSsl);
        CrvC_Settings::setValue(CrvC_Settings::DontShowSendToDlg, true);
        CorvidTest::store(CrvC_Settings::SelectedEmailTool, tool);
        CrvC_DataCollectionDialog dialog;
        dialog.show();
        const QString line = dialog.destinationLabel()->text();
        QVERIFY2(line.startsWith(start), qPrintable(line));
        // The identifiers the upload sends beside the page, and only for an upload.
        const QRegularExpression fields(QStringLiteral("^(domain|regid)=."));
        const bool upload = !start.startsWith(QLatin1String("E-mail"));
        for (const QString &field : CrvC_SendUsingSSL(QString()).uploadArguments(QString()).filter(fields))
            QCOMPARE(line.contains(field.section(QLatin1Char('='), 1)), upload);
    }

    // Where the view would hide text that is sent, the tab shows the page's exact text.
    void contents_data()
    {
        QTest::addColumn<QString>("file");
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<QStringList>("shown");

        QTest::newRow("usage values") << "top_usage.xml"
                                      << QByteArray(
                                             "<DeviceUsageReport><DeviceUsage><group name='G'>"
                                             "<item name='count&lt;3&gt;' value='1'/><item name='n' "
                                             "value='&lt;!--'/><item name='after' value='7'/>"
                                             "</group></DeviceUsage></DeviceUsageReport>")
                                      << QStringList{"count<3>=1", "n=<!--", "after=7"};
        QTest::newRow("title in a page") << "par_usage_statistics.html" << QByteArray("<TITLE>kept</TITLE>")
                                         << QStringList{"<TITLE>kept</TITLE>"};
    }

    void contents()
    {
        QFETCH(QString, file);
        QFETCH(QByteArray, content);
        QFETCH(QStringList, shown);
        QVERIFY(CorvidTest::writeFile(file, content));
        CrvC_DataCollectionDialog dialog;
        dialog.createReport(QString(), QStringLiteral("top"), QString());
        QFile::remove(file);
        QVERIFY(dialog.contentsAsText());
        for (const QString &value : shown)
            QVERIFY2(dialog.contentsViewer()->toPlainText().contains(value), qPrintable(value));
    }

    void largeReportInDialog()
    {
        // A usage page of the design tools well above the viewer's limit lands
        // in the report whole; the tab shows its beginning and the link opens
        // the whole report in the browser.
        QByteArray big = "<HTML><BODY><TABLE>\n";
        while (big.size() < CrvC_DataCollectionDialog::ContentsLimit * 2)
            big += "<TR><TD>net_0001</TD><TD>12</TD><TD>routed</TD></TR>\n";
        big += "</TABLE></BODY></HTML>\n";
        CorvidTest::writeFile(QStringLiteral("par_usage_statistics.html"), big);

        CrvC_DataCollectionDialog dialog;
        dialog.createReport(newProject(QStringLiteral("large")), QStringLiteral("large"), QString());
        QFile::remove(QStringLiteral("par_usage_statistics.html"));
        const QString page = dialog.builder().pageText();
        QVERIFY(page.size() > CrvC_DataCollectionDialog::ContentsLimit);
        QVERIFY(dialog.contentsCut());
        QVERIFY(dialog.contentsViewer()->toPlainText().size() < CrvC_DataCollectionDialog::ContentsLimit);

        // The notice with the link comes right after the body tag; the page
        // follows in whole lines.
        const QString text = CrvC_DataCollectionDialog::contentsText(page);
        const qsizetype notice = text.indexOf(QLatin1String("<P><B>"));
        const qsizetype noticeEnd = text.indexOf(QLatin1String("<HR>"), notice) + 4;
        QVERIFY(text.left(notice).endsWith(QLatin1Char('>'))
                && text.left(notice).contains(QLatin1String("<BODY")));
        QVERIFY(text.mid(notice, noticeEnd - notice)
                    .contains(QLatin1String(CrvC_DataCollectionDialog::BrowseContentsUrl)));
        const QString shown = text.left(notice) + text.mid(noticeEnd);
        QVERIFY(page.startsWith(shown));
        QCOMPARE(page.at(shown.size()), QLatin1Char('\n'));

        // Only that link leaves the tab: a link in a value opens nothing.
        for (const char *link : {"https://x.example/", "file:///etc/passwd", "corvid:browse-contents"})
            Q_EMIT dialog.contentsViewer()->anchorClicked(QUrl(QLatin1String(link)));
        QCOMPARE(m_opened, QStringList{QUrl::fromLocalFile(dialog.builder().pagePath()).toString()});
        QVERIFY(!QApplication::overrideCursor());
    }

public Q_SLOTS:
    // Stands in for the desktop's web browser.
    void openUrl(const QUrl &url) { m_opened << url.toString(); }

private:
    QString newProject(const QString &name)
    {
        const QString file = m_env->home() + QLatin1String("/projects/") + name + QLatin1String(".orb");
        CorvidTest::writeFile(file, "<project/>");
        return file;
    }

    std::unique_ptr<CorvidTest::Environment> m_env;
    QStringList m_opened;
};

QTEST_MAIN(TestReviewDialog)
#include "tst_reviewdialog.moc"
