#include "ProjectStatistics.h"

#include "host/String.h"
#include "project/ProjectRepositoryValues.h"

QString CrvC_ProjectStatistics::projectStatisticsSection(const QString &projectFile, const QDate &today,
                                                         const ProjectRepositoryValues &values)
{
    ProjectDataManager::PairList rows;
    ProjectDataManager::collectProjectProperties(rows);
    return sectionText(rows, values.projectAgeInDays(projectFile, today));
}

QString CrvC_ProjectStatistics::sectionText(const ProjectDataManager::PairList &rows, const QString &age)
{
    QString text = QStringLiteral(
        "&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>\n"
        "<dtag-section name=\"ProjectStatistics\">\n"
        "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=2><B>Project Statistics</B></TD></TR>\n"
        "<TR>\n");
    auto appendCell = [&text](std::size_t i, const QString &name, const QString &value) {
        if (i > 0 && i % 2 == 0)
            text += QLatin1String("\n</TR><TR>");
        text += QLatin1String("<TD>") + name + QLatin1Char('=') + value + QLatin1String("</TD>\n");
    };
    std::size_t i = 0;
    for (const ProjectDataManager::Pair &row : rows)
        appendCell(i++, Gui::Clip::String::convert(row.first), Gui::Clip::String::convert(row.second));
    appendCell(i, QStringLiteral("Project duration(days)"),
               QLatin1String("<dtag-project-duration-days>") + age
                   + QLatin1String("</dtag-project-duration-days>"));
    text += QLatin1String("</TR></dtag-section></TABLE>");
    return text;
}
