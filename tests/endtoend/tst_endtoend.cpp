// One report from `orb open` to the maker: the staged orb with the real
// plug-in, vancurl and corvid-receiver on 127.0.0.1 with a throwaway
// authority. Also what must not happen: nothing built or sent when
// collection is switched off, nothing sent after the user declines.

#include "common/TestEnvironment.h"
#include "common/TestServer.h"

#include "host/FileSupervisor.h"
#include "host/Settings.h"
#include "host/String.h"
#include "host/gui/ApplicationBase.h"
#include "host/project/OrbProject.h"
#include "project/CorvidSettings.h"
#include "project/ProjectRepositoryValues.h"
#include "transmit/SendHistory.h"

#include <QDateTime>
#include <QDirIterator>
#include <QElapsedTimer>
#include <QPluginLoader>
#include <QPushButton>
#include <QRegularExpression>
#include <QtTest>

using namespace CorvidTest;

class TestEndToEnd : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void init();
    void orbOpen_data();
    void orbOpen();
    void emailMethodComposesWithTheReport();
    void declineSendsNothing();

private:
    ToolRun orb(bool withProject, const QStringList &extraEnvironment = QStringList());
    // The requests the receiver has logged since the test function began.
    QStringList requests()
    {
        return m_server->log().mid(m_logSeen).split(QLatin1Char('\n'), Qt::SkipEmptyParts);
    }
    // The send history that orb records into (the test's data location).
    static QList<CrvC_SendHistory::Entry> sent()
    {
        QList<CrvC_SendHistory::Entry> entries;
        CrvC_SendHistory().entries(&entries);
        return entries;
    }
    QString sendIteration() const
    {
        return ProjectRepositoryValues::instance().getValue(
            m_projectFile, QLatin1String(ProjectRepositoryValues::SendIterationKey));
    }

    std::unique_ptr<Environment> m_env;
    std::unique_ptr<TestServer> m_server;
    qsizetype m_logSeen = 0;
    QString m_project; // a fresh copy of the sample for each test
    QString m_projectFile;
    QString m_page;
};

void TestEndToEnd::initTestCase()
{
    m_env.reset(new Environment);
    m_server.reset(new TestServer);
    QVERIFY2(m_server->start(), qPrintable(m_server->error()));
    QVERIFY(m_env->writeDataFile(QStringLiteral("reports/ca-cert-bundle.crt"), readFile(m_server->caFile())));
    qputenv("CORVID_SERVER", m_server->baseUrl().toUtf8());
    TestServer::putStageBinFirstInPath();
    // Loopback only, whatever the developer's proxy variables say.
    for (const char *name :
         {"http_proxy", "https_proxy", "HTTP_PROXY", "HTTPS_PROXY", "all_proxy", "ALL_PROXY"})
        qunsetenv(name);
    m_project = m_env->home() + QLatin1String("/ledctrl");
    m_projectFile = m_project + QLatin1String("/ledctrl.orb");
    m_page = m_project + QLatin1String("/device_usage_statistics.html");
}

void TestEndToEnd::init()
{
    m_env->clearSettings();
    QFile::remove(m_env->installRoot() + QLatin1String("/data/reports/corvidsettings"));
    // A direct connection, not the desktop's proxy.
    Gui::Clip::Settings(QStringLiteral("WebUpdate"), true, true, true)
        .setValue(QStringLiteral("ProxyChoice"), 0);
    const QString sample = Environment::sourceDir() + QLatin1String("/examples/ledctrl");
    QDir(m_project).removeRecursively();
    for (QDirIterator it(sample, QDir::Files, QDirIterator::Subdirectories); it.hasNext();) {
        const QString target = m_project + it.next().mid(sample.size());
        QDir().mkpath(QFileInfo(target).absolutePath());
        QVERIFY(QFile::copy(it.filePath(), target));
    }
    QString error;
    QVERIFY2(OrbProject::initializeRepository(m_projectFile, &error), qPrintable(error));
    m_logSeen = m_server->log().size();
}

// orb open on the sample's usage file, with the test's settings (the test
// process keeps them under QStandardPaths' test location).
ToolRun TestEndToEnd::orb(bool withProject, const QStringList &extraEnvironment)
{
    QStringList arguments;
    if (withProject)
        arguments << QStringLiteral("--project") << m_projectFile;
    arguments << QStringLiteral("open") << m_project + QLatin1String("/ledctrl_usage.xml");
    return runStaged(QStringLiteral("orb"), arguments, m_env->home(),
                     QStringList{QStringLiteral("ORB_DEBUG=1")} + Environment::locations()
                         + extraEnvironment);
}

