#pragma once

#include "host/gui/Dialog.h"

class CrvC_DataCollectionDialog;
class CrvC_SendClipDlgImp;
class QTimer;

// The send progress dialog: announces an automatic send with a bar that fills
// in five one-second ticks, then sends through its review dialog. The report
// is built in the background meanwhile: the send goes when both the ticks
// have run and the page is written; a build that writes no page closes the
// window unsent. "Details..."
// and "Cancel" stop the countdown and open the review dialog instead; closing
// the window sends nothing. Non-modal; deletes itself when it closes, with
// its review dialog.
class CrvC_SendClipDlg : public Gui::Clip::Dialog
{
    Q_OBJECT
public:
    static const int Steps = 5;
    static const int TickMs = 1000;

    // Starts building the report of the three texts (as the collection cycle
    // hands them to the review dialog) and the countdown; see reportStarted().
    CrvC_SendClipDlg(QWidget *parent, const QString &projectFile, const QString &designName,
                     const QString &targetFamily);
    ~CrvC_SendClipDlg() override;

    CrvC_DataCollectionDialog *reviewDialog() const { return m_reviewDialog; }
    // False when no build was started (the design-name prompt cancelled):
    // the caller deletes the window unshown.
    bool reportStarted() const { return m_started; }
    CrvC_SendClipDlgImp *imp() const { return m_imp; }
    // The countdown's timer; tests stop it and call OnTimeOut() themselves.
    QTimer *timer() const { return m_timer; }
    int step() const { return m_step; }

public Q_SLOTS:
    // One tick of the countdown; the fifth sends.
    void OnTimeOut();
    // "Details..." and "Cancel": stop and open the review dialog.
    void OnDetailsClicked();
    // End of the countdown: stores the check box and sends.
    void accept() override;

private:
    void onReportFinished();

    CrvC_SendClipDlgImp *m_imp = nullptr;
    CrvC_DataCollectionDialog *m_reviewDialog = nullptr;
    int m_step = 0;
    bool m_started = false;
    bool m_reviewing = false;
    QTimer *m_timer = nullptr;
};
