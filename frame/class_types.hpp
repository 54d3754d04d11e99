// Element types by class: one tag per class, the type lists of the families
// (integers, numeric classes, numeric classes and logical), and the one
// switch from a class id to a tag, written as a visitor.
#pragma once

#include "host/zq_array.hpp"

#include <climits>
#include <cstddef>
#include <optional>
#include <type_traits>
#include <utility>

namespace bitfcns {

template <class T, zqClassID Id>
struct ClassTag {
    using type = T;
    static constexpr zqClassID id = Id;
};

using Int8Tag = ClassTag<signed char, zqInt8Class>;
using UInt8Tag = ClassTag<unsigned char, zqUInt8Class>;
using Int16Tag = ClassTag<short, zqInt16Class>;
using UInt16Tag = ClassTag<unsigned short, zqUInt16Class>;
using Int32Tag = ClassTag<int, zqInt32Class>;
using UInt32Tag = ClassTag<unsigned int, zqUInt32Class>;
using Int64Tag = ClassTag<long, zqInt64Class>;
using UInt64Tag = ClassTag<unsigned long, zqUInt64Class>;
using SingleTag = ClassTag<float, zqSingleClass>;
using DoubleTag = ClassTag<double, zqDoubleClass>;
using LogicalTag = ClassTag<bool, zqLogicalClass>;

template <class... Tags>
struct TypeList {
    static constexpr std::size_t size = sizeof...(Tags);
};

template <class List, class... More>
struct Append;
template <class... Tags, class... More>
struct Append<TypeList<Tags...>, More...> {
    using type = TypeList<Tags..., More...>;
};

// The eight integer classes, in class-id order (signed, unsigned, by width).
using IntegerClasses =
    TypeList<Int8Tag, UInt8Tag, Int16Tag, UInt16Tag, Int32Tag, UInt32Tag, Int64Tag, UInt64Tag>;
// The ten numeric classes.
using NumericClasses = Append<IntegerClasses, SingleTag, DoubleTag>::type;
// The numeric classes and logical.
using ValueClasses = Append<NumericClasses, LogicalTag>::type;

// The integer classes are the run of ids from int8 to uint64.
constexpr bool isIntegerClass(zqClassID id) { return id >= zqInt8Class && id <= zqUInt64Class; }

// Width of an element type in bits.
template <class T>
inline constexpr int bitWidth = static_cast<int>(sizeof(T) * CHAR_BIT);

namespace detail {
template <class... Tags, class Visitor, class Otherwise>
decltype(auto) visitClassIn(TypeList<Tags...>, zqClassID id, Visitor& visitor,
                            Otherwise& otherwise) {
    using Result = decltype(otherwise());
    if constexpr (std::is_void_v<Result>) {
        const bool found = ((id == Tags::id ? (visitor(Tags{}), true) : false) || ...);
        if (!found) otherwise();
    } else {
        std::optional<Result> result;
        ((id == Tags::id ? (result.emplace(visitor(Tags{})), true) : false) || ...);
        return result ? Result(std::move(*result)) : otherwise();
    }
}
}  // namespace detail

// The switch from a class id to a tag: calls `visitor(Tag{})` for the tag of
// `List` whose id is `id` and returns its result, or `otherwise()` when no
// tag of the list has that id. All calls must return the same type.
template <class List, class Visitor, class Otherwise>
decltype(auto) visitClass(zqClassID id, Visitor&& visitor, Otherwise&& otherwise) {
    return detail::visitClassIn(List{}, id, visitor, otherwise);
}

}  // namespace bitfcns
