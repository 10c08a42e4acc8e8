#include "ProxyScript.h"

#include "host/MsgManData.h"
#include "host/VantorPath.h"

#include <QCoreApplication>
#include <QFileInfo>
#include <QRegularExpression>
#include <QTemporaryFile>

namespace {

const char *const EvaluatorName = "corvid-pac";

} // namespace

QString CrvC_ProxyScript::run(const QString &scriptUrl, const QString &url, const QString &host,
                              const CrvC_ProxyDeadline &deadline)
{
    if (scriptUrl.isEmpty())
        return QString();
    QByteArray text;
    if (!download(scriptUrl, &text, deadline))
        return QString();
    QTemporaryFile script; // removed when it goes out of scope
    if (!script.open() || script.write(text) != text.size() || !script.flush()) {
        Port_MsgManData::debugStub("Proxy script: no temporary file\n");
        return QString();
    }
    script.close();
    return evaluate(script.fileName(), url, host, deadline);
}

QString CrvC_ProxyScript::evaluate(const QString &scriptFile, const QString &url, const QString &host,
                                   const CrvC_ProxyDeadline &deadline)
{
    const QString program = evaluatorProgram();
    if (program.isEmpty()) {
        Port_MsgManData::debugStub("Proxy script: %s not found\n", EvaluatorName);
        return QString();
    }
    QByteArray output;
    const bool answered =
        deadline.within(TimeLimitMs).run(program, {scriptFile, url, host}, &output, MaxAnswerBytes);
    const QString answer = answered ? usableAnswer(output) : QString();
    if (answer.isEmpty())
        Port_MsgManData::debugStub("Proxy script: no answer from %s\n", qUtf8Printable(scriptFile));
    return answer;
}

bool CrvC_ProxyScript::download(const QString &scriptUrl, QByteArray *script,
                                const CrvC_ProxyDeadline &deadline)
{
    script->clear();
    if (!deadline.run(QStringLiteral("vancurl"), {scriptUrl}, script, MaxScriptBytes) || script->isEmpty()) {
        if (script->size() > MaxScriptBytes)
            Port_MsgManData::debugStub("Proxy script: %s is larger than %lld bytes\n",
                                       qUtf8Printable(scriptUrl), static_cast<long long>(MaxScriptBytes));
        else
            Port_MsgManData::debugStub("Proxy script: could not download %s\n", qUtf8Printable(scriptUrl));
        script->clear();
        return false;
    }
    return true;
}

QString CrvC_ProxyScript::usableAnswer(const QByteArray &output)
{
    const QString answer = QString::fromUtf8(output).trimmed();
    static const QRegularExpression entry(
        QStringLiteral("^(DIRECT|PROXY[ \\t]+([A-Za-z0-9._-]+|\\[[0-9A-Fa-f:.]+\\])(:[0-9]{1,5})?)$"),
        QRegularExpression::CaseInsensitiveOption);
    if (!entry.match(answer.section(QLatin1Char(';'), 0, 0).trimmed()).hasMatch())
        return QString();
    return answer;
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
