// Scalar forms of the filtered and field-aware chroma resampling: the
// vertical taps, the 2x2 midpoint growth of quarter-size chroma, and the
// horizontally interpolated 4:2:0 to BGR transform with its own Q12 set.
#pragma once

#include <cstdint>

#include "frame/scalar_ops.h"

namespace zel::chroma {

// Interlaced 4:2:2 to 4:2:0: each output row stays within its field.
inline uint8_t fieldTapFirst(int r0, int r2) { return uint8_t((3 * r0 + r2 + 2) >> 2); }
inline uint8_t fieldTapSecond(int r1, int r3) { return uint8_t((r1 + 3 * r3 + 2) >> 2); }

// Interlaced 4:2:0 to 4:2:2: eighth-weight taps of one field.
inline uint8_t eighthTap(int weightA, int a, int weightB, int b) {
  return uint8_t((weightA * a + weightB * b + 4) >> 3);
}

// Vertical half-sample filter, taps -1 9 9 -1.
inline uint8_t halfSampleTap(int above, int a, int b, int below) {
  return SaturateU8((9 * (a + b) - above - below + 8) >> 4);
}

// 4:2:0 to BGR with horizontal chroma interpolation, Q12 weights.
constexpr int kLuma12 = 4769, kCrToR12 = 6537, kCrToG12 = 3330, kCbToG12 = 1605, kCbToB12 = 8263;

// The exact wide form of the last pairs of a row.
inline void bgrWide(int y, int cr8, int cb8, uint8_t* bgr) {
  const int d = y * kLuma12 - 76304;
  bgr[2] = SaturateU8((d + (cr8 - 128) * kCrToR12) >> 12);
  bgr[1] = SaturateU8((d - (cr8 - 128) * kCrToG12 - (cb8 - 128) * kCbToG12) >> 12);
  bgr[0] = SaturateU8((d + (cb8 - 128) * kCbToB12) >> 12);
}

// The 16-bit lane form of the body.
inline void bgrLanes(int y8, int cr8, int cb8, uint8_t* bgr) {
  const int16_t y = MulHighS16(int16_t((y8 - 16) * 128), kLuma12);
  const int16_t cr = int16_t((cr8 - 128) * 128), cb = int16_t((cb8 - 128) * 128);
  bgr[2] = SaturateU8(int16_t(y + MulHighS16(cr, kCrToR12)) >> 3);
  bgr[1] = SaturateU8(int16_t(y - MulHighS16(cb, kCbToG12) - MulHighS16(cr, kCrToG12)) >> 3);
  bgr[0] = SaturateU8(int16_t(y + MulHighS16(cb, kCbToB12)) >> 3);
}

}  // namespace zel::chroma
