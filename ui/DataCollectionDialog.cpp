#include "DataCollectionDialog.h"

#include "DataCollectionHtmlViewer.h"
#include "SendToClipDlg.h"
#include "host/Env.h"
#include "host/MsgManData.h"
#include "host/String.h"
#include "project/ProjectRepositoryValues.h"
#include "report/BackgroundBuild.h"
#include "report/PageStore.h"
#include "report/PageText.h"
#include "transmit/MakerServer.h"
#include "transmit/SendRecorder.h"

#include <QApplication>
#include <QFileInfo>
#include <QHBoxLayout>
#include <QInputDialog>
#include <QLabel>
#include <QPushButton>
#include <QTabWidget>
#include <QVBoxLayout>

// A text browser takes about 0.75 s for 1 MB of the report's tables on a
// 2-core machine; a quarter of that leaves room for slower machines.
const int CrvC_DataCollectionDialog::ContentsLimit = 250000;
const char *const CrvC_DataCollectionDialog::BrowseContentsUrl = "corvid:browse-contents";

namespace {

// Shows the wait cursor for the life of the object.
class WaitCursor
{
public:
    WaitCursor() { QApplication::setOverrideCursor(Qt::WaitCursor); }
    ~WaitCursor() { QApplication::restoreOverrideCursor(); }
    WaitCursor(const WaitCursor &) = delete;
    WaitCursor &operator=(const WaitCursor &) = delete;
};

// How much of `page` the Contents tab shows: all of it, or above the limit
// its beginning up to a line end, so that no tag or entity is split.
qsizetype shownLength(const QString &page)
{
    if (page.size() <= CrvC_DataCollectionDialog::ContentsLimit)
        return page.size();
    const qsizetype end = page.lastIndexOf(QLatin1Char('\n'), CrvC_DataCollectionDialog::ContentsLimit);
    return end <= 0 ? CrvC_DataCollectionDialog::ContentsLimit : end;
}

QString cutNotice()
{
    using Dialog = CrvC_DataCollectionDialog;
    return QLatin1String("<P><B>")
           + Dialog::tr("This page is too large to be shown here in full; below is its beginning.")
           + QLatin1String("</B> <A HREF='") + QLatin1String(Dialog::BrowseContentsUrl) + QLatin1String("'>")
           + Dialog::tr("Open the whole page in the web browser") + QLatin1String("</A></P><HR>");
}

} // namespace

