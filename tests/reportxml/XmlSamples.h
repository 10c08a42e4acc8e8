#pragma once

#include <QByteArray>
#include <QFile>
#include <QString>

// Hostile and odd XML inputs shared by the reader tests.
namespace XmlSamples {

// `prefix`, then `levels` nested elements, closed again.
inline QByteArray deepDocument(int levels, const QByteArray &prefix = QByteArray())
{
    QByteArray xml = prefix;
    xml.reserve(prefix.size() + qsizetype(levels) * 7);
    for (int i = 0; i < levels; ++i)
        xml += "<d>";
    for (int i = 0; i < levels; ++i)
        xml += "</d>";
    return xml;
}

// Deep nesting behind an error that the cheap stream check stops at but the
// SAX reader reads past (an undeclared entity).
inline QByteArray deepBehindUndeclaredEntity(int levels)
{
    return deepDocument(levels, "<r>&undeclared;");
}

inline QByteArray binaryBytes()
{
    QByteArray bytes;
    for (int i = 0; i < 4096; ++i)
        bytes += char((i * 131 + 7) % 256);
    return bytes;
}

// A sparse file larger than any report the readers accept.
inline bool writeHugeFile(const QString &path)
{
    QFile file(path);
    return file.open(QIODevice::WriteOnly) && file.resize(qint64(300) * 1024 * 1024);
}

} // namespace XmlSamples
