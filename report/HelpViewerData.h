#pragma once

#include <QtCore5Compat/QXmlDefaultHandler>

#include <QList>
#include <QPair>
#include <QString>

class CrvC_SectionBuffer;

// The help viewer's record of the user's searches (with and without results)
// and opened help files, each with a count, as the help statistics section.
// Reads the help viewer's usage file when constructed.
//
// The file is <base>/Vantor/Common/<version>/orbhelpviewerdata.xml, where
// <version> is the first four characters of the build value "version" and
// <base> is the first of these that is set and not empty:
//   - the environment variable APPDATA,
//   - the environment variable TEMP,
//   - the per-user data location, QStandardPaths::GenericDataLocation; on
//     Linux $XDG_DATA_HOME, by default ~/.local/share, so the file is
//     ~/.local/share/Vantor/Common/<version>/orbhelpviewerdata.xml.
//
// Content handler of a SAX parse: <SearchString found="true" count="3">word
// </SearchString> and <OpenHelpFile count="2">file</OpenHelpFile>.
class CrvC_HelpViewerData : public QXmlDefaultHandler
{
public:
    // A search word or help file and how often it was used.
    using Entry = QPair<QString, qint32>;

    CrvC_HelpViewerData();
    ~CrvC_HelpViewerData() override;

    bool startDocument() override;
    bool startElement(const QString &namespaceURI, const QString &localName, const QString &qName,
                      const QXmlAttributes &atts) override;
    bool endElement(const QString &namespaceURI, const QString &localName, const QString &qName) override;
    bool characters(const QString &ch) override;

    // Writes the section to `out` as UTF-8: nothing when nothing was read
    // (missing file, no entries, or a file refused as too large or too
    // deeply nested). A malformed file gives the entries read before the error.
    void writeSection(CrvC_SectionBuffer &out) const;
    // The same section as one text.
    QString sectionText() const;

    // Where the help viewer's usage file is looked for; empty when no base
    // location is known.
    static QString helpFilePath();

private:
    QList<Entry> m_searchFoundList;
    QList<Entry> m_searchNotFoundList;
    QList<Entry> m_openedHelpFiles;
    QString m_elementText;
    QString m_foundValue;
    QString m_countValue;
};
