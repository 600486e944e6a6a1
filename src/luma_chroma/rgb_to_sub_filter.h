// The filtered CbYCr stream: chroma at each even pixel from a three-tap
// filter over its neighbours, in exact 32-bit arithmetic, optionally after
// a gamma table on every source sample.
#pragma once

#include <cstdint>

#include "frame/scalar_ops.h"
#include "luma_chroma/rgb_to_sub_forms.h"

namespace zel::lc::sub {

// 255 f(i / 255) rounded to nearest, ties to even, with f(x) = 4.5 x below
// 0.018 and 1.099 x^0.45 - 0.099 from there.
const uint8_t* gammaTable();

// Y = (8422 R + 16515 G + 3212 B + 540672) >> 15.
inline uint8_t filteredLuma(const Rgb& p) { return SaturateU8((8422 * p.r + 16515 * p.g + 3212 * p.b + 540672) >> 15); }

// The centre tap of Cb and Cr, and the half-weight taps of the neighbours.
inline int cbCentre(const Rgb& p) { return 7193 * p.b - 2426 * p.r - 4769 * p.g; }
inline int cbSide(const Rgb& p) { return 3596 * p.b - 1213 * p.r - 2385 * p.g; }
inline int crCentre(const Rgb& p) { return 7193 * p.r - 6030 * p.g - 1164 * p.b; }
inline int crSide(const Rgb& p) { return 3596 * p.r - 3015 * p.g - 582 * p.b; }

// (128 << 15) + 16383.
inline constexpr int kFilterAddend = 4210687;

// One pair at even pixel x: `prev` is pixel x - 1, or null at the row's start
// (its term is then zero). Writes Cb, Y0, Cr, Y1.
inline void filteredPair(const Rgb* prev, const Rgb& p0, const Rgb& p1, uint8_t* out) {
  const int cb = cbCentre(p0) + (prev ? cbSide(*prev) : 0) + cbSide(p1) + kFilterAddend;
  const int cr = crCentre(p0) + (prev ? crSide(*prev) : 0) + crSide(p1) + kFilterAddend;
  out[0] = SaturateU8(cb >> 15);
  out[1] = filteredLuma(p0);
  out[2] = SaturateU8(cr >> 15);
  out[3] = filteredLuma(p1);
}

// One row of interleaved RGB to a CbYCr stream; `table` is null or the
// gamma table. `vector` false keeps to scalar code (the same bytes).
void filteredRow(const uint8_t* src, uint8_t* dst, int width, const uint8_t* table, bool vector);

}  // namespace zel::lc::sub
