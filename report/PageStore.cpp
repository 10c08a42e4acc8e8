#include "PageStore.h"

#include <QDir>
#include <QFileInfo>
#include <QStandardPaths>
#include <QTemporaryDir>

const int CrvC_PageStore::KeepDays = 7;

QString CrvC_PageStore::root()
{
    return QStandardPaths::writableLocation(QStandardPaths::GenericCacheLocation)
           + QLatin1String("/Vantor/Corvid/pages");
}

QString CrvC_PageStore::newFolder(const QDateTime &now)
{
    const QString pages = root();
    if (!QDir().mkpath(pages))
        return QString();
    // Pages tell about the user's projects: theirs alone to read.
    QFile::setPermissions(pages, QFileDevice::ReadOwner | QFileDevice::WriteOwner | QFileDevice::ExeOwner);
    prune(pages, now.addDays(-KeepDays));

    // QTemporaryDir makes a new folder of a unique name, for the owner only.
    QTemporaryDir folder(pages + QLatin1Char('/') + now.toString(QStringLiteral("yyyyMMdd-HHmmss-"))
                         + QLatin1String("XXXXXX"));
    if (!folder.isValid())
        return QString();
    folder.setAutoRemove(false);
    return folder.path();
}

void CrvC_PageStore::prune(const QString &root, const QDateTime &limit)
{
    const QFileInfoList entries = QDir(root).entryInfoList(QDir::Dirs | QDir::NoDotAndDotDot | QDir::Hidden);
    for (const QFileInfo &entry : entries) {
        if (!entry.isSymLink() && entry.lastModified() < limit)
            QDir(entry.absoluteFilePath()).removeRecursively();
    }
}

void CrvC_PageStore::remove(const QString &folder)
{
    if (!folder.isEmpty() && !QFileInfo(folder).isSymLink())
        QDir(folder).removeRecursively();
}
