#pragma once

#include <QCoreApplication>
#include <QString>

// Why a send through the transfer tool failed, in words for the user: the
// cause shown beneath the failure warning, taken from how the tool's run
// ended (its exit status, which `vancurl --help` lists) and the one-line
// reason it wrote to standard error.
class CrvC_SendFailure
{
    Q_DECLARE_TR_FUNCTIONS(CrvC_SendFailure)
public:
    enum class Step { Lookup, Upload };

    // How one run of the tool ended.
    struct Run
    {
        Step step = Step::Upload;
        QString url;         // where the run went
        QString proxy;       // "host:port"; empty for a direct connection
        bool started = true; // false: the tool could not be started
        int exitStatus = 0;  // -1 when it crashed or was stopped
        QString reason;      // its standard error, or why it could not start
    };

    // The cause of the failed `run`, one sentence. A lookup that ended with
    // status 0 failed because its answer named no upload address.
    static QString cause(const Run &run);

    // What the warning shows beneath its text: the cause, then the path of
    // the report, which stays where it is.
    static QString details(const Run &run, const QString &reportFile);
};
