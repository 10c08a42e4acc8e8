#include "SendToClipDlg.h"

#include "SendToClipDlgImp.h"
#include "host/Env.h"
#include "host/String.h"
#include "host/gui/ApplicationBase.h"
#include "transmit/DataCollectionEmail.h"
#include "transmit/SendDispatcher.h"

#include <QBoxLayout>
#include <QFileInfo>
#include <QLabel>

CrvC_SendToClipDlg::CrvC_SendToClipDlg(QWidget *parent, const QString &reportFile)
    : Gui::Clip::Dialog(parent, nullptr, "Corvid_SendToDlg", true)
    , m_reportFile(reportFile)
    , m_email(new CrvC_DataCollectionEmail())
{
    m_email->setParent(this);
    m_imp = new CrvC_SendToClipDlgImp();
    QBoxLayout *layout = createLayout(m_imp);
    layout->setSizeConstraint(QLayout::SetMinimumSize);
    setWindowTitle(tr("Send To Vantor"));

    const CrvC_SendDispatcher::Choice stored = CrvC_SendDispatcher::storedChoice();
    m_imp->initialUseSSL = stored.useSsl;
    m_imp->initialDontShow = stored.dontShowAgain;
    m_imp->initialEmailTool = stored.emailTool;
    if (stored.useSsl)
        m_imp->sslRadioButton->setChecked(true);
    else
        m_imp->emailRadioButton->setChecked(true);
    m_imp->dontShowAgain->setChecked(stored.dontShowAgain);
    setSizeGripEnabled(true);

    m_imp->selectEmailTool->addItems(m_email->emailTools());
    if (m_imp->selectEmailTool->count() == 0) {
        // Nothing could send the e-mail: the option stays off and says why.
        m_noEmailToolNote =
            new QLabel(tr("No e-mail program was found on this computer."), m_imp->buttonGroup1);
        m_noEmailToolNote->setObjectName(QStringLiteral("noEmailToolNote"));
        m_imp->vboxLayout1->insertWidget(m_imp->vboxLayout1->indexOf(m_imp->selectEmailTool) + 1,
                                         m_noEmailToolNote);
        m_imp->emailRadioButton->setEnabled(false);
        m_imp->emailRadioButton->setToolTip(m_noEmailToolNote->text());
        m_imp->sslRadioButton->setChecked(true);
    }
    const int found =
        m_imp->selectEmailTool->findText(stored.emailTool, Qt::MatchExactly | Qt::MatchCaseSensitive);
    if (!stored.emailTool.isEmpty() && found >= 0)
        m_imp->selectEmailTool->setCurrentIndex(found);

    setOkButton(m_imp->okButton);
    setCancelButton(m_imp->cancelButton);
    setHelpButton(m_imp->helpButton);
    setHelpTopic(QStringLiteral("rv-email-send-to-dlg"));

    connect(m_imp->sslRadioButton, &QAbstractButton::toggled, this,
            &CrvC_SendToClipDlg::OnSSLButtonStateChanged);
    OnSSLButtonStateChanged(m_imp->sslRadioButton->isChecked());
    m_imp->selectEmailTool->setEditable(false);
}

CrvC_SendToClipDlg::~CrvC_SendToClipDlg() = default;

void CrvC_SendToClipDlg::OnSSLButtonStateChanged(bool on)
{
    m_imp->selectEmailTool->setEnabled(!on && m_imp->selectEmailTool->count() > 0);
}

void CrvC_SendToClipDlg::offerAfterFailure()
{
    m_forThisReportOnly = true;
    if (m_imp->emailRadioButton->isEnabled())
        m_imp->emailRadioButton->setChecked(true);
    m_imp->dontShowAgain->setChecked(false);
}

void CrvC_SendToClipDlg::help()
{
    const QString hostHelp = Gui::Clip::ApplicationBase::getHelpFileName();
    if (QFileInfo(hostHelp).isFile() && Gui::Clip::HelpManager::showHelpTopic(hostHelp, helpTopic()))
        return;
    const QString page = Gui::Clip::String::convert(Port_Env::GetDataFileName("reports/corvid_help.html"));
    if (!QFileInfo(page).isFile()) {
        Gui::Clip::MessageBox::warning(this, windowTitle(), tr("The help page for Corvid is not installed."));
        return;
    }
    if (!Gui::Clip::HelpManager::runWebBrowser(QFileInfo(page).absoluteFilePath()))
        Gui::Clip::MessageBox::warning(this, windowTitle(),
                                       tr("No web browser could be started to show the help."),
                                       QFileInfo(page).absoluteFilePath());
}

void CrvC_SendToClipDlg::accept()
{
    CrvC_SendDispatcher::Choice initial;
    initial.useSsl = m_imp->initialUseSSL;
    initial.dontShowAgain = m_imp->initialDontShow;
    initial.emailTool = m_imp->initialEmailTool;
    CrvC_SendDispatcher::Choice chosen;
    chosen.useSsl = m_imp->sslRadioButton->isChecked();
    chosen.dontShowAgain = m_imp->dontShowAgain->isChecked();
    chosen.emailTool = m_imp->selectEmailTool->currentText();
    // E-mail without a program would send nothing: OK neither stores nor
    // closes.
    if (!chosen.useSsl && chosen.emailTool.isEmpty())
        return;
    if (!m_forThisReportOnly || chosen.dontShowAgain)
        CrvC_SendDispatcher::storeChoice(initial, chosen);
    CrvC_SendDispatcher::send(chosen, m_reportFile);
    Gui::Clip::Dialog::accept();
}

void CrvC_SendToClipDlg::showSendMethodDialog(QWidget *parent, const QString &reportFile)
{
    if (CrvC_SendDispatcher::sendWithoutAsking(reportFile))
        return;
    CrvC_SendToClipDlg dialog(parent, reportFile);
    dialog.exec();
}

void CrvC_SendToClipDlg::showSendMethodDialogForEmail(QWidget *parent, const QString &reportFile)
{
    CrvC_SendToClipDlg dialog(parent, reportFile);
    dialog.offerAfterFailure();
    dialog.exec();
}

bool CrvC_SendToClipDlg::sendReport(const QString &reportFile)
{
    return CrvC_SendDispatcher::sendReport(reportFile);
}
