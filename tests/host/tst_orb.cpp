#include "common/TestEnvironment.h"

#include <QtTest>

// orb as users run it: the real binary with the real plug-in directory.
class TestOrb : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void commandLine_data();
    void commandLine();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
    QString m_work;
};

void TestOrb::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
    m_work = m_env->home() + QLatin1String("/work");
    QVERIFY(CorvidTest::writeFile(m_work + QLatin1String("/top_usage.xml"), "<usage/>"));
    QVERIFY(CorvidTest::writeFile(m_work + QLatin1String("/notes.txt"), "x"));
    QVERIFY(CorvidTest::writeFile(m_work + QLatin1String("/top_usage.XML"), "<usage/>"));
    // Nothing here may be sent: collection is off for the whole installation.
    QVERIFY(m_env->writeDataFile(QStringLiteral("reports/corvidsettings"), "collectusagestatistics=false\n"));
}

void TestOrb::commandLine_data()
{
    QTest::addColumn<QStringList>("arguments");
    QTest::addColumn<int>("exitCode");
    QTest::addColumn<QString>("expectedOutput"); // in stdout or stderr

    QTest::newRow("unclaimed file") << QStringList{"open", "notes.txt"} << 1
                                    << "no editor can open notes.txt";
    QTest::newRow("suffix case matters") << QStringList{"open", "top_usage.XML"} << 1 << "no editor can open";
    QTest::newRow("usage file reaches the plug-in; collection off: nothing built")
        << QStringList{"open", "top_usage.xml"} << 0
        << "Corvid: open " + m_work + "/top_usage.xml (design \"top\")\nCorvid: collection is switched off";
    // The open context names the design as "<project>|<design>".
    QTest::newRow("design from the open context")
        << QStringList{"open", "top_usage.xml", "--design", "blinker"} << 0 << "(design \"blinker\")";
    QTest::newRow("empty parts of the context dropped")
        << QStringList{"open", "top_usage.xml", "--design", "|des"} << 0 << "(design \"des\")";
    QTest::newRow("folder that is gone")
        << QStringList{"open", m_work + "/gone/top_usage.xml"} << 0 << "Corvid: cannot enter the folder";
}

void TestOrb::commandLine()
{
    QFETCH(QStringList, arguments);
    QFETCH(QString, expectedOutput);
    QFETCH(int, exitCode);
    // Should anything still try to send, it finds no server.
    const CorvidTest::ToolRun orb = CorvidTest::runStaged(
        QStringLiteral("orb"), arguments, m_work,
        {QStringLiteral("ORB_DEBUG=1"), QStringLiteral("CORVID_SERVER=https://127.0.0.1:9")});
    QVERIFY2(orb.output.contains(expectedOutput), qPrintable(orb.output));
    QCOMPARE(orb.exitCode, exitCode);
    QVERIFY(!QFile::exists(m_work + QLatin1String("/device_usage_statistics.html")));
}

QTEST_GUILESS_MAIN(TestOrb)
#include "tst_orb.moc"
