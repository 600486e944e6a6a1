// The 512-bit blocks of the colour-to-gray family: sixteen pixels a block
// (not for three-channel floats, which wait on memory: there the AVX2
// blocks are as fast).
// Two-register permutes take each channel out of the interleaved pixels,
// one lane per pixel; every lane then runs the four-pixel block form of its
// type in the same order. vpmovdw keeps the low 16 bits of a 16u result,
// vpmovsdw saturates a 16s one, as the narrower blocks do.
#include <type_traits>

#include "frame/simd.h"
#include "pixel_ops/to_gray.h"

ZEL_TIER512_BEGIN

namespace zel::gray {

namespace {

// Words: channel ch of pixel k at word K * k + ch of the block, read from
// two registers (words 0..31, 32..63), into the low word of 32-bit lane k.
template <int K>
struct WordSplit {
  alignas(64) uint16_t split[3][32];
  constexpr WordSplit() : split{} {
    for (int ch = 0; ch < 3; ++ch)
      for (int k = 0; k < 16; ++k) split[ch][2 * k] = uint16_t(K * k + ch);
  }
};
template <int K>
constexpr WordSplit<K> kWordSplit{};
constexpr __mmask32 kLowWordOfLane = 0x55555555u;

// Four-channel floats: a pair of registers holds eight pixels. `ab` puts
// their first samples in lanes 0..7 and their second in lanes 8..15, `d`
// their third in lanes 0..7.
struct FloatAC4Split {
  alignas(64) int32_t ab[16];
  alignas(64) int32_t d[16];
  constexpr FloatAC4Split() : ab{}, d{} {
    for (int k = 0; k < 8; ++k) {
      ab[k] = 4 * k;
      ab[k + 8] = 4 * k + 1;
      d[k] = d[k + 8] = 4 * k + 2;
    }
  }
};
constexpr FloatAC4Split kFloatAC4{};

ZEL_AVX512 ZEL_INLINE __m512i table(const void* p) { return _mm512_load_si512(p); }

// 64 bytes as two 32-byte loads: a source off its 64-byte lines then
// splits every other load instead of every one.
ZEL_AVX512 ZEL_INLINE __m512i load512(const void* p) {
  const auto* b = static_cast<const uint8_t*>(p);
  return _mm512_inserti64x4(_mm512_castsi256_si512(load256(b)), load256(b + 32), 1);
}
ZEL_AVX512 ZEL_INLINE __m512 load512f(const float* p) { return _mm512_castsi512_ps(load512(p)); }

struct Lanes16f {
  __m512 a, b, d;
};

template <typename T, int K>
ZEL_AVX512 ZEL_INLINE Lanes16f load16(const T* p) {
  if constexpr (std::is_same_v<T, float>) {
    static_assert(K == 4, "three-channel floats take the AVX2 blocks");
    const __m512 in0 = load512f(p), in1 = load512f(p + 16), in2 = load512f(p + 32), in3 = load512f(p + 48);
    const __m512i ab = table(kFloatAC4.ab), d = table(kFloatAC4.d);
    const __m512 ab0 = _mm512_permutex2var_ps(in0, ab, in1), ab1 = _mm512_permutex2var_ps(in2, ab, in3);
    const __m512 d0 = _mm512_permutex2var_ps(in0, d, in1), d1 = _mm512_permutex2var_ps(in2, d, in3);
    return {_mm512_shuffle_f32x4(ab0, ab1, _MM_SHUFFLE(1, 0, 1, 0)), _mm512_shuffle_f32x4(ab0, ab1, _MM_SHUFFLE(3, 2, 3, 2)),
            _mm512_shuffle_f32x4(d0, d1, _MM_SHUFFLE(1, 0, 1, 0))};
  } else {
    __m512i lo = load512(p);
    __m512i hi = K == 3 ? _mm512_zextsi256_si512(load256(p + 32)) : load512(p + 32);
    if constexpr (std::is_signed_v<T>) {  // s + 32768 in 16 bits
      lo = _mm512_xor_si512(lo, _mm512_set1_epi16(int16_t(0x8000)));
      hi = _mm512_xor_si512(hi, _mm512_set1_epi16(int16_t(0x8000)));
    }
    __m512 v[3];
    for (int ch = 0; ch < 3; ++ch)
      v[ch] = _mm512_cvtepi32_ps(_mm512_maskz_permutex2var_epi16(kLowWordOfLane, lo, table(kWordSplit<K>.split[ch]), hi));
    return {v[0], v[1], v[2]};
  }
}

}  // namespace

template <typename T, int Channels>
ZEL_AVX512 int blocks512(const T* src, T* dst, int end, WeightsF w) {
  const __m512 w0 = _mm512_set1_ps(w.w0), w1 = _mm512_set1_ps(w.w1), w2 = _mm512_set1_ps(w.w2);
  int x = 0;
  for (; x + 16 <= end; x += 16) {
    if constexpr (std::is_same_v<T, float>)
      _mm_prefetch(reinterpret_cast<const char*>(src + x * Channels) + kPrefetchBytes, _MM_HINT_T0);
    const Lanes16f c = load16<T, Channels>(src + x * Channels);
    const __m512 s = _mm512_add_ps(_mm512_add_ps(_mm512_mul_ps(c.a, w0), _mm512_mul_ps(c.b, w1)), _mm512_mul_ps(c.d, w2));
    if constexpr (std::is_same_v<T, float>) {
      _mm512_storeu_ps(dst + x, s);
    } else if constexpr (std::is_signed_v<T>) {
      store256(dst + x, _mm512_cvtsepi32_epi16(_mm512_sub_epi32(_mm512_cvtps_epi32(s), _mm512_set1_epi32(32768))));
    } else {
      store256(dst + x, _mm512_cvtepi32_epi16(_mm512_cvtps_epi32(s)));
    }
  }
  return x;
}

template int blocks512<uint16_t, 3>(const uint16_t*, uint16_t*, int, WeightsF);
template int blocks512<uint16_t, 4>(const uint16_t*, uint16_t*, int, WeightsF);
template int blocks512<int16_t, 3>(const int16_t*, int16_t*, int, WeightsF);
template int blocks512<int16_t, 4>(const int16_t*, int16_t*, int, WeightsF);
template int blocks512<float, 4>(const float*, float*, int, WeightsF);

}  // namespace zel::gray

ZEL_TIER512_END
