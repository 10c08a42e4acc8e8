#include "SendRetry.h"

#include "transmit/SendRecorder.h"
#include "transmit/SendUsingSSL.h"

#include "host/MsgManData.h"
#include "project/CorvidSettings.h"

#include <QCoreApplication>
#include <QFile>
#include <QList>
#include <QTemporaryDir>

#include <memory>

using State = CrvC_SendHistory::State;

namespace {

// A stored page written out for vancurl, under the name it was sent with,
// in a private folder removed when the try has ended.
struct Prepared
{
    CrvC_SendRecorder::Ticket ticket;
    std::shared_ptr<QTemporaryDir> dir;
};

QString tr(const char *text)
{
    return QCoreApplication::translate("CrvC_SendRetry", text);
}

// On the worker: the page of entry `id` into a private file for attempt
// `attemptId`; a page that cannot be had ends the attempt as failed.
bool prepare(CrvC_SendHistory &history, qint64 id, qint64 attemptId, Prepared *prepared, QString *error)
{
    CrvC_SendHistory::Entry entry;
    QByteArray page;
    auto dir = std::make_shared<QTemporaryDir>();
    const QString file = dir->path() + QLatin1String("/device_usage_statistics.html");
    QFile out(file);
    if (!history.entry(id, &entry) || !history.page(id, &page)) {
        *error = history.error();
    } else if (!dir->isValid() || !out.open(QIODevice::WriteOnly) || out.write(page) != page.size()
               || !out.flush()) {
        *error = tr("cannot write the page for the upload: %1").arg(out.errorString());
    } else {
        out.close();
        auto ticket = std::make_shared<CrvC_SendRecorder::Attempt>();
        ticket->reportFile = file;
        ticket->destination = entry.destination;
        ticket->bytes = page.size();
        ticket->interactive = false;
        ticket->entryId = id;
        ticket->attemptId = attemptId;
        *prepared = {ticket, dir};
        return true;
    }
    history.finishAttempt(attemptId, State::Failed, *error);
    return false;
}

void send(const Prepared &prepared, CrvC_SendRetry::Done done)
{
    std::shared_ptr<QTemporaryDir> dir = prepared.dir;
    prepared.ticket->onEnd = [dir, done](bool sent, const QString &text) mutable {
        dir.reset();
        if (done)
            done(sent, text);
    };
    auto *sender = new CrvC_SendUsingSSL();
    sender->setTicket(prepared.ticket);
    sender->SendFile(prepared.ticket->reportFile);
}

bool &retryRunning()
{
    static bool running = false;
    return running;
}

void sendNext(std::shared_ptr<QList<Prepared>> queue)
{
    if (queue->isEmpty()) {
        retryRunning() = false;
        return;
    }
    const Prepared next = queue->takeFirst();
    send(next, [queue](bool, const QString &) { sendNext(queue); });
}

} // namespace

void CrvC_SendRetry::retryPending()
{
    if (retryRunning() || !CrvC_Settings::isCollectionEnabled())
        return;
    retryRunning() = true;
    auto queue = std::make_shared<QList<Prepared>>();
    CrvC_SendRecorder::run(
        [queue](CrvC_SendHistory &history) {
            QList<QPair<qint64, qint64>> claimed;
            if (!history.claimPending(QDateTime::currentDateTimeUtc(), &claimed))
                Port_MsgManData::debugStub("Corvid ERROR: no retries: %s\n", qUtf8Printable(history.error()));
            for (const auto &[id, attemptId] : claimed) {
                Prepared prepared;
                QString error;
                if (prepare(history, id, attemptId, &prepared, &error))
                    queue->append(prepared);
                else
                    Port_MsgManData::debugStub("Corvid ERROR: report %lld not retried: %s\n",
                                               static_cast<long long>(id), qUtf8Printable(error));
            }
        },
        nullptr,
        [queue] {
            if (!queue->isEmpty())
                Port_MsgManData::debugStub("Corvid: retrying %lld failed upload(s)\n",
                                           static_cast<long long>(queue->size()));
            sendNext(queue);
        });
}

void CrvC_SendRetry::retry(qint64 id, Done done)
{
    if (!CrvC_Settings::isCollectionEnabled()) {
        done(false, tr("collection is switched off (Edit > Preferences > Corvid); nothing was sent"));
        return;
    }
    auto prepared = std::make_shared<Prepared>();
    auto error = std::make_shared<QString>();
    CrvC_SendRecorder::run(
        [id, prepared, error](CrvC_SendHistory &history) {
            CrvC_SendHistory::Entry entry;
            if (!history.entry(id, &entry)) {
                *error = history.error();
            } else if (!entry.retryable()) {
                *error = tr("report %1 is not a failed upload with its page kept (%2)")
                             .arg(id)
                             .arg(entry.outcome());
            } else if (const qint64 attemptId = history.addAttempt(id, false)) {
                prepare(history, id, attemptId, prepared.get(), error.get());
            } else {
                *error = history.error();
            }
        },
        nullptr,
        [prepared, error, done] {
            if (prepared->ticket)
                send(*prepared, done);
            else
                done(false, *error);
        });
}