void TestEndToEnd::orbOpen_data()
{
    QTest::addColumn<bool>("withProject");
    QTest::addColumn<QString>("switchedOff"); // "", "by the user", "for the installation"
    QTest::addColumn<bool>("countdown");
    QTest::addColumn<QString>("outcome"); // "sent", or the debug line when nothing is

    const QString user = QStringLiteral("by the user");
    const QString install = QStringLiteral("for the installation");
    const QString off = QStringLiteral("collection is switched off");
    QTest::newRow("sample project, countdown runs out") << true << "" << true << "sent";
    QTest::newRow("sample project, sent at once") << true << "" << false << "sent";
    QTest::newRow("switched off by the user") << true << user << true << off;
    QTest::newRow("switched off by the user, no project") << false << user << false << off;
    QTest::newRow("switched off for the installation") << true << install << false << off;
    QTest::newRow("switched off for the installation, no project") << false << install << true << off;
    // A folder in the page's place: no page, so nothing may be sent.
    QTest::newRow("page cannot be written") << true << "" << false << "no report written";
}

void TestEndToEnd::orbOpen()
{
    QFETCH(bool, withProject);
    QFETCH(QString, switchedOff);
    QFETCH(bool, countdown);
    QFETCH(QString, outcome);
    if (switchedOff == QLatin1String("by the user")) {
        CrvC_Settings::setValue(CrvC_Settings::CollectDeviceUsage, false);
        CrvC_Settings::setValue(CrvC_Settings::CorvidTimeStamp,
                                QDateTime::currentDateTime().toString(Qt::ISODate));
    } else if (!switchedOff.isEmpty()) {
        QVERIFY(
            m_env->writeDataFile(QStringLiteral("reports/corvidsettings"), "collectusagestatistics=false\n"));
    }
    CrvC_Settings::setValue(CrvC_Settings::DontShowSendProgressDlg, !countdown);
    const bool unwritable = outcome == QLatin1String("no report written");
    if (unwritable)
        QVERIFY(QDir().mkpath(m_page));
    const int uploadsBefore = m_server->uploadFolders().size();
    const qsizetype recordedBefore = sent().size();

    QElapsedTimer clock;
    clock.start();
    const ToolRun run = orb(withProject);
    QVERIFY2(run.exitCode == 0, qPrintable(run.output));

    if (outcome != QLatin1String("sent")) {
        QVERIFY2(run.output.contains(outcome), qPrintable(run.output));
        QVERIFY(!QFileInfo(m_page).isFile());
        QCOMPARE(QFileInfo(m_page).isDir(), unwritable);
        QCOMPARE(requests(), QStringList());
        QCOMPARE(sent().size(), recordedBefore);
        return;
    }
    if (countdown)
        QVERIFY2(clock.elapsed() >= 4500, "the countdown takes five seconds");
    // Byte for byte the page that was built; it showed iteration 1, the next send is the second.
    QCOMPARE(m_server->uploadFolders().size(), uploadsBefore + 1);
    const QByteArray built = readFile(m_page);
    QVERIFY(!built.isEmpty());
    QCOMPARE(m_server->upload(uploadsBefore).file, built);
    const QRegularExpression shown(QStringLiteral("name=\"ProjectIteration\">([^<]*)<"));
    QCOMPARE(shown.match(QString::fromUtf8(built)).captured(1), QStringLiteral("1"));
    QCOMPARE(sendIteration(), QStringLiteral("2"));
    // One entry more in the history, sent, with the bytes the receiver
    // stored; orb said so on its status line.
    const QList<CrvC_SendHistory::Entry> entries = sent();
    QCOMPARE(entries.size(), recordedBefore + 1);
    QCOMPARE(entries.first().outcome(), QStringLiteral("sent"));
    const ToolRun history = runStaged("corvid-history", {"show", QString::number(entries.first().id)},
                                      m_env->home(), Environment::locations());
    QVERIFY(history.standardOutput == m_server->upload(uploadsBefore).file);
    QVERIFY2(run.output.contains("orb: Usage report sent to 127.0.0.1, "), qPrintable(run.output));
}

