#pragma once

#include "OrbHostExport.h"

#include <array>
#include <cstdint>
#include <functional>
#include <string>

namespace Port {

// Interface identifier: a 128-bit GUID naming a host service or interface.
// Built from GUID text ("{cd48a8b1-2990-4881-8664-52802c04fdff}", case does
// not matter) or from its four 32-bit words, first word most significant.
class ORBHOST_EXPORT XUID
{
public:
    constexpr XUID() = default;
    constexpr XUID(std::uint32_t w0, std::uint32_t w1, std::uint32_t w2, std::uint32_t w3)
        : m_words{w0, w1, w2, w3}
    {
    }
    // Text that is not a GUID gives the null identifier.
    explicit XUID(const char *guidText);

    bool isNull() const { return (m_words[0] | m_words[1] | m_words[2] | m_words[3]) == 0; }
    std::uint32_t word(int i) const { return m_words[std::size_t(i)]; }
    // Lower-case GUID text with braces.
    std::string toString() const;

    bool operator==(const XUID &o) const { return m_words == o.m_words; }
    bool operator!=(const XUID &o) const { return m_words != o.m_words; }
    bool operator<(const XUID &o) const { return m_words < o.m_words; }

private:
    std::array<std::uint32_t, 4> m_words{};
};

} // namespace Port

template<>
struct std::hash<Port::XUID>
{
    std::size_t operator()(const Port::XUID &x) const noexcept
    {
        return std::hash<std::uint64_t>()((std::uint64_t(x.word(0)) << 32 | x.word(1))
                                          ^ (std::uint64_t(x.word(2)) << 32 | x.word(3)));
    }
};
