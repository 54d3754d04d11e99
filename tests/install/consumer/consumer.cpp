// A caller of an installed bitfcns, built against the installed tree only:
// it calls each entry point once on a uint8 row and checks the answer, checks
// that a refusal reaches it as the host's exception with its identifier, and
// that the loaded library is the version of the headers.
#include "bitfcns/entry_points.hpp"
#include "bitfcns/version.hpp"
#include "host/array_factory.hpp"
#include "host/exceptions.hpp"
#include "host/message_catalogue.hpp"

#include <cmath>
#include <cstdio>
#include <cstring>
#include <span>
#include <string>
#include <vector>

namespace {

using EntryPoint = void (*)(int, zqArraySlot*, int, const zqArray_tag**);
using Bytes = std::vector<unsigned char>;

// Calls `entry` on the row [12 10 255] and, unless NaN, a double scalar: the
// identifier of a refusal, or "ok" when the result holds `expected`.
std::string call(EntryPoint entry, double second, const Bytes& expected) {
    const Bytes row{12, 10, 255};
    const zqArraySlot first =
        host::makeArray(zqUInt8Class, {1, 3}, std::span<const unsigned char>(row));
    const zqArraySlot scalar = host::makeDoubleScalar(second);
    const zqArray_tag* inputs[] = {first.get(), scalar.get()};
    zqArraySlot result;
    try {
        entry(1, &result, std::isnan(second) ? 1 : 2, inputs);
    } catch (const foundation::core::except::IMsgIDException& error) {
        return host::catalogueSentence(error.GetID()).empty() ? "no sentence" : error.GetID();
    }
    const bool right = result && host::classOf(*result) == zqUInt8Class &&
                       host::elementCount(*result) == expected.size() &&
                       std::memcmp(result->data, expected.data(), expected.size()) == 0;
    return right ? "ok" : "WRONG ANSWER";
}

}  // namespace

int main() {
    const struct {
        const char* name;
        EntryPoint entry;
        double second;
        Bytes expected;
        const char* outcome;
    } checks[] = {
        {"bitand", ondelBitAndFcn, 10, {8, 10, 10}, "ok"},
        {"bitor", ondelBitOrFcn, 3, {15, 11, 255}, "ok"},
        {"bitxor", ondelBitXorFcn, 255, {243, 245, 0}, "ok"},
        {"bitcmp", ondelBitCmpFcn, NAN, {243, 245, 0}, "ok"},
        {"bitget", ondelBitGetFcn, 3, {1, 0, 1}, "ok"},
        {"bitset", ondelBitSetFcn, 1, {13, 11, 255}, "ok"},
        {"bitshift", ondelBitShiftFcn, -2, {3, 2, 63}, "ok"},
        {"refusal", ondelBitAndFcn, 256, {}, "VESPRA:Bitand:outOfRangeMixedType"},
    };
    bool passed = true;
    for (const auto& check : checks) {
        const std::string outcome = call(check.entry, check.second, check.expected);
        std::printf("%-8s %s\n", check.name, outcome.c_str());
        passed = passed && outcome == check.outcome;
    }
    const bool sameVersion = std::string(bitfcnsVersion()) == BITFCNS_VERSION_STRING;
    std::printf("version  %s (library %s, headers %s)\n", sameVersion ? "ok" : "MISMATCH",
                bitfcnsVersion(), BITFCNS_VERSION_STRING);
    return passed && sameVersion ? 0 : 1;
}
