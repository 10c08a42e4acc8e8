#pragma once

#include "host/OrbHostExport.h"

#include <QDialog>
#include <QPointer>

#include <functional>

class QUrl;

class QAbstractButton;
class QBoxLayout;

namespace Gui {
namespace Clip {

class Settings;

// Base of the host's dialogs. Knows its OK, Cancel and Help buttons, opens
// the help topic of the dialog, and can keep its geometry between runs in the
// host settings (group "DialogGeometry", key = object name).
class ORBHOSTGUI_EXPORT Dialog : public QDialog
{
    Q_OBJECT
public:
    Dialog(QWidget *parent = nullptr, Settings *settings = nullptr, const char *name = nullptr,
           bool modal = true, Qt::WindowFlags flags = Qt::WindowFlags());
    ~Dialog() override;

    void setOkButton(QAbstractButton *button);
    void setCancelButton(QAbstractButton *button);
    void setHelpButton(QAbstractButton *button);
    void setHelpTopic(const QString &topic);
    QString helpTopic() const { return m_helpTopic; }
    // Puts `content` into a vertical layout of the dialog.
    QBoxLayout *createLayout(QWidget *content);
    void setSaveAndRestoreGeometryFlag(bool on);

public Q_SLOTS:
    // Opens the dialog's help topic in the help viewer.
    virtual void help();
    void done(int result) override;

protected:
    void showEvent(QShowEvent *event) override;

private:
    QPointer<QAbstractButton> m_ok;
    QPointer<QAbstractButton> m_cancel;
    QPointer<QAbstractButton> m_help;
    QString m_helpTopic;
    bool m_keepGeometry = false;
    bool m_restored = false;
};

// Modal message boxes of the host.
class ORBHOSTGUI_EXPORT MessageBox
{
public:
    // A warning with `text` and `buttons`; answers the button pressed.
    // Without a display (offscreen, tests) the text goes to standard error
    // and `defaultButton` (or the first of `buttons`) is answered.
    static int warning(QWidget *parent, const QString &caption, const QString &text,
                       int buttons = 0x00000400 /* QMessageBox::Ok */, int defaultButton = 0);
    // The same with `informativeText` beneath `text` (what happened, in detail).
    static int warning(QWidget *parent, const QString &caption, const QString &text,
                       const QString &informativeText, int buttons = 0x00000400 /* QMessageBox::Ok */,
                       int defaultButton = 0);
};

// Opens addresses and help topics outside the host.
class ORBHOSTGUI_EXPORT HelpManager
{
public:
    // Opens `url` (an address, or a local file path) in the user's browser;
    // false when that failed or `url` is empty.
    static bool runWebBrowser(const QString &url);
    // Opens the help file at `topic` the same way; false without a help file.
    static bool showHelpTopic(const QString &helpFile, const QString &topic);

    // What starts the browser; the default hands the address to the desktop
    // (QDesktopServices, whose URL handlers apply; the offscreen platform
    // opens nothing). Tests install their own so that no browser is ever
    // launched; an empty function restores the default.
    using Launcher = std::function<bool(const QUrl &url)>;
    static void setLauncher(Launcher launcher);
};

} // namespace Clip
} // namespace Gui
