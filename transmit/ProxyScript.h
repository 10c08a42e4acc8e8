#pragma once

#include "ProxyDeadline.h"

#include <QString>

// Evaluates proxy auto-config scripts. A script comes from the network and may
// throw, loop, crash or eat memory, so it never runs in this process: the
// evaluator program corvid-pac runs it in a child process that is killed after
// TimeLimitMs and limits its own memory. corvid-pac is looked up beside the
// running executable, then in bin/ of each installation root
// (Port::VantorPath).
//
// Scripts are downloaded with the transfer tool vancurl (found through PATH),
// at most MaxScriptBytes, into a temporary file that is removed once the
// answer is known. Every step stops at the given deadline.
class CrvC_ProxyScript
{
public:
    static const int TimeLimitMs = 5000;
    // A script is a few kilobytes; a larger download is refused.
    static const qint64 MaxScriptBytes = 1024 * 1024;
    // corvid-pac cuts a longer answer after its last whole entry; output
    // beyond this is refused.
    static const qint64 MaxAnswerBytes = 1024;

    // Downloads the script at `scriptUrl` and evaluates it for `url` and
    // `host`. The script's answer ("PROXY h:8080; DIRECT"), or empty on any
    // failure.
    static QString run(const QString &scriptUrl, const QString &url, const QString &host,
                       const CrvC_ProxyDeadline &deadline = CrvC_ProxyDeadline());

    // Evaluates the script file `scriptFile`; empty when it fails, gives no
    // usable answer (one whose first entry is neither "DIRECT" nor
    // "PROXY host[:port]") or takes longer than TimeLimitMs or the deadline.
    static QString evaluate(const QString &scriptFile, const QString &url, const QString &host,
                            const CrvC_ProxyDeadline &deadline = CrvC_ProxyDeadline());

    // Downloads `scriptUrl`; false on failure or when it is larger than
    // MaxScriptBytes.
    static bool download(const QString &scriptUrl, QByteArray *script,
                         const CrvC_ProxyDeadline &deadline = CrvC_ProxyDeadline());

    // The evaluator's output trimmed; empty when its first entry is not
    // "DIRECT" or "PROXY host[:port]" (a script's "undefined", "null", 42).
    static QString usableAnswer(const QByteArray &output);

    // Path of corvid-pac, or empty when it is not installed.
    static QString evaluatorProgram();
};
