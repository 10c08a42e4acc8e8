#include "SynthesisReport.h"

#include "host/InputFile.h"

#include <QFile>
#include <QTextStream>

namespace {

// Only the head of the map report names the target.
constexpr int TargetInfoLines = 20;

const QLatin1String BlockHeader("Advanced HDL Synthesis Report");
const QLatin1String BlockEnd("================"); // sixteen

// The text after the first ':' up to the next one, trimmed.
QString secondField(const QString &line)
{
    return line.section(QLatin1Char(':'), 1, 1).trimmed();
}

} // namespace

bool CrvC_SynthesisReport::readTargetInfo(const QString &path, CrvC_ReportData &data)
{
    Port::InputFile file;
    if (file.open(path, Port::InputFile::MapReport) != Port::InputFile::Status::Opened)
        return true;
    QTextStream in(&file);
    in.setEncoding(QStringConverter::Utf8);
    QString device = data.targetDevice, package = data.targetPackage, speed = data.targetSpeed;
    QString line;
    for (int i = 0; i < TargetInfoLines && in.readLineInto(&line); ++i) {
        if (line.startsWith(QLatin1String("Target Device"), Qt::CaseInsensitive))
            device = secondField(line);
        else if (line.startsWith(QLatin1String("Target Package"), Qt::CaseInsensitive))
            package = secondField(line);
        else if (line.startsWith(QLatin1String("Target Speed"), Qt::CaseInsensitive))
            speed = secondField(line);
    }
    if (!file.refused()) {
        data.targetDevice = device;
        data.targetPackage = package;
        data.targetSpeed = speed;
    }
    return true;
}

bool CrvC_SynthesisReport::readMacroStatistics(const QString &path, CrvC_ReportData &data)
{
    Port::InputFile file;
    if (file.open(path, Port::InputFile::SynthesisReport) != Port::InputFile::Status::Opened)
        return true;
    QTextStream in(&file);
    in.setEncoding(QStringConverter::Utf8);

    static const QLatin1String separator(" : ");
    static const QLatin1String equals("=");
    bool inside = false;
    bool inCategory = false; // items go to the latest entry
    QList<QPair<QString, QStringList>> statistics;
    QString line;
    while (in.readLineInto(&line)) {
        if (line.startsWith(BlockHeader, Qt::CaseInsensitive)) {
            inside = true;
        } else if (!inside) {
            continue;
        } else if (line.startsWith(BlockEnd)) {
            break;
        } else if (line.startsWith(QLatin1Char('#'))) {
            QString name = line.simplified();
            name.remove(QLatin1Char('#')).replace(separator, equals);
            statistics.append(qMakePair(name, QStringList()));
            inCategory = true;
        } else if (!line.isEmpty() && inCategory) {
            QString item = line.simplified();
            item.replace(separator, equals);
            statistics.last().second.append(QLatin1String("<dtag-item1>") % item
                                            % QLatin1String("</dtag-item1>"));
        }
    }
    if (!file.refused())
        data.macroStatistics += statistics;
    return true;
}

QString CrvC_SynthesisReport::macroStatisticsCell(const CrvC_ReportData &data)
{
    if (data.macroStatistics.isEmpty())
        return QStringLiteral("<TD>&nbsp;</TD>");
    QStringList lines;
    lines.reserve(3 * data.macroStatistics.size() + 4);
    lines << QStringLiteral("<dtag-section name=\"MacroStatistics\">") << QStringLiteral("<TD>");
    for (const auto &entry : data.macroStatistics) {
        lines << CrvC_Markup::groupHead(entry.first);
        if (!entry.first.isEmpty() && !entry.second.isEmpty())
            lines << CrvC_Markup::itemList(entry.second);
        lines << CrvC_Markup::groupEnd();
    }
    lines << QStringLiteral("</TD>") << QStringLiteral("</dtag-section>");
    return lines.join(QLatin1Char('\n'));
}
