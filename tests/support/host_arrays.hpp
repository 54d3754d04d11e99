// Terse makers and readers of host arrays for tests, a caller of the exported
// entry points that reports the identifier of a refusal, and a fixture that
// fails a test which leaves array records alive.
#pragma once

#include "host/array_factory.hpp"
#include "host/element_types.hpp"
#include "host/exceptions.hpp"
#include "host/zq_array.hpp"

#include <gtest/gtest.h>

#include <exception>
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
    return host::makeArray(classIdOf<T>, dims, std::span<const T>(values));
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

using EntryPoint = void (*)(int, zqArraySlot*, int, const zqArray_tag**);

// The identifier of the refusal (the what() text of an error without one),
// or "" with the result in `result`.
inline std::string callEntry(EntryPoint entry, std::vector<const zqArray_tag*> inputs,
                             zqArraySlot* result = nullptr) {
    zqArraySlot own;
    try {
        entry(1, result ? result : &own, static_cast<int>(inputs.size()), inputs.data());
    } catch (const foundation::core::except::IMsgIDException& error) {
        return error.GetID();
    } catch (const std::exception& error) {
        return error.what();
    }
    return "";
}

class LeakCheckedTest : public ::testing::Test {
protected:
    void TearDown() override {
        EXPECT_EQ(host::liveArrayCount(), liveAtStart_) << "array records leaked";
    }

private:
    std::size_t liveAtStart_ = host::liveArrayCount();
};

}  // namespace testing_support
