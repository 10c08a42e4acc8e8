// The whole page for the sample project, byte for byte. The clock and the
// new identifiers come through the builder's seams; the random identifier,
// the creation date and the build values are fixed in the test's private
// settings, repository and installation. Then corvid-report, the same page
// made from the command line.

#include "common/TestEnvironment.h"

#include "host/project/OrbProject.h"
#include "host/project/RepositoryAccess.h"
#include "plugin/CollectionCycle.h"
#include "project/CorvidSettings.h"
#include "project/ProjectRepositoryValues.h"
#include "report/HelpViewerData.h"
#include "report/ReportBuilder.h"

#include <QDirIterator>
#include <QtTest>

namespace {

const char goldenPage[] = CORVID_SOURCE_DIR "/tests/samplereport/ledctrl_page.html";

bool copyTree(const QString &from, const QString &to)
{
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

// Every file below `dir`, hidden ones too, with its contents.
QMap<QString, QByteArray> contents(const QString &dir)
{
    QMap<QString, QByteArray> files;
    QDirIterator it(dir, QDir::Files | QDir::Hidden, QDirIterator::Subdirectories);
    while (it.hasNext()) {
        const QString path = it.next();
        files.insert(path, CorvidTest::readFile(path));
    }
    return files;
}

} // namespace

class TestSampleReport : public QObject
{
    Q_OBJECT
    std::unique_ptr<CorvidTest::Environment> m_env;
    QString m_projectFile;
    QString m_work; // corvid-report's working directory

    CrvC_ReportBuilder::Environment seams() const
    {
        CrvC_ReportBuilder::Environment env;
        env.now = [] { return QDateTime(QDate(2026, 3, 17), QTime(14, 5, 9)); };
        env.newIdentifier = [] { return QStringLiteral("9a0be000000000000000000000000002"); };
        return env;
    }

    QString build(CrvC_ReportBuilder &builder) const
    {
        QString projectFile, family;
        CrvC_CollectionCycle::currentProject(projectFile, family);
        builder.createReport(projectFile, QStringLiteral("ledctrl"), family);
        return builder.pageText();
    }

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new CorvidTest::Environment);
        QVERIFY(m_env->writeDataFile(QStringLiteral("orb_version"),
                                     "product=Orb Design Suite\nversion=14.7\n"
                                     "Registration_ID=ORB-EVAL-0000\nconfiguration.xc6=Professional\n"));
        CrvC_Settings::setValue(CrvC_Settings::RandomID, QStringLiteral("5eed0000000000000000000000000001"));

        const QString project = m_env->home() + QLatin1String("/ledctrl");
        QVERIFY(copyTree(CorvidTest::Environment::sourceDir() + QLatin1String("/examples/ledctrl"), project));
        const QString helpFile = CrvC_HelpViewerData::helpFilePath();
        QDir().mkpath(QFileInfo(helpFile).absolutePath());
        QVERIFY(QFile::copy(CorvidTest::Environment::sourceDir()
                                + QLatin1String("/examples/helpviewer/orbhelpviewerdata.xml"),
                            helpFile));

        m_work = m_env->home() + QLatin1String("/work");
        QVERIFY(CorvidTest::writeFile(m_work + QLatin1String("/top_usage.xml"), "<usage/>"));
        QVERIFY(QDir().mkpath(m_work + QLatin1String("/fresh"))
                && QFile::copy(project + QLatin1String("/ledctrl.orb"),
                               m_work + QLatin1String("/fresh/fresh.orb")));

