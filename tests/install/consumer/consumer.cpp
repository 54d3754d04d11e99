// A caller of an installed bitfcns, built against the installed tree only:
// it calls each entry point once on a uint8 row and checks the answer, checks
// that a refusal reaches it as the host's exception with its identifier, and
// that the loaded library is the version of the headers. The entry points are
// referenced weakly: one that the installed library doesn't define is
// reported and passed over.
#include "bitfcns/entry_points.hpp"
#include "bitfcns/version.hpp"
#include "host/array_factory.hpp"
#include "host/exceptions.hpp"
#include "host/message_catalogue.hpp"

#include <cstdio>
#include <cstring>
#include <optional>
#include <span>
#include <string>
#include <vector>

__attribute__((weak)) void ondelBitAndFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitOrFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitXorFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitCmpFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitGetFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitSetFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitShiftFcn(int, zqArraySlot*, int, const zqArray_tag**);

namespace {

using EntryPoint = void (*)(int, zqArraySlot*, int, const zqArray_tag**);
using Bytes = std::vector<unsigned char>;

struct Check {
    const char* name;
    EntryPoint entry;
    std::optional<double> second;  // a double scalar after the uint8 row, or none
    Bytes expected;
};

const Bytes row{12, 10, 255};

zqArraySlot uint8Row(const Bytes& values) {
    return host::makeArray(zqUInt8Class, {1, values.size()},
                           std::span<const unsigned char>(values));
}

bool holds(const zqArray_tag* array, const Bytes& expected) {
    return array && host::classOf(*array) == zqUInt8Class &&
           host::elementCount(*array) == expected.size() &&
           std::memcmp(array->data, expected.data(), expected.size()) == 0;
}

bool run(const Check& check) {
    if (!check.entry) {
        std::printf("%-8s skipped: the installed library doesn't define it\n", check.name);
        return true;
    }
    const zqArraySlot first = uint8Row(row);
    const zqArraySlot second = check.second ? host::makeDoubleScalar(*check.second) : nullptr;
    const zqArray_tag* inputs[] = {first.get(), second.get()};
    zqArraySlot result;
    check.entry(1, &result, second ? 2 : 1, inputs);
    const bool passed = holds(result.get(), check.expected);
    std::printf("%-8s %s\n", check.name, passed ? "ok" : "WRONG ANSWER");
    return passed;
}

// bitand of uint8 and int8 is refused with the identifier of its group.
bool refusalArrives() {
    const zqArraySlot first = uint8Row(row);
    const zqArraySlot second = host::makeArray(zqInt8Class, {1, 1});
    const zqArray_tag* inputs[] = {first.get(), second.get()};
    zqArraySlot result;
    try {
        ondelBitAndFcn(1, &result, 2, inputs);
    } catch (const foundation::core::except::IMsgIDException& error) {
        const bool passed = error.GetID() == "VESPRA:Bitand:mixedClasses" &&
                            !host::catalogueSentence(error.GetID()).empty();
        std::printf("refusal  %s (%s)\n", passed ? "ok" : "WRONG", error.GetID().c_str());
        return passed;
    }
    std::printf("refusal  WRONG: no exception\n");
    return false;
}

}  // namespace

int main() {
    const Check checks[] = {
        {"bitand", ondelBitAndFcn, 10, {8, 10, 10}},
        {"bitor", ondelBitOrFcn, 3, {15, 11, 255}},
        {"bitxor", ondelBitXorFcn, 255, {243, 245, 0}},
        {"bitcmp", ondelBitCmpFcn, std::nullopt, {243, 245, 0}},
        {"bitget", ondelBitGetFcn, 3, {1, 0, 1}},
        {"bitset", ondelBitSetFcn, 1, {13, 11, 255}},
        {"bitshift", ondelBitShiftFcn, -2, {3, 2, 63}},
    };
    bool passed = true;
    for (const Check& check : checks) passed = run(check) && passed;
    passed = refusalArrives() && passed;

    const bool sameVersion = std::string(bitfcnsVersion()) == BITFCNS_VERSION_STRING;
    std::printf("version  %s (library %s, headers %s)\n", sameVersion ? "ok" : "MISMATCH",
                bitfcnsVersion(), BITFCNS_VERSION_STRING);
    return passed && sameVersion ? 0 : 1;
}
