#include "ReceivedUpload.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QUrl>

const QStringList &CrvB_ReceivedUpload::metadataFileNames()
{
    // "@fields.txt" cannot be the name of an uploaded file (an upload's
    // name never holds "@"); "fields.txt" is the name of earlier receivers.
    static const QStringList names = {QStringLiteral("@fields.txt"), QStringLiteral("fields.txt")};
    return names;
}

QString CrvB_ReceivedUpload::metadataFile(const QString &folder)
{
    for (const QString &name : metadataFileNames()) {
        const QFileInfo info(folder + QLatin1Char('/') + name);
        if (info.isFile() && !info.isSymLink())
            return info.filePath();
    }
    return QString();
}

bool CrvB_ReceivedUpload::read(const QString &folder, QString *error)
{
    *this = CrvB_ReceivedUpload();
    const QString metadata = metadataFile(folder);
    QFile file(metadata);
    if (metadata.isEmpty() || !file.open(QIODevice::ReadOnly)) {
        *error = QStringLiteral("no upload metadata in %1").arg(folder);
        return false;
    }
    const QString metadataName = QFileInfo(metadata).fileName();
    QString storedAs;
    // A metadata file is a few hundred bytes; more is not ours.
    for (const QByteArray &line : file.read(64 * 1024).split('\n')) {
        const int equals = line.indexOf('=');
        if (equals <= 0)
            continue;
        const QByteArray name = line.left(equals).trimmed();
        const QString value =
            QString::fromUtf8(QByteArray::fromPercentEncoding(line.mid(equals + 1).trimmed()));
        if (name == "received")
            arrival.receivedAt = value;
        else if (name == "domain")
            arrival.domain = value;
        else if (name == "regid")
            arrival.regid = value;
        else if (name == "stored_as")
            storedAs = value;
    }

    if (storedAs.isEmpty() || storedAs.contains(QLatin1Char('/')) || storedAs.startsWith(QLatin1Char('.'))
        || storedAs == metadataName) {
        // No usable name: the one other regular file of the folder.
        const QFileInfoList files = QDir(folder).entryInfoList(QDir::Files | QDir::NoSymLinks, QDir::Name);
        storedAs.clear();
        for (const QFileInfo &info : files) {
            if (info.fileName() == metadataName)
                continue;
            if (!storedAs.isEmpty()) {
                storedAs.clear();
                break;
            }
            storedAs = info.fileName();
        }
    }
    const QFileInfo page(folder + QLatin1Char('/') + storedAs);
    if (storedAs.isEmpty() || !page.isFile() || page.isSymLink()) {
        *error = QStringLiteral("no page in the upload %1 (%2)").arg(folder, metadataName);
        return false;
    }
    pagePath = page.filePath();
    arrival.source = pagePath;
    return true;
}
