// The kernels of one integer class of A, BITFCNS_FIRST_CLASS (8 to 15): this
// file is compiled once per class, so that the 8 x 10 x 11 combinations
// spread over eight translation units.
#include "bitset/bitset_case_kernels.hpp"

#ifndef BITFCNS_FIRST_CLASS
#error "BITFCNS_FIRST_CLASS names the integer class of A that this unit instantiates"
#endif

namespace bitfcns {

using InstantiatedClass = TagOf<static_cast<zqClassID>(BITFCNS_FIRST_CLASS), IntegerClasses>::type;

template void bitsetClassDispatch<InstantiatedClass>(InstantiatedClass*, const InstantiatedClass*,
                                                     const zqArray_tag*, const zqArray_tag*,
                                                     unsigned long, unsigned long, unsigned long,
                                                     unsigned long, unsigned long);

}  // namespace bitfcns
