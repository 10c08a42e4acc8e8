#include "common/TestEnvironment.h"

#include "host/Factory.h"
#include "project/ProjectRepositoryValues.h"

#include <QElapsedTimer>
#include <QProcess>
#include <QtTest>

// The project repository component (libPrjrep_Repository) shared with other
// processes: concurrent sends never lose a count, and a repository another
// process keeps locked is neither taken for an empty one nor overwritten.
class TestRepository : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
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

void TestRepository::concurrentWritersLoseNothing()
{
    const QString project = newProject(QStringLiteral("concurrent"));
    const int times = 40;
    std::vector<std::unique_ptr<QProcess>> writers;
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
    // Every send counts, unless its repository stayed busy past the wait (a
    // sanitizer build can be that slow): then it is skipped, never lowered.
    const qlonglong counted =
        values.getValue(project, QLatin1String(ProjectRepositoryValues::SendIterationKey)).toLongLong();
    QVERIFY2(counted > 1 + times && counted <= 1 + 2 * times, qPrintable(QString::number(counted)));
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
