#pragma once

#include "host/gui/Dialog.h"
#include "report/ReportBuilder.h"
#include "transmit/SendDispatcher.h"

#include <QUrl>

#include <memory>

class CrvC_BackgroundBuild;
class CrvC_DataCollectionHtmlViewer;
class QLabel;
class QPushButton;
class QTabWidget;

// The review dialog: the user reads what is about to be sent (tabs
// Introduction, Contents, Help) and sends it or declines. It owns the report
// builder of its report and supplies the builder's hooks (the design-name
// prompt, the wait cursor, a folder for the report's own copy of its page);
// the Contents tab shows the built page, and a page too large for the viewer
// only in its beginning, with a link that opens the whole page in the web
// browser. Where the view of the page would drop text, the tab shows the
// page's exact text instead. A line above the buttons says where the report
// goes and what travels with it.
//
// startReport() builds in the background: the dialog may be shown at once,
// says that the report is being built, and shows the page when it is ready;
// until then nothing can be sent.
//
// The send step sends the report's own copy of its page, so that a later
// report cannot change what this one sends; a page that is not sent loses
// its copy with the dialog. No button is the default: Enter never sends.
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
    void createReport(const QString &projectFile, const QString &designName, const QString &targetFamily);
    // The same in the background: asks for the design name when it is empty
    // and the host for its values, here, then reads the files and writes
    // the page on a thread of its own; reportFinished() follows. False when
    // nothing is built (the prompt cancelled); nothing follows then.
    bool startReport(const QString &projectFile, const QString &designName, const QString &targetFamily);
    // False while a build started by startReport() runs.
    bool reportReady() const;

    // Where the page is written: the project directory's
    // device_usage_statistics.html, fixed when the dialog was made.
    QString reportPath() const;
    // Only for a finished build: a background build owns it until then.
    CrvC_ReportBuilder &builder() { return *m_builder; }
    // Shows the page of the last build in the Contents tab (createReport
    // does this itself).
    void showContents();
    // True when the Contents tab shows only the beginning of the page.
    bool contentsCut() const { return m_contentsCut; }
    // True when the Contents tab shows the page's text rather than its view.
    bool contentsAsText() const { return m_contentsAsText; }

    // What the Contents tab shows for `page`: the page itself, or, above
    // ContentsLimit, its beginning (cut at a line end) followed by the link
    // to the whole page; `cut` tells which.
    static QString contentsText(const QString &page, bool *cut = nullptr);
    // The same as the page's exact text, for a page whose view drops text.
    static QString contentsSource(const QString &page, bool *cut = nullptr);
    // The line above the buttons for `destination`.
    static QString destinationText(const CrvC_SendDispatcher::Destination &destination);

    QTabWidget *tabWidget() const { return m_tabWidget; }
    CrvC_DataCollectionHtmlViewer *introductionViewer() const { return m_introductionViewer; }
    CrvC_DataCollectionHtmlViewer *contentsViewer() const { return m_contentsViewer; }
    CrvC_DataCollectionHtmlViewer *helpViewer() const { return m_helpViewer; }
    QPushButton *sendButton() const { return m_sendButton; }
    QPushButton *verifyButton() const { return m_verifyButton; }
    QPushButton *declineButton() const { return m_declineButton; }
    QPushButton *helpButton() const { return m_helpButton; }
    QLabel *destinationLabel() const { return m_destinationLabel; }

Q_SIGNALS:
    // The background build has ended, the page written or not.
    void reportFinished();

public Q_SLOTS:
    // The send step: the send method decision for the report's own copy of
    // its page, then the project's send counter grows by one whatever the
    // outcome. Without a page (none was written, or still being built)
    // nothing is sent or counted.
    void sendData();
    void verifyContents();
    // Opens this report's whole page in the web browser.
    void browseContents();
    void decline();
    void getHelp();
    // Opens `url` in the web browser; the page in the tab stays.
    void onAnchorClicked(const QUrl &url);

protected:
    void showEvent(QShowEvent *event) override;

private:
    // Only the link to the whole of a cut page is followed: a value of the
    // page must not open an address or a file.
    void onContentsAnchorClicked(const QUrl &url);
    CrvC_ReportBuilder::Environment builderEnvironment();
    void onBuildFinished();

    std::shared_ptr<CrvC_ReportBuilder> m_builder;
    CrvC_BackgroundBuild *m_build = nullptr;
    bool m_contentsShown = false;
    QTabWidget *m_tabWidget = nullptr;
    CrvC_DataCollectionHtmlViewer *m_introductionViewer = nullptr;
    CrvC_DataCollectionHtmlViewer *m_contentsViewer = nullptr;
    CrvC_DataCollectionHtmlViewer *m_helpViewer = nullptr;
    QPushButton *m_sendButton = nullptr;
    QPushButton *m_verifyButton = nullptr;
    QPushButton *m_declineButton = nullptr;
    QPushButton *m_helpButton = nullptr;
    QLabel *m_destinationLabel = nullptr;
    bool m_contentsCut = false;
    bool m_contentsAsText = false;
    bool m_pageHandedOver = false;
};
