#pragma once

#include <QtCore5Compat/QXmlDefaultHandler>

#include <QString>

// The help viewer's searches and opened help files (orbhelpviewerdata.xml in
// the user's profile) as the help statistics section. Reads the file when
// constructed.
class CrvC_HelpViewerData : public QXmlDefaultHandler
{
public:
    CrvC_HelpViewerData();
    ~CrvC_HelpViewerData() override;

    // The section text; empty when nothing was read.
    QString sectionText() const;
};
