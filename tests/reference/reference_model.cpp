// The reference model: each function's tests in their order, then its result
// computed one element at a time in 128-bit integers.
#include "tests/reference/reference_model.hpp"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <deque>
#include <string_view>

namespace reference {

namespace {

__extension__ typedef __int128 Int;
__extension__ typedef unsigned __int128 UInt;

struct Refusal {
    std::string id;
};
[[noreturn]] void refuse(std::string id) { throw Refusal{std::move(id)}; }

bool isInteger(zqClassID cls) { return cls >= zqInt8Class && cls <= zqUInt64Class; }
bool isNumericClass(zqClassID cls) {
    return cls == zqDoubleClass || cls == zqSingleClass || isInteger(cls);
}
int widthOf(zqClassID cls) { return 8 << ((cls - zqInt8Class) / 2); }
bool isSigned(zqClassID cls) { return (cls - zqInt8Class) % 2 == 0; }

// `v` as a value of an integer class: its low bits, two's complement if signed.
Int wrap(Int v, zqClassID cls) {
    const UInt modulus = UInt(1) << widthOf(cls);
    const UInt bits = UInt(v) & (modulus - 1);
    return isSigned(cls) && bits >= modulus / 2 ? Int(bits) - Int(modulus) : Int(bits);
}

// The double nearest to `v`, for `v` from -2^63 to below 2^64.
double toDouble(Int v) {
    return v < 0 ? static_cast<double>(static_cast<long>(v))
                 : static_cast<double>(static_cast<unsigned long>(v));
}

// The element test of a double for an integer class: finite, whole, in range.
bool fits(double x, zqClassID cls) {
    if (!std::isfinite(x) || x != std::floor(x)) return false;
    const int width = widthOf(cls);
    const double low = isSigned(cls) ? -std::ldexp(1.0, width - 1) : 0.0;
    return x >= low && x < std::ldexp(1.0, isSigned(cls) ? width - 1 : width);
}

// The integer that a double passing the element test stands for.
Int exact(double x) {
    return x < 0 ? Int(static_cast<long>(x)) : Int(static_cast<unsigned long>(x));
}

bool isWhole(double x) { return std::isfinite(x) && x == std::floor(x); }

std::size_t countOf(const std::vector<unsigned long>& dims) {
    if (std::find(dims.begin(), dims.end(), 0UL) != dims.end()) return 0;
    std::size_t count = 1;
    for (unsigned long size : dims) count *= size;
    return count;
}

std::vector<unsigned long> shapeOf(const Operand& a) {
    return a.noStoredSizes ? std::vector<unsigned long>{1, 1} : normalised(a.dims);
}
std::size_t countOf(const Operand& a) { return countOf(shapeOf(a)); }
bool isScalar(const Operand& a) { return countOf(a) == 1; }
bool storedIs(const Operand& a, zqClassID cls) { return !a.opaque && a.cls == cls; }
bool isNumeric(const Operand& a) { return isNumericClass(a.cls); }
bool isComplex(const Operand& a) { return a.complex && isNumeric(a); }

// Element `i` of an integer or logical operand.
Int integerAt(const Operand& a, std::size_t i) {
    if (!isInteger(a.cls)) return a.bytes[i] != 0;
    unsigned long bits = 0;
    std::memcpy(&bits, &a.bytes[i * elementSize(a.cls)], elementSize(a.cls));
    return wrap(bits, a.cls);
}

// Element `i` as a double; integers rounded to the nearest double.
double realAt(const Operand& a, std::size_t i) {
    if (a.cls == zqSingleClass) {
        float x;
        std::memcpy(&x, &a.bytes[i * 4], 4);
        return x;
    }
    if (a.cls != zqDoubleClass) return toDouble(integerAt(a, i));
    double x;
    std::memcpy(&x, &a.bytes[i * 8], 8);
    return x;
}

bool truthAt(const Operand& a, std::size_t i) {
    return isInteger(a.cls) || a.cls == zqLogicalClass ? integerAt(a, i) != 0 : realAt(a, i) != 0;
}

// A shift count or bit position: exact for integers; whole floating values
// cut to +-128, which changes no answer.
Int countAt(const Operand& a, std::size_t i) {
    if (isInteger(a.cls)) return integerAt(a, i);
    return Int(std::clamp(realAt(a, i), -128.0, 128.0));
}

bool positionAt(const Operand& a, std::size_t i, int width) {
    if (!isInteger(a.cls) && !isWhole(realAt(a, i))) return false;
    const Int position = countAt(a, i);
    return position >= 1 && position <= width;
}

// Element `i` of an integer or logical result: the low bytes of `v`.
void put(Operand& r, std::size_t i, Int v) {
    const auto bits = static_cast<unsigned long>(v);
    std::memcpy(&r.bytes[i * elementSize(r.cls)], &bits, elementSize(r.cls));
}

void putDouble(Operand& r, std::size_t i, double x) { std::memcpy(&r.bytes[i * 8], &x, 8); }

// The shift rule: past the width nothing (or the sign) is left.
Int shifted(Int x, zqClassID cls, Int count) {
    const int width = widthOf(cls);
    if (count >= width) return 0;
    if (count <= -width) return x < 0 ? -1 : 0;
    if (count >= 0) return wrap(Int(UInt(x) << static_cast<int>(count)), cls);
    return x >> static_cast<int>(-count);
}

bool isScalarText(const Operand& a) {
    if (a.cls == zqCharClass) {
        const auto dims = shapeOf(a);
        return !a.noStoredSizes && dims.size() == 2 &&
               (dims[0] == 1 || (dims[0] == 0 && dims[1] == 0));
    }
    return a.cls == zqStringClass && countOf(a) == 1;
}

char16_t folded(char16_t unit) {
    if (unit & 0xFF80) refuse(kInvalidCharacter);
    return unit >= u'A' && unit <= u'Z' ? static_cast<char16_t>(unit + (u'a' - u'A')) : unit;
}

// Compares at most a bound's worth of the text: a cut spelling one short of
// two digits matches as well as the whole one.
bool equalsBounded(const std::u16string& text, std::string_view spelling, std::size_t bound) {
    if (text.empty()) return false;
    const std::size_t length =
        std::max(std::min(text.size(), spelling.size()), std::min(spelling.size(), bound));
    for (std::size_t i = 0; i < std::min(text.size(), length); ++i) {
        if (folded(text[i]) != static_cast<char16_t>(spelling[i])) return false;
    }
    return text.size() == length;
}

zqClassID parseType(const Operand& a) {
    if (!isScalarText(a)) return zqNoClass;
    std::u16string text;
    if (a.cls == zqCharClass) {
        text.resize(countOf(a));
        if (!text.empty()) std::memcpy(text.data(), a.bytes.data(), 2 * text.size());
    } else if (a.strings.at(0)) {
        text = *a.strings[0];
    } else {
        refuse("VESPRA:string:MissingNotSupported");
    }
    static constexpr std::string_view spellings[] = {"int8",  "uint8",  "int16", "uint16",
                                                     "int32", "uint32", "int64", "uint64"};
    for (int row = 0; row < 8; ++row) {
        if (equalsBounded(text, spellings[row], row % 2 ? 5 : 4)) {
            return static_cast<zqClassID>(zqInt8Class + row);
        }
    }
    return zqNoClass;
}

using Dims = std::vector<unsigned long>;

// Refuses with `id` at the first of the first `count` elements of `a` that
// isn't `valid`: a scalar's one element is tested even for an empty result.
template <class Test>
void scan(const Operand& a, std::size_t count, const std::string& id, Test valid) {
    for (std::size_t i = 0, n = isScalar(a) ? 1 : count; i < n; ++i) {
        if (!valid(i)) refuse(id);
    }
}

// An array of class `cls` and sizes `dims`, its elements zero.
Operand fresh(zqClassID cls, const Dims& dims) {
    Operand a;
    a.cls = cls;
    a.dims = normalised(dims);
    a.bytes.resize(countOf(a.dims) * elementSize(cls));
    return a;
}

// The sizes of a result where only a scalar adapts to the other operand.
Dims scalarOrSame(const Operand& a, const Operand& b, const std::string& sizeId) {
    if (!isScalar(a) && !isScalar(b) && shapeOf(a) != shapeOf(b)) refuse(sizeId);
    return isScalar(a) ? shapeOf(b) : shapeOf(a);
}

// The index in `a` of a result's element `i`: `i`, or 0 where `a` is scalar.
std::size_t at(const Operand& a, std::size_t i) { return isScalar(a) ? 0 : i; }

class Model {
public:
    Model(int nlhs, const std::vector<Operand>& inputs, std::optional<std::size_t> failing)
        : nlhs_(nlhs), in_(inputs), failing_(failing) {}

