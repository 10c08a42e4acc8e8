#include "ReportRecord.h"

#include <QHash>
#include <QSet>

namespace {

using Value = CrvB_PageReader::Value;

// What each element of the page is to the store. Elements of the pairs come
// one after the other: the first's value is always followed at once by the
// second's.
enum class Kind {
    Other,
    PairFirst,
    PairSecond,
    Property,
    GroupName,
    Item,
    CommandLine,
    CoreType,
    RunTool,
    RunField
};

struct Role
{
    Kind kind = Kind::Other;
    int index = 0; // the pair, the item level or the run field
};

const char *const pairNames[][2] = {
    {"dtag-core-param-name", "dtag-core-param-value"},
    {"dtag-design-property-name", "dtag-design-property-value"},
    {"dtag-process-property-name", "dtag-process-property-value"},
    {"dtag-design-source-type-name", "dtag-design-source-type-count"},
    {"dtag-search-item", "dtag-count-property"},
};
enum Pair { CoreParameter, DesignProperty, ProcessProperty, SourceType, HelpEntry };

// The run statistics fields after "dtag-run-tool", in the order of CrvB_ReportRecord::Run.
const char *const runFieldNames[] = {
    "dtag-run-count",         "dtag-run-completed",       "dtag-run-failed",   "dtag-run-cancelled",
    "dtag-run-total-seconds", "dtag-run-average-seconds", "dtag-run-last-date"};

Role roleOf(const QString &tag)
{
    static const QHash<QString, Role> roles = [] {
        QHash<QString, Role> map;
        for (int i = 0; i < 5; ++i) {
            map.insert(QLatin1String(pairNames[i][0]), {Kind::PairFirst, i});
            map.insert(QLatin1String(pairNames[i][1]), {Kind::PairSecond, i});
        }
        for (int i = 0; i < 7; ++i)
            map.insert(QLatin1String(runFieldNames[i]), {Kind::RunField, i});
        for (int level = 1; level <= 3; ++level)
            map.insert(QStringLiteral("dtag-item%1").arg(level), {Kind::Item, level});
        map.insert(QStringLiteral("dtag-property"), {Kind::Property, 0});
        map.insert(QStringLiteral("dtag-group-name"), {Kind::GroupName, 0});
        map.insert(QStringLiteral("dtag-cmdline"), {Kind::CommandLine, 0});
        map.insert(QStringLiteral("dtag-core-type-name"), {Kind::CoreType, 0});
        map.insert(QStringLiteral("dtag-run-tool"), {Kind::RunTool, 0});
        return map;
    }();
    return roles.value(tag);
}

QString section(const Value &value)
{
    static const QString prefix = QStringLiteral("dtag-section:");
    for (auto it = value.path.crbegin(); it != value.path.crend(); ++it)
        if (it->startsWith(prefix))
            return it->mid(prefix.size());
    return QString();
}

// The distinct words of a command line that start with "-" or "--" and a
// letter, in order.
QStringList optionsOf(const QString &line)
{
    QStringList options;
    for (const QStringView word : QStringView(line).split(QLatin1Char(' '), Qt::SkipEmptyParts)) {
        const qsizetype dashes = word.startsWith(QLatin1String("--")) ? 2
            : word.startsWith(QLatin1Char('-'))                       ? 1
                                                                      : 0;
        if (dashes && word.size() > dashes && word.at(dashes).isLetter() && word.at(dashes).unicode() < 128
            && !options.contains(word))
            options.append(word.toString());
    }
    return options;
}

class Sorter
{
public:
    Sorter(CrvB_ReportRecord &record) : r(record) { }

    bool add(const Value &v, const Value *next, QString *reason)
    {
        const Role role = roleOf(v.tag);
        const QString text = v.value.trimmed();
        switch (role.kind) {
        case Kind::PairFirst:
            if (!next || next->tag != QLatin1String(pairNames[role.index][1]))
                return fail(reason,
                            QStringLiteral("<%1> is not followed by <%2>")
                                .arg(v.tag, QLatin1String(pairNames[role.index][1])));
            pairOf(Pair(role.index), v, text, next->value.trimmed());
            m_pairTaken = true;
            return true;
        case Kind::PairSecond:
            if (!m_pairTaken)
                return fail(reason,
                            QStringLiteral("<%1> does not follow <%2>")
                                .arg(v.tag, QLatin1String(pairNames[role.index][0])));
            m_pairTaken = false;
            return true;
        case Kind::Property:
            if (!v.hasName)
                break;
            if (m_properties.contains(v.name))
                return fail(reason, QStringLiteral("the property \"%1\" is given twice").arg(v.name));
            m_properties.insert(v.name);
            if (CrvB_ReportRecord::propertyColumns().contains(v.name))
                r.properties.insert(CrvB_ReportRecord::propertyColumns().value(v.name), text);
            else
                other(v, text);
            return true;
        case Kind::GroupName:
            return groupName(v, text, reason);
        case Kind::Item:
            if (!m_groupOfElement.contains(v.parent))
                break;
            item(m_groupOfElement.value(v.parent), role.index, text);
            return true;
        case Kind::CommandLine:
            r.commandLines.append(
                {text.section(QLatin1Char(' '), 0, 0, QString::SectionSkipEmpty), text, optionsOf(text)});
            return true;
        case Kind::CoreType:
            r.cores.append(text);
            return true;
        case Kind::RunTool:
            r.runs.append(CrvB_ReportRecord::Run());
            r.runs.last().tool = text;
            m_runFields = 0;
            return true;
        case Kind::RunField:
            return runField(role.index, text, reason, v);
        case Kind::Other:
            break;
        }
        other(v, text);
        return true;
    }

private:
    static bool fail(QString *reason, const QString &why)
    {
        if (reason)
            *reason = why;
        return false;
    }

