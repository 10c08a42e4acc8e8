#include "SendRecorder.h"

#include "host/MsgManData.h"
#include "host/StatusLine.h"

#include <QCoreApplication>
#include <QEventLoopLocker>
#include <QFileInfo>
#include <QList>
#include <QPointer>
#include <QThreadPool>
#include <QUrl>

using Method = CrvC_SendHistory::Method;
using State = CrvC_SendHistory::State;

namespace {

struct Origin
{
    QString reportFile;
    QString projectFile;
    QString design;
};

// The pages of the last few cycles; a cycle's send begins soon after its
// page was built.
QList<Origin> &origins()
{
    static QList<Origin> list;
    return list;
}

QThreadPool &worker();

void drainWorker()
{
    worker().waitForDone();
}

bool &drainRegistered()
{
    static bool registered = false;
    return registered;
}

QThreadPool &worker()
{
    // One thread: the history's changes are made in the order of the calls.
    static QThreadPool pool;
    if (!drainRegistered()) {
        pool.setMaxThreadCount(1);
        // The last writes end before the application object goes: they
        // answer through it, and the database driver belongs to it.
        qAddPostRoutine(drainWorker);
        drainRegistered() = true;
    }
    return pool;
}

void logFailure(const CrvC_SendHistory &history)
{
    Port_MsgManData::debugStub("Corvid ERROR: the send is not recorded: %s\n",
                               qUtf8Printable(history.error()));
}

QString tr(const char *text)
{
    return QCoreApplication::translate("CrvC_SendRecorder", text);
}

} // namespace

void CrvC_SendRecorder::noteOrigin(const QString &reportFile, const QString &projectFile,
                                   const QString &design)
{
    QList<Origin> &list = origins();
    for (qsizetype i = list.size() - 1; i >= 0; --i) {
        if (list.at(i).reportFile == reportFile)
            list.removeAt(i);
    }
    list.append({reportFile, projectFile, design});
    while (list.size() > 16)
        list.removeFirst();
}

CrvC_SendRecorder::Ticket CrvC_SendRecorder::begin(Method method, const QString &reportFile,
                                                   const QString &destination)
{
    auto ticket = std::make_shared<Attempt>();
    ticket->method = method;
    ticket->reportFile = reportFile;
    ticket->destination = destination;
    ticket->bytes = QFileInfo(reportFile).size();
    CrvC_SendHistory::Entry entry;
    entry.time = QDateTime::currentDateTimeUtc();
    entry.method = method;
    entry.destination = destination;
    for (const Origin &origin : origins()) {
        if (origin.reportFile == reportFile) {
            entry.project = origin.projectFile;
            entry.design = origin.design;
        }
    }
    run(
        [ticket, entry](CrvC_SendHistory &history) {
            ticket->entryId = history.addEntry(entry, ticket->reportFile, &ticket->attemptId);
            if (!ticket->entryId)
                logFailure(history);
        },
        nullptr, nullptr);
    return ticket;
}

void CrvC_SendRecorder::uploadStarted(const Ticket &ticket, const QString &address, const QString &domain,
                                      const QString &regid)
{
    if (!ticket)
        return;
    ticket->destination = address;
    run(
        [ticket, address, domain, regid](CrvC_SendHistory &history) {
            if (ticket->entryId && !history.setDestination(ticket->entryId, address, domain, regid))
                logFailure(history);
        },
        nullptr, nullptr);
}

void CrvC_SendRecorder::finish(const Ticket &ticket, State state, const QString &detail, int exitStatus,
                               int httpStatus)
{
    if (!ticket)
        return;
    // The application stays up until the outcome is on disk and shown.
    auto keepAlive = QCoreApplication::instance() ? std::make_shared<QEventLoopLocker>() : nullptr;
    run(
        [ticket, state, detail, exitStatus, httpStatus](CrvC_SendHistory &history) {
            if (ticket->attemptId
                && !history.finishAttempt(ticket->attemptId, state, detail, exitStatus, httpStatus))
                logFailure(history);
        },
        nullptr,
        [ticket, state, detail, keepAlive] {
            const QString text = statusText(*ticket, state, detail);
            Port::StatusLine::show(text);
            if (ticket->onEnd)
                ticket->onEnd(state == State::Sent || state == State::Handed, text);
        });
}

QString CrvC_SendRecorder::sizeText(qint64 bytes)
{
    if (bytes < 1024 * 1024)
        return tr("%1 KB").arg(qMax<qint64>(1, (bytes + 512) / 1024));
    return tr("%1 MB").arg(double(bytes) / (1024 * 1024), 0, 'f', 1);
}

QString CrvC_SendRecorder::statusText(const Attempt &attempt, State state, const QString &detail)
{
    const QString where = tr("Edit > Preferences > Corvid > Sent reports");
    switch (state) {
    case State::Sent: {
        const QString host = QUrl(attempt.destination).host();
        return tr("Usage report sent to %1, %2 \u2014 %3")
            .arg(host.isEmpty() ? attempt.destination : host, sizeText(attempt.bytes), where);
    }
    case State::Handed:
        return tr("Usage report handed to %1, %2 \u2014 %3")
            .arg(QFileInfo(detail).fileName(), sizeText(attempt.bytes), where);
    case State::Failed:
    case State::Sending:
        break;
    }
    return tr("Usage report not sent: %1").arg(detail);
}

void CrvC_SendRecorder::run(std::function<void(CrvC_SendHistory &)> work, QObject *context,
                            std::function<void()> done)
{
    QPointer<QObject> guard(context);
    const bool guarded = context != nullptr;
    worker().start([work = std::move(work), done = std::move(done), guard, guarded] {
        {
            CrvC_SendHistory history;
            work(history);
        }
        QCoreApplication *app = QCoreApplication::instance();
        if (!done || !app)
            return;
        QMetaObject::invokeMethod(
            app,
            [done, guard, guarded] {
                if (!guarded || guard)
                    done();
            },
            Qt::QueuedConnection);
    });
}

void CrvC_SendRecorder::waitForDone()
{
    worker().waitForDone();
}

void CrvC_SendRecorder::shutdown()
{
    waitForDone();
    if (drainRegistered()) {
        qRemovePostRoutine(drainWorker);
        drainRegistered() = false;
    }
    if (QCoreApplication::instance())
        QCoreApplication::sendPostedEvents(QCoreApplication::instance(), QEvent::MetaCall);
}
