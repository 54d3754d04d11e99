// The host's math utility routines that the functions call: element-wise
// AND, OR and XOR under implicit expansion, and the integer complement loop;
// and the sizes from which the host's element loops go parallel.
// Function folders reach the host through frame/ only; this is their way to
// these routines.
#pragma once

#include "host/math_utils.hpp"
#include "host/parallel_limits.hpp"
