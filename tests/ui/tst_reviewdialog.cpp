#include "common/TestEnvironment.h"
#include "DialogTestSupport.h"
#include "ModalDialogs.h"
#include "project/ProjectRepositoryValues.h"
#include "ui/DataCollectionDialog.h"
#include "ui/DataCollectionHtmlViewer.h"

#include <QDesktopServices>
#include <QDir>
#include <QInputDialog>
#include <QPushButton>
#include <QTabWidget>
#include <QtTest>

// The review dialog: how each way out ends exec() and whether it sends and
// counts, the tab buttons, the links of each tab, the design-name prompt and
// the cut of a page too large for the viewer.
class TestReviewDialog : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void init();
    void cleanupTestCase();
    void exits_data();
    void exits();
    void tabButtons_data();
    void tabButtons();
    void links();
    void missingInstalledPages();
    void designNamePrompt_data();
    void designNamePrompt();
    void largePage_data();
    void largePage();
    void largeReportInDialog();

public Q_SLOTS:
    // Stands in for the desktop's web browser.
    void openUrl(const QUrl &url) { m_opened << url.toString(); }

private:
    QString newProject(const QString &name);

    std::unique_ptr<CorvidTest::Environment> m_env;
    QStringList m_opened;
};

namespace {

const char IntroductionPage[] =
    "<html><body><h1>Introduction</h1><a href='https://www.vantor.example/corvid'>more</a></body></html>";
const char HelpPage[] = "<html><body><h1>Help</h1><a href='#off'>off</a><a name='off'>Off</a></body></html>";

} // namespace

void TestReviewDialog::initTestCase()
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

void TestReviewDialog::cleanupTestCase()
{
    for (const char *scheme : {"http", "https", "file"})
        QDesktopServices::unsetUrlHandler(QLatin1String(scheme));
}

void TestReviewDialog::init()
{
    m_env->clearSettings();
    m_opened.clear();
}

QString TestReviewDialog::newProject(const QString &name)
{
    const QString file = m_env->home() + QLatin1String("/projects/") + name + QLatin1String(".orb");
    CorvidTest::writeFile(file, "<project/>");
    return file;
}

void TestReviewDialog::exits_data()
{
    QTest::addColumn<QString>("action");
    QTest::addColumn<int>("result");
    QTest::addColumn<QString>("counter"); // the project's send counter afterwards

    QTest::newRow("send") << "send" << int(QDialog::Accepted) << "2";
    QTest::newRow("decline") << "decline" << int(QDialog::Rejected) << QString();
    QTest::newRow("escape") << "escape" << int(QDialog::Rejected) << QString();
    QTest::newRow("close") << "close" << int(QDialog::Rejected) << QString();
}

void TestReviewDialog::exits()
{
    QFETCH(QString, action);
    const QString project = newProject(QLatin1String(QTest::currentDataTag()));
    CorvidTest::SendRecorder recorder;
    CrvC_DataCollectionDialog dialog;
    dialog.createReport(project, QStringLiteral("top"), QStringLiteral("Kestrel"));

    QStringList sentWhileOpen;
    CorvidTest::onNextModal<CrvC_DataCollectionDialog>([&](CrvC_DataCollectionDialog *open) {
        if (action == QLatin1String("send")) {
            open->sendButton()->click();
            sentWhileOpen = recorder.sends;
        } else if (action == QLatin1String("decline")) {
            open->declineButton()->click();
        } else if (action == QLatin1String("escape")) {
            QTest::keyClick(open, Qt::Key_Escape);
        } else {
            open->close();
        }
    });
    QTEST(dialog.exec(), "result");

    const bool sends = action == QLatin1String("send");
    QCOMPARE(sentWhileOpen, sends ? QStringList{QStringLiteral("upload")} : QStringList());
    QCOMPARE(recorder.sends.size(), sends ? 1 : 0);
    if (sends)
        QCOMPARE(recorder.files.first(), QFileInfo(dialog.reportPath()).absoluteFilePath());
    QTEST(ProjectRepositoryValues::instance().getValue(
              project, QLatin1String(ProjectRepositoryValues::SendIterationKey)),
          "counter");
}

void TestReviewDialog::tabButtons_data()
{
    QTest::addColumn<QString>("button");
    QTest::addColumn<int>("tab");

    QTest::newRow("Verify Contents") << "verify" << int(CrvC_DataCollectionDialog::ContentsTab);
    QTest::newRow("Help") << "help" << int(CrvC_DataCollectionDialog::HelpTab);
}

void TestReviewDialog::tabButtons()
{
    QFETCH(QString, button);
    CorvidTest::SendRecorder recorder;
    CrvC_DataCollectionDialog dialog;
    dialog.show();
    QCOMPARE(dialog.tabWidget()->currentIndex(), int(CrvC_DataCollectionDialog::IntroductionTab));
    (button == QLatin1String("verify") ? dialog.verifyButton() : dialog.helpButton())->click();
    QTEST(dialog.tabWidget()->currentIndex(), "tab");
    QVERIFY(dialog.isVisible());
    QVERIFY(recorder.sends.isEmpty());
}

void TestReviewDialog::links()
{
    CrvC_DataCollectionDialog dialog;
    const QUrl introduction = dialog.introductionViewer()->source();
    QVERIFY(introduction.isLocalFile());

    // Introduction: the link opens in the browser, the page stays.
    Q_EMIT dialog.introductionViewer()->anchorClicked(QUrl(QStringLiteral("https://www.vantor.example/corvid")));
    QCOMPARE(m_opened, QStringList{QStringLiteral("https://www.vantor.example/corvid")});
    QCOMPARE(dialog.introductionViewer()->source(), introduction);

    // Help: links are followed inside the tab, nothing opens outside.
    QVERIFY(dialog.helpViewer()->openLinks());
    QCOMPARE(m_opened.size(), 1);
    QVERIFY(!QApplication::overrideCursor());
}

