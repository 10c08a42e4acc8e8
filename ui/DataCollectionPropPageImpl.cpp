#include "DataCollectionPropPageImpl.h"
#include "SendHistoryDialog.h"

#include "host/gui/PropSheetEvent.h"
#include "transmit/DataCollectionEmail.h"

#include <QLabel>

using Gui::Clip::PropSheetEvent;

CrvC_DataCollectionPropPageImpl::CrvC_DataCollectionPropPageImpl(QWidget *parent, const char *name)
    : QWidget(parent)
{
    if (name)
        setObjectName(QString::fromLatin1(name));
    setupUi(this);
    // Added to the form's widgets, right under the box it is about.
    m_administratorNote = new QLabel(tr("Set for this installation by your administrator"), this);
    m_administratorNote->setObjectName(QStringLiteral("administratorNote"));
    m_administratorNote->setWordWrap(true);
    m_administratorNote->setIndent(20);
    m_administratorNote->hide();
    vboxLayout->insertWidget(vboxLayout->indexOf(collectionCheckBox) + 1, m_administratorNote);
    connect(sslRadioButton, &QAbstractButton::toggled, this,
            &CrvC_DataCollectionPropPageImpl::OnSSLButtonStateChanged);
    connect(sentReportsButton, &QAbstractButton::clicked, this,
            &CrvC_DataCollectionPropPageImpl::showSentReports);
}

CrvC_DataCollectionPropPageImpl::~CrvC_DataCollectionPropPageImpl() = default;

void CrvC_DataCollectionPropPageImpl::customEvent(QEvent *event)
{
    if (!dynamic_cast<PropSheetEvent *>(event))
        return;
    switch (int(event->type())) {
    case PropSheetEvent::ActivatePage:
        loadPage();
        break;
    case PropSheetEvent::ApplyChanges:
        applyPage();
        break;
    default:
        break;
    }
}

void CrvC_DataCollectionPropPageImpl::loadPage()
{
    m_loaded = CrvC_PreferenceValues::load();
    m_pageLoaded = true;
    collectionCheckBox->setChecked(m_loaded.collect);
    m_administratorNote->setVisible(m_loaded.collectSetByInstallation);
    showSendProgressCheckBox->setChecked(m_loaded.dontShowProgress);
    sslRadioButton->setChecked(m_loaded.useSsl);
    emailRadioButton->setChecked(!m_loaded.useSsl);

    // Filled afresh on every show, so that the list never repeats itself.
    selectEmailTool->clear();
    const QStringList order = CrvC_PreferenceValues::mailListOrder(emailToolNames());
    for (const QString &tool : order)
        selectEmailTool->addItem(tool, tool);
    selectEmailTool->setCurrentIndex(selectEmailTool->count() - 1);
    if (!m_loaded.emailTool.isEmpty()) {
        const int found =
            selectEmailTool->findText(m_loaded.emailTool, Qt::MatchExactly | Qt::MatchCaseSensitive);
        if (found >= 0)
            selectEmailTool->setCurrentIndex(found);
    }
    selectEmailTool->setEnabled(!m_loaded.useSsl);
    selectEmailTool->setEditable(false);
}

void CrvC_DataCollectionPropPageImpl::applyPage()
{
    // The form's boxes start cleared: applying a page that was never loaded
    // would switch collection off behind the user's back.
    if (!m_pageLoaded)
        loadPage();
    CrvC_PreferenceValues::Values shown;
    shown.collect = collectionCheckBox->isChecked();
    shown.dontShowProgress = showSendProgressCheckBox->isChecked();
    shown.useSsl = sslRadioButton->isChecked();
    shown.emailTool = selectEmailTool->currentText();
    CrvC_PreferenceValues::apply(m_loaded, shown);
    // A later apply compares with what is stored now, not with what the page
    // opened with: otherwise Apply, a change back and OK would keep the
    // first change.
    m_loaded = shown;
}

QStringList CrvC_DataCollectionPropPageImpl::emailToolNames()
{
    if (!m_mailProgramsRead) {
        m_mailPrograms = CrvC_DataCollectionEmail().emailTools();
        m_mailProgramsRead = true;
    }
    return m_mailPrograms;
}

void CrvC_DataCollectionPropPageImpl::OnSSLButtonStateChanged(bool on)
{
    selectEmailTool->setEnabled(!on);
}

void CrvC_DataCollectionPropPageImpl::showSentReports()
{
    CrvC_SendHistoryDialog dialog(this);
    dialog.exec();
}
