#include "StringBase.h"

#include <cstdio>
#include <cstring>
#include <strings.h>
#include <vector>

namespace Port {

StringBase::StringBase(const char *text) : m_text(text ? text : "")
{
}

StringBase::StringBase(const char *text, std::size_t length)
    : m_text(text ? std::string(text, length) : std::string())
{
}

StringBase &StringBase::operator=(const char *text)
{
    m_text = text ? text : "";
    return *this;
}

StringBase &StringBase::operator+=(const StringBase &other)
{
    m_text += other.m_text;
    return *this;
}

StringBase &StringBase::operator+=(const char *text)
{
    if (text)
        m_text += text;
    return *this;
}

StringBase &StringBase::operator+=(char c)
{
    m_text += c;
    return *this;
}

int StringBase::Compare(const StringBase &other, bool caseSensitive) const
{
    return caseSensitive ? std::strcmp(c_str(), other.c_str()) : strcasecmp(c_str(), other.c_str());
}

StringBase &StringBase::Format(const char *format, ...)
{
    va_list args;
    va_start(args, format);
    FormatV(format, args);
    va_end(args);
    return *this;
}

StringBase &StringBase::FormatV(const char *format, va_list args)
{
    if (!format) {
        m_text.clear();
        return *this;
    }
    va_list probe;
    va_copy(probe, args);
    const int needed = std::vsnprintf(nullptr, 0, format, probe);
    va_end(probe);
    if (needed < 0) {
        m_text.clear();
        return *this;
    }
    std::vector<char> buffer(std::size_t(needed) + 1);
    std::vsnprintf(buffer.data(), buffer.size(), format, args);
    m_text.assign(buffer.data(), std::size_t(needed));
    return *this;
}

int StringBase::Replace(const StringBase &from, const StringBase &to)
{
    if (from.IsEmpty())
        return 0;
    int count = 0;
    std::string result;
    std::size_t start = 0;
    for (std::size_t hit; (hit = m_text.find(from.m_text, start)) != std::string::npos;
         start = hit + from.Length()) {
        result.append(m_text, start, hit - start);
        result += to.m_text;
        ++count;
    }
    if (count) {
        result.append(m_text, start, std::string::npos);
        m_text.swap(result);
    }
    return count;
}

StringBase &StringBase::Trim(const char *chars, TrimMode mode)
{
    if (!chars)
        return *this;
    if (mode == TrimRight || mode == TrimBoth) {
        const std::size_t last = m_text.find_last_not_of(chars);
        m_text.erase(last == std::string::npos ? 0 : last + 1);
    }
    if (mode == TrimLeft || mode == TrimBoth) {
        const std::size_t first = m_text.find_first_not_of(chars);
        m_text.erase(0, first == std::string::npos ? m_text.size() : first);
    }
    return *this;
}

bool StringBase::NextTokenRange(const StringBase &delimiters, TokenMode mode, std::size_t &pos,
                                std::size_t &begin, std::size_t &end) const
{
    const std::string &d = delimiters.m_text;
    while (pos < m_text.size()) {
        std::size_t stop;
        std::size_t skip;
        if (mode == WholeDelimiter && !d.empty()) {
            stop = m_text.find(d, pos);
            skip = d.size();
        } else {
            stop = d.empty() ? std::string::npos : m_text.find_first_of(d, pos);
            skip = 1;
        }
        if (stop == std::string::npos)
            stop = m_text.size();
        if (stop > pos) {
            begin = pos;
            end = stop;
            pos = stop < m_text.size() ? stop + skip : stop;
            return true;
        }
        pos = stop + skip; // empty token: skip the delimiter
    }
    return false;
}

StringBase &StringBase::Reduce(const StringBase &delimiters, TokenMode mode)
{
    std::size_t pos = 0, begin = 0, end = 0;
    if (NextTokenRange(delimiters, mode, pos, begin, end))
        m_text = m_text.substr(begin, end - begin);
    else
        m_text.clear();
    return *this;
}

} // namespace Port
