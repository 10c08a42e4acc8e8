#include "XUID.h"

#include <cctype>
#include <cstdio>

namespace Port {

XUID::XUID(const char *guidText)
{
    if (!guidText)
        return;
    // Collect exactly 32 hex digits in the 8-4-4-4-12 layout, braces optional.
    static const int groups[] = {8, 4, 4, 4, 12};
    const char *p = guidText;
    if (*p == '{')
        ++p;
    std::array<std::uint32_t, 4> words{};
    int digit = 0;
    for (int g = 0; g < 5; ++g) {
        if (g > 0 && *p++ != '-')
            return;
        for (int i = 0; i < groups[g]; ++i, ++p, ++digit) {
            if (!std::isxdigit(static_cast<unsigned char>(*p)))
                return;
            const int v = std::isdigit(static_cast<unsigned char>(*p))
                              ? *p - '0'
                              : std::tolower(static_cast<unsigned char>(*p)) - 'a' + 10;
            words[std::size_t(digit / 8)] = words[std::size_t(digit / 8)] << 4 | std::uint32_t(v);
        }
    }
    if (guidText[0] == '{' ? (*p != '}' || p[1] != '\0') : *p != '\0')
        return;
    m_words = words;
}

std::string XUID::toString() const
{
    char text[40];
    std::snprintf(text, sizeof text, "{%08x-%04x-%04x-%04x-%04x%08x}", unsigned(m_words[0]),
                  unsigned(m_words[1] >> 16), unsigned(m_words[1] & 0xffff), unsigned(m_words[2] >> 16),
                  unsigned(m_words[2] & 0xffff), unsigned(m_words[3]));
    return text;
}

} // namespace Port
