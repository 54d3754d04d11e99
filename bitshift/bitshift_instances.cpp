// The typed kernels of bitshift for one class of the value, the one that
// BITFCNS_FIRST_CLASS names: its dispatch and the ten kernels below it. The
// build compiles this file once per integer class.
#include "bitshift/kernels.hpp"

namespace bitfcns {

using FirstClassValue = TagOf<static_cast<zqClassID>(BITFCNS_FIRST_CLASS)>::type;

template void bitshiftClassDispatch<FirstClassValue>(FirstClassValue*, const FirstClassValue*,
                                                     const zqArray_tag*, unsigned long,
                                                     unsigned long, unsigned long, unsigned long);

}  // namespace bitfcns
