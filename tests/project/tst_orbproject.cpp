#include "common/TestEnvironment.h"

#include "host/AutoRelease.h"
#include "host/InstanceTable.h"
#include "host/ProjectManager.h"
#include "host/String.h"
#include "host/project/OrbProject.h"
#include "host/project/RepositoryAccess.h"
#include "project/ProjectRepositoryValues.h"

#include <QtTest>

using Gui::Clip::String;

// Projects as the host hands them out (current project, project file and
// directory, target family) and orb's project commands.
class TestOrbProject : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void currentProject();
    void refusedProjectKeepsTheCurrentOne();
    void createProject();
    void commandLine_data();
    void commandLine();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
    QString m_work;
    int m_runs = 0;
};

namespace {

GuiI::IProjectManager *projectManager()
{
    CitI::IInterface *service = CitP::InstanceTable::GetInstance(GuiI::IProjectManager::serviceId());
    return service ? static_cast<GuiI::IProjectManager *>(service->GetInterface(GuiI::IProjectManager::iid()))
                   : nullptr;
}

const QByteArray Sample = "<project name='ledctrl'><target family='Xc6' device='xc6a25'/></project>";

} // namespace

void TestOrbProject::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
    m_work = m_env->home() + QLatin1String("/work");
    QVERIFY(QDir().mkpath(m_work));
}

void TestOrbProject::currentProject()
{
    const QString file = m_work + QLatin1String("/sub/../ledctrl.orb");
    QVERIFY(CorvidTest::writeFile(m_work + QLatin1String("/ledctrl.orb"), Sample));
    QVERIFY(QDir().mkpath(m_work + QLatin1String("/sub")));
    QString error;
    QVERIFY2(OrbProject::openCurrentProject(file, &error), qPrintable(error));
    QCOMPARE(OrbProject::currentProjectName(), QStringLiteral("ledctrl"));

    GuiI::IProjectManager *manager = projectManager();
    QVERIFY(manager);
    Prjrep::AutoRelease<CitI::IInterface> project(manager->getCurrentProject());
    QVERIFY(project);
    QCOMPARE(String::convert(manager->getTargetFamily(project.get())), QStringLiteral("Xc6"));
    QCOMPARE(manager->getTargetFamily(nullptr).str(), std::string());

    auto *projectFile = static_cast<Dpm::IProjectFile *>(project->GetInterface(Dpm::IProjectFile::iid()));
    QVERIFY(projectFile);
    QCOMPARE(String::convert(projectFile->getProjectFile()), m_work + QLatin1String("/ledctrl.orb"));
    auto *project2 = static_cast<Dpm::IProject2 *>(projectFile->GetInterface(Dpm::IProject2::iid()));
    QVERIFY(project2);
    Port::StringBase directory;
    project2->getProjectDirectory(directory);
    QCOMPARE(String::convert(directory), m_work);

    // The caller's reference keeps the project usable after it is closed.
    OrbProject::closeCurrentProject();
    QVERIFY(!Prjrep::AutoRelease<CitI::IInterface>(manager->getCurrentProject()));
    QCOMPARE(OrbProject::currentProjectName(), QString());
    QCOMPARE(String::convert(projectFile->getProjectFile()), m_work + QLatin1String("/ledctrl.orb"));
}

void TestOrbProject::refusedProjectKeepsTheCurrentOne()
{
    QVERIFY(CorvidTest::writeFile(m_work + QLatin1String("/ledctrl.orb"), Sample));
    QVERIFY(OrbProject::openCurrentProject(m_work + QLatin1String("/ledctrl.orb")));
    const QString bad = m_work + QLatin1String("/bad.orb");
    QVERIFY(CorvidTest::writeFile(bad, "<project>"));
    QString error;
    QVERIFY(!OrbProject::openCurrentProject(bad, &error));
    QVERIFY2(error.startsWith(bad + QLatin1String(": not a well-formed project file")), qPrintable(error));
    QCOMPARE(OrbProject::currentProjectFile(), m_work + QLatin1String("/ledctrl.orb"));
    OrbProject::closeCurrentProject();
}

