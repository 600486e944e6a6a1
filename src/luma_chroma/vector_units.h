// The vector operations of the luma-chroma kernels, written once for three
// widths. A kernel is a template over one of these:
//   Sse     one 128-bit register, one unit of 16 pixels;
//   Avx     one 256-bit register, two units (lane 0 pixels 0..15, lane 1
//           pixels 16..31), chosen at run time;
//   Avx512  one 512-bit register, four units (lane k pixels 16k..16k+15),
//           chosen at run time when the processor also has the byte
//           permutes, which split and merge three-byte pixels.
// Every operation works within a 128-bit lane, so the same kernel code
// computes the same bits at every width. Avx and Avx512 kernels are
// instantiated only inside a ZEL_AVX2 or ZEL_AVX512_VBMI function marked
// `flatten`, which pulls every operation into the code of that tier.
#pragma once

#include <immintrin.h>

#include <cstdint>

#include "frame/lane_units.h"
#include "frame/simd.h"

// Avx values pass between helpers that the flattened AVX2 kernels inline;
// no 256-bit value crosses a real call, so the ABI note does not apply.
#pragma GCC diagnostic ignored "-Wpsabi"

namespace zel::lc {

// The scalar meaning of a 16-bit lane sum without saturation: it wraps.
// With the luma-chroma constants no sum comes near the limit.
inline int16_t wrapAdd16(int a, int b) { return static_cast<int16_t>(a + b); }

// A 16-byte shuffle pattern (-1 clears the byte).
struct Shuffle16 {
  int8_t b[16];
};

struct Sse {
  using V = __m128i;
  static constexpr int kUnits = 1;
  static constexpr int kPixels = 16;

  // 16 bytes of each unit; units lie `unitStride` bytes apart.
  static V loadUnits(const void* p, int) { return load128(p); }
  static void storeUnits(void* p, int, V v) { store128(p, v); }
  static V shuffleOf(const Shuffle16& s) { return load128(s.b); }

  ZEL_UNIT_LANE_OPS(, _mm, 128)
  // Bytes of b where the mask byte's top bit is set, else of a.
  static V blend8(V a, V b, V m) { return _mm_blendv_epi8(a, b, m); }
};

struct Avx {
  using V = __m256i;
  static constexpr int kUnits = 2;
  static constexpr int kPixels = 32;

  ZEL_AVX2 static V loadUnits(const void* p, int unitStride) {
    const auto* b = static_cast<const uint8_t*>(p);
    return _mm256_inserti128_si256(_mm256_castsi128_si256(load128(b)), load128(b + unitStride), 1);
  }
  ZEL_AVX2 static void storeUnits(void* p, int unitStride, V v) {
    auto* b = static_cast<uint8_t*>(p);
    store128(b, _mm256_castsi256_si128(v));
    store128(b + unitStride, _mm256_extracti128_si256(v, 1));
  }
  ZEL_AVX2 static V shuffleOf(const Shuffle16& s) { return _mm256_broadcastsi128_si256(load128(s.b)); }

  ZEL_UNIT_LANE_OPS(ZEL_AVX2, _mm256, 256)
  ZEL_AVX2 static V blend8(V a, V b, V m) { return _mm256_blendv_epi8(a, b, m); }
};

ZEL_TIER512_BEGIN

// Moves of the 512-bit tier across lanes.
// Qword (dword) k of the result is qword (dword) index[k] of v.
ZEL_AVX512_VBMI inline __m512i qwordsAt(__m512i v, __m512i index) { return _mm512_permutexvar_epi64(index, v); }
ZEL_AVX512_VBMI inline __m512i dwordsAt(__m512i v, __m512i index) { return _mm512_permutexvar_epi32(index, v); }
// Lane K of v, and half K.
template <int K>
ZEL_AVX512_VBMI inline __m128i lane128(__m512i v) {
  return _mm512_extracti32x4_epi32(v, K);
}
template <int K>
ZEL_AVX512_VBMI inline __m256i half256(__m512i v) {
  return _mm512_extracti64x4_epi64(v, K);
}
// Lanes 2, 3 of a and 0, 1 of b.
ZEL_AVX512_VBMI inline __m512i middleLanes(__m512i a, __m512i b) { return _mm512_shuffle_i64x2(a, b, 0x4E); }
// A 16-byte pattern in every lane.
ZEL_AVX512_VBMI inline __m512i everyLane(__m128i v) { return _mm512_broadcast_i32x4(v); }

struct Avx512 {
  using V = __m512i;
  static constexpr int kUnits = 4;
  static constexpr int kPixels = 64;

