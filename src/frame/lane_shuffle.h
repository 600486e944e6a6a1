// Interleaved pixels to and from lanes of one channel each. A group of
// pixels (8 in 16-bit lanes, 4 in 32-bit lanes) is read with loads that
// cover exactly its bytes, split by byte shuffles into one vector a channel,
// and merged back the same way. The shuffle masks are built at compile time
// from the layout: element size, channels a pixel, lane width.
#pragma once

#include <immintrin.h>

#include <cstdint>

#include "frame/simd.h"

namespace zel {

struct alignas(16) ByteMask {
  int8_t b[16];
};

// Gathers element `channel` of each pixel from the 16 bytes that start at
// byte `start` of the group into the low bytes of its lane; other bytes 0.
constexpr ByteMask gatherMask(int elemBytes, int channels, int channel, int start, int laneBytes) {
  ByteMask m{};
  for (int i = 0; i < 16; ++i) m.b[i] = -128;
  const int pixels = 16 / laneBytes;
  for (int k = 0; k < pixels; ++k)
    for (int j = 0; j < elemBytes; ++j) {
      const int from = (k * channels + channel) * elemBytes + j - start;
      if (from >= 0 && from < 16) m.b[k * laneBytes + j] = int8_t(from);
    }
  return m;
}

// The reverse: the low bytes of each lane go to element `channel` of its
// pixel within the 16 output bytes that start at byte `start` of the group.
constexpr ByteMask scatterMask(int elemBytes, int channels, int channel, int start, int laneBytes) {
  ByteMask m{};
  const int pixels = 16 / laneBytes;
  for (int i = 0; i < 16; ++i) {
    const int at = start + i;
    const int element = at / elemBytes;
    const int k = element / channels;
    m.b[i] = -128;
    if (element % channels == channel && k < pixels) m.b[i] = int8_t(k * laneBytes + at % elemBytes);
  }
  return m;
}

// All bytes of element `channel` within the 16 bytes at `start`: 0xFF.
constexpr ByteMask elementMask(int elemBytes, int channels, int channel, int start) {
  ByteMask m{};
  for (int i = 0; i < 16; ++i) m.b[i] = int8_t(((start + i) / elemBytes) % channels == channel ? -1 : 0);
  return m;
}

template <int E, int Ch, int C, int Start, int Lane>
inline constexpr ByteMask kGather = gatherMask(E, Ch, C, Start, Lane);
template <int E, int Ch, int C, int Start, int Lane>
inline constexpr ByteMask kScatter = scatterMask(E, Ch, C, Start, Lane);
template <int E, int Ch, int C, int Start>
inline constexpr ByteMask kElement = elementMask(E, Ch, C, Start);

inline __m128i maskOf(const ByteMask& m) { return _mm_load_si128(reinterpret_cast<const __m128i*>(m.b)); }

inline void store32(void* p, __m128i v) {
  const int32_t x = _mm_cvtsi128_si32(v);
  __builtin_memcpy(p, &x, 4);
}

// A group of pixels of `Ch` elements of `E` bytes, one lane of `Lane`
// bytes a pixel: 16 / Lane pixels, 16 / Lane * Ch * E bytes.
template <int E, int Ch, int Lane>
struct PixelGroup {
  static constexpr int kPixels = 16 / Lane;
  static constexpr int kBytes = kPixels * Ch * E;
  static constexpr int kChunks = (kBytes + 15) / 16;
  static_assert(kBytes % 16 == 0 || kBytes % 16 == 8 || kBytes % 16 == 12, "partial chunk of 8 or 12 bytes");

  // Reads exactly the group's bytes.
  static __m128i chunk(const uint8_t* p, int i) {
    const int left = kBytes - 16 * i;
    if (left >= 16) return load128(p + 16 * i);
    if (left == 8) return load64(p + 16 * i);
    return _mm_unpacklo_epi64(load64(p + 16 * i), load32(p + 16 * i + 8));
  }
  template <bool Stream>
  static void put(uint8_t* p, int i, __m128i v) {
    const int left = kBytes - 16 * i;
    if (left >= 16) {
      if constexpr (Stream) storeStream128(p + 16 * i, v);
      else store128(p + 16 * i, v);
    } else if (left == 8) {
      store64(p + 16 * i, v);
    } else {
      store64(p + 16 * i, v);
      store32(p + 16 * i + 8, _mm_srli_si128(v, 8));
    }
  }

  template <int C, int I>
  static __m128i gatherFrom(const __m128i* raw) {
    if constexpr (I == kChunks) {
      return _mm_setzero_si128();
    } else {
      return _mm_or_si128(_mm_shuffle_epi8(raw[I], maskOf(kGather<E, Ch, C, 16 * I, Lane>)), gatherFrom<C, I + 1>(raw));
    }
  }
  template <int C, int N>
  static void gatherAll(const __m128i* raw, __m128i* lanes) {
    if constexpr (C < N) {
      lanes[C] = gatherFrom<C, 0>(raw);
      gatherAll<C + 1, N>(raw, lanes);
    }
  }
  // Element c of every pixel into lanes[c] (zero-extended), c below N.
  template <int N = Ch>
  static void load(const void* src, __m128i* lanes) {
    const uint8_t* p = static_cast<const uint8_t*>(src);
    __m128i raw[kChunks];
    for (int i = 0; i < kChunks; ++i) raw[i] = chunk(p, i);
    gatherAll<0, N>(raw, lanes);
  }

  template <int I, int C, int N>
  static __m128i mergeInto(const __m128i* lanes) {
    if constexpr (C == N) {
      return _mm_setzero_si128();
    } else {
      const __m128i part = _mm_shuffle_epi8(lanes[C], maskOf(kScatter<E, Ch, C, 16 * I, Lane>));
      return _mm_or_si128(part, mergeInto<I, C + 1, N>(lanes));
    }
  }
  template <int I, int N, bool Stream>
  static void storeChunks(uint8_t* p, const __m128i* lanes) {
    if constexpr (I < kChunks) {
      __m128i v = mergeInto<I, 0, N>(lanes);
      if constexpr (N < Ch) {
        // Elements beyond the first N keep what the destination holds.
        const __m128i keep = _mm_andnot_si128(colourBytes<I, 0, N>(), chunk(p, I));
        v = _mm_or_si128(v, keep);
      }
      put<Stream>(p, I, v);
      storeChunks<I + 1, N, Stream>(p, lanes);
    }
  }
  template <int I, int C, int N>
  static __m128i colourBytes() {
    if constexpr (C == N) return _mm_setzero_si128();
    else return _mm_or_si128(maskOf(kElement<E, Ch, C, 16 * I>), colourBytes<I, C + 1, N>());
  }
  // Writes the low E bytes of lanes[0..N) as elements 0..N-1 of each
  // pixel. With N < Ch the other elements are read and written back
  // unchanged; with N == Ch every byte of the group is written.
  template <int N, bool Stream = false>
  static void store(void* dst, const __m128i* lanes) {
    storeChunks<0, N, Stream>(static_cast<uint8_t*>(dst), lanes);
  }
};

}  // namespace zel
