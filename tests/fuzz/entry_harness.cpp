// The call that fuzz bytes describe: counts, operands drawn towards the edges
// of each class, type texts, layouts and flags; then the checks of one call.
#include "tests/fuzz/entry_harness.hpp"

#include "bitfcns/entry_points.hpp"
#include "host/array_factory.hpp"
#include "host/exceptions.hpp"
#include "host/host_control.hpp"

#include <tbb/global_control.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <limits>
#include <span>
#include <string>
#include <vector>

namespace fuzzing {

namespace {

using reference::Function;
using reference::Operand;
using Dims = std::vector<unsigned long>;

// The fuzz bytes, read front to back; past their end every read gives 0.
class Bytes {
public:
    Bytes(const std::uint8_t* data, std::size_t size) : data_(data), size_(size) {}
    unsigned next() { return at_ < size_ ? data_[at_++] : 0; }
    unsigned below(unsigned n) { return (next() | next() << 8) % n; }
    // Past the end of the bytes: false, so that short inputs make plain calls.
    bool oneIn(unsigned n) { return below(n) == n - 1; }
    void fill(unsigned char* out, std::size_t count) {
        for (std::size_t i = 0; i < count; ++i) out[i] = static_cast<unsigned char>(next());
    }

private:
    const std::uint8_t* data_;
    std::size_t size_;
    std::size_t at_ = 0;
};

std::size_t countOf(const Dims& dims) {
    std::size_t count = 1;
    for (unsigned long d : dims) count *= d;
    return count;
}

bool isNumericClass(zqClassID cls) {
    return cls == zqDoubleClass || cls == zqSingleClass ||
           (cls >= zqInt8Class && cls <= zqUInt64Class);
}

enum class Layout { twoDimensional, sizePointer, incomplete };

// How an operand is built beyond what the model reads.
struct Plan {
    Layout layout = Layout::twoDimensional;
    zqClassID storedId = zqDoubleClass;
    std::vector<unsigned char> imaginary;
};

struct Call {
    Function function = Function::bitand_;
    int nlhs = 1;
    std::vector<Operand> operands;
    std::vector<Plan> plans;
    std::optional<std::size_t> failingAllocation;
    bool quietLegacy = false;  // the host's legacy error call comes back
    bool sentinel = true;      // plhs[0] holds an array before the call
    bool large = false;        // arrays around a parallel limit
};

using Limits = std::numeric_limits<double>;
// Whole numbers at and past the bounds of each class, 2^53, 2^63, 2^64 and
// their neighbours, fractions, denormals, NaN and the infinities.
// clang-format off
constexpr double kEdges[] = {
    0.0, -0.0, 1, -1, 0.5, -0.5, 1.5, 2.5, 127, 128, -128, -129, 255, 256, 32767, 32768, -32769,
    65535, 65536, 2147483647, 2147483647.5, 2147483648.0, -2147483648.0, -2147483649.0,
    4294967295.0, 4294967296.0, 4503599627370497.0, 9007199254740992.0, 9007199254740994.0,
    9223372036854774784.0, 9223372036854775808.0, -9223372036854775808.0, -9223372036854777856.0,
    18446744073709549568.0, 18446744073709551616.0, Limits::quiet_NaN(), Limits::infinity(),
    -Limits::infinity(), Limits::denorm_min(), -Limits::denorm_min(), Limits::max(), 1e300, -1e300,
    3.4028234663852886e38};
// clang-format on

// A tame element: a small whole number, mostly a valid bit position and
// seldom negative, so that calls get as far as their loops.
long drawTame(Bytes& in) {
    const long magnitude = in.oneIn(4) ? in.below(66) : in.below(9);
    return in.oneIn(8) ? -magnitude : magnitude;
}

// Wild elements reach the edges of every class and any bit pattern.
double drawDouble(Bytes& in, bool wild) {
    switch (wild ? in.below(3) : 0) {
        case 0: return static_cast<double>(drawTame(in));
        case 1: return kEdges[in.below(std::size(kEdges))];
        default: {
            double x;
            in.fill(reinterpret_cast<unsigned char*>(&x), sizeof x);
            return x;
        }
    }
}

// Wild integers: the bounds of the class, their neighbours, or any bits.
void drawInteger(Bytes& in, unsigned char* out, std::size_t size, bool isSigned, bool wild) {
    if (wild && in.oneIn(2)) return in.fill(out, size);
    const unsigned long top = 1UL << (8 * size - 1), ones = top | (top - 1);
    const unsigned long lowest = isSigned ? top : 0, highest = isSigned ? top - 1 : ones;
    const unsigned long edges[] = {lowest, lowest + 1, highest, highest - 1};
    const unsigned long bits = wild ? edges[in.below(4)] : static_cast<unsigned long>(drawTame(in));
    std::memcpy(out, &bits, size);  // little-endian: the low bytes
}

// A type text: a spelling, its cut forms and near misses, edited now and then.
std::u16string drawText(Bytes& in) {
    static constexpr const char* spellings[] = {
        "int8", "uint8", "int16", "uint16", "int32",   "uint32", "int64", "uint64",
        "int1", "uint1", "int3",  "uint3",  "int6",    "uint6",  "int",   "uint",
        "i",    "u",     "int7",  "double", "uint641", "int8x",  ""};
    // The first 14 name a class; the rest are near misses.
    const char* spelling = spellings[in.below(in.oneIn(4) ? std::size(spellings) : 14)];
    std::u16string text(spelling, spelling + std::strlen(spelling));
    static constexpr char16_t wide[] = {0x80, 0xE9, 0xFF, 0x100, 0x130, 0x212A, 0xFF80, 0xFFFF};
    for (unsigned edits = in.oneIn(3) ? 1 + in.below(3) : 0; edits > 0; --edits) {
        const std::size_t at = text.empty() ? 0 : in.below(static_cast<unsigned>(text.size()));
        switch (in.below(5)) {
            case 0:
                if (!text.empty()) text[at] = static_cast<char16_t>(text[at] ^ 0x20);
                break;
            case 1:
                if (!text.empty()) text.pop_back();
                break;
            case 2: text.push_back(u"x16 4"[in.below(5)]); break;
            case 3: text.insert(at, 1, wide[in.below(std::size(wide))]); break;
            default: text.push_back(static_cast<char16_t>(in.next() | in.next() << 8)); break;
        }
    }
    return text;
}

void setText(Operand& op, const std::u16string& text, const Dims& dims) {
    op.cls = zqCharClass;
    op.dims = dims;
    op.bytes.resize(text.size() * 2);
    if (!text.empty()) std::memcpy(op.bytes.data(), text.data(), op.bytes.size());
}

// A type operand: mostly scalar text, sometimes text of another shape.
Operand drawTypeOperand(Bytes& in) {
    Operand op;
    const std::u16string text = drawText(in);
    switch (in.below(10)) {
        case 0: setText(op, text + text, {2, text.size()}); break;  // a char matrix
        case 1: setText(op, text, {text.size(), 1}); break;         // a column
        case 2: setText(op, u"", {0, 0}); break;
        case 3:
        case 4:
            op.cls = zqStringClass;
            op.dims = {1, 1};
            op.strings = {in.oneIn(6) ? std::nullopt : std::optional(text)};
            break;
        case 5:
            op.cls = zqStringClass;
            op.dims = {1, 2};
            op.strings = {text, text};
            break;
        default: setText(op, text, {1, text.size()}); break;
    }
    return op;
}

// A class, mostly double or an integer; the second operand often takes the
// first one's.
zqClassID drawClass(Bytes& in, zqClassID first, bool second) {
    if (second && in.oneIn(2)) return first;
    const unsigned pick = in.below(64);
    if (pick < 28) return zqDoubleClass;
    if (pick < 56) return static_cast<zqClassID>(zqInt8Class + in.below(8));
    static constexpr zqClassID others[] = {zqSingleClass,  zqSingleClass, zqLogicalClass,
                                           zqLogicalClass, zqCharClass,   zqCharClass,
                                           zqStringClass,  zqCellClass};
    return others[pick - 56];
}

// Sizes: a scalar, the call's base shape, its transpose, an empty one, any.
Dims drawDims(Bytes& in, const Dims& base, bool large) {
    if (large) return in.oneIn(3) ? Dims{1, 1} : base;
    const unsigned pick = in.below(10);
    if (pick < 3) return {1, 1};
    if (pick < 6) return base;
    if (pick == 6) return {base[1], base[0]};
    if (pick == 7) return in.oneIn(2) ? Dims{0, in.below(4)} : Dims{1UL << 62, 0, 1UL << 40};
    Dims dims(in.below(6));
    for (auto& size : dims) size = in.below(4);
    return dims;
}

void fillElements(Bytes& in, Operand& op, std::size_t drawn, bool wild) {
    const std::size_t size = reference::elementSize(op.cls);
    const std::size_t count = op.noStoredSizes ? 1 : countOf(op.dims);
    op.bytes.resize(count * size);
    for (std::size_t i = 0; i < std::min(count, drawn); ++i) {
        unsigned char* out = op.bytes.data() + i * size;
        if (op.cls == zqDoubleClass) {
            const double x = drawDouble(in, wild);
            std::memcpy(out, &x, size);
        } else if (op.cls == zqSingleClass) {
            const float x = static_cast<float>(drawDouble(in, wild));
            std::memcpy(out, &x, size);
        } else if (op.cls == zqLogicalClass) {
            *out = in.oneIn(2);
        } else if (op.cls == zqCharClass) {
            const char16_t unit = in.oneIn(4) ? static_cast<char16_t>(in.next() | in.next() << 8)
                                              : u"int8u6x"[in.below(7)];
            std::memcpy(out, &unit, size);
        } else {
            drawInteger(in, out, size, (op.cls - zqInt8Class) % 2 == 0, wild);
        }
    }
    // Large arrays repeat their first elements.
    for (std::size_t filled = std::min(count, drawn) * size; filled < op.bytes.size();
         filled *= 2) {
        std::memcpy(op.bytes.data() + filled, op.bytes.data(),
                    std::min(filled, op.bytes.size() - filled));
    }
}

Plan drawOperand(Bytes& in, bool typeRole, bool second, zqClassID first, const Dims& base,
                 bool large, Operand& op) {
    Plan plan;
    if (typeRole && !in.oneIn(6)) {
        op = drawTypeOperand(in);
    } else {
        op.cls = drawClass(in, first, second);
        op.dims = drawDims(in, base, large);
        if (op.cls == zqStringClass) {
            for (std::size_t i = 0; i < countOf(op.dims); ++i) op.strings.push_back(drawText(in));
        } else if (op.cls != zqCellClass) {
            op.noStoredSizes = op.dims.empty();
            const bool wild = in.oneIn(4);
            fillElements(in, op, large ? 1 + in.below(8) : std::numeric_limits<std::size_t>::max(),
                         wild);
        }
    }
    const bool holdsElements = reference::elementSize(op.cls) != 0;
    op.sparse = in.oneIn(32);
    op.complex = in.oneIn(32);
    if (op.complex && isNumericClass(op.cls)) {
        plan.imaginary.resize(op.bytes.size());
        in.fill(plan.imaginary.data(), plan.imaginary.size());
    }
    op.wantsShared = in.oneIn(3);
    op.opaque = in.oneIn(32);
    plan.storedId = op.opaque ? static_cast<zqClassID>(zqOpaqueClass + in.below(100)) : op.cls;
    const unsigned layout = in.below(8);
    if (holdsElements && !op.noStoredSizes && layout == 6) plan.layout = Layout::sizePointer;
    if (layout == 7) plan.layout = Layout::incomplete;
    return plan;
}

// Element counts at which loops go parallel: the library's limits, and the
// host's 256 KiB of result (its AND, OR, XOR and complement). Of the SIMD
// limits of bitget, bitset and bitshift only the lowest, which cost least.
constexpr unsigned long kLimits[] = {3000,  8000,   12000,  30000,  32768,
                                     40000, 262144, 400000, 800000, 1000000};

Call drawCall(Function function, Bytes& in) {
    Call call;
    call.function = function;
    const unsigned outputs = in.below(16);
    call.nlhs = outputs < 5 ? 0 : outputs < 15 ? 1 : static_cast<int>(2 + in.below(4));
    struct Counts {
        unsigned fewest, most;
    };
    const Counts counts = function == Function::bitcmp   ? Counts{1, 2}
                          : function == Function::bitset ? Counts{2, 4}
                                                         : Counts{2, 3};
    const unsigned inputs =
        in.oneIn(8) ? in.below(6) : counts.fewest + in.below(counts.most - counts.fewest + 1);
    call.large = in.oneIn(64);
    Dims base{1 + in.below(4), in.below(4)};
    if (call.large) {
        const bool simdLimits = function == Function::bitget || function == Function::bitset ||
                                function == Function::bitshift;
        const unsigned pick = in.below(simdLimits && in.oneIn(8) ? 10 : 7);
        const unsigned long size = kLimits[pick] - in.below(2);
        base = in.oneIn(2) ? Dims{size, 1} : Dims{1, size};
    }
    zqClassID first = zqDoubleClass;
    for (unsigned i = 0; i < inputs; ++i) {
        // bitset's third operand is a value operand, or with 3 inputs a type.
        const bool bitsetThird = function == Function::bitset && i == 2;
        const bool typeRole =
            i > 0 && (function == Function::bitcmp || i >= 3 || (i == 2 && !bitsetThird) ||
                      (bitsetThird && inputs == 3 && in.oneIn(2)));
        Operand& op = call.operands.emplace_back();
        call.plans.push_back(drawOperand(in, typeRole, i == 1, first, base, call.large, op));
        if (i == 0) first = op.cls;
    }
    if (in.oneIn(12)) call.failingAllocation = in.below(5);
    call.quietLegacy = in.oneIn(4);
    call.sentinel = !in.oneIn(4);
    return call;
}

zqArraySlot build(const Operand& op, const Plan& plan) {
    zqArraySlot array;
    if (op.cls == zqStringClass) {
        array = host::makeStringArray(op.dims, op.strings);
    } else if (op.cls == zqCellClass) {
        std::vector<zqArraySlot> cells;
        for (std::size_t i = 0; i < countOf(op.dims); ++i)
            cells.push_back(host::makeDoubleScalar(1));
        array = host::makeCellArray(op.dims, std::move(cells));
    } else if (op.noStoredSizes || plan.layout == Layout::sizePointer) {
        array = host::makeArrayWithSizePointer(op.cls, op.noStoredSizes ? Dims{} : op.dims);
        if (!op.bytes.empty()) std::memcpy(array->data, op.bytes.data(), op.bytes.size());
    } else {
        array = host::makeArray(op.cls, op.dims, std::as_bytes(std::span(op.bytes)));
    }
    if (op.complex && isNumericClass(op.cls)) {
        host::makeComplex(*array, std::as_bytes(std::span(plan.imaginary)));
    } else if (op.complex) {
        array->flags |= zqComplexFlag;  // means nothing without the numeric flag
    }
    host::setSparse(*array, op.sparse);
    host::setWantsSharedResult(*array, op.wantsShared);
    if (op.opaque) host::setOpaqueClassId(*array, plan.storedId);
    if (plan.layout == Layout::incomplete) host::setIncompleteDimensions(*array);
    return array;
}

// Each function's name and entry point, in the order of reference::Function.
constexpr struct {
    std::string_view name;
    void (*entry)(int, zqArraySlot*, int, const zqArray_tag**);
} kFunctions[] = {{"bitand", ondelBitAndFcn},    {"bitor", ondelBitOrFcn},
                  {"bitxor", ondelBitXorFcn},    {"bitcmp", ondelBitCmpFcn},
                  {"bitget", ondelBitGetFcn},    {"bitset", ondelBitSetFcn},
                  {"bitshift", ondelBitShiftFcn}};
const char* nameOf(Function function) { return kFunctions[static_cast<int>(function)].name.data(); }

struct Run {
    std::vector<zqArraySlot> operands;
    std::vector<std::uint32_t> flags;  // as built, less those that completion changes
    zqArraySlot slot;
    const zqArray_tag* sentinel = nullptr;
    std::string error;
    std::size_t legacyCount = 0;
    std::string legacyId;
};

constexpr std::uint32_t kStableFlags = ~(zqIncompleteDimsFlag | zqTwoDimensionalFlag);

Run runOnce(const Call& call) {
    Run run;
    std::vector<const zqArray_tag*> inputs;
    for (std::size_t i = 0; i < call.plans.size(); ++i) {
        run.operands.push_back(build(call.operands[i], call.plans[i]));
        run.flags.push_back(run.operands.back()->flags & kStableFlags);
        inputs.push_back(run.operands.back().get());
    }
    if (call.sentinel) run.slot = host::makeDoubleScalar(42);
    run.sentinel = run.slot.get();
    host::setLegacyErrorRaises(!call.quietLegacy);
    host::resetLegacyErrors();
    if (call.failingAllocation) host::failNextAllocations(1, *call.failingAllocation);
    try {
        kFunctions[static_cast<int>(call.function)].entry(
            call.nlhs, &run.slot, static_cast<int>(inputs.size()), inputs.data());
    } catch (const foundation::core::except::IMsgIDException& error) {
        run.error = error.GetID();
    } catch (const std::bad_alloc&) {
        run.error = reference::kOutOfMemory;
    } catch (const std::exception& error) {
        run.error = error.what();
    } catch (...) {
        run.error = "an exception of no known type";
    }
    host::failNextAllocations(0);
    host::setLegacyErrorRaises(true);
    run.legacyCount = host::legacyErrorCount();
    run.legacyId = host::lastLegacyErrorId();
    return run;
}

// For the report of a fault: up to 64 bytes in hex, and sizes as AxBxC.
std::string hexOf(const unsigned char* bytes, std::size_t count) {
    std::string text;
    for (std::size_t i = 0; i < count && i < 64; ++i)
        for (int shift : {4, 0}) text += "0123456789abcdef"[bytes[i] >> shift & 15];
    return text + (count > 64 ? "..." : "");
}

std::string dimsText(const Dims& dims) {
    std::string text;
    for (unsigned long d : dims) text.append(text.empty() ? "" : "x").append(std::to_string(d));
    return text.empty() ? "(no sizes)" : text;
}

[[noreturn]] void fail(const std::string& what, const Call& call,
                       const reference::Outcome& expected, const Run& run) {
    std::fprintf(stderr, "\n*** %s: %s\n", nameOf(call.function), what.c_str());
    std::fprintf(stderr, "nlhs %d, nrhs %zu, failing allocation %ld, quiet legacy %d\n", call.nlhs,
                 call.plans.size(), call.failingAllocation ? long(*call.failingAllocation) : -1L,
                 call.quietLegacy);
    for (std::size_t i = 0; i < call.plans.size(); ++i) {
        const Operand& op = call.operands[i];
        const Plan& plan = call.plans[i];
        std::string text;
        for (const auto& s : op.strings)
            text += s ? " \"" + std::string(s->begin(), s->end()) + "\"" : " <missing>";
        std::fprintf(
            stderr, "  class %d stored %d sparse %d complex %d shared %d layout %d dims %s: %s%s\n",
            op.cls, plan.storedId, op.sparse, op.complex, op.wantsShared,
            static_cast<int>(plan.layout), op.noStoredSizes ? "(none)" : dimsText(op.dims).c_str(),
            hexOf(op.bytes.data(), op.bytes.size()).c_str(), text.c_str());
    }
    std::fprintf(stderr, "model: %s class %d dims %s shares %d slot %d: %s\n",
                 expected.error.empty() ? "accepted" : expected.error.c_str(), expected.cls,
                 dimsText(expected.dims).c_str(), expected.sharesFirst, expected.slotFilled,
                 hexOf(expected.bytes.data(), expected.bytes.size()).c_str());
    const zqArray_tag* r = run.slot.get();
    std::fprintf(stderr, "library: %s", run.error.empty() ? "accepted" : run.error.c_str());
    if (r && r != run.sentinel) {
        const std::size_t size = host::elementCount(*r) * host::elementSize(host::classOf(*r));
        std::fprintf(stderr, " class %d dims %s: %s", host::classOf(*r),
                     dimsText(host::dimensions(*r)).c_str(),
                     hexOf(static_cast<const unsigned char*>(r->data), size).c_str());
    }
    std::fprintf(stderr, "\n");
    std::abort();
}

void compare(const Call& call, const reference::Outcome& expected, const Run& run) {
    const auto check = [&](bool holds, const std::string& what) {
        if (!holds) fail(what, call, expected, run);
    };
    check(run.error == expected.error, "the outcome differs from the model's");
    if (call.quietLegacy) {
        const bool viaLegacy =
            expected.error.starts_with("VESPRA:") && !expected.error.starts_with("VESPRA:string:");
        check(run.legacyCount == (viaLegacy ? 1u : 0u),
              "the legacy error call was made " + std::to_string(run.legacyCount) + " times");
        check(!viaLegacy || run.legacyId == expected.error, "the legacy call saw " + run.legacyId);
    }
    if (expected.error.empty()) {
        check(run.slot && run.slot.get() != run.sentinel, "no result in plhs[0]");
        const zqArray_tag& r = *run.slot;
        check(host::classOf(r) == expected.cls, "the result's class");
        check(host::dimensions(r) == expected.dims, "the result's sizes");
        // A shared copy keeps the operand's sparse flag (bitcmp has no sparse test on integers).
        const bool sparse = expected.sharesFirst && host::isSparse(*run.operands[0]);
        check(!host::isComplex(r) && host::isSparse(r) == sparse && !(r.flags & zqSharedResultFlag),
              "the result's flags");
        check(expected.bytes.empty() ||
                  std::memcmp(r.data, expected.bytes.data(), expected.bytes.size()) == 0,
              "the result's elements");
        for (std::size_t i = 0; i < run.operands.size(); ++i) {
            const bool shares = host::storageIdentity(r) == host::storageIdentity(*run.operands[i]);
            check(shares == (expected.sharesFirst && i == 0),
                  "storage sharing with operand " + std::to_string(i));
        }
    } else {
        check((run.slot.get() != run.sentinel) == expected.slotFilled,
              expected.slotFilled ? "a refusal left no result in plhs[0]"
                                  : "a refusal changed plhs[0]");
    }
    for (std::size_t i = 0; i < run.operands.size(); ++i) {
        const zqArray_tag& a = *run.operands[i];
        const Plan& plan = call.plans[i];
        const Operand& op = call.operands[i];
        const std::string which = "operand " + std::to_string(i);
        check(a.classId == plan.storedId && (a.flags & kStableFlags) == run.flags[i],
              which + ": class or flags changed");
        const Dims shown = op.noStoredSizes ? Dims{1, 1} : reference::normalised(op.dims);
        check(host::dimensions(a) == shown, which + ": sizes changed");
        const bool overwritten = expected.error.empty() && expected.sharesFirst && i == 0;
        const std::vector<unsigned char>& bytes = overwritten ? expected.bytes : op.bytes;
        check(bytes.empty() || std::memcmp(a.data, bytes.data(), bytes.size()) == 0,
              which + ": elements changed");
        check(plan.imaginary.empty() || std::memcmp(host::imaginaryData(a), plan.imaginary.data(),
                                                    plan.imaginary.size()) == 0,
              which + ": imaginary part changed");
    }
}

}  // namespace

void checkCall(Function function, const std::uint8_t* data, std::size_t size) {
    Bytes in(data, size);
    const Call call = drawCall(function, in);
    const std::size_t liveBefore = host::liveArrayCount();
    {
        const reference::Outcome expected =
            reference::call(function, call.nlhs, call.operands, call.failingAllocation);
        const Run run = runOnce(call);
        compare(call, expected, run);
        if (call.large && expected.error.empty()) {
            tbb::global_control oneThread(tbb::global_control::max_allowed_parallelism, 1);
            const Run serial = runOnce(call);
            compare(call, expected, serial);
        }
    }
    if (host::liveArrayCount() != liveBefore) {
        std::fprintf(stderr, "*** %s: %zu array records leaked\n", nameOf(function),
                     host::liveArrayCount() - liveBefore);
        std::abort();
    }
}

std::optional<Function> functionNamed(std::string_view name) {
    for (std::size_t i = 0; i < std::size(kFunctions); ++i) {
        if (kFunctions[i].name == name) return static_cast<Function>(i);
    }
    return std::nullopt;
}

}  // namespace fuzzing
