#include "ReceiverText.h"

#include <ctime>

namespace ReceiverText {

std::string utcNow()
{
    char text[32];
    const std::time_t now = std::time(nullptr);
    std::tm parts;
    gmtime_r(&now, &parts);
    std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%SZ", &parts);
    return text;
}

std::string escaped(const std::string &value)
{
    static const char hex[] = "0123456789ABCDEF";
    std::string out;
    for (unsigned char c : value) {
        if (c < 0x20 || c > 0x7e || c == '%') {
            out += '%';
            out += hex[c >> 4];
            out += hex[c & 15];
        } else {
            out += char(c);
        }
    }
    return out;
}

} // namespace ReceiverText
