#pragma once

#include <QList>
#include <QMap>
#include <QPair>
#include <QString>
#include <QStringBuilder>
#include <QStringList>

#include <functional>

// The fields one report build fills and reads. Owned by the report builder;
// valid for one build only (a new report uses a new builder).
struct CrvC_ReportData
{
    // Given by the caller and resolved by the builder.
    QString projectFile; // always ends in ".orb" after a build
    // False when the caller named no project file: projectFile is then ".orb"
    // for the page, but nothing named after it is opened.
    bool projectGiven = true;
    QString reportPath; // where the page is written
    QString targetFamily;

    // Map report: target of the design.
    QString targetDevice;
    QString targetPackage;
    QString targetSpeed;

    // Synthesis report: one entry per category line of the macro statistics
    // block, in file order (names may repeat).
    QList<QPair<QString, QStringList>> macroStatistics;

    // Usage XML: group name -> item texts, ordered by group name.
    QString usageXmlPath;
    QMap<QString, QStringList> designStatistics;
    QMap<QString, QStringList> deviceUsage;
    QMap<QString, QStringList> reportConfigData;
    QMap<QString, QStringList> reportPinData;
    qint32 reportConfigDataCount = 0;
    qint32 reportPinDataCount = 0;

    // Command log and fuse log entries, in input order.
    QStringList commandHistory;

    // Send iteration shown in the report; computed once per build. Empty
    // with projectIterationRead set when the repository could not be read.
    QString projectIteration;
    bool projectIterationRead = false;

    // The project file that readers of project-named files (repository, run
    // records) open: empty when the caller named none.
    QString projectFileToOpen() const { return projectGiven ? projectFile : QString(); }
};

// Where a section's lines go, one at a time and in page order: straight into
// the page as it is written, or into a list.
class CrvC_Lines
{
public:
    explicit CrvC_Lines(std::function<void(const QString &line)> take) : m_take(std::move(take)) {}
    explicit CrvC_Lines(QStringList &list) : m_take([&list](const QString &line) { list.append(line); }) {}

    CrvC_Lines &operator<<(const QString &line)
    {
        m_take(line);
        return *this;
    }

private:
    std::function<void(const QString &line)> m_take;
};

// The dtag mark-up that the tables share: a group is its head line, the list
// line of its items (left out for empty lists) and its closing line.
namespace CrvC_Markup {

// <dtag-group><dtag-group-name name="NAME">NAME</dtag-group-name>
inline QString groupHead(const QString &name)
{
    return QLatin1String("<dtag-group><dtag-group-name name=\"") % name % QLatin1String("\">") % name
           % QLatin1String("</dtag-group-name>");
}

// <UL>, one <LI> per item, </UL>, on lines of their own.
inline QString itemList(const QStringList &items)
{
    return QLatin1String("<UL>\n<LI>") % items.join(QLatin1String("</LI>\n<LI>"))
           % QLatin1String("</LI>\n</UL>");
}

inline QString groupEnd()
{
    return QStringLiteral("</dtag-group>");
}

} // namespace CrvC_Markup
