// Photo YCC with 16-bit and 32-bit float samples, all in single precision.
// 16-bit rows: four pixels at a time in float lanes below width AND NOT 3,
// rounded to nearest; the last pixels by the sample type's own truncating
// tail. Float rows: one formula for every pixel.
#include <cstring>

#include "frame/export.h"
#include "luma_chroma/photo_ycc_forms.h"
#include "luma_chroma/photo_ycc_kernels.h"
#include "luma_chroma/vector_units.h"
#include "luma_chroma/yuv_driver.h"

namespace zel::lc {

namespace {

inline __m128i mask(const Shuffle16& m) { return load128(m.b); }

// 16-bit element `channel` of four pixels of `stride` elements, zero-extended
// into 32-bit lanes, from the 16-byte part `part` of the pixels' bytes.
constexpr Shuffle16 gatherWords(int stride, int channel, int part) {
  Shuffle16 m{};
  for (int i = 0; i < 16; ++i) m.b[i] = -128;
  for (int lane = 0; lane < 4; ++lane) {
    const int e = stride * lane + channel;
    if (e / 8 != part) continue;
    m.b[4 * lane] = int8_t(2 * (e % 8));
    m.b[4 * lane + 1] = int8_t(2 * (e % 8) + 1);
  }
  return m;
}

// Words 8 * part .. 8 * part + 7 of four pixels of `stride` words, from
// P = c0 c0 c0 c0 c1 c1 c1 c1 (source 0) or Q = c2 c2 c2 c2 ... (source 1);
// a fourth channel is left zero.
constexpr Shuffle16 scatterWords(int stride, int part, int source) {
  Shuffle16 m{};
  for (int w = 0; w < 8; ++w) {
    const int word = 8 * part + w, px = word / stride, ch = word % stride;
    int from = -1;
    if (source == 0 && ch < 2) from = 4 * ch + px;
    if (source == 1 && ch == 2) from = px;
    m.b[2 * w] = from < 0 ? int8_t(-128) : int8_t(2 * from);
    m.b[2 * w + 1] = from < 0 ? int8_t(-128) : int8_t(2 * from + 1);
  }
  return m;
}

template <int Stride>
struct WordMasks {
  static constexpr Shuffle16 gather[3][2] = {{gatherWords(Stride, 0, 0), gatherWords(Stride, 0, 1)},
                                          {gatherWords(Stride, 1, 0), gatherWords(Stride, 1, 1)},
                                          {gatherWords(Stride, 2, 0), gatherWords(Stride, 2, 1)}};
  static constexpr Shuffle16 scatter[2][2] = {{scatterWords(Stride, 0, 0), scatterWords(Stride, 0, 1)},
                                           {scatterWords(Stride, 1, 0), scatterWords(Stride, 1, 1)}};
};

template <typename T>
T loadSample(const T* p) {
  T v;
  std::memcpy(&v, p, sizeof v);
  return v;
}
template <typename T>
void storeSample(T* p, T v) {
  std::memcpy(p, &v, sizeof v);
}

// 16-bit samples; signed ones are read as sample + 32768 (the top bit
// flipped), the unsigned range of the body.
template <int Channels, bool Signed>
struct Read16 {
  const uint16_t* p;
  Floats3 get4(int x) const {
    using M = WordMasks<Channels>;
    const uint16_t* s = p + Channels * x;
    const __m128i a = load128(s);
    const __m128i b = Channels == 3 ? load64(s + 8) : load128(s + 8);
    const __m128i flip = _mm_set1_epi32(Signed ? 0x8000 : 0);
    auto channel = [&](int c) {
      const __m128i v =
          _mm_or_si128(_mm_shuffle_epi8(a, mask(M::gather[c][0])), _mm_shuffle_epi8(b, mask(M::gather[c][1])));
      return _mm_cvtepi32_ps(_mm_xor_si128(v, flip));
    };
    return {channel(0), channel(1), channel(2)};
  }
  // Eight pixels: pixels 0..3 in the low 128-bit lane, 4..7 in the high one.
  ZEL_AVX2 ZEL_INLINE FloatTrio<Ps8> get8(int x) const {
    const uint16_t* s = p + Channels * x;
    const __m256i a = _mm256_inserti128_si256(_mm256_castsi128_si256(load128(s)), load128(s + 4 * Channels), 1);
    const __m256i b =
        Channels == 3
            ? _mm256_inserti128_si256(_mm256_castsi128_si256(load64(s + 8)), load64(s + 8 + 4 * Channels), 1)
            : _mm256_inserti128_si256(_mm256_castsi128_si256(load128(s + 8)), load128(s + 8 + 4 * Channels), 1);
    return {channel8(a, b, 0), channel8(a, b, 1), channel8(a, b, 2)};
  }
  ZEL_AVX2 ZEL_INLINE static __m256 channel8(__m256i a, __m256i b, int c) {
    using M = WordMasks<Channels>;
    const __m256i v = _mm256_or_si256(_mm256_shuffle_epi8(a, broadcast128(M::gather[c][0].b)),
                                      _mm256_shuffle_epi8(b, broadcast128(M::gather[c][1].b)));
    return _mm256_cvtepi32_ps(_mm256_xor_si256(v, _mm256_set1_epi32(Signed ? 0x8000 : 0)));
  }
  // Samples as the tails take them: unsigned, or signed values.
  Samples3 pixel(int x) const {
    const uint16_t* s = p + Channels * x;
    auto value = [](uint16_t w) { return Signed ? int(int16_t(w)) : int(w); };
    return {value(loadSample(s)), value(loadSample(s + 1)), value(loadSample(s + 2))};
  }
};

template <int Channels, bool Signed>
struct Write16 {
  uint16_t* p;
  // Rounded 32-bit results: clamped to 0..65535, less 32768 when signed.
  void put4(int x, __m128i c0, __m128i c1, __m128i c2) const {
    using M = WordMasks<Channels>;
    const __m128i flip = _mm_set1_epi16(Signed ? int16_t(-32768) : 0);
    const __m128i P = _mm_xor_si128(_mm_packus_epi32(c0, c1), flip);
    const __m128i Q = _mm_xor_si128(_mm_packus_epi32(c2, c2), flip);
    const __m128i out0 =
        _mm_or_si128(_mm_shuffle_epi8(P, mask(M::scatter[0][0])), _mm_shuffle_epi8(Q, mask(M::scatter[0][1])));
    const __m128i out1 =
        _mm_or_si128(_mm_shuffle_epi8(P, mask(M::scatter[1][0])), _mm_shuffle_epi8(Q, mask(M::scatter[1][1])));
    uint16_t* d = p + Channels * x;
    if constexpr (Channels == 3) {
      store128(d, out0);
      store64(d + 8, out1);
    } else {
      store128(d, _mm_blend_epi16(out0, load128(d), 0x88));
      store128(d + 8, _mm_blend_epi16(out1, load128(d + 8), 0x88));
    }
  }
  // Eight pixels as put4 stores four, from the two 128-bit lanes.
  ZEL_AVX2 ZEL_INLINE void put8(int x, __m256i c0, __m256i c1, __m256i c2) const {
    using M = WordMasks<Channels>;
    const __m256i flip = _mm256_set1_epi16(Signed ? int16_t(-32768) : 0);
    const __m256i P = _mm256_xor_si256(_mm256_packus_epi32(c0, c1), flip);
    const __m256i Q = _mm256_xor_si256(_mm256_packus_epi32(c2, c2), flip);
    const __m256i out0 = _mm256_or_si256(_mm256_shuffle_epi8(P, broadcast128(M::scatter[0][0].b)),
                                         _mm256_shuffle_epi8(Q, broadcast128(M::scatter[0][1].b)));
    const __m256i out1 = _mm256_or_si256(_mm256_shuffle_epi8(P, broadcast128(M::scatter[1][0].b)),
                                         _mm256_shuffle_epi8(Q, broadcast128(M::scatter[1][1].b)));
    uint16_t* d = p + Channels * x;
    if constexpr (Channels == 3) {
      store128(d, _mm256_castsi256_si128(out0));
      store64(d + 8, _mm256_castsi256_si128(out1));
      store128(d + 12, _mm256_extracti128_si256(out0, 1));
      store64(d + 20, _mm256_extracti128_si256(out1, 1));
    } else {
      auto* v = reinterpret_cast<__m256i*>(d);
      const __m256i first = _mm256_permute2x128_si256(out0, out1, 0x20);
      const __m256i second = _mm256_permute2x128_si256(out0, out1, 0x31);
      _mm256_storeu_si256(v, _mm256_blend_epi16(first, _mm256_loadu_si256(v), 0x88));
      _mm256_storeu_si256(v + 1, _mm256_blend_epi16(second, _mm256_loadu_si256(v + 1), 0x88));
    }
  }
  void putWords(int x, Word3 w) const {
    uint16_t* d = p + Channels * x;
    storeSample(d, w.c0);
    storeSample(d + 1, w.c1);
    storeSample(d + 2, w.c2);
  }
};

template <int Channels>
struct Read32f {
  const float* p;
  Floats3 get4(int x) const {
    const float* s = p + Channels * x;
    if constexpr (Channels == 3) {
      const __m128 a = _mm_loadu_ps(s), b = _mm_loadu_ps(s + 4), c = _mm_loadu_ps(s + 8);
      const __m128 r = _mm_blend_ps(_mm_blend_ps(a, b, 0x4), c, 0x2);  // a0 c1 b2 a3
      const __m128 g = _mm_blend_ps(_mm_blend_ps(a, b, 0x9), c, 0x4);  // b0 a1 c2 b3
      const __m128 bl = _mm_blend_ps(_mm_blend_ps(a, b, 0x2), c, 0x9);  // c0 b1 a2 c3
      return {_mm_shuffle_ps(r, r, _MM_SHUFFLE(1, 2, 3, 0)), _mm_shuffle_ps(g, g, _MM_SHUFFLE(2, 3, 0, 1)),
              _mm_shuffle_ps(bl, bl, _MM_SHUFFLE(3, 0, 1, 2))};
    } else {
      __m128 p0 = _mm_loadu_ps(s), p1 = _mm_loadu_ps(s + 4), p2 = _mm_loadu_ps(s + 8), p3 = _mm_loadu_ps(s + 12);
      _MM_TRANSPOSE4_PS(p0, p1, p2, p3);
      return {p0, p1, p2};
    }
  }
  // Eight pixels, 0..3 in the low 128-bit lane and 4..7 in the high one,
  // split as get4 splits four.
  ZEL_AVX2 ZEL_INLINE FloatTrio<Ps8> get8(int x) const {
    const float* s = p + Channels * x;
    if constexpr (Channels == 3) {
      const __m256 a = pair8(s + 0), b = pair8(s + 4), c = pair8(s + 8);
      const __m256 r = _mm256_blend_ps(_mm256_blend_ps(a, b, 0x44), c, 0x22);
      const __m256 g = _mm256_blend_ps(_mm256_blend_ps(a, b, 0x99), c, 0x44);
      const __m256 bl = _mm256_blend_ps(_mm256_blend_ps(a, b, 0x22), c, 0x99);
      return {_mm256_shuffle_ps(r, r, _MM_SHUFFLE(1, 2, 3, 0)), _mm256_shuffle_ps(g, g, _MM_SHUFFLE(2, 3, 0, 1)),
              _mm256_shuffle_ps(bl, bl, _MM_SHUFFLE(3, 0, 1, 2))};
    } else {
      const __m256 p0 = pair8(s + 0), p1 = pair8(s + 4), p2 = pair8(s + 8), p3 = pair8(s + 12);
      const __m256 t0 = _mm256_unpacklo_ps(p0, p1), t1 = _mm256_unpacklo_ps(p2, p3);
      const __m256 t2 = _mm256_unpackhi_ps(p0, p1), t3 = _mm256_unpackhi_ps(p2, p3);
      return {_mm256_shuffle_ps(t0, t1, _MM_SHUFFLE(1, 0, 1, 0)), _mm256_shuffle_ps(t0, t1, _MM_SHUFFLE(3, 2, 3, 2)),
              _mm256_shuffle_ps(t2, t3, _MM_SHUFFLE(1, 0, 1, 0))};
    }
  }
  // Four floats at s in the low lane, four at s + 4 Channels (four pixels
  // on) in the high one.
  ZEL_AVX2 ZEL_INLINE static __m256 pair8(const float* s) {
    return _mm256_insertf128_ps(_mm256_castps128_ps256(_mm_loadu_ps(s)), _mm_loadu_ps(s + 4 * Channels), 1);
  }
  Float3 pixel(int x) const {
    const float* s = p + Channels * x;
    return {loadSample(s), loadSample(s + 1), loadSample(s + 2)};
  }
};

template <int Channels>
struct Write32f {
  float* p;
  void put4(int x, const Floats3& v) const {
    float* d = p + Channels * x;
    if constexpr (Channels == 3) {
      const __m128 r = _mm_shuffle_ps(v.c0, v.c0, _MM_SHUFFLE(1, 2, 3, 0));  // R0 R3 R2 R1
      const __m128 g = _mm_shuffle_ps(v.c1, v.c1, _MM_SHUFFLE(2, 3, 0, 1));  // G1 G0 G3 G2
      const __m128 b = _mm_shuffle_ps(v.c2, v.c2, _MM_SHUFFLE(3, 0, 1, 2));  // B2 B1 B0 B3
      _mm_storeu_ps(d, _mm_blend_ps(_mm_blend_ps(r, g, 0x2), b, 0x4));      // R0 G0 B0 R1
      _mm_storeu_ps(d + 4, _mm_blend_ps(_mm_blend_ps(r, g, 0x9), b, 0x2));  // G1 B1 R2 G2
      _mm_storeu_ps(d + 8, _mm_blend_ps(_mm_blend_ps(r, b, 0x9), g, 0x4));  // B2 R3 G3 B3
    } else {
      __m128 p0 = v.c0, p1 = v.c1, p2 = v.c2, p3 = _mm_setzero_ps();
      _MM_TRANSPOSE4_PS(p0, p1, p2, p3);
      _mm_storeu_ps(d, _mm_blend_ps(p0, _mm_loadu_ps(d), 0x8));
      _mm_storeu_ps(d + 4, _mm_blend_ps(p1, _mm_loadu_ps(d + 4), 0x8));
      _mm_storeu_ps(d + 8, _mm_blend_ps(p2, _mm_loadu_ps(d + 8), 0x8));
      _mm_storeu_ps(d + 12, _mm_blend_ps(p3, _mm_loadu_ps(d + 12), 0x8));
    }
  }
  ZEL_AVX2 ZEL_INLINE void put8(int x, const FloatTrio<Ps8>& v) const {
    float* d = p + Channels * x;
    if constexpr (Channels == 3) {
      const __m256 r = _mm256_shuffle_ps(v.c0, v.c0, _MM_SHUFFLE(1, 2, 3, 0));
      const __m256 g = _mm256_shuffle_ps(v.c1, v.c1, _MM_SHUFFLE(2, 3, 0, 1));
      const __m256 b = _mm256_shuffle_ps(v.c2, v.c2, _MM_SHUFFLE(3, 0, 1, 2));
      storePair8(d + 0, _mm256_blend_ps(_mm256_blend_ps(r, g, 0x22), b, 0x44));
      storePair8(d + 4, _mm256_blend_ps(_mm256_blend_ps(r, g, 0x99), b, 0x22));
      storePair8(d + 8, _mm256_blend_ps(_mm256_blend_ps(r, b, 0x99), g, 0x44));
    } else {
      const __m256 t0 = _mm256_unpacklo_ps(v.c0, v.c1), t2 = _mm256_unpackhi_ps(v.c0, v.c1);
      const __m256 t1 = _mm256_unpacklo_ps(v.c2, _mm256_setzero_ps()), t3 = _mm256_unpackhi_ps(v.c2, _mm256_setzero_ps());
      const __m256 q[4] = {_mm256_shuffle_ps(t0, t1, _MM_SHUFFLE(1, 0, 1, 0)), _mm256_shuffle_ps(t0, t1, _MM_SHUFFLE(3, 2, 3, 2)),
                           _mm256_shuffle_ps(t2, t3, _MM_SHUFFLE(1, 0, 1, 0)), _mm256_shuffle_ps(t2, t3, _MM_SHUFFLE(3, 2, 3, 2))};
      for (int k = 0; k < 4; ++k) {
        // The fourth sample of each pixel stays as it is.
        storePair8(d + 4 * k, _mm256_blend_ps(q[k], Read32f<Channels>::pair8(d + 4 * k), 0x88));
      }
    }
  }
  ZEL_AVX2 ZEL_INLINE static void storePair8(float* d, __m256 w) {
    _mm_storeu_ps(d, _mm256_castps256_ps128(w));
    _mm_storeu_ps(d + 4 * Channels, _mm256_extractf128_ps(w, 1));
  }
  void putPixel(int x, Float3 v) const {
    float* d = p + Channels * x;
    storeSample(d, v.c0);
    storeSample(d + 1, v.c1);
    storeSample(d + 2, v.c2);
  }
};

// Eight-pixel blocks of the 16-bit body below `end` (a multiple of 4), in
// AVX2; returns where they stop.
template <int Channels, bool Signed, typename Body>
ZEL_AVX2 __attribute__((flatten)) int yccBlocks16Avx(const uint16_t* src, uint16_t* dst, int end, Body body) {
  const Read16<Channels, Signed> in{src};
  const Write16<Channels, Signed> out{dst};
  int x = 0;
  for (; x + 8 <= end; x += 8) {
    const FloatTrio<Ps8> v = in.get8(x);
    const FloatTrio<Ps8> r = body(v.c0, v.c1, v.c2);
    out.put8(x, _mm256_cvtps_epi32(r.c0), _mm256_cvtps_epi32(r.c1), _mm256_cvtps_epi32(r.c2));
  }
  return x;
}

// A 16-bit row: the float body, rounded, over [0, width AND NOT 3), then
// the tail.
template <int Channels, bool Signed, typename Body, typename Tail>
void yccRow16(const uint16_t* src, uint16_t* dst, int width, Body body, Tail tail, bool avx2) {
  const Read16<Channels, Signed> in{src};
  const Write16<Channels, Signed> out{dst};
  const int end = bodyEnd(width, 4);
  int x = avx2 ? yccBlocks16Avx<Channels, Signed>(src, dst, end, body) : 0;
  for (; x < end; x += 4) {
    const Floats3 v = in.get4(x);
    const Floats3 r = body(v.c0, v.c1, v.c2);
    out.put4(x, RoundEven(r.c0), RoundEven(r.c1), RoundEven(r.c2));
  }
  for (; x < width; ++x) {
    const Samples3 s = in.pixel(x);
    out.putWords(x, tail(s.c0, s.c1, s.c2));
  }
}

template <int Channels, typename Form>
ZEL_AVX2 __attribute__((flatten)) int yccBlocks32fAvx(const float* src, float* dst, int width, Form form) {
  const Read32f<Channels> in{src};
  const Write32f<Channels> out{dst};
  int x = 0;
  for (; x + 8 <= width; x += 8) {
    const FloatTrio<Ps8> v = in.get8(x);
    out.put8(x, form(v.c0, v.c1, v.c2));
  }
  return x;
}

template <int Channels, typename Form>
void yccRow32f(const float* src, float* dst, int width, Form form, bool avx2) {
  const Read32f<Channels> in{src};
  const Write32f<Channels> out{dst};
  int x = avx2 ? yccBlocks32fAvx<Channels>(src, dst, width, form) : 0;
  for (; x + 4 <= width; x += 4) {
    const Floats3 v = in.get4(x);
    out.put4(x, form(v.c0, v.c1, v.c2));
  }
  for (; x < width; ++x) {
    const Float3 v = in.pixel(x);
    out.putPixel(x, form(v.c0, v.c1, v.c2));
  }
}

}  // namespace

template <int Channels, bool Signed>
void rgbToYcc16Row(const uint16_t* src, uint16_t* dst, int width, bool avx2) {
  yccRow16<Channels, Signed>(src, dst, width, RgbToYccBody16Form{}, Signed ? rgbToYccTail16s : rgbToYccTail16u, avx2);
}

template <int Channels, bool Signed>
void yccToRgb16Row(const uint16_t* src, uint16_t* dst, int width, bool avx2) {
  yccRow16<Channels, Signed>(src, dst, width, YccToRgbBody16Form{}, Signed ? yccToRgbTail16s : yccToRgbTail16u, avx2);
}

template <int Channels>
void rgbToYcc32fRow(const float* src, float* dst, int width, bool avx2) {
  yccRow32f<Channels>(src, dst, width, RgbToYcc32fForm{}, avx2);
}

template <int Channels>
void yccToRgb32fRow(const float* src, float* dst, int width, bool avx2) {
  yccRow32f<Channels>(src, dst, width, YccToRgb32fForm{}, avx2);
}

template void rgbToYcc16Row<3, false>(const uint16_t*, uint16_t*, int, bool);
template void rgbToYcc16Row<4, false>(const uint16_t*, uint16_t*, int, bool);
template void rgbToYcc16Row<3, true>(const uint16_t*, uint16_t*, int, bool);
template void rgbToYcc16Row<4, true>(const uint16_t*, uint16_t*, int, bool);
template void yccToRgb16Row<3, false>(const uint16_t*, uint16_t*, int, bool);
template void yccToRgb16Row<4, false>(const uint16_t*, uint16_t*, int, bool);
template void yccToRgb16Row<3, true>(const uint16_t*, uint16_t*, int, bool);
template void yccToRgb16Row<4, true>(const uint16_t*, uint16_t*, int, bool);
template void rgbToYcc32fRow<3>(const float*, float*, int, bool);
template void rgbToYcc32fRow<4>(const float*, float*, int, bool);
template void yccToRgb32fRow<3>(const float*, float*, int, bool);
template void yccToRgb32fRow<4>(const float*, float*, int, bool);

}  // namespace zel::lc

