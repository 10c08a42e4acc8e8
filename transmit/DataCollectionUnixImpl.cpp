#include "DataCollectionUnixImpl.h"

#include <QDir>
#include <QFileInfo>

namespace {

const char *const ComposeNames[] = {"netscape", "mozilla", "thunderbird"};
const char *const XdgEmailName = "xdg-email";

// A value inside one quoted word of the command line: the word splitting
// knows no escape for the quotation mark, so one would cut the word short.
QString quoted(const QString &value)
{
    QString text = value;
    text.remove(QLatin1Char('"'));
    return QLatin1Char('"') + text + QLatin1Char('"');
}

} // namespace

QStringList CrvC_DataCollectionUnixImpl::emailTools()
{
    if (!m_tools.isEmpty())
        return m_tools;

    const QString path = qEnvironmentVariable("PATH") + QLatin1String(":/usr/bin/:/usr/X11R6/bin/:/usr/dt/bin/");
    QStringList directories;
    for (const QString &directory : path.split(QLatin1Char(':'))) {
        if (!directory.isEmpty() && QFileInfo(directory).isDir())
            directories << directory;
    }

    auto addIfPresent = [this](const QString &directory, const char *name) {
        const QFileInfo program(QDir::cleanPath(directory + QLatin1Char('/') + QLatin1String(name)));
        if (!program.exists() || program.isDir())
            return false;
        const QString absolute = QDir::cleanPath(program.absoluteFilePath());
        if (!m_tools.contains(absolute))
            m_tools << absolute;
        return true;
    };
    for (const QString &directory : directories) {
        for (const char *name : ComposeNames)
            addIfPresent(directory, name);
    }
    // The desktop's own way to the user's mail program: the first on the path.
    for (const QString &directory : directories) {
        if (addIfPresent(directory, XdgEmailName))
            break;
    }
    return m_tools;
}

QString CrvC_DataCollectionUnixImpl::composeArgument(const QString &tool, const QString &to,
                                                     const QString &subject, const QString &body,
                                                     const QString &file)
{
    if (isXdgEmail(tool)) {
        QString argument = QLatin1String("--subject ") + quoted(subject);
        if (!body.isEmpty())
            argument += QLatin1String(" --body ") + quoted(body);
        argument += QLatin1String(" --attach ") + quoted(file) + QLatin1Char(' ') + quoted(to);
        return argument;
    }
    return QStringLiteral("to=%1,subject=%2,body=%3,attachment=file://%4").arg(to, subject, body, file);
}

QString CrvC_DataCollectionUnixImpl::toolCommand(const QString &tool)
{
    // A program path with a space or tab is quoted, or it would split in two.
    const QString program = tool.contains(QLatin1Char(' ')) || tool.contains(QLatin1Char('\t'))
                                ? QLatin1Char('"') + tool + QLatin1Char('"')
                                : tool;
    if (isXdgEmail(tool))
        return program + QLatin1String(" %1");
    return program + QLatin1String(" -compose \"%1\"");
}

bool CrvC_DataCollectionUnixImpl::isXdgEmail(const QString &tool)
{
    return QFileInfo(tool).fileName() == QLatin1String(XdgEmailName);
}
