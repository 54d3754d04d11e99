// The human display: a header with name, size and class, then the values by
// rows and columns, a page per index of the dimensions beyond the second,
// and columns wrapped to the width of a terminal.
#include "calc/array_access.hpp"
#include "calc/display.hpp"
#include "calc/element_text.hpp"
#include "calc/text_join.hpp"

#include <algorithm>
#include <ostream>
#include <vector>

namespace bitcalc {

namespace {

constexpr std::size_t lineWidth = 80;
constexpr std::string_view indent = "  ";
constexpr std::string_view gap = "  ";

// A short form of a cell's element: a scalar's value, a text, or the size
// and class.
std::string cellElementSummary(const zqArray_tag& element) {
    const zqClassID cls = host::classOf(element);
    const Dims dims = host::dimensions(element);
    if (cls == zqCellClass) return joinText("{", dimsText(dims), " cell}");
    if (cls == zqCharClass && dims.size() == 2 && dims[0] == 1) {
        return humanQuoted({elementsOf<char16_t>(element), dims[1]}, '\'');
    }
    if (cls == zqStringClass && isScalar(element)) {
        const auto text = host::stringElement(element, 0);
        return text ? humanQuoted(*text, '"') : "<missing>";
    }
    if (holdsElements(cls) && cls != zqCharClass && isScalar(element)) {
        return joinText("[", numberText(element, 0, NumberStyle::Human), "]");
    }
    return joinText("[", dimsText(dims), " ", className(cls), "]");
}

std::string elementText(const zqArray_tag& array, std::size_t index) {
    switch (host::classOf(array)) {
        case zqStringClass: {
            const auto text = host::stringElement(array, index);
            return text ? humanQuoted(*text, '"') : "<missing>";
        }
        case zqCellClass: return cellElementSummary(*host::cellElement(array, index));
        default: return numberText(array, index, NumberStyle::Human);
    }
}

// "(:,:,2,3)" for the page at `page` of the dimensions beyond the second.
std::string pageLabel(const Dims& dims, std::size_t page) {
    std::string label = "(:,:";
    for (std::size_t d = 2; d < dims.size(); ++d) {
        label += ',';
        label += std::to_string(page % dims[d] + 1);
        page /= dims[d];
    }
    return label += ')';
}

class HumanDisplay final : public Display {
public:
    HumanDisplay(std::ostream& out, std::ostream& errors) : out_(out), errors_(errors) {}

    void showValue(std::string_view name, const zqArray_tag& array) override {
        const Dims dims = host::dimensions(array);
        out_ << name << " = " << dimsText(dims) << ' ' << className(host::classOf(array));
        if (host::isSparse(array)) out_ << " sparse";
        if (host::isComplex(array)) out_ << " complex";
        out_ << '\n';
        const std::size_t count = host::elementCount(array);
        if (count == 0) {
            out_ << indent << "[]\n";
            return;
        }
        const std::size_t pageSize = dims[0] * dims[1];
        const std::size_t pages = count / pageSize;
        for (std::size_t page = 0; page < pages; ++page) {
            if (dims.size() > 2) out_ << indent << pageLabel(dims, page) << '\n';
            showPage(array, dims[0], dims[1], page * pageSize);
        }
        out_.flush();
    }

    void showError(const ErrorReport& error) override {
        out_.flush();
        errors_ << "error: " << error.message;
        if (!error.identifier.empty()) errors_ << " (" << error.identifier << ")";
        errors_ << std::endl;
    }

private:
    void showPage(const zqArray_tag& array, std::size_t rows, std::size_t columns,
                  std::size_t first) {
        if (host::classOf(array) == zqCharClass) {
            const char16_t* units = elementsOf<char16_t>(array) + first;
            for (std::size_t row = 0; row < rows; ++row) {
                std::u16string text;
                for (std::size_t column = 0; column < columns; ++column)
                    text.push_back(units[row + column * rows]);
                out_ << indent << humanQuoted(text, '\'') << '\n';
            }
            return;
        }
        // Numbers line up in columns of one width; text and cells take each
        // column as wide as its widest element. As many columns go to a
        // block as fit the line.
        std::vector<std::string> texts(rows * columns);
        std::vector<std::size_t> widths(columns, 1);
        for (std::size_t i = 0; i < texts.size(); ++i) {
            texts[i] = elementText(array, first + i);
            widths[i / rows] = std::max(widths[i / rows], texts[i].size());
        }
        const bool alignLeft =
            host::classOf(array) == zqStringClass || host::classOf(array) == zqCellClass;
        if (!alignLeft)
            std::fill(widths.begin(), widths.end(),
                      *std::max_element(widths.begin(), widths.end()));
        std::vector<std::size_t> blockStarts;
        std::size_t used = 0;
        for (std::size_t column = 0; column < columns; ++column) {
            if (blockStarts.empty() || used + gap.size() + widths[column] > lineWidth) {
                blockStarts.push_back(column);
                used = indent.size() + widths[column];
            } else {
                used += gap.size() + widths[column];
            }
        }
        blockStarts.push_back(columns);
        for (std::size_t block = 0; block + 1 < blockStarts.size(); ++block) {
            const std::size_t start = blockStarts[block];
            const std::size_t end = blockStarts[block + 1];
            if (blockStarts.size() > 2) {
                out_ << indent;
                if (end - start == 1) {
                    out_ << "Column " << start + 1 << ":\n";
                } else {
                    out_ << "Columns " << start + 1 << " to " << end << ":\n";
                }
            }
            for (std::size_t row = 0; row < rows; ++row) {
                std::string line(indent);
                for (std::size_t column = start; column < end; ++column) {
                    const std::string& text = texts[row + column * rows];
                    const std::string padding(widths[column] - text.size(), ' ');
                    if (column != start) line += gap;
                    line += alignLeft ? joinText(text, padding) : joinText(padding, text);
                }
                while (!line.empty() && line.back() == ' ') line.pop_back();
                out_ << line << '\n';
            }
        }
    }

    std::ostream& out_;
    std::ostream& errors_;
};

}  // namespace

std::unique_ptr<Display> makeHumanDisplay(std::ostream& out, std::ostream& errors) {
    return std::make_unique<HumanDisplay>(out, errors);
}

}  // namespace bitcalc