CrvC_DataCollectionDialog::CrvC_DataCollectionDialog(QWidget *parent, const char *name, bool modal,
                                                     Qt::WindowFlags flags)
    : Gui::Clip::Dialog(parent, nullptr, name, modal, flags)
    , m_builder(std::make_shared<CrvC_ReportBuilder>(builderEnvironment()))
{
    setWindowTitle(tr("Vantor Corvid Dialog"));
    auto *layout = new QVBoxLayout(this);

    const QString infoPage = CrvC_MakerServer::baseUrl();
    const auto installedPage = [](const char *relativePath) {
        const QString path = Gui::Clip::String::convert(Port_Env::GetDataFileName(relativePath));
        return QFileInfo(path).isFile() ? QFileInfo(path).absoluteFilePath() : QString();
    };

    m_introductionViewer = new CrvC_DataCollectionHtmlViewer(this);
    const QString introduction = installedPage("reports/corvid_introduction.html");
    if (!introduction.isEmpty()) {
        m_introductionViewer->setSource(QUrl::fromLocalFile(introduction));
        m_introductionViewer->setOpenLinks(false);
    } else {
        m_introductionViewer->setText(
            tr("The HTML page containing the Introduction for the Corvid feature is missing. Please go ")
            + infoPage + tr(" for more information."));
    }
    connect(m_introductionViewer, &QTextBrowser::anchorClicked, this,
            &CrvC_DataCollectionDialog::onAnchorClicked);

    m_contentsViewer = new CrvC_DataCollectionHtmlViewer(this);
    m_contentsViewer->setOpenLinks(false);
    connect(m_contentsViewer, &QTextBrowser::anchorClicked, this,
            &CrvC_DataCollectionDialog::onContentsAnchorClicked);

    m_helpViewer = new CrvC_DataCollectionHtmlViewer(this);
    const QString help = installedPage("reports/corvid_help.html");
    if (!help.isEmpty())
        m_helpViewer->setSource(QUrl::fromLocalFile(help));
    else
        m_helpViewer->setText(
            tr("The HTML page containing the Help for the Corvid feature is missing. Please go ") + infoPage
            + tr(" for more information."));

    m_tabWidget = new QTabWidget(this);
    m_tabWidget->setMinimumSize(600, 550);
    m_tabWidget->addTab(m_introductionViewer, tr("Introduction"));
    m_tabWidget->addTab(m_contentsViewer, tr("Contents (") + QLatin1String(CrvC_ReportBuilder::ReportFileName)
                                              + QLatin1String(")"));
    m_tabWidget->addTab(m_helpViewer, tr("Help"));
    QSizePolicy policy(QSizePolicy::Expanding, QSizePolicy::Expanding);
    policy.setHorizontalStretch(5);
    policy.setVerticalStretch(5);
    m_tabWidget->setSizePolicy(policy);

    m_sendButton = new QPushButton(tr("Send to Vantor"), this);
    m_sendButton->setToolTip(tr("Email the device usage statistics (as an HTML page) to Vantor "));
    m_verifyButton = new QPushButton(tr("Verify Contents"), this);
    m_verifyButton->setToolTip(tr("Open the Contents tab, displaying the HTML page for review "));
    m_declineButton = new QPushButton(tr("Decline"), this);
    m_declineButton->setToolTip(tr("Opt out of sending device usage statistics to Vantor "));
    m_helpButton = new QPushButton(tr("  Help  "), this);
    m_helpButton->setToolTip(tr("Get help for this dialog "));
    // Sending takes a click, or Space on "Send to Vantor": Enter in a viewer
    // must not press a default button.
    for (QPushButton *button : {m_sendButton, m_verifyButton, m_declineButton, m_helpButton}) {
        button->setAutoDefault(false);
        button->setDefault(false);
    }

    // Filled when the dialog is shown, with the settings of that moment.
    m_destinationLabel = new QLabel(this);
    m_destinationLabel->setObjectName(QStringLiteral("destinationLabel"));
    m_destinationLabel->setTextFormat(Qt::PlainText);
    m_destinationLabel->setWordWrap(true);
    m_destinationLabel->setContentsMargins(10, 0, 10, 0);

    layout->addSpacing(8);
    layout->addWidget(m_tabWidget, 9);
    layout->addSpacing(8);
    layout->addWidget(m_destinationLabel);
    layout->addSpacing(8);
    auto *buttons = new QHBoxLayout();
    buttons->addSpacing(10);
    buttons->addWidget(m_sendButton);
    buttons->addSpacerItem(new QSpacerItem(10, 0, QSizePolicy::Expanding, QSizePolicy::Minimum));
    buttons->addWidget(m_verifyButton);
    buttons->addSpacerItem(new QSpacerItem(10, 0, QSizePolicy::Expanding, QSizePolicy::Minimum));
    buttons->addWidget(m_declineButton);
    buttons->addSpacerItem(new QSpacerItem(10, 0, QSizePolicy::Expanding, QSizePolicy::Minimum));
    buttons->addWidget(m_helpButton);
    buttons->addSpacing(10);
    layout->addLayout(buttons);
    layout->addSpacing(8);

    // accept() first, so that exec() answers Accepted once the send step,
    // which runs second, has started.
    connect(m_sendButton, &QPushButton::clicked, this, &QDialog::accept);
    connect(m_sendButton, &QPushButton::clicked, this, &CrvC_DataCollectionDialog::sendData);
    connect(m_verifyButton, &QPushButton::clicked, this, &CrvC_DataCollectionDialog::verifyContents);
    connect(m_declineButton, &QPushButton::clicked, this, &CrvC_DataCollectionDialog::decline);
    connect(m_helpButton, &QPushButton::clicked, this, &CrvC_DataCollectionDialog::getHelp);
}

CrvC_DataCollectionDialog::~CrvC_DataCollectionDialog()
{
    // A build still running removes its own copy when it ends.
    if (m_build && m_build->abandon())
        return;
    if (!m_pageHandedOver)
        m_builder->discardOwnCopy();
}

CrvC_ReportBuilder::Environment CrvC_DataCollectionDialog::builderEnvironment()
{
    CrvC_ReportBuilder::Environment env;
    env.askDesignName = [this](QString &designName) {
        bool ok = false;
        designName = QInputDialog::getText(this, tr("Corvid"), tr("Enter the design name:"),
                                           QLineEdit::Normal, QString(), &ok);
        return ok;
    };
    env.pageFolder = [] { return CrvC_PageStore::newFolder(); };
    return env;
}

void CrvC_DataCollectionDialog::createReport(const QString &projectFile, const QString &designName,
                                             const QString &targetFamily)
{
    m_builder->createReport(projectFile, designName, targetFamily);
    showContents();
}

bool CrvC_DataCollectionDialog::startReport(const QString &projectFile, const QString &designName,
                                            const QString &targetFamily)
{
    m_builder->data().targetFamily = targetFamily;
    if (!m_builder->prepare(projectFile, designName))
        return false;
    m_sendButton->setEnabled(false);
    m_contentsViewer->setPlainText(tr("Building the report..."));
    m_build = new CrvC_BackgroundBuild(m_builder, this);
    connect(m_build, &CrvC_BackgroundBuild::finished, this, &CrvC_DataCollectionDialog::onBuildFinished);
    return true;
}

bool CrvC_DataCollectionDialog::reportReady() const
{
    return !m_build || m_build->isFinished();
}

void CrvC_DataCollectionDialog::onBuildFinished()
{
    m_sendButton->setEnabled(m_builder->written());
    // A page is put into the view only when someone looks: that takes a
    // while for a large page.
    if (isVisible())
        showContents();
    emit reportFinished();
}

