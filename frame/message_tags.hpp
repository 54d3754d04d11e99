// Message identifiers: one tag class per identifier, derived from the host's
// message record. `MessageTag<Group, Leaf>` lets generic code name any tag by
// its group and leaf; the namespaces below give each of the library's 65
// identifiers its own name, as in VESPRA::bitshift::sizeMismatch.
#pragma once

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

// The tag of the identifier "Group:Leaf". Messages of this library take no
// arguments.
template <FixedString Group, FixedString Leaf>
struct MessageTag : resource_core::BaseMsgID {
    MessageTag() : BaseMsgID(std::string(Group.view()), std::string(Leaf.view()), 0) {}
};

}  // namespace bitfcns

// The groups differ in the case of their first letter; they are exact.
namespace VESPRA {

namespace Bitand {
inline constexpr bitfcns::FixedString group = "VESPRA:Bitand";
template <bitfcns::FixedString Leaf>
using Tag = bitfcns::MessageTag<group, Leaf>;
using sparseArgs = Tag<"sparseArgs">;
using operandsNotNumeric = Tag<"operandsNotNumeric">;
using complexInputs = Tag<"complexInputs">;
using firstArgsNotInt = Tag<"firstArgsNotInt">;
using sizeMismatch = Tag<"sizeMismatch">;
using mixedClasses = Tag<"mixedClasses">;
using unknownTypeString = Tag<"unknownTypeString">;
using invalidTypeString = Tag<"invalidTypeString">;
using outOfRangeMixedType = Tag<"outOfRangeMixedType">;
using outOfRange = Tag<"outOfRange">;
}  // namespace Bitand

namespace Bitor {
inline constexpr bitfcns::FixedString group = "VESPRA:Bitor";
template <bitfcns::FixedString Leaf>
using Tag = bitfcns::MessageTag<group, Leaf>;
using sparseArgs = Tag<"sparseArgs">;
using operandsNotNumeric = Tag<"operandsNotNumeric">;
using complexInputs = Tag<"complexInputs">;
using firstArgsNotInt = Tag<"firstArgsNotInt">;
using sizeMismatch = Tag<"sizeMismatch">;
using mixedClasses = Tag<"mixedClasses">;
using unknownTypeString = Tag<"unknownTypeString">;
using invalidTypeString = Tag<"invalidTypeString">;
using outOfRangeMixedType = Tag<"outOfRangeMixedType">;
using outOfRange = Tag<"outOfRange">;
}  // namespace Bitor

namespace bitxor {
inline constexpr bitfcns::FixedString group = "VESPRA:bitxor";
template <bitfcns::FixedString Leaf>
using Tag = bitfcns::MessageTag<group, Leaf>;
using sparseArgs = Tag<"sparseArgs">;
using operandsNotNumeric = Tag<"operandsNotNumeric">;
using complexInputs = Tag<"complexInputs">;
using firstArgsNotInt = Tag<"firstArgsNotInt">;
using sizeMismatch = Tag<"sizeMismatch">;
using mixedClasses = Tag<"mixedClasses">;
using unknownTypeString = Tag<"unknownTypeString">;
using invalidTypeString = Tag<"invalidTypeString">;
using outOfRangeMixedType = Tag<"outOfRangeMixedType">;
using outOfRange = Tag<"outOfRange">;
}  // namespace bitxor

namespace bitcmp {
inline constexpr bitfcns::FixedString group = "VESPRA:bitcmp";
template <bitfcns::FixedString Leaf>
using Tag = bitfcns::MessageTag<group, Leaf>;
using firstArgNotInt = Tag<"firstArgNotInt">;
using sparseArgs = Tag<"sparseArgs">;
using complexOperands = Tag<"complexOperands">;
using unknownTypeString = Tag<"unknownTypeString">;
using invalidTypeString = Tag<"invalidTypeString">;
using outOfRange = Tag<"outOfRange">;
}  // namespace bitcmp

namespace bitget {
inline constexpr bitfcns::FixedString group = "VESPRA:bitget";
template <bitfcns::FixedString Leaf>
using Tag = bitfcns::MessageTag<group, Leaf>;
using sparseArgs = Tag<"sparseArgs">;
using numericArg = Tag<"numericArg">;
using complexArgs = Tag<"complexArgs">;
using sizeMismatch = Tag<"sizeMismatch">;
using unknownTypeString = Tag<"unknownTypeString">;
using invalidTypeString = Tag<"invalidTypeString">;
using outOfRange = Tag<"outOfRange">;
}  // namespace bitget

// Shared by bitget and bitset.
namespace bitSetGet {
inline constexpr bitfcns::FixedString group = "VESPRA:bitSetGet";
template <bitfcns::FixedString Leaf>
using Tag = bitfcns::MessageTag<group, Leaf>;
using firstArgNotInt = Tag<"firstArgNotInt">;
using sizeMismatch = Tag<"sizeMismatch">;
using BITOutOfRange = Tag<"BITOutOfRange">;
}  // namespace bitSetGet

namespace bitset {
inline constexpr bitfcns::FixedString group = "VESPRA:bitset";
template <bitfcns::FixedString Leaf>
using Tag = bitfcns::MessageTag<group, Leaf>;
using sparseArgs = Tag<"sparseArgs">;
using numericArg = Tag<"numericArg">;
using complexArgs = Tag<"complexArgs">;
using invalidV = Tag<"invalidV">;
using sizeMismatch = Tag<"sizeMismatch">;
using unknownTypeString = Tag<"unknownTypeString">;
using invalidTypeString = Tag<"invalidTypeString">;
using outOfRange = Tag<"outOfRange">;
}  // namespace bitset

namespace bitshift {
inline constexpr bitfcns::FixedString group = "VESPRA:bitshift";
template <bitfcns::FixedString Leaf>
using Tag = bitfcns::MessageTag<group, Leaf>;
using sparseArgs = Tag<"sparseArgs">;
using numericArg = Tag<"numericArg">;
using complexArgs = Tag<"complexArgs">;
using firstArgNotInt = Tag<"firstArgNotInt">;
using sizeMismatch = Tag<"sizeMismatch">;
using unknownTypeString = Tag<"unknownTypeString">;
using invalidTypeString = Tag<"invalidTypeString">;
using outOfRange = Tag<"outOfRange">;
using inputsMustBeIntegers = Tag<"inputsMustBeIntegers">;
}  // namespace bitshift

// Errors of reading a text operand; thrown without the legacy report.
namespace string {
inline constexpr bitfcns::FixedString group = "VESPRA:string";
template <bitfcns::FixedString Leaf>
using Tag = bitfcns::MessageTag<group, Leaf>;
using MustBeStringScalarOrCharacterVector = Tag<"MustBeStringScalarOrCharacterVector">;
using MissingNotSupported = Tag<"MissingNotSupported">;
}  // namespace string

}  // namespace VESPRA
