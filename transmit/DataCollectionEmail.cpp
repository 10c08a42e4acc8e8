#include "DataCollectionEmail.h"

#include "DataCollectionUnixImpl.h"
#include "UserNotice.h"

const char *const CrvC_DataCollectionEmail::CollectionMailbox = "usage-statistics@vantor.example";

CrvC_DataCollectionEmail::CrvC_DataCollectionEmail()
    : m_impl(new CrvC_DataCollectionUnixImpl)
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
    const QStringList words =
        commandWords(m_impl->toolCommand(tool), m_impl->composeArgument(tool, to, subject, body, file));
    if (words.size() < 2)
        return false;

    // The mail program runs detached: it may stay open after the host has
    // quit, and no process object is left behind for it. Nobody reads its
    // output: it goes where the host's goes. A failed start is known before
    // startDetached() returns, while this object still exists (callers drop
    // it as soon as send() returns).
    QProcess process;
    process.setProgram(words.first());
    process.setArguments(words.mid(1));
    process.setStandardInputFile(QProcess::nullDevice());
    if (process.startDetached())
        return true;
    onProcessError(QProcess::FailedToStart);
    return false;
}

QStringList CrvC_DataCollectionEmail::commandWords(const QString &command, const QString &argument)
{
    const int at = command.indexOf(QLatin1String("%1"));
    if (at < 0)
        return QStringList();
    QString line = command;
    line.replace(at, 2, argument);
    return splitCommandLine(line);
}

QStringList CrvC_DataCollectionEmail::splitCommandLine(const QString &command)
{
    QStringList words;
    QString word;
    bool inQuotes = false;
    auto endWord = [&words, &word]() {
        if (!word.isEmpty())
            words << word;
        word.clear();
    };
    for (const QChar c : command) {
        if (c.unicode() == 0)
            break;
        if (inQuotes) {
            if (c == QLatin1Char('"')) {
                inQuotes = false;
                endWord();
            } else {
                word += c;
            }
        } else if (c == QLatin1Char('"')) {
            inQuotes = true;
        } else if (c == QLatin1Char(' ') || c == QLatin1Char('\t')) {
            endWord();
        } else {
            word += c;
        }
    }
    endWord();
    return words;
}

void CrvC_DataCollectionEmail::onProcessError(QProcess::ProcessError)
{
    CrvC_UserNotice::warning(tr("Could not run E-mail Tool:\n"));
}
