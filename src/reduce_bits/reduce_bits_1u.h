// Bit-depth reduction of 8-bit samples to packed bits.
#pragma once

#include <cstdint>

#include "zelcc/zelcc.h"

namespace zel::reduce {

// Threshold kind, whole bytes: count bytes of 8 pixels each, bit 7 the
// first pixel, set where the sample is above `threshold`. Returns count.
int thresholdBytes(const uint8_t* src, uint8_t* out, int count, uint8_t threshold);

Status reduceBitsTo1u(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, int dstBitOffset, ImageSize size,
                      int ditherKind, uint8_t threshold);

}  // namespace zel::reduce
