#pragma once

#include "host/gui/Dialog.h"
#include "report/ReportBuilder.h"

#include <QUrl>

class CrvC_DataCollectionHtmlViewer;
class QPushButton;
class QTabWidget;

// The review dialog: the user reads what is about to be sent (tabs
// Introduction, Contents, Help) and sends it or declines. It owns the report
// builder of its report and supplies the builder's hooks (the design-name
// prompt, the wait cursor); the Contents tab shows the built page, and a page
// too large for the viewer only in its beginning, with a link that opens the
// whole page in the web browser.
//
// exec() answers Accepted after "Send to Vantor" (the send step has then
// already started) and Rejected after "Decline", Escape or closing.
class CrvC_DataCollectionDialog : public Gui::Clip::Dialog
{
    Q_OBJECT
public:
    enum Tab { IntroductionTab = 0, ContentsTab = 1, HelpTab = 2 };

    // Pages longer than this (in characters) are shown cut in the Contents tab.
    static const int ContentsLimit;
    // The link of a cut page that opens the whole page (browseContents).
    static const char *const BrowseContentsUrl;

    explicit CrvC_DataCollectionDialog(QWidget *parent = nullptr, const char *name = nullptr,
                                       bool modal = true, Qt::WindowFlags flags = Qt::WindowFlags());
    ~CrvC_DataCollectionDialog() override;

    // Builds the report of `projectFile` and `designName` (asking the user
    // for the design name when it is empty), writes it to reportPath() and
    // shows it in the Contents tab.
    void createReport(const QString &projectFile, const QString &designName,
                      const QString &targetFamily);

    // Where the page is written: the project directory's
    // device_usage_statistics.html, fixed when the dialog was made.
    QString reportPath() const;
    CrvC_ReportBuilder &builder() { return m_builder; }
    // Shows the page of the last build in the Contents tab (createReport
    // does this itself).
    void showContents();
    // True when the Contents tab shows only the beginning of the page.
    bool contentsCut() const { return m_contentsCut; }

    // What the Contents tab shows for `page`: the page itself, or, above
    // ContentsLimit, its beginning (cut at a line end) followed by the link
    // to the whole page; `cut` tells which.
    static QString contentsText(const QString &page, bool *cut = nullptr);

    QTabWidget *tabWidget() const { return m_tabWidget; }
    CrvC_DataCollectionHtmlViewer *introductionViewer() const { return m_introductionViewer; }
    CrvC_DataCollectionHtmlViewer *contentsViewer() const { return m_contentsViewer; }
    CrvC_DataCollectionHtmlViewer *helpViewer() const { return m_helpViewer; }
    QPushButton *sendButton() const { return m_sendButton; }
    QPushButton *verifyButton() const { return m_verifyButton; }
    QPushButton *declineButton() const { return m_declineButton; }
    QPushButton *helpButton() const { return m_helpButton; }

public Q_SLOTS:
    // The send step: the send method decision, then the project's send
    // counter grows by one whatever the outcome.
    void sendData();
    void verifyContents();
    // Opens the whole report file in the web browser.
    void browseContents();
    void decline();
    void getHelp();
    // Opens `url` in the web browser; the page in the tab stays.
    void onAnchorClicked(const QUrl &url);

private:
    void onContentsAnchorClicked(const QUrl &url);
    CrvC_ReportBuilder::Environment builderEnvironment();

    CrvC_ReportBuilder m_builder;
    QString m_designName; // of the last build, for the send history
    QTabWidget *m_tabWidget = nullptr;
    CrvC_DataCollectionHtmlViewer *m_introductionViewer = nullptr;
    CrvC_DataCollectionHtmlViewer *m_contentsViewer = nullptr;
    CrvC_DataCollectionHtmlViewer *m_helpViewer = nullptr;
    QPushButton *m_sendButton = nullptr;
    QPushButton *m_verifyButton = nullptr;
    QPushButton *m_declineButton = nullptr;
    QPushButton *m_helpButton = nullptr;
    bool m_contentsCut = false;
};
