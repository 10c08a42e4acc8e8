#include "common/TestEnvironment.h"

#include "host/AutoRelease.h"
#include "host/Factory.h"
#include "host/Repository.h"
#include "host/String.h"
#include "host/project/RepositoryAccess.h"
#include "project/ProjectRepositoryValues.h"

#include <QProcess>
#include <QSqlDatabase>
#include <QtTest>

using Gui::Clip::String;

// The project repository component (libPrjrep_Repository) as its clients see
// it: open modes and statuses, the file beside the project, and several
// processes using one repository.
class TestRepository : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void modes_data();
    void modes();
    void values();
    void damagedRepository_data();
    void damagedRepository();
    void connectionsAreRemoved();
    void valuesSurviveTheProcess();
    void concurrentWritersLoseNothing();

private:
    QString newProject(const QString &name);

    std::unique_ptr<CorvidTest::Environment> m_env;
};

namespace {

// One open repository object with a section and a sub-section, released in
// order at the end.
class Session
{
public:
    Session() : m_object(CitP::Factory::CreateInstance(Prjrep::IRepository::objectId()))
    {
        m_repository = m_object ? static_cast<Prjrep::IRepository *>(
                                      m_object->GetInterface(Prjrep::IRepository::iid()))
                                : nullptr;
    }
    ~Session()
    {
        if (m_section && m_sub)
            m_section->releaseSubSection(m_sub);
        if (m_repository)
            m_repository->close();
    }

    bool valid() const { return m_repository != nullptr; }

    int openSection(const QString &project, const char *name, int mode)
    {
        CitI::IInterface *object = nullptr;
        const int status = m_repository->openSection(String::convert(project), name, mode, &object);
        m_section = object ? static_cast<Prjrep::IRegSection *>(
                                 object->GetInterface(Prjrep::IRegSection::iid()))
                           : nullptr;
        if ((status == Prjrep::StatusOk) != (m_section != nullptr))
            return -99; // success must come with an object, failure without
        return status;
    }
    int openSub(const char *name, int mode)
    {
        const int status = m_section->openSubSection(name, mode, &m_sub);
        if ((status == Prjrep::StatusOk) != (m_sub != nullptr))
            return -99;
        return status;
    }
    Prjrep::IRegSection *section() const { return m_section; }
    Prjrep::IRegSection *sub() const { return m_sub; }

private:
    Prjrep::AutoRelease<CitI::IInterface> m_object;
    Prjrep::IRepository *m_repository = nullptr;
    Prjrep::IRegSection *m_section = nullptr;
    Prjrep::IRegSection *m_sub = nullptr;
};

QString repositoryFile(const QString &project)
{
    QString name = project;
    name.chop(4); // ".orb"
    return name + QLatin1String(".orbrepo");
}

QByteArray runTool(const QStringList &arguments)
{
    QProcess tool;
    tool.start(QStringLiteral(REPOTOOL), arguments);
    if (!tool.waitForFinished(60000) || tool.exitCode() != 0)
        return "<failed: " + tool.readAllStandardError() + '>';
    return tool.readAllStandardOutput().trimmed();
}

} // namespace

void TestRepository::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
    QVERIFY(CitP::Factory::LoadLibraryFactory("libPrjrep_Repository"));
}

QString TestRepository::newProject(const QString &name)
{
    const QString file = m_env->home() + QLatin1Char('/') + name + QLatin1String(".orb");
    QFile::remove(file);
    QFile::remove(repositoryFile(file));
    CorvidTest::writeFile(file, "<project/>");
    return file;
}

