#include "CoresStatistics.h"
#include "XmlDepthGuard.h"

#include <algorithm>
#include <initializer_list>

namespace {

const QLatin1String ScopeTag("scope");
const QLatin1String ItemTag("item");
const QLatin1String StringIdAttribute("stringID");

CrvC_CoresStatistics::Parameter parameter(const QString &name, const QString &value)
{
    return { QLatin1String("<dtag-core-param-name>") + name + QLatin1String("</dtag-core-param-name>"),
             QLatin1String("<dtag-core-param-value>") + value
                 + QLatin1String("</dtag-core-param-value>") };
}

// Appends a parameter pair for every attribute of `atts`, in attribute order,
// except those named in `skipped`.
void appendParameters(CrvC_CoresStatistics::CoreInstance &instance, const QXmlAttributes &atts,
                      std::initializer_list<QLatin1String> skipped)
{
    for (int i = 0; i < atts.count(); ++i) {
        const QString name = atts.qName(i);
        if (std::find(skipped.begin(), skipped.end(), name) == skipped.end())
            instance.append(parameter(name, atts.value(i)));
    }
}

} // namespace

CrvC_CoresStatistics::CrvC_CoresStatistics() = default;
CrvC_CoresStatistics::~CrvC_CoresStatistics() = default;

bool CrvC_CoresStatistics::startDocument()
{
    m_currentInstance = -1;
    return true;
}

bool CrvC_CoresStatistics::startElement(const QString &, const QString &, const QString &qName,
                                        const QXmlAttributes &atts)
{
    const QString stringId = atts.value(StringIdAttribute);
    if (qName == ScopeTag && stringId == QLatin1String("LNKGEN_CORE_INSTANCE")) {
        m_coreInstances.append(CoreInstance());
        m_currentInstance = m_coreInstances.size() - 1;
        return true;
    }
    if (m_currentInstance < 0 || qName != ItemTag)
        return true;

    CoreInstance &instance = m_coreInstances[m_currentInstance];
    if (stringId == QLatin1String("LNKGEN_CORE_INFO")) {
        instance.append({ QStringLiteral("Core Type"),
                          QLatin1String("<dtag-core-type-name>") + atts.value(QLatin1String("type"))
                              + QLatin1String("</dtag-core-type-name>") });
        appendParameters(instance, atts,
                         { QLatin1String("type"), QLatin1String("value"), StringIdAttribute });
    } else if (stringId == QLatin1String("LNKGEN_CORE_PARAMETERS")) {
        appendParameters(instance, atts,
                         { StringIdAttribute, QLatin1String("value"),
                           QLatin1String("component_name"), QLatin1String("unregistered") });
    }
    return true;
}

bool CrvC_CoresStatistics::endElement(const QString &, const QString &, const QString &qName)
{
    if (qName == ScopeTag)
        m_currentInstance = -1;
    return true;
}

bool CrvC_CoresStatistics::characters(const QString &)
{
    return true;
}

QString CrvC_CoresStatistics::sectionText(const QString &path)
{
    m_fileName = path;
    parse();
    return sectionFromInstances();
}

void CrvC_CoresStatistics::parse()
{
    m_coreInstances.clear();
    m_currentInstance = -1;
    // A refused document counts as unreadable, whatever was collected.
    if (CrvC_XmlDepthGuard::parseFile(m_fileName, Port::InputFile::CoreReport, *this)
        == CrvC_XmlDepthGuard::Outcome::Refused)
        m_coreInstances.clear();
}

QString CrvC_CoresStatistics::sectionFromInstances() const
{
    if (m_coreInstances.isEmpty())
        return QString();

    QString text = QLatin1String("&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>\n"
                                 "<dtag-section name=\"CorelibStatistics\">\n"
                                 "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=4>"
                                 "<B>Core Statistics</B></TD></TR>\n");
    for (const CoreInstance &instance : m_coreInstances) {
        // The first pair is the block's title; the rest stand four to a row.
        // Each block's last row is left open; the closing "</TR>" below ends
        // only the last one.
        if (!instance.isEmpty()) {
            text += QLatin1String("<TR ALIGN=CENTER><TD COLSPAN=4><B>") + instance.first().first
                + QLatin1Char('=') + instance.first().second + QLatin1String("</B></TD></TR>\n");
        }
        text += QLatin1String("<TR>\n");
        for (qsizetype i = 1; i < instance.size(); ++i) {
            const qsizetype cell = i - 1;
            if (cell > 0 && cell % 4 == 0)
                text += QLatin1String("\n</TR><TR>");
            text += QLatin1String("<TD>") + instance.at(i).first + QLatin1Char('=')
                + instance.at(i).second + QLatin1String("</TD>\n");
        }
    }
    text += QLatin1String("</TR></dtag-section></TABLE>");
    return text;
}
