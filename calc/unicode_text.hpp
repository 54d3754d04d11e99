// Conversions between UTF-8 source text and the host's 16-bit code units.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace bitcalc {

// The UTF-16 code units of UTF-8 text, or nothing when the text isn't valid
// UTF-8 (overlong forms, surrogates and values above U+10FFFF are refused).
std::optional<std::u16string> utf8ToUtf16(std::string_view utf8);

// UTF-8 text of 16-bit code units; an unpaired surrogate becomes U+FFFD.
std::string toUtf8(std::u16string_view units);

// The character that starts at `offset` of UTF-8 text, for a message:
// "'&'" for printable ASCII, "U+00E9" otherwise, "byte 0xFF" when the bytes
// there aren't UTF-8.
std::string describeCharacterAt(std::string_view utf8, std::size_t offset);

}  // namespace bitcalc
