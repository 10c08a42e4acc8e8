#include "SendClipDlg.h"

#include "DataCollectionDialog.h"
#include "SendClipDlgImp.h"
#include "project/CorvidSettings.h"

#include "host/MsgManData.h"

#include <QBoxLayout>
#include <QTimer>
#include <QVariant>

CrvC_SendClipDlg::CrvC_SendClipDlg(QWidget *parent, const QString &projectFile, const QString &designName,
                                   const QString &targetFamily)
    : Gui::Clip::Dialog(parent, nullptr, "Corvid_SendDlg", false)
{
    setAttribute(Qt::WA_DeleteOnClose);
    m_reviewDialog = new CrvC_DataCollectionDialog(this, nullptr, true);
    m_started = m_reviewDialog->startReport(projectFile, designName, targetFamily);
    connect(m_reviewDialog, &CrvC_DataCollectionDialog::reportFinished, this,
            &CrvC_SendClipDlg::onReportFinished);
    setSaveAndRestoreGeometryFlag(false);

    m_imp = new CrvC_SendClipDlgImp();
    createLayout(m_imp)->setSizeConstraint(QLayout::SetMinimumSize);
    setWindowTitle(tr("Corvid Send Progress"));

    m_imp->initialDontShow = CrvC_Settings::dontShowSendProgressDlg();
    m_imp->dontShowAgain->setChecked(m_imp->initialDontShow);
    m_imp->progressBar->setRange(0, Steps);
    m_imp->progressBar->setValue(0);

    m_timer = new QTimer(this);
    m_timer->start(TickMs);
    connect(m_timer, &QTimer::timeout, this, &CrvC_SendClipDlg::OnTimeOut);
    connect(m_imp->detailsButton, &QPushButton::clicked, this, &CrvC_SendClipDlg::OnDetailsClicked);
    connect(m_imp->cancelButton, &QPushButton::clicked, this, &CrvC_SendClipDlg::OnDetailsClicked);
}

CrvC_SendClipDlg::~CrvC_SendClipDlg() = default;

void CrvC_SendClipDlg::OnTimeOut()
{
    if (m_step >= Steps)
        return;
    ++m_step;
    m_imp->progressBar->setValue(m_step);
    if (m_step == Steps) {
        m_timer->stop();
        // Otherwise the page's arrival sends.
        if (m_reviewDialog->reportReady())
            accept();
    }
}

void CrvC_SendClipDlg::onReportFinished()
{
    if (m_reviewing)
        return; // the review dialog shows how it went; its buttons decide
    if (!m_reviewDialog->builder().written()) {
        Port_MsgManData::debugStub("Corvid: no report written, nothing sent\n");
        m_timer->stop();
        reject();
    } else if (m_step == Steps) {
        accept();
    }
}

void CrvC_SendClipDlg::OnDetailsClicked()
{
    m_timer->stop();
    m_reviewing = true;
    m_reviewDialog->exec();
    reject();
}

void CrvC_SendClipDlg::accept()
{
    CrvC_Settings::setValue(CrvC_Settings::DontShowSendProgressDlg, m_imp->dontShowAgain->isChecked());
    m_reviewDialog->sendData();
    Gui::Clip::Dialog::accept();
}
