#pragma once

#include "OrbHostExport.h"

#include <cstdarg>
#include <string>

namespace Port {

// The host's string type: a byte string (UTF-8 by convention) passed across
// every host interface. Plug-in code converts it to QString right away
// (Gui::Clip::String::convert).
class ORBHOST_EXPORT StringBase
{
public:
    // Token parse modes of NextTokenRange.
    enum TokenMode {
        AnyOfDelimiters = 0, // every character of the delimiter text separates
        WholeDelimiter = 1   // the delimiter text as a whole separates
    };
    // Trim modes of Trim.
    enum TrimMode { TrimLeft = 0, TrimRight = 1, TrimBoth = 2 };

    StringBase() = default;
    StringBase(const char *text);
    StringBase(const char *text, std::size_t length);
    StringBase(const std::string &text) : m_text(text) {}

    StringBase &operator=(const char *text);
    StringBase &operator+=(const StringBase &other);
    StringBase &operator+=(const char *text);
    StringBase &operator+=(char c);
    friend StringBase operator+(StringBase a, const StringBase &b) { return a += b; }

    const char *c_str() const { return m_text.c_str(); }
    std::size_t Length() const { return m_text.size(); }
    bool IsEmpty() const { return m_text.empty(); }
    const std::string &str() const { return m_text; }

    // strcmp-style comparison: <0, 0 or >0.
    int Compare(const StringBase &other, bool caseSensitive = true) const;

    // Replaces the contents with printf-style formatted text.
    StringBase &Format(const char *format, ...)
#if defined(__GNUC__)
        __attribute__((format(printf, 2, 3)))
#endif
        ;
    StringBase &FormatV(const char *format, va_list args);

    // Replaces every occurrence of `from` by `to`; returns the number of replacements.
    int Replace(const StringBase &from, const StringBase &to);

    // Removes the characters of `chars` from one or both ends.
    StringBase &Trim(const char *chars = " \t", TrimMode mode = TrimBoth);

    // Reads the next non-empty token at or after `pos`. On success the token's
    // bounds are stored in `begin` and `end` (end exclusive), `pos` moves past
    // the token and true is returned; false when no token is left.
    bool NextTokenRange(const StringBase &delimiters, TokenMode mode, std::size_t &pos, std::size_t &begin,
                        std::size_t &end) const;

    // Keeps only the first token delimited as in NextTokenRange; an empty result
    // when there is none.
    StringBase &Reduce(const StringBase &delimiters, TokenMode mode);

    bool operator==(const StringBase &other) const
    {
        return m_text == other.m_text;
    }
    bool operator!=(const StringBase &other) const
    {
        return m_text != other.m_text;
    }
    bool operator<(const StringBase &other) const
    {
        return m_text < other.m_text;
    }

private:
    std::string m_text;
};

} // namespace Port
