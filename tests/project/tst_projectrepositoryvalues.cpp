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
    std::unique_ptr<CorvidTest::Environment> m_env;
    const ProjectRepositoryValues &values = ProjectRepositoryValues::instance();
    const QString CounterKey = QLatin1String(ProjectRepositoryValues::SendIterationKey);

    QString newProject(const QString &name)
    {
        const QString file = m_env->home() + QLatin1Char('/') + name + QLatin1String(".orb");
        CorvidTest::writeFile(file, "<project/>");
        return file;
    }

    // The identifier and iteration one report shows.
    QStringList report(const QString &project)
    {
        return {values.projectIdentifier(project, QUuid::createUuid().toString(QUuid::Id128)),
                values.sendIteration(project)};
    }

private Q_SLOTS:
    void initTestCase() { m_env.reset(new CorvidTest::Environment); }

    void reportsAndSends_data()
    {
        QTest::addColumn<bool>("projectExists");
        QTest::addColumn<QString>("storedCounter"); // before the first report; empty: none
        QTest::addColumn<QString>("firstIteration");
        QTest::addColumn<QString>("counterAfterSend"); // stored after the first send
        QTest::addColumn<QString>("secondIteration");

        QTest::newRow("new project") << true << QString() << "1" << "2" << "2";
        QTest::newRow("no project file") << false << QString() << "1" << QString() << "1";
        QTest::newRow("counter abc") << true << "abc" << "1" << "abc" << "1";
        QTest::newRow("leading zeros") << true << "007" << "7" << "8" << "8";
        // The counter is 64 bits wide and stops at its maximum instead of wrapping.
        QTest::newRow("one below the cap") << true << "9223372036854775806" << "9223372036854775806"
                                           << "9223372036854775807" << "9223372036854775807";
        QTest::newRow("at the cap") << true << "9223372036854775807" << "9223372036854775807"
                                    << "9223372036854775807" << "9223372036854775807";
        QTest::newRow("beyond 64 bits") << true << "9223372036854775808" << "1"
                                        << "9223372036854775808" << "1";
    }

    void reportsAndSends()
    {
        QFETCH(bool, projectExists);
        QFETCH(QString, storedCounter);
        const QString project = projectExists
                                    ? newProject(QStringLiteral("sends-%1").arg(QTest::currentDataTag()))
                                    : m_env->home() + QLatin1String("/missing/none.orb");
        if (!storedCounter.isEmpty())
            values.setValue(project, CounterKey, storedCounter);

        const QStringList first = report(project);
        QVERIFY2(QRegularExpression(QStringLiteral("^[0-9a-f]{32}$")).match(first[0]).hasMatch(),
                 qPrintable(first[0]));
        QTEST(first[1], "firstIteration");
        QCOMPARE(values.getValue(project, QLatin1String(ProjectRepositoryValues::ProjectIdKey)),
                 projectExists ? first[0] : QString());

        values.countSend(project, first[1]);
        QTEST(values.getValue(project, CounterKey), "counterAfterSend");

        const QStringList second = report(project);
        QTEST(second[1], "secondIteration");
        QCOMPARE(second[0] == first[0], projectExists);
        QCOMPARE(QFileInfo::exists(QFileInfo(project).absolutePath()), projectExists);
    }

    void projectAge_data()
    {
        QTest::addColumn<QString>("stamp"); // "-": none stored
        QTest::addColumn<QDate>("today");
        QTest::addColumn<QString>("age");

        const QDate march17(2024, 3, 17);
        QTest::newRow("1 March read on 17 March") << "2024-03-01" << march17 << "16";
        QTest::newRow("date and time with offset") << "2024-03-01T23:59:59+01:00" << march17 << "16";
        QTest::newRow("across a leap day") << "2024-02-28" << QDate(2024, 3, 1) << "2";
        QTest::newRow("in the future") << "2024-03-20" << march17 << "-3";
        QTest::newRow("UNINITIALIZED") << "UNINITIALIZED" << march17 << QString();
        QTest::newRow("thirteenth month") << "2024-13-01" << march17 << QString();
        QTest::newRow("never stamped") << "-" << march17 << QString();
    }

    void projectAge()
    {
        QFETCH(QString, stamp);
        QFETCH(QDate, today);
        const QString project = newProject(QStringLiteral("age-%1").arg(QTest::currentDataTag()));
        if (stamp != QLatin1String("-"))
            QVERIFY(RepositoryAccess::write(project, QLatin1String(RepositoryAccess::CreationSection),
                                            QLatin1String(RepositoryAccess::CreationSubSection),
                                            QLatin1String(RepositoryAccess::CreationKey), stamp));
        QTEST(values.projectAgeInDays(project, today), "age");
    }

    // Without a project nothing is written, not even in the working directory.
    void emptyPathTouchesNothing()
    {
        const QString cwd = m_env->home() + QLatin1String("/cwd");
        QDir().mkpath(cwd);
        const QString previous = QDir::currentPath();
        QDir::setCurrent(cwd);
        values.setValue(QString(), CounterKey, QStringLiteral("5"));
        values.countSend(QString(), QStringLiteral("1"));
        QCOMPARE(values.getValue(QString(), CounterKey), QString());
        QCOMPARE(values.sendIteration(QString()), QStringLiteral("1"));
        QCOMPARE(QDir(cwd).entryList(QDir::NoDotAndDotDot | QDir::AllEntries), QStringList());
        QDir::setCurrent(previous);
    }
};

QTEST_GUILESS_MAIN(TestProjectRepositoryValues)
#include "tst_projectrepositoryvalues.moc"
