// The string helpers: which arrays are scalar text, and the string array view.
#include "host/string_helpers.hpp"
#include "host_test_support.hpp"

namespace host::testing {
namespace {

class StringHelpersTest : public HostTest {};

TEST_F(StringHelpersTest, ScalarTextIsACharRowOrEmptyOrAStringScalar) {
    struct Case {
        const char* what;
        zqArraySlot array;
        bool scalarText;
    };
    std::vector<Case> cases;
    cases.push_back({"char row", makeCharArray(u"int8"), true});
    cases.push_back({"char 1x0", makeCharArray({1, 0}, u""), true});
    cases.push_back({"char 0x0", makeCharArray({0, 0}, u""), true});
    cases.push_back({"char 0x3", makeCharArray({0, 3}, u""), false});
    cases.push_back({"char column", makeCharArray({4, 1}, u"int8"), false});
    cases.push_back({"char matrix", makeCharArray({2, 2}, u"int8"), false});
    cases.push_back({"char 1x2x2", makeCharArray({1, 2, 2}, u"int8"), false});
    cases.push_back({"string scalar", makeStringArray({1, 1}, {u"uint8"}), true});
    cases.push_back({"missing string", makeStringArray({1, 1}, {std::nullopt}), true});
    cases.push_back({"string row", makeStringArray({1, 2}, {u"a", u"b"}), false});
    cases.push_back({"double", makeDoubleScalar(8), false});
    cases.push_back({"cell",
                     makeCellArray({1, 1},
                                   [] {
                                       std::vector<zqArraySlot> one;
                                       one.push_back(makeCharArray(u"int8"));
                                       return one;
                                   }()),
                     false});
    for (const Case& c : cases) {
        EXPECT_EQ(Kestrelon::String::isScalarText(c.array.get(), false, true), c.scalarText)
            << c.what;
    }
    zqArraySlot incomplete = makeCharArray(u"ab");
    setIncompleteDimensions(*incomplete);
    EXPECT_TRUE(Kestrelon::String::isScalarText(incomplete.get(), false, true));
}

TEST_F(StringHelpersTest, StringArrayView) {
    zqArraySlot strings = makeStringArray({1, 2}, {u"int16", std::nullopt});
    EXPECT_TRUE(Kestrelon::String::isString(strings.get()));
    EXPECT_FALSE(Kestrelon::String::isString(makeCharArray(u"int16").get()));
    const Kestrelon::String::StringArray* view = Kestrelon::String::getString(strings.get());
    ASSERT_EQ(view->ndims, 2u);
    EXPECT_EQ(view->dims[0], 1u);
    EXPECT_EQ(view->dims[1], 2u);
    ASSERT_NE(view->elements[0], nullptr);
    EXPECT_EQ(std::u16string_view(view->elements[0]->units, view->elements[0]->length), u"int16");
    EXPECT_EQ(view->elements[1], nullptr);
}

}  // namespace
}  // namespace host::testing
