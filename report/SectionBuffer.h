#pragma once

#include <QByteArray>
#include <QStringView>
#include <QTemporaryFile>

#include <functional>
#include <memory>

// A large section of the page on its way to the page file, as UTF-8. The
// first megabyte stays in memory; beyond that the text goes to an anonymous
// temporary file, so that the sections read side by side cost no memory
// while they wait for their turn on the page. Without a temporary folder it
// all stays in memory. Not copyable: a section is written once, then drained.
class CrvC_SectionBuffer
{
public:
    CrvC_SectionBuffer();
    ~CrvC_SectionBuffer();
    CrvC_SectionBuffer(const CrvC_SectionBuffer &) = delete;
    CrvC_SectionBuffer &operator=(const CrvC_SectionBuffer &) = delete;

    CrvC_SectionBuffer &operator+=(QByteArrayView utf8);
    CrvC_SectionBuffer &operator+=(QStringView text);
    CrvC_SectionBuffer &operator+=(char c) { return *this += QByteArrayView(&c, 1); }

    bool isEmpty() const { return m_size == 0; }
    qint64 size() const { return m_size; }

    // Hands the whole text to `sink` in order, in slices of at most a
    // megabyte, and empties the buffer. False when the temporary file could
    // not be read back: the text is then incomplete.
    bool drain(const std::function<void(const QByteArray &slice)> &sink);

    // The whole text at once (tests and small sections).
    QByteArray takeAll();

    void clear();

private:
    void spill();

    QByteArray m_head;
    std::unique_ptr<QTemporaryFile> m_file;
    qint64 m_fileSize = 0; // bytes written whole to m_file
    bool m_fileFailed = false;
    qint64 m_size = 0;
};
