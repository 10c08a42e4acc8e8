// The readers of the design tools' reports and of the help viewer's file.
// The sample page shows each of them on a sound input with its mark-up; here
// the rules it does not reach and inputs that are broken, deep or odd, as
// the values read or the section's cell texts.

#include "common/TestEnvironment.h"

#include "host/Factory.h"
#include "host/QualityData.h"
#include "host/RefObject.h"
#include "report/CommandLog.h"
#include "report/CoresStatistics.h"
#include "report/HelpViewerData.h"
#include "report/RunStatistics.h"
#include "report/SynthesisReport.h"
#include "report/UsageXml.h"
#include "report/XmlDepthGuard.h"

#include <QtCore5Compat/QXmlDefaultHandler>

#include <QRandomGenerator>
#include <QRegularExpression>
#include <QStandardPaths>
#include <QtTest>

namespace {

const QString HelpFile = QStringLiteral("/Vantor/Common/9.30/orbhelpviewerdata.xml");

class CountingHandler : public QXmlDefaultHandler
{
public:
    bool startElement(const QString &, const QString &, const QString &, const QXmlAttributes &) override
    {
        ++elements;
        return true;
    }
    int elements = 0;
};

// An object without the reader interface.
class NotAReader final : public CitP::RefObject
{};

// The usage XML tables in a compact form: "Section/group: item|item", one
// line per group, sections in the order of the report, then the two counters.
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
    lines << QStringLiteral("counts %1 %2").arg(data.reportConfigDataCount).arg(data.reportPinDataCount);
    return lines.join(QLatin1Char('\n'));
}

// What `reader` makes of the file at `path` (written already, or missing).
QString readAs(const QString &reader, const QString &path)
{
    CrvC_ReportData data;
    if (reader == QLatin1String("map")) {
        CrvC_SynthesisReport::readTargetInfo(path, data);
        return data.targetDevice + '|' + data.targetPackage + '|' + data.targetSpeed;
    }
    if (reader == QLatin1String("synthesis")) {
        static const QRegularExpression tag(QStringLiteral("<[^>]*>"));
        CrvC_SynthesisReport::readMacroStatistics(path, data);
        QStringList categories;
        for (const auto &category : data.macroStatistics)
            categories << category.first + '[' + category.second.join(',').remove(tag) + ']';
        return categories.join(' ');
    }
    if (reader == QLatin1String("usage")) {
        const bool read = CrvC_UsageXml::readUsageXml(path, data);
        return (read ? QString() : QStringLiteral("not read: ")) + dump(data);
    }
    if (reader == QLatin1String("cores"))
        return CorvidTest::cellText(QString::fromUtf8(CrvC_CoresStatistics().sectionText(path)));
    if (reader == QLatin1String("help")) {
        qputenv("APPDATA", QFile::encodeName(path.chopped(HelpFile.size())));
        return CorvidTest::cellText(CrvC_HelpViewerData().sectionText());
    }
    if (reader == QLatin1String("log")) {
        CrvC_CommandLog::readCommandLog(path, data);
        return data.commandHistory.join('|');
    }
    if (reader == QLatin1String("par"))
        return CrvC_RunStatistics::parUsageSection(path);
    if (reader == QLatin1String("osim"))
        return CrvC_RunStatistics::osimUsageSection(path);
    if (reader == QLatin1String("runs"))
        return CorvidTest::cellText(CrvC_RunStatistics::runStatisticsSection(path.chopped(5)));
    // The SAX readers' way into the parse: the outcome, the elements seen.
    CountingHandler handler;
    const auto outcome = CrvC_XmlDepthGuard::parseFile(path, Port::InputFile::CoreReport, handler, 1000);
    static const char *const names[] = {"not read", "parsed", "malformed", "refused"};
    return QLatin1String(names[int(outcome)]) + QLatin1Char(' ') + QString::number(handler.elements);
}