    Outcome run(Function function) {
        try {
            switch (function) {
                case Function::bitand_: logic('&', "VESPRA:Bitand"); break;
                case Function::bitor_: logic('|', "VESPRA:Bitor"); break;
                case Function::bitxor_: logic('^', "VESPRA:bitxor"); break;
                case Function::bitcmp: bitcmp(); break;
                case Function::bitget: getOrShift(false); break;
                case Function::bitset: bitset(); break;
                case Function::bitshift: getOrShift(true); break;
            }
        } catch (const Refusal& refusal) {
            outcome_ = Outcome{};
            outcome_.error = refusal.id;
            outcome_.slotFilled = slotFilled_;
        }
        return outcome_;
    }

private:
    int nlhs_;
    const std::vector<Operand>& in_;
    std::optional<std::size_t> failing_;
    std::size_t allocations_ = 0;
    bool shares_ = false, slotFilled_ = false;
    Outcome outcome_;
    std::deque<Operand> conversions_;

    void counts(std::size_t fewest, std::size_t most) {
        if (nlhs_ > 1) refuse("VESPRA:maxlhs");
        if (in_.size() > most) refuse("VESPRA:maxrhs");
        if (in_.size() < fewest) refuse("VESPRA:minrhs");
    }

    // One array made by the host: a record, large storage apart, an
    // imaginary part apart; each takes one allocation.
    void allocate(std::size_t bytes, bool complex = false) {
        const std::size_t units = 1 + (bytes >= (32u << 10)) + complex;
        if (failing_ && *failing_ >= allocations_ && *failing_ < allocations_ + units) {
            refuse(kOutOfMemory);
        }
        allocations_ += units;
    }

