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
// it: the open modes they use and their statuses, the file beside the
// project, and several processes writing one repository.
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
    void concurrentWritersLoseNothing();

private:
    QString newProject(const QString &name);

    std::unique_ptr<CorvidTest::Environment> m_env;
};

namespace {

// One open repository object with a section and a sub-section, released in
// order at the end. A status of success must come with an object, a failure
// without one (-99 otherwise).
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
        return (status == Prjrep::StatusOk) == (m_section != nullptr) ? status : -99;
    }
    int openSub(const char *name, int mode)
    {
        const int status = m_section->openSubSection(name, mode, &m_sub);
        return (status == Prjrep::StatusOk) == (m_sub != nullptr) ? status : -99;
    }
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
    QTest::addColumn<int>("mode");      // of the section and the sub-section
    QTest::addColumn<QString>("statuses"); // section, sub-section, write; until the first failure
    QTest::addColumn<bool>("repositoryExists");

    const int rw = Prjrep::ModeReadWriteCreate, ro = Prjrep::ModeReadOnly;
    QTest::newRow("43 creates the repository") << true << false << rw << "1 1 1" << true;
    QTest::newRow("1 needs an existing repository") << true << false << ro << "2" << false;
    QTest::newRow("project file missing") << false << false << rw << "2" << false;
    QTest::newRow("1 on a stored value") << true << true << ro << "1 1 3" << true;
}

void TestRepository::modes()
{
    QFETCH(bool, projectExists);
    QFETCH(bool, prepared);
    QFETCH(int, mode);
    QFETCH(bool, repositoryExists);

    const QString project = newProject(QStringLiteral("modes"));
    if (!projectExists)
        QFile::remove(project);
    if (prepared)
        QVERIFY(RepositoryAccess::write(project, "S", "Sub", "k", "v"));

    Session session;
    QVERIFY(session.valid());
    QStringList statuses{QString::number(session.openSection(project, "S", mode))};
    if (statuses.last() == QLatin1String("1"))
        statuses << QString::number(session.openSub("Sub", mode));
    if (session.sub()) {
        statuses << QString::number(session.sub()->setValue("k", "w"));
        Port::StringBase value;
        QCOMPARE(session.sub()->getValue("k", value), 1);
        QCOMPARE(value.str(), std::string(statuses.last() == QLatin1String("1") ? "w" : "v"));
    }
    QTEST(statuses.join(QLatin1Char(' ')), "statuses");
    QCOMPARE(QFileInfo::exists(repositoryFile(project)), repositoryExists);
}

void TestRepository::values()
{
    const QString project = newProject(QStringLiteral("values"));
    const QString tricky = QStringLiteral("Grüße \"quoted\" 'x'; DROP TABLE entries;");
    const auto write = [&](const char *sub, const char *key, const QString &value) {
        return RepositoryAccess::write(project, "Corvid", QLatin1String(sub), QLatin1String(key), value);
    };
    QVERIFY(write("DesignDataCollection", "text", tricky));
    QVERIFY(write("DesignDataCollection", "empty", QString()));
    QVERIFY(write("DesignDataCollection", "twice", "first"));
    QVERIFY(write("DesignDataCollection", "twice", "second"));
    QVERIFY(!write("DesignDataCollection", "", "no key"));
    QVERIFY(write("Other", "twice", "elsewhere")); // values are kept per sub-section

    const auto read = [&](const char *key) {
        QString value = QStringLiteral("stale");
        const bool found = RepositoryAccess::read(project, "Corvid", "DesignDataCollection",
                                                  QLatin1String(key), &value);
        return found ? value : QStringLiteral("<none: %1>").arg(value);
    };
    QCOMPARE(read("text"), tricky);
    QCOMPARE(read("empty"), QString());
    QCOMPARE(read("twice"), QStringLiteral("second"));
    QCOMPARE(read("never"), QStringLiteral("<none: >"));
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
