#pragma once

#include <QMainWindow>

class QMenu;

// The host's main window: the current project's name in the title, File >
// Open... (starting in the project's folder, usage files first) with the
// recently opened files, Edit > Preferences..., Help > About, and the status
// bar where the host's status line (Port::StatusLine) appears.
class MainWindow : public QMainWindow
{
    Q_OBJECT
public:
    static const int MaxRecentFiles = 8;

    explicit MainWindow(QWidget *parent = nullptr);
    ~MainWindow() override;

    // The files opened last, newest first (settings group "MainWindow").
    static QStringList recentFiles();

public Q_SLOTS:
    void openFile();
    // Hands `fileName` to the editors and remembers it; warns when none
    // claims it.
    void open(const QString &fileName);
    void showPreferences();
    // Asks vancurl for libcurl's version, then shows the versions.
    void showAbout();

private:
    void fillRecentMenu();

    QMenu *m_recent = nullptr;
};