QByteArray deep(int levels, const QByteArray &prefix = QByteArray())
{
    return prefix + QByteArray("<d>").repeated(levels) + QByteArray("</d>").repeated(levels);
}

QByteArray usageXml(const QByteArray &body)
{
    return "<?xml version=\"1.0\"?>\n<DeviceUsageReport>" + body + "</DeviceUsageReport>\n";
}

QByteArray inGroup(const QByteArray &items)
{
    return usageXml("<DeviceUsage><group name='g'>" + items + "</group></DeviceUsage>");
}

QByteArray cores(const QByteArray &body)
{
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<document stringID=\"LNKGEN\">\n" + body
           + "</document>\n";
}

QByteArray instance(const QByteArray &items)
{
    return "<scope stringID=\"LNKGEN_CORE_INSTANCE\" name=\"u\">" + items + "</scope>\n";
}

QByteArray info(const QByteArray &attributes)
{
    return "<item stringID=\"LNKGEN_CORE_INFO\" " + attributes + "/>";
}

QByteArray help(const QByteArray &body)
{
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<OrbHelpViewerData version=\"9.30\">\n" + body
           + "</OrbHelpViewerData>\n";
}

QByteArray search(const QByteArray &attributes, const QByteArray &text)
{
    return "<SearchString " + attributes + ">" + text + "</SearchString>\n";
}

QByteArray helpFile(const QByteArray &count, const QByteArray &text)
{
    return "<OpenHelpFile count=\"" + count + "\">" + text + "</OpenHelpFile>\n";
}

QStringList items(int count)
{
    QStringList result;
    for (int i = 0; i < count; ++i)
        result << QStringLiteral("<dtag-item1>i%1=%1</dtag-item1>").arg(i);
    return result;
}

} // namespace

class tst_Readers : public QObject
{
    Q_OBJECT
    CorvidTest::Environment m_env;
    int m_rows = 0;

private Q_SLOTS:
    void initTestCase()
    {
        // Only the first four characters of the version name the help viewer's folder.
        QVERIFY(m_env.writeDataFile(QStringLiteral("orb_version"), "version=9.30.1\n"));
        QVERIFY2(CitP::Factory::LoadLibraryFactory(UtilC::IRunStatisticsReader::libraryName()),
                 "the run statistics reader is not in the stage's lib folder");
    }

    void cleanup()
    {
        qunsetenv("APPDATA");
        qunsetenv("TEMP");
    }

