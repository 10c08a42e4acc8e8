#include "HelpViewerData.h"
#include "SectionBuffer.h"
#include "XmlDepthGuard.h"

#include "host/String.h"
#include "host/Version.h"

#include <QStandardPaths>

namespace {

const QLatin1String SearchStringTag("SearchString");
const QLatin1String OpenHelpFileTag("OpenHelpFile");

// Appends one group of the table: its head, its entries two to a row, and
// its end.
void appendGroup(CrvC_SectionBuffer &text, const QList<CrvC_HelpViewerData::Entry> &entries, const char *head,
                 const char *itemClose)
{
    if (entries.isEmpty())
        return;
    text += QByteArrayView(head);
    for (qsizetype i = 0; i < entries.size(); ++i) {
        if (i > 0 && i % 2 == 0)
            text += QByteArrayView("\n</TR><TR>");
        text += QByteArrayView("<TD><dtag-search-item>");
        text += QStringView(entries.at(i).first);
        text += QByteArrayView(itemClose);
        text += QByteArrayView(QByteArray::number(entries.at(i).second));
        text += QByteArrayView("</dtag-count-property> )</TD>\n");
    }
    text += QByteArrayView("</TR></dtag-group>");
}

} // namespace

CrvC_HelpViewerData::CrvC_HelpViewerData()
{
    if (CrvC_XmlDepthGuard::parseFile(helpFilePath(), Port::InputFile::HelpViewerData, *this)
        == CrvC_XmlDepthGuard::Outcome::Refused) {
        m_searchFoundList.clear();
        m_searchNotFoundList.clear();
        m_openedHelpFiles.clear();
    }
}

CrvC_HelpViewerData::~CrvC_HelpViewerData() = default;

QString CrvC_HelpViewerData::helpFilePath()
{
    QString base = qEnvironmentVariable("APPDATA");
    if (base.isEmpty())
        base = qEnvironmentVariable("TEMP");
    if (base.isEmpty())
        base = QStandardPaths::writableLocation(QStandardPaths::GenericDataLocation);
    if (base.isEmpty())
        return QString();
    const QString version = Gui::Clip::String::convert(Port::Version::getValue("version"));
    return base + QLatin1String("/Vantor/Common/") + version.left(4)
           + QLatin1String("/orbhelpviewerdata.xml");
}

bool CrvC_HelpViewerData::startDocument()
{
    return true;
}

bool CrvC_HelpViewerData::startElement(const QString &, const QString &, const QString &qName,
                                       const QXmlAttributes &atts)
{
    if (qName == SearchStringTag) {
        m_foundValue = atts.value(QLatin1String("found"));
        m_countValue = atts.value(QLatin1String("count"));
    } else if (qName == OpenHelpFileTag) {
        m_countValue = atts.value(QLatin1String("count"));
    }
    return true;
}

bool CrvC_HelpViewerData::endElement(const QString &, const QString &, const QString &qName)
{
    if (qName == SearchStringTag || qName == OpenHelpFileTag) {
        // Not a number counts as 0.
        const Entry entry(m_elementText.trimmed(), m_countValue.toInt(nullptr, 10));
        if (qName == OpenHelpFileTag)
            m_openedHelpFiles.append(entry);
        else if (m_foundValue == QLatin1String("true"))
            m_searchFoundList.append(entry);
        else
            m_searchNotFoundList.append(entry);
    }
    m_elementText.clear();
    return true;
}

bool CrvC_HelpViewerData::characters(const QString &ch)
{
    m_elementText += ch;
    return true;
}

QString CrvC_HelpViewerData::sectionText() const
{
    CrvC_SectionBuffer text;
    writeSection(text);
    return QString::fromUtf8(text.takeAll());
}

void CrvC_HelpViewerData::writeSection(CrvC_SectionBuffer &text) const
{
    if (m_searchFoundList.isEmpty() && m_searchNotFoundList.isEmpty() && m_openedHelpFiles.isEmpty())
        return;

    text += QByteArrayView(
        "&nbsp;<BR><TABLE BORDER CELLSPACING=0 WIDTH='100%'>\n"
        "<dtag-section name=\"OrbHelpViewerData\">\n"
        "<TR ALIGN=CENTER BGCOLOR='#99CCFF'><TD COLSPAN=2>"
        "<B>Help Statistics</B></TD></TR>\n");
    appendGroup(text, m_searchFoundList,
                "<TR ALIGN=LEFT><TD COLSPAN=2><dtag-group><B>"
                "<dtag-group-name name=\"SearchFoundList\">\n"
                "Search words with results</dtag-group-name></B></TD></TR>\n<TR>",
                " </dtag-search-item> ( <dtag-count-property>");
    appendGroup(text, m_searchNotFoundList,
                "<TR ALIGN=LEFT><TD COLSPAN=2><dtag-group><B>"
                "<dtag-group-name name=\"SearchNotFoundList\">\n"
                "Unsuccessful Search words</dtag-group-name></B></TD></TR>\n<TR>",
                "</dtag-search-item> ( <dtag-count-property>");
    appendGroup(text, m_openedHelpFiles,
                "<TR VALIGN=TOP><TD COLSPAN=2><dtag-group><B>"
                "<dtag-group-name name=\"OpenedHelpFiles\">\n"
                "Help files</dtag-group-name></B></TD></TR>\n<TR>",
                "</dtag-search-item> ( <dtag-count-property>");
    text += QByteArrayView("</dtag-section></TABLE>");
}
