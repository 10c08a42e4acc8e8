#include "common/TestEnvironment.h"
#include "report/UsageXml.h"

#include <QTemporaryDir>
#include <QtTest>

namespace {

// The section tables in a compact form: "Section/group: item|item", one line
// per group, sections in the order of the report, then the two counters.
QString dump(const CrvC_ReportData &data)
{
    QStringList lines;
    const auto add = [&lines](const char *section, const QMap<QString, QStringList> &table) {
        for (auto it = table.cbegin(); it != table.cend(); ++it)
            lines << QLatin1String(section) + QLatin1Char('/') + it.key() + QLatin1String(": ")
                    + it.value().join(QLatin1Char('|'));
    };
    add("design", data.designStatistics);
    add("device", data.deviceUsage);
    add("config", data.reportConfigData);
    add("pin", data.reportPinData);
    lines << QStringLiteral("counts %1 %2")
                 .arg(data.reportConfigDataCount)
                 .arg(data.reportPinDataCount);
    return lines.join(QLatin1Char('\n'));
}

QByteArray doc(const QByteArray &body)
{
    return "<?xml version=\"1.0\"?>\n<DeviceUsageReport>" + body + "</DeviceUsageReport>\n";
}

// A device usage section holding group "g" with `items`, and what it reads as.
QByteArray inGroup(const QByteArray &items)
{
    return doc("<DeviceUsage><group name='g'>" + items + "</group></DeviceUsage>");
}

QString readAs(const QString &items)
{
    return QLatin1String("device/g: ") + items + QLatin1String("\ncounts 0 0");
}

// The cell texts of the device usage table, and of that table when empty.
const QString Heads = QStringLiteral(
    "Device Usage Statistics|Macro Statistics|Miscellaneous Statistics|Net Statistics|Site Usage|");
const QString EmptyTables = Heads + QStringLiteral("||||");

QStringList items(int count)
{
    QStringList result;
    for (int i = 0; i < count; ++i)
        result << QStringLiteral("<dtag-item1>i%1=%1</dtag-item1>").arg(i);
    return result;
}

} // namespace

class tst_UsageXml : public QObject
{
    Q_OBJECT

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
    QTemporaryDir m_dir;

    QString write(const QByteArray &contents)
    {
        const QString path = m_dir.filePath(QStringLiteral("design_usage.xml"));
        CorvidTest::writeFile(path, contents);
        return path;
    }

    static QString tables(const CrvC_ReportData &data)
    {
        QStringList lines;
        CrvC_UsageXml::appendTables(data, lines);
        return lines.join(QLatin1Char('\n'));
    }

private Q_SLOTS:
    void initTestCase() { m_env.reset(new CorvidTest::Environment); }

