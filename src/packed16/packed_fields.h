// The 16-bit packed pixel: one little-endian word holding three colour
// fields. A layout's name lists its channels from the least significant
// field up (FieldOrderRule): BGR565 has blue in bits 0-4, green in 5-10 and
// red in 11-15; RGB565 has red low and blue high. Bits above the top field
// (bit 15 of 555, bits 12-15 of 444) are ignored on input and written 0.
//
// One row driver serves a BGR-named and an RGB-named member: `redHigh` is
// set for BGR names and puts red in the top field.
//
// Expansion to 8 bits is a plain left shift (no replication of high bits:
// white 0xFFFF of 565 expands to 248, 252, 248); reduction from 8 bits is
// truncation of the low bits.
#pragma once

#include <cstddef>
#include <cstdint>

namespace zel::packed {

// Field widths of a layout, least significant field first.
template <int LowBits, int MidBits, int TopBits>
struct FieldLayout {
  static constexpr int kLowBits = LowBits, kMidBits = MidBits, kTopBits = TopBits;
  static constexpr int kLowShift = 0, kMidShift = LowBits, kTopShift = LowBits + MidBits;
  static constexpr int kLowMask = (1 << LowBits) - 1, kMidMask = (1 << MidBits) - 1, kTopMask = (1 << TopBits) - 1;

  // Raw fields of a word.
  static int low(uint16_t w) { return w & kLowMask; }
  static int mid(uint16_t w) { return (w >> kMidShift) & kMidMask; }
  static int top(uint16_t w) { return (w >> kTopShift) & kTopMask; }

  // Fields expanded to 8 bits, low bits zero.
  static int lowExpanded(uint16_t w) { return low(w) << (8 - LowBits); }
  static int midExpanded(uint16_t w) { return mid(w) << (8 - MidBits); }
  static int topExpanded(uint16_t w) { return top(w) << (8 - TopBits); }

  // Three 8-bit values truncated to their fields and assembled; the bits
  // above the top field stay 0.
  static uint16_t pack(int low8, int mid8, int top8) {
    return static_cast<uint16_t>((low8 >> (8 - LowBits)) | ((mid8 >> (8 - MidBits)) << kMidShift) |
                                 ((top8 >> (8 - TopBits)) << kTopShift));
  }
};

using Layout565 = FieldLayout<5, 6, 5>;
using Layout555 = FieldLayout<5, 5, 5>;
using Layout444 = FieldLayout<4, 4, 4>;

// Colour channels of one pixel, 8-bit expansions or values to reduce.
struct Rgb {
  int r, g, b;
};

// The channels of a word of layout L: with `redHigh` red is the top field
// (BGR names), otherwise the low one (RGB names).
template <class L>
inline Rgb unpackRgb(uint16_t w, bool redHigh) {
  const int lo = L::lowExpanded(w), hi = L::topExpanded(w);
  return redHigh ? Rgb{hi, L::midExpanded(w), lo} : Rgb{lo, L::midExpanded(w), hi};
}

template <class L>
inline uint16_t packRgb(int r, int g, int b, bool redHigh) {
  return redHigh ? L::pack(b, g, r) : L::pack(r, g, b);
}

// Rows of a packed image: its step is used as a whole number of words
// (step >> 1), so an odd step loses its low bit.
template <typename T>
inline T* wordRowAt(T* base, int step, int y) {
  return base + std::ptrdiff_t(step >> 1) * y;
}

}  // namespace zel::packed
