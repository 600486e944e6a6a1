// Definitions of exported functions: C linkage, default visibility (the
// prototypes in zelcc.h carry the attribute).
#pragma once

#include "zelcc/zelcc.h"

#define ZEL_PUBLIC extern "C"
