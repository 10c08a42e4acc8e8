#include "Ingest.h"

#include "PageReader.h"
#include "ReceivedUpload.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <openssl/evp.h>

namespace {

// Folders deeper than this below the path given are not searched.
const int MaxFolderDepth = 32;

// The page's SHA-256 in hexadecimal. OpenSSL's digest runs several times as
// fast as Qt's, and a page is hashed before anything else is done with it.
QByteArray sha256Hex(const QByteArray &data)
{
    unsigned char digest[EVP_MAX_MD_SIZE];
    unsigned int length = 0;
    if (!EVP_Digest(data.constData(), size_t(data.size()), digest, &length, EVP_sha256(), nullptr))
        return QByteArray();
    return QByteArray(reinterpret_cast<const char *>(digest), int(length)).toHex();
}

} // namespace

CrvB_Ingest::CrvB_Ingest(CrvB_Store &store, std::function<void(const QString &)> say)
    : m_store(store), m_say(std::move(say))
{
}

void CrvB_Ingest::setRejectedFolder(const QString &folder)
{
    m_rejectedFolder = folder;
}

void CrvB_Ingest::setCommitEvery(int pages)
{
    finish();
    m_commitEvery = qMax(1, pages);
}

void CrvB_Ingest::finish()
{
    QString error;
    if (m_store.inBatch() && !m_store.commitBatch(&error) && m_batchPages > 0) {
        m_counts.ingested -= m_batchPages;
        m_counts.failed += m_batchPages;
        m_say(QStringLiteral("failed: the last %1 pages stored were not committed: %2")
                  .arg(QString::number(m_batchPages), error));
    }
    m_batchPages = 0;
}

void CrvB_Ingest::setShard(int index, int count)
{
    m_shardIndex = index;
    m_shardCount = qMax(1, count);
}

QString CrvB_Ingest::summary() const
{
    return QStringLiteral("ingested %1, already present %2, rejected %3")
        .arg(m_counts.ingested)
        .arg(m_counts.alreadyPresent)
        .arg(m_counts.rejected);
}

QString CrvB_Ingest::defaultRejectedFolder(const CrvB_DatabaseUrl &url)
{
    if (url.engine != CrvB_DatabaseUrl::Engine::SQLite)
        return QString();
    return QFileInfo(url.database).absolutePath() + QLatin1String("/rejected");
}

bool CrvB_Ingest::inShard(const QString &name) const
{
    if (m_shardCount <= 1)
        return true;
    bool numbered = false;
    const qulonglong number = name.toULongLong(&numbered);
    return (numbered ? number : qHash(name, 0)) % qulonglong(m_shardCount) == qulonglong(m_shardIndex);
}

void CrvB_Ingest::ingestPath(const QString &path)
{
    const QFileInfo info(path);
    if (info.isDir()) {
        ingestFolder(path, 0);
    } else if (info.isFile()) {
        ingestPage(path, CrvB_Store::Arrival{path, QString(), QString(), QString()});
    } else {
        m_say(QStringLiteral("skipped %1: no such file or folder").arg(path));
    }
}

void CrvB_Ingest::ingestFolder(const QString &folder, int depth)
{
    if (!CrvB_ReceivedUpload::metadataFile(folder).isEmpty()) {
        if (!inShard(QFileInfo(folder).fileName()))
            return;
        CrvB_ReceivedUpload upload;
        QString error;
        if (upload.read(folder, &error))
            ingestPage(upload.pagePath, upload.arrival);
        else
            m_say(QStringLiteral("skipped %1").arg(error));
        return;
    }
    if (depth >= MaxFolderDepth) {
        m_say(QStringLiteral("skipped %1: deeper than %2 folders")
                  .arg(folder, QString::number(MaxFolderDepth)));
        return;
    }
    const QString rejected =
        m_rejectedFolder.isEmpty() ? QString() : QFileInfo(m_rejectedFolder).canonicalFilePath();
    const QFileInfoList entries = QDir(folder).entryInfoList(
        QDir::Dirs | QDir::Files | QDir::NoDotAndDotDot | QDir::NoSymLinks, QDir::Name);
    for (const QFileInfo &entry : entries) {
        if (entry.isDir()) {
            if (!rejected.isEmpty() && entry.canonicalFilePath() == rejected)
                continue;
            ingestFolder(entry.filePath(), depth + 1);
        } else if (entry.suffix().compare(QLatin1String("html"), Qt::CaseInsensitive) == 0
                   && inShard(entry.fileName())) {
            ingestPage(entry.filePath(),
                       CrvB_Store::Arrival{entry.filePath(), QString(), QString(), QString()});
        }
    }
}

