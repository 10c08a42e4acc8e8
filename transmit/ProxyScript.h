#pragma once

#include <QString>

// Evaluates proxy auto-config scripts. A script comes from the network and may
// throw, loop or crash, so it never runs in this process: the evaluator
// program corvid-pac runs it in a child process that is killed after
// TimeLimitMs. corvid-pac is looked up beside the running executable, then in
// bin/ of each installation root (Port::VantorPath).
//
// Scripts are downloaded with the transfer tool vancurl (found through PATH)
// into a temporary file that is removed once the answer is known.
class CrvC_ProxyScript
{
public:
    static const int TimeLimitMs = 5000;
    static const int DownloadLimitMs = 60000;

    // Downloads the script at `scriptUrl` and evaluates it for `url` and
    // `host`. The script's answer ("PROXY h:8080; DIRECT"), or empty on any
    // failure.
    static QString run(const QString &scriptUrl, const QString &url, const QString &host);

    // Evaluates the script file `scriptFile`; empty when it fails, gives no
    // answer or takes longer than `timeLimitMs`.
    static QString evaluate(const QString &scriptFile, const QString &url, const QString &host,
                            int timeLimitMs = TimeLimitMs);

    // Downloads `scriptUrl` into the open file `path`; false on failure.
    static bool download(const QString &scriptUrl, const QString &path);

    // Path of corvid-pac, or empty when it is not installed.
    static QString evaluatorProgram();
};
