// Element types by class: one tag per class, the type lists of the families
// (integers, numeric classes, numeric classes and logical), and the switch
// from class ids to tags, written as a visitor over one or several lists.
#pragma once

#include "host/element_types.hpp"
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
template <class... Tags>
consteval std::size_t indexOfClass(TypeList<Tags...>, zqClassID id) {
    std::size_t index = 0;
    const bool found = ((Tags::id == id ? true : (++index, false)) || ...);
    return found ? index : sizeof...(Tags);
}
template <std::size_t I, class Head, class... Tail>
struct At : At<I - 1, Tail...> {};
template <class Head, class... Tail>
struct At<0, Head, Tail...> {
    using type = Head;
};
template <class List, zqClassID Id>
struct TagById;
template <class... Tags, zqClassID Id>
struct TagById<TypeList<Tags...>, Id> {
    static constexpr std::size_t index = indexOfClass(TypeList<Tags...>{}, Id);
    static_assert(index < sizeof...(Tags), "no tag of the list has this class id");
    using type = typename At<index, Tags...>::type;
};

// The host's element tags, seen as the library's.
template <class HostList>
struct FromHost;
template <class... HostTags>
struct FromHost<host::TagList<HostTags...>> {
    using type = TypeList<ClassTag<typename HostTags::type, HostTags::id>...>;
};
}  // namespace detail

// The tag of class `Id` in `List`, at compile time.
template <zqClassID Id, class List = ValueClasses>
using TagOf = typename detail::TagById<List, Id>::type;

// The host keeps its own tags; both sides must mean the same classes.
static_assert(std::is_same_v<detail::FromHost<host::IntegerElements>::type, IntegerClasses>);
static_assert(std::is_same_v<detail::FromHost<host::NumericElements>::type, NumericClasses>);
static_assert(std::is_same_v<detail::FromHost<host::ValueElements>::type, ValueClasses>);

// A list to visit that falls back to `Tag` for an id none of its tags has,
// where a switch has a default case of its own.
template <class List, class Tag>
struct OrElse {};

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
        (void)((id == Tags::id ? (result.emplace(visitor(Tags{})), true) : false) || ...);
        return result ? Result(std::move(*result)) : otherwise();
    }
}
template <class List, class Fallback, class Visitor, class Unused>
decltype(auto) visitClassIn(OrElse<List, Fallback>, zqClassID id, Visitor& visitor, Unused&) {
    auto fallback = [&]() -> decltype(auto) { return visitor(Fallback{}); };
    return visitClassIn(List{}, id, visitor, fallback);
}
}  // namespace detail

// The switch from a class id to a tag: calls `visitor(Tag{})` for the tag of
// `List` whose id is `id` and returns its result, or `otherwise()` when no
// tag of the list has that id. All calls must return the same type.
template <class List, class Visitor, class Otherwise>
decltype(auto) visitClass(zqClassID id, Visitor&& visitor, Otherwise&& otherwise) {
    return detail::visitClassIn(List{}, id, visitor, otherwise);
}

// The same for a list with a fallback tag, which needs no `otherwise`.
template <class List, class Visitor>
decltype(auto) visitClass(zqClassID id, Visitor&& visitor) {
    auto noOtherwise = [] {};  // never called: the fallback tag takes every other id
    return detail::visitClassIn(List{}, id, visitor, noOtherwise);
}

// The switch over several ids at once, one list each: calls
// `visitor(Tag1{}, Tag2{}, ...)` with the tag of each id in its list, or
// `otherwise()` as soon as one id has no tag there. Each combination of tags
// is one instance of the visitor.
template <class List, class... Lists, class Visitor, class Otherwise, class... Ids>
decltype(auto) visitClasses(Visitor&& visitor, Otherwise&& otherwise, zqClassID id, Ids... ids) {
    static_assert(sizeof...(Lists) == sizeof...(Ids), "one class id per list");
    if constexpr (sizeof...(Lists) == 0) {
        return visitClass<List>(id, visitor, otherwise);
    } else {
        return visitClass<List>(
            id,
            [&](auto tag) -> decltype(auto) {
                return visitClasses<Lists...>(
                    [&](auto... more) -> decltype(auto) { return visitor(tag, more...); },
                    otherwise, ids...);
            },
            otherwise);
    }
}

}  // namespace bitfcns
