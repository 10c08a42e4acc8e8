#pragma once

#include "transmit/SendHistory.h"

#include <QString>

#include <functional>
#include <memory>

class QObject;

// Records every send in the user's send history and tells the user how it
// ended on the host's status line. The send classes call it where a send
// begins and where it ends; the history's disk work runs on a worker thread
// of its own, in the order of the calls, so the GUI thread never waits for
// it. A history that cannot be written costs the record, never the send.
// Call from the GUI thread.
class CrvC_SendRecorder
{
public:
    // One try to send a page, from its beginning to its end.
    struct Attempt
    {
        CrvC_SendHistory::Method method = CrvC_SendHistory::Method::Upload;
        QString reportFile;
        QString destination;
        qint64 bytes = 0;
        // Whether a failure is also shown with the warning and the offer of
        // the e-mail method; retries only record it and say it on the status
        // line.
        bool interactive = true;
        // Called on the GUI thread once the outcome is recorded.
        std::function<void(bool sent, const QString &statusText)> onEnd;
        // The history's ids, set on the worker thread; 0 when not recorded.
        qint64 entryId = 0;
        qint64 attemptId = 0;
    };
    using Ticket = std::shared_ptr<Attempt>;

    // The project and design of the page at `reportFile`, for the entries
    // of its sends.
    static void noteOrigin(const QString &reportFile, const QString &projectFile, const QString &design);

    // A send of the page at `reportFile` begins: its bytes are recorded as
    // a new entry. `destination` is the server (upload) or the mailbox.
    static Ticket begin(CrvC_SendHistory::Method method, const QString &reportFile,
                        const QString &destination);
    // The upload goes to `address` with these form fields beside the page.
    static void uploadStarted(const Ticket &ticket, const QString &address, const QString &domain,
                              const QString &regid);
    // The attempt ended: records the outcome, then shows the status line
    // and calls the ticket's onEnd. `detail` is the server's answer, the
    // cause of the failure or the mail program.
    static void finish(const Ticket &ticket, CrvC_SendHistory::State state, const QString &detail,
                       int exitStatus = -1, int httpStatus = 0);

    // The status line for an attempt that ended in `state`.
    static QString statusText(const Attempt &attempt, CrvC_SendHistory::State state, const QString &detail);
    // "18 KB", "2.4 MB".
    static QString sizeText(qint64 bytes);

    // Runs `work` on the history worker with the user's history, then
    // `done` on the GUI thread unless `context` is gone by then.
    static void run(std::function<void(CrvC_SendHistory &history)> work, QObject *context,
                    std::function<void()> done);
    // Waits until the worker has written everything. The application
    // object waits for it too before it goes.
    static void waitForDone();
    // Before the code goes (the plug-in is unloaded): waits, then delivers
    // the answers already waiting in the event queue.
    static void shutdown();
};
