#include "UsageXml.h"
#include "SynthesisReport.h"

#include "host/XmlGuard.h"

#include <QFile>
#include <QXmlStreamReader>

#include <vector>

namespace {

enum class Section { None, DesignStatistics, DeviceUsage, ReportConfigData, ReportPinData };

// The section an element opens, by case-insensitive prefix of its tag name.
Section sectionOf(QStringView tag)
{
    static const struct
    {
        QLatin1String prefix;
        Section section;
    } sections[] = {
        {QLatin1String("DesignStatistics"), Section::DesignStatistics},
        {QLatin1String("DeviceUsage"), Section::DeviceUsage},
        {QLatin1String("ReportConfigData"), Section::ReportConfigData},
        {QLatin1String("ReportPinData"), Section::ReportPinData},
    };
    for (const auto &s : sections) {
        if (tag.startsWith(s.prefix, Qt::CaseInsensitive))
            return s.section;
    }
    return Section::None;
}

// The four section tables and the two counters that one reading fills.
struct UsageTables
{
    explicit UsageTables(const CrvC_ReportData &data)
        : designStatistics(data.designStatistics)
        , deviceUsage(data.deviceUsage)
        , reportConfigData(data.reportConfigData)
        , reportPinData(data.reportPinData)
        , reportConfigDataCount(data.reportConfigDataCount)
        , reportPinDataCount(data.reportPinDataCount)
    {
    }

    void storeInto(CrvC_ReportData &data)
    {
        data.designStatistics.swap(designStatistics);
        data.deviceUsage.swap(deviceUsage);
        data.reportConfigData.swap(reportConfigData);
        data.reportPinData.swap(reportPinData);
        data.reportConfigDataCount = reportConfigDataCount;
        data.reportPinDataCount = reportPinDataCount;
    }

    QMap<QString, QStringList> designStatistics;
    QMap<QString, QStringList> deviceUsage;
    QMap<QString, QStringList> reportConfigData;
    QMap<QString, QStringList> reportPinData;
    qint32 reportConfigDataCount;
    qint32 reportPinDataCount;
};

// Turns the element events of the usage document into section tables. The
// document is read as a stream: a whole DOM tree of a large usage file takes
// tens of times the file's size in memory. Open elements are kept on an
// explicit stack, so nesting costs no call depth.
class UsageWalker
{
public:
    explicit UsageWalker(UsageTables &tables) : m_tables(tables) {}

    void startElement(QStringView tag, const QXmlStreamAttributes &attributes);
    void endElement();

private:
    enum class Kind {
        Root,    // the document element: not examined itself
        Plain,   // any other element: its children are walked
        Group,   // "group": collects the items inside it
        Item,    // "item": reads its "attrib" children
        Ignored, // inside an item: not walked
    };

    struct Frame
    {
        explicit Frame(Kind k) : kind(k) {}
        Kind kind;
        // Group: its name and items. Item: its name, value and level.
        QString name;
        QString value;
        QLatin1String level;
        bool readAttribs = false;
        QStringList items;
    };

    void readAttrib(Frame &item, const QXmlStreamAttributes &attributes);
    void closeGroup(const Frame &group);
    QStringList &currentItems();
    QMap<QString, QStringList> *sectionTable() const;

