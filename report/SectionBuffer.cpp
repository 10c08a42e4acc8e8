#include "SectionBuffer.h"

#include <QDir>
#include <QStringEncoder>

namespace {

const qsizetype SliceSize = 1 << 20;

} // namespace

CrvC_SectionBuffer::CrvC_SectionBuffer() = default;
CrvC_SectionBuffer::~CrvC_SectionBuffer() = default;

CrvC_SectionBuffer &CrvC_SectionBuffer::operator+=(QByteArrayView utf8)
{
    m_head.append(utf8);
    m_size += utf8.size();
    if (m_head.size() >= SliceSize)
        spill();
    return *this;
}

CrvC_SectionBuffer &CrvC_SectionBuffer::operator+=(QStringView text)
{
    // Encoded straight into the buffer: no UTF-8 copy of a long text.
    QStringEncoder encode(QStringEncoder::Utf8);
    constexpr qsizetype Chunk = 16 * 1024;
    for (qsizetype at = 0; at < text.size(); at += Chunk) {
        const QStringView chunk = text.mid(at, Chunk);
        const qsizetype before = m_head.size();
        m_head.resize(before + encode.requiredSpace(chunk.size()));
        const qsizetype written = encode.appendToBuffer(m_head.data() + before, chunk) - m_head.data();
        m_head.resize(written);
        m_size += written - before;
        if (m_head.size() >= SliceSize)
            spill();
    }
    return *this;
}

void CrvC_SectionBuffer::spill()
{
    if (m_fileFailed)
        return;
    if (!m_file) {
        m_file = std::make_unique<QTemporaryFile>(QDir::tempPath() + QLatin1String("/corvid-section-XXXXXX"));
        if (!m_file->open()) {
            m_file.reset();
            m_fileFailed = true;
            return;
        }
    }
    if (m_file->write(m_head) != m_head.size()) {
        // A full disk: what the file holds whole stays there, the rest in memory.
        m_file->resize(m_fileSize);
        m_file->seek(m_fileSize);
        m_fileFailed = true;
        return;
    }
    m_fileSize += m_head.size();
    m_head.clear();
}

bool CrvC_SectionBuffer::drain(const std::function<void(const QByteArray &slice)> &sink)
{
    bool complete = true;
    if (m_file) {
        complete = m_file->seek(0);
        for (qint64 left = m_fileSize; complete && left > 0;) {
            const QByteArray slice = m_file->read(qMin<qint64>(SliceSize, left));
            complete = !slice.isEmpty();
            left -= slice.size();
            if (complete)
                sink(slice);
        }
        m_file.reset();
        m_fileSize = 0;
    }
    if (!m_head.isEmpty())
        sink(m_head);
    m_head = QByteArray();
    m_size = 0;
    m_fileFailed = false;
    return complete;
}

QByteArray CrvC_SectionBuffer::takeAll()
{
    QByteArray all;
    all.reserve(m_size);
    drain([&all](const QByteArray &slice) { all += slice; });
    return all;
}

void CrvC_SectionBuffer::clear()
{
    drain([](const QByteArray &) {});
}
