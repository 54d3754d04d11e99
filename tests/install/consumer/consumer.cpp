// A caller of an installed bitfcns, built against the installed tree only:
// each entry point once on the uint8 row [12 10 255] and a double scalar, a
// refusal that arrives as the host's exception with its identifier and
// sentence, and a library of the headers' version.
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

int main() {
    using Bytes = std::vector<unsigned char>;
    const struct {
        void (*entry)(int, zqArraySlot*, int, const zqArray_tag**);
        double second;   // NaN: no second input
        Bytes expected;  // empty: the refusal below
    } checks[] = {
        {ondelBitAndFcn, 10, {8, 10, 10}},    {ondelBitOrFcn, 3, {15, 11, 255}},
        {ondelBitXorFcn, 255, {243, 245, 0}}, {ondelBitCmpFcn, NAN, {243, 245, 0}},
        {ondelBitGetFcn, 3, {1, 0, 1}},       {ondelBitSetFcn, 1, {13, 11, 255}},
        {ondelBitShiftFcn, -2, {3, 2, 63}},   {ondelBitAndFcn, 256, {}},
    };
    bool passed = true;
    for (const auto& check : checks) {
        const Bytes row{12, 10, 255};
        const zqArraySlot first = host::makeArray(zqUInt8Class, {1, 3}, std::span(row));
        const zqArraySlot scalar = host::makeDoubleScalar(check.second);
        const zqArray_tag* inputs[] = {first.get(), scalar.get()};
        zqArraySlot result;
        std::string outcome = "ok";
        try {
            check.entry(1, &result, std::isnan(check.second) ? 1 : 2, inputs);
            if (!result || host::classOf(*result) != zqUInt8Class ||
                host::elementCount(*result) != check.expected.size() ||
                std::memcmp(result->data, check.expected.data(), check.expected.size()) != 0)
                outcome = "WRONG ANSWER";
        } catch (const foundation::core::except::IMsgIDException& error) {
            outcome =
                host::catalogueSentence(error.GetID()).empty() ? "no sentence" : error.GetID();
        }
        const char* wanted = check.expected.empty() ? "VESPRA:Bitand:outOfRangeMixedType" : "ok";
        std::printf("%s\n", outcome.c_str());
        passed = passed && outcome == wanted;
    }
    const bool sameVersion = std::string(bitfcnsVersion()) == BITFCNS_VERSION_STRING;
    std::printf("version %s (library %s, headers %s)\n", sameVersion ? "ok" : "MISMATCH",
                bitfcnsVersion(), BITFCNS_VERSION_STRING);
    return passed && sameVersion ? 0 : 1;
}
