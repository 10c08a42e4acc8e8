// corvid-ingest-bench: how fast received pages go into the back end's
// database on one core. Makes varied sample-size pages (the sample page with
// other identifiers, targets, products and run counts) in the receiver's
// layout, then times the page reader alone and the whole ingest into SQLite.
// Not a test: it prints figures (docs/backend.md).
//
//   corvid-ingest-bench [--pages N] [--db URL] [--commit-every N]
//   corvid-ingest-bench --generate DIR [--pages N] [--first K]
//
// --generate only writes the pages (upload folders K, K+1, ...) for a run of
// corvid-ingest processes elsewhere, e.g. the scale simulation.

#include "SamplePage.h"

#include "backend/Ingest.h"
#include "backend/PageReader.h"
#include "backend/Store.h"

#include <QCoreApplication>
#include <QDateTime>
#include <QDir>
#include <QElapsedTimer>
#include <QFile>
#include <QTemporaryDir>

#include <time.h>

#include <cstdio>

namespace {

// Processor time of the calling thread, in ms.
double threadCpuMs()
{
    timespec t{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &t);
    return double(t.tv_sec) * 1000 + double(t.tv_nsec) / 1e6;
}

QByteArray hex32(quint64 n)
{
    return QByteArray::number(n, 16).rightJustified(32, '0');
}

// Page `i`: the sample with values of a few hundred users, projects and
// targets; the date makes every page's bytes its own.
QByteArray variedPage(int i)
{
    static const char *const families[] = {"Xc6", "Xc7", "Ya1", "Yb2", "Zk9"};
    static const char *const devices[] = {"xc6a25", "xc6a50", "xc7k70", "ya1s15", "yb2t40", "zk9m100"};
    static const char *const packages[] = {"csg324", "fgg484", "ftg256", "cpg236"};
    static const char *const speeds[] = {"-1", "-2", "-3"};
    static const char *const products[] = {"Orb Design Suite:14.5", "Orb Design Suite:14.6",
                                           "Orb Design Suite:14.7"};
    static const char *const platforms[] = {"LIN64", "NT64", "LIN"};
    QByteArray page(samplePage);
    auto set = [&page](const char *from, const QByteArray &to) { page.replace(from, to); };
    set("5eed0000000000000000000000000001", hex32(quint64(i % 400) + 1));
    set("9a0be000000000000000000000000002", hex32(quint64(i % 1500) + 0x9a0be00000ull));
    set("\"ProjectIteration\">1<", "\"ProjectIteration\">" + QByteArray::number(i % 7 + 1) + "<");
    set(">Xc6<", QByteArray(">") + families[i % 5] + "<");
    set(">xc6a25<", QByteArray(">") + devices[i % 6] + "<");
    set(">csg324<", QByteArray(">") + packages[i % 4] + "<");
    set("\"TargetSpeed\">-2<", QByteArray("\"TargetSpeed\">") + speeds[i % 3] + "<");
    set("Orb Design Suite:14.7", products[i % 3]);
    set(">LIN64<", QByteArray(">") + platforms[i % 3] + "<");
    set("<dtag-run-count>3</dtag-run-count>",
        "<dtag-run-count>" + QByteArray::number(i % 9 + 1) + "</dtag-run-count>");
    set("Tue Mar 17 14:05:09 2026",
        QDateTime(QDate(2026, 1, 1), QTime(0, 0)).addSecs(i).toString(Qt::TextDate).toUtf8());
    return page;
}

bool writePages(const QString &dir, int first, int count, qint64 &bytes)
{
    bytes = 0;
    for (int i = first; i < first + count; ++i) {
        const QString folder = dir + QStringLiteral("/%1").arg(i, 6, 10, QLatin1Char('0'));
        const QByteArray page = variedPage(i);
        bytes += page.size();
        QFile file(folder + QLatin1String("/device_usage_statistics.html"));
        QFile fields(folder + QLatin1String("/fields.txt"));
        if (!QDir().mkpath(folder) || !file.open(QIODevice::WriteOnly) || file.write(page) != page.size()
            || !fields.open(QIODevice::WriteOnly)
            || fields.write("received=2026-03-" + QByteArray::number(i % 28 + 1).rightJustified(2, '0')
                            + "T12:00:00Z\ndomain=example.org\nregid=REG-" + QByteArray::number(i % 400)
                            + "\nstored_as=device_usage_statistics.html\n")
                < 0)
            return false;
    }
    return true;
}

int fail(const QString &message)
{
    std::fprintf(stderr, "corvid-ingest-bench: %s\n", qUtf8Printable(message));
    return 1;
}

} // namespace

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    int pages = 5000, first = 1, commitEvery = 200;
    QString generate, url;
    const QStringList args = app.arguments();
    for (int i = 1; i + 1 < args.size(); i += 2) {
        if (args.at(i) == QLatin1String("--pages"))
            pages = args.at(i + 1).toInt();
        else if (args.at(i) == QLatin1String("--first"))
            first = args.at(i + 1).toInt();
        else if (args.at(i) == QLatin1String("--generate"))
            generate = args.at(i + 1);
        else if (args.at(i) == QLatin1String("--commit-every"))
            commitEvery = args.at(i + 1).toInt();
        else if (args.at(i) == QLatin1String("--db"))
            url = args.at(i + 1);
        else
            return fail(QStringLiteral(
                "usage: corvid-ingest-bench [--pages N] [--db URL] [--commit-every N] | --generate DIR "
                "[--pages N] [--first K]"));
    }
    if (pages < 1 || first < 1 || commitEvery < 1 || args.size() % 2 == 0)
        return fail(QStringLiteral("--pages, --first and --generate need values (see the source's head)"));
    qint64 bytes = 0;
    if (!generate.isEmpty()) {
        if (!writePages(generate, first, pages, bytes))
            return fail(QStringLiteral("cannot write the pages into %1").arg(generate));
        std::printf("%d pages, %.1f KB each on average, in %s\n", pages, double(bytes) / pages / 1024,
                    qUtf8Printable(generate));
        return 0;
    }

    QTemporaryDir work;
    const QString received = work.path() + QLatin1String("/received");
    if (!work.isValid() || !writePages(received, first, pages, bytes))
        return fail(QStringLiteral("cannot write the pages"));
    if (url.isEmpty())
        url = QLatin1String("sqlite:") + work.path() + QLatin1String("/bench.sqlite");

    // The reader alone, on pages in memory.
    QVector<QByteArray> inMemory;
    for (int i = first; i < first + qMin(pages, 1000); ++i)
        inMemory.append(variedPage(i));
    qint64 values = 0;
    double cpu = threadCpuMs();
    for (const QByteArray &page : inMemory)
        values += CrvB_PageReader::read(page).values.size();
    const double readerMs = (threadCpuMs() - cpu) / inMemory.size();

    CrvB_Store store;
    QString error;
    if (!store.open(url, false, &error))
        return fail(error);
    CrvB_Ingest ingest(store, [](const QString &line) { std::printf("%s\n", qUtf8Printable(line)); });
    QElapsedTimer wall;
    wall.start();
    cpu = threadCpuMs();
    ingest.setCommitEvery(commitEvery);
    ingest.ingestPath(received);
    ingest.finish();
    const double cpuMs = threadCpuMs() - cpu;
    const double wallMs = double(wall.nsecsElapsed()) / 1e6;

    std::printf("pages: %d, %.1f KB each on average, %lld values each\n", pages, double(bytes) / pages / 1024,
                values / inMemory.size());
    std::printf("reader alone: %.3f ms per page (%.0f pages/s)\n", readerMs, 1000 / readerMs);
    std::printf(
        "ingest into %s: %.0f ms wall, %.0f ms on this thread: %.0f pages/s wall, %.0f pages/s per core\n",
        qUtf8Printable(store.url().engine == CrvB_DatabaseUrl::Engine::SQLite ? QStringLiteral("SQLite")
                                                                              : QStringLiteral("PostgreSQL")),
        wallMs, cpuMs, pages * 1000 / wallMs, pages * 1000 / cpuMs);
    std::printf("%s\n", qUtf8Printable(ingest.summary()));
    QFile load(QStringLiteral("/proc/loadavg"));
    if (load.open(QIODevice::ReadOnly))
        std::printf("load average: %s", load.readAll().constData());
    return ingest.counts().ingested == pages ? 0 : 1;
}
