// Float scalar meanings shared by the colour-space, pixel-operator and
// tone-mapping families. All arithmetic is 32-bit float, every step rounded
// as written (the build forbids contraction into fused multiply-add).
#pragma once

#include <immintrin.h>

#include <cstdint>

namespace zel {

// The processor's 12-bit reciprocal estimate (RCPSS). Vector bodies use
// RCPPS, which gives the same bits lane by lane.
inline float ApproxRcp(float x) { return _mm_cvtss_f32(_mm_rcp_ss(_mm_set_ss(x))); }
inline __m128 ApproxRcp(__m128 x) { return _mm_rcp_ps(x); }

// One Newton step on the estimate: (r + r) - ((x * r) * r), in this order.
inline float RefinedRcp(float x) {
  const float r = ApproxRcp(x);
  return (r + r) - ((x * r) * r);
}
inline __m128 RefinedRcp(__m128 x) {
  const __m128 r = _mm_rcp_ps(x);
  return _mm_sub_ps(_mm_add_ps(r, r), _mm_mul_ps(_mm_mul_ps(x, r), r));
}

// Nearest, ties to even (the default rounding mode, CVTSS2SI).
inline int32_t RoundEven(float x) { return _mm_cvtss_si32(_mm_set_ss(x)); }
inline __m128i RoundEven(__m128 x) { return _mm_cvtps_epi32(x); }

// Toward zero (CVTTSS2SI).
inline int32_t TruncateToInt(float x) { return _mm_cvttss_si32(_mm_set_ss(x)); }
inline __m128i TruncateToInt(__m128 x) { return _mm_cvttps_epi32(x); }

}  // namespace zel