void TestRepository::modes_data()
{
    QTest::addColumn<bool>("projectExists");
    QTest::addColumn<bool>("prepared"); // a value was stored before
    QTest::addColumn<int>("sectionMode");
    QTest::addColumn<int>("subMode");
    QTest::addColumn<int>("sectionStatus");
    QTest::addColumn<int>("subStatus");   // -1: not reached (the section failed)
    QTest::addColumn<int>("writeStatus"); // -1: not reached
    QTest::addColumn<bool>("repositoryExists");

    const int rw = Prjrep::ModeReadWriteCreate, ro = Prjrep::ModeReadOnly;
    QTest::newRow("43 creates the repository") << true << false << rw << rw << 1 << 1 << 1 << true;
    QTest::newRow("1 needs an existing repository") << true << false << ro << ro << 2 << -1 << -1 << false;
    QTest::newRow("project file missing") << false << false << rw << rw << 2 << -1 << -1 << false;
    QTest::newRow("1 on a stored value") << true << true << ro << ro << 1 << 1 << 3 << true;
    QTest::newRow("writable sub-section of a read-only section")
        << true << true << ro << rw << 1 << 3 << -1 << true;
    QTest::newRow("no access at all") << true << false << 0 << 0 << 3 << -1 << -1 << false;
}

void TestRepository::modes()
{
    QFETCH(bool, projectExists);
    QFETCH(bool, prepared);
    QFETCH(int, sectionMode);
    QFETCH(int, subMode);
    QFETCH(int, sectionStatus);
    QFETCH(int, subStatus);
    QFETCH(int, writeStatus);
    QFETCH(bool, repositoryExists);

    const QString project = newProject(QStringLiteral("modes"));
    if (!projectExists)
        QFile::remove(project);
    if (prepared)
        QVERIFY(RepositoryAccess::write(project, "S", "Sub", "k", "v"));

    Session session;
    QVERIFY(session.valid());
    QCOMPARE(session.openSection(project, "S", sectionMode), sectionStatus);
    if (sectionStatus == 1) {
        QCOMPARE(session.openSub("Sub", subMode), subStatus);
        if (session.sub()) {
            QCOMPARE(session.sub()->setValue("k", "w"), writeStatus);
            Port::StringBase value;
            QCOMPARE(session.sub()->getValue("k", value), 1);
            QCOMPARE(value.str(), std::string(writeStatus == 1 ? "w" : "v"));
        }
    }
    QCOMPARE(QFileInfo::exists(repositoryFile(project)), repositoryExists);
}

void TestRepository::values()
{
    const QString project = newProject(QStringLiteral("values"));
    {
        Session session;
        QCOMPARE(session.openSection(project, "Corvid", Prjrep::ModeReadWriteCreate), 1);
        QCOMPARE(session.openSub("DesignDataCollection", Prjrep::ModeReadWriteCreate), 1);
        Prjrep::IRegSection *sub = session.sub();
        QCOMPARE(sub->getName().str(), std::string("DesignDataCollection"));
        QCOMPARE(sub->setValue("text", "Grüße \"quoted\" 'x'; DROP TABLE entries;"), 1);
        QCOMPARE(sub->setValue("empty", ""), 1);
        QCOMPARE(sub->setValue("twice", "first"), 1);
        QCOMPARE(sub->setValue("twice", "second"), 1);
        QCOMPARE(sub->setValue("", "no key"), 0);
    }
    // Values are kept per sub-section and read back in a new session.
    QVERIFY(RepositoryAccess::write(project, "Corvid", "Other", "twice", "elsewhere"));
    Session session;
    QCOMPARE(session.openSection(project, "Corvid", Prjrep::ModeReadOnly), 1);
    QCOMPARE(session.openSub("DesignDataCollection", Prjrep::ModeReadOnly), 1);
    Port::StringBase value;
    QCOMPARE(session.sub()->getValue("text", value), 1);
    QCOMPARE(String::convert(value), QStringLiteral("Grüße \"quoted\" 'x'; DROP TABLE entries;"));
    QCOMPARE(session.sub()->getValue("empty", value), 1);
    QCOMPARE(value.str(), std::string());
    QCOMPARE(session.sub()->getValue("twice", value), 1);
    QCOMPARE(value.str(), std::string("second"));
    QCOMPARE(session.sub()->getValue("never", value), int(Prjrep::StatusNotFound));
    QVERIFY(value.IsEmpty());
}

