// Lane forms of the bit-depth reduction formulas: four samples a vector,
// the same float operations in the same order as the scalar forms, so body
// and tail agree wherever the formulas do.
#pragma once

#include <cstdint>
#include <cstring>
#include <type_traits>

#include "frame/simd.h"
#include "reduce_bits/reduce_formulas.h"

namespace zel::reduce {

// Four consecutive samples as their working values (the signed 16-bit
// source biased by 32768).
template <typename Src>
inline __m128 loadWorking4(const Src* p) {
  if constexpr (std::is_same_v<Src, uint8_t>) return _mm_cvtepi32_ps(_mm_cvtepu8_epi32(load32(p)));
  else if constexpr (std::is_same_v<Src, uint16_t>) return _mm_cvtepi32_ps(_mm_cvtepu16_epi32(load64(p)));
  else if constexpr (std::is_same_v<Src, int16_t>)
    return _mm_cvtepi32_ps(_mm_add_epi32(_mm_cvtepi16_epi32(load64(p)), _mm_set1_epi32(32768)));
  else return _mm_loadu_ps(p);
}

template <typename Src>
inline __m128 normalise4(const Src* p) {
  const __m128 w = loadWorking4(p);
  if constexpr (std::is_same_v<Src, uint8_t>) return _mm_mul_ps(w, _mm_set1_ps(0.003921569f));
  else if constexpr (std::is_same_v<Src, float>) return w;
  else return _mm_mul_ps(w, _mm_set1_ps(1.5259022e-5f));
}

inline __m128 nearestLevel4(__m128 t, const PlainLevels& p) {
  const __m128 inv = _mm_set1_ps(p.inv);
  const __m128i i = TruncateToInt(_mm_mul_ps(t, _mm_set1_ps(p.span)));
  const __m128 base = _mm_mul_ps(inv, _mm_cvtepi32_ps(i));
  const __m128 up = _mm_cmpgt_ps(_mm_sub_ps(t, base), _mm_set1_ps(p.half));
  return _mm_blendv_ps(base, _mm_add_ps(base, inv), up);
}

template <typename Dst>
inline __m128i plainScaled4(__m128 level) {
  return TruncateToInt(_mm_mul_ps(level, _mm_set1_ps(std::is_same_v<Dst, uint8_t> ? 255.0f : 65535.0f)));
}

inline __m128 levelBelow4(__m128 w, const QuantValues& qv) {
  return _mm_mul_ps(_mm_cvtepi32_ps(TruncateToInt(_mm_mul_ps(w, _mm_set1_ps(qv.inv)))), _mm_set1_ps(qv.q));
}

inline __m128 orderedLevel4(__m128 w, __m128 t, const QuantValues& qv) {
  const __m128 base = levelBelow4(w, qv);
  const __m128 up = _mm_cmplt_ps(t, _mm_sub_ps(w, base));
  return _mm_blendv_ps(base, _mm_add_ps(base, _mm_set1_ps(qv.q)), up);
}

template <typename M>
inline __m128i orderedInteger4(__m128 o) {
  __m128i v;
  if constexpr (M::source == SourceClass::Float)
    v = TruncateToInt(_mm_mul_ps(o, _mm_set1_ps(M::byteDest ? 255.0f : 65535.0f)));
  else v = TruncateToInt(o);
  if constexpr (M::narrows) v = _mm_srai_epi32(v, 8);
  return v;
}

// How 32-bit lane results become destination samples.
enum class Pack {
  SaturateBytes,   // SaturateU8(SaturateS16(v)): also the clamp to 0..255
  LowWords,        // low 16 bits
  BiasedWords,     // SaturateS16(v - 32768) + 32768
  SignedWords,     // SaturateS16(v - 32768)
  ClampedWords,    // v clamped to 0..65535
  ClampedSigned,   // v clamped to 0..65535, minus 32768
};

// Eight results (a then b) packed into the low 8 or all 16 bytes.
template <Pack P>
inline __m128i pack8(__m128i a, __m128i b) {
  const __m128i bias = _mm_set1_epi32(32768);
  const __m128i flip = _mm_set1_epi16(int16_t(0x8000));
  if constexpr (P == Pack::SaturateBytes) {
    const __m128i w = _mm_packs_epi32(a, b);
    return _mm_packus_epi16(w, w);
  } else if constexpr (P == Pack::LowWords) {
    const __m128i low = _mm_setr_epi8(0, 1, 4, 5, 8, 9, 12, 13, -1, -1, -1, -1, -1, -1, -1, -1);
    return _mm_unpacklo_epi64(_mm_shuffle_epi8(a, low), _mm_shuffle_epi8(b, low));
  } else if constexpr (P == Pack::BiasedWords) {
    return _mm_xor_si128(_mm_packs_epi32(_mm_sub_epi32(a, bias), _mm_sub_epi32(b, bias)), flip);
  } else if constexpr (P == Pack::SignedWords) {
    return _mm_packs_epi32(_mm_sub_epi32(a, bias), _mm_sub_epi32(b, bias));
  } else if constexpr (P == Pack::ClampedWords) {
    return _mm_packus_epi32(a, b);
  } else {
    return _mm_xor_si128(_mm_packus_epi32(a, b), flip);
  }
}

inline void storeLow32(void* p, __m128i v) {
  const int32_t low = _mm_cvtsi128_si32(v);
  std::memcpy(p, &low, 4);
}

// Stores the first n (4 or 8) samples of a packed vector.
template <typename Dst>
inline void storePacked(Dst* d, __m128i v, int n) {
  if constexpr (sizeof(Dst) == 1) {
    if (n == 8) store64(d, v);
    else storeLow32(d, v);
  } else {
    if (n == 8) store128(d, v);
    else store64(d, v);
  }
}

// Writes the first three samples of each of the `pixels` four-sample groups
// of a packed vector: the fourth sample of an AC4 pixel is never written.
template <typename Dst>
inline void storeThreeOfFour(Dst* d, __m128i v, int pixels) {
  alignas(16) Dst lanes[16 / sizeof(Dst)];
  _mm_store_si128(reinterpret_cast<__m128i*>(lanes), v);
  for (int k = 0; k < pixels; ++k) std::memcpy(d + 4 * k, lanes + 4 * k, 3 * sizeof(Dst));
}

// ---- AVX2: eight samples a vector, the same operations lane by lane ----

template <typename Src>
ZEL_AVX2 inline __m256 loadWorking8(const Src* p) {
  if constexpr (std::is_same_v<Src, uint8_t>) return _mm256_cvtepi32_ps(_mm256_cvtepu8_epi32(load64(p)));
  else if constexpr (std::is_same_v<Src, uint16_t>) return _mm256_cvtepi32_ps(_mm256_cvtepu16_epi32(load128(p)));
  else if constexpr (std::is_same_v<Src, int16_t>)
    return _mm256_cvtepi32_ps(_mm256_add_epi32(_mm256_cvtepi16_epi32(load128(p)), _mm256_set1_epi32(32768)));
  else return _mm256_loadu_ps(p);
}

template <typename Src>
ZEL_AVX2 inline __m256 normalise8(const Src* p) {
  const __m256 w = loadWorking8(p);
  if constexpr (std::is_same_v<Src, uint8_t>) return _mm256_mul_ps(w, _mm256_set1_ps(0.003921569f));
  else if constexpr (std::is_same_v<Src, float>) return w;
  else return _mm256_mul_ps(w, _mm256_set1_ps(1.5259022e-5f));
}

ZEL_AVX2 inline __m256 nearestLevel8(__m256 t, const PlainLevels& p) {
  const __m256 inv = _mm256_set1_ps(p.inv);
  const __m256i i = _mm256_cvttps_epi32(_mm256_mul_ps(t, _mm256_set1_ps(p.span)));
  const __m256 base = _mm256_mul_ps(inv, _mm256_cvtepi32_ps(i));
  const __m256 up = _mm256_cmp_ps(_mm256_sub_ps(t, base), _mm256_set1_ps(p.half), _CMP_GT_OQ);
  return _mm256_blendv_ps(base, _mm256_add_ps(base, inv), up);
}

template <typename Dst>
ZEL_AVX2 inline __m256i plainScaled8(__m256 level) {
  return _mm256_cvttps_epi32(_mm256_mul_ps(level, _mm256_set1_ps(std::is_same_v<Dst, uint8_t> ? 255.0f : 65535.0f)));
}

ZEL_AVX2 inline __m256 orderedLevel8(__m256 w, __m256 t, const QuantValues& qv) {
  const __m256 q = _mm256_set1_ps(qv.q);
  const __m256 base = _mm256_mul_ps(_mm256_cvtepi32_ps(_mm256_cvttps_epi32(_mm256_mul_ps(w, _mm256_set1_ps(qv.inv)))), q);
  const __m256 up = _mm256_cmp_ps(t, _mm256_sub_ps(w, base), _CMP_LT_OQ);
  return _mm256_blendv_ps(base, _mm256_add_ps(base, q), up);
}

template <typename M>
ZEL_AVX2 inline __m256i orderedInteger8(__m256 o) {
  __m256i v;
  if constexpr (M::source == SourceClass::Float)
    v = _mm256_cvttps_epi32(_mm256_mul_ps(o, _mm256_set1_ps(M::byteDest ? 255.0f : 65535.0f)));
  else v = _mm256_cvttps_epi32(o);
  if constexpr (M::narrows) v = _mm256_srai_epi32(v, 8);
  return v;
}

// Sixteen results (a then b) packed into 16 bytes or 32 bytes, as pack8.
template <Pack P>
ZEL_AVX2 inline __m256i pack16(__m256i a, __m256i b) {
  const __m256i bias = _mm256_set1_epi32(32768);
  const __m256i flip = _mm256_set1_epi16(int16_t(0x8000));
  __m256i w;  // sixteen words, lanes interleaved by the in-lane packs
  if constexpr (P == Pack::SaturateBytes || P == Pack::ClampedWords || P == Pack::ClampedSigned) {
    w = P == Pack::SaturateBytes ? _mm256_packs_epi32(a, b) : _mm256_packus_epi32(a, b);
  } else if constexpr (P == Pack::LowWords) {
    const __m256i low = _mm256_set1_epi32(0xFFFF);
    w = _mm256_packus_epi32(_mm256_and_si256(a, low), _mm256_and_si256(b, low));
  } else {
    w = _mm256_packs_epi32(_mm256_sub_epi32(a, bias), _mm256_sub_epi32(b, bias));
  }
  w = _mm256_permute4x64_epi64(w, _MM_SHUFFLE(3, 1, 2, 0));
  if constexpr (P == Pack::SaturateBytes)
    return _mm256_castsi128_si256(_mm_packus_epi16(_mm256_castsi256_si128(w), _mm256_extracti128_si256(w, 1)));
  else if constexpr (P == Pack::BiasedWords || P == Pack::ClampedSigned) return _mm256_xor_si256(w, flip);
  else return w;
}

template <typename Dst>
ZEL_AVX2 inline void storePacked16(Dst* d, __m256i v) {
  if constexpr (sizeof(Dst) == 1) store128(d, _mm256_castsi256_si128(v));
  else store256(d, v);
}

}  // namespace zel::reduce
