// The value of an expression: either an array the evaluation just made,
// which nobody else holds, or a variable's array, borrowed.
#pragma once

#include "calc/array_building.hpp"
#include "host/zq_array.hpp"

#include <utility>

namespace bitcalc {

class Value {
public:
    // An array just made, such as the result of a call or a conversion.
    static Value fresh(zqArraySlot array) {
        Value value;
        value.owned_ = std::move(array);
        value.array_ = value.owned_.get();
        return value;
    }

    // A variable's array; it must outlive the value.
    static Value borrowed(const zqArray_tag& array) {
        Value value;
        value.array_ = &array;
        return value;
    }

    const zqArray_tag& array() const { return *array_; }

    // True for an array that nobody else holds: one whose storage a library
    // may take over when it is passed straight as an argument.
    bool isFresh() const { return owned_ != nullptr; }

    // The array itself, or a copy of a borrowed one.
    zqArraySlot release() && { return owned_ ? std::move(owned_) : copyArray(*array_); }

    // The fresh array, to be flagged before a call; null for a borrowed one.
    zqArray_tag* freshArray() { return owned_.get(); }

private:
    Value() = default;

    zqArraySlot owned_;
    const zqArray_tag* array_ = nullptr;
};

}  // namespace bitcalc
