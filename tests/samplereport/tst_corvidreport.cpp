#include "common/TestEnvironment.h"

#include <QtTest>

// corvid-report as administrators run it.
class TestCorvidReport : public QObject
{
    Q_OBJECT
    std::unique_ptr<CorvidTest::Environment> m_env;
    QString m_work;

private Q_SLOTS:
    void initTestCase()
    {
        m_env.reset(new CorvidTest::Environment);
        m_work = m_env->home() + QLatin1String("/work");
        QVERIFY(CorvidTest::writeFile(m_work + QLatin1String("/top_usage.xml"), "<usage/>"));
        QVERIFY(CorvidTest::writeFile(m_work + QLatin1String("/broken.orb"), "<project"));
    }

    void commandLine_data()
    {
        QTest::addColumn<QStringList>("arguments");
        QTest::addColumn<int>("exitCode");
        QTest::addColumn<QString>("expectedOutput");
        QTest::addColumn<QString>("expectedPage"); // a page that must exist afterwards

        const QString page = m_work + QLatin1String("/device_usage_statistics.html");
        QTest::newRow("no usage file") << QStringList{} << 1 << "no usage file given" << QString();
        QTest::newRow("page beside the usage file")
            << QStringList{"top_usage.xml"} << 0 << page << page;
        QTest::newRow("--out into a missing folder")
            << QStringList{"--out", "out/page.html", "top_usage.xml"} << 1 << "cannot write" << QString();
        QTest::newRow("page to --out")
            << QStringList{"--out", "elsewhere.html", "--design", "x", "top_usage.xml"} << 0
            << m_work + "/elsewhere.html" << m_work + "/elsewhere.html";
        QTest::newRow("missing project")
            << QStringList{"--project", "nothere.orb", "top_usage.xml"} << 1 << "nothere.orb" << QString();
        QTest::newRow("malformed project")
            << QStringList{"--project", "broken.orb", "top_usage.xml"} << 1 << "broken.orb" << QString();
        QTest::newRow("option without value") << QStringList{"top_usage.xml", "--design"} << 1
                                              << "--design needs" << QString();
    }

    void commandLine()
    {
        QFETCH(QStringList, arguments);
        QFETCH(int, exitCode);
        QFETCH(QString, expectedOutput);
        QFETCH(QString, expectedPage);
        const CorvidTest::ToolRun tool =
            CorvidTest::runStaged(QStringLiteral("corvid-report"), arguments, m_work);
        QVERIFY2(tool.output.contains(expectedOutput), qPrintable(tool.output));
        QCOMPARE(tool.exitCode, exitCode);
        if (!expectedPage.isEmpty())
            QVERIFY(CorvidTest::readFile(expectedPage).startsWith("<HTML><HEAD>"));
    }
};

QTEST_GUILESS_MAIN(TestCorvidReport)
#include "tst_corvidreport.moc"
