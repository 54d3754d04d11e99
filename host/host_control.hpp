// Switches of the stand-in host that tests and tools turn: whether the legacy
// error call raises or comes back, and allocation failures on demand.
#pragma once

#include <cstddef>
#include <string>

namespace host {

// When true (the default), matrix::detail::do_legacy_zq_error raises a copy
// of the error it is given; when false it records the error's identifier and
// comes back.
void setLegacyErrorRaises(bool raises);
bool legacyErrorRaises();
// The identifier of the last error that do_legacy_zq_error came back from,
// and how many it has seen since the last reset.
std::string lastLegacyErrorId();
std::size_t legacyErrorCount();
void resetLegacyErrors();

// Lets the next `after` allocations of array storage or records succeed and
// makes the `count` after them fail: creation returns null, and host
// operations that raise raise the allocation failure. A count of 0 clears
// any failure still pending.
void failNextAllocations(std::size_t count = 1, std::size_t after = 0);

// Makes every request for more than `bytes` of element storage fail as an
// allocation failure does (0: no limit), so that a fuzzed program can't take
// the machine's memory.
void limitStorageBytes(std::size_t bytes);

}  // namespace host