    UsageTables &m_tables;
    Section m_section = Section::None;
    // Items outside any group: they go with the next group that is stored.
    QStringList m_pendingItems;
    std::vector<Frame> m_stack;
    // Positions in m_stack of the open groups, innermost last.
    std::vector<size_t> m_groups;
};

QString attribute(const QXmlStreamAttributes &attributes, const char *name)
{
    return attributes.value(QLatin1String(name)).toString();
}

void UsageWalker::startElement(QStringView tag, const QXmlStreamAttributes &attributes)
{
    if (m_stack.empty()) {
        m_stack.emplace_back(Kind::Root);
        return;
    }
    Frame &parent = m_stack.back();
    if (parent.kind == Kind::Item || parent.kind == Kind::Ignored) {
        if (parent.kind == Kind::Item && parent.readAttribs && tag == QLatin1String("attrib"))
            readAttrib(parent, attributes);
        m_stack.emplace_back(Kind::Ignored);
        return;
    }

    if (tag == QLatin1String("item")) {
        Frame item(Kind::Item);
        item.name = attribute(attributes, "name");
        item.value = attribute(attributes, "value");
        item.level = QLatin1String("item1");
        // A value given on the item itself wins over its attribs.
        item.readAttribs = item.value.isEmpty();
        if (m_section == Section::ReportConfigData)
            ++m_tables.reportConfigDataCount;
        else if (m_section == Section::ReportPinData)
            ++m_tables.reportPinDataCount;
        m_stack.push_back(std::move(item));
    } else if (tag == QLatin1String("group")) {
        Frame group(Kind::Group);
        group.name = attribute(attributes, "name").trimmed();
        group.items.swap(m_pendingItems);
        m_groups.push_back(m_stack.size());
        m_stack.push_back(std::move(group));
    } else {
        // A section stays current until the next section element.
        const Section section = sectionOf(tag);
        if (section != Section::None)
            m_section = section;
        m_stack.emplace_back(Kind::Plain);
    }
}

void UsageWalker::endElement()
{
    if (m_stack.empty())
        return;
    Frame done = std::move(m_stack.back());
    m_stack.pop_back();
    if (done.kind == Kind::Item) {
        currentItems().append(QLatin1String("<dtag-") % done.level % QLatin1Char('>') % done.name
                              % QLatin1Char('=') % done.value % QLatin1String("</dtag-") % done.level
                              % QLatin1Char('>'));
    } else if (done.kind == Kind::Group) {
        m_groups.pop_back();
        closeGroup(done);
    }
}

QStringList &UsageWalker::currentItems()
{
    return m_groups.empty() ? m_pendingItems : m_stack[m_groups.back()].items;
}

QMap<QString, QStringList> *UsageWalker::sectionTable() const
{
    switch (m_section) {
    case Section::DesignStatistics:
        return &m_tables.designStatistics;
    case Section::DeviceUsage:
        return &m_tables.deviceUsage;
    case Section::ReportConfigData:
        return &m_tables.reportConfigData;
    case Section::ReportPinData:
        return &m_tables.reportPinData;
    case Section::None:
        break;
    }
    return nullptr;
}

void UsageWalker::closeGroup(const Frame &group)
{
    if (QMap<QString, QStringList> *table = sectionTable()) {
        table->insert(group.name, group.items);
        return;
    }
    // Not stored outside a section: the items wait for the next stored group.
    currentItems() += group.items;
}

// The attribs apply one after another: a later one overrides what an earlier
// one set.
void UsageWalker::readAttrib(Frame &item, const QXmlStreamAttributes &attributes)
{
    const QString aname = attribute(attributes, "name");
    const QString avalue = attribute(attributes, "value");
    if (aname == QLatin1String("value")) {
        item.value = avalue;
    } else if (aname == QLatin1String("total")) {
        // shown only together with "used"
    } else if (aname == QLatin1String("used")) {
        item.level = QLatin1String("item2");
        item.value = avalue;
    } else {
        item.level = QLatin1String("item3");
        if (!item.value.isEmpty())
            item.value += QLatin1Char(' ');
        item.value += QLatin1Char('[') % aname % QLatin1Char(':') % avalue % QLatin1Char(']');
    }
}

// A group's head line and, when it has a name and items, its list line.
void appendGroupHead(CrvC_Lines &lines, const QString &name, const QStringList &items)
{
    lines << CrvC_Markup::groupHead(name);
    if (!name.isEmpty() && !items.isEmpty())
        lines << CrvC_Markup::itemList(items);
}

const QLatin1String CellBreak("</TD><TD>");

// The Configuration Data and Pin Data tables: the groups are spread over
// cells, aiming at four columns of about count / 4 items each.
void appendSpreadTable(const char *title, const QMap<QString, QStringList> &table, qint32 count,
                       CrvC_Lines &lines)
{
    lines << QLatin1String("&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>")
          << QLatin1String("<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=4><B>") % QLatin1String(title)
                 % QLatin1String("</B></TD></TR><TR VALIGN=TOP>")
          << QStringLiteral("<dtag-section name=\"ReportConfigData\">") << QStringLiteral("<TD>");
    const qint32 limit = count / 4;
    qint64 running = 0;
    for (auto it = table.cbegin(); it != table.cend(); ++it) {
        if (it.key().isEmpty())
            continue;
        appendGroupHead(lines, it.key(), it.value());
        if (!it.value().isEmpty()) {
            running += it.value().size();
            if (running >= limit) {
                lines << CellBreak;
                running = 0;
            }
        }
        lines << CrvC_Markup::groupEnd();
    }
    lines << QStringLiteral("</TD>") << QStringLiteral("</dtag-section>") << QStringLiteral("</TR></TABLE>");
}

} // namespace

