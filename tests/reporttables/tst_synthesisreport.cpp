#include "common/TestEnvironment.h"
#include "report/SynthesisReport.h"

#include <QTemporaryDir>
#include <QtTest>

namespace {

const QByteArray Header = "Advanced HDL Synthesis Report\n";
const QByteArray Sixteen = "================\n";

QString group(const QString &name, const QStringList &items = QStringList())
{
    QString text = QLatin1String("<dtag-group><dtag-group-name name=\"") + name
        + QLatin1String("\">") + name + QLatin1String("</dtag-group-name>\n");
    if (!items.isEmpty()) {
        text += QLatin1String("<UL>\n<LI><dtag-item1>")
            + items.join(QLatin1String("</dtag-item1></LI>\n<LI><dtag-item1>"))
            + QLatin1String("</dtag-item1></LI>\n</UL>\n");
    }
    return text + QLatin1String("</dtag-group>\n");
}

QString cell(const QString &groups)
{
    return QLatin1String("<dtag-section name=\"MacroStatistics\">\n<TD>\n") + groups
        + QLatin1String("</TD>\n</dtag-section>");
}

const QString EmptyCell = QStringLiteral("<TD>&nbsp;</TD>");

} // namespace

class tst_SynthesisReport : public QObject
{
    Q_OBJECT

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
    QTemporaryDir m_dir;

    QString write(const QByteArray &contents)
    {
        const QString path = m_dir.filePath(QStringLiteral("report.txt"));
        CorvidTest::writeFile(path, contents);
        return path;
    }

private Q_SLOTS:
    void initTestCase() { m_env.reset(new CorvidTest::Environment); }

    // Device, package and speed joined with "|".
    void targetInfo_data()
    {
        QTest::addColumn<QByteArray>("contents");
        QTest::addColumn<QString>("target");

        QTest::newRow("CRLF line ends")
            << QByteArray("Target Device : xc6a25\r\nTarget Speed : -2\r\n") << "xc6a25||-2";
        QTest::newRow("lower case prefix taken") << QByteArray("target device : x\n") << "x||";
        QTest::newRow("leading blank not taken") << QByteArray("  Target Device : x\n") << "||";
        QTest::newRow("second colon ends the value") << QByteArray("Target Device : a : b\n") << "a||";
        QTest::newRow("no colon gives empty") << QByteArray("Target Device xc6a25\n") << "||";
        QTest::newRow("later line wins") << QByteArray("Target Speed : -1\nTarget Speed : -3\n") << "||-3";
        QTest::newRow("only the first 20 lines")
            << QByteArray(19, '\n') + "Target Package : line20\nTarget Device : line21\n" << "|line20|";
        QTest::newRow("binary") << QByteArray("\0\xff\xfe:\x01Target\0", 12) << "||";
    }

    void targetInfo()
    {
        QFETCH(QByteArray, contents);
        CrvC_ReportData data;
        QVERIFY(CrvC_SynthesisReport::readTargetInfo(write(contents), data));
        QTEST(QString(data.targetDevice + '|' + data.targetPackage + '|' + data.targetSpeed), "target");
    }

    void missingFilesLeaveFieldsAlone()
    {
        CrvC_ReportData data;
        data.targetDevice = QStringLiteral("kept");
        QVERIFY(CrvC_SynthesisReport::readTargetInfo(m_dir.filePath(QStringLiteral("none")), data));
        QVERIFY(CrvC_SynthesisReport::readMacroStatistics(m_dir.filePath(QStringLiteral("none")),
                                                          data));
        QCOMPARE(data.targetDevice, QStringLiteral("kept"));
        QCOMPARE(CrvC_SynthesisReport::macroStatisticsCell(data), EmptyCell);
    }

    void macroStatistics_data()
    {
        QTest::addColumn<QByteArray>("contents");
        QTest::addColumn<QString>("cell");

        QTest::newRow("no header") << QByteArray("# RAMs : 1\n 16x8-bit RAM : 1\n") << EmptyCell;
        QTest::newRow("header only") << Header << EmptyCell;
        QTest::newRow("header prefix is case-insensitive")
            << QByteArray("ADVANCED hdl SYNTHESIS REPORT (part 1)\n#RAMs : 2\n")
            << cell(group("RAMs=2"));
        QTest::newRow("hash without blank")
            << Header + "#RAMs : 2\n# RAMs : 2\n"
            << cell(group("RAMs=2") + group(" RAMs=2"));
        QTest::newRow("every hash removed")
            << Header + "# Adders/Subtractors # : 3\n" << cell(group(" Adders/Subtractors =3"));
        QTest::newRow("duplicate categories in file order")
            << Header + "# Registers : 1\n a : 1\n# Counters : 1\n b : 1\n# Registers : 1\n c : 1\n"
            << cell(group(" Registers=1", {"a=1"}) + group(" Counters=1", {"b=1"})
                    + group(" Registers=1", {"c=1"}));
        QTest::newRow("blank-only line gives empty item, empty line nothing")
            << Header + "# RAMs : 1\n   \t \n\n x : 1\n" << cell(group(" RAMs=1", {"", "x=1"}));
        QTest::newRow("sixteen equals signs end the block")
            << Header + "# RAMs : 1\n" + Sixteen + "# Counters : 2\n" << cell(group(" RAMs=1"));
        QTest::newRow("fifteen equals signs are an item")
            << Header + "# RAMs : 1\n===============\n"
            << cell(group(" RAMs=1", {"==============="}));
        QTest::newRow("second header after the end never reached")
            << Header + "# RAMs : 1\n" + Sixteen + Header + "# Counters : 2\n"
            << cell(group(" RAMs=1"));
        QTest::newRow("block runs to the end of the file")
            << Header + "# RAMs : 1\n a : 1\n# Counters : 2" << cell(group(" RAMs=1", {"a=1"})
                                                                 + group(" Counters=2"));
        QTest::newRow("repeated header keeps the current list")
            << Header + "# RAMs : 1\n" + Header + " a : 1\n" << cell(group(" RAMs=1", {"a=1"}));
        QTest::newRow("colon without blanks kept") << Header + "# RAMs:1\n x:1\n"
                                                   << cell(group(" RAMs:1", {"x:1"}));
        QTest::newRow("CRLF line ends") << Header + "# RAMs : 1\r\n a : 1\r\n"
                                        << cell(group(" RAMs=1", {"a=1"}));
        QTest::newRow("empty category name has no list")
            << Header + "#\n a : 1\n" << cell(group(""));
    }

    void macroStatistics()
    {
        QFETCH(QByteArray, contents);
        QFETCH(QString, cell);
        CrvC_ReportData data;
        QVERIFY(CrvC_SynthesisReport::readMacroStatistics(write(contents), data));
        QCOMPARE(CrvC_SynthesisReport::macroStatisticsCell(data), cell);
    }
};

QTEST_GUILESS_MAIN(tst_SynthesisReport)
#include "tst_synthesisreport.moc"