    // The result array: a shared copy of `first` if allowed and flagged.
    Operand makeResult(const Operand& first, bool mayShare, zqClassID cls, const Dims& dims,
                       bool intoSlot) {
        Operand result = fresh(cls, dims);
        shares_ = mayShare && first.wantsShared;
        allocate(shares_ ? 0 : result.bytes.size());
        slotFilled_ = intoSlot;
        return result;
    }

    // The host's conversion: the operand itself when of class `cls`.
    const Operand& converted(const Operand& a, zqClassID cls) {
        if (a.cls == cls) return a;
        if (isComplex(a) && cls == zqLogicalClass) refuse("VESPRA:bsxfun:badOperands");
        allocate(countOf(a) * elementSize(cls), isComplex(a));
        Operand& c = conversions_.emplace_back(fresh(cls, shapeOf(a)));
        c.complex = isComplex(a);
        for (std::size_t i = 0, n = countOf(a); i < n; ++i) {
            if (cls == zqDoubleClass) {
                putDouble(c, i, realAt(a, i));
            } else if (cls == zqLogicalClass) {
                put(c, i, truthAt(a, i));
            } else {
                put(c, i, a.cls == zqDoubleClass ? exact(realAt(a, i)) : integerAt(a, i));
            }
        }
        return c;
    }

    void finish(Operand result) {
        outcome_.cls = result.cls;
        outcome_.dims = result.dims;
        outcome_.bytes = std::move(result.bytes);
        outcome_.sharesFirst = shares_;
    }

