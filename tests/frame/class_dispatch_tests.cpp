// The switch from class ids to tags: one list, several lists at once, and a
// list with a fallback tag.
#include "frame/class_types.hpp"

#include <gtest/gtest.h>

#include <string>

namespace {

using namespace bitfcns;

template <class Tag>
std::string nameOf(Tag) {
    return std::to_string(Tag::id) + ":" + std::to_string(sizeof(typename Tag::type));
}

TEST(ClassDispatch, SeveralListsGiveEveryCombinationOrTheFirstMiss) {
    const auto visit = [](zqClassID a, zqClassID b, zqClassID c) {
        return visitClasses<IntegerClasses, NumericClasses, ValueClasses>(
            [](auto t, auto u, auto w) { return nameOf(t) + " " + nameOf(u) + " " + nameOf(w); },
            [] { return std::string("none"); }, a, b, c);
    };
    EXPECT_EQ(visit(zqInt8Class, zqSingleClass, zqLogicalClass), "8:1 7:4 3:1");
    EXPECT_EQ(visit(zqUInt64Class, zqDoubleClass, zqInt16Class), "15:8 6:8 10:2");
    EXPECT_EQ(visit(zqDoubleClass, zqDoubleClass, zqDoubleClass), "none");
    EXPECT_EQ(visit(zqInt8Class, zqLogicalClass, zqDoubleClass), "none");
    EXPECT_EQ(visit(zqInt8Class, zqInt8Class, zqCharClass), "none");
}

TEST(ClassDispatch, FallbackTagTakesEveryOtherId) {
    const auto visit = [](zqClassID id) {
        return visitClass<OrElse<IntegerClasses, DoubleTag>>(id, [](auto t) { return nameOf(t); });
    };
    EXPECT_EQ(visit(zqUInt16Class), "11:2");
    EXPECT_EQ(visit(zqDoubleClass), "6:8");
    EXPECT_EQ(visit(static_cast<zqClassID>(40)), "6:8");
    static_assert(std::is_same_v<TagOf<zqInt32Class>, Int32Tag>);
}

}  // namespace
