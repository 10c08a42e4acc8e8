#include "SendToClipDlg.h"

#include "SendToClipDlgImp.h"
#include "transmit/DataCollectionEmail.h"
#include "transmit/SendDispatcher.h"

#include <QBoxLayout>
#include <QFileInfo>

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
    const int found = m_imp->selectEmailTool->findText(stored.emailTool, Qt::MatchExactly | Qt::MatchCaseSensitive);
    if (!stored.emailTool.isEmpty() && found >= 0)
        m_imp->selectEmailTool->setCurrentIndex(found);

    setOkButton(m_imp->okButton);
    setCancelButton(m_imp->cancelButton);
    setHelpButton(m_imp->helpButton);
    setHelpTopic(QStringLiteral("rv-email-send-to-dlg"));

    connect(m_imp->sslRadioButton, &QAbstractButton::toggled, this,
            &CrvC_SendToClipDlg::OnSSLButtonStateChanged);
    m_imp->selectEmailTool->setEnabled(!stored.useSsl);
    m_imp->selectEmailTool->setEditable(false);
}

CrvC_SendToClipDlg::~CrvC_SendToClipDlg() = default;

void CrvC_SendToClipDlg::OnSSLButtonStateChanged(bool on)
{
    m_imp->selectEmailTool->setEnabled(!on);
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
    CrvC_SendDispatcher::storeChoice(initial, chosen);
    sendReport(m_reportFile);
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
    dialog.imp()->emailRadioButton->setChecked(true);
    dialog.exec();
}

bool CrvC_SendToClipDlg::sendReport(const QString &reportFile)
{
    return CrvC_SendDispatcher::sendReport(reportFile);
}