void TestOrbProject::createProject()
{
    const QString file = m_work + QLatin1String("/fresh.orb");
    QString error;
    const QDate day = QDate::currentDate();
    QVERIFY2(OrbProject::createProject(file, {QStringLiteral("Xc7"), QStringLiteral("xc7k70"),
                                              QStringLiteral("fbg676"), QStringLiteral("-1")},
                                       &error),
             qPrintable(error));
    // Made today, or yesterday when midnight passed meanwhile.
    const QString age = ProjectRepositoryValues::instance().projectAgeInDays(file);
    QVERIFY2(age == QLatin1String("0")
                 || (age == QLatin1String("1") && QDate::currentDate() != day),
             qPrintable(age));
    const auto creationStamp = [&file] {
        QString stamp;
        RepositoryAccess::read(file, QLatin1String(RepositoryAccess::CreationSection),
                               QLatin1String(RepositoryAccess::CreationSubSection),
                               QLatin1String(RepositoryAccess::CreationKey), &stamp);
        return stamp;
    };
    const QString stamp = creationStamp();
    QVERIFY2(QDateTime::fromString(stamp, Qt::ISODate).isValid(), qPrintable(stamp));

    // A second creation is refused and changes nothing.
    const QByteArray before = CorvidTest::readFile(file);
    QVERIFY(!OrbProject::createProject(file, {}, &error));
    QCOMPARE(error, file + QLatin1String(": already exists"));
    QCOMPARE(CorvidTest::readFile(file), before);

    // Initialising again keeps the creation time.
    QVERIFY(OrbProject::initializeRepository(file, &error));
    QCOMPARE(creationStamp(), stamp);

    QVERIFY(OrbProject::openCurrentProject(file));
    QCOMPARE(OrbProject::currentProjectName(), QStringLiteral("fresh"));
    Prjrep::AutoRelease<CitI::IInterface> project(projectManager()->getCurrentProject());
    QCOMPARE(String::convert(projectManager()->getTargetFamily(project.get())), QStringLiteral("Xc7"));
    OrbProject::closeCurrentProject();
}

void TestOrbProject::commandLine_data()
{
    QTest::addColumn<QStringList>("arguments");
    QTest::addColumn<int>("exitCode");
    QTest::addColumn<QString>("expectedOutput"); // in stdout or stderr
    QTest::addColumn<QStringList>("filesAfter");  // in the work directory

    QTest::newRow("missing project file")
        << QStringList{"--project", "absent.orb", "open", "top_usage.xml"} << 1
        << "orb: absent.orb: no such project file" << QStringList{"broken.orb"};
    QTest::newRow("malformed project file")
        << QStringList{"--project", "broken.orb"} << 1
        << "orb: broken.orb: not a well-formed project file: line 1" << QStringList{"broken.orb"};
    QTest::newRow("new project")
        << QStringList{"new-project", "made.orb", "--family", "Xc6", "--speed", "-2"} << 0
        << "made.orb: project created" << QStringList{"broken.orb", "made.orb", "made.orbrepo"};
    QTest::newRow("new project over a malformed file")
        << QStringList{"new-project", "broken.orb"} << 1
        << "orb: broken.orb: not a well-formed project file" << QStringList{"broken.orb"};
    QTest::newRow("new project over an existing one with target options")
        << QStringList{"new-project", "kept.orb", "--device", "xc6a50"} << 1
        << "kept.orb: exists already" << QStringList{"broken.orb", "kept.orb"};
    QTest::newRow("new project over an existing one")
        << QStringList{"new-project", "kept.orb"} << 0 << "kept.orb: project kept"
        << QStringList{"broken.orb", "kept.orb", "kept.orbrepo"};
    QTest::newRow("target options need new-project")
        << QStringList{"--family", "Xc6", "open", "x_usage.xml"} << 1
        << "only go with new-project" << QStringList{"broken.orb"};
}

void TestOrbProject::commandLine()
{
    QFETCH(QStringList, arguments);
    QFETCH(QString, expectedOutput);
    QFETCH(int, exitCode);
    QFETCH(QStringList, filesAfter);

    const QString dir = m_work + QStringLiteral("/cli-%1").arg(++m_runs);
    QVERIFY(CorvidTest::writeFile(dir + QLatin1String("/broken.orb"), "<project><sources>"));
    if (filesAfter.contains(QLatin1String("kept.orb")))
        QVERIFY(CorvidTest::writeFile(dir + QLatin1String("/kept.orb"), Sample));

    const CorvidTest::ToolRun orb = CorvidTest::runStaged(QStringLiteral("orb"), arguments, dir);
    QVERIFY2(orb.output.contains(expectedOutput), qPrintable(orb.output));
    QCOMPARE(orb.exitCode, exitCode);
    QCOMPARE(QDir(dir).entryList(QDir::Files, QDir::Name), filesAfter);
}

QTEST_GUILESS_MAIN(TestOrbProject)
#include "tst_orbproject.moc"