    void read_data()
    {
        QTest::addColumn<QString>("reader");      // "<reader>" or "<reader>:<file name>"
        QTest::addColumn<QByteArray>("contents"); // null: no file
        QTest::addColumn<QString>("expected");

        // Map report: device, package and speed.
        QTest::newRow("map: values trimmed; CRLF line ends")
            << "map" << QByteArray("Target Device : xc6a25\r\nTarget Speed : -2\r\n") << "xc6a25||-2";
        QTest::newRow("map: later line wins")
            << "map" << QByteArray("Target Speed : -1\nTarget Speed : -3\n") << "||-3";
        QTest::newRow("map: only the first 20 lines")
            << "map" << QByteArray(19, '\n') + "Target Package : line20\nTarget Device : line21\n"
            << "|line20|";

        // Synthesis report: the macro statistics block, as "category[item,...]".
        const QByteArray header = "Advanced HDL Synthesis Report\n";
        const QByteArray end = QByteArray(16, '=') + '\n';
        QTest::newRow("synthesis: no header")
            << "synthesis" << QByteArray("# RAMs : 1\n 16x8-bit RAM : 1\n") << "";
        QTest::newRow("synthesis: categories repeat in file order")
            << "synthesis"
            << header + "# Registers : 1\n a : 1\n# Counters : 1\n b : 1\n# Registers : 1\n c : 1\n"
            << " Registers=1[a=1]  Counters=1[b=1]  Registers=1[c=1]";
        QTest::newRow("synthesis: sixteen equals signs end the block")
            << "synthesis" << header + "# RAMs : 1\n" + end + "# Counters : 2\n"
            << " RAMs=1[]";
        QTest::newRow("synthesis: block runs to the end of the file")
            << "synthesis" << header + "# RAMs : 1\r\n a : 1\r\n# Counters : 2"
            << " RAMs=1[a=1]  Counters=2[]";

        // Usage XML: the three tables and the counters.
        QTest::newRow("usage: the value attribute wins; other children and text are skipped")
            << "usage"
            << inGroup(
                   "<item name='n' value='5'><attrib name='used' value='1'/></item>"
                   "<item name='m'>text<Attrib name='a' value='1'/><note name='b' value='2'/></item>")
            << "device/g: <dtag-item1>n=5</dtag-item1>|<dtag-item1>m=</dtag-item1>\ncounts 0 0";
        QTest::newRow("usage: the order of the attribs decides the level")
            << "usage"
            << inGroup(
                   "<item name='a'><attrib name='value' value='7'/><attrib name='b' value='2'/></item>"
                   "<item name='b'><attrib name='x' value='1'/><attrib name='used' value='3'/></item>"
                   "<item name='c'><attrib name='used' value='3'/><attrib name='x' value='1'/></item>")
            << "device/g: <dtag-item3>a=7 [b:2]</dtag-item3>|<dtag-item2>b=3</dtag-item2>|"
               "<dtag-item3>c=3 [x:1]</dtag-item3>\ncounts 0 0";
        QTest::newRow("usage: nested groups keep their own names and items")
            << "usage"
            << usageXml(
                   "<DeviceUsage><group name='outer'><item name='a' value='1'/><group name='inner'>"
                   "<item name='b' value='2'/></group><item name='c' value='3'/></group></DeviceUsage>")
            << "device/inner: <dtag-item1>b=2</dtag-item1>\n"
               "device/outer: <dtag-item1>a=1</dtag-item1>|<dtag-item1>c=3</dtag-item1>\ncounts 0 0";
        QTest::newRow("usage: items outside groups counted, and go with the next group")
            << "usage"
            << usageXml(
                   "<ReportConfigData><item name='x' value='1'/><group name='g'><item name='a' "
                   "value='1'/></group><item name='y' value='1'/></ReportConfigData><ReportPinData>"
                   "<group name='p'><item name='q' value='1'/><item name='r' value='1'/></group>"
                   "</ReportPinData><DeviceUsage><item name='z' value='1'/></DeviceUsage>")
            << "config/g: <dtag-item1>x=1</dtag-item1>|<dtag-item1>a=1</dtag-item1>\n"
               "pin/p: <dtag-item1>y=1</dtag-item1>|<dtag-item1>q=1</dtag-item1>|"
               "<dtag-item1>r=1</dtag-item1>\ncounts 3 2";
        // A document that fails keeps nothing, not even the groups before the error.
        QTest::newRow("usage: truncated after whole groups")
            << "usage"
            << QByteArray(
                   "<r><ReportConfigData><group name='g'><item name='a' value='1'/></group>"
                   "<group name='h'><item name='b' value='2'/></group><oops></r>")
            << "not read: counts 0 0";
        QTest::newRow("usage: too deeply nested")
            << "usage"
            << QByteArray("<DeviceUsage>").repeated(20000)
                   + "<group name='g'><item name='n' value='1'/></group>"
                   + QByteArray("</DeviceUsage>").repeated(20000)
            << "not read: counts 0 0";

        // Netlist-build report: core statistics.
        QTest::newRow("cores: same core twice gives two blocks")
            << "cores"
            << cores(instance(info("type=\"counter\" depth=\"512\""))
                     + instance(info("type=\"counter\" depth=\"512\"")))
            << "Core Statistics|Core Type=counter|depth=512|Core Type=counter|depth=512|";
        QTest::newRow("cores: info and parameters items add to one instance")
            << "cores"
            << cores(instance(info("type=\"ram\" width=\"8\"")
                              + "<item stringID=\"LNKGEN_CORE_PARAMETERS\" component_name=\"c\" "
                                "depth=\"16\" unregistered=\"no\" value=\"x\" mode=\"a\"/>"))
            << "Core Statistics|Core Type=ram|width=8|depth=16|mode=a|";
        QTest::newRow("cores: nested scope of another kind ends the instance")
            << "cores"
            << cores(instance(info("type=\"t\"") + "<scope stringID=\"LNKGEN_OTHER\"/>"
                              + "<item stringID=\"LNKGEN_CORE_PARAMETERS\" late=\"1\"/>"))
            << "Core Statistics|Core Type=t|";
        QTest::newRow("cores: attribute names compared exactly; values decoded")
            << "cores" << cores(instance(info("type=\"a&amp;b\" Type=\"T\" StringID=\"s\"")))
            << "Core Statistics|Core Type=a&b|Type=T|StringID=s|";
        QTest::newRow("cores: malformed: instances before the error are kept")
            << "cores"
            << QByteArray("<document>") + instance(info("type=\"kept\""))
                   + "<scope stringID=\"LNKGEN_CORE_INSTANCE\"><item stringID=\"LNKGEN_CORE_INFO\" "
                     "type=\"partial\"/><broken"
            << "Core Statistics|Core Type=kept|Core Type=partial|";
        QTest::newRow("cores: no core instances: no table")
            << "cores" << cores("<scope stringID=\"LNKGEN_SUMMARY\"/>") << "";
        // The depth guard's rows below cover unusable files; these prove the readers go through it.
        QTest::newRow("cores: 50000 levels deep behind an undeclared entity")
            << "cores" << deep(50000, "<document>" + instance(info("type=\"t\"")) + "&undeclared;") << "";

        // Help viewer file: searches with and without results, help files opened.
        QTest::newRow("help: count 007 is 7, many or none is 0; found is exactly true")
            << "help"
            << help(search("found=\"true\" count=\"007\"", "a") + search("found=\"TRUE\" count=\"many\"", "b")
                    + search("found=\"true\"", "c"))
            << "Help Statistics|Search words with results|a ( 7 )|c ( 0 )|Unsuccessful Search words|b ( 0 )|";
        QTest::newRow("help: help file after a found search is still one; count out of range is 0")
            << "help" << help(search("found=\"true\" count=\"1\"", "w") + helpFile("99999999999", "f"))
            << "Help Statistics|Search words with results|w ( 1 )|Help files|f ( 0 )|";
        QTest::newRow("help: malformed: entries before the error are kept")
            << "help" << QByteArray("<OrbHelpViewerData>") + helpFile("1", "kept") + "<OpenHelpFile count="
            << "Help Statistics|Help files|kept ( 1 )|";
        QTest::newRow("help: no entries: no table") << "help" << help("<Settings zoom=\"2\"/>") << "";
        QTest::newRow("help: missing: no table") << "help" << QByteArray() << "";
        QTest::newRow("help: 50000 levels deep behind an undeclared entity")
            << "help" << deep(50000, "<OrbHelpViewerData>" + helpFile("1", "f") + "&undeclared;") << "";

        // Command log: the design name is the file name up to the first dot.
        QTest::newRow("log: design case-sensitive")
            << "log:top.cmd_log" << QByteArray("TOP Top top") << "TOP Top <design>";
        QTest::newRow("log: design before a dot is swallowed")
            << "log:top.v2.cmd_log" << QByteArray("bitmake top.ncd\npar top.v2")
            << "bitmake <fname>.ncd|par <fname>.v2";
        QTest::newRow("log: empty design replaces nothing")
            << "log:.cmd_log" << QByteArray("par top") << "par top";

        // Sub-report pages, taken line by line (the simulator's joined).
        const QByteArray page = "<TD>\r\n\r\n\xc3\xa4</TD>";
        QTest::newRow("par: CRLF, empty lines, UTF-8, no line end at the end")
            << "par" << page << QString("&nbsp;<BR><TD>\n\n") + QChar(0xe4) + "</TD>\n";
        QTest::newRow("osim: the same page")
            << "osim" << page << QString("&nbsp;<BR><TD>") + QChar(0xe4) + "</TD>";
        QTest::newRow("par: missing page") << "par" << QByteArray() << "&nbsp;<BR>";
        QTest::newRow("osim: missing page") << "osim" << QByteArray() << "&nbsp;<BR>";

        // Run records, read by the host's run statistics reader.
        const QString runs = QStringLiteral(
            "Software Quality|Run Statistics|Tool|Runs|Completed|Failed|Cancelled|"
            "Total Time (s)|Average Time (s)|Last Run|");
        QTest::newRow("runs: no records file") << "runs" << QByteArray() << "";
        QTest::newRow("runs: mark-up in tool names is escaped; UTF-8")
            << "runs" << QByteArray("<b>&x\xc3\xa4 2025-03-03T09:12:40 0 completed\n")
            << runs + "&lt;b&gt;&amp;x" + QChar(0xe4) + "|1|1|0|0|0|0.0|2025-03-03|";
        QTest::newRow("runs: binary file") << "runs"
                                           << QByteArray(
                                                  "\x7f"
                                                  "ELF\x02\x01\x01\x00\x00\xff\xfe\n\x00\x01",
                                                  14)
                                           << "";

        // What the SAX readers' parse is given (depth limit 1000): the outcome
        // and the elements the handler saw.
        QTest::newRow("sax: internal DTD subset")
            << "sax" << QByteArray("<!DOCTYPE r [<!ENTITY a 'b'>]><r>&a;</r>") << "refused 0";
        QTest::newRow("sax: depth at the limit") << "sax" << deep(1000) << "parsed 1000";
        QTest::newRow("sax: one level past the limit") << "sax" << deep(1001) << "refused 0";
        QTest::newRow("sax: truncated") << "sax" << QByteArray("<r><a/><b>") << "malformed 3";
        // The stream check gives up at the first error; the SAX reader reads
        // past it and must still be stopped before it recurses out of stack.
        QTest::newRow("sax: 50000 levels behind an undeclared entity")
            << "sax" << deep(50000, "<r>&undeclared;") << "refused 1000";
        QTest::newRow("sax: 50000 levels behind a repeated attribute")
            << "sax" << deep(50000, "<r a='1' a='2'>") << "refused 1000";
    }