using namespace zel::lc;

namespace {

// Signed samples travel as their 16-bit patterns.
const uint16_t* words(const int16_t* p) { return reinterpret_cast<const uint16_t*>(p); }
uint16_t* words(int16_t* p) { return reinterpret_cast<uint16_t*>(p); }
const uint16_t* words(const uint16_t* p) { return p; }
uint16_t* words(uint16_t* p) { return p; }
const float* words(const float* p) { return p; }
float* words(float* p) { return p; }

// A plain walk of one row kernel, on the vector width of the processor.
template <auto Row, typename T>
Status walk(const T* src, int srcStep, T* dst, int dstStep, ImageSize size) {
  const bool avx2 = zel::hasAvx2();
  return walkElements(src, srcStep, dst, dstStep, size,
                      [avx2](const T* s, T* d, int w) { Row(words(s), words(d), w, avx2); });
}

}  // namespace

ZEL_PUBLIC Status zeliRGBToYCC_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size) {
  return walk<rgbToYcc16Row<3, false>>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToYCC_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size) {
  return walk<rgbToYcc16Row<4, false>>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToYCC_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size) {
  return walk<rgbToYcc16Row<3, true>>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToYCC_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size) {
  return walk<rgbToYcc16Row<4, true>>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToYCC_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return walk<rgbToYcc32fRow<3>>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToYCC_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return walk<rgbToYcc32fRow<4>>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliYCCToRGB_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size) {
  return walk<yccToRgb16Row<3, false>>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliYCCToRGB_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep, ImageSize size) {
  return walk<yccToRgb16Row<4, false>>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliYCCToRGB_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size) {
  return walk<yccToRgb16Row<3, true>>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliYCCToRGB_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size) {
  return walk<yccToRgb16Row<4, true>>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliYCCToRGB_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return walk<yccToRgb32fRow<3>>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliYCCToRGB_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return walk<yccToRgb32fRow<4>>(src, srcStep, dst, dstStep, size);
}
