// corvid-bench: generates a large design project (command log, usage XML,
// netlist-build report, help viewer file, synthesis report, sub-report pages)
// at several sizes and times the report build on each, so that the build's
// growth with its input can be seen. Not a test: it prints figures.
//
//   corvid-bench [--scale F] [--steps N] [--usage F] [--keep DIR] [--cycle]
//
// --usage F scales the usage XML alone (0.25: a 16 MB usage XML beside a
// scale-1 command log and core report), for projects of another shape.
// Scale 1 is the reference project: 200,000 command-log lines, a usage XML of
// about 63 MB, 20,000 core instances, 20,000 help entries. Step k of N builds
// the project at k/N of the scale.
//
// With --cycle, each step also runs a whole collection cycle (the countdown
// shown at once, its report built in the background, five one-second ticks,
// the send started) and prints the longest time the GUI thread handled no
// events ("stall ms"), measured with a 10 ms timer. The send goes to
// CORVID_SERVER, which must name this machine (a corvid-receiver as
// scripts/demo.sh starts it), else to https://127.0.0.1:9, where the upload
// fails at once; without a proxy, and with settings of its own in the
// temporary folder, so the user's are neither read nor changed.
//
// When xmllint is installed, each step also times `xmllint --noout` on the
// same usage XML: the cost of merely parsing the largest input, measured in
// the same run, as a floor to read the build time against.

#include "host/Version.h"
#include "report/ReportBuilder.h"
#include "ui/DataCollectionDialog.h"
#include "ui/SendClipDlg.h"

#include <QApplication>
#include <QDir>
#include <QElapsedTimer>
#include <QEventLoop>
#include <QFile>
#include <QFileInfo>
#include <QPointer>
#include <QProcess>
#include <QPushButton>
#include <QStandardPaths>
#include <QTemporaryDir>
#include <QTimer>
#include <QUrl>

#include <sys/resource.h>
#include <time.h>

#include <algorithm>
#include <cstdio>
#include <functional>