bool CrvC_UsageXml::readUsageXml(const QString &path, CrvC_ReportData &data)
{
    data.usageXmlPath = path;
    Port::InputFile file;
    if (Port::XmlGuard::open(path, Port::InputFile::UsageXml, file) != Port::XmlGuard::Outcome::Accepted)
        return false;

    // Filled on the side: a document that turns out to be malformed, or
    // nested deeper than any real report, leaves the tables as they were.
    UsageTables tables(data);
    UsageWalker walker(tables);
    QXmlStreamReader reader(&file);
    reader.setNamespaceProcessing(false);
    int depth = 0;
    while (!reader.atEnd()) {
        switch (Port::XmlGuard::readNext(reader, depth)) {
        case QXmlStreamReader::StartElement:
            walker.startElement(reader.qualifiedName(), reader.attributes());
            break;
        case QXmlStreamReader::EndElement:
            walker.endElement();
            break;
        default:
            break;
        }
    }
    if (reader.hasError() || file.refused())
        return false;
    tables.storeInto(data);
    return true;
}

void CrvC_UsageXml::appendTables(const CrvC_ReportData &data, QStringList &lines)
{
    CrvC_Lines out(lines);
    appendTables(data, out);
}

void CrvC_UsageXml::appendTables(const CrvC_ReportData &data, CrvC_Lines &lines)
{
    lines << QStringLiteral("&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>")
          << QStringLiteral(
                 "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=4><B>Device Usage "
                 "Statistics</B></TD></TR>")
          << QStringLiteral(
                 "<TR ALIGN=CENTER BGCOLOR='#FFFF99'><TD><B>Macro Statistics</B></TD>"
                 "<TD><B>Miscellaneous Statistics</B></TD><TD><B>Net Statistics</B>"
                 "</TD><TD><B>Site Usage</B></TD></TR><TR VALIGN=TOP>")
          << CrvC_SynthesisReport::macroStatisticsCell(data);

    // Miscellaneous and net statistics: every "NetStatistics..." group opens
    // a further cell.
    if (data.designStatistics.isEmpty()) {
        lines << QStringLiteral("<TD>&nbsp;</TD><TD>&nbsp;</TD>");
    } else {
        lines << QStringLiteral("<dtag-section name=\"DesignStatistics\">") << QStringLiteral("<TD>");
        for (auto it = data.designStatistics.cbegin(); it != data.designStatistics.cend(); ++it) {
            if (it.key().startsWith(QLatin1String("NetStatistics"), Qt::CaseInsensitive))
                lines << CellBreak;
            appendGroupHead(lines, it.key(), it.value());
            lines << CrvC_Markup::groupEnd();
        }
        lines << QStringLiteral("</TD>") << QStringLiteral("</dtag-section>");
    }

    if (data.deviceUsage.isEmpty()) {
        lines << QStringLiteral("<TD>&nbsp;</TD>");
    } else {
        lines << QStringLiteral("<dtag-section name=\"DeviceUsage\">") << QStringLiteral("<TD>");
        for (auto it = data.deviceUsage.cbegin(); it != data.deviceUsage.cend(); ++it) {
            appendGroupHead(lines, it.key(), it.value());
            lines << CrvC_Markup::groupEnd();
        }
        lines << QStringLiteral("</TD>") << QStringLiteral("</dtag-section>");
    }
    lines << QStringLiteral("</TR></TABLE>");

    if (!data.reportConfigData.isEmpty())
        appendSpreadTable("Configuration Data", data.reportConfigData, data.reportConfigDataCount, lines);
    // The pin data carry the configuration data's section name.
    if (!data.reportPinData.isEmpty())
        appendSpreadTable("Pin Data", data.reportPinData, data.reportPinDataCount, lines);
}
