#include "MainWindow.h"
#include "Orb.h"

#include "host/Settings.h"
#include "host/StatusLine.h"
#include "host/VantorPath.h"
#include "host/Version.h"
#include "host/gui/ApplicationBase.h"
#include "host/gui/DataCollector.h"
#include "host/gui/PropSheet.h"
#include "host/gui/VantorUpdatePage.h"
#include "host/project/OrbProject.h"

#include <QDir>
#include <QFileDialog>
#include <QFileInfo>
#include <QLabel>
#include <QMenuBar>
#include <QMessageBox>
#include <QProcess>
#include <QRegularExpression>
#include <QStatusBar>

namespace {

const char *const RecentGroup = "MainWindow";
const char *const RecentKey = "RecentFiles";

} // namespace

MainWindow::MainWindow(QWidget *parent) : QMainWindow(parent)
{
    const QString project = Orb::currentProjectName();
    setWindowTitle(project.isEmpty() ? tr("Orb Design Environment")
                                     : tr("%1 - Orb Design Environment").arg(project));
    QMenu *file = menuBar()->addMenu(tr("&File"));
    file->addAction(tr("&Open..."), QKeySequence::Open, this, &MainWindow::openFile);
    m_recent = file->addMenu(tr("Recent &Files"));
    connect(m_recent, &QMenu::aboutToShow, this, &MainWindow::fillRecentMenu);
    file->addSeparator();
    file->addAction(tr("E&xit"), QKeySequence::Quit, this, &QWidget::close);
    QMenu *edit = menuBar()->addMenu(tr("&Edit"));
    edit->addAction(tr("&Preferences..."), this, &MainWindow::showPreferences);
    QMenu *help = menuBar()->addMenu(tr("&Help"));
    help->addAction(tr("&About Orb..."), this, &MainWindow::showAbout);

    auto *label = new QLabel(Orb::currentProjectDescription(), this);
    label->setAlignment(Qt::AlignCenter);
    setCentralWidget(label);
    statusBar()->showMessage(tr("Ready"));
    Port::StatusLine::setDisplay([this](const QString &text) { statusBar()->showMessage(text); });
    resize(640, 400);
}

MainWindow::~MainWindow()
{
    Port::StatusLine::setDisplay(nullptr);
}

QStringList MainWindow::recentFiles()
{
    return Gui::Clip::Settings(RecentGroup, true, true, true).getValue(RecentKey).toStringList();
}

void MainWindow::fillRecentMenu()
{
    m_recent->clear();
    for (const QString &path : recentFiles())
        m_recent->addAction(QDir::toNativeSeparators(path), this, [this, path] { open(path); });
    if (m_recent->isEmpty())
        m_recent->addAction(tr("(none)"))->setEnabled(false);
}

void MainWindow::openFile()
{
    const QString projectFile = OrbProject::currentProjectFile();
    const QString start = projectFile.isEmpty() ? QDir::currentPath() : QFileInfo(projectFile).absolutePath();
    const QString fileName = QFileDialog::getOpenFileName(this, tr("Open File"), start,
                                                          tr("Usage files (*_usage.xml);;All files (*)"));
    if (!fileName.isEmpty())
        open(fileName);
}

void MainWindow::open(const QString &fileName)
{
    const QString path = QFileInfo(fileName).absoluteFilePath();
    if (!Orb::openFile(path, nullptr)) {
        QMessageBox::warning(this, tr("Open File"), tr("No editor can open %1.").arg(path));
        return;
    }
    QStringList recent = recentFiles();
    recent.removeAll(path);
    recent.prepend(path);
    Gui::Clip::Settings(RecentGroup, true, true, true).setValue(RecentKey, recent.mid(0, MaxRecentFiles));
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

void MainWindow::showAbout()
{
    // The host links no network library: libcurl's version is vancurl's to
    // tell, the installation's own first.
    const QString installed =
        QString::fromStdString(Port::VantorPath::installationRoot()) + QLatin1String("/bin/vancurl");
    auto *tool = new QProcess(this);
    auto show = [this, tool] {
        static const QRegularExpression libcurl(QStringLiteral("libcurl[ /]([0-9][0-9A-Za-z.+-]*)"));
        const QRegularExpressionMatch match = libcurl.match(QString::fromUtf8(tool->readAllStandardOutput()));
        tool->deleteLater();
        const QString product = QString::fromStdString(Port::Version::getValue("product").str());
        const QString version = QString::fromStdString(Port::Version::getValue("version").str());
        QMessageBox::about(this, tr("About Orb"),
                           tr("<h3>%1 %2</h3><p>The Orb design environment.</p>"
                              "<p>Qt %3<br>libcurl %4 (through vancurl)</p>")
                               .arg(product.isEmpty() ? tr("Orb") : product.toHtmlEscaped(),
                                    version.toHtmlEscaped(), QLatin1String(qVersion()),
                                    match.hasMatch() ? match.captured(1) : tr("unknown")));
    };
    connect(tool, &QProcess::finished, this, show);
    connect(tool, &QProcess::errorOccurred, this, [show](QProcess::ProcessError error) {
        if (error == QProcess::FailedToStart)
            show();
    });
    tool->start(QFileInfo(installed).isExecutable() ? installed : QStringLiteral("vancurl"),
                {QStringLiteral("--version")});
}
