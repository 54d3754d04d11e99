// A call through an exported entry point checked against the reference model
// on the same operands, and doubles at the edges of an integer class for the
// double paths.
#pragma once

#include "host/host_control.hpp"
#include "tests/reference/reference_model.hpp"
#include "tests/support/host_arrays.hpp"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <type_traits>
#include <utility>
#include <vector>

namespace testing_support {

// `array`, flagged (or not) as one whose storage the result may take over.
inline zqArraySlot flagged(zqArraySlot array, bool inPlace = true) {
    host::setWantsSharedResult(*array, inPlace);
    return array;
}

// The model's outcome: the same refusal, or the same class, sizes and
// elements, taking over the first operand's storage exactly when the model
// does; and no array record left behind. (What a refused call leaves in its
// operands and in plhs[0] is the fuzz harness's to check.)
inline void expectModelOutcome(reference::Function function, EntryPoint entry,
                               const std::vector<const zqArray_tag*>& inputs) {
    const std::size_t liveBefore = host::liveArrayCount();
    [&] {
        std::vector<reference::Operand> operands;
        for (const zqArray_tag* a : inputs) {
            const auto* bytes = static_cast<const unsigned char*>(a->data);
            const std::size_t size = host::elementCount(*a) * host::elementSize(host::classOf(*a));
            reference::Operand& op = operands.emplace_back();
            op.cls = host::classOf(*a);
            op.wantsShared = (a->flags & zqSharedResultFlag) != 0;
            op.dims = host::dimensions(*a);
            op.bytes.assign(bytes, bytes + size);
        }
        const reference::Outcome expected = reference::call(function, 1, operands);
        zqArraySlot result;
        ASSERT_EQ(callEntry(entry, inputs, &result), expected.error)
            << "the library, then the model";
        if (!expected.error.empty()) return;
        ASSERT_EQ(host::classOf(*result), expected.cls);
        ASSERT_EQ(host::dimensions(*result), expected.dims);
        EXPECT_EQ(host::storageIdentity(*result) == host::storageIdentity(*inputs[0]),
                  expected.sharesFirst);
        const auto* got = static_cast<const unsigned char*>(result->data);
        const long size = static_cast<long>(host::elementSize(expected.cls));
        const long firstWrong =
            std::mismatch(expected.bytes.begin(), expected.bytes.end(), got).first -
            expected.bytes.begin();
        EXPECT_EQ(firstWrong / size, static_cast<long>(expected.bytes.size()) / size)
            << "the first wrong element (the count when none is)";
    }();
    EXPECT_EQ(host::liveArrayCount(), liveBefore) << "array records leaked";
}

// Whole doubles of T: the bounds (the largest doubles below 2^63 and 2^64),
// zeros, the middle, and values of every length and sign.
template <class T>
std::vector<double> edgeDoublesOf() {
    constexpr int bits = sizeof(T) * 8 - std::is_signed_v<T>;
    const double top = std::ldexp(1.0, bits), low = std::is_signed_v<T> ? -top : 0.0;
    const double step = bits > 53 ? std::ldexp(1.0, bits - 53) : 1.0;
    std::vector<double> v{0.0, -0.0, 1.0, low, top - step, top - 2 * step, top / 2, top / 2 + 1};
    if (low < 0) v.insert(v.end(), {-1.0, low / 2, low / 2 - 1});
    for (std::uint64_t s = bits, i = 0; i < 40; ++i) {
        s = s * 6364136223846793005u + 1442695040888963407u;
        const double m =
            std::floor(std::ldexp(double(s >> 11) / 9007199254740992.0, int(s % bits)));
        v.push_back(low < 0 && (s & 1024) ? -m : m);
    }
    return v;
}

// `values` with each whole number from `first` to `last` in turn: arrays that
// pair every value with every number, so that neighbouring elements differ.
inline std::pair<zqArraySlot, zqArraySlot> pairedWithEach(const std::vector<double>& values,
                                                          double first, double last) {
    std::vector<double> paired, numbers;
    for (double x : values)
        for (double k = first; k <= last; ++k) paired.push_back(x), numbers.push_back(k);
    return {makeOf(paired), makeOf(numbers)};
}

// T's class name, the assumed type of a double path.
template <class T>
zqArraySlot classNameOf() {
    constexpr const char16_t* names[] = {u"int8",  u"uint8",  u"int16", u"uint16",
                                         u"int32", u"uint32", u"int64", u"uint64"};
    return host::makeCharArray(names[classIdOf<T> - zqInt8Class]);
}

}  // namespace testing_support