void TestEndToEnd::emailMethodComposesWithTheReport()
{
    // A stand-in mail program, found first on PATH under a mail program's name.
    const QString bin = m_env->home() + QLatin1String("/mailbin");
    const QString mailer = bin + QLatin1String("/thunderbird");
    QDir().mkpath(bin);
    QFile::remove(mailer);
    QVERIFY(QFile::copy(QStringLiteral(FAKE_MAIL), mailer));
    const QString log = m_env->home() + QLatin1String("/mail.log");
    QFile::remove(log);

    CrvC_Settings::setValue(CrvC_Settings::DontShowSendProgressDlg, true);
    CrvC_Settings::setValue(CrvC_Settings::UseSSL, false);
    CrvC_Settings::setValue(CrvC_Settings::DontShowSendToDlg, true);
    CrvC_Settings::setValue(CrvC_Settings::SelectedEmailTool, mailer);
    const ToolRun run =
        orb(true, {QLatin1String("FAKE_MAIL_LOG=") + log,
                   QLatin1String("PATH=") + bin + QLatin1Char(':') + qEnvironmentVariable("PATH")});
    QVERIFY2(run.exitCode == 0, qPrintable(run.output));
    QTRY_VERIFY2_WITH_TIMEOUT(QFile::exists(log), qPrintable(run.output), 10000);
    const QString request = QString::fromUtf8(readFile(log));
    QVERIFY2(request.startsWith(QLatin1String("thunderbird\n-compose\n")), qPrintable(request));
    // The attachment is the report's own copy, named as one argument value.
    const QString encoded =
        request.section(QLatin1String("attachment='file://"), 1).section(QLatin1Char('\''), 0, 0);
    const QString attachment = QUrl::fromPercentEncoding(encoded.toLatin1());
    QVERIFY2(attachment.startsWith(qEnvironmentVariable("XDG_CACHE_HOME")), qPrintable(request));
    QCOMPARE(readFile(attachment), readFile(m_page));
    QCOMPARE(requests(), QStringList());
    QCOMPARE(sendIteration(), QStringLiteral("2"));
}

void TestEndToEnd::declineSendsNothing()
{
    // In this process, with the real plug-in: Cancel in the countdown opens
    // the review dialog, where the user declines.
    QString error;
    QVERIFY2(OrbProject::openCurrentProject(m_projectFile, &error), qPrintable(error));
    QPluginLoader plugin(Environment::stageDir() + QLatin1String("/lib/orb/plugins/libCorvid.so"));
    QVERIFY2(plugin.instance(), qPrintable(plugin.errorString()));
    const auto editors =
        Gui::Clip::FileSupervisor::getInstance()->editors(Gui::Clip::FileSupervisor::fileEditorCategory());
    QCOMPARE(editors.size(), std::size_t(1));

    const qsizetype recordedBefore = sent().size();
    bool declined = false;
    QTimer::singleShot(0, this, [&] {
        QWidget *countdown = nullptr;
        for (QWidget *widget : QApplication::topLevelWidgets()) {
            if (widget->objectName() == QLatin1String("Corvid_SendDlg") && widget->isVisible())
                countdown = widget;
        }
        QVERIFY(countdown);
        QTimer::singleShot(0, this, [&] {
            QWidget *review = QApplication::activeModalWidget();
            QVERIFY(review);
            for (QPushButton *button : review->findChildren<QPushButton *>()) {
                if (button->text().remove(QLatin1Char('&')) == QLatin1String("Decline")) {
                    declined = true;
                    button->click();
                }
            }
        });
        countdown->findChild<QPushButton *>(QStringLiteral("cancelButton"))->click();
    });
    editors.front()->openFile(Gui::Clip::String::convert(m_project + QLatin1String("/ledctrl_usage.xml")), 0,
                              nullptr);
    QTRY_VERIFY_WITH_TIMEOUT(declined, 10000);
    // Well past the countdown: nothing may go out late.
    QTest::qWait(6000);
    QVERIFY(QFile::exists(m_page));
    QCOMPARE(requests(), QStringList());
    QCOMPARE(sendIteration(), QString());
    QCOMPARE(sent().size(), recordedBefore);
    plugin.unload();
    OrbProject::closeCurrentProject();
}

int main(int argc, char **argv)
{
    // The plug-in connects to the host application's signals.
    Gui::Clip::ApplicationBase app(argc, argv);
    TestEndToEnd test;
    return QTest::qExec(&test, argc, argv);
}
#include "tst_endtoend.moc"
