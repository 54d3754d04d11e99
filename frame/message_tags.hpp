// Message identifiers: one tag class per identifier, derived from the host's
// message record, and one type per group that names its tags. A raising site
// names a tag through its group, as in VESPRA::bitshift::sizeMismatch, so a
// misspelt leaf doesn't compile; each group's `Tags` lists its tags once more
// for code that walks the whole catalogue.
#pragma once

#include "frame/class_types.hpp"
#include "host/exceptions.hpp"

#include <algorithm>
#include <cstddef>
#include <string>
#include <string_view>

namespace bitfcns {

// A string literal usable as a template argument.
template <std::size_t N>
struct FixedString {
    char text[N]{};

    constexpr FixedString(const char (&literal)[N]) { std::copy_n(literal, N, text); }
    constexpr std::string_view view() const { return {text, N - 1}; }
};

// The tag of the identifier "Group:Leaf", for a group type that holds its
// full name as `name`. Messages of this library take no arguments.
template <class Group, FixedString Leaf>
struct MessageTag : resource_core::BaseMsgID {
    MessageTag() : BaseMsgID(std::string(Group::name.view()), std::string(Leaf.view()), 0) {}
};

}  // namespace bitfcns

// The groups differ in the case of their first letter; they are exact.
namespace VESPRA {

using bitfcns::MessageTag;

// The leaves that bitand, bitor and bitxor share, each under its own group.
template <bitfcns::FixedString Name>
struct LogicGroup {
    static constexpr bitfcns::FixedString name = Name;
    using sparseArgs = MessageTag<LogicGroup, "sparseArgs">;
    using operandsNotNumeric = MessageTag<LogicGroup, "operandsNotNumeric">;
    using complexInputs = MessageTag<LogicGroup, "complexInputs">;
    using firstArgsNotInt = MessageTag<LogicGroup, "firstArgsNotInt">;
    using sizeMismatch = MessageTag<LogicGroup, "sizeMismatch">;
    using mixedClasses = MessageTag<LogicGroup, "mixedClasses">;
    using unknownTypeString = MessageTag<LogicGroup, "unknownTypeString">;
    using invalidTypeString = MessageTag<LogicGroup, "invalidTypeString">;
    using outOfRangeMixedType = MessageTag<LogicGroup, "outOfRangeMixedType">;
    using outOfRange = MessageTag<LogicGroup, "outOfRange">;
    using Tags = bitfcns::TypeList<sparseArgs, operandsNotNumeric, complexInputs, firstArgsNotInt,
                                   sizeMismatch, mixedClasses, unknownTypeString, invalidTypeString,
                                   outOfRangeMixedType, outOfRange>;
};
using Bitand = LogicGroup<"VESPRA:Bitand">;
using Bitor = LogicGroup<"VESPRA:Bitor">;
using bitxor = LogicGroup<"VESPRA:bitxor">;

struct bitcmp {
    static constexpr bitfcns::FixedString name = "VESPRA:bitcmp";
    using firstArgNotInt = MessageTag<bitcmp, "firstArgNotInt">;
    using sparseArgs = MessageTag<bitcmp, "sparseArgs">;
    using complexOperands = MessageTag<bitcmp, "complexOperands">;
    using unknownTypeString = MessageTag<bitcmp, "unknownTypeString">;
    using invalidTypeString = MessageTag<bitcmp, "invalidTypeString">;
    using outOfRange = MessageTag<bitcmp, "outOfRange">;
    using Tags = bitfcns::TypeList<firstArgNotInt, sparseArgs, complexOperands, unknownTypeString,
                                   invalidTypeString, outOfRange>;
};

struct bitget {
    static constexpr bitfcns::FixedString name = "VESPRA:bitget";
    using sparseArgs = MessageTag<bitget, "sparseArgs">;
    using numericArg = MessageTag<bitget, "numericArg">;
    using complexArgs = MessageTag<bitget, "complexArgs">;
    using sizeMismatch = MessageTag<bitget, "sizeMismatch">;
    using unknownTypeString = MessageTag<bitget, "unknownTypeString">;
    using invalidTypeString = MessageTag<bitget, "invalidTypeString">;
    using outOfRange = MessageTag<bitget, "outOfRange">;
    using Tags = bitfcns::TypeList<sparseArgs, numericArg, complexArgs, sizeMismatch,
                                   unknownTypeString, invalidTypeString, outOfRange>;
};

// Shared by bitget and bitset.
struct bitSetGet {
    static constexpr bitfcns::FixedString name = "VESPRA:bitSetGet";
    using firstArgNotInt = MessageTag<bitSetGet, "firstArgNotInt">;
    using sizeMismatch = MessageTag<bitSetGet, "sizeMismatch">;
    using BITOutOfRange = MessageTag<bitSetGet, "BITOutOfRange">;
    using Tags = bitfcns::TypeList<firstArgNotInt, sizeMismatch, BITOutOfRange>;
};

struct bitset {
    static constexpr bitfcns::FixedString name = "VESPRA:bitset";
    using sparseArgs = MessageTag<bitset, "sparseArgs">;
    using numericArg = MessageTag<bitset, "numericArg">;
    using complexArgs = MessageTag<bitset, "complexArgs">;
    using invalidV = MessageTag<bitset, "invalidV">;
    using sizeMismatch = MessageTag<bitset, "sizeMismatch">;
    using unknownTypeString = MessageTag<bitset, "unknownTypeString">;
    using invalidTypeString = MessageTag<bitset, "invalidTypeString">;
    using outOfRange = MessageTag<bitset, "outOfRange">;
    using Tags = bitfcns::TypeList<sparseArgs, numericArg, complexArgs, invalidV, sizeMismatch,
                                   unknownTypeString, invalidTypeString, outOfRange>;
};

struct bitshift {
    static constexpr bitfcns::FixedString name = "VESPRA:bitshift";
    using sparseArgs = MessageTag<bitshift, "sparseArgs">;
    using numericArg = MessageTag<bitshift, "numericArg">;
    using complexArgs = MessageTag<bitshift, "complexArgs">;
    using firstArgNotInt = MessageTag<bitshift, "firstArgNotInt">;
    using sizeMismatch = MessageTag<bitshift, "sizeMismatch">;
    using unknownTypeString = MessageTag<bitshift, "unknownTypeString">;
    using invalidTypeString = MessageTag<bitshift, "invalidTypeString">;
    using outOfRange = MessageTag<bitshift, "outOfRange">;
    using inputsMustBeIntegers = MessageTag<bitshift, "inputsMustBeIntegers">;
    using Tags =
        bitfcns::TypeList<sparseArgs, numericArg, complexArgs, firstArgNotInt, sizeMismatch,
                          unknownTypeString, invalidTypeString, outOfRange, inputsMustBeIntegers>;
};

// Errors of reading a text operand; thrown without the legacy report.
struct string {
    static constexpr bitfcns::FixedString name = "VESPRA:string";
    using MustBeStringScalarOrCharacterVector =
        MessageTag<string, "MustBeStringScalarOrCharacterVector">;
    using MissingNotSupported = MessageTag<string, "MissingNotSupported">;
    using Tags = bitfcns::TypeList<MustBeStringScalarOrCharacterVector, MissingNotSupported>;
};

// Every group of the library.
using Groups =
    bitfcns::TypeList<Bitand, Bitor, bitxor, bitcmp, bitget, bitSetGet, bitset, bitshift, string>;

}  // namespace VESPRA