    void read()
    {
        QFETCH(QString, reader);
        QFETCH(QByteArray, contents);
        static const QMap<QString, QString> files{{"map", "top_map.ktp"},
                                                  {"synthesis", "top.snx"},
                                                  {"usage", "top_usage.xml"},
                                                  {"cores", "top_lnkgen.drpt"},
                                                  {"help", "AppData" + HelpFile},
                                                  {"par", "par_usage_statistics.html"},
                                                  {"osim", "osim_usage_statistics.html"},
                                                  {"runs", "top.orb.runs"},
                                                  {"sax", "doc.xml"}};
        const QString file = QStringLiteral("read%1/").arg(++m_rows)
                             + (reader.contains(':') ? reader.section(':', 1) : files.value(reader));
        const QString path = contents.isNull() ? m_env.path(file) : m_env.write(file, contents);
        QTEST(readAs(reader.section(':', 0, 0), path), "expected");
    }

    void helpFileLocation_data()
    {
        QTest::addColumn<QString>("appData"); // "-" for unset
        QTest::addColumn<QString>("temp");
        QTest::addColumn<QString>("fileUnder"); // "APPDATA", "TEMP", "user"
        QTest::addColumn<bool>("found");

        QTest::newRow("APPDATA preferred over TEMP") << "app"
                                                     << "tmp"
                                                     << "APPDATA" << true;
        QTest::newRow("no fall-back to TEMP when APPDATA is set") << "app"
                                                                  << "tmp"
                                                                  << "TEMP" << false;
        QTest::newRow("TEMP when APPDATA is empty") << ""
                                                    << "tmp"
                                                    << "TEMP" << true;
        QTest::newRow("per-user location when both are empty") << ""
                                                               << ""
                                                               << "user" << true;
        QTest::newRow("TEMP preferred over the per-user location") << "-"
                                                                   << "tmp"
                                                                   << "user" << false;
    }

