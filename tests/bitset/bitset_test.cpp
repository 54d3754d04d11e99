// bitset through its entry point against a plain model on bit patterns:
// serial against parallel runs at each limit, fresh and in place, and no
// array left behind. The call forms, the truth of V and the refusals are in
// bitset.case; every class combination and position is checked against the
// reference model by the fuzz target.
#include "bitfcns/entry_points.hpp"
#include "engine/parallel_limits.hpp"
#include "host/array_factory.hpp"
#include "host/host_control.hpp"
#include "tests/support/host_arrays.hpp"

#include <gtest/gtest.h>

#include <bit>
#include <cstdint>
#include <cstring>

namespace {

using namespace testing_support;
using Bits = std::uint64_t;

constexpr zqClassID noValue = zqNoClass;

unsigned widthOf(zqClassID cls) { return static_cast<unsigned>(host::elementSize(cls) * 8); }

// An array of class `cls` holding `values`, converted by the host; null for
// noValue.
zqArraySlot arrayOf(zqClassID cls, const std::vector<double>& values) {
    if (cls == noValue) return nullptr;
    return zqArraySlot(matrix::convert_if_needed(makeOf(values).get(), cls).detach());
}

Bits bitsAt(const zqArray_tag* array, unsigned long i) {
    const std::size_t size = host::elementSize(host::classOf(*array));
    Bits bits = 0;
    std::memcpy(&bits, static_cast<const char*>(array->data) + i * size, size);
    return bits;
}

// The model: bit b (from 1) of `a` set or cleared, cut to `width` bits.
Bits withBit(Bits a, unsigned b, bool set, unsigned width) {
    const Bits bits = set ? a | Bits{1} << (b - 1) : a & ~(Bits{1} << (b - 1));
    return width == 64 ? bits : bits & ((Bits{1} << width) - 1);
}

CallOutcome bitset(const zqArraySlot& a, const zqArraySlot& bit, const zqArraySlot& value) {
    if (!value) return callEntry(&ondelBitSetFcn, {a.get(), bit.get()});
    return callEntry(&ondelBitSetFcn, {a.get(), bit.get(), value.get()});
}

// Every test fails if it leaves an array behind.
class Bitset : public LeakCheckedTest {};

// One run below the limit of each route and one at it, fresh and in place,
// against the model (the engine's tests take the SIMD families through
// every width). Position i is i modulo the width, plus 1; V is true unless i is a
// multiple of 3. A double A holds whole numbers below 2^32.
TEST_F(Bitset, SerialAndParallelRunsAgreeAtEveryLimit) {
    using namespace bitfcns::limits;
    const struct {
        zqClassID aClass, bitClass, valueClass;
        bool bitArray, valueArray;
        unsigned long limit;
    } cases[] = {
        {zqDoubleClass, zqDoubleClass, noValue, true, false, bitsetOnDouble},
        {zqUInt8Class, zqDoubleClass, noValue, true, false, bitsetPositionArrayTrue},
        {zqInt16Class, zqUInt8Class, zqDoubleClass, true, false, bitsetPositionArrayFalse},
        {zqInt32Class, zqSingleClass, zqLogicalClass, true, true, bitsetPositionValueArrays},
        {zqUInt8Class, zqDoubleClass, zqInt8Class, false, true, bitsetScalarPosition},
        {zqInt64Class, zqDoubleClass, zqInt64Class, false, true, bitsetScalarPosition},
        {zqUInt16Class, zqDoubleClass, zqUInt16Class, false, true, setBitFromValues<short>},
        {zqInt32Class, zqDoubleClass, noValue, false, false, setOneBit<int>},
        {zqInt64Class, zqDoubleClass, zqDoubleClass, false, false, clearOneBit<long>},
    };
    for (const auto& c : cases)
        for (unsigned long n : {c.limit - 1, c.limit})
            for (bool inPlace : {false, true}) {
                SCOPED_TRACE(testing::Message() << c.aClass << " " << n << " " << inPlace);
                const bool onDouble = c.aClass == zqDoubleClass;
                const unsigned width = widthOf(onDouble ? zqUInt64Class : c.aClass);
                const std::size_t size = host::elementSize(c.aClass);
                std::vector<Bits> aBits(n);
                std::vector<double> positions(c.bitArray ? n : 1, width), values(n);
                std::vector<std::byte> aBytes(n * size);
                for (unsigned long i = 0; i < n; ++i) {
                    aBits[i] = (i + 1) * 0x9E3779B97F4A7C15u >> (onDouble ? 32 : 0);
                    if (onDouble) aBits[i] = std::bit_cast<Bits>(static_cast<double>(aBits[i]));
                    std::memcpy(aBytes.data() + i * size, &aBits[i], size);
                    if (c.bitArray) positions[i] = static_cast<double>(i % width + 1);
                    values[i] = static_cast<double>(i % 3);
                }
                values.resize(c.valueArray ? n : 1);
                const auto a = host::makeArray(c.aClass, {1, n}, aBytes);
                host::setWantsSharedResult(*a, inPlace);
                const auto value = arrayOf(c.valueClass, values);
                const auto outcome = bitset(a, arrayOf(c.bitClass, positions), value);
                ASSERT_EQ(outcome.error, "");
                EXPECT_EQ(outcome.result->data == a->data, inPlace);
                for (unsigned long i = 0; i < n; ++i) {
                    const auto b = static_cast<unsigned>(positions[c.bitArray ? i : 0]);
                    const bool set = !value || values[c.valueArray ? i : 0] != 0;
                    const Bits whole =
                        onDouble ? static_cast<Bits>(std::bit_cast<double>(aBits[i])) : aBits[i];
                    const Bits bits = withBit(whole, b, set, width);
                    const Bits expected =
                        onDouble ? std::bit_cast<Bits>(static_cast<double>(bits)) : bits;
                    ASSERT_EQ(bitsAt(outcome.result.get(), i), expected) << "element " << i;
                }
            }
}

// The bridge converts BIT and V; neither a refusal after that nor a failed
// allocation at any step leaves an array behind.
TEST_F(Bitset, NothingLeftBehind) {
    const auto a = makeOf<double>({1, 2});
    const auto value = makeOf<short>({1, 0});
    const auto bits = makeOf<unsigned char>({1, 2});
    EXPECT_EQ(bitset(a, makeOf<unsigned char>({1, 65}), value).error,
              "VESPRA:bitSetGet:BITOutOfRange");
    for (std::size_t after = 0; after < 4; ++after) {
        host::failNextAllocations(1, after);
        const auto outcome = bitset(a, bits, value);
        host::failNextAllocations(0);
        EXPECT_EQ(outcome.error.empty(), outcome.result != nullptr) << after;
    }
}

}  // namespace
