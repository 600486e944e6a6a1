#include "pixel_ops/twist.h"

#include <type_traits>

#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "frame/simd.h"

namespace zel::twist {

NearestRounding::NearestRounding() : saved_(_mm_getcsr()), changed_((saved_ & _MM_ROUND_MASK) != _MM_ROUND_NEAREST) {
  if (changed_) _mm_setcsr((saved_ & ~_MM_ROUND_MASK) | _MM_ROUND_NEAREST);
}
NearestRounding::~NearestRounding() {
  if (changed_) _mm_setcsr(saved_);
}

namespace {

// ---- four interleaved pixels in and out of channel lanes ----

// Shuffles that take channel `ch` of pixel k from up to two registers
// (bytes 0..15 and 16..31 of the four pixels) into 32-bit lane k: at the
// bottom of the lane for unsigned samples, at the top for signed ones (an
// arithmetic shift then extends the sign).
struct Gather {
  alignas(16) int8_t m[2][3][16];
  constexpr Gather(int channels, int bytes, bool sign) : m{} {
    for (int r = 0; r < 2; ++r)
      for (int ch = 0; ch < 3; ++ch)
        for (int i = 0; i < 16; ++i) m[r][ch][i] = int8_t(0x80);
    for (int ch = 0; ch < 3; ++ch)
      for (int k = 0; k < 4; ++k)
        for (int j = 0; j < bytes; ++j) {
          const int from = (channels * k + ch) * bytes + j;
          const int at = sign ? 4 - bytes + j : j;
          m[from / 16][ch][4 * k + at] = int8_t(from % 16);
        }
  }
};

// Shuffles from narrowed channels (channel ch of pixel k at sample ch * 4
// + k, over one or two registers) into pixel order, and the bytes of an AC4
// destination that keep their value.
struct Scatter {
  alignas(16) int8_t m[2][2][16];  // [output register][source register]
  alignas(16) int8_t keep[2][16];
  constexpr Scatter(int channels, int bytes) : m{}, keep{} {
    for (int o = 0; o < 2; ++o)
      for (int b = 0; b < 16; ++b) {
        m[o][0][b] = m[o][1][b] = int8_t(0x80);
        const int sample = (o * 16 + b) / bytes, j = (o * 16 + b) % bytes;
        const int k = sample / channels, ch = sample % channels;
        if (k >= 4) continue;
        if (ch == 3) {
          keep[o][b] = int8_t(0xFF);
          continue;
        }
        const int from = (ch * 4 + k) * bytes + j;
        m[o][from / 16][b] = int8_t(from % 16);
      }
  }
};

template <int Channels, int Bytes, bool Sign>
constexpr Gather kGather(Channels, Bytes, Sign);
template <int Channels, int Bytes>
constexpr Scatter kScatter(Channels, Bytes);

inline __m128i mask(const int8_t* m) { return _mm_load_si128(reinterpret_cast<const __m128i*>(m)); }

struct Lanes3 {
  __m128 a, b, c;
};

template <typename T>
constexpr bool isSigned = std::is_signed_v<T>;

// The bytes of four interleaved pixels, in one or two registers (bytes
// 0..15 and 16..31); never a byte past the fourth pixel.
struct Raw {
  __m128i lo, hi;
};

template <typename T, int K>
inline Raw rawLoad(const T* src, int x) {
  constexpr int total = 4 * K * int(sizeof(T));
  const auto* p = reinterpret_cast<const uint8_t*>(src + x * K);
  Raw r{_mm_setzero_si128(), _mm_setzero_si128()};
  if constexpr (total == 12) {
    int32_t last;
    __builtin_memcpy(&last, p + 8, 4);
    r.lo = _mm_insert_epi32(load64(p), last, 2);
  } else {
    r.lo = load128(p);
    if constexpr (total == 24) r.hi = load64(p + 16);
    if constexpr (total == 32) r.hi = load128(p + 16);
  }
  return r;
}

// Channel ch of four pixels as 32-bit integers.
template <typename T, int K>
inline __m128i split(const Raw& r, int ch) {
  constexpr int bytes = int(sizeof(T)), total = 4 * K * bytes;
  const Gather& g = kGather<K, bytes, isSigned<T>>;
  __m128i v = _mm_shuffle_epi8(r.lo, mask(g.m[0][ch]));
  if constexpr (total > 16) v = _mm_or_si128(v, _mm_shuffle_epi8(r.hi, mask(g.m[1][ch])));
  if constexpr (isSigned<T>) v = _mm_srai_epi32(v, 32 - 8 * bytes);
  return v;
}

// Four samples of one plane as 32-bit integers.
template <typename T>
inline __m128i widen(const T* p) {
  if constexpr (std::is_same_v<T, uint8_t>) return _mm_cvtepu8_epi32(load32(p));
  else if constexpr (std::is_same_v<T, int8_t>) return _mm_cvtepi8_epi32(load32(p));
  else if constexpr (std::is_same_v<T, uint16_t>) return _mm_cvtepu16_epi32(load64(p));
  else return _mm_cvtepi16_epi32(load64(p));
}

// Four pixels' samples as floats.
template <typename T, int K>
inline Lanes3 load4(const T* const src[3], int x) {
  __m128i v[3];
  if constexpr (K == Planar) {
    for (int k = 0; k < 3; ++k) v[k] = widen(src[k] + x);
  } else {
    const Raw r = rawLoad<T, K>(src[0], x);
    for (int ch = 0; ch < 3; ++ch) v[ch] = split<T, K>(r, ch);
  }
  return {_mm_cvtepi32_ps(v[0]), _mm_cvtepi32_ps(v[1]), _mm_cvtepi32_ps(v[2])};
}

// Saturating narrowing as the type's packs do it: 32 to 16 bits, and for
// bytes 16 to 8 bits.
template <typename T>
inline __m128i narrow16(__m128i x, __m128i y) {
  if constexpr (std::is_same_v<T, uint16_t>) return _mm_packus_epi32(x, y);
  else return _mm_packs_epi32(x, y);
}
template <typename T>
inline __m128i narrow8(__m128i x, __m128i y) {
  if constexpr (std::is_same_v<T, uint8_t>) return _mm_packus_epi16(x, y);
  else return _mm_packs_epi16(x, y);
}

// Four samples of one plane from 32-bit integers.
template <typename T>
inline void storePlane(T* p, __m128i v) {
  __m128i n = narrow16<T>(v, v);
  if constexpr (sizeof(T) == 1) {
    n = narrow8<T>(n, n);
    const int32_t four = _mm_cvtsi128_si32(n);
    __builtin_memcpy(p, &four, 4);
  } else {
    store64(p, n);
  }
}

// Narrowed channels (channel ch of pixel k at sample ch * 4 + k, bytes in
// one register, 16-bit samples in two) into four interleaved pixels; an
// AC4 destination keeps its fourth samples.
template <typename T, int K>
inline void scatter(T* dst, int x, __m128i n0, __m128i n1) {
  constexpr int bytes = int(sizeof(T)), total = 4 * K * bytes;
  const Scatter& s = kScatter<K, bytes>;
  auto* p = reinterpret_cast<uint8_t*>(dst + x * K);
  for (int o = 0; o * 16 < total; ++o) {
    __m128i out = _mm_shuffle_epi8(n0, mask(s.m[o][0]));
    if constexpr (bytes > 1) out = _mm_or_si128(out, _mm_shuffle_epi8(n1, mask(s.m[o][1])));
    if constexpr (K == AC4) out = _mm_blendv_epi8(out, load128(p + 16 * o), mask(s.keep[o]));
    const int left = total - 16 * o;
    if (left >= 16) {
      store128(p + 16 * o, out);
    } else if (left == 12) {
      store64(p + 16 * o, out);
      const int32_t last = _mm_extract_epi32(out, 2);
      __builtin_memcpy(p + 16 * o + 8, &last, 4);
    } else {
      store64(p + 16 * o, out);
    }
  }
}

template <typename T, int K>
inline void store4(T* const dst[3], int x, __m128i r, __m128i g, __m128i b) {
  if constexpr (K == Planar) {
    storePlane(dst[0] + x, r);
    storePlane(dst[1] + x, g);
    storePlane(dst[2] + x, b);
  } else if constexpr (sizeof(T) == 1) {
    scatter<T, K>(dst[0], x, narrow8<T>(narrow16<T>(r, g), narrow16<T>(b, b)), _mm_setzero_si128());
  } else {
    scatter<T, K>(dst[0], x, narrow16<T>(r, g), narrow16<T>(b, b));
  }
}

// ---- AVX2: eight pixels, each 128-bit lane holding four of them exactly
// as the SSE4.1 block does; the same operations lane by lane. ----

template <typename T, int K>
ZEL_AVX2 inline __m256i split8(__m256i lo, __m256i hi, int ch) {
  constexpr int bytes = int(sizeof(T)), total = 4 * K * bytes;
  const Gather& g = kGather<K, bytes, isSigned<T>>;
  __m256i v = _mm256_shuffle_epi8(lo, _mm256_broadcastsi128_si256(mask(g.m[0][ch])));
  if constexpr (total > 16)
    v = _mm256_or_si256(v, _mm256_shuffle_epi8(hi, _mm256_broadcastsi128_si256(mask(g.m[1][ch]))));
  if constexpr (isSigned<T>) v = _mm256_srai_epi32(v, 32 - 8 * bytes);
  return v;
}

template <typename T>
ZEL_AVX2 inline __m256i widen8(const T* p) {
  if constexpr (std::is_same_v<T, uint8_t>) return _mm256_cvtepu8_epi32(load64(p));
  else if constexpr (std::is_same_v<T, int8_t>) return _mm256_cvtepi8_epi32(load64(p));
  else if constexpr (std::is_same_v<T, uint16_t>) return _mm256_cvtepu16_epi32(load128(p));
  else return _mm256_cvtepi16_epi32(load128(p));
}

template <typename T>
ZEL_AVX2 inline __m256i narrow16x8(__m256i x, __m256i y) {
  if constexpr (std::is_same_v<T, uint16_t>) return _mm256_packus_epi32(x, y);
  else return _mm256_packs_epi32(x, y);
}
template <typename T>
ZEL_AVX2 inline __m256i narrow8x8(__m256i x, __m256i y) {
  if constexpr (std::is_same_v<T, uint8_t>) return _mm256_packus_epi16(x, y);
  else return _mm256_packs_epi16(x, y);
}

// Eight 8-bit pixels, four in each 128-bit lane at bytes 0..11, to their
// outputs in the same places. The minimum alone clamps: a value below 0
// (an infinity too) rounds to an integer that the signed and unsigned packs
// take to 0, as the maximum with 0.0 would have; NaN becomes 255 either way.
ZEL_AVX2 ZEL_INLINE __m256i twistEight8u(__m256i px, const __m256 (&t)[3][4]) {
  const Gather& g = kGather<3, 1, false>;
  __m256 f[3];
  for (int ch = 0; ch < 3; ++ch)
    f[ch] = _mm256_cvtepi32_ps(_mm256_shuffle_epi8(px, _mm256_broadcastsi128_si256(mask(g.m[0][ch]))));
  __m256i r[3];
  for (int i = 0; i < 3; ++i) {
    const __m256 o = _mm256_add_ps(_mm256_add_ps(t[i][3], _mm256_mul_ps(f[0], t[i][0])),
                                   _mm256_add_ps(_mm256_mul_ps(f[2], t[i][2]), _mm256_mul_ps(f[1], t[i][1])));
    r[i] = _mm256_cvtps_epi32(_mm256_min_ps(o, _mm256_set1_ps(Sample<uint8_t>::hi)));
  }
  const __m256i n = _mm256_packus_epi16(_mm256_packs_epi32(r[0], r[1]), _mm256_packs_epi32(r[2], r[2]));
  return _mm256_shuffle_epi8(n, _mm256_broadcastsi128_si256(mask(kScatter<3, 1>.m[0][0])));
}

// Sixteen 8-bit three-channel pixels at a time: 48 bytes read whole (in
// place too) before 48 bytes are written.
ZEL_AVX2 int sixteen8uC3(const uint8_t* src, uint8_t* dst, int x, int width, const __m256 (&t)[3][4]) {
  const __m256i first = _mm256_setr_epi32(0, 1, 2, 2, 3, 4, 5, 5);   // bytes 0..23 of a load at 0
  const __m256i second = _mm256_setr_epi32(2, 3, 4, 4, 5, 6, 7, 7);  // bytes 24..47 of a load at 16
  const __m256i low = _mm256_setr_epi32(0, 1, 2, 4, 5, 6, 6, 6);
  const __m256i high = _mm256_setr_epi32(2, 4, 5, 6, 0, 0, 0, 1);
  for (; x + 16 <= width; x += 16) {
    const uint8_t* s = src + x * 3;
    const __m256i a = _mm256_permutevar8x32_epi32(load256(s), first);
    const __m256i b = _mm256_permutevar8x32_epi32(load256(s + 16), second);
    const __m256i lo = _mm256_permutevar8x32_epi32(twistEight8u(a, t), low);
    const __m256i hi = _mm256_permutevar8x32_epi32(twistEight8u(b, t), high);
    uint8_t* d = dst + x * 3;
    store256(d, _mm256_blend_epi32(lo, hi, 0xC0));
    store128(d + 32, _mm256_castsi256_si128(hi));
  }
  return x;
}

template <typename T, int K>
ZEL_AVX2 int wideBlocks(const T* const src[3], T* const dst[3], int x, int width, const Matrix& m) {
  __m256 t[3][4];
  for (int i = 0; i < 3; ++i)
    for (int j = 0; j < 4; ++j) t[i][j] = _mm256_set1_ps(m.t[i][j]);
  if constexpr (std::is_same_v<T, uint8_t> && K == C3) x = sixteen8uC3(src[0], dst[0], x, width, t);
  for (; x + 8 <= width; x += 8) {
    __m256i v[3];
    if constexpr (K == Planar) {
      for (int k = 0; k < 3; ++k) v[k] = widen8(src[k] + x);
    } else {
      const Raw a = rawLoad<T, K>(src[0], x), b = rawLoad<T, K>(src[0], x + 4);
      const __m256i lo = _mm256_set_m128i(b.lo, a.lo), hi = _mm256_set_m128i(b.hi, a.hi);
      for (int ch = 0; ch < 3; ++ch) v[ch] = split8<T, K>(lo, hi, ch);
    }
    const __m256 fa = _mm256_cvtepi32_ps(v[0]), fb = _mm256_cvtepi32_ps(v[1]), fc = _mm256_cvtepi32_ps(v[2]);
    __m256i r[3];
    for (int i = 0; i < 3; ++i) {
      if constexpr (std::is_same_v<T, int8_t>) {
        const __m256 o = _mm256_add_ps(
            _mm256_add_ps(_mm256_add_ps(_mm256_mul_ps(fa, t[i][0]), _mm256_mul_ps(fb, t[i][1])),
                          _mm256_mul_ps(fc, t[i][2])),
            t[i][3]);
        r[i] = _mm256_cvtps_epi32(_mm256_min_ps(o, _mm256_set1_ps(Sample<int8_t>::hi)));
      } else {
        const __m256 o = _mm256_add_ps(_mm256_add_ps(t[i][3], _mm256_mul_ps(fa, t[i][0])),
                                       _mm256_add_ps(_mm256_mul_ps(fc, t[i][2]), _mm256_mul_ps(fb, t[i][1])));
        const __m256 c = _mm256_min_ps(o, _mm256_set1_ps(Sample<T>::hi));
        r[i] = _mm256_cvtps_epi32(_mm256_max_ps(c, _mm256_set1_ps(Sample<T>::lo)));
      }
    }
    if constexpr (K == Planar) {
      for (int k = 0; k < 3; ++k) {
        storePlane(dst[k] + x, _mm256_castsi256_si128(r[k]));
        storePlane(dst[k] + x + 4, _mm256_extracti128_si256(r[k], 1));
      }
    } else {
      __m256i n0, n1 = _mm256_setzero_si256();
      if constexpr (sizeof(T) == 1) {
        n0 = narrow8x8<T>(narrow16x8<T>(r[0], r[1]), narrow16x8<T>(r[2], r[2]));
      } else {
        n0 = narrow16x8<T>(r[0], r[1]);
        n1 = narrow16x8<T>(r[2], r[2]);
      }
      scatter<T, K>(dst[0], x, _mm256_castsi256_si128(n0), _mm256_castsi256_si128(n1));
      scatter<T, K>(dst[0], x + 4, _mm256_extracti128_si256(n0, 1), _mm256_extracti128_si256(n1, 1));
    }
  }
  return x;
}

struct Columns {
  __m128 t[3][4];  // t[i][j]: entry (i, j) in all lanes
  explicit Columns(const Matrix& m) {
    for (int i = 0; i < 3; ++i)
      for (int j = 0; j < 4; ++j) t[i][j] = _mm_set1_ps(m.t[i][j]);
  }
};

inline __m128 output4(const Columns& c, int i, const Lanes3& v) {
  return _mm_add_ps(_mm_add_ps(c.t[i][3], _mm_mul_ps(v.a, c.t[i][0])),
                    _mm_add_ps(_mm_mul_ps(v.c, c.t[i][2]), _mm_mul_ps(v.b, c.t[i][1])));
}
inline __m128 output4of8s(const Columns& c, int i, const Lanes3& v) {
  return _mm_add_ps(_mm_add_ps(_mm_add_ps(_mm_mul_ps(v.a, c.t[i][0]), _mm_mul_ps(v.b, c.t[i][1])),
                               _mm_mul_ps(v.c, c.t[i][2])),
                    c.t[i][3]);
}

template <typename T, int K>
inline void pixel(const T* const src[3], T* const dst[3], int x, const Matrix& m) {
  T in[3];
  if constexpr (K == Planar) {
    for (int k = 0; k < 3; ++k) in[k] = src[k][x];
  } else {
    for (int k = 0; k < 3; ++k) in[k] = src[0][x * K + k];  // the whole pixel before any write
  }
  const float a = float(in[0]), b = float(in[1]), c = float(in[2]);
  for (int i = 0; i < 3; ++i) {
    const T v = Sample<T>::out(m, i, a, b, c);
    if constexpr (K == Planar) dst[i][x] = v;
    else dst[0][x * K + i] = v;
  }
}

}  // namespace

template <typename T, int K>
void row(const T* const src[3], T* const dst[3], int width, const Matrix& m, VectorTier tier) {
  const Columns c(m);
  int x = 0;
  if constexpr (std::is_same_v<T, float> && K == C3) {
    row32fC3(src[0], dst[0], width, m, false, tier);
    return;
  } else if constexpr (std::is_same_v<T, float>) {
    for (; x + 4 <= width; x += 4) {
      Lanes3 v;
      if constexpr (K == Planar) {
        v = {_mm_loadu_ps(src[0] + x), _mm_loadu_ps(src[1] + x), _mm_loadu_ps(src[2] + x)};
      } else {  // AC4: the alpha lane of the loads is dropped by the transpose
        const float* p = src[0] + x * 4;
        __m128 p0 = _mm_loadu_ps(p), p1 = _mm_loadu_ps(p + 4), p2 = _mm_loadu_ps(p + 8), p3 = _mm_loadu_ps(p + 12);
        _MM_TRANSPOSE4_PS(p0, p1, p2, p3);
        v = {p0, p1, p2};
      }
      __m128 o0 = output4(c, 0, v), o1 = output4(c, 1, v), o2 = output4(c, 2, v);
      if constexpr (K == Planar) {
        _mm_storeu_ps(dst[0] + x, o0);
        _mm_storeu_ps(dst[1] + x, o1);
        _mm_storeu_ps(dst[2] + x, o2);
      } else {
        float* p = dst[0] + x * 4;
        __m128 o3 = _mm_setzero_ps();
        _MM_TRANSPOSE4_PS(o0, o1, o2, o3);
        _mm_storeu_ps(p, _mm_blend_ps(o0, _mm_loadu_ps(p), 0x8));
        _mm_storeu_ps(p + 4, _mm_blend_ps(o1, _mm_loadu_ps(p + 4), 0x8));
        _mm_storeu_ps(p + 8, _mm_blend_ps(o2, _mm_loadu_ps(p + 8), 0x8));
        _mm_storeu_ps(p + 12, _mm_blend_ps(o3, _mm_loadu_ps(p + 12), 0x8));
      }
    }
  } else {
    if (tier >= VectorTier::Avx512) x = blocks512<T, K>(src, dst, width, m);
    if (tier >= VectorTier::Avx2) x = wideBlocks<T, K>(src, dst, x, width, m);
    for (; x + 4 <= width; x += 4) {
      const Lanes3 v = load4<T, K>(src, x);
      __m128i r[3];
      for (int i = 0; i < 3; ++i) {
        if constexpr (std::is_same_v<T, int8_t>) {
          r[i] = _mm_cvtps_epi32(_mm_min_ps(output4of8s(c, i, v), _mm_set1_ps(Sample<int8_t>::hi)));
        } else {
          const __m128 o = _mm_min_ps(output4(c, i, v), _mm_set1_ps(Sample<T>::hi));
          r[i] = _mm_cvtps_epi32(_mm_max_ps(o, _mm_set1_ps(Sample<T>::lo)));
        }
      }
      store4<T, K>(dst, x, r[0], r[1], r[2]);
    }
  }
  for (; x < width; ++x) pixel<T, K>(src, dst, x, m);
}

#define ZEL_TWIST_ROWS(T)                                                                      \
  template void row<T, Planar>(const T* const[3], T* const[3], int, const Matrix&, VectorTier); \
  template void row<T, C3>(const T* const[3], T* const[3], int, const Matrix&, VectorTier);     \
  template void row<T, AC4>(const T* const[3], T* const[3], int, const Matrix&, VectorTier);
ZEL_TWIST_ROWS(uint8_t)
ZEL_TWIST_ROWS(int8_t)
ZEL_TWIST_ROWS(uint16_t)
ZEL_TWIST_ROWS(int16_t)
ZEL_TWIST_ROWS(float)
#undef ZEL_TWIST_ROWS

namespace {

// ---- three-channel floats: four pixels (12 samples) per 128-bit lane ----
//
// Split p0 p1 p2 = r0 g0 b0 r1 | g1 b1 r2 g2 | b2 r3 g3 b3 into channels:
// blends gather a channel's four samples in some order, one shuffle puts
// them in pixel order. Each shuffle swaps two pairs of places or none, so
// the same shuffle takes a channel back, and the same blends put the three
// channels together again. The AVX2 form does the same in each 128-bit lane.

inline Lanes3 split32fC3(__m128 p0, __m128 p1, __m128 p2) {
  const __m128 ra = _mm_blend_ps(_mm_blend_ps(p0, p1, 0x4), p2, 0x2);
  const __m128 rb = _mm_blend_ps(_mm_blend_ps(p0, p1, 0x9), p2, 0x4);
  const __m128 rc = _mm_blend_ps(_mm_blend_ps(p0, p1, 0x2), p2, 0x9);
  return {_mm_shuffle_ps(ra, ra, _MM_SHUFFLE(1, 2, 3, 0)), _mm_shuffle_ps(rb, rb, _MM_SHUFFLE(2, 3, 0, 1)),
          _mm_shuffle_ps(rc, rc, _MM_SHUFFLE(3, 0, 1, 2))};
}

struct Pixels3 {
  __m128 q0, q1, q2;
};

inline Pixels3 merge32fC3(__m128 o0, __m128 o1, __m128 o2) {
  const __m128 ra = _mm_shuffle_ps(o0, o0, _MM_SHUFFLE(1, 2, 3, 0));
  const __m128 rb = _mm_shuffle_ps(o1, o1, _MM_SHUFFLE(2, 3, 0, 1));
  const __m128 rc = _mm_shuffle_ps(o2, o2, _MM_SHUFFLE(3, 0, 1, 2));
  return {_mm_blend_ps(_mm_blend_ps(ra, rb, 0x2), rc, 0x4), _mm_blend_ps(_mm_blend_ps(rb, rc, 0x2), ra, 0x4),
          _mm_blend_ps(_mm_blend_ps(rc, ra, 0x2), rb, 0x4)};
}

inline void pixel32fC3(const float* src, float* dst, int64_t x, const Matrix& m) {
  const float* s = src + x * 3;
  const float a = s[0], b = s[1], c = s[2];  // the whole pixel before any write
  for (int i = 0; i < 3; ++i) dst[x * 3 + i] = output(m, i, a, b, c);
}

// Pixels from x on, a pixel at a time, until dst + 3 * x lies on an
// `align`-byte boundary (never past `pixels`). Whole floats reach every
// 64-byte boundary within sixteen pixels.
inline int64_t alignPixels(const float* src, float* dst, int64_t x, int64_t pixels, const Matrix& m, unsigned align) {
  while (x < pixels && (reinterpret_cast<uintptr_t>(dst + x * 3) & (align - 1)) != 0) pixel32fC3(src, dst, x++, m);
  return x;
}

// A streamed run is far larger than the caches: its source is asked for
// this many bytes ahead of the block being read (an address past the end
// of the source is only a hint, never touched).
constexpr uintptr_t kStreamPrefetchBytes = 4096;

inline void prefetchAhead(const float* s) {
  _mm_prefetch(reinterpret_cast<const char*>(reinterpret_cast<uintptr_t>(s) + kStreamPrefetchBytes), _MM_HINT_T0);
}

// Eight pixels per block, pixels x..x+3 in the low lanes and x+4..x+7 in
// the high lanes of every register, 32-byte stores (streamed: dst + 3 * x
// on a 32-byte boundary). Returns where the blocks stop.
template <bool Stream>
ZEL_AVX2 int64_t wide32fC3(const float* src, float* dst, int64_t x, int64_t pixels, const Matrix& m) {
  __m256 t[3][4];
  for (int i = 0; i < 3; ++i)
    for (int j = 0; j < 4; ++j) t[i][j] = _mm256_set1_ps(m.t[i][j]);
  for (; x + 8 <= pixels; x += 8) {
    const float* s = src + x * 3;
    if constexpr (Stream) prefetchAhead(s);
    const __m256 l0 = _mm256_loadu_ps(s), l1 = _mm256_loadu_ps(s + 8), l2 = _mm256_loadu_ps(s + 16);
    // Samples 0..11 of the block in the low lanes, 12..23 in the high lanes.
    const __m256 p0 = _mm256_blend_ps(l0, l1, 0xF0), p1 = _mm256_permute2f128_ps(l0, l2, 0x21),
                 p2 = _mm256_blend_ps(l1, l2, 0xF0);
    const __m256 ra = _mm256_blend_ps(_mm256_blend_ps(p0, p1, 0x44), p2, 0x22);
    const __m256 rb = _mm256_blend_ps(_mm256_blend_ps(p0, p1, 0x99), p2, 0x44);
    const __m256 rc = _mm256_blend_ps(_mm256_blend_ps(p0, p1, 0x22), p2, 0x99);
    const __m256 v[3] = {_mm256_permute_ps(ra, _MM_SHUFFLE(1, 2, 3, 0)), _mm256_permute_ps(rb, _MM_SHUFFLE(2, 3, 0, 1)),
                         _mm256_permute_ps(rc, _MM_SHUFFLE(3, 0, 1, 2))};
    __m256 o[3];
    for (int i = 0; i < 3; ++i)
      o[i] = _mm256_add_ps(_mm256_add_ps(t[i][3], _mm256_mul_ps(v[0], t[i][0])),
                           _mm256_add_ps(_mm256_mul_ps(v[2], t[i][2]), _mm256_mul_ps(v[1], t[i][1])));
    const __m256 sa = _mm256_permute_ps(o[0], _MM_SHUFFLE(1, 2, 3, 0));
    const __m256 sb = _mm256_permute_ps(o[1], _MM_SHUFFLE(2, 3, 0, 1));
    const __m256 sc = _mm256_permute_ps(o[2], _MM_SHUFFLE(3, 0, 1, 2));
    const __m256 q0 = _mm256_blend_ps(_mm256_blend_ps(sa, sb, 0x22), sc, 0x44);
    const __m256 q1 = _mm256_blend_ps(_mm256_blend_ps(sb, sc, 0x22), sa, 0x44);
    const __m256 q2 = _mm256_blend_ps(_mm256_blend_ps(sc, sa, 0x22), sb, 0x44);
    const __m256 w0 = _mm256_permute2f128_ps(q0, q1, 0x20), w1 = _mm256_blend_ps(q2, q0, 0xF0),
                 w2 = _mm256_permute2f128_ps(q1, q2, 0x31);
    float* d = dst + x * 3;
    if constexpr (Stream) {
      _mm256_stream_ps(d, w0);
      _mm256_stream_ps(d + 8, w1);
      _mm256_stream_ps(d + 16, w2);
    } else {
      _mm256_storeu_ps(d, w0);
      _mm256_storeu_ps(d + 8, w1);
      _mm256_storeu_ps(d + 16, w2);
    }
  }
  return x;
}

}  // namespace

void row32fC3(const float* src, float* dst, int64_t pixels, const Matrix& m, bool stream, VectorTier tier) {
  const Columns c(m);
  // Streaming needs whole floats; the first pixels then go one by one until
  // the stores are aligned, and every block store is a whole aligned one.
  const bool streamed = stream && (reinterpret_cast<uintptr_t>(dst) & 3) == 0;
  int64_t x = 0;
  if (streamed) x = alignPixels(src, dst, x, pixels, m, tier >= VectorTier::Avx512 ? 64 : tier >= VectorTier::Avx2 ? 32 : 16);
  if (tier >= VectorTier::Avx512)
    x = streamed ? blocks32fC3<true>(src, dst, x, pixels, m) : blocks32fC3<false>(src, dst, x, pixels, m);
  if (tier >= VectorTier::Avx2)
    x = streamed ? wide32fC3<true>(src, dst, x, pixels, m) : wide32fC3<false>(src, dst, x, pixels, m);
  for (; x + 4 <= pixels; x += 4) {
    const float* s = src + x * 3;
    if (streamed) prefetchAhead(s);
    const Lanes3 v = split32fC3(_mm_loadu_ps(s), _mm_loadu_ps(s + 4), _mm_loadu_ps(s + 8));
    const Pixels3 q = merge32fC3(output4(c, 0, v), output4(c, 1, v), output4(c, 2, v));
    float* d = dst + x * 3;
    if (streamed) {
      _mm_stream_ps(d, q.q0);
      _mm_stream_ps(d + 4, q.q1);
      _mm_stream_ps(d + 8, q.q2);
    } else {
      _mm_storeu_ps(d, q.q0);
      _mm_storeu_ps(d + 4, q.q1);
      _mm_storeu_ps(d + 8, q.q2);
    }
  }
  for (; x < pixels; ++x) pixel32fC3(src, dst, x, m);
  if (stream) _mm_sfence();
}

void row32fC4(const float* src, float* dst, int64_t pixels, const Matrix& m) {
  __m128 t[4][4];
  for (int i = 0; i < 4; ++i)
    for (int j = 0; j < 4; ++j) t[i][j] = _mm_set1_ps(m.t[i][j]);
  int64_t x = 0;
  for (; x + 4 <= pixels; x += 4) {
    const float* s = src + x * 4;
    __m128 px = _mm_loadu_ps(s), py = _mm_loadu_ps(s + 4), pz = _mm_loadu_ps(s + 8), pw = _mm_loadu_ps(s + 12);
    _MM_TRANSPOSE4_PS(px, py, pz, pw);
    __m128 o[4];
    for (int i = 0; i < 4; ++i)
      o[i] = _mm_add_ps(_mm_mul_ps(t[i][3], pw),
                        _mm_add_ps(_mm_mul_ps(t[i][2], pz),
                                   _mm_add_ps(_mm_mul_ps(t[i][0], px), _mm_mul_ps(t[i][1], py))));
    _MM_TRANSPOSE4_PS(o[0], o[1], o[2], o[3]);
    float* d = dst + x * 4;
    for (int k = 0; k < 4; ++k) _mm_storeu_ps(d + 4 * k, o[k]);
  }
  for (; x < pixels; ++x) {
    const float* s = src + x * 4;
    const float px = s[0], py = s[1], pz = s[2], pw = s[3];
    for (int i = 0; i < 4; ++i) dst[x * 4 + i] = output4(m, i, px, py, pz, pw);
  }
}

namespace {

// Rows one by one. Kept out of line so that no sample arithmetic moves
// across the change of the rounding mode around it.
template <typename T, int K>
__attribute__((noinline)) void walk(const T* const* srcPlanes, int srcStep, T* const* dstPlanes, int dstStep,
                                    ImageSize size, const Matrix& m) {
  const int planes = K == Planar ? 3 : 1;
  const VectorTier tier = std::is_same_v<T, float> ? zel::widestTier() : zel::widestTierWithBytePermutes();
  plainWalk(size.height, [&](int y) {
    const T* s[3];
    T* d[3];
    for (int k = 0; k < 3; ++k) {
      s[k] = rowAt(srcPlanes[k < planes ? k : 0], srcStep, y);
      d[k] = rowAt(dstPlanes[k < planes ? k : 0], dstStep, y);
    }
    row<T, K>(s, d, size.width, m, tier);
  });
}

// After the pointers: size, then steps; the integer types under nearest
// rounding.
template <typename T, int K>
Status twistImage(const T* const* srcPlanes, int srcStep, T* const* dstPlanes, int dstStep, ImageSize size,
                  const float twist[3][4]) {
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (srcStep < 1 || dstStep < 1) return StatusStepError;
  const Matrix m = matrix3(twist);
  if constexpr (std::is_same_v<T, float>) {
    walk<T, K>(srcPlanes, srcStep, dstPlanes, dstStep, size, m);
  } else {
    NearestRounding nearest;
    walk<T, K>(srcPlanes, srcStep, dstPlanes, dstStep, size, m);
  }
  return StatusOk;
}

template <typename T, int K>
Status twistPixels(const T* src, int srcStep, T* dst, int dstStep, ImageSize size, const float twist[3][4]) {
  if (!src || !dst || !twist) return StatusNullPointerError;
  const T* s[1] = {src};
  T* d[1] = {dst};
  return twistImage<T, K>(s, srcStep, d, dstStep, size, twist);
}

template <typename T>
Status twistPlanes(const T* const srcPlanes[3], int srcStep, T* const dstPlanes[3], int dstStep, ImageSize size,
                   const float twist[3][4]) {
  if (!srcPlanes || !dstPlanes || !twist) return StatusNullPointerError;
  for (int k = 0; k < 3; ++k)
    if (!srcPlanes[k] || !dstPlanes[k]) return StatusNullPointerError;
  return twistImage<T, Planar>(srcPlanes, srcStep, dstPlanes, dstStep, size, twist);
}

}  // namespace

}  // namespace zel::twist

