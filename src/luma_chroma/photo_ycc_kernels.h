// Row kernels of Photo YCC. `Channels` is the pixel's sample count, 3 or 4
// (the fourth is neither read for a result nor written). Each converts one
// row of `width` pixels with the member's body and tail.
#pragma once

#include <cstdint>

namespace zel::lc {

// 8 bits: a body of 16-bit lanes below width AND NOT 7 (three channels) or
// width AND NOT 3 (four), then the 32-bit tail.
template <int Channels>
void rgbToYcc8uRow(const uint8_t* src, uint8_t* dst, int width, bool avx2);
template <int Channels>
void yccToRgb8uRow(const uint8_t* src, uint8_t* dst, int width, bool avx2);

// 16 bits, unsigned or signed: a float body below width AND NOT 3, then the
// tail of the sample type. `avx2` runs the body eight pixels at a time.
template <int Channels, bool Signed>
void rgbToYcc16Row(const uint16_t* src, uint16_t* dst, int width, bool avx2);
template <int Channels, bool Signed>
void yccToRgb16Row(const uint16_t* src, uint16_t* dst, int width, bool avx2);

// 32-bit float: one formula for every pixel.
template <int Channels>
void rgbToYcc32fRow(const float* src, float* dst, int width, bool avx2);
template <int Channels>
void yccToRgb32fRow(const float* src, float* dst, int width, bool avx2);

}  // namespace zel::lc