    // The host's helper: AND, OR or XOR under implicit expansion; `allocates`
    // false for the library's own loop into a result it has made already.
    Operand combine(const Operand& a, const Operand& b, char op, zqClassID cls,
                    bool allocates = true) {
        const Dims sa = shapeOf(a), sb = shapeOf(b);
        Dims dims(std::max(sa.size(), sb.size()));
        const auto sizeIn = [](const Dims& s, std::size_t d) { return d < s.size() ? s[d] : 1; };
        for (std::size_t d = 0; d < dims.size(); ++d) {
            dims[d] = sizeIn(sa, d) == 1 ? sizeIn(sb, d) : sizeIn(sa, d);
        }
        if (allocates) allocate(countOf(dims) * elementSize(cls));
        Operand r = fresh(cls, dims);
        const auto valueAt = [](const Operand& x, std::size_t i) {
            return x.cls == zqDoubleClass ? exact(realAt(x, i)) : integerAt(x, i);
        };
        for (std::size_t k = 0, n = countOf(dims); k < n; ++k) {
            std::size_t rest = k, ia = 0, ib = 0, strideA = 1, strideB = 1;
            for (std::size_t d = 0; d < dims.size(); ++d) {
                const std::size_t sub = rest % dims[d];
                rest /= dims[d];
                ia += sizeIn(sa, d) == 1 ? 0 : sub * strideA;
                ib += sizeIn(sb, d) == 1 ? 0 : sub * strideB;
                strideA *= sizeIn(sa, d);
                strideB *= sizeIn(sb, d);
            }
            const Int x = valueAt(a, ia), y = valueAt(b, ib);
            put(r, k, op == '&' ? (x & y) : op == '|' ? (x | y) : (x ^ y));
        }
        return r;
    }

    // An assumed type given with integer values must name their class.
    static void expectType(const Operand* type, zqClassID cls, const std::string& group) {
        if (!type) return;
        const zqClassID named = parseType(*type);
        if (!named) refuse(group + ":unknownTypeString");
        if (named != cls) refuse(group + ":invalidTypeString");
    }

    bool bothDoubles() const {
        return storedIs(in_[0], zqDoubleClass) && storedIs(in_[1], zqDoubleClass);
    }

    bool allFit(const Operand& a, zqClassID cls) {
        for (std::size_t i = 0, n = countOf(a); i < n; ++i) {
            if (!fits(realAt(a, i), cls)) return false;
        }
        return true;
    }

    void logic(char op, const std::string& group) {
        counts(2, 3);
        const Operand &a = in_[0], &b = in_[1];
        const auto fail = [&](const char* leaf) { refuse(group + ":" + leaf); };
        if (a.sparse || b.sparse) fail("sparseArgs");
        const auto accepted = [](const Operand& x) {
            return isNumeric(x) || storedIs(x, zqLogicalClass);
        };
        if (!accepted(a) || !accepted(b)) fail("operandsNotNumeric");
        if (isComplex(a) || isComplex(b)) fail("complexInputs");
        const zqClassID ca = a.cls, cb = b.cls;
        if ((ca == zqSingleClass && !isInteger(cb)) || (cb == zqSingleClass && !isInteger(ca))) {
            fail("firstArgsNotInt");
        }
        const Dims sa = shapeOf(a), sb = shapeOf(b);
        for (std::size_t d = 0; d < std::min(sa.size(), sb.size()); ++d) {
            if (sa[d] != 1 && sb[d] != 1 && sa[d] != sb[d]) fail("sizeMismatch");
        }
        if (isInteger(ca) || isInteger(cb)) {
            const zqClassID cls = isInteger(ca) ? ca : cb;
            if (ca != cb && !(ca == zqDoubleClass && isScalar(a)) &&
                !(cb == zqDoubleClass && isScalar(b))) {
                fail("mixedClasses");
            }
            expectType(in_.size() == 3 ? &in_[2] : nullptr, cls, group);
            for (const Operand* x : {&a, &b}) {
                if (x->cls == zqDoubleClass && !allFit(*x, cls)) fail("outOfRangeMixedType");
            }
            return finish(combine(a, b, op, cls));
        }
        if (in_.size() == 2 && ca == zqLogicalClass && cb == zqLogicalClass) {
            return finish(combine(a, b, op, zqLogicalClass));
        }
        const zqClassID work = in_.size() == 3 ? parseType(in_[2]) : zqUInt64Class;
        if (!work) fail("unknownTypeString");
        // Two doubles of the same sizes, or one of them scalar: the double
        // result is made before any element is tested and filled as they
        // pass; a refused element leaves the report to the conversions.
        if (ca == zqDoubleClass && cb == zqDoubleClass &&
            (isScalar(a) || isScalar(b) || sa == sb)) {
            allocate(countOf(isScalar(a) ? sb : sa) * elementSize(zqDoubleClass));
            if (allFit(a, work) && allFit(b, work)) {
                const Operand bits = combine(a, b, op, work, false);
                Operand r = fresh(zqDoubleClass, bits.dims);
                for (std::size_t i = 0; i < countOf(r); ++i) putDouble(r, i, realAt(bits, i));
                return finish(std::move(r));
            }
        }
        const auto convert = [&](const Operand& x) -> const Operand& {
            if (x.cls == zqDoubleClass && !allFit(x, work)) fail("outOfRange");
            return converted(x, work);
        };
        const Operand& first = convert(a);
        const Operand& second = convert(b);
        const Operand bits = combine(first, second, op, work);
        finish(converted(bits, zqDoubleClass));
    }

