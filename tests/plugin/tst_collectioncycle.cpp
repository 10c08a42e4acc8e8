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

class TestCollectionCycle : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase();
    void init();
    void cleanupTestCase() { CrvC_CollectionCycle::setDialogs({}); }
    void gating_data();
    void gating();
    void designName_data();
    void designName();
    void unreachableFolderEndsTheCycle();

private:
    struct Start
    {
        QString how; // "at once" or "countdown"
        QString projectFile, design, family;
    };
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

void TestCollectionCycle::gating_data()
{
    QTest::addColumn<QString>("fileName");
    QTest::addColumn<bool>("withProject");
    QTest::addColumn<QString>("switchedOff"); // "", "by the user", "for the installation"
    QTest::addColumn<bool>("dontShowProgress");
    QTest::addColumn<QString>("expected"); // "", "at once", "countdown"

    const QString user = QStringLiteral("by the user");
    const QString install = QStringLiteral("for the installation");
    QTest::newRow("no project, collection on") << "top_usage.xml" << false << "" << false << "countdown";
    QTest::newRow("project, collection on") << "top_usage.xml" << true << "" << false << "countdown";
    QTest::newRow("countdown turned off: sent at once") << "top_usage.xml" << true << "" << true << "at once";
    QTest::newRow("project, user switched off") << "top_usage.xml" << true << user << false << "";
    QTest::newRow("no project, user switched off") << "top_usage.xml" << false << user << true << "";
    QTest::newRow("project, installation off") << "top_usage.xml" << true << install << false << "";
    QTest::newRow("no project, installation off") << "top_usage.xml" << false << install << true << "";
    QTest::newRow("not an xml file") << "top_usage.xml.bak" << true << "" << false << "";
    QTest::newRow("suffix case matters") << "top_usage.XML" << false << "" << true << "";
}

void TestCollectionCycle::gating()
{
    QFETCH(QString, fileName);
    QFETCH(bool, withProject);
    QFETCH(QString, switchedOff);
    QFETCH(QString, expected);

    if (withProject)
        QVERIFY(OrbProject::openCurrentProject(m_projectFile));
    if (switchedOff == QLatin1String("by the user")) {
        CrvC_Settings::setValue(CrvC_Settings::CollectDeviceUsage, false);
        CrvC_Settings::setValue(CrvC_Settings::CorvidTimeStamp,
                                QDateTime::currentDateTime().toString(Qt::ISODate));
    } else if (!switchedOff.isEmpty()) {
        QVERIFY(
            m_env->writeDataFile(QStringLiteral("reports/corvidsettings"), "collectusagestatistics=false\n"));
    }
    QFETCH(bool, dontShowProgress);
    CrvC_Settings::setValue(CrvC_Settings::DontShowSendProgressDlg, dontShowProgress);

    const QString dir = m_env->home() + QLatin1String("/designs");
    QDir().mkpath(dir);
    CrvC_CollectionCycle::openUsageFile(dir + QLatin1Char('/') + fileName, nullptr);

    QCOMPARE(m_starts.size(), expected.isEmpty() ? 0 : 1);
    if (expected.isEmpty())
        return;
    const Start &start = m_starts.first();
    QCOMPARE(start.how, expected);
    QCOMPARE(start.design, QStringLiteral("top"));
    QCOMPARE(start.projectFile, withProject ? QFileInfo(m_projectFile).absoluteFilePath() : QString());
    QCOMPARE(start.family, withProject ? QStringLiteral("Sparta3") : QString());
    QCOMPARE(QDir::currentPath(), dir);
}

void TestCollectionCycle::designName_data()
{
    // Without an open context; the context's design text is read in orb's tests.
    QTest::addColumn<QString>("fileName");
    QTest::addColumn<QString>("expected");
    QTest::newRow("cut at the last underscore") << "my_top_usage.xml"
                                                << "my_top";
    QTest::newRow("no underscore") << "usage.xml"
                                   << "usage";
}

void TestCollectionCycle::designName()
{
    QFETCH(QString, fileName);
    QTEST(CrvC_CollectionCycle::designName(m_env->home() + QLatin1Char('/') + fileName, nullptr), "expected");
}

void TestCollectionCycle::unreachableFolderEndsTheCycle()
{
    // A folder that is gone, and a folder that is a link loop: the current
    // directory stays, and its files must not be taken for the design's.
    const QString before = m_env->home();
    QVERIFY(CorvidTest::writeFile(before + QLatin1String("/top_usage.xml"), "<usage/>"));
    const QString loop = before + QLatin1String("/loop");
    QVERIFY(QFile::link(loop, loop));
    for (const QString &folder : QStringList{before + QLatin1String("/gone"), loop}) {
        const QString usageFile = folder + QLatin1String("/top_usage.xml");
        QDir::setCurrent(before);
        CrvC_CollectionCycle::openUsageFile(usageFile, nullptr);
        QCOMPARE(m_starts.size(), 0);
        QCOMPARE(QDir::currentPath(), before);
        // The report tool run on its own refuses it the same way.
        const CorvidTest::ToolRun tool =
            CorvidTest::runStaged(QStringLiteral("corvid-report"), {usageFile}, before);
        QCOMPARE(tool.exitCode, 1);
        QVERIFY2(tool.output.contains(QLatin1String("cannot enter the folder")), qPrintable(tool.output));
        QVERIFY(!QFile::exists(before + QLatin1String("/device_usage_statistics.html")));
    }
}

QTEST_GUILESS_MAIN(TestCollectionCycle)
#include "tst_collectioncycle.moc"
