#pragma once

#include <cstdint>

#include "zelcc/zelcc.h"

namespace zel {

// Sets every byte of a width x height region to `value`. Large fills that do
// not fit in the largest cache bypass it with non-temporal stores.
Status fillBytes(uint8_t value, uint8_t* dst, int dstStep, int width, int height);

// Whether fillBytes takes the non-temporal route for this many bytes.
bool fillBytesNonTemporal(int64_t total);

}  // namespace zel
