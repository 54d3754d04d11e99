// The canonical display: exact, one line per value or error.
#include "calc/array_access.hpp"
#include "calc/display.hpp"
#include "calc/element_text.hpp"
#include "calc/text_join.hpp"

#include <ostream>

namespace bitcalc {

namespace {

std::string elementsText(const zqArray_tag& array) {
    const zqClassID cls = host::classOf(array);
    const std::size_t count = host::elementCount(array);
    if (count == 0) return "[]";
    if (cls == zqCharClass) {
        // All code units as one quoted text, in storage order.
        const char16_t* units = elementsOf<char16_t>(array);
        std::string text = "[";
        text += canonicalQuoted({units, count}, '\'');
        return text += ']';
    }
    std::string text = "[";
    for (std::size_t i = 0; i < count; ++i) {
        if (i != 0) text += ' ';
        if (cls == zqStringClass) {
            const auto element = host::stringElement(array, i);
            text += element ? canonicalQuoted(*element, '"') : "<missing>";
        } else if (cls == zqCellClass) {
            text += '{';
            text += canonicalValueText(*host::cellElement(array, i));
            text += '}';
        } else {
            text += numberText(array, i, NumberStyle::Canonical);
        }
    }
    return text += ']';
}

class CanonicalDisplay final : public Display {
public:
    explicit CanonicalDisplay(std::ostream& out) : out_(out) {}

    void showValue(std::string_view name, const zqArray_tag& array) override {
        out_ << name << " = " << canonicalValueText(array) << '\n';
    }

    void showError(const ErrorReport& error) override { out_ << canonicalErrorLine(error) << '\n'; }

private:
    std::ostream& out_;
};

}  // namespace

std::string canonicalValueText(const zqArray_tag& array) {
    return joinText(className(host::classOf(array)), ' ', dimsText(host::dimensions(array)),
                    host::isSparse(array) ? " sparse" : "",
                    host::isComplex(array) ? " complex" : "", ' ', elementsText(array));
}

std::string canonicalErrorLine(const ErrorReport& error) {
    return joinText("error: ", error.identifier.empty() ? error.message : error.identifier);
}

std::unique_ptr<Display> makeCanonicalDisplay(std::ostream& out) {
    return std::make_unique<CanonicalDisplay>(out);
}

}  // namespace bitcalc
