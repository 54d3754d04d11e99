// The checks of arrays of positions, one instance for each numeric class of
// BIT, shared by the kernels of every class of A and by the double path.
#include "bitset/bit_checks.hpp"

#include "engine/parallel_driver.hpp"
#include "frame/class_types.hpp"
#include "frame/exception.hpp"
#include "frame/message_tags.hpp"
#include "frame/position_scan.hpp"

#include <tuple>

namespace bitfcns {

void raiseBitOutOfRange() { raiseError<VESPRA::bitSetGet::BITOutOfRange>(); }

template <class U>
void checkPositions(const U* positions, unsigned long n, int width, unsigned long limit) {
    if (!allPositionsValid(positions, n, width, {limit, &runInRanges})) raiseBitOutOfRange();
}

namespace {

// The addresses of checkPositions for every class of a list. Kept in the
// object file, they make the compiler emit each instance here, where the
// other translation units of the library find it.
template <class... Tags>
constexpr auto instancesOf(TypeList<Tags...>) {
    return std::tuple{&checkPositions<typename Tags::type>...};
}
[[gnu::used]] constexpr auto positionChecks = instancesOf(NumericClasses{});

}  // namespace
}  // namespace bitfcns
