#include "common/TestEnvironment.h"

#include "report/ProjectStatistics.h"

#include <QtTest>

// The sample page shows a table with an even number of facts; here the age
// sharing a row, values in UTF-8, and no project at all.
namespace {

const QString Head = QStringLiteral(
    "&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>\n"
    "<dtag-section name=\"ProjectStatistics\">\n"
    "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=2><B>Project Statistics</B></TD></TR>\n"
    "<TR>\n");
const QString Tail = QStringLiteral("</TR></dtag-section></TABLE>");

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
    void oddCountAndUtf8()
    {
        const ProjectDataManager::PairList rows{{"a<b", "\xc3\xa4&"}};
        QCOMPARE(CrvC_ProjectStatistics::sectionText(rows, QStringLiteral("-3")),
                 Head + "<TD>a<b=" + QChar(0xe4) + "&</TD>\n" + ageCell("-3") + Tail);
    }

    // No current project and a project file that does not exist: only the
    // age row, without an age.
    void noProject()
    {
        CorvidTest::Environment env;
        QCOMPARE(CrvC_ProjectStatistics::projectStatisticsSection(env.home() + "/none/top.orb",
                                                                  QDate::currentDate()),
                 Head + ageCell("") + Tail);
    }
};

QTEST_GUILESS_MAIN(tst_ProjectStatistics)
#include "tst_projectstatistics.moc"