using namespace zel::twist;
using zel::plainWalk;
using zel::rowAt;

#define ZEL_TWIST_INT(T, tok)                                                                                       \
  ZEL_PUBLIC Status zeliColorTwist32f_##tok##_C3R(const T* src, int srcStep, T* dst, int dstStep, ImageSize size,   \
                                                  const float twist[3][4]) {                                       \
    return twistPixels<T, C3>(src, srcStep, dst, dstStep, size, twist);                                            \
  }                                                                                                                 \
  ZEL_PUBLIC Status zeliColorTwist32f_##tok##_AC4R(const T* src, int srcStep, T* dst, int dstStep, ImageSize size,  \
                                                   const float twist[3][4]) {                                      \
    return twistPixels<T, AC4>(src, srcStep, dst, dstStep, size, twist);                                           \
  }                                                                                                                 \
  ZEL_PUBLIC Status zeliColorTwist32f_##tok##_C3IR(T* srcDst, int srcDstStep, ImageSize size,                       \
                                                   const float twist[3][4]) {                                      \
    return twistPixels<T, C3>(srcDst, srcDstStep, srcDst, srcDstStep, size, twist);                                \
  }                                                                                                                 \
  ZEL_PUBLIC Status zeliColorTwist32f_##tok##_AC4IR(T* srcDst, int srcDstStep, ImageSize size,                      \
                                                    const float twist[3][4]) {                                     \
    return twistPixels<T, AC4>(srcDst, srcDstStep, srcDst, srcDstStep, size, twist);                               \
  }                                                                                                                 \
  ZEL_PUBLIC Status zeliColorTwist32f_##tok##_P3R(const T* const srcPlanes[3], int srcStep, T* const dstPlanes[3],  \
                                                  int dstStep, ImageSize size, const float twist[3][4]) {          \
    return twistPlanes<T>(srcPlanes, srcStep, dstPlanes, dstStep, size, twist);                                    \
  }                                                                                                                 \
  ZEL_PUBLIC Status zeliColorTwist32f_##tok##_IP3R(T* const srcDstPlanes[3], int srcDstStep, ImageSize size,        \
                                                   const float twist[3][4]) {                                      \
    return twistPlanes<T>(srcDstPlanes, srcDstStep, srcDstPlanes, srcDstStep, size, twist);                        \
  }

