#pragma once

#include "host/OrbHostExport.h"

#include <QWidget>

class QLineEdit;
class QRadioButton;

namespace Gui {
namespace Clip {

class PropSheet;

// The host's "VantorUpdate" preference page: how connections to the maker's
// web site go out. It keeps the user's proxy choice in the settings group
// "WebUpdate", which the plug-ins' transfers read:
//   "ProxyChoice"  0 no proxy, 1 the system's proxy settings, 2 manual
//   "ProxyHost"    host name of the manual proxy (absent when none was given)
//   "ProxyPort"    its port (absent when none was given)
// Loads on PropSheetEvent 1000, refuses a port outside 1..65535 on 1003,
// stores on 1004.
class ORBHOSTGUI_EXPORT VantorUpdatePage : public QWidget
{
    Q_OBJECT
public:
    enum ProxyChoice { NoProxy = 0, SystemProxy = 1, ManualProxy = 2 };

    static const char *const Group;    // "WebUpdate"
    static const char *const ItemName; // "VantorUpdate"

    explicit VantorUpdatePage(QWidget *parent = nullptr);

    // Adds the page's item to `sheet`; the page is made when first shown.
    static void addTo(PropSheet *sheet);

    // Reads the stored choice into the page; no stored choice shows the
    // system's proxy settings.
    void loadPage();
    // Stores the page's choice; a manual choice also stores host and port.
    void applyPage();
    // False, after telling the user, when the manual choice has a port that
    // is not a number from 1 to 65535.
    bool validatePage();

    QRadioButton *noProxyButton() const { return m_none; }
    QRadioButton *systemProxyButton() const { return m_system; }
    QRadioButton *manualProxyButton() const { return m_manual; }
    QLineEdit *hostEdit() const { return m_host; }
    QLineEdit *portEdit() const { return m_port; }

protected:
    void customEvent(QEvent *event) override;

private:
    void updateEnabled();
    bool portAcceptable() const;

    QRadioButton *m_none;
    QRadioButton *m_system;
    QRadioButton *m_manual;
    QLineEdit *m_host;
    QLineEdit *m_port;
};

} // namespace Clip
} // namespace Gui
