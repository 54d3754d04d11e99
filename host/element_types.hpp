// The host's element types by class: one tag per class that holds elements,
// the type lists of its families, and the one switch from a class id to a
// tag, written as a visitor. Used by the host and by its tools.
#pragma once

#include "host/zq_array.hpp"

#include <cstddef>
#include <optional>
#include <type_traits>
#include <utility>

namespace host {

template <class T, zqClassID Id>
struct ElementTag {
    using type = T;
    static constexpr zqClassID id = Id;
};

using Int8Element = ElementTag<signed char, zqInt8Class>;
using UInt8Element = ElementTag<unsigned char, zqUInt8Class>;
using Int16Element = ElementTag<short, zqInt16Class>;
using UInt16Element = ElementTag<unsigned short, zqUInt16Class>;
using Int32Element = ElementTag<int, zqInt32Class>;
using UInt32Element = ElementTag<unsigned int, zqUInt32Class>;
using Int64Element = ElementTag<long, zqInt64Class>;
using UInt64Element = ElementTag<unsigned long, zqUInt64Class>;
using SingleElement = ElementTag<float, zqSingleClass>;
using DoubleElement = ElementTag<double, zqDoubleClass>;
using LogicalElement = ElementTag<bool, zqLogicalClass>;
using CharElement = ElementTag<char16_t, zqCharClass>;

template <class... Tags>
struct TagList {};

// The eight integer classes in class-id order.
using IntegerElements = TagList<Int8Element, UInt8Element, Int16Element, UInt16Element,
                                Int32Element, UInt32Element, Int64Element, UInt64Element>;
// The numeric classes: the integers, single and double.
using NumericElements =
    TagList<Int8Element, UInt8Element, Int16Element, UInt16Element, Int32Element, UInt32Element,
            Int64Element, UInt64Element, SingleElement, DoubleElement>;
// The numeric classes and logical.
using ValueElements =
    TagList<Int8Element, UInt8Element, Int16Element, UInt16Element, Int32Element, UInt32Element,
            Int64Element, UInt64Element, SingleElement, DoubleElement, LogicalElement>;
// Every class that holds elements: what conversion reads and writes.
using StoredElements =
    TagList<Int8Element, UInt8Element, Int16Element, UInt16Element, Int32Element, UInt32Element,
            Int64Element, UInt64Element, SingleElement, DoubleElement, LogicalElement, CharElement>;

namespace detail {
template <class T, class... Tags>
constexpr zqClassID classOfElementIn(TagList<Tags...>) {
    zqClassID id = zqNoClass;
    static_cast<void>(
        ((std::is_same_v<T, typename Tags::type> ? (id = Tags::id, true) : false) || ...));
    return id;
}
}  // namespace detail

// The class whose elements are of type T; zqNoClass for any other type.
template <class T>
inline constexpr zqClassID elementClassOf = detail::classOfElementIn<T>(StoredElements{});

template <class Tag>
inline constexpr bool isIntegerElement = Tag::id >= zqInt8Class&& Tag::id <= zqUInt64Class;

namespace detail {
template <class... Tags, class Visitor, class Otherwise>
decltype(auto) visitElementClassIn(TagList<Tags...>, zqClassID id, Visitor& visitor,
                                   Otherwise& otherwise) {
    using Result = decltype(otherwise());
    if constexpr (std::is_void_v<Result>) {
        const bool found = ((id == Tags::id ? (visitor(Tags{}), true) : false) || ...);
        if (!found) otherwise();
    } else {
        std::optional<Result> result;
        static_cast<void>(
            ((id == Tags::id ? (result.emplace(visitor(Tags{})), true) : false) || ...));
        return result ? Result(std::move(*result)) : otherwise();
    }
}
}  // namespace detail

// The switch from a class id to a tag: calls `visitor(Tag{})` for the tag of
// `List` whose id is `id` and returns its result, or `otherwise()` when no
// tag of the list has that id. All calls must return the same type.
template <class List, class Visitor, class Otherwise>
decltype(auto) visitElementClass(zqClassID id, Visitor&& visitor, Otherwise&& otherwise) {
    return detail::visitElementClassIn(List{}, id, visitor, otherwise);
}

// Element size in bytes for each stored class; 0 for any other class.
template <class... Tags>
constexpr std::size_t elementSizeIn(TagList<Tags...>, zqClassID id) {
    std::size_t size = 0;
    static_cast<void>(
        ((id == Tags::id ? (size = sizeof(typename Tags::type), true) : false) || ...));
    return size;
}

constexpr bool isIntegerClass(zqClassID id) { return id >= zqInt8Class && id <= zqUInt64Class; }

// The classes that carry the numeric flag: double, single and the integers.
constexpr bool isNumericClass(zqClassID id) {
    return id == zqDoubleClass || id == zqSingleClass || isIntegerClass(id);
}

}  // namespace host