    void reading_data()
    {
        QTest::addColumn<QByteArray>("xml");
        QTest::addColumn<QString>("tables");

        QTest::newRow("the value attribute wins; other children and text are skipped")
            << inGroup("<item name='n' value='5'><attrib name='used' value='1'/></item>"
                       "<item name='m'>text<Attrib name='a' value='1'/><note name='b' value='2'/></item>")
            << readAs("<dtag-item1>n=5</dtag-item1>|<dtag-item1>m=</dtag-item1>");
        QTest::newRow("the order of the attribs decides the level")
            << inGroup("<item name='a'><attrib name='value' value='7'/><attrib name='b' value='2'/></item>"
                       "<item name='b'><attrib name='x' value='1'/><attrib name='used' value='3'/></item>"
                       "<item name='c'><attrib name='used' value='3'/><attrib name='x' value='1'/></item>")
            << readAs("<dtag-item3>a=7 [b:2]</dtag-item3>|<dtag-item2>b=3</dtag-item2>|"
                      "<dtag-item3>c=3 [x:1]</dtag-item3>");
        QTest::newRow("item without attributes")
            << doc("<DeviceUsage><group><item/></group></DeviceUsage>")
            << "device/: <dtag-item1>=</dtag-item1>\ncounts 0 0";
        QTest::newRow("other case is walked, not taken")
            << doc("<DeviceUsage><Group name='G'><group name='g'><Item name='I'><item name='n' "
                   "value='1'/></Item></group></Group></DeviceUsage>")
            << readAs("<dtag-item1>n=1</dtag-item1>");
        QTest::newRow("section prefix is case-insensitive")
            << doc("<designstatistics_v2><group name='g'><item name='n' value='1'/></group>"
                   "</designstatistics_v2>")
            << "design/g: <dtag-item1>n=1</dtag-item1>\ncounts 0 0";
        QTest::newRow("items before a group go with it; its name is trimmed")
            << doc("<DeviceUsage><item name='a' value='1'/><group name='  g  '><item name='b' "
                   "value='2'/></group></DeviceUsage>")
            << readAs("<dtag-item1>a=1</dtag-item1>|<dtag-item1>b=2</dtag-item1>");
        QTest::newRow("later group of the same name wins")
            << doc("<DeviceUsage><group name='g'><item name='a' value='1'/></group><group name='g'>"
                   "<item name='b' value='2'/></group></DeviceUsage>")
            << readAs("<dtag-item1>b=2</dtag-item1>");
        QTest::newRow("groups outside sections wait for the next stored group")
            << doc("<group name='lost'><item name='a' value='1'/></group><DeviceUsage><group "
                   "name='g'><item name='b' value='2'/></group></DeviceUsage>")
            << readAs("<dtag-item1>a=1</dtag-item1>|<dtag-item1>b=2</dtag-item1>");
        QTest::newRow("section stays current after its element")
            << doc("<DeviceUsage/><group name='g'><item name='a' value='1'/></group>")
            << readAs("<dtag-item1>a=1</dtag-item1>");
        QTest::newRow("the root element is not a section")
            << QByteArray("<DeviceUsage><group name='g'><item name='a' value='1'/></group>"
                          "</DeviceUsage>")
            << "counts 0 0";
        QTest::newRow("nested groups keep their own names and items")
            << doc("<DeviceUsage><group name='outer'><item name='a' value='1'/><group name='inner'>"
                   "<item name='b' value='2'/></group><item name='c' value='3'/></group></DeviceUsage>")
            << "device/inner: <dtag-item1>b=2</dtag-item1>\n"
               "device/outer: <dtag-item1>a=1</dtag-item1>|<dtag-item1>c=3</dtag-item1>\ncounts 0 0";
        QTest::newRow("groups in name order")
            << doc("<DesignStatistics><group name='b'/><group name='B'/><group name='a'/>"
                   "</DesignStatistics>")
            << "design/B: \ndesign/a: \ndesign/b: \ncounts 0 0";
        QTest::newRow("items outside groups counted, and go with the next group")
            << doc("<ReportConfigData><item name='x' value='1'/><group name='g'><item name='a' "
                   "value='1'/></group><item name='y' value='1'/></ReportConfigData><ReportPinData>"
                   "<group name='p'><item name='q' value='1'/><item name='r' value='1'/></group>"
                   "</ReportPinData><DeviceUsage><item name='z' value='1'/></DeviceUsage>")
            << "config/g: <dtag-item1>x=1</dtag-item1>|<dtag-item1>a=1</dtag-item1>\n"
               "pin/p: <dtag-item1>y=1</dtag-item1>|<dtag-item1>q=1</dtag-item1>|"
               "<dtag-item1>r=1</dtag-item1>\ncounts 3 2";
    }

    void reading()
    {
        QFETCH(QByteArray, xml);
        QFETCH(QString, tables);
        CrvC_ReportData data;
        QVERIFY(CrvC_UsageXml::readUsageXml(write(xml), data));
        QCOMPARE(dump(data), tables);
    }

    void badInput_data()
    {
        QTest::addColumn<QByteArray>("xml");

        QTest::newRow("empty") << QByteArray("");
        QTest::newRow("binary") << QByteArray("\x00\xff\xfe\x01<\x02>\x00", 8);
        QTest::newRow("truncated")
            << QByteArray("<r><DeviceUsage><group name='g'><item name='n' value='1'/>");
        QTest::newRow("two roots") << QByteArray("<a/><b/>");
        QTest::newRow("too deeply nested")
            << QByteArray("<DeviceUsage>").repeated(20000) + "<group name='g'><item name='n' value='1'/></group>"
                   + QByteArray("</DeviceUsage>").repeated(20000);
    }

    void badInput()
    {
        QFETCH(QByteArray, xml);
        CrvC_ReportData data;
        QVERIFY(!CrvC_UsageXml::readUsageXml(write(xml), data));
        QCOMPARE(dump(data), QStringLiteral("counts 0 0"));
        QCOMPARE(CorvidTest::cellText(tables(data)), EmptyTables);
    }

