#include "MainWindow.h"
#include "Orb.h"

#include "host/gui/ApplicationBase.h"
#include "host/gui/DataCollector.h"
#include "host/gui/PropSheet.h"
#include "host/gui/VantorUpdatePage.h"

#include <QFileDialog>
#include <QLabel>
#include <QMenuBar>
#include <QMessageBox>

MainWindow::MainWindow(QWidget *parent)
    : QMainWindow(parent)
{
    setWindowTitle(tr("Orb Design Environment"));
    QMenu *file = menuBar()->addMenu(tr("&File"));
    file->addAction(tr("&Open..."), QKeySequence::Open, this, &MainWindow::openFile);
    file->addSeparator();
    file->addAction(tr("E&xit"), QKeySequence::Quit, this, &QWidget::close);
    QMenu *edit = menuBar()->addMenu(tr("&Edit"));
    edit->addAction(tr("&Preferences..."), this, &MainWindow::showPreferences);

    auto *label = new QLabel(Orb::currentProjectDescription(), this);
    label->setAlignment(Qt::AlignCenter);
    setCentralWidget(label);
    resize(640, 400);
}

void MainWindow::openFile()
{
    const QString fileName = QFileDialog::getOpenFileName(this, tr("Open File"));
    if (fileName.isEmpty())
        return;
    if (!Orb::openFile(fileName, nullptr))
        QMessageBox::warning(this, tr("Open File"), tr("No editor can open %1.").arg(fileName));
}

void MainWindow::showPreferences()
{
    Gui::Clip::PropSheet sheet(this);
    Gui::Clip::VantorUpdatePage::addTo(&sheet);
    Gui::Clip::DataCollector collector(Gui::Clip::DataCollector::PreferenceSheet, &sheet);
    static_cast<Gui::Clip::ApplicationBase *>(QCoreApplication::instance())->requestData(collector);
    if (sheet.itemCount() > 0)
        sheet.showItem(0);
    sheet.exec();
}
