// Row kernels of Photo YCC. `Channels` is the pixel's sample count, 3 or 4
// (the fourth is neither read for a result nor written). Each converts one
// row of `width` pixels with the member's body and tail.
#pragma once

#include <cstdint>

#include "frame/stream_stores.h"
#include "luma_chroma/vector_units.h"

namespace zel::lc {

// 8 bits: a body of 16-bit lanes below width AND NOT 7 (three channels) or
// width AND NOT 3 (four), then the 32-bit tail; `tier` at most
// widestTierWithBytePermutes().
template <int Channels>
void rgbToYcc8uRow(const uint8_t* src, uint8_t* dst, int width, VectorTier tier);
template <int Channels>
void yccToRgb8uRow(const uint8_t* src, uint8_t* dst, int width, VectorTier tier);

// 16 bits, unsigned or signed: a float body below width AND NOT 3, then the
// tail of the sample type. The body takes the widest blocks that `tier` (at
// most widestTier(): their 512-bit blocks need no byte permutes) allows:
// 16, 8, then 4 pixels.
template <int Channels, bool Signed>
void rgbToYcc16Row(const uint16_t* src, uint16_t* dst, int width, VectorTier tier);
template <int Channels, bool Signed>
void yccToRgb16Row(const uint16_t* src, uint16_t* dst, int width, VectorTier tier);

// 32-bit float: one formula for every pixel, in blocks of 16, 8 and 4 (`tier`
// at most widestTier()).
// Stores is PlainStores, or StreamStores for three channels (the caller
// fences after the last row).
template <int Channels, class Stores>
void rgbToYcc32fRow(const float* src, float* dst, int width, VectorTier tier);
template <int Channels, class Stores>
void yccToRgb32fRow(const float* src, float* dst, int width, VectorTier tier);

}  // namespace zel::lc
