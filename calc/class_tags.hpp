// Element types by class for the evaluator: one tag per class that holds
// elements, the type lists of the families, and the one switch from a class
// id to a tag, written as a visitor.
#pragma once

#include "host/zq_array.hpp"

#include <optional>
#include <type_traits>
#include <utility>

namespace bitcalc {

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
using CharTag = ClassTag<char16_t, zqCharClass>;

template <class... Tags>
struct TypeList {};

template <class List, class... More>
struct Append;
template <class... Tags, class... More>
struct Append<TypeList<Tags...>, More...> {
    using type = TypeList<Tags..., More...>;
};

// The eight integer classes, in class-id order.
using IntegerClasses =
    TypeList<Int8Tag, UInt8Tag, Int16Tag, UInt16Tag, Int32Tag, UInt32Tag, Int64Tag, UInt64Tag>;
// The ten numeric classes.
using NumericClasses = Append<IntegerClasses, SingleTag, DoubleTag>::type;
// Every class whose elements are plain numbers: numeric, logical, char.
using ElementClasses = Append<NumericClasses, LogicalTag, CharTag>::type;

template <class Tag>
inline constexpr bool isIntegerTag =
    std::is_integral_v<typename Tag::type> && !std::is_same_v<typename Tag::type, bool> &&
    !std::is_same_v<typename Tag::type, char16_t>;

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

// Calls `visitor(Tag{})` for the tag of `List` whose id is `id` and returns
// its result, or `otherwise()` when no tag of the list has that id.
template <class List, class Visitor, class Otherwise>
decltype(auto) visitClass(zqClassID id, Visitor&& visitor, Otherwise&& otherwise) {
    return detail::visitClassIn(List{}, id, visitor, otherwise);
}

}  // namespace bitcalc
