#pragma once

#include <QMainWindow>

// The host's main window: File > Open... hands a file to the file editors,
// Edit > Preferences... builds and shows the preference sheet.
class MainWindow : public QMainWindow
{
    Q_OBJECT
public:
    explicit MainWindow(QWidget *parent = nullptr);

public Q_SLOTS:
    void openFile();
    void showPreferences();
};
