#include "common/TestEnvironment.h"

#include "host/project/OrbProject.h"
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
    CorvidTest::Environment m_env;
    const ProjectRepositoryValues &values = ProjectRepositoryValues::instance();

    // A stored value, read without creating a repository.
    static QString stored(const QString &project, const char *key)
    {
        QString value;
        RepositoryAccess::read(project, QStringLiteral("Corvid"), QStringLiteral("DesignDataCollection"),
                               QLatin1String(key), &value);
        return value;
    }

    // The identifier and iteration one report shows.
    QStringList report(const QString &project)
    {
        return {values.projectIdentifier(project, QUuid::createUuid().toString(QUuid::Id128)),
                values.sendIteration(project)};
    }

private Q_SLOTS:
    void reportsAndSends_data()
    {
        QTest::addColumn<QString>("project");       // "new", "damaged" repository, "missing" file
        QTest::addColumn<QString>("storedCounter"); // before the first report; empty: none
        QTest::addColumn<QString>("firstIteration");
        QTest::addColumn<QString>("counterAfterSend"); // stored after the first send
        QTest::addColumn<QString>("secondIteration");

        QTest::newRow("new project") << "new" << QString() << "1"
                                     << "2"
                                     << "2";
        QTest::newRow("no project file") << "missing" << QString() << "1" << QString() << "1";
        // Unreadable is not empty: the page shows no values, nothing is stored.
        QTest::newRow("damaged repository") << "damaged" << QString() << QString() << QString() << QString();
        QTest::newRow("counter abc") << "new"
                                     << "abc"
                                     << "1"
                                     << "abc"
                                     << "1";
        QTest::newRow("leading zeros") << "new"
                                       << "007"
                                       << "7"
                                       << "8"
                                       << "8";
        // The counter is 64 bits wide and stops at its maximum instead of wrapping.
        QTest::newRow("one below the cap") << "new"
                                           << "9223372036854775806"
                                           << "9223372036854775806"
                                           << "9223372036854775807"
                                           << "9223372036854775807";
        QTest::newRow("at the cap") << "new"
                                    << "9223372036854775807"
                                    << "9223372036854775807"
                                    << "9223372036854775807"
                                    << "9223372036854775807";
        QTest::newRow("beyond 64 bits") << "new"
                                        << "9223372036854775808"
                                        << "1"
                                        << "9223372036854775808"
                                        << "1";
    }

    void reportsAndSends()
    {
        QFETCH(QString, project);
        QFETCH(QString, storedCounter);
        const QString name = QLatin1String("sends-") + QLatin1String(QTest::currentDataTag());
        const QString dir = m_env.path(name);
        QVERIFY(QDir().mkpath(dir));
        const bool exists = project == QLatin1String("new") || project == QLatin1String("damaged");
        const QString file = exists ? m_env.write(name + QLatin1String("/p.orb"), "<project/>")
                                    : dir + QLatin1String("/p.orb");
        const QByteArray damage = QByteArray("this is not SQLite at all, just text\n").repeated(100);
        if (project == QLatin1String("damaged"))
            m_env.write(name + QLatin1String("/p.orbrepo"), damage);
        if (!storedCounter.isEmpty())
            values.setValue(file, QLatin1String(ProjectRepositoryValues::SendIterationKey), storedCounter);

        const bool kept = project == QLatin1String("new");
        const QStringList first = report(file);
        const bool unreadable = project == QLatin1String("damaged");
        QVERIFY2(unreadable ? first[0].isEmpty()
                            : QRegularExpression(QStringLiteral("^[0-9a-f]{32}$")).match(first[0]).hasMatch(),
                 qPrintable(first[0]));
        QTEST(first[1], "firstIteration");
        QCOMPARE(stored(file, ProjectRepositoryValues::ProjectIdKey), kept ? first[0] : QString());
        values.countSend(file, first[1]);
        QTEST(stored(file, ProjectRepositoryValues::SendIterationKey), "counterAfterSend");
        const QStringList second = report(file);
        QTEST(second[1], "secondIteration");
        QCOMPARE(second[0] == first[0], kept || unreadable);

        QCOMPARE(QDir(dir).entryList(QDir::NoDotAndDotDot | QDir::AllEntries),
                 exists ? QStringList({"p.orb", "p.orbrepo"}) : QStringList());
        // A damaged repository is left for the user to look at, not replaced.
        if (project == QLatin1String("damaged"))
            QCOMPARE(CorvidTest::readFile(dir + QLatin1String("/p.orbrepo")), damage);
    }

    void projectAge_data()
    {
        QTest::addColumn<QString>("stamp"); // "created": made by orb today
        QTest::addColumn<QDate>("today");
        QTest::addColumn<QString>("age");

        const QDate march17(2024, 3, 17);
        QTest::newRow("1 March read on 17 March") << "2024-03-01" << march17 << "16";
        QTest::newRow("date and time with offset") << "2024-03-01T23:59:59+01:00" << march17 << "16";
        QTest::newRow("in the future") << "2024-03-20" << march17 << "-3";
        QTest::newRow("thirteenth month") << "2024-13-01" << march17 << QString();
        QTest::newRow("created by orb") << "created" << QDate::currentDate() << "0";
    }

    void projectAge()
    {
        QFETCH(QString, stamp);
        QFETCH(QDate, today);
        const QString project = m_env.path(QStringLiteral("age-%1.orb").arg(QTest::currentDataTag()));
        if (stamp == QLatin1String("created")) {
            QString error;
            QVERIFY2(OrbProject::createProject(project, {}, &error), qPrintable(error));
            if (QDate::currentDate() != today)
                QSKIP("midnight passed");
        } else {
            CorvidTest::writeFile(project, "<project/>");
            QVERIFY(RepositoryAccess::write(project, QLatin1String(RepositoryAccess::CreationSection),
                                            QLatin1String(RepositoryAccess::CreationSubSection),
                                            QLatin1String(RepositoryAccess::CreationKey), stamp));
        }
        QTEST(values.projectAgeInDays(project, today), "age");
    }
};

QTEST_GUILESS_MAIN(TestProjectRepositoryValues)
#include "tst_projectrepositoryvalues.moc"