        m_projectFile = project + QLatin1String("/ledctrl.orb");
        QString error;
        QVERIFY2(RepositoryAccess::write(m_projectFile, QLatin1String(RepositoryAccess::CreationSection),
                                         QLatin1String(RepositoryAccess::CreationSubSection),
                                         QLatin1String(RepositoryAccess::CreationKey),
                                         QStringLiteral("2026-03-01T09:30:00"), &error),
                 qPrintable(error));
        QVERIFY2(OrbProject::openCurrentProject(m_projectFile, &error), qPrintable(error));
    }

    void samplePage()
    {
        CrvC_ReportBuilder builder(seams());
        const QByteArray page = build(builder).toUtf8();
        QCOMPARE(CorvidTest::readFile(QFileInfo(m_projectFile).absolutePath()
                                      + QLatin1String("/device_usage_statistics.html")),
                 page);

        if (qEnvironmentVariableIsSet("CORVID_UPDATE_GOLDEN"))
            QVERIFY(CorvidTest::writeFile(QString::fromUtf8(goldenPage), page));
        const QByteArray golden = CorvidTest::readFile(QString::fromUtf8(goldenPage));
        QVERIFY2(!golden.isEmpty(), goldenPage);
        if (page != golden) {
            // Name the first differing line rather than dumping two whole pages.
            const QList<QByteArray> got = page.split('\n');
            const QList<QByteArray> want = golden.split('\n');
            for (int i = 0; i < qMin(got.size(), want.size()); ++i)
                QCOMPARE(QString::fromUtf8(got.at(i)), QString::fromUtf8(want.at(i)));
            QCOMPARE(got.size(), want.size());
        }
    }

    // A second report keeps the project's identifier and shows the send counted
    // after the first.
    void secondReportKeepsIdentifiersAndCountsSends()
    {
        CrvC_ReportBuilder first(seams());
        build(first);
        QCOMPARE(first.projectIteration(), QStringLiteral("1"));
        ProjectRepositoryValues::instance().countSend(m_projectFile, first.projectIteration());

        CrvC_ReportBuilder::Environment other = seams();
        other.newIdentifier = [] { return QStringLiteral("ffffffffffffffffffffffffffffffff"); };
        CrvC_ReportBuilder second(other);
        const QString page = build(second);
        QVERIFY(page.contains(
            QLatin1String("<dtag-property name=\"ProjectID\">9a0be000000000000000000000000002")));
        QVERIFY(page.contains(QLatin1String("<dtag-property name=\"ProjectIteration\">2</dtag-property>")));
    }

    // corvid-report as administrators run it.
    void commandLine_data()
    {
        QTest::addColumn<QStringList>("arguments");
        QTest::addColumn<int>("exitCode");
        QTest::addColumn<QString>("expectedOutput");
        QTest::addColumn<QString>("expectedPage"); // a page that must exist afterwards

        const QString page = m_work + QLatin1String("/device_usage_statistics.html");
        QTest::newRow("page beside the usage file") << QStringList{"top_usage.xml"} << 0 << page << page;
        QTest::newRow("--out into a missing folder")
            << QStringList{"--out", "out/page.html", "top_usage.xml"} << 1 << "cannot write" << QString();
        QTest::newRow("page to --out")
            << QStringList{"--out", "elsewhere.html", "--design", "x", "top_usage.xml"} << 0
            << m_work + "/elsewhere.html" << m_work + "/elsewhere.html";
        QTest::newRow("missing project")
            << QStringList{"--project", "nothere.orb", "top_usage.xml"} << 1 << "nothere.orb" << QString();
        QTest::newRow("project without identifiers, page to --out")
            << QStringList{"--project", "fresh/fresh.orb", "--out", "fresh.html", "top_usage.xml"} << 0
            << m_work + "/fresh.html" << m_work + "/fresh.html";
    }

    void commandLine()
    {
        QFETCH(QStringList, arguments);
        QFETCH(int, exitCode);
        QFETCH(QString, expectedOutput);
        QFETCH(QString, expectedPage);
        // A preview changes nothing but its page, not even a user who has no
        // random identifier yet.
        CrvC_Settings::setValue(CrvC_Settings::RandomID, QString());
        QMap<QString, QByteArray> before = contents(m_env->home());
        const CorvidTest::ToolRun tool =
            CorvidTest::runStaged(QStringLiteral("corvid-report"), arguments, m_work);
        QVERIFY2(tool.output.contains(expectedOutput), qPrintable(tool.output));
        QCOMPARE(tool.exitCode, exitCode);
        if (!expectedPage.isEmpty())
            QVERIFY(CorvidTest::readFile(expectedPage).startsWith("<HTML><HEAD>"));
        QMap<QString, QByteArray> after = contents(m_env->home());
        before.remove(expectedPage);
        after.remove(expectedPage);
        QCOMPARE(after.keys(), before.keys());
        QVERIFY(after == before);
    }
};

QTEST_GUILESS_MAIN(TestSampleReport)
#include "tst_samplereport.moc"
