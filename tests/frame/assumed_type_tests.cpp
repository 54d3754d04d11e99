// The assumed-type operand: spellings with their cut forms, case, length
// rules, char rows against string scalars, what is no scalar text, the text
// errors and the invalid-character rule.
#include "frame/assumed_type.hpp"
#include "frame/ctype_error.hpp"
#include "frame/exception.hpp"
#include "frame/message_tags.hpp"
#include "host/host_control.hpp"
#include "tests/support/host_arrays.hpp"

namespace {

using namespace bitfcns;
using InvalidCharacter = foundation::ustring::CtypeInvalidCharacter;

TextView view(std::u16string_view text) { return {text.data(), text.size()}; }

TEST(EqualsBounded, NullTextsNeverMatchAndNonAsciiRaisesOnlyWhereCompared) {
    EXPECT_FALSE(equalsBounded(view(u"int8"), {nullptr, 4}, 4));
    EXPECT_FALSE(equalsBounded({nullptr, 4}, view(u"int8"), 4));
    EXPECT_THROW(equalsBounded(view(u"\u00e9nt8"), view(u"int8"), 4), InvalidCharacter);
    EXPECT_THROW(equalsBounded(view(u"int1\u00e9"), view(u"int16"), 4), InvalidCharacter);
    EXPECT_THROW(equalsBounded(view(u"\u0100"), view(u"int8"), 4), InvalidCharacter);
    EXPECT_FALSE(equalsBounded(view(u"int8\u00e9"), view(u"int8"), 4));  // past the compare length
    EXPECT_FALSE(equalsBounded(view(u"uint\u00e9"), view(u"int8"), 4));  // differs before it
}

// The same text as a char row and as a string scalar.
std::vector<zqArraySlot> asCharRowAndString(const std::u16string& text) {
    std::vector<zqArraySlot> operands;
    operands.push_back(host::makeCharArray(text));
    operands.push_back(host::makeStringArray({1, 1}, {text}));
    return operands;
}

TEST(ParseAssumedType, SpellingsCutFormsCaseAndLength) {
    const std::pair<std::u16string, zqClassID> cases[] = {
        {u"int8", zqInt8Class},     {u"uint8", zqUInt8Class},   {u"int16", zqInt16Class},
        {u"uint16", zqUInt16Class}, {u"int32", zqInt32Class},   {u"uint32", zqUInt32Class},
        {u"int64", zqInt64Class},   {u"uint64", zqUInt64Class}, {u"int1", zqInt16Class},
        {u"uint1", zqUInt16Class},  {u"int3", zqInt32Class},    {u"uint3", zqUInt32Class},
        {u"int6", zqInt64Class},    {u"uint6", zqUInt64Class},  {u"INT8", zqInt8Class},
        {u"uInT64", zqUInt64Class}, {u"int", zqNoClass},        {u"uint", zqNoClass},
        {u"i", zqNoClass},          {u"int8x", zqNoClass},      {u"int16x", zqNoClass},
        {u"uint641", zqNoClass},    {u" int8", zqNoClass},      {u"int8 ", zqNoClass},
        {u"double", zqNoClass},     {u"", zqNoClass},           {u"int8\u00e9", zqNoClass},
    };
    for (const auto& [text, expected] : cases) {
        for (const zqArraySlot& operand : asCharRowAndString(text)) {
            EXPECT_EQ(parseAssumedType(operand.get()), expected)
                << std::string(text.begin(), text.end()) << " class " << host::classOf(*operand);
        }
    }
    for (const std::u16string text : {u"int1\u00e9", u"\u00e9"}) {
        for (const zqArraySlot& operand : asCharRowAndString(text))
            EXPECT_THROW(parseAssumedType(operand.get()), InvalidCharacter);
    }
}

TEST(ParseAssumedType, WhatIsNoScalarTextHasNoClass) {
    std::vector<zqArraySlot> operands;
    operands.push_back(host::makeDoubleScalar(8));
    operands.push_back(host::makeCharArray({4, 1}, u"int8"));
    operands.push_back(host::makeCharArray({2, 4}, u"iunitn88"));
    operands.push_back(host::makeCharArray({1, 2, 2}, u"int8"));
    operands.push_back(host::makeCharArray({0, 0}, u""));
    operands.push_back(host::makeStringArray({1, 2}, {u"int8", u"int8"}));
    std::vector<zqArraySlot> cellElements;
    cellElements.push_back(host::makeCharArray(u"int8"));
    operands.push_back(host::makeCellArray({1, 1}, std::move(cellElements)));
    for (const zqArraySlot& operand : operands)
        EXPECT_EQ(parseAssumedType(operand.get()), zqNoClass);

    auto incomplete = host::makeCharArray(u"uint3");
    host::setIncompleteDimensions(*incomplete);
    EXPECT_EQ(parseAssumedType(incomplete.get()), zqUInt32Class);
    host::setOpaqueClassId(*incomplete, zqOpaqueClass);
    EXPECT_EQ(parseAssumedType(incomplete.get()), zqUInt32Class);
}

// The text errors are thrown as they are: the legacy report never sees them.
TEST(GetScalarText, RefusesWhatIsNoLineOfTextWithoutTheLegacyReport) {
    using NotText = ErrorOf<VESPRA::string::MustBeStringScalarOrCharacterVector>;
    host::resetLegacyErrors();
    const auto missing = host::makeStringArray({1, 1}, {std::nullopt});
    EXPECT_THROW(parseAssumedType(missing.get()), ErrorOf<VESPRA::string::MissingNotSupported>);
    EXPECT_THROW(getScalarText(nullptr, true), NotText);
    EXPECT_THROW(getScalarText(host::makeCharArray({2, 2}, u"int8").get(), true), NotText);
    EXPECT_THROW(getScalarText(host::makeStringArray({1, 2}, {u"a", u"b"}).get(), true), NotText);
    EXPECT_THROW(getScalarText(host::makeDoubleScalar(1).get(), true), NotText);
    EXPECT_EQ(host::legacyErrorCount(), 0u);
}

}  // namespace
