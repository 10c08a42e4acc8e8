#include "RunStatistics.h"

#include "host/AutoRelease.h"
#include "host/Factory.h"
#include "host/InputFile.h"
#include "host/QualityData.h"
#include "host/String.h"

#include <QFile>
#include <QTextStream>

namespace {

QString subReport(const QString &path, QLatin1String lineEnd)
{
    const QString empty = QStringLiteral("&nbsp;<BR>");
    Port::InputFile file;
    if (file.open(path, Port::InputFile::SubReport) != Port::InputFile::Status::Opened)
        return empty;
    QTextStream in(&file);
    QString text = empty;
    QString line;
    while (in.readLineInto(&line))
        text += line + lineEnd;
    return file.refused() ? empty : text;
}

} // namespace

QString CrvC_RunStatistics::runStatisticsSection(const QString &projectFile)
{
    if (!CitP::Factory::LoadLibraryFactory(UtilC::IRunStatisticsReader::libraryName()))
        return QString();
    Prjrep::AutoRelease<CitI::IInterface> object(
        CitP::Factory::CreateInstanceRef(UtilC::IRunStatisticsReader::classId()));
    Prjrep::AutoCast<UtilC::IRunStatisticsReader> reader(object.get());
    if (!reader)
        return QString();

    Port::StringBase html;
    reader->readRunStatistics(Gui::Clip::String::convert(projectFile), html);
    html.Replace("<table>",
                 "&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>"
                 "<dtag-section name=\"RunStatistics\">"
                 "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=8><B>Software Quality</B></TD></TR>"
                 "<TR ALIGN=LEFT><TD COLSPAN=8><B>Run Statistics</B></TD></TR>");
    html.Replace("</table>", "</dtag-section></TABLE>");
    return Gui::Clip::String::convert(html);
}

QString CrvC_RunStatistics::parUsageSection(const QString &path)
{
    return subReport(path, QLatin1String("\n"));
}

QString CrvC_RunStatistics::osimUsageSection(const QString &path)
{
    return subReport(path, QLatin1String(""));
}