void TestRepository::damagedRepository_data()
{
    QTest::addColumn<QByteArray>("contents");
    QTest::newRow("not a database") << QByteArray("this is not SQLite at all, just text\n").repeated(100);
    QTest::newRow("truncated header") << QByteArray("SQLite format 3\0", 16);
}

void TestRepository::damagedRepository()
{
    QFETCH(QByteArray, contents);
    const QString project = newProject(QStringLiteral("damaged"));
    QVERIFY(CorvidTest::writeFile(repositoryFile(project), contents));

    const ProjectRepositoryValues &values = ProjectRepositoryValues::instance();
    values.setValue(project, QStringLiteral("k"), QStringLiteral("v"));
    QCOMPARE(values.getValue(project, QStringLiteral("k")), QString());
    QCOMPARE(values.projectAgeInDays(project), QString());
    QString error;
    QVERIFY(!RepositoryAccess::write(project, "S", "Sub", "k", "v", &error));
    QVERIFY2(error.startsWith(project + QLatin1String(": repository S/Sub")), qPrintable(error));
    // The damaged file is left for the user to look at, not replaced.
    QCOMPARE(CorvidTest::readFile(repositoryFile(project)), contents);
}

void TestRepository::connectionsAreRemoved()
{
    const QString project = newProject(QStringLiteral("connections"));
    const ProjectRepositoryValues &values = ProjectRepositoryValues::instance();
    for (int i = 0; i < 3; ++i) {
        values.setValue(project, QStringLiteral("k"), QString::number(i));
        QCOMPARE(values.getValue(project, QStringLiteral("k")), QString::number(i));
    }
    QCOMPARE(QSqlDatabase::connectionNames(), QStringList());
}

void TestRepository::valuesSurviveTheProcess()
{
    const QString project = newProject(QStringLiteral("restart"));
    QCOMPARE(runTool({QStringLiteral("set"), project, QStringLiteral("Corvid-DataCollection-Project-ID"),
                      QStringLiteral("0123456789abcdef0123456789abcdef")}),
             QByteArray());
    QCOMPARE(runTool({QStringLiteral("get"), project, QStringLiteral("Corvid-DataCollection-Project-ID")}),
             QByteArray("0123456789abcdef0123456789abcdef"));

    // A project created by orb carries its creation time: made today (or
    // yesterday, when midnight passed meanwhile).
    const QString created = m_env->home() + QLatin1String("/created/led.orb");
    QDir().mkpath(QFileInfo(created).absolutePath());
    const QDate day = QDate::currentDate();
    QCOMPARE(CorvidTest::runStaged(QStringLiteral("orb"), {QStringLiteral("new-project"), created},
                                   m_env->home())
                 .exitCode,
             0);
    const QByteArray age = runTool({QStringLiteral("age"), created});
    QVERIFY2(age == "0" || (age == "1" && QDate::currentDate() != day), age.constData());
}

void TestRepository::concurrentWritersLoseNothing()
{
    const QString project = newProject(QStringLiteral("concurrent"));
    const int times = 40;
    std::vector<std::unique_ptr<QProcess>> writers;
    for (const char *key : {"first", "second"}) {
        writers.emplace_back(new QProcess);
        writers.back()->start(QStringLiteral(REPOTOOL),
                              {QStringLiteral("increment"), project, QLatin1String(key),
                               QString::number(times)});
    }
    for (const auto &writer : writers) {
        QVERIFY(writer->waitForFinished(120000));
        QCOMPARE(writer->exitCode(), 0);
    }
    const ProjectRepositoryValues &values = ProjectRepositoryValues::instance();
    QCOMPARE(values.getValue(project, QStringLiteral("first")), QString::number(times));
    QCOMPARE(values.getValue(project, QStringLiteral("second")), QString::number(times));
}

QTEST_GUILESS_MAIN(TestRepository)
#include "tst_repository.moc"
