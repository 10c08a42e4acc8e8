#include "common/TestEnvironment.h"

#include "host/project/RepositoryAccess.h"
#include "project/ProjectRepositoryValues.h"

#include <QRegularExpression>
#include <QUuid>
#include <QtTest>

// Corvid's values in the project repository: the project identifier, the
// send counter across reports and sends, and the project's age.
class TestProjectRepositoryValues : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void reportsAndSends_data();
    void reportsAndSends();
    void projectAge_data();
    void projectAge();
    void emptyPathTouchesNothing();

private:
    QString newProject(const QString &name);

    std::unique_ptr<CorvidTest::Environment> m_env;
};

namespace {

const QString IdKey = QLatin1String(ProjectRepositoryValues::ProjectIdKey);
const QString CounterKey = QLatin1String(ProjectRepositoryValues::SendIterationKey);

// What one report shows.
struct Report
{
    QString identifier;
    QString iteration;
};

Report makeReport(const QString &projectFile)
{
    const ProjectRepositoryValues &values = ProjectRepositoryValues::instance();
    return {values.projectIdentifier(projectFile, QUuid::createUuid().toString(QUuid::Id128)), values.sendIteration(projectFile)};
}

} // namespace

void TestProjectRepositoryValues::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
}

QString TestProjectRepositoryValues::newProject(const QString &name)
{
    const QString file = m_env->home() + QLatin1Char('/') + name + QLatin1String(".orb");
    CorvidTest::writeFile(file, "<project/>");
    return file;
}

void TestProjectRepositoryValues::reportsAndSends_data()
{
    QTest::addColumn<bool>("projectExists");
    QTest::addColumn<QString>("storedCounter"); // before the first report; empty: none
    QTest::addColumn<QString>("firstIteration");
    QTest::addColumn<QString>("counterAfterSend"); // stored after the first send
    QTest::addColumn<QString>("secondIteration");
    QTest::addColumn<bool>("sameIdentifier");

    QTest::newRow("new project") << true << QString() << "1" << "2" << "2" << true;
    QTest::newRow("no project file") << false << QString() << "1" << QString() << "1" << false;
    QTest::newRow("counter abc") << true << "abc" << "1" << "abc" << "1" << true;
    QTest::newRow("leading zeros") << true << "007" << "7" << "8" << "8" << true;
    // The counter is 64 bits wide and stops at its maximum instead of wrapping.
    QTest::newRow("one below the cap") << true << "9223372036854775806" << "9223372036854775806"
                                       << "9223372036854775807" << "9223372036854775807" << true;
    QTest::newRow("at the cap") << true << "9223372036854775807" << "9223372036854775807"
                                << "9223372036854775807" << "9223372036854775807" << true;
    QTest::newRow("beyond 64 bits") << true << "9223372036854775808" << "1" << "9223372036854775808"
                                    << "1" << true;
}

void TestProjectRepositoryValues::reportsAndSends()
{
    QFETCH(bool, projectExists);
    QFETCH(QString, storedCounter);
    const QString project = projectExists
                                ? newProject(QStringLiteral("sends-%1").arg(QTest::currentDataTag()))
                                : m_env->home() + QLatin1String("/missing/none.orb");
    const ProjectRepositoryValues &values = ProjectRepositoryValues::instance();
    if (!storedCounter.isEmpty())
        values.setValue(project, CounterKey, storedCounter);

    const Report first = makeReport(project);
    QVERIFY2(QRegularExpression(QStringLiteral("^[0-9a-f]{32}$")).match(first.identifier).hasMatch(),
             qPrintable(first.identifier));
    QTEST(first.iteration, "firstIteration");
    QCOMPARE(values.getValue(project, IdKey), projectExists ? first.identifier : QString());

    values.countSend(project, first.iteration);
    QTEST(values.getValue(project, CounterKey), "counterAfterSend");

    const Report second = makeReport(project);
    QTEST(second.iteration, "secondIteration");
    QTEST(second.identifier == first.identifier, "sameIdentifier");
    QCOMPARE(QFileInfo::exists(QFileInfo(project).absolutePath()), projectExists);
}

void TestProjectRepositoryValues::projectAge_data()
{
    QTest::addColumn<QString>("stamp"); // "-": none stored
    QTest::addColumn<QDate>("today");
    QTest::addColumn<QString>("age");

    const QDate march17(2024, 3, 17);
    QTest::newRow("1 March read on 17 March") << "2024-03-01" << march17 << "16";
    QTest::newRow("date and time with offset") << "2024-03-01T23:59:59+01:00" << march17 << "16";
    QTest::newRow("same day") << "2024-03-17T08:00:00" << march17 << "0";
    QTest::newRow("across a leap day") << "2024-02-28" << QDate(2024, 3, 1) << "2";
    QTest::newRow("in the future") << "2024-03-20" << march17 << "-3";
    QTest::newRow("UNINITIALIZED") << "UNINITIALIZED" << march17 << QString();
    QTest::newRow("thirteenth month") << "2024-13-01" << march17 << QString();
    QTest::newRow("not a date") << "last Tuesday" << march17 << QString();
    QTest::newRow("empty text") << QString() << march17 << QString();
    QTest::newRow("never stamped") << "-" << march17 << QString();
}

void TestProjectRepositoryValues::projectAge()
{
    QFETCH(QString, stamp);
    QFETCH(QDate, today);
    const QString project = newProject(QStringLiteral("age-%1").arg(QTest::currentDataTag()));
    if (stamp != QLatin1String("-"))
        QVERIFY(RepositoryAccess::write(project, QLatin1String(RepositoryAccess::CreationSection),
                                        QLatin1String(RepositoryAccess::CreationSubSection),
                                        QLatin1String(RepositoryAccess::CreationKey), stamp));
    QTEST(ProjectRepositoryValues::instance().projectAgeInDays(project, today), "age");
}

void TestProjectRepositoryValues::emptyPathTouchesNothing()
{
    const QString cwd = m_env->home() + QLatin1String("/cwd");
    QDir().mkpath(cwd);
    const QString previous = QDir::currentPath();
    QDir::setCurrent(cwd);
    const ProjectRepositoryValues &values = ProjectRepositoryValues::instance();
    values.setValue(QString(), IdKey, QStringLiteral("x"));
    values.countSend(QString(), QStringLiteral("1"));
    QCOMPARE(values.getValue(QString(), IdKey), QString());
    QCOMPARE(values.projectAgeInDays(QString()), QString());
    QCOMPARE(values.sendIteration(QString()), QStringLiteral("1"));
    QCOMPARE(QDir(cwd).entryList(QDir::NoDotAndDotDot | QDir::AllEntries), QStringList());
    QDir::setCurrent(previous);
}

QTEST_GUILESS_MAIN(TestProjectRepositoryValues)
#include "tst_projectrepositoryvalues.moc"