void TestReviewDialog::missingInstalledPages()
{
    const QString intro = m_env->installRoot() + QLatin1String("/data/reports/corvid_introduction.html");
    const QString help = m_env->installRoot() + QLatin1String("/data/reports/corvid_help.html");
    QVERIFY(QFile::rename(intro, intro + QLatin1String(".off")));
    QVERIFY(QFile::rename(help, help + QLatin1String(".off")));
    CrvC_DataCollectionDialog dialog;
    QVERIFY(QFile::rename(intro + QLatin1String(".off"), intro));
    QVERIFY(QFile::rename(help + QLatin1String(".off"), help));

    QVERIFY(dialog.introductionViewer()->toPlainText().startsWith(
        QLatin1String("The HTML page containing the Introduction for the Corvid feature is missing.")));
    QVERIFY(dialog.helpViewer()->toPlainText().startsWith(
        QLatin1String("The HTML page containing the Help for the Corvid feature is missing.")));
}

void TestReviewDialog::designNamePrompt_data()
{
    QTest::addColumn<QString>("typed"); // null: the prompt is cancelled
    QTest::addColumn<QString>("design");

    QTest::newRow("typed with blanks") << "  led  " << "led";
    QTest::newRow("cancelled") << QString() << QString();
}

void TestReviewDialog::designNamePrompt()
{
    QFETCH(QString, typed);
    QFETCH(QString, design);
    // A design "led" with a synthesis report that names its device.
    CorvidTest::writeFile(QStringLiteral("led_map.ktp"), "Target Device  : ks3s500\nTarget Package : fg320\n");
    QString title;
    QString label;
    CorvidTest::onNextModal<QInputDialog>([&](QInputDialog *prompt) {
        title = prompt->windowTitle();
        label = prompt->labelText();
        if (typed.isNull()) {
            prompt->reject();
        } else {
            prompt->setTextValue(typed);
            prompt->accept();
        }
    });
    CrvC_DataCollectionDialog dialog;
    dialog.createReport(newProject(QStringLiteral("prompt")), QString(), QStringLiteral("Kestrel"));

    QCOMPARE(title, QStringLiteral("Corvid"));
    QCOMPARE(label, QStringLiteral("Enter the design name:"));
    QVERIFY(!QApplication::overrideCursor());
    QVERIFY(QFileInfo(dialog.reportPath()).isFile());
    QCOMPARE(dialog.builder().data().targetDevice.isEmpty(), design.isEmpty());
}

void TestReviewDialog::largePage_data()
{
    QTest::addColumn<int>("lines");
    QTest::addColumn<bool>("cut");

    // About 100 characters a line.
    const int perLimit = CrvC_DataCollectionDialog::ContentsLimit / 100;
    QTest::newRow("small") << 50 << false;
    QTest::newRow("just below the limit") << perLimit - 2 << false;
    QTest::newRow("above the limit") << perLimit + 5 << true;
    QTest::newRow("tens of times the limit") << perLimit * 30 << true;
}

void TestReviewDialog::largePage()
{
    QFETCH(int, lines);
    QString page = QStringLiteral("<HTML><HEAD><TITLE>t</TITLE></HEAD>\n<BODY TEXT='#000000'>\n");
    for (int i = 0; i < lines; ++i)
        page += QStringLiteral("<TR><TD>name</TD><TD><dtag-item1>v=%1</dtag-item1></TD></TR>")
                    .arg(i, 6, 10, QLatin1Char('0'))
                    .leftJustified(99, QLatin1Char(' '))
                + QLatin1Char('\n');
    page += QLatin1String("</BODY></HTML>");

    bool cut = false;
    const QString text = CrvC_DataCollectionDialog::contentsText(page, &cut);
    QTEST(cut, "cut");
    if (!cut) {
        QCOMPARE(text, page);
        return;
    }
    QVERIFY(text.size() < CrvC_DataCollectionDialog::ContentsLimit + 1000);
    // The notice with the link comes right after the body tag; the page
    // follows in whole lines.
    const qsizetype notice = text.indexOf(QLatin1String("<P><B>"));
    const qsizetype noticeEnd = text.indexOf(QLatin1String("<HR>"), notice) + 4;
    QCOMPARE(text.left(notice), page.left(notice));
    QVERIFY(text.mid(notice, noticeEnd - notice).contains(QLatin1String(CrvC_DataCollectionDialog::BrowseContentsUrl)));
    const QString shown = text.left(notice) + text.mid(noticeEnd);
    QVERIFY(page.startsWith(shown));
    QCOMPARE(page.at(shown.size()), QLatin1Char('\n'));
}

void TestReviewDialog::largeReportInDialog()
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
    QVERIFY(dialog.builder().pageText().size() > CrvC_DataCollectionDialog::ContentsLimit);
    QVERIFY(dialog.contentsCut());
    QVERIFY(dialog.contentsViewer()->toPlainText().size() < CrvC_DataCollectionDialog::ContentsLimit);

    Q_EMIT dialog.contentsViewer()->anchorClicked(QUrl(QLatin1String(CrvC_DataCollectionDialog::BrowseContentsUrl)));
    QCOMPARE(m_opened, QStringList{QUrl::fromLocalFile(QFileInfo(dialog.reportPath()).absoluteFilePath()).toString()});
    QVERIFY(!QApplication::overrideCursor());
}

QTEST_MAIN(TestReviewDialog)
#include "tst_reviewdialog.moc"
