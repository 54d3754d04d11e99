// The version query of the library.
#include "bitfcns/version.hpp"

const char* bitfcnsVersion() noexcept { return BITFCNS_VERSION_STRING; }
