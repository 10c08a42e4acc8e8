// corvid-screenshots: renders the review dialog (each tab), the send method
// dialog, the countdown, the preference page, the send history and orb's
// main window to PNG files, for the documentation. It works on a copy of the sample project and on private
// settings, so it neither touches the user's own nor sends anything.
//
//   corvid-screenshots [--out DIR]     (default: docs/screenshots of the sources)

#include "app/MainWindow.h"
#include "host/StatusLine.h"
#include "host/gui/DataCollector.h"
#include "host/gui/PropSheet.h"
#include "host/project/OrbProject.h"
#include "plugin/CollectionCycle.h"
#include "transmit/SendDispatcher.h"
#include "transmit/SendHistory.h"
#include "transmit/SendRecorder.h"
#include "ui/DataCollectionDialog.h"
#include "ui/PropPageCreator.h"
#include "ui/SendClipDlg.h"
#include "ui/SendHistoryDialog.h"
#include "ui/SendToClipDlg.h"

#include <QApplication>
#include <QDir>
#include <QEventLoop>
#include <QFileInfo>
#include <QLabel>
#include <QPixmap>
#include <QProcess>
#include <QTabWidget>
#include <QTemporaryDir>
#include <QTimer>

#include <cstdio>

namespace {

bool copyTree(const QString &from, const QString &to)
{
    QDir().mkpath(to);
    const QDir source(from);
    for (const QFileInfo &entry : source.entryInfoList(QDir::Files | QDir::Dirs | QDir::NoDotAndDotDot)) {
        const QString target = to + QLatin1Char('/') + entry.fileName();
        if (entry.isDir() ? !copyTree(entry.filePath(), target) : !QFile::copy(entry.filePath(), target))
            return false;
    }
    return true;
}

QByteArray readPage(const QString &path)
{
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

bool save(QWidget *widget, const QString &dir, const char *name)
{
    widget->show();
    QApplication::processEvents();
    const QString path = dir + QLatin1Char('/') + QLatin1String(name) + QLatin1String(".png");
    if (!widget->grab().save(path)) {
        std::fprintf(stderr, "corvid-screenshots: cannot write %s\n", qPrintable(path));
        return false;
    }
    std::printf("%s\n", qPrintable(QDir::toNativeSeparators(path)));
    return true;
}

// Three sends of `page` in the private history: an e-mail, a failed upload
// and a delivered one.
void recordSends(const QByteArray &page, const QString &projectFile)
{
    CrvC_SendHistory history;
    const QDateTime now = QDateTime::currentDateTimeUtc();
    const struct
    {
        CrvC_SendHistory::Method method;
        int minutesAgo;
        CrvC_SendHistory::State state;
        const char *destination;
        const char *detail;
    } sends[] = {
        {CrvC_SendHistory::Method::Email, 4000, CrvC_SendHistory::State::Handed,
         "usage-statistics@vantor.example", "/usr/bin/thunderbird"},
        {CrvC_SendHistory::Method::Upload, 1500, CrvC_SendHistory::State::Failed,
         "https://www.vantor.example", "Could not connect to www.vantor.example."},
        {CrvC_SendHistory::Method::Upload, 2, CrvC_SendHistory::State::Sent,
         "https://upload.vantor.example/cgi-bin/corvid/upload", "Thank you: report 1187 received."},
    };
    for (const auto &send : sends) {
        CrvC_SendHistory::Entry entry;
        entry.time = now.addSecs(-60 * send.minutesAgo);
        entry.project = projectFile;
        entry.design = QStringLiteral("ledctrl");
        entry.method = send.method;
        entry.destination = QLatin1String(send.destination);
        if (send.method == CrvC_SendHistory::Method::Upload) {
            entry.domain = QStringLiteral("example.org");
            entry.regid = QStringLiteral("REG-2231-7781");
        }
        qint64 attempt = 0;
        history.addEntry(entry, page, &attempt);
        history.finishAttempt(attempt, send.state, QLatin1String(send.detail),
                              send.state == CrvC_SendHistory::State::Handed ? -1
                              : send.state == CrvC_SendHistory::State::Sent ? 0
                                                                            : 4);
    }
}

} // namespace

int main(int argc, char **argv)
{
    // Private settings and home before anything reads them.
    QTemporaryDir temp;
    if (!temp.isValid())
        return 1;
    qputenv("HOME", QFile::encodeName(temp.path()));
    qputenv("XDG_CONFIG_HOME", QFile::encodeName(temp.path() + QLatin1String("/.config")));
    qputenv("XDG_DATA_HOME", QFile::encodeName(temp.path() + QLatin1String("/.local/share")));
    qputenv("XDG_CACHE_HOME", QFile::encodeName(temp.path() + QLatin1String("/.cache")));
    qputenv("APPDATA", QFile::encodeName(temp.path() + QLatin1String("/appdata")));
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM"))
        qputenv("QT_QPA_PLATFORM", "offscreen");
    QApplication app(argc, argv);

    QString out = QStringLiteral(CORVID_SOURCE_DIR "/docs/screenshots");
    const QStringList args = app.arguments();
    for (int i = 1; i < args.size(); ++i) {
        if (args.at(i) == QLatin1String("--out") && i + 1 < args.size()) {
            out = args.at(++i);
        } else {
            std::fprintf(stderr, "usage: corvid-screenshots [--out DIR]\n");
            return 1;
        }
    }
    out = QFileInfo(out).absoluteFilePath();
    QDir().mkpath(out);

    const QString project = temp.path() + QLatin1String("/ledctrl");
    if (!copyTree(QStringLiteral(CORVID_SOURCE_DIR "/examples/ledctrl"), project)) {
        std::fprintf(stderr, "corvid-screenshots: cannot copy the sample project\n");
        return 1;
    }
    QString error;
    if (!OrbProject::openCurrentProject(project + QLatin1String("/ledctrl.orb"), &error)) {
        std::fprintf(stderr, "corvid-screenshots: %s\n", qPrintable(error));
        return 1;
    }
    QString projectFile, family;
    CrvC_CollectionCycle::currentProject(projectFile, family);
    QDir::setCurrent(project);

    // Nothing leaves the machine.
    CrvC_SendDispatcher::setStarter([](CrvC_SendDispatcher::Method, const QString &, const QString &) {});

    bool ok = true;
    {
        CrvC_DataCollectionDialog review;
        review.createReport(projectFile, QStringLiteral("ledctrl"), family);
        review.resize(760, 680);
        // The destination line as it is shown, but with a domain of the
        // documentation's rather than this machine's.
        review.show();
        CrvC_SendDispatcher::Destination destination = CrvC_SendDispatcher::destination();
        destination.domain = QStringLiteral("example.com");
        review.destinationLabel()->setText(CrvC_DataCollectionDialog::destinationText(destination));
        const char *const names[] = {"review-introduction", "review-contents", "review-help"};
        for (int tab = 0; tab < 3; ++tab) {
            review.tabWidget()->setCurrentIndex(tab);
            ok &= save(&review, out, names[tab]);
        }
    }
    {
        CrvC_SendToClipDlg method(nullptr, project + QLatin1String("/device_usage_statistics.html"));
        ok &= save(&method, out, "send-method");
    }
    {
        auto *countdown = new CrvC_SendClipDlg(nullptr, projectFile, QStringLiteral("ledctrl"), family);
        countdown->setAttribute(Qt::WA_DeleteOnClose, false);
        countdown->timer()->stop();
        countdown->OnTimeOut();
        countdown->OnTimeOut();
        ok &= save(countdown, out, "countdown");
        delete countdown;
    }
    {
        Gui::Clip::PropSheet sheet;
        Gui::Clip::DataCollector collector(Gui::Clip::DataCollector::PreferenceSheet, &sheet);
        CrvC_PropPageCreator::addPreferenceItem(collector);
        sheet.showItem(sheet.itemCount() - 1);
        sheet.resize(640, 420);
        ok &= save(&sheet, out, "preferences");
    }
    recordSends(readPage(project + QLatin1String("/device_usage_statistics.html")), projectFile);
    {
        CrvC_SendHistoryDialog history;
        QEventLoop loop;
        QObject::connect(&history, &CrvC_SendHistoryDialog::pageShown, &loop, &QEventLoop::quit);
        QTimer::singleShot(10000, &loop, &QEventLoop::quit);
        history.show();
        loop.exec();
        ok &= save(&history, out, "sent-reports");
    }
    {
        MainWindow window;
        CrvC_SendRecorder::Attempt sent;
        sent.destination = QStringLiteral("https://upload.vantor.example/cgi-bin/corvid/upload");
        sent.bytes = QFileInfo(project + QLatin1String("/device_usage_statistics.html")).size();
        Port::StatusLine::show(CrvC_SendRecorder::statusText(sent, CrvC_SendHistory::State::Sent, QString()));
        ok &= save(&window, out, "main-window");
    }
    CrvC_SendRecorder::waitForDone();
    OrbProject::closeCurrentProject();
    return ok ? 0 : 1;
}
