#include "common/TestEnvironment.h"

#include "project/CorvidSettings.h"

#include <QDir>
#include <QtTest>

class TestCorvidSettings : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase() { m_env.reset(new CorvidTest::Environment); }
    void init();
    void collectionSwitch_data();
    void collectionSwitch();
    void firstRootWins();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
};

void TestCorvidSettings::init()
{
    m_env->clearSettings();
    QFile::remove(m_env->installRoot() + QLatin1String("/data/reports/corvidsettings"));
}

void TestCorvidSettings::collectionSwitch_data()
{
    // What the plug-in's own preference tests do not reach: the file's syntax and the stamps' order.
    QTest::addColumn<QByteArray>("installFile"); // empty: no file at all
    QTest::addColumn<QString>("userCollect");    // empty: never applied
    QTest::addColumn<QString>("userStamp");
    QTest::addColumn<bool>("expected");

    const QString earlier = QStringLiteral("2009-03-17T14:05:09");
    const QString later = QStringLiteral("2010-01-02T08:00:00");
    const auto install = [](const char *collect, const QString &stamp = QString()) {
        QByteArray file = QByteArray("collectusagestatistics=") + collect + '\n';
        if (!stamp.isEmpty())
            file += "timestamp=" + stamp.toLatin1() + '\n';
        return file;
    };

    QTest::newRow("no user stamp: user value ignored") << install("false") << "true"
                                                       << "" << false;
    QTest::newRow("capital True is off") << install("True") << ""
                                         << "" << false;
    QTest::newRow("value with trailing blank is off") << install("true ") << ""
                                                      << "" << false;
    QTest::newRow("equal stamps: install wins") << install("false", earlier) << "true" << earlier << false;
    QTest::newRow("install newer wins") << install("true", later) << "false" << earlier << true;
    QTest::newRow("extra parts ignored, later line wins")
        << install("false") + "collectusagestatistics=true=x\n"
        << ""
        << "" << true;
    QTest::newRow("blanks round the key and =: off")
        << QByteArray(" collectusagestatistics\t= false\n") << "true"
        << "" << false;
    QTest::newRow("blank before the value of true: off") << install(" true") << ""
                                                         << "" << false;
    QTest::newRow("key in capitals, spaced stamp: install newer wins")
        << QByteArray("CollectUsageStatistics=false\nTimeStamp = " + later.toLatin1() + " \n") << "true"
        << earlier << false;
    QTest::newRow("line without = ignored") << install("false") + "collectusagestatistics\n"
                                            << ""
                                            << "" << false;
    QTest::newRow("unknown keys and binary junk ignored")
        << QByteArray("colour=blue\n") + QByteArray("\x01\x02\xff=\0zz\n", 8) + install("false") << ""
        << "" << false;
}

void TestCorvidSettings::collectionSwitch()
{
    QFETCH(QByteArray, installFile);
    QFETCH(QString, userCollect);
    QFETCH(QString, userStamp);
    if (!installFile.isEmpty())
        QVERIFY(m_env->writeDataFile(QStringLiteral("reports/corvidsettings"), installFile));
    if (!userCollect.isEmpty())
        CrvC_Settings::setValue(CrvC_Settings::CollectDeviceUsage, userCollect == QLatin1String("true"));
    if (!userStamp.isEmpty())
        CrvC_Settings::setValue(CrvC_Settings::CorvidTimeStamp, userStamp);
    QTEST(CrvC_Settings::isCollectionEnabled(), "expected");
}

void TestCorvidSettings::firstRootWins()
{
    // Only the first installation root counts, even when it has no stamp.
    QTemporaryDir second;
    QVERIFY(CorvidTest::writeFile(second.path() + QLatin1String("/data/reports/corvidsettings"),
                                  "collectusagestatistics=true\ntimestamp=2001-01-01T00:00:00\n"));
    QVERIFY(m_env->writeDataFile(QStringLiteral("reports/corvidsettings"), "collectusagestatistics=false\n"));
    const QByteArray saved = qgetenv("VANTOR");
    qputenv("VANTOR", saved + ':' + QFile::encodeName(second.path()));
    QString stamp = QStringLiteral("unchanged");
    bool collect = true;
    CrvC_Settings::readInstallSettings(stamp, collect);
    qputenv("VANTOR", saved);
    QCOMPARE(collect, false);
    QCOMPARE(stamp, QStringLiteral("unchanged"));
}

QTEST_GUILESS_MAIN(TestCorvidSettings)
#include "tst_corvidsettings.moc"