    void other(const Value &v, const QString &text)
    {
        r.others.append(
            {v.tag, v.hasName ? QVariant(v.name) : QVariant(), v.path.join(QLatin1Char('/')), text});
    }

    void pairOf(Pair pair, const Value &v, const QString &first, const QString &second)
    {
        switch (pair) {
        case CoreParameter:
            if (r.cores.isEmpty())
                r.cores.append(QString());
            r.coreParameters.append({int(r.cores.size()) - 1, first, second});
            break;
        case DesignProperty:
            r.projectProperties.append({QStringLiteral("design"), first, second});
            break;
        case ProcessProperty:
            r.projectProperties.append({QStringLiteral("process"), first, second});
            break;
        case SourceType:
            r.sourceTypes.append({first, CrvB_ReportRecord::integer(second)});
            break;
        case HelpEntry:
            r.helpEntries.append({m_helpList.value(v.parent), first, CrvB_ReportRecord::integer(second)});
            break;
        }
    }

    void item(int group, int level, const QString &text)
    {
        const int split = int(text.indexOf(QLatin1Char('=')));
        r.items.append(
            {group, level, split < 0 ? text : text.left(split), split < 0 ? QString() : text.mid(split + 1)});
    }

    // A group's name: the help lists keep the key in the name attribute, the
    // usage tables show the name itself.
    bool groupName(const Value &v, const QString &text, QString *reason)
    {
        const QString sectionName = section(v);
        if (sectionName == QLatin1String("OrbHelpViewerData")) {
            if (m_helpList.contains(v.parent))
                return fail(reason, QStringLiteral("a help group is named twice"));
            m_helpList.insert(v.parent, v.hasName ? v.name : text);
            return true;
        }
        if (m_groupOfElement.contains(v.parent))
            return fail(reason, QStringLiteral("a group is named twice"));
        m_groupOfElement.insert(v.parent, int(r.groups.size()));
        r.groups.append({sectionName, text});
        return true;
    }

    bool runField(int field, const QString &text, QString *reason, const Value &v)
    {
        if (r.runs.isEmpty() || (m_runFields & (1u << field)))
            return fail(reason, QStringLiteral("<%1> out of place").arg(v.tag));
        m_runFields |= 1u << field;
        CrvB_ReportRecord::Run &row = r.runs.last();
        QVariant *const numbers[] = {&row.runs,      &row.completed,    &row.failed,
                                     &row.cancelled, &row.totalSeconds, &row.averageSeconds};
        if (field < 4)
            *numbers[field] = CrvB_ReportRecord::integer(text);
        else if (field < 6)
            *numbers[field] = CrvB_ReportRecord::number(text);
        else
            row.lastRun = text;
        return true;
    }

    CrvB_ReportRecord &r;
    bool m_pairTaken = false; // the value before was the first of a pair
    QSet<QString> m_properties; // property names seen
    QHash<int, int> m_groupOfElement; // dtag-group element -> index into groups
    QHash<int, QString> m_helpList; // help dtag-group element -> its list name
    uint m_runFields = 0; // fields of the current run row, one bit each
};

} // namespace

const QMap<QString, QString> &CrvB_ReportRecord::propertyColumns()
{
    static const QMap<QString, QString> columns = {
        {QStringLiteral("RandomID"), QStringLiteral("random_id")},
        {QStringLiteral("ProjectID"), QStringLiteral("project_id")},
        {QStringLiteral("ProjectIteration"), QStringLiteral("project_iteration")},
        {QStringLiteral("ProductVersion"), QStringLiteral("product_version")},
        {QStringLiteral("ProductConfiguration"), QStringLiteral("product_configuration")},
        {QStringLiteral("OSPlatform"), QStringLiteral("os_platform")},
        {QStringLiteral("TargetFamily"), QStringLiteral("target_family")},
        {QStringLiteral("TargetDevice"), QStringLiteral("target_device")},
        {QStringLiteral("TargetPackage"), QStringLiteral("target_package")},
        {QStringLiteral("TargetSpeed"), QStringLiteral("target_speed")},
        {QStringLiteral("RegistrationID"), QStringLiteral("registration_id")},
        {QStringLiteral("Date Generated"), QStringLiteral("date_generated")},
    };
    return columns;
}

bool CrvB_ReportRecord::fromValues(const QVector<CrvB_PageReader::Value> &values, CrvB_ReportRecord &record,
                                   QString *reason)
{
    record = CrvB_ReportRecord();
    Sorter sorter(record);
    for (qsizetype i = 0; i < values.size(); ++i) {
        if (!sorter.add(values.at(i), i + 1 < values.size() ? &values.at(i + 1) : nullptr, reason)) {
            record = CrvB_ReportRecord();
            return false;
        }
    }
    return true;
}

QVariant CrvB_ReportRecord::integer(const QString &text)
{
    bool ok = false;
    const qlonglong n = text.trimmed().toLongLong(&ok);
    return ok ? QVariant(n) : QVariant();
}

QVariant CrvB_ReportRecord::number(const QString &text)
{
    bool ok = false;
    const double n = text.trimmed().toDouble(&ok);
    return ok && qIsFinite(n) ? QVariant(n) : QVariant();
}