    void bitcmp() {
        counts(1, 2);
        const Operand& a = in_[0];
        if (storedIs(a, zqDoubleClass)) {
            if (a.sparse) refuse("VESPRA:bitcmp:sparseArgs");
            if (isComplex(a)) refuse("VESPRA:bitcmp:complexOperands");
            const zqClassID type = in_.size() == 2 ? parseType(in_[1]) : zqUInt64Class;
            Operand r = makeResult(a, true, zqDoubleClass, shapeOf(a), false);
            if (!isInteger(type)) refuse("VESPRA:bitcmp:unknownTypeString");
            if (!allFit(a, type)) refuse("VESPRA:bitcmp:outOfRange");
            for (std::size_t i = 0, n = countOf(a); i < n; ++i) {
                putDouble(r, i, toDouble(wrap(~exact(realAt(a, i)), type)));
            }
            return finish(std::move(r));
        }
        if (a.opaque || !isInteger(a.cls)) refuse("VESPRA:bitcmp:firstArgNotInt");
        if (isComplex(a)) refuse("VESPRA:bitcmp:complexOperands");
        expectType(in_.size() == 2 ? &in_[1] : nullptr, a.cls, "VESPRA:bitcmp");
        Operand r = makeResult(a, true, a.cls, shapeOf(a), false);
        for (std::size_t i = 0, n = countOf(a); i < n; ++i) put(r, i, ~integerAt(a, i));
        finish(std::move(r));
    }

    // bitget and bitshift (`shift`) test two operands in one order. Their
    // integer path words a first operand of no integer class and unequal
    // sizes in a group of its own, and fills the slot only for bitshift.
    void getOrShift(bool shift) {
        counts(2, 3);
        const std::string group = shift ? "VESPRA:bitshift" : "VESPRA:bitget";
        const std::string integerGroup = shift ? group : "VESPRA:bitSetGet";
        const Operand &a = in_[0], &b = in_[1], *type = in_.size() == 3 ? &in_[2] : nullptr;
        if (bothDoubles()) return finish(getOrShiftOnDouble(shift, a, b, type, true));
        if (a.sparse || b.sparse) refuse(group + ":sparseArgs");
        if (!isNumeric(a) || !isNumeric(b)) refuse(group + ":numericArg");
        if (a.cls == zqDoubleClass) {
            if (b.cls == zqSingleClass) refuse(integerGroup + ":firstArgNotInt");
            return finish(getOrShiftOnDouble(shift, a, converted(b, zqDoubleClass), type, shift));
        }
        if (!isInteger(a.cls)) refuse(integerGroup + ":firstArgNotInt");
        if (isComplex(a) || isComplex(b)) refuse(group + ":complexArgs");
        const Dims dims = scalarOrSame(a, b, integerGroup + ":sizeMismatch");
        expectType(type, a.cls, group);
        Operand r = makeResult(a, !isScalar(a), a.cls, dims, shift);
        const std::size_t n = countOf(dims);
        if (!shift) {
            scan(b, n, "VESPRA:bitSetGet:BITOutOfRange",
                 [&](std::size_t i) { return positionAt(b, i, widthOf(a.cls)); });
        } else if (!isInteger(b.cls)) {
            scan(b, n, "VESPRA:bitshift:inputsMustBeIntegers",
                 [&](std::size_t i) { return isWhole(realAt(b, i)); });
        }
        for (std::size_t i = 0; i < n; ++i) {
            const Int x = integerAt(a, at(a, i)), k = countAt(b, at(b, i));
            put(r, i, shift ? shifted(x, a.cls, k) : (x >> static_cast<int>(k - 1)) & 1);
        }
        finish(std::move(r));
    }

