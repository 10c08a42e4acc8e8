#pragma once

#include <string>

// Texts the receiver writes into its log and into the stored fields.
namespace ReceiverText {

// The current time, UTC, as 2026-12-06T14:27:03Z.
std::string utcNow();
// `value` with "%", control characters and bytes above 0x7e written as %XX,
// so that it cannot break a line-based layout.
std::string escaped(const std::string &value);

} // namespace ReceiverText
