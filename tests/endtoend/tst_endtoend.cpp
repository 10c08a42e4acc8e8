// One report from `orb open` to the maker: the staged orb with the real
// plug-in, vancurl and corvid-receiver on 127.0.0.1 with a throwaway
// authority. Also what must not happen: nothing built or sent when
// collection is switched off, nothing sent after the user declines.

#include "common/TestEnvironment.h"
#include "common/TestServer.h"

#include "host/FileSupervisor.h"
#include "host/Settings.h"
#include "host/gui/ApplicationBase.h"
#include "host/String.h"
#include "host/project/OrbProject.h"
#include "project/CorvidSettings.h"
#include "project/ProjectRepositoryValues.h"

#include <QDateTime>
#include <QDeadlineTimer>
#include <QElapsedTimer>
#include <QDirIterator>
#include <QPluginLoader>
#include <QPushButton>
#include <QRegularExpression>
#include <QtTest>

using namespace CorvidTest;

namespace {

const QString pageName = QStringLiteral("device_usage_statistics.html");

bool copyTree(const QString &from, const QString &to)
{
    QDir(to).removeRecursively();
    QDirIterator it(from, QDir::Files, QDirIterator::Subdirectories);
    while (it.hasNext()) {
        const QString source = it.next();
        const QString target = to + source.mid(from.size());
        QDir().mkpath(QFileInfo(target).absolutePath());
        if (!QFile::copy(source, target))
            return false;
    }
    return true;
}

// The send iteration the page showed.
QString shownIteration(const QByteArray &page)
{
    const QRegularExpression tag(QStringLiteral("name=\"ProjectIteration\">([^<]*)<"));
    return tag.match(QString::fromUtf8(page)).captured(1);
}

bool waitFor(const std::function<bool()> &done, int ms)
{
    QDeadlineTimer deadline(ms);
    while (!done()) {
        if (deadline.hasExpired())
            return false;
        QTest::qWait(50);
    }
    return true;
}

} // namespace

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
    void freshProject();
    ToolRun orb(bool withProject, const QStringList &extraEnvironment = QStringList());
    QStringList requests();
    int m_requestsSeen = 0;

    std::unique_ptr<Environment> m_env;
    std::unique_ptr<TestServer> m_server;
    QString m_project; // the copy of the sample
    QString m_projectFile;
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
    for (const char *name : {"http_proxy", "https_proxy", "HTTP_PROXY", "HTTPS_PROXY", "all_proxy", "ALL_PROXY"})
        qunsetenv(name);
    m_project = m_env->home() + QLatin1String("/ledctrl");
    m_projectFile = m_project + QLatin1String("/ledctrl.orb");
}

void TestEndToEnd::init()
{
    m_env->clearSettings();
    QFile::remove(m_env->installRoot() + QLatin1String("/data/reports/corvidsettings"));
    // A direct connection, not the desktop's proxy.
    Gui::Clip::Settings(QStringLiteral("WebUpdate"), true, true, true).setValue(QStringLiteral("ProxyChoice"), 0);
    freshProject();
    m_requestsSeen = 0;
    m_requestsSeen = int(requests().size());
}

void TestEndToEnd::freshProject()
{
    QVERIFY(copyTree(Environment::sourceDir() + QLatin1String("/examples/ledctrl"), m_project));
    QString error;
    QVERIFY2(OrbProject::initializeRepository(m_projectFile, &error), qPrintable(error));
}

// orb open on the sample's usage file, with the test's settings (the test
// process keeps them under QStandardPaths' test location).
ToolRun TestEndToEnd::orb(bool withProject, const QStringList &extraEnvironment)
{
    QStringList arguments;
    if (withProject)
        arguments << QStringLiteral("--project") << m_projectFile;
    arguments << QStringLiteral("open") << m_project + QLatin1String("/ledctrl_usage.xml");
    QStringList environment{QStringLiteral("ORB_DEBUG=1"),
                            QLatin1String("XDG_CONFIG_HOME=") + QFileInfo(Gui::Clip::Settings::userFileName()).absolutePath().chopped(4)};
    return runStaged(QStringLiteral("orb"), arguments, m_env->home(), environment + extraEnvironment);
}

// The requests the receiver has logged since the test function began.
QStringList TestEndToEnd::requests()
{
    QStringList lines = m_server->log().split(QLatin1Char('\n'), Qt::SkipEmptyParts);
    lines.removeIf([](const QString &line) { return line.startsWith(QLatin1String("listening on")); });
    return lines.mid(m_requestsSeen);
}

void TestEndToEnd::orbOpen_data()
{
    QTest::addColumn<bool>("withProject");
    QTest::addColumn<QString>("userCollect"); // "" never applied, else applied now
    QTest::addColumn<QByteArray>("installFile");
    QTest::addColumn<bool>("countdown");
    QTest::addColumn<QString>("outcome"); // "sent", or the debug line when nothing is

    const QByteArray off = "collectusagestatistics=false\n";
    const QString switchedOff = QStringLiteral("collection is switched off");
    QTest::newRow("sample project, countdown runs out") << true << "" << QByteArray() << true << "sent";
    QTest::newRow("sample project, sent at once") << true << "" << QByteArray() << false << "sent";
    QTest::newRow("switched off by the user") << true << "false" << QByteArray() << true << switchedOff;
    QTest::newRow("switched off by the user, no project") << false << "false" << QByteArray() << false << switchedOff;
    QTest::newRow("switched off for the installation") << true << "" << off << false << switchedOff;
    QTest::newRow("switched off for the installation, no project") << false << "" << off << true << switchedOff;
    // A folder in the page's place: no page, so nothing may be sent.
    QTest::newRow("page cannot be written") << true << "" << QByteArray() << false << "no report written";
}