namespace {

struct Sizes
{
    int commandLines;
    int usageItems; // items in the usage XML, about 60 bytes each
    int coreInstances;
    int helpEntries;
    int macroLines;
};

Sizes sizesFor(double scale, double usageScale)
{
    return {int(200000 * scale), int(800000 * scale * usageScale), int(20000 * scale), int(20000 * scale),
            int(50000 * scale)};
}

// Writes a file in chunks so that generating 50 MB needs little memory.
bool writeChunks(const QString &path, const std::function<bool(QByteArray &chunk)> &next)
{
    QDir().mkpath(QFileInfo(path).absolutePath());
    QFile file(path);
    if (!file.open(QIODevice::WriteOnly))
        return false;
    QByteArray chunk;
    chunk.reserve(1 << 20);
    bool more = true;
    while (more) {
        chunk.clear();
        more = next(chunk);
        if (file.write(chunk) != chunk.size())
            return false;
    }
    return true;
}

qint64 fileSize(const QString &path)
{
    return QFileInfo(path).size();
}

bool generate(const QString &dir, const QString &design, const Sizes &s, qint64 &bytes)
{
    const QString base = dir + QLatin1Char('/') + design;
    bool ok = true;

    int line = 0;
    ok &= writeChunks(base + QLatin1String(".cmd_log"), [&](QByteArray &c) {
        for (int i = 0; i < 5000 && line < s.commandLines; ++i, ++line) {
            switch (line % 4) {
            case 0:
                c += "synth -ifn \"" + design.toUtf8() + ".prj\" -ofn " + design.toUtf8() + ".ngc\n";
                break;
            case 1:
                c += "map -o " + design.toUtf8() + "_map.ncd " + design.toUtf8() + ".ngd -w\n";
                break;
            case 2:
                c += "par -w -ol high " + design.toUtf8() + "_map.ncd " + design.toUtf8() + ".ncd\n";
                break;
            default:
                c += "bitgen -w \"C:/work/" + design.toUtf8() + "/" + design.toUtf8() + ".ut\" x.bit\n";
                break;
            }
        }
        return line < s.commandLines;
    });

    // Four sections of equal size, groups of 50 items; one item in three has
    // a value, the others "used"/"total" attrib children.
    const char *sections[] = {"DesignStatistics", "DeviceUsage", "ReportConfigData", "ReportPinData"};
    const int perSection = qMax(1, s.usageItems / 4);
    int section = -1;
    int item = 0;
    ok &= writeChunks(base + QLatin1String("_usage.xml"), [&](QByteArray &c) {
        if (section < 0) {
            c += "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<DeviceUsageReport>\n";
            section = 0;
        }
        for (int i = 0; i < 10000 && section < 4; ++i) {
            if (item == 0)
                c += QByteArray("<") + sections[section] + ">\n";
            if (item % 50 == 0) {
                const bool net = section == 0 && item % 1000 == 0;
                c += "<group name=\"" + QByteArray(net ? "NetStatistics" : "Group") + QByteArray::number(item)
                     + "\">\n";
            }
            if (item % 3 == 0)
                c += "<item name=\"Slice LUTs\" value=\"" + QByteArray::number(item) + "\"/>\n";
            else
                c += "<item name=\"Registers\"><attrib name=\"used\" value=\"12\"/><attrib name=\"total\" "
                     "value=\"100\"/></item>\n";
            ++item;
            if (item % 50 == 0 || item == perSection)
                c += "</group>\n";
            if (item == perSection) {
                c += QByteArray("</") + sections[section] + ">\n";
                item = 0;
                ++section;
            }
        }
        if (section == 4) {
            c += "</DeviceUsageReport>\n";
            return false;
        }
        return true;
    });

    int core = 0;
    bool coreHeader = false;
    ok &= writeChunks(base + QLatin1String("_lnkgen.drpt"), [&](QByteArray &c) {
        if (!coreHeader) {
            c += "<?xml version=\"1.0\"?>\n<document>\n";
            coreHeader = true;
        }
        for (int i = 0; i < 2000 && core < s.coreInstances; ++i, ++core) {
            c += "<scope stringID=\"LNKGEN_CORE_INSTANCE\" value=\"u" + QByteArray::number(core) + "\">\n"
                 "<item stringID=\"LNKGEN_CORE_INFO\" type=\"fifo_generator\" value=\"x\" version=\"9.3\" vendor=\"vantor\"/>\n"
                 "<item stringID=\"LNKGEN_CORE_PARAMETERS\" value=\"\" component_name=\"f\" depth=\"1024\" width=\"32\" clocks=\"2\"/>\n"
                 "</scope>\n";
        }
        if (core >= s.coreInstances)
            c += "</document>\n";
        return core < s.coreInstances;
    });

    const QByteArray version = QByteArray(Port::Version::getValue("version").c_str()).left(4);
    int help = 0;
    bool helpHeader = false;
    const QString helpFile = dir + QLatin1String("/appdata/Vantor/Common/") + QString::fromUtf8(version)
                             + QLatin1String("/orbhelpviewerdata.xml");
    ok &= writeChunks(helpFile, [&](QByteArray &c) {
        if (!helpHeader) {
            c += "<?xml version=\"1.0\"?>\n<HelpViewerData>\n";
            helpHeader = true;
        }
        for (int i = 0; i < 2000 && help < s.helpEntries; ++i, ++help) {
            if (help % 3 == 2)
                c += "<OpenHelpFile count=\"" + QByteArray::number(help % 17) + "\">topic"
                     + QByteArray::number(help) + ".htm</OpenHelpFile>\n";
            else
                c += "<SearchString found=\"" + QByteArray(help % 3 ? "false" : "true") + "\" count=\""
                     + QByteArray::number(help % 9) + "\">search " + QByteArray::number(help)
                     + "</SearchString>\n";
        }
        if (help >= s.helpEntries)
            c += "</HelpViewerData>\n";
        return help < s.helpEntries;
    });

    int macro = 0;
    bool macroHeader = false;
    ok &= writeChunks(base + QLatin1String(".snx"), [&](QByteArray &c) {
        if (!macroHeader) {
            c +=
                "Synthesis log\n\n=========================================================================\n"
                "Advanced HDL Synthesis Report\n\nMacro Statistics\n"
                "=========================================================================\n\n";
            macroHeader = true;
        }
        for (int i = 0; i < 5000 && macro < s.macroLines; ++i, ++macro) {
            if (macro % 20 == 0)
                c += "# Registers                                          : " + QByteArray::number(macro)
                     + "\n";
            else
                c += " Flip-Flops                                           : " + QByteArray::number(macro)
                     + "\n";
        }
        if (macro >= s.macroLines)
            c += "\n=========================================================================\n";
        return macro < s.macroLines;
    });

    ok &= writeChunks(base + QLatin1String("_map.ktp"), [&](QByteArray &c) {
        c += "Release 14.7 Map\n\nTarget Device  : xc6a25\nTarget Package : csg324\nTarget Speed   : -2\n";
        return false;
    });

    int row = 0;
    ok &= writeChunks(dir + QLatin1String("/par_usage_statistics.html"), [&](QByteArray &c) {
        for (int i = 0; i < 2000 && row < s.coreInstances; ++i, ++row)
            c += "<TR><TD>route pass " + QByteArray::number(row) + "</TD><TD>1</TD></TR>\n";
        return row < s.coreInstances;
    });

    bytes = 0;
    for (const QFileInfo &f : QDir(dir).entryInfoList(QDir::Files))
        bytes += f.size();
    bytes += fileSize(helpFile);
    return ok;
}

// The process's peak resident set so far (VmHWM), in KiB; 0 when unknown.
long peakRssKiB()
{
    QFile status(QStringLiteral("/proc/self/status"));
    if (!status.open(QIODevice::ReadOnly | QIODevice::Text))
        return 0;
    // Files under /proc have no size: read to the end rather than test atEnd().
    for (const QByteArray &line : status.readAll().split('\n')) {
        if (line.startsWith("VmHWM:"))
            return line.mid(6).simplified().split(' ').value(0).toLong();
    }
    return 0;
}

// Processor time of this process so far (all threads, user and system), in ms.
qint64 cpuMs()
{
    rusage usage{};
    getrusage(RUSAGE_SELF, &usage);
    return qint64(usage.ru_utime.tv_sec + usage.ru_stime.tv_sec) * 1000
           + (usage.ru_utime.tv_usec + usage.ru_stime.tv_usec) / 1000;
}

// Processor time of the calling thread so far, in ms: the part of a build
// that no other thread can take over.
qint64 threadCpuMs()
{
    timespec t{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &t);
    return qint64(t.tv_sec) * 1000 + t.tv_nsec / 1000000;
}

// Starts the peak resident set afresh from the present one, so that each
// step's peak is its own; false where the system does not allow it.
bool resetPeakRss()
{
    QFile clear(QStringLiteral("/proc/self/clear_refs"));
    return clear.open(QIODevice::WriteOnly) && clear.write("5") == 1;
}

// Milliseconds that `xmllint --noout file` takes; -1 when it cannot run.
qint64 xmllintMs(const QString &xmllint, const QString &file)
{
    if (xmllint.isEmpty())
        return -1;
    QProcess process;
    process.setProcessChannelMode(QProcess::ForwardedErrorChannel);
    QElapsedTimer timer;
    timer.start();
    process.start(xmllint, {QStringLiteral("--noout"), QStringLiteral("--huge"), file});
    if (!process.waitForFinished(-1) || process.exitStatus() != QProcess::NormalExit
        || process.exitCode() != 0)
        return -1;
    return timer.elapsed();
}

// Settings, page copies and the server of --cycle: all private to `root`,
// the server on this machine only. False when CORVID_SERVER names another.
bool prepareCycle(const QString &root)
{
    const QString server = qEnvironmentVariable("CORVID_SERVER");
    const QString host = QUrl(server).host();
    if (!server.isEmpty() && host != QLatin1String("127.0.0.1") && host != QLatin1String("localhost")
        && host != QLatin1String("::1"))
        return false;
    if (server.isEmpty())
        qputenv("CORVID_SERVER", "https://127.0.0.1:9");
    qputenv("XDG_CONFIG_HOME", QFile::encodeName(root + QLatin1String("/config")));
    qputenv("XDG_CACHE_HOME", QFile::encodeName(root + QLatin1String("/cache")));
    QDir().mkpath(root + QLatin1String("/config/orb"));
    QFile ini(root + QLatin1String("/config/orb/orb.ini"));
    return ini.open(QIODevice::WriteOnly) && ini.write("[WebUpdate]\nProxyChoice=0\n") > 0;
}

// One whole cycle in this process, as the plug-in runs it for an opened usage
// file: the countdown made and shown, five ticks, the send. Answers the
// longest gap between the ticks of a 10 ms timer on this (the GUI) thread,
// from before the countdown is made until 2 s after it has closed.
qint64 cycleStallMs(const QString &design)
{
    QElapsedTimer clock;
    clock.start();
    qint64 last = 0, longest = 0;
    QTimer probe;
    probe.setTimerType(Qt::PreciseTimer);
    QObject::connect(&probe, &QTimer::timeout, [&] {
        longest = std::max(longest, clock.elapsed() - last);
        last = clock.elapsed();
    });
    probe.start(10);

    QEventLoop loop;
    QPointer<CrvC_SendClipDlg> countdown;
    bool started = false;
    QTimer watch;
    QObject::connect(&watch, &QTimer::timeout, [&] {
        if (!started) {
            started = true;
            countdown = new CrvC_SendClipDlg(nullptr, QString(), design, QStringLiteral("Xc6"));
            countdown->show();
        } else if (countdown.isNull()) {
            watch.stop();
            QTimer::singleShot(2000, &loop, &QEventLoop::quit);
        }
    });
    watch.start(50);
    QTimer::singleShot(120000, &loop, &QEventLoop::quit);
    loop.exec();
    delete countdown;
    return longest;
}

} // namespace

