// Rows of HLS members: the pixel sides (interleaved or planar, with or
// without a fourth channel) and the member descriptions that the row
// kernels are built from. A side reads or writes groups of 4 pixels as
// 32-bit lanes, one vector a channel, and single samples for the tail.
#pragma once

#include <immintrin.h>

#include <cstdint>
#include <cstring>
#include <type_traits>

#include "frame/image_layout.h"
#include "frame/lane_shuffle.h"
#include "frame/simd.h"
#include "spaces/float_lanes.h"
#include "spaces/hls_formulas.h"

namespace zel::hls {

template <typename T>
inline uint32_t bitsOf(T v) {
  if constexpr (std::is_same_v<T, float>) {
    uint32_t b;
    std::memcpy(&b, &v, 4);
    return b;
  } else {
    return std::make_unsigned_t<T>(v);
  }
}
template <typename T>
inline T fromBits(uint32_t b) {
  if constexpr (std::is_same_v<T, float>) {
    float v;
    std::memcpy(&v, &b, 4);
    return v;
  } else {
    return T(std::make_unsigned_t<T>(b));
  }
}

// Interleaved pixels of Ch elements. Body stores write the first N
// elements of each pixel; with N < Ch the rest is read and written back.
template <typename T, int Ch>
struct Packed {
  using Sample = T;
  static constexpr int kChannels = Ch;
  using Group = PixelGroup<int(sizeof(T)), Ch, 4>;
  uint8_t* base;
  int step;
  Packed rowAt(int y) const { return {zel::rowAt(base, step, y), step}; }
  T* pixel(int x) const { return reinterpret_cast<T*>(base) + x * Ch; }
  // The source lines of `Pixels` pixels from x, some way ahead.
  template <int Pixels>
  void readAhead(int x) const {
    lanes::readAhead<Pixels * Ch * int(sizeof(T))>(pixel(x));
  }
  template <int N>
  void load(int x, __m128i* lanes) const {
    Group::template load<N>(pixel(x), lanes);
  }
  template <int N>
  void store(int x, const __m128i* lanes) const {
    Group::template store<N>(pixel(x), lanes);
  }
  uint32_t at(int x, int c) const {
    T v;
    std::memcpy(&v, pixel(x) + c, sizeof(T));
    return bitsOf(v);
  }
  void put(int x, int c, uint32_t bits) const {
    const T v = fromBits<T>(bits);
    std::memcpy(pixel(x) + c, &v, sizeof(T));
  }
};

// Four-element pixels whose fourth element is never written, not even
// with its own value: the three channels go out sample by sample.
template <typename T>
struct PackedSkipAlpha : Packed<T, 4> {
  PackedSkipAlpha rowAt(int y) const { return {{zel::rowAt(this->base, this->step, y), this->step}}; }
  template <int N>
  void store(int x, const __m128i* lanes) const {
    alignas(16) uint32_t v[3][4];
    for (int c = 0; c < 3; ++c) _mm_store_si128(reinterpret_cast<__m128i*>(v[c]), lanes[c]);
    for (int k = 0; k < 4; ++k)
      for (int c = 0; c < 3; ++c) this->put(x + k, c, v[c][k]);
  }
};

// Planes with one step between rows.
template <typename T, int Planes>
struct Planar {
  using Sample = T;
  static constexpr int kChannels = 0;
  static constexpr int kPlanes = Planes;
  uint8_t* base[Planes];
  int step;
  Planar rowAt(int y) const {
    Planar r = *this;
    for (int p = 0; p < Planes; ++p) r.base[p] = zel::rowAt(base[p], step, y);
    return r;
  }
  T* sample(int p, int x) const { return reinterpret_cast<T*>(base[p]) + x; }
  template <int Pixels>
  void readAhead(int x) const {
    for (int p = 0; p < Planes; ++p) lanes::readAhead<Pixels * int(sizeof(T))>(sample(p, x));
  }
  template <int N>
  void load(int x, __m128i* lanes) const {
    for (int p = 0; p < N; ++p) {
      if constexpr (sizeof(T) == 1) lanes[p] = _mm_cvtepu8_epi32(load32(sample(p, x)));
      else if constexpr (sizeof(T) == 2) lanes[p] = _mm_cvtepu16_epi32(load64(sample(p, x)));
      else lanes[p] = load128(sample(p, x));
    }
  }
  template <int N>
  void store(int x, const __m128i* lanes) const {
    for (int p = 0; p < N; ++p) {
      if constexpr (sizeof(T) == 1)
        store32(sample(p, x), _mm_shuffle_epi8(lanes[p], _mm_setr_epi8(0, 4, 8, 12, -128, -128, -128, -128, -128, -128,
                                                                       -128, -128, -128, -128, -128, -128)));
      else if constexpr (sizeof(T) == 2)
        store64(sample(p, x), _mm_shuffle_epi8(lanes[p], _mm_setr_epi8(0, 1, 4, 5, 8, 9, 12, 13, -128, -128, -128,
                                                                       -128, -128, -128, -128, -128)));
      else store128(sample(p, x), lanes[p]);
    }
  }
  uint32_t at(int x, int c) const {
    T v;
    std::memcpy(&v, sample(c, x), sizeof(T));
    return bitsOf(v);
  }
  void put(int x, int c, uint32_t bits) const {
    const T v = fromBits<T>(bits);
    std::memcpy(sample(c, x), &v, sizeof(T));
  }
};

// A member: its recipes, its two sides, where red sits among the three
// colour elements (0 for RGB, 2 for BGR) and whether a fourth channel is
// copied from source to destination.
template <class Body, class Tail, int Block, class InSide, class OutSide, int RedAt, bool CopyAlpha>
struct Member {
  using BodyRecipe = Body;
  using TailRecipe = Tail;
  using In = InSide;
  using Out = OutSide;
  static constexpr int kBlock = Block;
  static constexpr int kRedAt = RedAt;
  static constexpr int kChannels = CopyAlpha ? 4 : 3;
  static constexpr bool kCopyAlpha = CopyAlpha;
  // Signed samples are biased by 32768 around the arithmetic: a flip of
  // the top bit of the 16-bit pattern.
  static constexpr bool kBiased = std::is_same_v<typename In::Sample, int16_t>;
  static constexpr bool kFloat = std::is_same_v<typename In::Sample, float>;
};

}  // namespace zel::hls
