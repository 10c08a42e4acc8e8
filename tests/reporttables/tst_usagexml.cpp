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

const QString TableHead = QStringLiteral(
    "&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>\n"
    "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=4><B>Device Usage Statistics</B></TD></TR>\n"
    "<TR ALIGN=CENTER BGCOLOR='#FFFF99'><TD><B>Macro Statistics</B></TD><TD><B>Miscellaneous "
    "Statistics</B></TD><TD><B>Net Statistics</B></TD><TD><B>Site Usage</B></TD></TR>"
    "<TR VALIGN=TOP>\n");
const QString EmptyTables = TableHead
    + QStringLiteral("<TD>&nbsp;</TD>\n<TD>&nbsp;</TD><TD>&nbsp;</TD>\n<TD>&nbsp;</TD>\n"
                     "</TR></TABLE>");

QString head(const QString &name)
{
    return QLatin1String("<dtag-group><dtag-group-name name=\"") + name + QLatin1String("\">")
        + name + QLatin1String("</dtag-group-name>\n");
}

QString list(const QStringList &items)
{
    return QLatin1String("<UL>\n<LI>") + items.join(QLatin1String("</LI>\n<LI>"))
        + QLatin1String("</LI>\n</UL>\n");
}

const QString End = QStringLiteral("</dtag-group>\n");
const QString Break = QStringLiteral("</TD><TD>\n");

QString spreadTable(const QString &title, const QString &groups)
{
    return QLatin1String("&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>\n"
                         "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=4><B>")
        + title
        + QLatin1String("</B></TD></TR><TR VALIGN=TOP>\n<dtag-section name=\"ReportConfigData\">\n"
                        "<TD>\n")
        + groups + QLatin1String("</TD>\n</dtag-section>\n</TR></TABLE>");
}

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
        QCOMPARE(tables(data), EmptyTables);
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

    void deviceUsageTable_data()
    {
        QTest::addColumn<QStringList>("designGroups");
        QTest::addColumn<QStringList>("deviceGroups");
        QTest::addColumn<QString>("cells");

        QTest::newRow("every NetStatistics group opens a cell")
            << QStringList({"NetStatisticsA", "netstatisticsB"}) << QStringList({"Sites"})
            << QLatin1String("<dtag-section name=\"DesignStatistics\">\n<TD>\n") + Break
                   + head("NetStatisticsA") + list(items(1)) + End + Break
                   + head("netstatisticsB") + list(items(1)) + End
                   + QLatin1String("</TD>\n</dtag-section>\n<dtag-section name=\"DeviceUsage\">\n"
                                   "<TD>\n")
                   + head("Sites") + list(items(1)) + End + QLatin1String("</TD>\n</dtag-section>\n");
        QTest::newRow("empty name writes no list")
            << QStringList({""}) << QStringList({""})
            << QLatin1String("<dtag-section name=\"DesignStatistics\">\n<TD>\n") + head("") + End
                   + QLatin1String("</TD>\n</dtag-section>\n<dtag-section name=\"DeviceUsage\">\n"
                                   "<TD>\n")
                   + head("") + End + QLatin1String("</TD>\n</dtag-section>\n");
    }

    void deviceUsageTable()
    {
        QFETCH(QStringList, designGroups);
        QFETCH(QStringList, deviceGroups);
        QFETCH(QString, cells);
        CrvC_ReportData data;
        for (const QString &name : designGroups)
            data.designStatistics.insert(name, items(1));
        for (const QString &name : deviceGroups)
            data.deviceUsage.insert(name, items(1));
        QCOMPARE(tables(data), TableHead + QLatin1String("<TD>&nbsp;</TD>\n") + cells
                                   + QLatin1String("</TR></TABLE>"));
    }

    void spreadTables_data()
    {
        QTest::addColumn<QList<int>>("groupSizes"); // groups "g0", "g1", ...
        QTest::addColumn<int>("count");
        QTest::addColumn<QString>("groups");

        QTest::newRow("limit reached across groups")
            << QList<int>({1, 1, 1, 3}) << 8
            << head("g0") + list(items(1)) + End + head("g1") + list(items(1)) + Break + End
                   + head("g2") + list(items(1)) + End + head("g3") + list(items(3)) + Break + End;
        QTest::newRow("limit not reached") << QList<int>({2, 2}) << 20
                                                         << head("g0") + list(items(2)) + End
                                                                + head("g1") + list(items(2)) + End;
    }

    void spreadTables()
    {
        QFETCH(QList<int>, groupSizes);
        QFETCH(int, count);
        QFETCH(QString, groups);
        CrvC_ReportData data;
        for (int i = 0; i < groupSizes.size(); ++i) {
            data.reportConfigData.insert(QStringLiteral("g%1").arg(i), items(groupSizes.at(i)));
            data.reportPinData.insert(QStringLiteral("g%1").arg(i), items(groupSizes.at(i)));
        }
        data.reportConfigData.insert(QString(), items(5)); // no name: left out
        data.reportConfigDataCount = count;
        data.reportPinDataCount = count;
        QCOMPARE(tables(data), EmptyTables + QLatin1Char('\n')
                                   + spreadTable(QStringLiteral("Configuration Data"), groups)
                                   + QLatin1Char('\n')
                                   + spreadTable(QStringLiteral("Pin Data"), groups));
    }

    void onlyPinData()
    {
        CrvC_ReportData data;
        data.reportPinData.insert(QStringLiteral("p"), items(1));
        QCOMPARE(tables(data), EmptyTables + QLatin1Char('\n')
                                   + spreadTable(QStringLiteral("Pin Data"),
                                                 head("p") + list(items(1)) + Break + End));
    }

};

QTEST_GUILESS_MAIN(tst_UsageXml)
#include "tst_usagexml.moc"