    void helpFileLocation()
    {
        QFETCH(QString, appData);
        QFETCH(QString, temp);
        QFETCH(QString, fileUnder);
        const QString root = m_env.path(QLatin1String("location/") + QLatin1String(QTest::currentDataTag()));
        const QString userDir = QStandardPaths::writableLocation(QStandardPaths::GenericDataLocation);
        QVERIFY(userDir.startsWith(m_env.home()));
        if (appData != QLatin1String("-"))
            qputenv("APPDATA", QFile::encodeName(appData.isEmpty() ? appData : root + "/AppData"));
        if (temp != QLatin1String("-"))
            qputenv("TEMP", QFile::encodeName(temp.isEmpty() ? temp : root + "/Temp"));
        const QString path = (fileUnder == QLatin1String("APPDATA") ? root + "/AppData"
                              : fileUnder == QLatin1String("TEMP")  ? root + "/Temp"
                                                                    : userDir)
                             + HelpFile;
        QVERIFY(CorvidTest::writeFile(path, help(search("found=\"true\" count=\"1\"", "fifo"))));
        const QString text = CrvC_HelpViewerData().sectionText();
        QFile::remove(path);
        QTEST(!text.isEmpty(), "found");
        if (!text.isEmpty())
            QCOMPARE(CrvC_HelpViewerData::helpFilePath(), path);
    }

