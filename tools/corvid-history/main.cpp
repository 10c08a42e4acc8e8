// corvid-history: what Corvid sent from this account, when and where, with
// the exact bytes; retries a failed upload and clears the history.

#include "transmit/SendHistory.h"
#include "transmit/SendRetry.h"

#include <QCoreApplication>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QUrl>

#include <cstdio>

namespace {

const char usage[] =
    "Usage: corvid-history COMMAND\n"
    "\n"
    "Shows the reports that Corvid sent (or tried to send) from this account.\n"
    "\n"
    "Commands:\n"
    "  list          One line per report, newest first: id, local time, method,\n"
    "                destination host, size, outcome.\n"
    "  list --json   The same as a JSON array of objects (id, time, method,\n"
    "                destination, outcome, bytes, sha256, project, design, domain,\n"
    "                regid, pending, attempts).\n"
    "  show ID       Write the exact bytes of report ID, as they left, to standard\n"
    "                output.\n"
    "  retry ID      Upload the failed report ID again now, through vancurl with\n"
    "                today's proxy and server, and record the try. Refused while\n"
    "                collection is switched off.\n"
    "  clear         Remove every report and its page. A damaged history file is\n"
    "                removed.\n"
    "  -h, --help    Show this text.\n"
    "\n"
    "The history is $XDG_DATA_HOME/orb/corvid/history.sqlite\n"
    "(~/.local/share/orb/corvid/history.sqlite). It keeps the newest 100 reports\n"
    "within 200 MB of stored pages. A failed upload is tried again when a later\n"
    "report is collected, at most 3 times and for 14 days.\n"
    "\n"
    "Exit status: 0 on success; 1 when the history cannot be read (missing entry,\n"
    "damaged file) or a retry failed; 2 on a usage error.\n";

int fail(const QString &message, int status = 1)
{
    std::fprintf(stderr, "corvid-history: %s\n", qUtf8Printable(message));
    return status;
}

int usageError(const QString &message)
{
    std::fputs(usage, stderr);
    return fail(message, 2);
}

// The history, open for reading; null after reporting why it cannot be.
std::unique_ptr<CrvC_SendHistory> openHistory()
{
    auto history = std::make_unique<CrvC_SendHistory>();
    if (!history->open(false)) {
        fail(history->error());
        return nullptr;
    }
    return history;
}

QString localTime(const QDateTime &time)
{
    return time.toLocalTime().toString(Qt::ISODate);
}

QJsonObject toJson(const CrvC_SendHistory::Entry &entry)
{
    QJsonArray attempts;
    for (const CrvC_SendHistory::Attempt &a : entry.attempts) {
        attempts.append(QJsonObject{
            {QStringLiteral("started"), localTime(a.started)},
            {QStringLiteral("ended"), a.ended.isValid() ? QJsonValue(localTime(a.ended)) : QJsonValue()},
            {QStringLiteral("state"), CrvC_SendHistory::stateName(a.state)},
            {QStringLiteral("detail"), a.detail},
            {QStringLiteral("exitStatus"), a.exitStatus},
            {QStringLiteral("httpStatus"), a.httpStatus},
            {QStringLiteral("automatic"), a.automatic},
        });
    }
    return QJsonObject{
        {QStringLiteral("id"), entry.id},
        {QStringLiteral("time"), localTime(entry.time)},
        {QStringLiteral("method"), CrvC_SendHistory::methodName(entry.method)},
        {QStringLiteral("destination"), entry.destination},
        {QStringLiteral("outcome"), entry.outcome()},
        {QStringLiteral("bytes"), entry.bytes},
        {QStringLiteral("sha256"), QString::fromLatin1(entry.sha256)},
        {QStringLiteral("project"), entry.project},
        {QStringLiteral("design"), entry.design},
        {QStringLiteral("domain"), entry.domain},
        {QStringLiteral("regid"), entry.regid},
        {QStringLiteral("pending"), entry.pending()},
        {QStringLiteral("pageKept"), entry.pageKept},
        {QStringLiteral("attempts"), attempts},
    };
}

int list(bool json)
{
    auto history = openHistory();
    QList<CrvC_SendHistory::Entry> entries;
    if (!history || !history->entries(&entries))
        return history ? fail(history->error()) : 1;
    if (json) {
        QJsonArray array;
        for (const CrvC_SendHistory::Entry &entry : entries)
            array.append(toJson(entry));
        std::fputs(QJsonDocument(array).toJson(QJsonDocument::Indented).constData(), stdout);
        return 0;
    }
    if (entries.isEmpty())
        std::fprintf(stderr, "corvid-history: no report has been sent (%s)\n",
                     qUtf8Printable(history->fileName()));
    for (const CrvC_SendHistory::Entry &entry : entries) {
        const QString host = QUrl(entry.destination).host();
        std::printf("%5lld  %s  %-6s  %-24s %9s  %s\n", static_cast<long long>(entry.id),
                    qUtf8Printable(entry.time.toLocalTime().toString(QStringLiteral("yyyy-MM-dd HH:mm:ss"))),
                    qUtf8Printable(CrvC_SendHistory::methodName(entry.method)),
                    qUtf8Printable(host.isEmpty() ? entry.destination : host),
                    qUtf8Printable(QStringLiteral("%1 bytes").arg(entry.bytes)),
                    qUtf8Printable(entry.outcome()));
    }
    return 0;
}

int show(qint64 id)
{
    auto history = openHistory();
    QByteArray page;
    if (!history || !history->page(id, &page))
        return history ? fail(history->error()) : 1;
    if (std::fwrite(page.constData(), 1, size_t(page.size()), stdout) != size_t(page.size())
        || std::fflush(stdout) != 0)
        return fail(QStringLiteral("cannot write to standard output"));
    return 0;
}

int retry(QCoreApplication &app, qint64 id)
{
    int status = -1;
    CrvC_SendRetry::retry(id, [&app, &status](bool sent, const QString &message) {
        if (sent)
            std::printf("%s\n", qUtf8Printable(message));
        else
            fail(message);
        status = sent ? 0 : 1;
        app.quit();
    });
    if (status < 0) // not refused at once
        app.exec();
    return status;
}

int clear()
{
    CrvC_SendHistory history;
    if (!history.clear())
        return fail(history.error());
    std::printf("corvid-history: cleared %s\n", qUtf8Printable(history.fileName()));
    return 0;
}

} // namespace

