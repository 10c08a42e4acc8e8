#include "common/TestEnvironment.h"

#include "host/Factory.h"
#include "host/project/RepositoryAccess.h"
#include "project/ProjectRepositoryValues.h"

#include <QElapsedTimer>
#include <QProcess>
#include <QSqlDatabase>
#include <QtTest>

// The project repository component (libPrjrep_Repository) as Corvid reaches
// it: reads and writes, the file beside the project, a damaged file, and
// several processes writing one repository.
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
    void lockedRepository_data();
    void lockedRepository();

private:
    QString newProject(const QString &name);

    std::unique_ptr<CorvidTest::Environment> m_env;
};

namespace {

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
    QTest::addColumn<bool>("prepared"); // "k" was stored before
    QTest::addColumn<bool>("write");    // else read
    QTest::addColumn<QString>("outcome"); // the value read afterwards; "-": the call failed
    QTest::addColumn<bool>("repositoryExists");

    QTest::newRow("writing creates the repository") << true << false << true << "w" << true;
    QTest::newRow("reading creates nothing") << true << false << false << "-" << false;
    QTest::newRow("reading a stored value") << true << true << false << "v" << true;
    QTest::newRow("no repository without a project file") << false << false << true << "-" << false;
}

void TestRepository::modes()
{
    QFETCH(bool, projectExists);
    QFETCH(bool, prepared);
    QFETCH(bool, write);
    QFETCH(bool, repositoryExists);

    const QString project = newProject(QStringLiteral("modes"));
    if (!projectExists)
        QFile::remove(project);
    if (prepared)
        QVERIFY(RepositoryAccess::write(project, "S", "Sub", "k", "v"));
    QString value;
    const bool done = write ? RepositoryAccess::write(project, "S", "Sub", "k", "w")
                            : RepositoryAccess::read(project, "S", "Sub", "k", &value);
    if (done && write)
        QVERIFY(RepositoryAccess::read(project, "S", "Sub", "k", &value));
    QTEST(done ? value : QStringLiteral("-"), "outcome");
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
    // Two senders counting the same project's sends: every send counts.
    for (int i = 0; i < 2; ++i) {
        writers.emplace_back(new QProcess);
        writers.back()->start(QStringLiteral(REPOTOOL),
                              {QStringLiteral("send"), project, QString::number(times)});
    }
    for (const auto &writer : writers) {
        QVERIFY(writer->waitForFinished(120000));
        QCOMPARE(writer->exitCode(), 0);
    }
    const ProjectRepositoryValues &values = ProjectRepositoryValues::instance();
    QCOMPARE(values.getValue(project, QStringLiteral("first")), QString::number(times));
    QCOMPARE(values.getValue(project, QStringLiteral("second")), QString::number(times));
    QCOMPARE(values.getValue(project, QLatin1String(ProjectRepositoryValues::SendIterationKey)),
             QString::number(1 + 2 * times));
}

void TestRepository::lockedRepository_data()
{
    QTest::addColumn<int>("lockMs");
    QTest::addColumn<bool>("readable");
    QTest::newRow("locked briefly: waited for") << 300 << true;
    QTest::newRow("locked for long: nothing read, nothing written") << 9000 << false;
}

// Another process holds the repository locked while a report is made and
// sent: the reads wait a little, then give up without taking the stored
// values for absent ones.
void TestRepository::lockedRepository()
{
    QFETCH(int, lockMs);
    QFETCH(bool, readable);
    const QString project = newProject(QStringLiteral("locked"));
    const ProjectRepositoryValues &values = ProjectRepositoryValues::instance();
    const QString idKey = QLatin1String(ProjectRepositoryValues::ProjectIdKey);
    const QString counterKey = QLatin1String(ProjectRepositoryValues::SendIterationKey);
    const QString id = QStringLiteral("0123456789abcdef0123456789abcdef");
    values.setValue(project, idKey, id);
    values.setValue(project, counterKey, QStringLiteral("57"));

    QProcess locker;
    locker.start(QStringLiteral(REPOTOOL),
                 {QStringLiteral("lock"), repositoryFile(project), QString::number(lockMs)});
    QVERIFY(locker.waitForReadyRead(10000));
    QElapsedTimer timer;
    timer.start();
    const QString shownId = values.projectIdentifier(project, QStringLiteral("f").repeated(32));
    const QString shownIteration = values.sendIteration(project);
    values.countSend(project, shownIteration);
    QVERIFY2(timer.elapsed() < 8000, qPrintable(QString::number(timer.elapsed())));
    QVERIFY(locker.waitForFinished(20000));

    QCOMPARE(shownId, readable ? id : QString());
    QCOMPARE(shownIteration, readable ? QStringLiteral("57") : QString());
    QCOMPARE(values.getValue(project, idKey), id);
    QCOMPARE(values.getValue(project, counterKey), readable ? QStringLiteral("58") : QStringLiteral("57"));
}

QTEST_GUILESS_MAIN(TestRepository)
#include "tst_repository.moc"