void TestEndToEnd::orbOpen()
{
    QFETCH(bool, withProject);
    QFETCH(QString, userCollect);
    QFETCH(QByteArray, installFile);
    QFETCH(bool, countdown);
    QFETCH(QString, outcome);
    if (!userCollect.isEmpty()) {
        CrvC_Settings::setValue(CrvC_Settings::CollectDeviceUsage, userCollect == QLatin1String("true"));
        CrvC_Settings::setValue(CrvC_Settings::CorvidTimeStamp, QDateTime::currentDateTime().toString(Qt::ISODate));
    }
    if (!installFile.isEmpty())
        QVERIFY(m_env->writeDataFile(QStringLiteral("reports/corvidsettings"), installFile));
    CrvC_Settings::setValue(CrvC_Settings::DontShowSendProgressDlg, !countdown);
    const QString page = m_project + QLatin1Char('/') + pageName;
    const bool unwritable = outcome == QLatin1String("no report written");
    if (unwritable)
        QVERIFY(QDir().mkpath(page));
    const int uploadsBefore = m_server->uploadFolders().size();

    QElapsedTimer clock;
    clock.start();
    const ToolRun run = orb(withProject);
    QVERIFY2(run.exitCode == 0, qPrintable(run.output));

    if (outcome != QLatin1String("sent")) {
        QVERIFY2(run.output.contains(outcome), qPrintable(run.output));
        QCOMPARE(QFileInfo(page).isFile(), false);
        QCOMPARE(QFileInfo(page).isDir(), unwritable);
        QCOMPARE(requests(), QStringList());
        QCOMPARE(m_server->uploadFolders().size(), uploadsBefore);
        return;
    }
    if (countdown)
        QVERIFY2(clock.elapsed() >= 4500, "the countdown takes five seconds");
    QCOMPARE(m_server->uploadFolders().size(), uploadsBefore + 1);
    const QByteArray built = readFile(page);
    QVERIFY(!built.isEmpty());
    QCOMPARE(m_server->upload(uploadsBefore).file, built);
    QCOMPARE(shownIteration(built), QStringLiteral("1"));
    QCOMPARE(ProjectRepositoryValues::instance().getValue(
                 m_projectFile, QLatin1String(ProjectRepositoryValues::SendIterationKey)),
             QStringLiteral("2"));
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
    const ToolRun run = orb(true, {QLatin1String("FAKE_MAIL_LOG=") + log,
                                   QLatin1String("PATH=") + bin + QLatin1Char(':') + qEnvironmentVariable("PATH")});
    QVERIFY2(run.exitCode == 0, qPrintable(run.output));
    QVERIFY2(waitFor([&] { return QFile::exists(log); }, 10000), qPrintable(run.output));
    const QString request = QString::fromUtf8(readFile(log));
    QVERIFY2(request.startsWith(QLatin1String("thunderbird\n-compose\n")), qPrintable(request));
    QVERIFY2(request.contains(QLatin1String("attachment=file://") + m_project + QLatin1Char('/') + pageName),
             qPrintable(request));
    QCOMPARE(requests(), QStringList());
    QCOMPARE(ProjectRepositoryValues::instance().getValue(
                 m_projectFile, QLatin1String(ProjectRepositoryValues::SendIterationKey)),
             QStringLiteral("2"));
}

void TestEndToEnd::declineSendsNothing()
{
    // In this process, with the real plug-in: Cancel in the countdown opens
    // the review dialog, where the user declines.
    QString error;
    QVERIFY2(OrbProject::openCurrentProject(m_projectFile, &error), qPrintable(error));
    QPluginLoader plugin(Environment::stageDir() + QLatin1String("/lib/orb/plugins/libCorvid.so"));
    QVERIFY2(plugin.instance(), qPrintable(plugin.errorString()));
    const auto editors = Gui::Clip::FileSupervisor::getInstance()->editors(
        Gui::Clip::FileSupervisor::fileEditorCategory());
    QCOMPARE(editors.size(), std::size_t(1));

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
    editors.front()->openFile(Gui::Clip::String::convert(m_project + QLatin1String("/ledctrl_usage.xml")), 0, nullptr);
    QVERIFY(waitFor([&] { return declined; }, 10000));
    // Well past the countdown: nothing may go out late.
    QTest::qWait(6000);
    QVERIFY(QFile::exists(m_project + QLatin1Char('/') + pageName));
    QCOMPARE(requests(), QStringList());
    QCOMPARE(ProjectRepositoryValues::instance().getValue(
                 m_projectFile, QLatin1String(ProjectRepositoryValues::SendIterationKey)),
             QString());
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
