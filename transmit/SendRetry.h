#pragma once

#include <QString>

#include <functional>

// Sends the stored page of a failed upload again, through the same upload
// as a new report (CrvC_SendUsingSSL: today's proxy and server), as a new
// attempt of its history entry. Only while collection is switched on; e-mail
// sends are never sent again. Call from the GUI thread.
class CrvC_SendRetry
{
public:
    // Gets whether the page went out, and the status line or why nothing
    // was sent.
    using Done = std::function<void(bool sent, const QString &message)>;

    // The start of a collection cycle: the pending uploads (failed, younger
    // than CrvC_SendHistory::RetryDays, tried at most MaxRetries times) are
    // sent again, oldest first, one after the other. Nothing happens while
    // an earlier run is still going on.
    static void retryPending();

    // Sends the failed upload `id` again now, whatever its age and tries
    // (the user asked for it).
    static void retry(qint64 id, Done done);
};
