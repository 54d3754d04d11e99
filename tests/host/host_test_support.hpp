// Shared pieces of the host tests: a fixture that fails a test which leaves
// array records alive, and small makers of typed arrays.
#pragma once

#include "host/array_factory.hpp"

#include <gtest/gtest.h>

#include <span>
#include <vector>

namespace host::testing {

class HostTest : public ::testing::Test {
protected:
    void SetUp() override { liveAtStart_ = liveArrayCount(); }
    void TearDown() override {
        EXPECT_EQ(liveArrayCount(), liveAtStart_) << "array records leaked";
    }

private:
    std::size_t liveAtStart_ = 0;
};

template <class T>
zqArraySlot arrayOf(zqClassID cls, const Dims& dims, const std::vector<T>& values) {
    return makeArray(cls, dims, std::span<const T>(values));
}

template <class T>
std::span<const T> elementsOf(const zqArray_tag& array) {
    return {static_cast<const T*>(array.data), elementCount(array)};
}

}  // namespace host::testing
