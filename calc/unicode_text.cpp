// Conversions between UTF-8 source text and the host's 16-bit code units.
#include "calc/unicode_text.hpp"

#include <cstdint>
#include <cstdio>

namespace bitcalc {

namespace {

struct Decoded {
    char32_t codePoint;
    std::size_t length;  // bytes used; 0 for an invalid sequence
};

Decoded decodeAt(std::string_view utf8, std::size_t at) {
    const auto byte = [&](std::size_t i) -> std::uint32_t {
        return at + i < utf8.size() ? static_cast<unsigned char>(utf8[at + i]) : 0u;
    };
    const std::uint32_t lead = byte(0);
    if (lead < 0x80) return {lead, 1};
    std::size_t length = 0;
    std::uint32_t value = 0;
    std::uint32_t smallest = 0;
    if ((lead & 0xE0) == 0xC0) {
        length = 2, value = lead & 0x1F, smallest = 0x80;
    } else if ((lead & 0xF0) == 0xE0) {
        length = 3, value = lead & 0x0F, smallest = 0x800;
    } else if ((lead & 0xF8) == 0xF0) {
        length = 4, value = lead & 0x07, smallest = 0x10000;
    } else {
        return {0, 0};
    }
    for (std::size_t i = 1; i < length; ++i) {
        const std::uint32_t next = byte(i);
        if ((next & 0xC0) != 0x80) return {0, 0};
        value = (value << 6) | (next & 0x3F);
    }
    const bool surrogate = value >= 0xD800 && value <= 0xDFFF;
    if (value < smallest || surrogate || value > 0x10FFFF) return {0, 0};
    return {value, length};
}

}  // namespace

std::optional<std::u16string> utf8ToUtf16(std::string_view utf8) {
    std::u16string units;
    units.reserve(utf8.size());
    for (std::size_t at = 0; at < utf8.size();) {
        const Decoded decoded = decodeAt(utf8, at);
        if (decoded.length == 0) return std::nullopt;
        at += decoded.length;
        if (decoded.codePoint < 0x10000) {
            units.push_back(static_cast<char16_t>(decoded.codePoint));
        } else {
            const char32_t above = decoded.codePoint - 0x10000;
            units.push_back(static_cast<char16_t>(0xD800 + (above >> 10)));
            units.push_back(static_cast<char16_t>(0xDC00 + (above & 0x3FF)));
        }
    }
    return units;
}

std::string toUtf8(std::u16string_view units) {
    std::string out;
    out.reserve(units.size());
    auto append = [&out](char32_t cp) {
        if (cp < 0x80) {
            out.push_back(static_cast<char>(cp));
        } else if (cp < 0x800) {
            out.push_back(static_cast<char>(0xC0 | (cp >> 6)));
            out.push_back(static_cast<char>(0x80 | (cp & 0x3F)));
        } else if (cp < 0x10000) {
            out.push_back(static_cast<char>(0xE0 | (cp >> 12)));
            out.push_back(static_cast<char>(0x80 | ((cp >> 6) & 0x3F)));
            out.push_back(static_cast<char>(0x80 | (cp & 0x3F)));
        } else {
            out.push_back(static_cast<char>(0xF0 | (cp >> 18)));
            out.push_back(static_cast<char>(0x80 | ((cp >> 12) & 0x3F)));
            out.push_back(static_cast<char>(0x80 | ((cp >> 6) & 0x3F)));
            out.push_back(static_cast<char>(0x80 | (cp & 0x3F)));
        }
    };
    for (std::size_t i = 0; i < units.size(); ++i) {
        const char16_t unit = units[i];
        const bool high = unit >= 0xD800 && unit <= 0xDBFF;
        const bool low = unit >= 0xDC00 && unit <= 0xDFFF;
        if (high && i + 1 < units.size() && units[i + 1] >= 0xDC00 && units[i + 1] <= 0xDFFF) {
            append(0x10000 + ((char32_t(unit) - 0xD800) << 10) + (char32_t(units[i + 1]) - 0xDC00));
            ++i;
        } else if (high || low) {
            append(0xFFFD);
        } else {
            append(unit);
        }
    }
    return out;
}

std::string describeCharacterAt(std::string_view utf8, std::size_t offset) {
    const Decoded decoded = decodeAt(utf8, offset);
    char text[32];
    if (decoded.length == 0) {
        std::snprintf(text, sizeof text, "byte 0x%02X", static_cast<unsigned char>(utf8[offset]));
    } else if (decoded.codePoint >= 0x20 && decoded.codePoint < 0x7F) {
        std::snprintf(text, sizeof text, "'%c'", static_cast<char>(decoded.codePoint));
    } else {
        std::snprintf(text, sizeof text, "U+%04X", static_cast<unsigned>(decoded.codePoint));
    }
    return text;
}

}  // namespace bitcalc
