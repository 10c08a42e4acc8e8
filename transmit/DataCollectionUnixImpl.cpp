#include "DataCollectionUnixImpl.h"

#include <QDir>
#include <QFileInfo>
#include <QUrl>

namespace {

const char *const ComposeNames[] = {"netscape", "mozilla", "thunderbird"};
const char *const XdgEmailName = "xdg-email";

} // namespace

QStringList CrvC_DataCollectionUnixImpl::emailTools()
{
    if (!m_tools.isEmpty())
        return m_tools;

    const QString path =
        qEnvironmentVariable("PATH") + QLatin1String(":/usr/bin/:/usr/X11R6/bin/:/usr/dt/bin/");
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

QStringList CrvC_DataCollectionUnixImpl::composeArguments(const QString &tool, const QString &to,
                                                          const QString &subject, const QString &body,
                                                          const QString &file)
{
    if (isXdgEmail(tool)) {
        QStringList arguments{QStringLiteral("--subject"), subject};
        if (!body.isEmpty())
            arguments << QStringLiteral("--body") << body;
        return arguments << QStringLiteral("--attach") << file << to;
    }
    const QString request = composeRequest(to, subject, body, file);
    if (request.isEmpty())
        return QStringList();
    return QStringList{QStringLiteral("-compose"), request};
}

QString CrvC_DataCollectionUnixImpl::composeRequest(const QString &to, const QString &subject,
                                                    const QString &body, const QString &file)
{
    for (const QString *value : {&to, &subject, &body}) {
        if (value->contains(QLatin1Char('\'')))
            return QString();
    }
    const QString attachment =
        QLatin1String("file://") + QString::fromLatin1(QUrl::toPercentEncoding(file, "/"));
    // One arg() call, so that a "%1" inside a value stays as it is.
    return QStringLiteral("to='%1',subject='%2',body='%3',attachment='%4'")
        .arg(to, subject, body, attachment);
}

bool CrvC_DataCollectionUnixImpl::isXdgEmail(const QString &tool)
{
    return QFileInfo(tool).fileName() == QLatin1String(XdgEmailName);
}
