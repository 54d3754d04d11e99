// Joining pieces of text into one string. Messages are built with it rather
// than with chains of +, which GCC 12 misreads as overlapping copies
// (-Wrestrict) once they are inlined.
#pragma once

#include <string>
#include <string_view>

namespace bitcalc {

namespace detail {
inline void appendPiece(std::string& text, std::string_view piece) { text.append(piece); }
inline void appendPiece(std::string& text, char piece) { text.push_back(piece); }
}  // namespace detail

template <class... Pieces>
std::string joinText(const Pieces&... pieces) {
    std::string text;
    (detail::appendPiece(text, pieces), ...);
    return text;
}

}  // namespace bitcalc