int main(int argc, char **argv)
{
    QCoreApplication app(argc, argv);
    app.setApplicationName(QStringLiteral("corvid-history"));
    QStringList args = app.arguments().mid(1);
    if (args.contains(QLatin1String("-h")) || args.contains(QLatin1String("--help"))) {
        std::fputs(usage, stdout);
        return 0;
    }
    if (args.isEmpty())
        return usageError(QStringLiteral("no command given"));
    const QString command = args.takeFirst();
    if (command == QLatin1String("list")) {
        if (args.size() > 1 || (args.size() == 1 && args.first() != QLatin1String("--json")))
            return usageError(QStringLiteral("list takes only --json"));
        return list(!args.isEmpty());
    }
    if (command == QLatin1String("clear"))
        return args.isEmpty() ? clear() : usageError(QStringLiteral("clear takes no arguments"));
    if (command != QLatin1String("show") && command != QLatin1String("retry"))
        return usageError(QStringLiteral("unknown command: %1").arg(command));
    bool ok = false;
    const qint64 id = args.size() == 1 ? args.first().toLongLong(&ok) : 0;
    if (!ok || id <= 0)
        return usageError(QStringLiteral("%1 needs one report id (see list)").arg(command));
    return command == QLatin1String("show") ? show(id) : retry(app, id);
}
