#include "common/TestEnvironment.h"

#include "report/ProjectStatistics.h"

#include <QtTest>

using PairList = ProjectDataManager::PairList;
Q_DECLARE_METATYPE(PairList)

namespace {

const QString head = QStringLiteral(
    "&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>\n"
    "<dtag-section name=\"ProjectStatistics\">\n"
    "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=2><B>Project Statistics</B></TD></TR>\n"
    "<TR>\n");
const QString tail = QStringLiteral("</TR></dtag-section></TABLE>");

QString ageCell(const QString &age)
{
    return QLatin1String("<TD>Project duration(days)=<dtag-project-duration-days>") + age
           + QLatin1String("</dtag-project-duration-days></TD>\n");
}

} // namespace

class tst_ProjectStatistics : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void initTestCase();
    void layout_data();
    void layout();
    void noProject();

private:
    std::unique_ptr<CorvidTest::Environment> m_env;
};

void tst_ProjectStatistics::initTestCase()
{
    m_env.reset(new CorvidTest::Environment);
}

void tst_ProjectStatistics::layout_data()
{
    QTest::addColumn<PairList>("rows");
    QTest::addColumn<QString>("age");
    QTest::addColumn<QString>("expected");

    const ProjectDataManager::Pair tool{
        "<dtag-design-property-name>PROP_Synthesis_Tool</dtag-design-property-name>",
        "<dtag-design-property-value>synth</dtag-design-property-value>"};
    const ProjectDataManager::Pair partitions{"Partitions count",
                                              "<dtag-partitions-count>0</dtag-partitions-count>"};
    const QString toolCell = QStringLiteral(
        "<TD><dtag-design-property-name>PROP_Synthesis_Tool</dtag-design-property-name>="
        "<dtag-design-property-value>synth</dtag-design-property-value></TD>\n");
    const QString partitionsCell = QStringLiteral(
        "<TD>Partitions count=<dtag-partitions-count>0</dtag-partitions-count></TD>\n");
    const QString rowBreak = QStringLiteral("\n</TR><TR>");

    QTest::newRow("age row alone") << PairList() << "16" << head + ageCell("16") + tail;
    QTest::newRow("no creation date") << PairList() << "" << head + ageCell("") + tail;
    QTest::newRow("negative age") << PairList() << "-3" << head + ageCell("-3") + tail;
    QTest::newRow("two cells share a row")
        << PairList{partitions} << "0" << head + partitionsCell + ageCell("0") + tail;
    QTest::newRow("third cell opens a row")
        << PairList{tool, partitions} << "7"
        << head + toolCell + partitionsCell + rowBreak + ageCell("7") + tail;
    QTest::newRow("four rows and the age")
        << PairList{tool, partitions, tool, partitions} << "1"
        << head + toolCell + partitionsCell + rowBreak + toolCell + partitionsCell + rowBreak
               + ageCell("1") + tail;
    QTest::newRow("UTF-8 values shown as they are")
        << PairList{{"a<b", "\xc3\xa4&"}} << ""
        << head + "<TD>a<b=" + QChar(0xe4) + "&</TD>\n" + ageCell("") + tail;
}

void tst_ProjectStatistics::layout()
{
    QFETCH(PairList, rows);
    QFETCH(QString, age);
    QFETCH(QString, expected);
    QCOMPARE(CrvC_ProjectStatistics::sectionText(rows, age), expected);
}

// No current project and a project file that does not exist: only the age
// row, without an age.
void tst_ProjectStatistics::noProject()
{
    QCOMPARE(CrvC_ProjectStatistics::projectStatisticsSection(m_env->home() + "/none/top.orb", QDate::currentDate()),
             head + ageCell("") + tail);
}

QTEST_GUILESS_MAIN(tst_ProjectStatistics)
#include "tst_projectstatistics.moc"