    void failedReadKeepsTables()
    {
        // The groups before the error are complete, yet nothing of the
        // broken document is kept.
        CrvC_ReportData data;
        data.deviceUsage.insert(QStringLiteral("old"), items(1));
        QVERIFY(!CrvC_UsageXml::readUsageXml(
            write("<r><ReportConfigData><group name='g'><item name='a' value='1'/></group>"
                  "<group name='h'><item name='b' value='2'/></group><oops></r>"),
            data));
        QCOMPARE(dump(data), QStringLiteral("device/old: <dtag-item1>i0=0</dtag-item1>\ncounts 0 0"));
    }

    void deepButAcceptedNesting()
    {
        // Deep nesting that the parser accepts is walked without recursion.
        CrvC_ReportData data;
        QVERIFY(CrvC_UsageXml::readUsageXml(
            write("<r><DeviceUsage>" + QByteArray("<level>").repeated(900)
                  + "<group name='g'><item name='n' value='1'/></group>"
                  + QByteArray("</level>").repeated(900) + "</DeviceUsage></r>"),
            data));
        QCOMPARE(dump(data), readAs("<dtag-item1>n=1</dtag-item1>"));
    }

    // The tables' cell texts: design and device groups of one item each,
    // and groups "g0", "g1", ... of the given sizes in both spread tables.
    void layout_data()
    {
        QTest::addColumn<QStringList>("designGroups");
        QTest::addColumn<QStringList>("deviceGroups");
        QTest::addColumn<QList<int>>("spreadGroups"); // "g0", "g1", ... in both spread tables
        QTest::addColumn<int>("count");
        QTest::addColumn<QString>("cells");

        QTest::newRow("every NetStatistics group opens a cell")
            << QStringList({"NetStatisticsA", "netstatisticsB"}) << QStringList({"Sites"})
            << QList<int>() << 0
            << Heads + "||NetStatisticsA i0=0|netstatisticsB i0=0|Sites i0=0|";
        QTest::newRow("empty name writes no list")
            << QStringList({""}) << QStringList({""}) << QList<int>() << 0 << Heads + "|||";
        QTest::newRow("spread: limit reached across groups")
            << QStringList() << QStringList() << QList<int>({1, 1, 1, 3}) << 8
            << EmptyTables + "Configuration Data|g0 i0=0 g1 i0=0|g2 i0=0 g3 i0=0 i1=1 i2=2||"
                             "Pin Data|g0 i0=0 g1 i0=0|g2 i0=0 g3 i0=0 i1=1 i2=2||";
        QTest::newRow("spread: limit not reached")
            << QStringList() << QStringList() << QList<int>({2, 2}) << 20
            << EmptyTables + "Configuration Data|g0 i0=0 i1=1 g1 i0=0 i1=1|Pin Data|g0 i0=0 i1=1 g1 i0=0 i1=1|";
    }

    void layout()
    {
        QFETCH(QStringList, designGroups);
        QFETCH(QStringList, deviceGroups);
        QFETCH(QList<int>, spreadGroups);
        QFETCH(int, count);
        CrvC_ReportData data;
        for (const QString &name : designGroups)
            data.designStatistics.insert(name, items(1));
        for (const QString &name : deviceGroups)
            data.deviceUsage.insert(name, items(1));
        for (int i = 0; i < spreadGroups.size(); ++i) {
            data.reportConfigData.insert(QStringLiteral("g%1").arg(i), items(spreadGroups.at(i)));
            data.reportPinData.insert(QStringLiteral("g%1").arg(i), items(spreadGroups.at(i)));
        }
        if (!spreadGroups.isEmpty())
            data.reportConfigData.insert(QString(), items(5)); // no name: left out
        data.reportConfigDataCount = data.reportPinDataCount = count;
        QTEST(CorvidTest::cellText(tables(data)), "cells");
    }

    void pinDataAlone()
    {
        CrvC_ReportData data;
        data.reportPinData.insert(QStringLiteral("p"), items(1));
        QCOMPARE(CorvidTest::cellText(tables(data)), EmptyTables + "Pin Data|p i0=0||");
    }
};

QTEST_GUILESS_MAIN(tst_UsageXml)
#include "tst_usagexml.moc"
