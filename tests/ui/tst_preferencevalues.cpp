#include "common/TestEnvironment.h"
#include "DialogTestSupport.h"
#include "project/PreferenceValues.h"

#include <QtTest>

// What the preference page stores on apply, and the order of its mail list,
// without widgets.
class TestPreferenceValues : public QObject
{
    Q_OBJECT
private Q_SLOTS:
    void initTestCase() { m_env.reset(new CorvidTest::Environment); }
    void init() { m_env->clearSettings(); }
    void apply_data();
    void apply();
    void applyOutranksInstallation_data();
    void applyOutranksInstallation();
    void mailListOrder_data();
    void mailListOrder();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
};

using CorvidTest::stored;
using Values = CrvC_PreferenceValues::Values;

Q_DECLARE_METATYPE(Values)

namespace {

Values values(bool collect, bool dontShow, bool useSsl, const QString &tool)
{
    Values v;
    v.collect = collect;
    v.dontShowProgress = dontShow;
    v.useSsl = useSsl;
    v.emailTool = tool;
    return v;
}

} // namespace

void TestPreferenceValues::apply_data()
{
    QTest::addColumn<Values>("loaded");
    QTest::addColumn<Values>("shown");
    QTest::addColumn<QVariant>("useSsl"); // invalid: not written
    QTest::addColumn<QVariant>("tool");

    const QVariant none;
    const Values defaults = values(true, false, true, QString());
    QTest::newRow("unchanged") << defaults << defaults << none << none;
    QTest::newRow("collection off") << defaults << values(false, false, true, QString()) << none << none;
    QTest::newRow("countdown off") << defaults << values(true, true, true, QString()) << none << none;
    QTest::newRow("to e-mail") << defaults << values(true, false, false, QString()) << QVariant(false) << none;
    QTest::newRow("program chosen") << defaults << values(true, false, false, "b") << QVariant(false) << QVariant("b");
    QTest::newRow("program gone") << values(true, false, false, "gone") << values(true, false, false, "a")
                                  << none << QVariant("a");
}

void TestPreferenceValues::apply()
{
    QFETCH(Values, loaded);
    QFETCH(Values, shown);
    const QDateTime now(QDate(2026, 3, 17), QTime(14, 5, 9));
    CrvC_PreferenceValues::apply(loaded, shown, now);

    QCOMPARE(stored(CrvC_Settings::CollectDeviceUsage), QVariant(shown.collect));
    QCOMPARE(stored(CrvC_Settings::CorvidTimeStamp), QVariant("2026-03-17T14:05:09"));
    QCOMPARE(stored(CrvC_Settings::DontShowSendProgressDlg), QVariant(shown.dontShowProgress));
    QTEST(stored(CrvC_Settings::UseSSL), "useSsl");
    QTEST(stored(CrvC_Settings::SelectedEmailTool), "tool");

    const Values reread = CrvC_PreferenceValues::load();
    QCOMPARE(reread.collect, shown.collect);
    QCOMPARE(reread.dontShowProgress, shown.dontShowProgress);
}

void TestPreferenceValues::applyOutranksInstallation_data()
{
    QTest::addColumn<QByteArray>("installFile");
    QTest::addColumn<bool>("collectBefore");
    QTest::addColumn<bool>("applied");

    QTest::newRow("installation off, user on") << QByteArray("collectusagestatistics=false\n") << false << true;
    QTest::newRow("installation on, user off")
        << QByteArray("collectusagestatistics=true\ntimestamp=2020-01-01T00:00:00\n") << true << false;
}

void TestPreferenceValues::applyOutranksInstallation()
{
    QFETCH(QByteArray, installFile);
    QFETCH(bool, applied);
    QVERIFY(m_env->writeDataFile(QStringLiteral("reports/corvidsettings"), installFile));
    const Values loaded = CrvC_PreferenceValues::load();
    QTEST(loaded.collect, "collectBefore");

    Values shown = loaded;
    shown.collect = applied;
    CrvC_PreferenceValues::apply(loaded, shown);
    QCOMPARE(CrvC_Settings::isCollectionEnabled(), applied);
    QVERIFY(m_env->writeDataFile(QStringLiteral("reports/corvidsettings"), QByteArray()));
}

void TestPreferenceValues::mailListOrder_data()
{
    QTest::addColumn<QStringList>("tools"); // the preferred one first
    QTest::addColumn<QStringList>("order");

    QTest::newRow("none") << QStringList() << QStringList();
    QTest::newRow("one") << QStringList{"a"} << QStringList{"a"};
    QTest::newRow("preferred last") << QStringList{"def", "a", "b"} << QStringList{"b", "a", "def"};
    QTest::newRow("empty preferred name") << QStringList{"", "a", "b"} << QStringList{"b", "a", ""};
    QTest::newRow("each name once") << QStringList{"a", "b", "a", "b"} << QStringList{"b", "a"};
}

void TestPreferenceValues::mailListOrder()
{
    QFETCH(QStringList, tools);
    QTEST(CrvC_PreferenceValues::mailListOrder(tools), "order");
}

QTEST_GUILESS_MAIN(TestPreferenceValues)
#include "tst_preferencevalues.moc"
