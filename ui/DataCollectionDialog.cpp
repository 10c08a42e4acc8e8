#include "DataCollectionDialog.h"

#include "DataCollectionHtmlViewer.h"
#include "SendToClipDlg.h"
#include "host/Env.h"
#include "host/String.h"
#include "project/ProjectRepositoryValues.h"
#include "transmit/MakerServer.h"
#include "transmit/SendRecorder.h"

#include <QApplication>
#include <QFileInfo>
#include <QHBoxLayout>
#include <QInputDialog>
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

} // namespace

CrvC_DataCollectionDialog::CrvC_DataCollectionDialog(QWidget *parent, const char *name, bool modal,
                                                     Qt::WindowFlags flags)
    : Gui::Clip::Dialog(parent, nullptr, name, modal, flags)
    , m_builder(builderEnvironment())
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

    // A link on the page, and the link to the whole of a cut page, open in
    // the web browser; the page itself stays in the tab.
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
            tr("The HTML page containing the Help for the Corvid feature is missing. Please go ")
            + infoPage + tr(" for more information."));

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

    layout->addSpacing(8);
    layout->addWidget(m_tabWidget, 9);
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

CrvC_DataCollectionDialog::~CrvC_DataCollectionDialog() = default;

CrvC_ReportBuilder::Environment CrvC_DataCollectionDialog::builderEnvironment()
{
    CrvC_ReportBuilder::Environment env;
    env.askDesignName = [this](QString &designName) {
        bool ok = false;
        designName = QInputDialog::getText(this, tr("Corvid"), tr("Enter the design name:"),
                                           QLineEdit::Normal, QString(), &ok);
        m_designName = designName.trimmed();
        return ok;
    };
    env.setBusy = [](bool busy) {
        if (busy)
            QApplication::setOverrideCursor(Qt::WaitCursor);
        else
            QApplication::restoreOverrideCursor();
    };
    return env;
}

void CrvC_DataCollectionDialog::createReport(const QString &projectFile, const QString &designName,
                                             const QString &targetFamily)
{
    m_designName = designName;
    m_builder.createReport(projectFile, designName, targetFamily);
    showContents();
}

QString CrvC_DataCollectionDialog::reportPath() const
{
    return m_builder.data().reportPath;
}

QString CrvC_DataCollectionDialog::contentsText(const QString &page, bool *cut)
{
    if (cut)
        *cut = page.size() > ContentsLimit;
    if (page.size() <= ContentsLimit)
        return page;
    // Cut at a line end, so that no tag or entity is split, and say so at
    // the top of the page, where the reader starts.
    qsizetype end = page.lastIndexOf(QLatin1Char('\n'), ContentsLimit);
    if (end <= 0)
        end = ContentsLimit;
    const QString notice = QLatin1String("<P><B>")
                           + tr("This page is too large to be shown here in full; below is its beginning.")
                           + QLatin1String("</B> <A HREF='") + QLatin1String(BrowseContentsUrl)
                           + QLatin1String("'>") + tr("Open the whole page in the web browser")
                           + QLatin1String("</A></P><HR>");
    QString text = page.left(end);
    const qsizetype body = text.indexOf(QLatin1String("<BODY"));
    const qsizetype afterBody = body < 0 ? -1 : text.indexOf(QLatin1Char('>'), body);
    text.insert(afterBody < 0 ? 0 : afterBody + 1, notice);
    return text;
}

void CrvC_DataCollectionDialog::showContents()
{
    WaitCursor wait;
    m_contentsViewer->clear();
    m_contentsViewer->setHtml(contentsText(m_builder.pageText(), &m_contentsCut));
}

void CrvC_DataCollectionDialog::sendData()
{
    const QString page = QFileInfo(reportPath()).absoluteFilePath();
    CrvC_SendRecorder::noteOrigin(page, m_builder.data().projectFileToOpen(), m_designName);
    CrvC_SendToClipDlg::showSendMethodDialog(this, page);
    ProjectRepositoryValues::instance().countSend(m_builder.data().projectFileToOpen(),
                                                  m_builder.projectIteration());
}

void CrvC_DataCollectionDialog::verifyContents()
{
    m_tabWidget->setCurrentIndex(ContentsTab);
}

void CrvC_DataCollectionDialog::browseContents()
{
    WaitCursor wait;
    const QString path = reportPath();
    if (!path.isEmpty() && QFileInfo(path).isFile())
        Gui::Clip::HelpManager::runWebBrowser(
            QUrl::fromLocalFile(QFileInfo(path).absoluteFilePath()).toString());
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
    else
        onAnchorClicked(url);
}