    Operand getOrShiftOnDouble(bool shift, const Operand& a, const Operand& b, const Operand* type,
                               bool intoSlot) {
        const std::string group = shift ? "VESPRA:bitshift" : "VESPRA:bitget";
        if (a.sparse || b.sparse) refuse(group + ":sparseArgs");
        if (isComplex(a) || isComplex(b)) refuse(group + ":complexArgs");
        const Dims dims = scalarOrSame(a, b, group + ":sizeMismatch");
        const zqClassID cls = type ? parseType(*type) : zqUInt64Class;
        Operand r = makeResult(a, !isScalar(a), zqDoubleClass, dims, intoSlot);
        if (!isInteger(cls)) refuse(group + ":unknownTypeString");
        const std::size_t n = countOf(dims);
        scan(a, n, group + ":outOfRange", [&](std::size_t i) { return fits(realAt(a, i), cls); });
        if (shift) {
            scan(b, n, "VESPRA:bitshift:inputsMustBeIntegers",
                 [&](std::size_t i) { return isWhole(realAt(b, i)); });
        } else {
            scan(b, n, "VESPRA:bitSetGet:BITOutOfRange",
                 [&](std::size_t i) { return positionAt(b, i, widthOf(cls)); });
        }
        for (std::size_t i = 0; i < n; ++i) {
            const Int x = exact(realAt(a, at(a, i))), k = countAt(b, at(b, i));
            putDouble(r, i,
                      toDouble(shift ? shifted(x, cls, k) : (x >> static_cast<int>(k - 1)) & 1));
        }
        return r;
    }

    // bitset's result shape by which operands are scalar; `sizeId` is the refusal.
    static Dims bitsetShape(const Operand& a, const Operand& bit, const Operand* v,
                            const std::string& sizeId) {
        const bool aS = isScalar(a), bS = isScalar(bit), vArray = v && !isScalar(*v);
        const auto same = [&](const Operand& x, const Operand& y) {
            if (shapeOf(x) != shapeOf(y)) refuse(sizeId);
        };
        if (aS && bS) return v ? shapeOf(*v) : shapeOf(bit);
        if (aS) {
            if (vArray) same(bit, *v);
            return shapeOf(bit);
        }
        if (!bS) same(a, bit);
        if (vArray) same(a, *v);
        return shapeOf(a);
    }

    // Element `i` of bitset's result: `x` with bit BIT(i) set, or cleared
    // where V(i) is false, as a value of `cls`.
    static Int setOrCleared(Int x, const Operand& bit, const Operand* v, std::size_t i,
                            zqClassID cls) {
        const Int mask = Int(1) << static_cast<int>(countAt(bit, at(bit, i)) - 1);
        return wrap(!v || truthAt(*v, at(*v, i)) ? x | mask : x & ~mask, cls);
    }

    void bitset() {
        counts(2, 4);
        if (bothDoubles()) {
            std::vector<const Operand*> list;
            for (const Operand& x : in_) list.push_back(&x);
            return finish(bitsetOnDouble(list, true));
        }
        const Operand *v = nullptr, *type = nullptr;
        if (in_.size() == 4) {
            v = &in_[2];
            type = &in_[3];
        } else if (in_.size() == 3) {
            (isScalarText(in_[2]) ? type : v) = &in_[2];
        }
        finish(bitsetOnInteger(in_[0], in_[1], v, type));
    }

