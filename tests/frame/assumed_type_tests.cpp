// The assumed-type operand's compare and text extraction where no entry point
// reaches them: null texts, and operands that no caller passes. Spellings, cut
// forms, case, shapes and the invalid-character rule are checked through every
// entry point against the reference model by the fuzz targets.
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
