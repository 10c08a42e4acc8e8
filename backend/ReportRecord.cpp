#include "ReportRecord.h"

#include <QHash>
#include <QRegularExpression>
#include <QSet>

namespace {

using Value = CrvB_PageReader::Value;

// Elements that come in pairs on the page: the first's value is always
// followed at once by the second's.
const QHash<QString, QString> &pairs()
{
    static const QHash<QString, QString> map = {
        {QStringLiteral("dtag-core-param-name"), QStringLiteral("dtag-core-param-value")},
        {QStringLiteral("dtag-design-property-name"), QStringLiteral("dtag-design-property-value")},
        {QStringLiteral("dtag-process-property-name"), QStringLiteral("dtag-process-property-value")},
        {QStringLiteral("dtag-design-source-type-name"), QStringLiteral("dtag-design-source-type-count")},
        {QStringLiteral("dtag-search-item"), QStringLiteral("dtag-count-property")},
    };
    return map;
}

const QString runPrefix = QStringLiteral("dtag-run-");
const QStringList runFields = {QStringLiteral("count"),         QStringLiteral("completed"),
                               QStringLiteral("failed"),        QStringLiteral("cancelled"),
                               QStringLiteral("total-seconds"), QStringLiteral("average-seconds"),
                               QStringLiteral("last-date")};

QString section(const Value &value)
{
    static const QString prefix = QStringLiteral("dtag-section:");
    for (auto it = value.path.crbegin(); it != value.path.crend(); ++it)
        if (it->startsWith(prefix))
            return it->mid(prefix.size());
    return QString();
}

QStringList optionsOf(const QString &line)
{
    static const QRegularExpression option(QStringLiteral("^--?[A-Za-z]"));
    QStringList options;
    for (const QString &word : line.split(QLatin1Char(' '), Qt::SkipEmptyParts))
        if (option.match(word).hasMatch() && !options.contains(word))
            options.append(word);
    return options;
}

class Sorter
{
public:
    Sorter(CrvB_ReportRecord &record) : r(record) {}

    bool add(const Value &v, const Value *next, QString *reason)
    {
        const QString text = v.value.trimmed();
        const auto pair = pairs().constFind(v.tag);
        if (pair != pairs().cend() && (!next || next->tag != pair.value()))
            return fail(reason, QStringLiteral("<%1> is not followed by <%2>").arg(v.tag, pair.value()));
        if (m_pairSecond == v.tag) {
            m_pairSecond.clear();
            return true; // taken with its first
        }
        for (auto it = pairs().cbegin(); it != pairs().cend(); ++it)
            if (it.value() == v.tag)
                return fail(reason, QStringLiteral("<%1> does not follow <%2>").arg(v.tag, it.key()));
        if (pair != pairs().cend()) {
            m_pairSecond = pair.value();
            pairOf(v, text, next->value.trimmed());
            return true;
        }

        if (v.tag == QLatin1String("dtag-property") && v.hasName) {
            if (!m_properties.contains(v.name)) {
                m_properties.insert(v.name);
                const auto column = CrvB_ReportRecord::propertyColumns().constFind(v.name);
                if (column == CrvB_ReportRecord::propertyColumns().cend())
                    other(v, text);
                else
                    r.properties.insert(column.value(), text);
                return true;
            }
            return fail(reason, QStringLiteral("the property \"%1\" is given twice").arg(v.name));
        }
        if (v.tag == QLatin1String("dtag-group-name"))
            return groupName(v, text, reason);
        if (v.tag.startsWith(QLatin1String("dtag-item")) && m_groupOfElement.contains(v.parent)) {
            bool ok = false;
            const int level = v.tag.mid(9).toInt(&ok);
            if (ok && level >= 1 && level <= 3) {
                const int split = text.indexOf(QLatin1Char('='));
                r.items.append({m_groupOfElement.value(v.parent), level, split < 0 ? text : text.left(split),
                                split < 0 ? QString() : text.mid(split + 1)});
                return true;
            }
        }
        if (v.tag == QLatin1String("dtag-cmdline")) {
            r.commandLines.append({text.section(QLatin1Char(' '), 0, 0, QString::SectionSkipEmpty), text,
                                   optionsOf(text)});
            return true;
        }
        if (v.tag == QLatin1String("dtag-core-type-name")) {
            r.cores.append(text);
            return true;
        }
        if (v.tag.startsWith(runPrefix))
            return run(v.tag.mid(runPrefix.size()), text, reason, v);
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
        r.others.append({v.tag, v.hasName ? QVariant(v.name) : QVariant(),
                         v.path.join(QLatin1Char('/')), text});
    }

    void pairOf(const Value &v, const QString &first, const QString &second)
    {
        const QString &tag = v.tag;
        if (tag == QLatin1String("dtag-core-param-name")) {
            if (r.cores.isEmpty())
                r.cores.append(QString());
            r.coreParameters.append({int(r.cores.size()) - 1, first, second});
        } else if (tag == QLatin1String("dtag-design-property-name")) {
            r.projectProperties.append({QStringLiteral("design"), first, second});
        } else if (tag == QLatin1String("dtag-process-property-name")) {
            r.projectProperties.append({QStringLiteral("process"), first, second});
        } else if (tag == QLatin1String("dtag-design-source-type-name")) {
            r.sourceTypes.append({first, CrvB_ReportRecord::integer(second)});
        } else {
            r.helpEntries.append({m_helpList.value(v.parent), first, CrvB_ReportRecord::integer(second)});
        }
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

    bool run(const QString &field, const QString &text, QString *reason, const Value &v)
    {
        if (field == QLatin1String("tool")) {
            r.runs.append(CrvB_ReportRecord::Run());
            r.runs.last().tool = text;
            m_runFields.clear();
            return true;
        }
        if (!runFields.contains(field)) {
            other(v, text);
            return true;
        }
        if (r.runs.isEmpty() || m_runFields.contains(field))
            return fail(reason, QStringLiteral("<%1> out of place").arg(v.tag));
        m_runFields.insert(field);
        CrvB_ReportRecord::Run &row = r.runs.last();
        const int index = runFields.indexOf(field);
        QVariant *const columns[] = {&row.runs,         &row.completed,      &row.failed, &row.cancelled,
                                   &row.totalSeconds, &row.averageSeconds, nullptr};
        if (columns[index])
            *columns[index] = index >= 4 ? CrvB_ReportRecord::number(text) : CrvB_ReportRecord::integer(text);
        else
            row.lastRun = text;
        return true;
    }

    CrvB_ReportRecord &r;
    QString m_pairSecond;             // the second of a pair whose first was just taken
    QSet<QString> m_properties;       // property names seen
    QHash<int, int> m_groupOfElement; // dtag-group element -> index into groups
    QHash<int, QString> m_helpList;   // help dtag-group element -> its list name
    QSet<QString> m_runFields;        // fields of the current run row
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