    Operand bitsetOnDouble(const std::vector<const Operand*>& list, bool intoSlot) {
        const Operand &a = *list[0], &bit = *list[1];
        const bool withV = list.size() == 4 || (list.size() == 3 && !isScalarText(*list[2]));
        const Operand* v = nullptr;  // V's logical form
        zqClassID cls = zqUInt64Class;
        if (withV) {
            const Operand& given = *list[2];
            if (a.sparse || bit.sparse || given.sparse) refuse("VESPRA:bitset:sparseArgs");
            if (given.cls == zqSingleClass) refuse("VESPRA:bitset:invalidV");
            if (isComplex(a) || isComplex(bit) || isComplex(given)) {
                refuse("VESPRA:bitset:complexArgs");
            }
            if (bit.cls == zqSingleClass) refuse("VESPRA:bitSetGet:firstArgNotInt");
            if (given.cls != zqLogicalClass && !isNumeric(given)) refuse("VESPRA:bitset:invalidV");
            v = &converted(given, zqLogicalClass);
        } else {
            if (a.sparse || bit.sparse) refuse("VESPRA:bitset:sparseArgs");
            if (isComplex(a) || isComplex(bit)) refuse("VESPRA:bitset:complexArgs");
        }
        const Dims dims = bitsetShape(a, bit, v, "VESPRA:bitset:sizeMismatch");
        if (list.size() == 4 || (list.size() == 3 && !withV)) cls = parseType(*list.back());
        Operand r = makeResult(a, !isScalar(a), zqDoubleClass, dims, intoSlot);
        if (!isInteger(cls)) refuse("VESPRA:bitset:unknownTypeString");
        const std::size_t n = countOf(dims);
        scan(a, n, "VESPRA:bitset:outOfRange",
             [&](std::size_t i) { return fits(realAt(a, i), cls); });
        scan(bit, n, "VESPRA:bitSetGet:BITOutOfRange",
             [&](std::size_t i) { return positionAt(bit, i, widthOf(cls)); });
        for (std::size_t i = 0; i < n; ++i) {
            putDouble(r, i, toDouble(setOrCleared(exact(realAt(a, at(a, i))), bit, v, i, cls)));
        }
        return r;
    }

    Operand bitsetOnInteger(const Operand& a, const Operand& bit, const Operand* v,
                            const Operand* type) {
        if (a.sparse || bit.sparse || (v && v->sparse)) refuse("VESPRA:bitset:sparseArgs");
        if (!isNumeric(a) || !isNumeric(bit)) refuse("VESPRA:bitset:numericArg");
        if (v && !isNumeric(*v) && v->cls != zqLogicalClass) refuse("VESPRA:bitset:numericArg");
        if (a.cls == zqDoubleClass) {
            if (bit.cls == zqSingleClass) refuse("VESPRA:bitSetGet:firstArgNotInt");
            std::vector<const Operand*> list{&a, &converted(bit, zqDoubleClass)};
            if (v) list.push_back(&converted(*v, zqLogicalClass));
            if (type) list.push_back(type);
            return bitsetOnDouble(list, false);
        }
        if (!isInteger(a.cls)) refuse("VESPRA:bitSetGet:firstArgNotInt");
        if (isComplex(a) || isComplex(bit) || (v && isComplex(*v))) {
            refuse("VESPRA:bitset:complexArgs");
        }
        const Dims dims = bitsetShape(
            a, bit, v, v ? "VESPRA:bitset:sizeMismatch" : "VESPRA:bitSetGet:sizeMismatch");
        expectType(type, a.cls, "VESPRA:bitset");
        Operand r = makeResult(a, !isScalar(a), a.cls, dims, false);
        const std::size_t n = countOf(dims);
        scan(bit, n, "VESPRA:bitSetGet:BITOutOfRange",
             [&](std::size_t i) { return positionAt(bit, i, widthOf(a.cls)); });
        for (std::size_t i = 0; i < n; ++i) {
            put(r, i, setOrCleared(integerAt(a, at(a, i)), bit, v, i, a.cls));
        }
        return r;
    }
};

}  // namespace

std::vector<unsigned long> normalised(std::vector<unsigned long> dims) {
    while (dims.size() > 2 && dims.back() == 1) dims.pop_back();
    dims.resize(std::max<std::size_t>(dims.size(), 2), 1);
    return dims;
}

std::size_t elementSize(zqClassID cls) {
    switch (cls) {
        case zqLogicalClass: return 1;
        case zqCharClass: return 2;
        case zqDoubleClass: return 8;
        case zqSingleClass: return 4;
        default: return isInteger(cls) ? static_cast<std::size_t>(widthOf(cls) / 8) : 0;
    }
}

Outcome call(Function function, int nlhs, const std::vector<Operand>& inputs,
             std::optional<std::size_t> failingAllocation) {
    return Model(nlhs, inputs, failingAllocation).run(function);
}

}  // namespace reference