    // The usage tables' cell texts: design and device groups of one item
    // each, and groups "g0", "g1", ... of the given sizes in the two spread
    // tables (configuration and pin data).
    void usageTables_data()
    {
        QTest::addColumn<QStringList>("designGroups");
        QTest::addColumn<QStringList>("deviceGroups");
        QTest::addColumn<QList<int>>("configGroups");
        QTest::addColumn<QList<int>>("pinGroups");
        QTest::addColumn<int>("count");
        QTest::addColumn<QString>("cells");

        const QString heads = QStringLiteral(
            "Device Usage Statistics|Macro Statistics|Miscellaneous Statistics|Net Statistics|Site Usage|");
        const QString empty = heads + QStringLiteral("||||");
        QTest::newRow("every NetStatistics group opens a cell")
            << QStringList({"NetStatisticsA", "netstatisticsB"}) << QStringList({"Sites"}) << QList<int>()
            << QList<int>() << 0 << heads + "||NetStatisticsA i0=0|netstatisticsB i0=0|Sites i0=0|";
        QTest::newRow("empty name writes no list")
            << QStringList({""}) << QStringList({""}) << QList<int>() << QList<int>() << 0 << heads + "|||";
        QTest::newRow("spread: limit reached across groups")
            << QStringList() << QStringList() << QList<int>({1, 1, 1, 3}) << QList<int>({1, 1, 1, 3}) << 8
            << empty + "Configuration Data|g0 i0=0 g1 i0=0|g2 i0=0 g3 i0=0 i1=1 i2=2||"
                       "Pin Data|g0 i0=0 g1 i0=0|g2 i0=0 g3 i0=0 i1=1 i2=2||";
        QTest::newRow("spread: limit not reached")
            << QStringList() << QStringList() << QList<int>({2, 2}) << QList<int>({2, 2}) << 20
            << empty + "Configuration Data|g0 i0=0 i1=1 g1 i0=0 i1=1|Pin Data|g0 i0=0 i1=1 g1 i0=0 i1=1|";
        QTest::newRow("pin data alone") << QStringList() << QStringList() << QList<int>() << QList<int>({1})
                                        << 0 << empty + "Pin Data|g0 i0=0||";
    }

