#include "MsgManData.h"
#include "StringBase.h"

#include <QByteArray>
#include <QMutex>

#include <cstdarg>
#include <cstdio>

namespace {

struct SinkHolder
{
    QMutex mutex;
    Port_MsgManData::Sink sink;
};

SinkHolder &holder()
{
    static SinkHolder h;
    return h;
}

bool debugEnabled()
{
    const QByteArray v = qgetenv("ORB_DEBUG");
    return !v.isEmpty() && v != "0";
}

void deliver(const Port_MsgManData::Message &m)
{
    Port_MsgManData::Sink sink;
    {
        SinkHolder &h = holder();
        QMutexLocker lock(&h.mutex);
        sink = h.sink;
    }
    if (sink) {
        sink(m);
        return;
    }
    if (m.kind == Port_MsgManData::Error) {
        std::fprintf(stderr, "ERROR:%s:%s:%d: %s", m.module.c_str(), m.file.c_str(), m.line, m.text.c_str());
        if (m.text.empty() || m.text.back() != '\n')
            std::fputc('\n', stderr);
    } else if (debugEnabled()) {
        std::fputs(m.text.c_str(), stderr);
    }
    std::fflush(stderr);
}

} // namespace

std::unique_ptr<Port_MsgManData> Port_MsgManData::createObject(const char *module, const char *file, int line,
                                                               const char *revision)
{
    std::unique_ptr<Port_MsgManData> object(new Port_MsgManData);
    object->m_module = module ? module : "";
    object->m_file = file ? file : "";
    object->m_line = line;
    object->m_revision = revision ? revision : "";
    return object;
}

void Port_MsgManData::issueError(const char *format, ...)
{
    va_list args;
    va_start(args, format);
    Port::StringBase text;
    text.FormatV(format, args);
    va_end(args);
    deliver({Error, m_module, m_file, m_line, m_revision, text.str()});
}

void Port_MsgManData::debugStub(const char *format, ...)
{
    va_list args;
    va_start(args, format);
    Port::StringBase text;
    text.FormatV(format, args);
    va_end(args);
    deliver({Debug, std::string(), std::string(), 0, std::string(), text.str()});
}

Port_MsgManData::Sink Port_MsgManData::setSink(Sink sink)
{
    SinkHolder &h = holder();
    QMutexLocker lock(&h.mutex);
    std::swap(h.sink, sink);
    return sink;
}
