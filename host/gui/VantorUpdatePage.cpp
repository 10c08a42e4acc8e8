#include "VantorUpdatePage.h"
#include "ApplicationBase.h"
#include "PropItem.h"
#include "PropSheet.h"
#include "PropSheetEvent.h"

#include "Dialog.h"

#include "host/Settings.h"

#include <QFormLayout>
#include <QGroupBox>
#include <QLabel>
#include <QLineEdit>
#include <QRadioButton>
#include <QRegularExpressionValidator>
#include <QVBoxLayout>

namespace Gui {
namespace Clip {

const char *const VantorUpdatePage::Group = "WebUpdate";
const char *const VantorUpdatePage::ItemName = "VantorUpdate";

namespace {

const char ChoiceKey[] = "ProxyChoice";
const char HostKey[] = "ProxyHost";
const char PortKey[] = "ProxyPort";

// Makes the page when the sheet first shows the item; lives as long as the item.
class Creator : public QObject
{
    Q_OBJECT
public Q_SLOTS:
    void OnCreatePrefPage(QWidget *parent, Gui::Clip::PropItem *item)
    {
        if (item && !item->page())
            new VantorUpdatePage(parent);
    }
};

} // namespace

VantorUpdatePage::VantorUpdatePage(QWidget *parent)
    : QWidget(parent)
    , m_none(new QRadioButton(tr("&No proxy")))
    , m_system(new QRadioButton(tr("Use the &system proxy settings")))
    , m_manual(new QRadioButton(tr("&Manual proxy configuration")))
    , m_host(new QLineEdit)
    , m_port(new QLineEdit)
{
    setObjectName(QStringLiteral("VantorUpdatePage"));
    m_host->setObjectName(QStringLiteral("proxyHost"));
    m_port->setObjectName(QStringLiteral("proxyPort"));
    // 1 to 65535 without leading zeros: a keystroke that leaves that range
    // is refused (QIntValidator lets five-digit numbers above it through).
    m_port->setValidator(new QRegularExpressionValidator(
        QRegularExpression(QStringLiteral("[1-9][0-9]{0,3}|[1-5][0-9]{4}|6[0-4][0-9]{3}|65[0-4][0-9]{2}"
                                          "|655[0-2][0-9]|6553[0-5]")),
        m_port));
    m_system->setChecked(true);

    auto *group = new QGroupBox(tr("Connections to Vantor's web site"), this);
    auto *manual = new QFormLayout;
    manual->addRow(tr("&Host:"), m_host);
    manual->addRow(tr("&Port:"), m_port);
    manual->setContentsMargins(24, 0, 0, 0);
    auto *box = new QVBoxLayout(group);
    box->addWidget(m_none);
    box->addWidget(m_system);
    box->addWidget(m_manual);
    box->addLayout(manual);

    auto *layout = new QVBoxLayout(this);
    auto *note = new QLabel(tr("Usage reports and updates reach Vantor's web site through this "
                               "proxy."),
                            this);
    note->setWordWrap(true);
    layout->addWidget(note);
    layout->addWidget(group);
    layout->addStretch(1);

    connect(m_manual, &QRadioButton::toggled, this, &VantorUpdatePage::updateEnabled);
    updateEnabled();
}

void VantorUpdatePage::addTo(PropSheet *sheet)
{
    if (!sheet)
        return;
    auto *item =
        new PropItem(QString::fromLatin1(ItemName), tr("VantorUpdate"),
                     tr("Proxy settings for connections to Vantor's web site"), "orb-vantorupdate-pref-item");
    // The sheet owns the item; the creator goes with the sheet.
    auto *creator = new Creator;
    creator->setParent(sheet);
    item->setPropPageCreator(creator, SLOT(OnCreatePrefPage(QWidget *, Gui::Clip::PropItem *)));
    item->setHelpFileNameAndTopic(ApplicationBase::getHelpFileName(), QStringLiteral("orb-vantorupdate"));
    sheet->addItem(item, false, 1);
}

void VantorUpdatePage::loadPage()
{
    const Settings settings(QString::fromLatin1(Group), false, false, true);
    const QVariant choice = settings.getValue(QString::fromLatin1(ChoiceKey));
    bool ok = false;
    const int value = choice.toInt(&ok);
    m_none->setChecked(ok && value == NoProxy);
    m_manual->setChecked(ok && value == ManualProxy);
    m_system->setChecked(!ok || (value != NoProxy && value != ManualProxy));
    m_host->setText(settings.getValue(QString::fromLatin1(HostKey)).toString());
    m_port->setText(settings.getValue(QString::fromLatin1(PortKey)).toString());
    updateEnabled();
}

void VantorUpdatePage::applyPage()
{
    Settings settings(QString::fromLatin1(Group), true, true, true);
    const int choice = m_none->isChecked() ? NoProxy : m_manual->isChecked() ? ManualProxy : SystemProxy;
    settings.setValue(QString::fromLatin1(ChoiceKey), choice);
    if (choice != ManualProxy)
        return;
    // Without a host the transfers fall back to the system's settings; an
    // empty stored host would read as a proxy named "".
    const QString host = m_host->text().trimmed();
    if (host.isEmpty())
        settings.remove(QString::fromLatin1(HostKey));
    else
        settings.setValue(QString::fromLatin1(HostKey), host);
    const QString port = m_port->text().trimmed();
    if (!port.isEmpty() && portAcceptable())
        settings.setValue(QString::fromLatin1(PortKey), port);
    else
        settings.remove(QString::fromLatin1(PortKey));
}

bool VantorUpdatePage::portAcceptable() const
{
    QString port = m_port->text().trimmed();
    int pos = 0;
    return port.isEmpty() || m_port->validator()->validate(port, pos) == QValidator::Acceptable;
}

bool VantorUpdatePage::validatePage()
{
    if (!m_manual->isChecked() || portAcceptable())
        return true;
    MessageBox::warning(this, tr("VantorUpdate"), tr("The proxy port must be a number from 1 to 65535."));
    m_port->setFocus();
    return false;
}

void VantorUpdatePage::customEvent(QEvent *event)
{
    switch (int(event->type())) {
    case PropSheetEvent::ActivatePage:
        loadPage();
        break;
    case PropSheetEvent::ValidateChanges:
        event->setAccepted(validatePage());
        break;
    case PropSheetEvent::ApplyChanges:
        applyPage();
        break;
    default:
        QWidget::customEvent(event);
    }
}

void VantorUpdatePage::updateEnabled()
{
    m_host->setEnabled(m_manual->isChecked());
    m_port->setEnabled(m_manual->isChecked());
}

} // namespace Clip
} // namespace Gui

#include "VantorUpdatePage.moc"