  // Units that follow each other are one load or store.
  ZEL_AVX512_VBMI static V loadUnits(const void* p, int unitStride) {
    const auto* b = static_cast<const uint8_t*>(p);
    if (unitStride == 16) return _mm512_loadu_si512(p);
    V v = _mm512_castsi128_si512(load128(b));
    v = _mm512_inserti32x4(v, load128(b + unitStride), 1);
    v = _mm512_inserti32x4(v, load128(b + 2 * unitStride), 2);
    return _mm512_inserti32x4(v, load128(b + 3 * unitStride), 3);
  }
  ZEL_AVX512_VBMI static void storeUnits(void* p, int unitStride, V v) {
    auto* b = static_cast<uint8_t*>(p);
    if (unitStride == 16) {
      _mm512_storeu_si512(p, v);
    } else {
      store128(b, _mm512_castsi512_si128(v));
      store128(b + unitStride, lane128<1>(v));
      store128(b + 2 * unitStride, lane128<2>(v));
      store128(b + 3 * unitStride, lane128<3>(v));
    }
  }
  ZEL_AVX512_VBMI static V shuffleOf(const Shuffle16& s) { return everyLane(load128(s.b)); }

  ZEL_UNIT_LANE_OPS(ZEL_AVX512_VBMI, _mm512, 512)
  ZEL_AVX512_VBMI static V blend8(V a, V b, V m) { return _mm512_mask_blend_epi8(_mm512_movepi8_mask(m), a, b); }
};

ZEL_TIER512_END

// Three channels of a block: bytes (16 pixels a unit) or 16-bit lanes.
template <class U>
struct Trio {
  typename U::V c0, c1, c2;
};

// Three samples of one pixel.
struct Samples3 {
  int c0, c1, c2;
};

// Three dwords of 16-bit-range results to the bytes of four pixels: byte
// 4i + c is SaturateU8 of channel c of pixel i, byte 4i + 3 is zero.
inline __m128i mergeDwords(__m128i c0, __m128i c1, __m128i c2) {
  const __m128i bytes = _mm_packus_epi16(_mm_packs_epi32(c0, c1), _mm_packs_epi32(c2, _mm_setzero_si128()));
  return _mm_shuffle_epi8(bytes, _mm_setr_epi8(0, 4, 8, 12, 1, 5, 9, 13, 2, 6, 10, 14, 3, 7, 11, 15));
}

// Bytes of a unit widened to two vectors of 16-bit lanes (pixels 0..7 and
// 8..15 of each unit), and back with SaturateU8.
template <class U>
struct Wide16 {
  typename U::V lo, hi;
};
template <class U>
ZEL_INLINE Wide16<U> widen(typename U::V bytes) {
  const typename U::V z = U::zero();
  return {U::unpackLo8(bytes, z), U::unpackHi8(bytes, z)};
}
template <class U>
ZEL_INLINE typename U::V narrow(const Wide16<U>& w) {
  return U::packU8(w.lo, w.hi);
}

// Bytes of a unit as the high bytes of 16-bit lanes: sample << 8, read as
// unsigned; after flipping the top bit of each byte, (sample - 128) << 8,
// read as signed.
template <class U>
ZEL_INLINE Wide16<U> widenHigh(typename U::V bytes) {
  const typename U::V z = U::zero();
  return {U::unpackLo8(z, bytes), U::unpackHi8(z, bytes)};
}
template <class U>
ZEL_INLINE Wide16<U> widenCentred(typename U::V bytes) {
  return widenHigh<U>(U::xor_(bytes, U::set8(0x80)));
}

}  // namespace zel::lc
