#include "CoresStatistics.h"
#include "XmlDepthGuard.h"

#include <algorithm>
#include <initializer_list>

namespace {

const QLatin1String ScopeTag("scope");
const QLatin1String ItemTag("item");
const QLatin1String StringIdAttribute("stringID");

void appendTagged(CrvC_SectionBuffer &text, QLatin1String tag, QStringView value)
{
    if (tag.isEmpty()) {
        text += value;
        return;
    }
    const QByteArrayView name(tag.data(), tag.size());
    text += '<';
    text += name;
    text += '>';
    text += value;
    text += QByteArrayView("</");
    text += name;
    text += '>';
}

} // namespace

CrvC_CoresStatistics::CrvC_CoresStatistics() = default;
CrvC_CoresStatistics::~CrvC_CoresStatistics() = default;

bool CrvC_CoresStatistics::startDocument()
{
    m_inInstance = false;
    return true;
}

bool CrvC_CoresStatistics::startElement(const QString &, const QString &, const QString &qName,
                                        const QXmlAttributes &atts)
{
    const QString stringId = atts.value(StringIdAttribute);
    if (qName == ScopeTag && stringId == QLatin1String("LNKGEN_CORE_INSTANCE")) {
        startInstance();
        return true;
    }
    if (!m_inInstance || qName != ItemTag)
        return true;

    if (stringId == QLatin1String("LNKGEN_CORE_INFO")) {
        appendPair(QLatin1String(), u"Core Type", QLatin1String("dtag-core-type-name"),
                   atts.value(QLatin1String("type")));
        appendParameters(atts, {QLatin1String("type"), QLatin1String("value"), StringIdAttribute});
    } else if (stringId == QLatin1String("LNKGEN_CORE_PARAMETERS")) {
        appendParameters(atts, {StringIdAttribute, QLatin1String("value"), QLatin1String("component_name"),
                                QLatin1String("unregistered")});
    }
    return true;
}

bool CrvC_CoresStatistics::endElement(const QString &, const QString &, const QString &qName)
{
    if (qName == ScopeTag)
        m_inInstance = false;
    return true;
}

bool CrvC_CoresStatistics::characters(const QString &)
{
    return true;
}

void CrvC_CoresStatistics::startInstance()
{
    if (m_pairs < 0) {
        *m_text += QByteArrayView(
            "&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>\n"
            "<dtag-section name=\"CorelibStatistics\">\n"
            "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=4>"
            "<B>Core Statistics</B></TD></TR>\n");
    } else {
        endInstance();
    }
    m_inInstance = true;
    m_pairs = 0;
}

// An instance without pairs still opens its row.
void CrvC_CoresStatistics::endInstance()
{
    if (m_pairs == 0)
        *m_text += QByteArrayView("<TR>\n");
}

void CrvC_CoresStatistics::appendPair(QLatin1String nameTag, QStringView name, QLatin1String valueTag,
                                      QStringView value)
{
    // Each block's last row is left open; the closing "</TR>" of the
    // section ends only the last one.
    const qsizetype cell = m_pairs - 1;
    if (cell < 0) {
        *m_text += QByteArrayView("<TR ALIGN=CENTER><TD COLSPAN=4><B>");
    } else {
        if (cell > 0 && cell % 4 == 0)
            *m_text += QByteArrayView("\n</TR><TR>");
        *m_text += QByteArrayView("<TD>");
    }
    appendTagged(*m_text, nameTag, name);
    *m_text += '=';
    appendTagged(*m_text, valueTag, value);
    *m_text += QByteArrayView(cell < 0 ? "</B></TD></TR>\n<TR>\n" : "</TD>\n");
    ++m_pairs;
}

void CrvC_CoresStatistics::appendParameters(const QXmlAttributes &atts,
                                            std::initializer_list<QLatin1String> skipped)
{
    for (int i = 0; i < atts.count(); ++i) {
        const QString name = atts.qName(i);
        if (std::find(skipped.begin(), skipped.end(), name) == skipped.end())
            appendPair(QLatin1String("dtag-core-param-name"), name, QLatin1String("dtag-core-param-value"),
                       atts.value(i));
    }
}

void CrvC_CoresStatistics::writeSection(const QString &path, CrvC_SectionBuffer &out)
{
    out.clear();
    m_text = &out;
    m_inInstance = false;
    m_pairs = -1;
    // A refused document counts as unreadable, whatever was collected.
    if (CrvC_XmlDepthGuard::parseFile(path, Port::InputFile::CoreReport, *this)
        == CrvC_XmlDepthGuard::Outcome::Refused) {
        out.clear();
    } else if (m_pairs >= 0) {
        endInstance();
        out += QByteArrayView("</TR></dtag-section></TABLE>");
    }
    m_text = nullptr;
}

QByteArray CrvC_CoresStatistics::sectionText(const QString &path)
{
    CrvC_SectionBuffer text;
    writeSection(path, text);
    return text.takeAll();
}
