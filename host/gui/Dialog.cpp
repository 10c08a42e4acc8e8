#include "Dialog.h"

#include "host/Settings.h"

#include <QAbstractButton>
#include <QDesktopServices>
#include <QDir>
#include <QGuiApplication>
#include <QMessageBox>
#include <QUrl>
#include <QVBoxLayout>

#include <cstdio>

namespace Gui {
namespace Clip {

Dialog::Dialog(QWidget *parent, Settings *, const char *name, bool modal, Qt::WindowFlags flags)
    : QDialog(parent, flags)
{
    if (name)
        setObjectName(QString::fromLatin1(name));
    setModal(modal);
}

Dialog::~Dialog() = default;

void Dialog::setOkButton(QAbstractButton *button)
{
    m_ok = button;
    if (button)
        connect(button, &QAbstractButton::clicked, this, &QDialog::accept);
}

void Dialog::setCancelButton(QAbstractButton *button)
{
    m_cancel = button;
    if (button)
        connect(button, &QAbstractButton::clicked, this, &QDialog::reject);
}

void Dialog::setHelpButton(QAbstractButton *button)
{
    m_help = button;
    if (button)
        connect(button, &QAbstractButton::clicked, this, &Dialog::help);
}

void Dialog::setHelpTopic(const QString &topic)
{
    m_helpTopic = topic;
}

QBoxLayout *Dialog::createLayout(QWidget *content)
{
    auto *layout = new QVBoxLayout(this);
    layout->setContentsMargins(0, 0, 0, 0);
    if (content)
        layout->addWidget(content);
    return layout;
}

void Dialog::setSaveAndRestoreGeometryFlag(bool on)
{
    m_keepGeometry = on;
}

void Dialog::help()
{
    HelpManager::showHelpTopic(QString(), m_helpTopic);
}

void Dialog::done(int result)
{
    if (m_keepGeometry && !objectName().isEmpty()) {
        Settings settings(QStringLiteral("DialogGeometry"), true, true, true);
        settings.setValue(objectName(), saveGeometry());
    }
    QDialog::done(result);
}

void Dialog::showEvent(QShowEvent *event)
{
    if (m_keepGeometry && !m_restored && !objectName().isEmpty()) {
        m_restored = true;
        Settings settings(QStringLiteral("DialogGeometry"), true, true, true);
        restoreGeometry(settings.getValue(objectName()).toByteArray());
    }
    QDialog::showEvent(event);
}

int MessageBox::warning(QWidget *parent, const QString &caption, const QString &text, int buttons,
                        int defaultButton)
{
    return warning(parent, caption, text, QString(), buttons, defaultButton);
}

int MessageBox::warning(QWidget *parent, const QString &caption, const QString &text,
                        const QString &informativeText, int buttons, int defaultButton)
{
    if (QGuiApplication::platformName() == QLatin1String("offscreen")) {
        std::fprintf(stderr, "%s: %s\n", qUtf8Printable(caption), qUtf8Printable(text));
        if (!informativeText.isEmpty())
            std::fprintf(stderr, "%s\n", qUtf8Printable(informativeText));
        if (defaultButton)
            return defaultButton;
        for (int bit = 1; bit; bit <<= 1) {
            if (buttons & bit)
                return bit;
        }
        return QMessageBox::Ok;
    }
    QMessageBox box(QMessageBox::Warning, caption, text, QMessageBox::StandardButtons(buttons), parent);
    box.setInformativeText(informativeText);
    if (defaultButton)
        box.setDefaultButton(QMessageBox::StandardButton(defaultButton));
    return box.exec();
}

namespace {

HelpManager::Launcher &launcher()
{
    static HelpManager::Launcher current;
    return current;
}

bool launch(const QUrl &url)
{
    if (!url.isValid() || url.isEmpty())
        return false;
    return launcher() ? launcher()(url) : QDesktopServices::openUrl(url);
}

} // namespace

void HelpManager::setLauncher(Launcher replacement)
{
    launcher() = std::move(replacement);
}

bool HelpManager::runWebBrowser(const QString &url)
{
    const QString text = url.trimmed();
    if (text.isEmpty())
        return false;
    // A path names a local file (the review dialog opens whole pages that way).
    return launch(QUrl::fromUserInput(text, QDir::currentPath()));
}

bool HelpManager::showHelpTopic(const QString &helpFile, const QString &topic)
{
    if (helpFile.isEmpty())
        return false;
    QUrl url = QUrl::fromLocalFile(helpFile);
    if (!topic.isEmpty())
        url.setFragment(topic);
    return launch(url);
}

} // namespace Clip
} // namespace Gui
