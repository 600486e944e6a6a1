// The banded error diffusion kernels in two widths: eight rows at a time in
// two SSE vectors of lanes, sixteen in two AVX2 vectors. One source,
// diffusion_bands.inc, built once per width.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <type_traits>

#include "frame/image_layout.h"
#include "frame/simd.h"
#include "reduce_bits/noise_generator.h"
#include "reduce_bits/reduce_formulas.h"

namespace zel::reduce {

template <typename Src, typename Dst>
struct Image {
  const Src* src;
  int srcStep;  // bytes
  Dst* dst;
  int dstStep;  // bytes
  int width, height;
};

namespace sse {

struct One {
  static constexpr int n = 4;
  using F = __m128;
  using I = __m128i;
  static ZEL_INLINE F zero() { return _mm_setzero_ps(); }
  static ZEL_INLINE F set1(float v) { return _mm_set1_ps(v); }
  static ZEL_INLINE I set1i(int32_t v) { return _mm_set1_epi32(v); }
  static ZEL_INLINE F add(F a, F b) { return _mm_add_ps(a, b); }
  static ZEL_INLINE F sub(F a, F b) { return _mm_sub_ps(a, b); }
  static ZEL_INLINE F mul(F a, F b) { return _mm_mul_ps(a, b); }
  static ZEL_INLINE F and_(F a, F b) { return _mm_and_ps(a, b); }
  static ZEL_INLINE F or_(F a, F b) { return _mm_or_ps(a, b); }
  static ZEL_INLINE F andnot(F a, F b) { return _mm_andnot_ps(a, b); }
  static ZEL_INLINE F cmpge(F a, F b) { return _mm_cmpge_ps(a, b); }
  static ZEL_INLINE F cmplt(F a, F b) { return _mm_cmplt_ps(a, b); }
  static ZEL_INLINE I cvtt(F a) { return _mm_cvttps_epi32(a); }
  static ZEL_INLINE F cvt(I a) { return _mm_cvtepi32_ps(a); }
  static ZEL_INLINE F castf(I a) { return _mm_castsi128_ps(a); }
  static ZEL_INLINE I addi(I a, I b) { return _mm_add_epi32(a, b); }
  static ZEL_INLINE I subi(I a, I b) { return _mm_sub_epi32(a, b); }
  static ZEL_INLINE I srai8(I a) { return _mm_srai_epi32(a, 8); }
  static ZEL_INLINE I blendi(I a, I b, F mask) { return _mm_blendv_epi8(a, b, _mm_castps_si128(mask)); }
  static ZEL_INLINE void store(float* p, F v) { _mm_store_ps(p, v); }
  static ZEL_INLINE void storei(int32_t* p, I v) { _mm_store_si128(reinterpret_cast<I*>(p), v); }
  // Lanes up by one, `first` into lane 0.
  static ZEL_INLINE F shiftIn(F v, float first) {
    return _mm_move_ss(_mm_castsi128_ps(_mm_slli_si128(_mm_castps_si128(v), 4)), _mm_set_ss(first));
  }
  // Lanes up by one, the last lane of `below` into lane 0.
  static ZEL_INLINE F shiftInFrom(F v, F below) {
    return _mm_castsi128_ps(_mm_alignr_epi8(_mm_castps_si128(v), _mm_castps_si128(below), 12));
  }
  template <typename G>
  static ZEL_INLINE F make(G g) {
    return _mm_setr_ps(g(0), g(1), g(2), g(3));
  }
  template <typename G>
  static ZEL_INLINE I makei(G g) {
    return _mm_setr_epi32(g(0), g(1), g(2), g(3));
  }
};

#include "reduce_bits/diffusion_pair.inc"
#include "reduce_bits/diffusion_bands.inc"

}  // namespace sse

#pragma GCC push_options
#pragma GCC target("avx2")
namespace avx2 {

struct One {
  static constexpr int n = 8;
  using F = __m256;
  using I = __m256i;
  static ZEL_INLINE F zero() { return _mm256_setzero_ps(); }
  static ZEL_INLINE F set1(float v) { return _mm256_set1_ps(v); }
  static ZEL_INLINE I set1i(int32_t v) { return _mm256_set1_epi32(v); }
  static ZEL_INLINE F add(F a, F b) { return _mm256_add_ps(a, b); }
  static ZEL_INLINE F sub(F a, F b) { return _mm256_sub_ps(a, b); }
  static ZEL_INLINE F mul(F a, F b) { return _mm256_mul_ps(a, b); }
  static ZEL_INLINE F and_(F a, F b) { return _mm256_and_ps(a, b); }
  static ZEL_INLINE F or_(F a, F b) { return _mm256_or_ps(a, b); }
  static ZEL_INLINE F andnot(F a, F b) { return _mm256_andnot_ps(a, b); }
  static ZEL_INLINE F cmpge(F a, F b) { return _mm256_cmp_ps(a, b, _CMP_GE_OS); }
  static ZEL_INLINE F cmplt(F a, F b) { return _mm256_cmp_ps(a, b, _CMP_LT_OS); }
  static ZEL_INLINE I cvtt(F a) { return _mm256_cvttps_epi32(a); }
  static ZEL_INLINE F cvt(I a) { return _mm256_cvtepi32_ps(a); }
  static ZEL_INLINE F castf(I a) { return _mm256_castsi256_ps(a); }
  static ZEL_INLINE I addi(I a, I b) { return _mm256_add_epi32(a, b); }
  static ZEL_INLINE I subi(I a, I b) { return _mm256_sub_epi32(a, b); }
  static ZEL_INLINE I srai8(I a) { return _mm256_srai_epi32(a, 8); }
  static ZEL_INLINE I blendi(I a, I b, F mask) { return _mm256_blendv_epi8(a, b, _mm256_castps_si256(mask)); }
  static ZEL_INLINE void store(float* p, F v) { _mm256_store_ps(p, v); }
  static ZEL_INLINE void storei(int32_t* p, I v) { _mm256_store_si256(reinterpret_cast<I*>(p), v); }
  static ZEL_INLINE F shiftIn(F v, float first) {
    const F up = _mm256_permutevar8x32_ps(v, _mm256_setr_epi32(0, 0, 1, 2, 3, 4, 5, 6));
    return _mm256_blend_ps(up, _mm256_set1_ps(first), 1);
  }
  static ZEL_INLINE F shiftInFrom(F v, F below) {
    const F up = _mm256_permutevar8x32_ps(v, _mm256_setr_epi32(0, 0, 1, 2, 3, 4, 5, 6));
    return _mm256_blend_ps(up, _mm256_permutevar8x32_ps(below, _mm256_set1_epi32(7)), 1);
  }
  template <typename G>
  static ZEL_INLINE F make(G g) {
    return _mm256_setr_ps(g(0), g(1), g(2), g(3), g(4), g(5), g(6), g(7));
  }
  template <typename G>
  static ZEL_INLINE I makei(G g) {
    return _mm256_setr_epi32(g(0), g(1), g(2), g(3), g(4), g(5), g(6), g(7));
  }
};

#include "reduce_bits/diffusion_pair.inc"
#include "reduce_bits/diffusion_bands.inc"

}  // namespace avx2
#pragma GCC pop_options

}  // namespace zel::reduce