int main(int argc, char **argv)
{
    // The review dialog is timed too; without a display it is drawn offscreen.
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM") && qEnvironmentVariableIsEmpty("DISPLAY")
        && qEnvironmentVariableIsEmpty("WAYLAND_DISPLAY"))
        qputenv("QT_QPA_PLATFORM", "offscreen");
    QApplication app(argc, argv);
    double scale = 1.0;
    int steps = 4;
    double usageScale = 1.0;
    QString keep;
    bool cycle = false;
    const QStringList args = app.arguments();
    for (int i = 1; i < args.size(); ++i) {
        if (args.at(i) == QLatin1String("--scale") && i + 1 < args.size())
            scale = args.at(++i).toDouble();
        else if (args.at(i) == QLatin1String("--steps") && i + 1 < args.size())
            steps = qMax(1, args.at(++i).toInt());
        else if (args.at(i) == QLatin1String("--usage") && i + 1 < args.size())
            usageScale = args.at(++i).toDouble();
        else if (args.at(i) == QLatin1String("--keep") && i + 1 < args.size())
            keep = args.at(++i);
        else if (args.at(i) == QLatin1String("--cycle"))
            cycle = true;
        else {
            std::fprintf(stderr,
                         "usage: corvid-bench [--scale F] [--steps N] [--usage F] [--keep DIR] [--cycle]\n");
            return 1;
        }
    }

    QTemporaryDir temp;
    const QString root = keep.isEmpty() ? temp.path() : QFileInfo(keep).absoluteFilePath();
    const QString xmllint = QStandardPaths::findExecutable(QStringLiteral("xmllint"));
    if (cycle && !prepareCycle(root)) {
        std::fprintf(stderr, "corvid-bench: CORVID_SERVER must name this machine\n");
        return 1;
    }
    std::printf("%-5s %10s %12s %7s %7s %9s %9s %8s %9s %11s %8s %10s %9s\n", "step", "cmd lines",
                "usage items", "cores", "help", "input MB", "build ms", "cpu ms", "main cpu", "xmllint ms",
                "peak MB", "dialog ms", "stall ms");
    long buildsPeakKiB = 0, runPeakKiB = 0;
    for (int step = 1; step <= steps; ++step) {
        const Sizes sizes = sizesFor(scale * step / steps, usageScale);
        const QString dir = root + QLatin1String("/step") + QString::number(step);
        QDir().mkpath(dir);
        qint64 bytes = 0;
        if (!generate(dir, QStringLiteral("bench"), sizes, bytes)) {
            std::fprintf(stderr, "corvid-bench: cannot write the project in %s\n", qPrintable(dir));
            return 1;
        }
        qputenv("APPDATA", QFile::encodeName(dir + QLatin1String("/appdata")));
        QDir::setCurrent(dir);

        runPeakKiB = std::max(runPeakKiB, peakRssKiB());
        const bool stepPeak = resetPeakRss();
        const qint64 cpuBefore = cpuMs();
        const qint64 mainBefore = threadCpuMs();
        QElapsedTimer timer;
        timer.start();
        CrvC_DataCollectionDialog dialog;
        CrvC_ReportBuilder &builder = dialog.builder();
        builder.createReport(QString(), QStringLiteral("bench"), QStringLiteral("Xc6"));
        const qint64 ms = timer.elapsed();
        const qint64 cpu = cpuMs() - cpuBefore;
        const qint64 mainCpu = threadCpuMs() - mainBefore;
        const long buildPeak = peakRssKiB();

        // The review dialog after the build: the page into the Contents tab,
        // the dialog on screen, and a click on "Verify Contents" answered
        // with the tab drawn.
        timer.restart();
        dialog.showContents();
        dialog.show();
        app.processEvents();
        dialog.verifyButton()->click();
        dialog.grab();
        const qint64 dialogMs = timer.elapsed();
        dialog.hide();
        if (!builder.written()) {
            std::fprintf(stderr, "corvid-bench: the page was not written\n");
            return 1;
        }
        const qint64 floorMs = xmllintMs(xmllint, dir + QLatin1String("/bench_usage.xml"));
        const qint64 stallMs = cycle ? cycleStallMs(QStringLiteral("bench")) : -1;
        std::printf("%-5d %10d %12d %7d %7d %9.1f %9lld %8lld %9lld %11s %8.1f %10lld %9s\n", step,
                    sizes.commandLines, sizes.usageItems, sizes.coreInstances, sizes.helpEntries,
                    bytes / 1048576.0, static_cast<long long>(ms), static_cast<long long>(cpu),
                    static_cast<long long>(mainCpu), floorMs < 0 ? "-" : qPrintable(QString::number(floorMs)),
                    buildPeak / 1024.0, static_cast<long long>(dialogMs),
                    stallMs < 0 ? "-" : qPrintable(QString::number(stallMs)));
        buildsPeakKiB = std::max(buildsPeakKiB, buildPeak);
        if (!stepPeak)
            std::printf("(the peak is the process's so far: it cannot be reset here)\n");
        std::fflush(stdout);
    }
    if (xmllint.isEmpty())
        std::printf("xmllint not found: no parsing floor (Debian package libxml2-utils)\n");
    std::printf(
        "peak resident memory of the builds: %.1f MB (with the dialogs: %.1f MB); "
        "page of the last step: %.1f MB\n",
        buildsPeakKiB / 1024.0, std::max(runPeakKiB, peakRssKiB()) / 1024.0,
        fileSize(root + QLatin1String("/step") + QString::number(steps)
                 + QLatin1String("/device_usage_statistics.html"))
            / 1048576.0);
    return 0;
}
