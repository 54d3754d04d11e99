// The exported entry points of libbitfcns.so, one per function, each with the
// built-in calling shape: number of outputs, output slots, number of inputs,
// input arrays. Failures leave as exceptions of the host's exception library.
#pragma once

#include "host/zq_array.hpp"

#define BITFCNS_EXPORT __attribute__((visibility("default")))

BITFCNS_EXPORT void ondelBitAndFcn(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs);
BITFCNS_EXPORT void ondelBitOrFcn(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs);
BITFCNS_EXPORT void ondelBitXorFcn(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs);
BITFCNS_EXPORT void ondelBitCmpFcn(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs);
BITFCNS_EXPORT void ondelBitGetFcn(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs);
BITFCNS_EXPORT void ondelBitSetFcn(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs);
BITFCNS_EXPORT void ondelBitShiftFcn(int nlhs, zqArraySlot* plhs, int nrhs,
                                     const zqArray_tag** prhs);