QString CrvC_DataCollectionDialog::reportPath() const
{
    return m_builder->data().reportPath;
}

QString CrvC_DataCollectionDialog::contentsText(const QString &page, bool *cut)
{
    const qsizetype length = shownLength(page);
    if (cut)
        *cut = length < page.size();
    if (length == page.size())
        return page;
    // The cut is told at the top of the page, where the reader starts.
    QString text = page.left(length);
    const qsizetype body = text.indexOf(QLatin1String("<BODY"));
    const qsizetype afterBody = body < 0 ? -1 : text.indexOf(QLatin1Char('>'), body);
    text.insert(afterBody < 0 ? 0 : afterBody + 1, cutNotice());
    return text;
}

QString CrvC_DataCollectionDialog::contentsSource(const QString &page, bool *cut)
{
    const qsizetype length = shownLength(page);
    if (cut)
        *cut = length < page.size();
    return QLatin1String("<P><B>")
           + tr(
               "Some of the text of this page would not show in its formatted view. Below is the page as "
               "it is sent, mark-up included.")
           + QLatin1String("</B></P>") + (length < page.size() ? cutNotice() : QString())
           + QLatin1String("<PRE STYLE='white-space: pre-wrap'>") + page.left(length).toHtmlEscaped()
           + QLatin1String("</PRE>");
}

QString CrvC_DataCollectionDialog::destinationText(const CrvC_SendDispatcher::Destination &to)
{
    const auto shown = [](const QString &value) { return value.isEmpty() ? tr("(none)") : value; };
    const QString upload = tr("HTTPS upload to %1, with your registration ID %2 and network domain %3")
                               .arg(shown(to.server), shown(to.registrationId), shown(to.domain));
    if (to.asks)
        return tr("You choose how it is sent before it goes: %1; or e-mail to %2").arg(upload, to.mailbox);
    if (to.method == CrvC_SendDispatcher::Method::Email)
        return tr("E-mail to %1 with %2").arg(to.mailbox, shown(to.emailTool));
    return upload;
}

void CrvC_DataCollectionDialog::showContents()
{
    if (!reportReady())
        return;
    m_contentsShown = true;
    if (!m_builder->written()) {
        m_contentsViewer->setPlainText(tr("The report could not be written; nothing will be sent."));
        return;
    }
    WaitCursor wait;
    const QString page = m_builder->pageText();
    const QString view = contentsText(page, &m_contentsCut);
    m_contentsViewer->clear();
    m_contentsViewer->setHtml(view);
    m_contentsAsText = !CrvC_PageText::showsAllText(view, m_contentsViewer->toPlainText());
    if (m_contentsAsText)
        m_contentsViewer->setHtml(contentsSource(page, &m_contentsCut));
}

void CrvC_DataCollectionDialog::showEvent(QShowEvent *event)
{
    m_destinationLabel->setText(destinationText(CrvC_SendDispatcher::destination()));
    if (!m_contentsShown && m_build && reportReady())
        showContents();
    Gui::Clip::Dialog::showEvent(event);
}

void CrvC_DataCollectionDialog::sendData()
{
    if (!reportReady() || !m_builder->written()) {
        Port_MsgManData::debugStub("Corvid: no report written, nothing sent\n");
        return;
    }
    m_pageHandedOver = true;
    CrvC_SendRecorder::noteOrigin(m_builder->pagePath(), m_builder->data().projectFileToOpen(),
                                  m_builder->designName());
    CrvC_SendToClipDlg::showSendMethodDialog(this, m_builder->pagePath());
    ProjectRepositoryValues::instance().countSend(m_builder->data().projectFileToOpen(),
                                                  m_builder->projectIteration());
}

void CrvC_DataCollectionDialog::verifyContents()
{
    m_tabWidget->setCurrentIndex(ContentsTab);
}

void CrvC_DataCollectionDialog::browseContents()
{
    const QString path = m_builder->pagePath();
    if (path.isEmpty() || !QFileInfo(path).isFile())
        return;
    bool opened = false;
    {
        WaitCursor wait;
        opened = Gui::Clip::HelpManager::runWebBrowser(QUrl::fromLocalFile(path).toString());
    }
    if (!opened)
        Gui::Clip::MessageBox::warning(this, windowTitle(),
                                       tr("No web browser could be started to show the whole page."), path);
}

void CrvC_DataCollectionDialog::decline()
{
    reject();
}

void CrvC_DataCollectionDialog::getHelp()
{
    m_tabWidget->setCurrentIndex(HelpTab);
}

void CrvC_DataCollectionDialog::onAnchorClicked(const QUrl &url)
{
    WaitCursor wait;
    Gui::Clip::HelpManager::runWebBrowser(url.toString());
}

void CrvC_DataCollectionDialog::onContentsAnchorClicked(const QUrl &url)
{
    if (url.toString() == QLatin1String(BrowseContentsUrl))
        browseContents();
}
