#pragma once

#include <QTextBrowser>

// The page viewer of the review dialog's tabs: a sunken panel that shows HTML
// black on white whatever the desktop's colour scheme.
class CrvC_DataCollectionHtmlViewer : public QTextBrowser
{
    Q_OBJECT
public:
    explicit CrvC_DataCollectionHtmlViewer(QWidget *parent = nullptr);
    ~CrvC_DataCollectionHtmlViewer() override;
};
