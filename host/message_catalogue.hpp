// The host's message catalogue: one plain sentence for each identifier that
// the host or a loaded library may raise.
#pragma once

#include <span>
#include <string_view>

namespace host {

struct CatalogueEntry {
    std::string_view identifier;  // "VESPRA:bitshift:outOfRange"
    std::string_view sentence;
};

// Every entry, in catalogue order.
std::span<const CatalogueEntry> catalogue();

// The sentence for `identifier`, or an empty view when it has none.
std::string_view catalogueSentence(std::string_view identifier);

}  // namespace host
