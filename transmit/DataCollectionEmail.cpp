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

void CrvC_DataCollectionEmail::send(const QString &tool, const QString &to, const QString &subject,
                                    const QString &body, const QString &file)
{
    const QStringList words =
        commandWords(m_impl->toolCommand(tool), m_impl->composeArgument(tool, to, subject, body, file));
    if (words.size() < 2)
        return;

    // The mail program runs on its own; its process object goes when it ends.
    auto *process = new QProcess;
    // Connected before the start: a failed start may be reported at once.
    connect(process, &QProcess::errorOccurred, this, &CrvC_DataCollectionEmail::onProcessError);
    connect(process, &QProcess::errorOccurred, process, [process](QProcess::ProcessError error) {
        if (error == QProcess::FailedToStart)
            process->deleteLater();
    });
    connect(process, &QProcess::finished, process, &QObject::deleteLater);
    // Nobody reads the program's output: it goes where the host's goes.
    process->setProcessChannelMode(QProcess::ForwardedChannels);
    process->setStandardInputFile(QProcess::nullDevice());
    process->start(words.first(), words.mid(1), QIODevice::ReadWrite);
    // Settles the start here, so that a failure is reported while this object
    // still exists (callers drop it as soon as send() returns).
    process->waitForStarted(5000);
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
