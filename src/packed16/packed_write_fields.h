// The two ways the packed writers reduce an 8-bit colour to its field:
// truncation of the low bits, or the 4 x 4 ordered dither. Field layouts,
// their order and `redHigh` are those of packed_fields.h: with `redHigh`
// (the BGR names) red goes into the top field, otherwise into the low one;
// green always sits in the middle.
#pragma once

#include <cstdint>

#include "packed16/packed_dither_matrix.h"
#include "packed16/packed_fields.h"

namespace zel::pack {

enum class Packing { P444, P555, P565 };

using packed::Layout444;
using packed::Layout555;
using packed::Layout565;
using packed::Rgb;

// ---- ordered dither ----

// q is the level below the colour; the colour rises to q + 1 when its
// distance above that level, c * 256 - q * S in 8.8 units, exceeds the
// threshold. S is the width of one level: 4352 for 4 bits, 2105 for 5,
// 1036 for 6.
template <int Bits>
struct DitherLevel;
template <>
struct DitherLevel<4> {
  static constexpr int kMultiplier = 15, kSize = 4352;
};
template <>
struct DitherLevel<5> {
  static constexpr int kMultiplier = 31, kSize = 2105;
};
template <>
struct DitherLevel<6> {
  static constexpr int kMultiplier = 63, kSize = 1036;
};

// The threshold of pixel (x, y) of the region for a field of Bits: the
// 4-bit matrix for 444, the 5-bit matrix for 5-bit fields and its half for
// the 6-bit green of 565.
template <int Bits>
inline int ditherThreshold(int x, int y) {
  if constexpr (Bits == 4)
    return kDitherMatrix4[y & 3][x & 3];
  else if constexpr (Bits == 5)
    return kDitherMatrix5[y & 3][x & 3];
  else
    return kDitherMatrix5[y & 3][x & 3] >> 1;
}

template <int Bits>
inline int ditherToField(int c, int threshold) {
  using L = DitherLevel<Bits>;
  const int q = (c * L::kMultiplier) >> 8;
  return c * 256 - q * L::kSize > threshold ? q + 1 : q;
}

// ---- the two reductions as word writers ----

// Each takes the colours of a pixel at (x, y) of the region and returns its
// word in layout L (Layout444, Layout555, Layout565).
template <class L>
struct Truncating {
  static constexpr bool kDither = false;
  bool redHigh;
  uint16_t word(const Rgb& c, int, int) const { return packed::packRgb<L>(c.r, c.g, c.b, redHigh); }
};

template <class L>
struct Dithering {
  static constexpr bool kDither = true;
  bool redHigh;
  uint16_t word(const Rgb& c, int x, int y) const {
    const int low = redHigh ? c.b : c.r, top = redHigh ? c.r : c.b;
    return static_cast<uint16_t>(ditherToField<L::kLowBits>(low, ditherThreshold<L::kLowBits>(x, y)) |
                                 (ditherToField<L::kMidBits>(c.g, ditherThreshold<L::kMidBits>(x, y)) << L::kMidShift) |
                                 (ditherToField<L::kTopBits>(top, ditherThreshold<L::kTopBits>(x, y)) << L::kTopShift));
  }
};

}  // namespace zel::pack