    void usageTables()
    {
        QFETCH(QStringList, designGroups);
        QFETCH(QStringList, deviceGroups);
        QFETCH(QList<int>, configGroups);
        QFETCH(QList<int>, pinGroups);
        QFETCH(int, count);
        CrvC_ReportData data;
        for (const QString &name : designGroups)
            data.designStatistics.insert(name, items(1));
        for (const QString &name : deviceGroups)
            data.deviceUsage.insert(name, items(1));
        for (int i = 0; i < configGroups.size(); ++i)
            data.reportConfigData.insert(QStringLiteral("g%1").arg(i), items(configGroups.at(i)));
        for (int i = 0; i < pinGroups.size(); ++i)
            data.reportPinData.insert(QStringLiteral("g%1").arg(i), items(pinGroups.at(i)));
        if (!configGroups.isEmpty())
            data.reportConfigData.insert(QString(), items(5)); // no name: left out
        data.reportConfigDataCount = data.reportPinDataCount = count;
        QStringList lines;
        CrvC_UsageXml::appendTables(data, lines);
        QTEST(CorvidTest::cellText(lines.join(QLatin1Char('\n'))), "cells");
    }

    // No run statistics reader, or an object that is none: no table.
    void runStatisticsWithoutReader()
    {
        CitP::Factory::RegisterCreator(UtilC::IRunStatisticsReader::classId(),
                                       []() -> CitI::IInterface * { return nullptr; });
        QCOMPARE(CrvC_RunStatistics::runStatisticsSection(m_env.path(QStringLiteral("top.orb"))), QString());
        CitP::Factory::RegisterCreator(UtilC::IRunStatisticsReader::classId(),
                                       [] { return static_cast<CitP::RefObject *>(new NotAReader); });
        QCOMPARE(CrvC_RunStatistics::runStatisticsSection(m_env.path(QStringLiteral("top.orb"))), QString());
        CitP::Factory::UnRegisterCreator(UtilC::IRunStatisticsReader::classId());
    }

    // The command log's quoted-argument and file name steps scan by hand; on
    // any line they must give what the regular expressions ".*" and \S+[.] give.
    void commandLogSameAsThePatterns()
    {
        static const QRegularExpression quoted(QStringLiteral("\".*\""));
        static const QRegularExpression plain(QStringLiteral("\\S+[\\.]"));
        const QString alphabet = QStringLiteral("ab.. \t\v\r\"_\u00a0");
        QRandomGenerator random(4711);
        for (int n = 0; n < 20000; ++n) {
            QString line;
            const int length = random.bounded(12);
            for (int i = 0; i < length; ++i)
                line += alphabet.at(random.bounded(alphabet.size()));
            QString expected = line.simplified();
            expected.replace(quoted, QStringLiteral("<orb_file>"));
            expected.replace(plain, QStringLiteral("<fname>."));
            QCOMPARE(CrvC_CommandLog::anonymized(line, QString()), expected);
        }
    }

    // Without a command log the table holds "fuse" alone; without fuse.log nothing.
    void fuseLogAlone()
    {
        const QString fuse = m_env.path(QStringLiteral("fuse/fuse.log"));
        CrvC_ReportData data;
        QVERIFY(!CrvC_CommandLog::checkFuseLog(fuse, data));
        m_env.write(QStringLiteral("fuse/fuse.log"), QByteArray());
        QVERIFY(!CrvC_CommandLog::readCommandLog(m_env.path(QStringLiteral("fuse/none.cmd_log")), data));
        QVERIFY(CrvC_CommandLog::checkFuseLog(fuse, data));
        QCOMPARE(data.commandHistory, QStringList{"fuse"});
    }
};

QTEST_GUILESS_MAIN(tst_Readers)
#include "tst_readers.moc"
