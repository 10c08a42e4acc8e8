// The collection cycle's gating: which open requests start a report (sent at
// once or after the countdown) and which end with nothing built, shown or
// sent. The windows are replaced by recording hooks.

#include "common/TestEnvironment.h"

#include "host/project/OrbProject.h"
#include "plugin/CollectionCycle.h"
#include "project/CorvidSettings.h"

#include <QDateTime>
#include <QDir>
#include <QtTest>

namespace {

struct Start
{
    QString how; // "at once" or "countdown"
    QString projectFile, design, family;
};

} // namespace

class TestCollectionCycle : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void init();
    void cleanupTestCase();
    void gating_data();
    void gating();
    void unreachableFolderEndsTheCycle();
    void reportToolRefusesUnreachableFolder();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
    QString m_projectFile;
    QList<Start> m_starts;
};

void TestCollectionCycle::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
    m_projectFile = m_env->home() + QLatin1String("/proj/blinker.orb");
    QDir().mkpath(QFileInfo(m_projectFile).absolutePath());
    OrbProject::ProjectDocument::Target target;
    target.family = QStringLiteral("Sparta3");
    target.device = QStringLiteral("xs3s200");
    QString error;
    QVERIFY2(OrbProject::createProject(m_projectFile, target, &error), qPrintable(error));

    auto record = [this](const char *how) {
        return [this, how](const QString &projectFile, const QString &design, const QString &family) {
            m_starts << Start{QString::fromLatin1(how), projectFile, design, family};
        };
    };
    CrvC_CollectionCycle::setDialogs({record("at once"), record("countdown")});
}

void TestCollectionCycle::init()
{
    m_starts.clear();
    m_env->clearSettings();
    QFile::remove(m_env->installRoot() + QLatin1String("/data/reports/corvidsettings"));
    OrbProject::closeCurrentProject();
}

void TestCollectionCycle::cleanupTestCase()
{
    CrvC_CollectionCycle::setDialogs({});
}

void TestCollectionCycle::gating_data()
{
    QTest::addColumn<QString>("fileName");
    QTest::addColumn<bool>("withProject");
    QTest::addColumn<QString>("userCollect"); // "" never applied; else "true"/"false" applied now
    QTest::addColumn<QByteArray>("installFile"); // empty: none
    QTest::addColumn<bool>("dontShowProgress");
    QTest::addColumn<QString>("expected"); // "", "at once", "countdown"

    const QByteArray installOff = "collectusagestatistics=false\n";
    const QByteArray installOffLater = "collectusagestatistics=false\ntimestamp=2999-01-01T00:00:00\n";

    QTest::newRow("no project, collection on") << "top_usage.xml" << false << "" << QByteArray() << false << "countdown";
    QTest::newRow("project, collection on") << "top_usage.xml" << true << "" << QByteArray() << false << "countdown";
    QTest::newRow("countdown turned off: sent at once") << "top_usage.xml" << true << "" << QByteArray() << true << "at once";
    QTest::newRow("no project, countdown off") << "top_usage.xml" << false << "" << QByteArray() << true << "at once";
    QTest::newRow("project, user switched off") << "top_usage.xml" << true << "false" << QByteArray() << false << "";
    QTest::newRow("no project, user switched off") << "top_usage.xml" << false << "false" << QByteArray() << false << "";
    QTest::newRow("no project, user off, countdown off") << "top_usage.xml" << false << "false" << QByteArray() << true << "";
    QTest::newRow("project, installation off") << "top_usage.xml" << true << "" << installOff << false << "";
    QTest::newRow("no project, installation off") << "top_usage.xml" << false << "" << installOff << true << "";
    QTest::newRow("user on after installation off") << "top_usage.xml" << true << "true" << installOff << false << "countdown";
    QTest::newRow("installation off after user on") << "top_usage.xml" << false << "true" << installOffLater << false << "";
    QTest::newRow("not an xml file") << "top_usage.xml.bak" << true << "" << QByteArray() << false << "";
    QTest::newRow("suffix case matters") << "top_usage.XML" << false << "" << QByteArray() << true << "";
}

void TestCollectionCycle::gating()
{
    QFETCH(QString, fileName);
    QFETCH(bool, withProject);
    QFETCH(QString, userCollect);
    QFETCH(QByteArray, installFile);
    QFETCH(bool, dontShowProgress);
    QFETCH(QString, expected);

    if (withProject)
        QVERIFY(OrbProject::openCurrentProject(m_projectFile));
    if (!userCollect.isEmpty()) {
        CrvC_Settings::setValue(CrvC_Settings::CollectDeviceUsage, userCollect == QLatin1String("true"));
        CrvC_Settings::setValue(CrvC_Settings::CorvidTimeStamp,
                                QDateTime::currentDateTime().toString(Qt::ISODate));
    }
    if (!installFile.isEmpty())
        QVERIFY(m_env->writeDataFile(QStringLiteral("reports/corvidsettings"), installFile));
    if (dontShowProgress)
        CrvC_Settings::setValue(CrvC_Settings::DontShowSendProgressDlg, true);

    const QString dir = m_env->home() + QLatin1String("/designs");
    QDir().mkpath(dir);
    CrvC_CollectionCycle::openUsageFile(dir + QLatin1Char('/') + fileName, nullptr);

    if (expected.isEmpty()) {
        QCOMPARE(m_starts.size(), 0);
        return;
    }
    QCOMPARE(m_starts.size(), 1);
    const Start &start = m_starts.first();
    QCOMPARE(start.how, expected);
    QCOMPARE(start.design, QStringLiteral("top"));
    QCOMPARE(start.projectFile, withProject ? QFileInfo(m_projectFile).absoluteFilePath() : QString());
    QCOMPARE(start.family, withProject ? QStringLiteral("Sparta3") : QString());
    QCOMPARE(QDir::currentPath(), dir);
}

void TestCollectionCycle::unreachableFolderEndsTheCycle()
{
    // A folder that is gone, and a folder that is a link loop: the current
    // directory stays, and its files must not be taken for the design's.
    const QString before = m_env->home();
    QDir::setCurrent(before);
    const QString loop = m_env->home() + QLatin1String("/loop");
    QVERIFY(QFile::link(loop, loop));
    for (const QString &folder : QStringList{m_env->home() + QLatin1String("/gone"), loop}) {
        CrvC_CollectionCycle::openUsageFile(folder + QLatin1String("/top_usage.xml"), nullptr);
        QCOMPARE(m_starts.size(), 0);
        QCOMPARE(QDir::currentPath(), before);
    }
}

void TestCollectionCycle::reportToolRefusesUnreachableFolder()
{
    const QString work = m_env->home() + QLatin1String("/cwd");
    QVERIFY(CorvidTest::writeFile(work + QLatin1String("/top_usage.xml"), "<usage/>"));
    const CorvidTest::ToolRun tool = CorvidTest::runStaged(
        QStringLiteral("corvid-report"), {m_env->home() + QLatin1String("/gone/top_usage.xml")}, work);
    QCOMPARE(tool.exitCode, 1);
    QVERIFY2(tool.output.contains(QLatin1String("cannot enter the folder")), qPrintable(tool.output));
    QVERIFY(!QFile::exists(work + QLatin1String("/device_usage_statistics.html")));
}

QTEST_GUILESS_MAIN(TestCollectionCycle)
#include "tst_collectioncycle.moc"
