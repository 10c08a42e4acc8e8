#include "ProxyScript.h"

#include "host/MsgManData.h"
#include "host/VantorPath.h"

#include <QCoreApplication>
#include <QFileInfo>
#include <QProcess>
#include <QTemporaryFile>

namespace {

const char *const EvaluatorName = "corvid-pac";

// Waits for `process` up to `limitMs`; kills it when it takes longer.
bool finishWithin(QProcess &process, int limitMs)
{
    if (!process.waitForStarted(limitMs))
        return false;
    if (!process.waitForFinished(limitMs)) {
        process.kill();
        process.waitForFinished(2000);
        return false;
    }
    return process.exitStatus() == QProcess::NormalExit && process.exitCode() == 0;
}

} // namespace

QString CrvC_ProxyScript::run(const QString &scriptUrl, const QString &url, const QString &host)
{
    if (scriptUrl.isEmpty())
        return QString();
    QTemporaryFile script; // removed when it goes out of scope
    if (!script.open()) {
        Port_MsgManData::debugStub("Proxy script: no temporary file\n");
        return QString();
    }
    script.close();
    if (!download(scriptUrl, script.fileName()))
        return QString();
    return evaluate(script.fileName(), url, host);
}

QString CrvC_ProxyScript::evaluate(const QString &scriptFile, const QString &url, const QString &host,
                                   int timeLimitMs)
{
    const QString program = evaluatorProgram();
    if (program.isEmpty()) {
        Port_MsgManData::debugStub("Proxy script: %s not found\n", EvaluatorName);
        return QString();
    }
    QProcess evaluator;
    evaluator.setProcessChannelMode(QProcess::SeparateChannels);
    evaluator.start(program, {scriptFile, url, host}, QIODevice::ReadOnly);
    if (!finishWithin(evaluator, timeLimitMs)) {
        Port_MsgManData::debugStub("Proxy script: no answer from %s\n", qUtf8Printable(scriptFile));
        return QString();
    }
    return QString::fromUtf8(evaluator.readAllStandardOutput()).trimmed();
}

bool CrvC_ProxyScript::download(const QString &scriptUrl, const QString &path)
{
    QProcess transfer;
    transfer.setStandardOutputFile(path, QIODevice::Truncate);
    transfer.setStandardErrorFile(QProcess::nullDevice());
    transfer.start(QStringLiteral("vancurl"), {scriptUrl}, QIODevice::ReadOnly);
    if (!finishWithin(transfer, DownloadLimitMs)) {
        Port_MsgManData::debugStub("Proxy script: could not download %s\n", qUtf8Printable(scriptUrl));
        return false;
    }
    return QFileInfo(path).size() > 0;
}

QString CrvC_ProxyScript::evaluatorProgram()
{
    const QString name = QString::fromLatin1(EvaluatorName);
    QStringList candidates;
    if (QCoreApplication::instance())
        candidates << QCoreApplication::applicationDirPath() + QLatin1Char('/') + name;
    for (const std::string &root : Port::VantorPath::GetInstance())
        candidates << QString::fromStdString(root) + QLatin1String("/bin/") + name;
    for (const QString &candidate : candidates) {
        const QFileInfo info(candidate);
        if (info.isFile() && info.isExecutable())
            return info.absoluteFilePath();
    }
    return QString();
}
