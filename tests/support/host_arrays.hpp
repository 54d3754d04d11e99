// Terse makers and readers of host arrays for tests, a fixture that fails a
// test which leaves array records alive, and a caller of the exported entry
// points that reports the identifier of a refusal.
#pragma once

#include "host/array_factory.hpp"
#include "host/element_types.hpp"
#include "host/exceptions.hpp"
#include "host/zq_array.hpp"

#include <gtest/gtest.h>

#include <exception>
#include <initializer_list>
#include <span>
#include <string>
#include <vector>

namespace testing_support {

using IntegerTypes = ::testing::Types<signed char, unsigned char, short, unsigned short, int,
                                      unsigned int, long, unsigned long>;

// The host class of an element type.
template <class T>
inline constexpr zqClassID classIdOf = host::elementClassOf<T>;

// An array of T's class holding `values`; a row unless `dims` is given.
template <class T>
zqArraySlot makeOf(const std::vector<T>& values, host::Dims dims = {}) {
    if (dims.empty()) dims = {1, values.size()};
    if constexpr (std::is_same_v<T, bool>) {
        std::vector<unsigned char> bytes(values.begin(), values.end());
        return host::makeArray(classIdOf<T>, dims, std::span<const unsigned char>(bytes));
    } else {
        return host::makeArray(classIdOf<T>, dims, std::span<const T>(values));
    }
}

template <class T>
zqArraySlot makeOf(std::initializer_list<T> values, host::Dims dims = {}) {
    return makeOf(std::vector<T>(values), std::move(dims));
}

template <class T>
zqArraySlot scalarOf(T value) {
    return makeOf<T>({value});
}

// The real elements of `array`, read as T.
template <class T>
std::vector<T> elementsOf(const zqArray_tag* array) {
    const T* data = static_cast<const T*>(array->data);
    return std::vector<T>(data, data + host::elementCount(*array));
}

class LeakCheckedTest : public ::testing::Test {
protected:
    void TearDown() override {
        EXPECT_EQ(host::liveArrayCount(), liveAtStart_) << "array records leaked";
    }

private:
    std::size_t liveAtStart_ = host::liveArrayCount();
};

using EntryPoint = void (*)(int, zqArraySlot*, int, const zqArray_tag**);

// The outcome of one call: the result, or the refusal's identifier (the
// what() text for an error without one).
struct CallOutcome {
    zqArraySlot result;
    std::string error;
};

inline CallOutcome callEntry(EntryPoint entry, std::vector<const zqArray_tag*> inputs,
                             int nlhs = 1) {
    CallOutcome outcome;
    try {
        entry(nlhs, &outcome.result, static_cast<int>(inputs.size()), inputs.data());
    } catch (const foundation::core::except::IMsgIDException& error) {
        outcome.error = error.GetID();
    } catch (const std::exception& error) {
        outcome.error = error.what();
    }
    return outcome;
}

}  // namespace testing_support
