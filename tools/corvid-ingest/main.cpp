// corvid-ingest: reads received usage pages into the back end's database, or
// prints the values of one page. See docs/backend.md.

#include "backend/DatabaseUrl.h"
#include "backend/Ingest.h"
#include "backend/PageReader.h"
#include "backend/Store.h"

#include <QCoreApplication>
#include <QFile>
#include <QFileInfo>

#include <cstdio>

namespace {

const char usage[] =
    "Usage: corvid-ingest [--db URL] [--rejected DIR] [--shard K/N] [--commit-every N]\n"
    "                     PATH...\n"
    "       corvid-ingest --print PAGE\n"
    "\n"
    "Reads usage pages (device_usage_statistics.html as senders upload them) into\n"
    "the database URL. PATH is a page file, an upload folder of corvid-receiver, or a\n"
    "folder searched for both (.html files and numbered upload folders; symbolic\n"
    "links and folders whose names start with a dot are not followed).\n"
    "\n"
    "  --db URL        sqlite:FILE (default sqlite:corvid.sqlite) or a PostgreSQL\n"
    "                  URI: postgresql://[USER[:PASSWORD]@][HOST][:PORT][/DATABASE]\n"
    "                  [?host=/socket/folder&port=N&...]. Tables are made when missing.\n"
    "  --rejected DIR  Copy rejected pages, each with a .reason file, into DIR\n"
    "                  (default: rejected/ beside an SQLite file; none for PostgreSQL).\n"
    "  --shard K/N     Take only the uploads whose folder number modulo N is K, so\n"
    "                  that N processes can share one folder (0 <= K < N).\n"
    "  --commit-every N  Pages per transaction (default 200; 1 commits each page\n"
    "                  on its own). Either way a page is stored whole or not at all.\n"
    "  --print PAGE    Print the page's values as JSON and store nothing.\n"
    "  -h, --help      Show this text.\n"
    "\n"
    "Each page is stored whole or not at all (under a savepoint of its own when\n"
    "several share a transaction); a page whose bytes\n"
    "were stored before (SHA-256) is already present. A page that cannot be read\n"
    "exactly (not UTF-8, too large, too deep, too many values, mark-up cut off or\n"
    "out of place, no values) is rejected with its reason and leaves no rows.\n"
    "One line is printed per rejected or failed page; the last line is\n"
    "\"ingested N, already present M, rejected K\".\n"
    "Exit status: 0 when every page was stored, present or rejected; 1 on bad\n"
    "arguments, when the database cannot be opened, or when storing a page failed.\n";

int fail(const QString &message)
{
    std::fprintf(stderr, "corvid-ingest: %s\n", qUtf8Printable(message));
    return 1;
}

int printPage(const QString &path)
{
    QFile file(path);
    if (!QFileInfo(path).isFile() || !file.open(QIODevice::ReadOnly))
        return fail(QStringLiteral("cannot read %1 (not a regular file?)").arg(path));
    if (file.size() > CrvB_PageReader::MaxPageBytes)
        return fail(QStringLiteral("rejected %1: larger than %2 bytes")
                        .arg(path, QString::number(CrvB_PageReader::MaxPageBytes)));
    const CrvB_PageReader::Result result = CrvB_PageReader::read(file.readAll());
    if (!result.ok())
        return fail(QStringLiteral("rejected %1: %2").arg(path, result.rejection));
    const QByteArray json = CrvB_PageReader::toJson(result.values);
    std::fwrite(json.constData(), 1, size_t(json.size()), stdout);
    return 0;
}

} // namespace

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    QString url = QLatin1String(CrvB_DatabaseUrl::DefaultUrl), rejected, print;
    bool haveRejected = false;
    int shardIndex = 0, shardCount = 1, commitEvery = 200;
    QStringList paths;
    const QStringList args = app.arguments();
    for (int i = 1; i < args.size(); ++i) {
        const QString &arg = args.at(i);
        if (arg == QLatin1String("-h") || arg == QLatin1String("--help")) {
            std::fputs(usage, stdout);
            return 0;
        }
        const bool takesValue = arg == QLatin1String("--db") || arg == QLatin1String("--rejected")
                                || arg == QLatin1String("--shard") || arg == QLatin1String("--print")
                                || arg == QLatin1String("--commit-every");
        if (takesValue && i + 1 >= args.size())
            return fail(QStringLiteral("%1 needs a value (see --help)").arg(arg));
        if (arg == QLatin1String("--db")) {
            url = args.at(++i);
        } else if (arg == QLatin1String("--rejected")) {
            rejected = args.at(++i);
            haveRejected = true;
        } else if (arg == QLatin1String("--print")) {
            print = args.at(++i);
        } else if (arg == QLatin1String("--commit-every")) {
            bool ok = false;
            commitEvery = args.at(++i).toInt(&ok);
            if (!ok || commitEvery < 1)
                return fail(QStringLiteral("--commit-every needs a positive number"));
        } else if (arg == QLatin1String("--shard")) {
            const QStringList parts = args.at(++i).split(QLatin1Char('/'));
            bool okIndex = false, okCount = false;
            if (parts.size() == 2) {
                shardIndex = parts.at(0).toInt(&okIndex);
                shardCount = parts.at(1).toInt(&okCount);
            }
            if (!okIndex || !okCount || shardCount < 1 || shardIndex < 0 || shardIndex >= shardCount)
                return fail(QStringLiteral("--shard needs K/N with 0 <= K < N"));
        } else if (arg.startsWith(QLatin1Char('-')) && arg.size() > 1) {
            return fail(QStringLiteral("unknown option %1 (see --help)").arg(arg));
        } else {
            paths.append(arg);
        }
    }
    if (!print.isEmpty())
        return paths.isEmpty() ? printPage(print)
                               : fail(QStringLiteral("--print takes one page and no PATH"));
    if (paths.isEmpty())
        return fail(QStringLiteral("no page or folder given (see --help)"));

    CrvB_Store store;
    QString error;
    if (!store.open(url, false, &error))
        return fail(error);
    CrvB_Ingest ingest(store, [](const QString &line) {
        std::printf("%s\n", qUtf8Printable(line));
        std::fflush(stdout);
    });
    ingest.setRejectedFolder(haveRejected ? rejected : CrvB_Ingest::defaultRejectedFolder(store.url()));
    ingest.setShard(shardIndex, shardCount);
    ingest.setCommitEvery(commitEvery);
    for (const QString &path : paths)
        ingest.ingestPath(path);
    ingest.finish();
    std::printf("%s\n", qUtf8Printable(ingest.summary()));
    return ingest.counts().failed ? 1 : 0;
}