void CrvB_Ingest::ingestPage(const QString &pagePath, const CrvB_Store::Arrival &arrival)
{
    QFile file(pagePath);
    if (!file.open(QIODevice::ReadOnly)) {
        m_say(QStringLiteral("skipped %1: cannot read it").arg(pagePath));
        return;
    }
    if (file.size() > CrvB_PageReader::MaxPageBytes) {
        // Not read into memory; the digest is left out of the copy's name.
        reject(pagePath, QByteArray(),
               QStringLiteral("larger than %1 bytes").arg(CrvB_PageReader::MaxPageBytes));
        return;
    }
    // Read no more than the limit even should the file grow meanwhile.
    const QByteArray page = file.read(qMin(file.size(), CrvB_PageReader::MaxPageBytes) + 1);
    if (page.size() > CrvB_PageReader::MaxPageBytes) {
        reject(pagePath, QByteArray(),
               QStringLiteral("larger than %1 bytes").arg(CrvB_PageReader::MaxPageBytes));
        return;
    }
    file.close();
    const QByteArray sha256 = sha256Hex(page);
    QString error;
    if (sha256.isEmpty()) {
        ++m_counts.failed;
        m_say(QStringLiteral("failed %1: no SHA-256 digest").arg(pagePath));
        return;
    }
    if (m_store.contains(sha256, &error)) {
        ++m_counts.alreadyPresent;
        return;
    }
    if (!error.isEmpty()) {
        ++m_counts.failed;
        m_say(QStringLiteral("failed %1: %2").arg(pagePath, error));
        return;
    }
    const CrvB_PageReader::Result read = CrvB_PageReader::read(page);
    CrvB_ReportRecord record;
    QString reason = read.rejection;
    if (!read.ok() || !CrvB_ReportRecord::fromValues(read.values, record, &reason)) {
        reject(pagePath, sha256, reason);
        return;
    }
    store(pagePath, sha256, page.size(), record, arrival);
}

void CrvB_Ingest::store(const QString &pagePath, const QByteArray &sha256, qint64 bytes,
                        const CrvB_ReportRecord &record, const CrvB_Store::Arrival &arrival)
{
    QString error;
    if (m_commitEvery > 1 && !m_store.inBatch()) {
        if (!m_store.beginBatch(&error)) {
            ++m_counts.failed;
            m_say(QStringLiteral("failed %1: %2").arg(pagePath, error));
            return;
        }
        m_batchAge.start();
    }
    switch (m_store.store(sha256, bytes, record, arrival, &error)) {
    case CrvB_Store::Outcome::Stored:
        ++m_counts.ingested;
        if (m_store.inBatch() && (++m_batchPages >= m_commitEvery || m_batchAge.elapsed() >= 1000))
            finish();
        break;
    case CrvB_Store::Outcome::AlreadyPresent:
        ++m_counts.alreadyPresent;
        break;
    case CrvB_Store::Outcome::Failed:
        ++m_counts.failed;
        m_say(QStringLiteral("failed %1: %2").arg(pagePath, error));
        break;
    }
}

void CrvB_Ingest::reject(const QString &pagePath, const QByteArray &sha256, const QString &reason)
{
    ++m_counts.rejected;
    m_say(QStringLiteral("rejected %1: %2").arg(pagePath, reason));
    if (m_rejectedFolder.isEmpty() || !QDir().mkpath(m_rejectedFolder))
        return;
    // Named by digest, so that a page rejected again replaces its own copy.
    const QString name =
        (sha256.isEmpty() ? QString() : QString::fromLatin1(sha256.left(16)) + QLatin1Char('-'))
        + QFileInfo(pagePath).fileName();
    const QString copy = m_rejectedFolder + QLatin1Char('/') + name;
    if (QFileInfo(copy).canonicalFilePath() == QFileInfo(pagePath).canonicalFilePath())
        return;
    QFile::remove(copy);
    // A page over the size limit is not copied: it could be of any size.
    const bool keep = QFileInfo(pagePath).size() <= CrvB_PageReader::MaxPageBytes;
    QFile reasonFile(copy + QLatin1String(".reason"));
    if ((keep && !QFile::copy(pagePath, copy)) || !reasonFile.open(QIODevice::WriteOnly | QIODevice::Truncate)
        || reasonFile.write(pagePath.toUtf8() + ": " + reason.toUtf8() + '\n') < 0)
        m_say(QStringLiteral("cannot copy %1 to %2").arg(pagePath, m_rejectedFolder));
}

std::string CrvB_Ingest::receiverIngest(const std::string &url, const std::string &dataDir, unsigned number)
{
    const QString name = QStringLiteral("%1").arg(number, 6, 10, QLatin1Char('0'));
    QStringList lines;
    CrvB_Store store;
    QString error;
    if (store.open(QString::fromStdString(url), false, &error)) {
        CrvB_Ingest ingest(store, [&lines](const QString &line) { lines.append(line); });
        ingest.setRejectedFolder(defaultRejectedFolder(store.url()));
        ingest.setCommitEvery(1);
        ingest.ingestPath(QString::fromStdString(dataDir) + QLatin1Char('/') + name);
        lines.append(ingest.summary());
    } else {
        lines.append(QStringLiteral("failed: ") + error);
    }
    const QString line =
        QStringLiteral("ingest ") + name + QLatin1String(": ") + lines.join(QLatin1String("; "));
    return line.toStdString();
}
