// corvid-stats: answers the maker's questions from the back end's database.
// See docs/backend.md.

#include "backend/DatabaseUrl.h"
#include "backend/Statistics.h"
#include "backend/StatisticsFormat.h"
#include "backend/Store.h"

#include <QCoreApplication>

#include <cstdio>

namespace {

const char usageHead[] =
    "Usage: corvid-stats [--db URL] [--format table|csv|json|html] QUERY\n"
    "\n"
    "Answers one question about the usage pages stored by corvid-ingest. Nothing in\n"
    "the database is changed.\n"
    "\n"
    "  --db URL        sqlite:FILE (default sqlite:corvid.sqlite) or a PostgreSQL URI\n"
    "                  (see corvid-ingest --help).\n"
    "  --format F      table (default), csv, json (an array of row objects) or html\n"
    "                  (a self-contained page: a bar chart and the table).\n"
    "  -h, --help      Show this text.\n"
    "\n"
    "QUERY is one of:\n";

int fail(const QString &message)
{
    std::fprintf(stderr, "corvid-stats: %s\n", qUtf8Printable(message));
    return 1;
}

} // namespace

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    QString url = QLatin1String(CrvB_DatabaseUrl::DefaultUrl), format = QStringLiteral("table"), query;
    const QStringList args = app.arguments();
    for (int i = 1; i < args.size(); ++i) {
        const QString &arg = args.at(i);
        if (arg == QLatin1String("-h") || arg == QLatin1String("--help")) {
            std::printf("%s%s", usageHead, qUtf8Printable(CrvB_Statistics::describe()));
            return 0;
        }
        if (arg == QLatin1String("--db") || arg == QLatin1String("--format")) {
            if (i + 1 >= args.size())
                return fail(QStringLiteral("%1 needs a value (see --help)").arg(arg));
            (arg == QLatin1String("--db") ? url : format) = args.at(++i);
        } else if (arg.startsWith(QLatin1Char('-')) || !query.isEmpty()) {
            return fail(QStringLiteral("unexpected argument %1 (see --help)").arg(arg));
        } else {
            query = arg;
        }
    }
    if (!CrvB_StatisticsFormat::formats().contains(format))
        return fail(QStringLiteral("unknown format %1 (table, csv, json or html)").arg(format));
    if (query.isEmpty())
        return fail(QStringLiteral("no question given (see --help)"));
    if (!CrvB_Statistics::queries().contains(query))
        return fail(QStringLiteral("unknown question \"%1\" (one of: %2)")
                        .arg(query, CrvB_Statistics::queries().join(QLatin1String(", "))));

    CrvB_Store store;
    QString error;
    if (!store.open(url, true, &error))
        return fail(error);
    CrvB_Statistics::Table table;
    if (!CrvB_Statistics::run(store.database(), query, table, &error))
        return fail(error);
    const QByteArray out = CrvB_StatisticsFormat::write(table, format);
    std::fwrite(out.constData(), 1, size_t(out.size()), stdout);
    return 0;
}
