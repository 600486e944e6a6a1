// Interleaving of three channel vectors into R G B pixels: 16 pixels of 8
// bits (48 bytes) or 8 pixels of 16 bits (24 words) per call.
#pragma once

#include <cstdint>

#include "frame/simd.h"

namespace zel {

// Byte shuffles [store][channel][byte]: which byte of a channel vector goes
// to each byte of the three output vectors (-128 clears it).
struct RgbShuffles {
  int8_t m[3][3][16];
};

constexpr RgbShuffles makeRgbShuffles(int sampleBytes) {
  RgbShuffles s{};
  for (int j = 0; j < 3; ++j)
    for (int c = 0; c < 3; ++c)
      for (int b = 0; b < 16; ++b) s.m[j][c][b] = -128;
  for (int j = 0; j < 3; ++j)
    for (int b = 0; b < 16; ++b) {
      const int element = (16 * j + b) / sampleBytes;
      const int pixel = element / 3, channel = element % 3;
      s.m[j][channel][b] = int8_t(pixel * sampleBytes + b % sampleBytes);
    }
  return s;
}

alignas(16) inline constexpr RgbShuffles kRgbShuffles8 = makeRgbShuffles(1);
alignas(16) inline constexpr RgbShuffles kRgbShuffles16 = makeRgbShuffles(2);

// Stores the 48 bytes of 16 / sizeof(T) pixels at `dst`.
template <typename T>
inline void storeRgb(T* dst, __m128i r, __m128i g, __m128i b) {
  const RgbShuffles& s = sizeof(T) == 1 ? kRgbShuffles8 : kRgbShuffles16;
  uint8_t* out = reinterpret_cast<uint8_t*>(dst);
  for (int j = 0; j < 3; ++j) {
    const __m128i v =
        _mm_or_si128(_mm_or_si128(_mm_shuffle_epi8(r, load128(s.m[j][0])), _mm_shuffle_epi8(g, load128(s.m[j][1]))),
                     _mm_shuffle_epi8(b, load128(s.m[j][2])));
    store128(out + 16 * j, v);
  }
}

}  // namespace zel
