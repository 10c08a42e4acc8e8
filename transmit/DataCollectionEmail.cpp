#include "DataCollectionEmail.h"

#include "DataCollectionUnixImpl.h"
#include "UserNotice.h"

const char *const CrvC_DataCollectionEmail::CollectionMailbox = "usage-statistics@vantor.example";

CrvC_DataCollectionEmail::CrvC_DataCollectionEmail() : m_impl(new CrvC_DataCollectionUnixImpl)
{
}

CrvC_DataCollectionEmail::~CrvC_DataCollectionEmail() = default;

QStringList CrvC_DataCollectionEmail::emailTools()
{
    return m_impl->emailTools();
}

bool CrvC_DataCollectionEmail::send(const QString &tool, const QString &to, const QString &subject,
                                    const QString &body, const QString &file)
{
    m_tool = tool;
    const QStringList arguments =
        canPassFile(file) ? m_impl->composeArguments(tool, to, subject, body, file) : QStringList();
    if (arguments.isEmpty()) {
        CrvC_UserNotice::warning(
            tr("The report cannot be handed to the E-mail Tool unchanged."),
            tr("Its path %1 holds a character, such as a line break, that cannot be passed on. Send the "
               "report over HTTPS, or move the project to a folder whose path has none.")
                .arg(file));
        return false;
    }

    // The mail program runs detached: it may stay open after the host has
    // quit, and no process object is left behind for it. Nobody reads its
    // output: it goes where the host's goes. A failed start is known before
    // startDetached() returns, while this object still exists (callers drop
    // it as soon as send() returns).
    QProcess process;
    process.setProgram(tool);
    process.setArguments(arguments);
    process.setStandardInputFile(QProcess::nullDevice());
    if (process.startDetached())
        return true;
    m_startError = process.errorString();
    onProcessError(QProcess::FailedToStart);
    return false;
}

bool CrvC_DataCollectionEmail::canPassFile(const QString &file)
{
    if (!file.startsWith(QLatin1Char('/')))
        return false;
    for (const QChar c : file) {
        if (c.category() == QChar::Other_Control || c == QChar::ReplacementCharacter)
            return false;
    }
    return true;
}

void CrvC_DataCollectionEmail::onProcessError(QProcess::ProcessError)
{
    CrvC_UserNotice::warning(tr("Could not run E-mail Tool:\n") + m_tool, m_startError);
}
