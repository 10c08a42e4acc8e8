#include "common/TestEnvironment.h"

#include "project/CorvidSettings.h"

#include <QDir>
#include <QtTest>

class TestCorvidSettings : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void init();
    void collectionSwitch_data();
    void collectionSwitch();
    void firstRootWins();
    void randomId();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
};

void TestCorvidSettings::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
}

void TestCorvidSettings::init()
{
    m_env->clearSettings();
    QFile::remove(m_env->installRoot() + QLatin1String("/data/reports/corvidsettings"));
}

void TestCorvidSettings::collectionSwitch_data()
{
    QTest::addColumn<QByteArray>("installFile"); // empty: no file at all
    QTest::addColumn<QString>("userCollect");    // empty: never applied
    QTest::addColumn<QString>("userStamp");
    QTest::addColumn<bool>("expected");

    const QString earlier = QStringLiteral("2009-03-17T14:05:09");
    const QString later = QStringLiteral("2010-01-02T08:00:00");

    QTest::newRow("nothing anywhere") << QByteArray() << "" << "" << true;
    QTest::newRow("install off, no stamp, user never applied")
        << QByteArray("collectusagestatistics=false\n") << "" << "" << false;
    QTest::newRow("install off, no stamp, user applied on")
        << QByteArray("collectusagestatistics=false\n") << "true" << later << true;
    QTest::newRow("install off, no stamp, user applied off")
        << QByteArray("collectusagestatistics=false\n") << "false" << later << false;
    QTest::newRow("capital True is off") << QByteArray("collectusagestatistics=True\n") << "" << ""
                                          << false;
    QTest::newRow("value with trailing blank is off")
        << QByteArray("collectusagestatistics=true \n") << "" << "" << false;
    QTest::newRow("equal stamps: install wins")
        << QByteArray("collectusagestatistics=false\ntimestamp=" + earlier.toLatin1() + "\n")
        << "true" << earlier << false;
    QTest::newRow("install newer wins")
        << QByteArray("collectusagestatistics=true\ntimestamp=" + later.toLatin1() + "\n")
        << "false" << earlier << true;
    QTest::newRow("user newer wins")
        << QByteArray("collectusagestatistics=true\ntimestamp=" + earlier.toLatin1() + "\n")
        << "false" << later << false;
    QTest::newRow("extra parts ignored, later line wins")
        << QByteArray("collectusagestatistics=false\ncollectusagestatistics=true=x\n") << "" << ""
        << true;
    QTest::newRow("line without = ignored")
        << QByteArray("collectusagestatistics=false\ncollectusagestatistics\n") << "" << "" << false;
    QTest::newRow("unknown keys and binary junk ignored")
        << QByteArray("colour=blue\n") + QByteArray("\x01\x02\xff=\0zz\n", 8)
               + QByteArray("collectusagestatistics=false\n")
        << ""
        << "" << false;
    QTest::newRow("no user stamp: user value ignored")
        << QByteArray("collectusagestatistics=false\n") << "true" << "" << false;
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
    QFETCH(bool, expected);
    QCOMPARE(CrvC_Settings::isCollectionEnabled(), expected);
}

void TestCorvidSettings::firstRootWins()
{
    QTemporaryDir second;
    QVERIFY(CorvidTest::writeFile(second.path() + QLatin1String("/data/reports/corvidsettings"),
                                  "collectusagestatistics=true\ntimestamp=2001-01-01T00:00:00\n"));
    QVERIFY(m_env->writeDataFile(QStringLiteral("reports/corvidsettings"),
                                 "collectusagestatistics=false\n"));
    const QByteArray saved = qgetenv("VANTOR");
    qputenv("VANTOR", saved + ':' + QFile::encodeName(second.path()));
    QString stamp = QStringLiteral("unchanged");
    bool collect = true;
    CrvC_Settings::readInstallSettings(stamp, collect);
    qputenv("VANTOR", saved);
    QCOMPARE(collect, false);
    QCOMPARE(stamp, QStringLiteral("unchanged"));
}

void TestCorvidSettings::randomId()
{
    const QString first = CrvC_Settings::randomId();
    QVERIFY2(QRegularExpression(QStringLiteral("^[0-9a-f]{32}$")).match(first).hasMatch(),
             qPrintable(first));
    QCOMPARE(CrvC_Settings::randomId(), first);
    CrvC_Settings::setValue(CrvC_Settings::RandomID, QString());
    QVERIFY(CrvC_Settings::randomId() != first);
}

QTEST_GUILESS_MAIN(TestCorvidSettings)
#include "tst_corvidsettings.moc"
