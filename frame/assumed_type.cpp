// Reading the assumed-type operand: text extraction from char rows and string
// scalars, the bounded ASCII compare, and the table of class spellings.
#include "frame/assumed_type.hpp"

#include "frame/array.hpp"
#include "frame/ctype_error.hpp"
#include "frame/exception.hpp"
#include "frame/message_tags.hpp"
#include "host/string_helpers.hpp"

#include <algorithm>
#include <array>
#include <string>

namespace bitfcns {

namespace {

struct Spelling {
    const char16_t* reference;
    std::size_t bound;
    zqClassID id;
};

// Tried from top to bottom. The bound is 4 for every signed and 5 for every
// unsigned name, one short of the two-digit names, which therefore also match
// when cut by their last digit.
constexpr std::array<Spelling, 8> spellings{{
    {u"int8", 4, zqInt8Class},
    {u"uint8", 5, zqUInt8Class},
    {u"int16", 4, zqInt16Class},
    {u"uint16", 5, zqUInt16Class},
    {u"int32", 4, zqInt32Class},
    {u"uint32", 5, zqUInt32Class},
    {u"int64", 4, zqInt64Class},
    {u"uint64", 5, zqUInt64Class},
}};

// ASCII with the capitals mapped to small letters.
constexpr std::array<char16_t, 128> asciiLowerCase = [] {
    std::array<char16_t, 128> table{};
    for (char16_t unit = 0; unit < 128; ++unit) {
        table[unit] = (unit >= u'A' && unit <= u'Z') ? char16_t(unit - u'A' + u'a') : unit;
    }
    return table;
}();

char16_t foldCase(char16_t unit) {
    if ((unit & 0xFF80) != 0)
        foundation::ustring::detail::throw_ctype_invalid_character_exception();
    return asciiLowerCase[unit];
}

std::uint64_t terminatedLength(const char16_t* text) {
    std::uint64_t length = 0;
    while (text[length] != u'\0') ++length;
    return length;
}

// The text errors are thrown as they are, without the host's legacy report.
template <class Tag>
[[noreturn]] void throwTextError() {
    throw ErrorOf<Tag>(Tag{});
}

// A char array that reads as one line: two dimensions, one row (of any
// length) or 0-by-0.
bool isCharRow(const zqArray_tag* operand) {
    if (numberOfDimensions(operand) != 2) return false;
    const unsigned long* dims = dimensionsOf(operand);
    return dims[0] == 1 || (dims[0] == 0 && dims[1] == 0);
}

}  // namespace

TextView getScalarText(const zqArray_tag* operand, bool rowOnly) {
    using NotText = VESPRA::string::MustBeStringScalarOrCharacterVector;
    if (operand == nullptr) throwTextError<NotText>();

    if (classOf(operand) == zqCharClass && (!rowOnly || isCharRow(operand))) {
        return {dataOf<const char16_t>(operand), numberOfElements(operand)};
    }
    if (!Kestrelon::String::isString(operand)) throwTextError<NotText>();

    const Kestrelon::String::StringArray* strings = Kestrelon::String::getString(operand);
    if (strings->ndims != 2 || strings->dims[0] != 1 || strings->dims[1] != 1) {
        throwTextError<NotText>();
    }
    const Kestrelon::String::TextRecord* text = strings->elements[0];
    if (text == nullptr) throwTextError<VESPRA::string::MissingNotSupported>();
    return {text->units, text->length};
}

bool equalsBounded(TextView text, TextView reference, std::size_t bound) {
    if (text.length == 0) return false;
    const std::uint64_t compareLength =
        std::max(std::min<std::uint64_t>(text.length, reference.length),
                 std::min<std::uint64_t>(reference.length, bound));
    if (reference.data == nullptr || compareLength == 0 || text.data == nullptr) return false;

    if (text.length <= compareLength) {
        // The text ends first (or together with the compare length): it
        // matches only if it is exactly as long as the compare length.
        for (std::uint64_t i = 0; i < text.length; ++i) {
            const char16_t textUnit = foldCase(text.data[i]);
            if (textUnit != foldCase(reference.data[i])) return false;
        }
        return text.length == compareLength;
    }
    // The text runs past the compare length: compared as far as that, then
    // refused for being longer.
    for (std::uint64_t i = 0; i < compareLength; ++i) {
        const char16_t referenceUnit = foldCase(reference.data[i]);
        if (referenceUnit != foldCase(text.data[i])) return false;
    }
    return false;
}

zqClassID parseAssumedType(const zqArray_tag* operand) {
    if (!Kestrelon::String::isScalarText(operand, false, true)) return zqNoClass;
    const TextView text = getScalarText(operand, true);
    for (const Spelling& spelling : spellings) {
        const TextView reference{spelling.reference, terminatedLength(spelling.reference)};
        if (equalsBounded(text, reference, spelling.bound)) return spelling.id;
    }
    return zqNoClass;
}

}  // namespace bitfcns