ZEL_TWIST_INT(uint8_t, 8u)
ZEL_TWIST_INT(int8_t, 8s)
ZEL_TWIST_INT(uint16_t, 16u)
ZEL_TWIST_INT(int16_t, 16s)

// Three-channel floats: rows of width * 12 bytes on both sides merge into
// one run; an image of 34993 samples or more streams its destination.
ZEL_PUBLIC Status zeliColorTwist_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size,
                                         const float twist[3][4]) {
  if (!src || !dst || !twist) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (srcStep < 1 || dstStep < 1) return StatusStepError;
  const Matrix m = matrix3(twist);
  const bool stream = streamsC3(size.width, size.height);
  const zel::VectorTier tier = zel::widestTier();
  if (mergesC3(srcStep, dstStep, size.width)) {
    row32fC3(src, dst, int64_t(size.width) * size.height, m, stream, tier);
    return StatusOk;
  }
  plainWalk(size.height,
            [&](int y) { row32fC3(rowAt(src, srcStep, y), rowAt(dst, dstStep, y), size.width, m, stream, tier); });
  return StatusOk;
}
ZEL_PUBLIC Status zeliColorTwist_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size,
                                          const float twist[3][4]) {
  return twistPixels<float, AC4>(src, srcStep, dst, dstStep, size, twist);
}
ZEL_PUBLIC Status zeliColorTwist_32f_C3IR(float* srcDst, int srcDstStep, ImageSize size, const float twist[3][4]) {
  return twistPixels<float, C3>(srcDst, srcDstStep, srcDst, srcDstStep, size, twist);
}
ZEL_PUBLIC Status zeliColorTwist_32f_AC4IR(float* srcDst, int srcDstStep, ImageSize size, const float twist[3][4]) {
  return twistPixels<float, AC4>(srcDst, srcDstStep, srcDst, srcDstStep, size, twist);
}
ZEL_PUBLIC Status zeliColorTwist_32f_P3R(const float* const srcPlanes[3], int srcStep, float* const dstPlanes[3],
                                         int dstStep, ImageSize size, const float twist[3][4]) {
  return twistPlanes<float>(srcPlanes, srcStep, dstPlanes, dstStep, size, twist);
}
ZEL_PUBLIC Status zeliColorTwist_32f_IP3R(float* const srcDstPlanes[3], int srcDstStep, ImageSize size,
                                          const float twist[3][4]) {
  return twistPlanes<float>(srcDstPlanes, srcDstStep, srcDstPlanes, srcDstStep, size, twist);
}

// Four-channel floats: a 4 by 4 matrix without constants. Steps of
// width * 4 bytes on both sides merge width * height pixels into one run.
ZEL_PUBLIC Status zeliColorTwist_32f_C4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size,
                                         const float twist[4][4]) {
  if (!src || !dst || !twist) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (srcStep < 1 || dstStep < 1) return StatusStepError;
  const Matrix m = matrix4(twist);
  if (mergesC4(srcStep, dstStep, size.width)) {
    row32fC4(src, dst, int64_t(size.width) * size.height, m);
    return StatusOk;
  }
  plainWalk(size.height, [&](int y) { row32fC4(rowAt(src, srcStep, y), rowAt(dst, dstStep, y), size.width, m); });
  return StatusOk;
}
