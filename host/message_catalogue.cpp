// The host's message catalogue: identifiers and their sentences, sorted by
// group the way a reader of the catalogue looks for them.
#include "host/message_catalogue.hpp"

#include <algorithm>
#include <array>
#include <deque>
#include <string>
#include <vector>

namespace host {

namespace {

// The leaves that bitand, bitor and bitxor share, each under its own group;
// "%" stands for the function's name.
constexpr std::array<CatalogueEntry, 10> logicLeaves{{
    {"sparseArgs", "Inputs to % must not be sparse."},
    {"operandsNotNumeric", "Inputs to % must be numeric or logical."},
    {"complexInputs", "Inputs to % must be real."},
    {"firstArgsNotInt", "A single input to % must be paired with an integer input."},
    {"sizeMismatch",
     "Inputs to % must have compatible sizes: in each dimension the sizes must agree or one of "
     "them must be 1."},
    {"mixedClasses",
     "Inputs to % must be of the same integer class, or an integer array with a double scalar, "
     "or doubles and logicals."},
    {"unknownTypeString",
     "The assumed type of % must name an integer class such as 'uint8' or 'int64'."},
    {"invalidTypeString", "The assumed type of % must be the class of its integer input."},
    {"outOfRangeMixedType",
     "The double input of % must hold an integer that the class of its integer input can hold."},
    {"outOfRange",
     "Double inputs of % must hold integers that the assumed integer class can hold."},
}};

struct LogicFunction {
    std::string_view group;
    std::string_view name;
};
constexpr std::array<LogicFunction, 3> logicFunctions{
    {{"VESPRA:Bitand", "bitand"}, {"VESPRA:Bitor", "bitor"}, {"VESPRA:bitxor", "bitxor"}}};

constexpr auto fixedEntries = std::to_array<CatalogueEntry>({
    // The host's own errors.
    {"VESPRA:maxlhs", "Too many output arguments."},
    {"VESPRA:maxrhs", "Too many input arguments."},
    {"VESPRA:minrhs", "Not enough input arguments."},
    {"VESPRA:bsxfun:badOperands",
     "The operands of an element-wise operation must have compatible classes and sizes."},

    {"VESPRA:bitcmp:firstArgNotInt", "The input to bitcmp must be a double or integer array."},
    {"VESPRA:bitcmp:sparseArgs", "The input to bitcmp must not be sparse."},
    {"VESPRA:bitcmp:complexOperands", "The input to bitcmp must be real."},
    {"VESPRA:bitcmp:unknownTypeString",
     "The assumed type of bitcmp must name an integer class such as 'uint8' or 'int64'."},
    {"VESPRA:bitcmp:invalidTypeString",
     "The assumed type of bitcmp must be the class of its integer input."},
    {"VESPRA:bitcmp:outOfRange",
     "The input to bitcmp must hold integers that the assumed integer class can hold."},

    {"VESPRA:bitget:sparseArgs", "Inputs to bitget must not be sparse."},
    {"VESPRA:bitget:numericArg", "Inputs to bitget must be numeric."},
    {"VESPRA:bitget:complexArgs", "Inputs to bitget must be real."},
    {"VESPRA:bitget:sizeMismatch",
     "Inputs to bitget must have the same size, unless one of them is a scalar."},
    {"VESPRA:bitget:unknownTypeString",
     "The assumed type of bitget must name an integer class such as 'uint8' or 'int64'."},
    {"VESPRA:bitget:invalidTypeString",
     "The assumed type of bitget must be the class of its first input."},
    {"VESPRA:bitget:outOfRange",
     "The first input to bitget must hold integers that the assumed integer class can hold."},

    {"VESPRA:bitSetGet:firstArgNotInt",
     "The first input must be a double or integer array, and a double first input can't take "
     "a single bit position."},
    {"VESPRA:bitSetGet:sizeMismatch",
     "The value and the bit positions must have the same size, unless one of them is a scalar."},
    {"VESPRA:bitSetGet:BITOutOfRange",
     "Bit positions must be integers from 1 to the number of bits of the class."},

    {"VESPRA:bitset:sparseArgs", "Inputs to bitset must not be sparse."},
    {"VESPRA:bitset:numericArg",
     "Inputs to bitset must be numeric; the new bit values may also be logical."},
    {"VESPRA:bitset:complexArgs", "Inputs to bitset must be real."},
    {"VESPRA:bitset:invalidV",
     "The new bit values of bitset must be numeric or logical, and not single."},
    {"VESPRA:bitset:sizeMismatch",
     "Inputs to bitset must have the same size, unless they are scalars."},
    {"VESPRA:bitset:unknownTypeString",
     "The assumed type of bitset must name an integer class such as 'uint8' or 'int64'."},
    {"VESPRA:bitset:invalidTypeString",
     "The assumed type of bitset must be the class of its first input."},
    {"VESPRA:bitset:outOfRange",
     "The first input to bitset must hold integers that the assumed integer class can hold."},

    {"VESPRA:bitshift:sparseArgs", "Inputs to bitshift must not be sparse."},
    {"VESPRA:bitshift:numericArg", "Inputs to bitshift must be numeric."},
    {"VESPRA:bitshift:complexArgs", "Inputs to bitshift must be real."},
    {"VESPRA:bitshift:firstArgNotInt",
     "The first input to bitshift must be a double or integer array, and a double first input "
     "can't take a single shift count."},
    {"VESPRA:bitshift:sizeMismatch",
     "Inputs to bitshift must have the same size, unless one of them is a scalar."},
    {"VESPRA:bitshift:unknownTypeString",
     "The assumed type of bitshift must name an integer class such as 'uint8' or 'int64'."},
    {"VESPRA:bitshift:invalidTypeString",
     "The assumed type of bitshift must be the class of its first input."},
    {"VESPRA:bitshift:outOfRange",
     "The first input to bitshift must hold integers that the assumed integer class can hold."},
    {"VESPRA:bitshift:inputsMustBeIntegers", "Shift counts must be finite integers."},

    {"VESPRA:string:MustBeStringScalarOrCharacterVector",
     "The type name must be a character row vector or a string scalar."},
    {"VESPRA:string:MissingNotSupported", "The type name must not be a missing string."},
});

// The whole catalogue, made once: the fixed entries, then the shared leaves
// spelled out for each of the three logic functions.
class Catalogue {
public:
    Catalogue() {
        entries_.assign(fixedEntries.begin(), fixedEntries.end());
        for (const LogicFunction& function : logicFunctions) {
            for (const CatalogueEntry& leaf : logicLeaves) {
                std::string identifier =
                    std::string(function.group) + ':' + std::string(leaf.identifier);
                std::string sentence(leaf.sentence);
                sentence.replace(sentence.find('%'), 1, function.name);
                texts_.push_back(std::move(identifier));
                texts_.push_back(std::move(sentence));
            }
        }
        for (std::size_t i = 0; i < texts_.size(); i += 2)
            entries_.push_back({texts_[i], texts_[i + 1]});
    }

    std::span<const CatalogueEntry> entries() const { return entries_; }

private:
    std::deque<std::string> texts_;  // stable addresses for the views below
    std::vector<CatalogueEntry> entries_;
};

const Catalogue& theCatalogue() {
    static const Catalogue instance;
    return instance;
}

}  // namespace

std::span<const CatalogueEntry> catalogue() { return theCatalogue().entries(); }

std::string_view catalogueSentence(std::string_view identifier) {
    const auto entries = catalogue();
    const auto found = std::find_if(entries.begin(), entries.end(), [&](const CatalogueEntry& e) {
        return e.identifier == identifier;
    });
    return found == entries.end() ? std::string_view() : found->sentence;
}

}  // namespace host
