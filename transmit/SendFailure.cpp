#include "SendFailure.h"

#include "SendUsingSSL.h"

#include <QDir>
#include <QRegularExpression>
#include <QUrl>

namespace {

// vancurl's exit statuses (vancurl --help). A status it adds later falls to
// the general cause with its own reason line, unless that line names an HTTP
// status or a time-out, which are recognised whatever the status.
enum VancurlStatus {
    UnreadableFile = 3,
    ConnectionFailed = 4,
    TlsFailed = 5,
    TimeLimit = 9, // the whole transfer took longer than its limit
};

// "host" or "host:port" of `url`; the text itself when it is no address.
QString serverOf(const QString &url)
{
    const QUrl address(url);
    if (address.host().isEmpty())
        return url;
    if (address.port() < 0)
        return address.host();
    return address.host() + QLatin1Char(':') + QString::number(address.port());
}

// The tool's reason as one line, without its name, and not a page long.
QString reasonLine(const QString &text)
{
    QString line = text.simplified();
    const QLatin1String prefix("vancurl: ");
    if (line.startsWith(prefix))
        line = line.mid(prefix.size());
    return line.left(300);
}

} // namespace

QString CrvC_SendFailure::cause(const Run &run)
{
    const QString server = serverOf(run.url);
    const QString tool = QLatin1String(CrvC_SendUsingSSL::ProgramName);
    const QString reason = reasonLine(run.reason);
    if (!run.started)
        return tr("The transfer tool %1 could not be started: %2").arg(tool, reason);
    if (run.exitStatus < 0)
        return tr("The transfer tool %1 stopped before it had finished.").arg(tool);
    if (run.exitStatus == 0)
        return tr("The server %1 named no upload address.").arg(server);

    static const QRegularExpression httpStatus(QStringLiteral("\\bHTTP status (\\d{3})\\b"));
    const QRegularExpressionMatch http = httpStatus.match(reason);
    if (http.hasMatch()) {
        return (run.step == Step::Lookup ? tr("The server %1 answered the address lookup with HTTP %2.")
                                         : tr("The server %1 refused the report with HTTP %2."))
            .arg(server, http.captured(1));
    }
    if (reason.contains(QLatin1String("timed out"), Qt::CaseInsensitive))
        return tr("The connection to %1 timed out.").arg(server);

    switch (run.exitStatus) {
    case ConnectionFailed:
        if (!run.proxy.isEmpty())
            return tr("The proxy %1 could not be reached or refused the connection to %2.")
                .arg(run.proxy, server);
        return tr("Could not connect to %1.").arg(server);
    case TlsFailed:
        return tr("The certificate of the server %1 could not be verified.").arg(server);
    case UnreadableFile:
        return tr("The report could not be read.");
    case TimeLimit:
        return tr("The transfer to %1 took longer than its time limit.").arg(server);
    default:
        return tr("The transfer to %1 failed (exit status %2): %3")
            .arg(server)
            .arg(run.exitStatus)
            .arg(reason);
    }
}

QString CrvC_SendFailure::details(const Run &run, const QString &reportFile)
{
    return cause(run) + QLatin1Char('\n')
           + tr("The report was kept at %1.").arg(QDir::toNativeSeparators(reportFile));
}
