// Field layouts of the 16-bit packed words the writers produce, and the two
// ways an 8-bit colour is reduced to its field: truncation of the low bits,
// or the 4 x 4 ordered dither.
//
// A layout's name lists its channels from the least significant field up:
// BGR565 has blue in bits 0-4, RGB565 red. One writer serves both names: with
// `redHigh` (the BGR names) red goes into the top field and blue into the
// low one, otherwise the other way round. Green always sits in the middle.
// Unused top bits (bit 15 of 555, bits 12-15 of 444) are written zero.
#pragma once

#include <cstdint>

#include "packed16/packed_dither_matrix.h"

namespace zel::p16 {

enum class Packing { P444, P555, P565 };

// Field widths and positions: low field at bit 0, green at kGreenShift, the
// top field at kHighShift.
template <Packing P>
struct Fields;
template <>
struct Fields<Packing::P565> {
  static constexpr int kLowBits = 5, kGreenBits = 6, kHighBits = 5, kGreenShift = 5, kHighShift = 11;
};
template <>
struct Fields<Packing::P555> {
  static constexpr int kLowBits = 5, kGreenBits = 5, kHighBits = 5, kGreenShift = 5, kHighShift = 10;
};
template <>
struct Fields<Packing::P444> {
  static constexpr int kLowBits = 4, kGreenBits = 4, kHighBits = 4, kGreenShift = 4, kHighShift = 8;
};

// Three 8-bit colours of one pixel.
struct Rgb {
  int r, g, b;
};

template <Packing P>
inline uint16_t assembleWord(int low, int green, int high) {
  using F = Fields<P>;
  return static_cast<uint16_t>(low | (green << F::kGreenShift) | (high << F::kHighShift));
}

// Truncation: the low 8 - bits bits of the colour are dropped.
template <int Bits>
inline int truncateToField(int c) {
  return c >> (8 - Bits);
}

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
// word; `lanes<U>(y)` gives the same for a vector block of row y.
template <Packing P>
struct Truncating {
  static constexpr bool kDither = false;
  bool redHigh;
  uint16_t word(const Rgb& c, int, int) const {
    using F = Fields<P>;
    const int low = redHigh ? c.b : c.r, high = redHigh ? c.r : c.b;
    return assembleWord<P>(truncateToField<F::kLowBits>(low), truncateToField<F::kGreenBits>(c.g),
                           truncateToField<F::kHighBits>(high));
  }
};

template <Packing P>
struct Dithering {
  static constexpr bool kDither = true;
  bool redHigh;
  uint16_t word(const Rgb& c, int x, int y) const {
    using F = Fields<P>;
    const int low = redHigh ? c.b : c.r, high = redHigh ? c.r : c.b;
    return assembleWord<P>(ditherToField<F::kLowBits>(low, ditherThreshold<F::kLowBits>(x, y)),
                           ditherToField<F::kGreenBits>(c.g, ditherThreshold<F::kGreenBits>(x, y)),
                           ditherToField<F::kHighBits>(high, ditherThreshold<F::kHighBits>(x, y)));
  }
};

}  // namespace zel::p16
