// Photo YCC with 16-bit and 32-bit float samples, all in single precision.
// 16-bit rows: four pixels at a time in float lanes below width AND NOT 3,
// rounded to nearest; the last pixels by the sample type's own truncating
// tail. Float rows: one formula for every pixel.
#include <cstring>

#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/stream_stores.h"
#include "luma_chroma/photo_ycc_forms.h"
#include "luma_chroma/photo_ycc_kernels.h"
#include "luma_chroma/vector_units.h"
#include "luma_chroma/yuv_driver.h"

namespace zel::lc {

// The kernels of every tier, the 512-bit ones among them.
ZEL_TIER512_BEGIN

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

// 512-bit blocks of 16 pixels move their words with 16-bit permutes over two
// registers (index bit 5 picks the second).
struct alignas(64) WordPermute {
  uint16_t w[32];
};

// Channel c of 16 pixels of `stride` words, each at the low word of a dword
// (the high words are zeroed by the permute's mask).
constexpr WordPermute gatherWords16(int stride, int channel) {
  WordPermute m{};
  for (int i = 0; i < 16; ++i) m.w[2 * i] = uint16_t(stride * i + channel);
  return m;
}

// Words 32 part .. 32 part + 31 of 16 pixels of `stride` words, from P, the
// pack of channels 0 and 1 (word 8k + m is channel 0 of pixel 4k + m for
// m < 4, channel 1 of pixel 4k + m - 4 after), and Q, the pack of channel 2
// with itself (read from index 32 on). A fourth channel's words are not
// stored.
constexpr WordPermute scatterWords16(int stride, int part) {
  WordPermute m{};
  for (int w = 0; w < 32; ++w) {
    const int word = 32 * part + w, px = word / stride, ch = word % stride;
    const int at = 8 * (px / 4) + px % 4;
    if (px < 16 && ch < 3) m.w[w] = uint16_t(ch == 0 ? at : ch == 1 ? at + 4 : 32 + at);
  }
  return m;
}

template <int Stride>
struct WordPermutes16 {
  static constexpr WordPermute gather[3] = {gatherWords16(Stride, 0), gatherWords16(Stride, 1),
                                            gatherWords16(Stride, 2)};
  static constexpr WordPermute scatter[2] = {scatterWords16(Stride, 0), scatterWords16(Stride, 1)};
};

ZEL_AVX512 inline __m512i wordPermute(const WordPermute& m) { return _mm512_load_si512(m.w); }

// Conversions of 16 lanes (all-ones zero masks: the plain instructions,
// without the undefined merge source of the unmasked forms). RoundEven is
// the conversion in the default rounding mode, as in narrower lanes.
ZEL_AVX512 inline __m512 wordsToFloats(__m512i v) { return _mm512_maskz_cvtepi32_ps(__mmask16(~0u), v); }
ZEL_AVX512 inline __m512i roundEven16(__m512 v) { return _mm512_maskz_cvtps_epi32(__mmask16(~0u), v); }

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
  // Sixteen pixels in pixel order.
  ZEL_AVX512 ZEL_INLINE FloatTrio<Ps16> get16(int x) const {
    const uint16_t* s = p + Channels * x;
    const __m512i a = _mm512_loadu_si512(s);
    // Three channels: the block's last 16 words alone, by a plain 256-bit
    // load (with a masked 512-bit load and store, whose unused halves reach
    // into the next block or past the row, whole calls ran at a third of
    // the speed now and then); the permutes never read the upper half.
    const __m256i* tail = reinterpret_cast<const __m256i*>(s + 32);
    const __m512i b = Channels == 3 ? _mm512_castsi256_si512(_mm256_loadu_si256(tail)) : _mm512_loadu_si512(s + 32);
    return {channel16(a, b, 0), channel16(a, b, 1), channel16(a, b, 2)};
  }
  ZEL_AVX512 ZEL_INLINE static __m512 channel16(__m512i a, __m512i b, int c) {
    const __m512i v = _mm512_maskz_permutex2var_epi16(0x55555555u, a, wordPermute(WordPermutes16<Channels>::gather[c]), b);
    return wordsToFloats(Signed ? _mm512_xor_si512(v, _mm512_set1_epi32(0x8000)) : v);
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
  // Sixteen pixels in pixel order; a fourth word is not written.
  ZEL_AVX512 ZEL_INLINE void put16(int x, __m512i c0, __m512i c1, __m512i c2) const {
    using M = WordPermutes16<Channels>;
    __m512i P = _mm512_packus_epi32(c0, c1), Q = _mm512_packus_epi32(c2, c2);
    if constexpr (Signed) {
      const __m512i flip = _mm512_set1_epi16(int16_t(-32768));
      P = _mm512_xor_si512(P, flip);
      Q = _mm512_xor_si512(Q, flip);
    }
    const __m512i out0 = _mm512_permutex2var_epi16(P, wordPermute(M::scatter[0]), Q);
    const __m512i out1 = _mm512_permutex2var_epi16(P, wordPermute(M::scatter[1]), Q);
    uint16_t* d = p + Channels * x;
    if constexpr (Channels == 3) {
      _mm512_storeu_si512(d, out0);
      _mm256_storeu_si256(reinterpret_cast<__m256i*>(d + 32), _mm512_castsi512_si256(out1));  // plain, as the load
    } else {
      _mm512_mask_storeu_epi16(d, 0x77777777u, out0);
      _mm512_mask_storeu_epi16(d + 32, 0x77777777u, out1);
    }
  }
  void putWords(int x, Word3 w) const {
    uint16_t* d = p + Channels * x;
    storeSample(d, w.c0);
    storeSample(d + 1, w.c1);
    storeSample(d + 2, w.c2);
  }
};

// 512-bit blocks of 16 float pixels move their samples with 32-bit permutes
// over two registers (index bit 4 picks the second).
struct alignas(64) FloatPermute {
  int32_t i[16];
};

// gather[c]: the float of the block that holds channel c of pixel i, for the
// permute of the first two registers (the low five bits); upper[c] marks the
// pixels whose float lies past the first 32, taken from the rest of the
// block by the same index.
template <int Stride>
struct FloatGather16 {
  FloatPermute gather[3];
  uint16_t upper[3];
};
template <int Stride>
constexpr FloatGather16<Stride> makeFloatGather16() {
  FloatGather16<Stride> g{};
  for (int c = 0; c < 3; ++c)
    for (int i = 0; i < 16; ++i) {
      g.gather[c].i[i] = Stride * i + c;
      if (Stride * i + c >= 32) g.upper[c] = uint16_t(g.upper[c] | (1u << i));
    }
  return g;
}

// part[r]: for float j of the r-th 16 floats of the block, the pixel whose
// channel lands there (plus 16 for the second channel, read from the second
// register); third[r] marks the floats of the third channel, fourth[r] those
// of a fourth, which keep their samples.
template <int Stride>
struct FloatScatter16 {
  FloatPermute part[Stride];
  uint16_t third[Stride], fourth[Stride];
};
template <int Stride>
constexpr FloatScatter16<Stride> makeFloatScatter16() {
  FloatScatter16<Stride> s{};
  for (int r = 0; r < Stride; ++r)
    for (int j = 0; j < 16; ++j) {
      const int at = 16 * r + j, px = at / Stride, ch = at % Stride;
      s.part[r].i[j] = px + (ch == 1 ? 16 : 0);
      if (ch == 2) s.third[r] = uint16_t(s.third[r] | (1u << j));
      if (ch == 3) s.fourth[r] = uint16_t(s.fourth[r] | (1u << j));
    }
  return s;
}

template <int Stride>
inline constexpr FloatGather16<Stride> kFloatGather16 = makeFloatGather16<Stride>();
template <int Stride>
inline constexpr FloatScatter16<Stride> kFloatScatter16 = makeFloatScatter16<Stride>();

ZEL_AVX512 inline __m512i floatPermute(const FloatPermute& m) { return _mm512_load_si512(m.i); }

template <int Channels>
struct Read32f {
  const float* p;
  // Sixteen pixels in pixel order.
  ZEL_AVX512 ZEL_INLINE FloatTrio<Ps16> get16(int x) const {
    const float* s = p + Channels * x;
    const FloatGather16<Channels>& g = kFloatGather16<Channels>;
    __m512 part[Channels];
    for (int k = 0; k < Channels; ++k) part[k] = _mm512_loadu_ps(s + 16 * k);
    __m512 out[3];
    for (int c = 0; c < 3; ++c) {
      const __m512i index = floatPermute(g.gather[c]);
      const __m512 lower = _mm512_permutex2var_ps(part[0], index, part[1]);
      if constexpr (Channels == 3)
        out[c] = _mm512_mask_permutexvar_ps(lower, g.upper[c], index, part[2]);
      else
        out[c] = _mm512_mask_blend_ps(g.upper[c], lower, _mm512_permutex2var_ps(part[2], index, part[3]));
    }
    return {out[0], out[1], out[2]};
  }
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

// Float pixels out. Three-channel blocks go through the store kind Stores
// (plain, or streaming from an address aligned to the vector width, which
// each block keeps: 48 bytes for four pixels, 96 for eight, 192 for
// sixteen); four-channel ones keep the fourth sample and store plainly.
template <int Channels, class Stores = PlainStores>
struct Write32f {
  float* p;
  void put4(int x, const Floats3& v) const {
    float* d = p + Channels * x;
    if constexpr (Channels == 3) {
      const __m128 r = _mm_shuffle_ps(v.c0, v.c0, _MM_SHUFFLE(1, 2, 3, 0));  // R0 R3 R2 R1
      const __m128 g = _mm_shuffle_ps(v.c1, v.c1, _MM_SHUFFLE(2, 3, 0, 1));  // G1 G0 G3 G2
      const __m128 b = _mm_shuffle_ps(v.c2, v.c2, _MM_SHUFFLE(3, 0, 1, 2));  // B2 B1 B0 B3
      Stores::put(d, _mm_blend_ps(_mm_blend_ps(r, g, 0x2), b, 0x4));      // R0 G0 B0 R1
      Stores::put(d + 4, _mm_blend_ps(_mm_blend_ps(r, g, 0x9), b, 0x2));  // G1 B1 R2 G2
      Stores::put(d + 8, _mm_blend_ps(_mm_blend_ps(r, b, 0x9), g, 0x4));  // B2 R3 G3 B3
    } else {
      __m128 p0 = v.c0, p1 = v.c1, p2 = v.c2, p3 = _mm_setzero_ps();
      _MM_TRANSPOSE4_PS(p0, p1, p2, p3);
      _mm_storeu_ps(d, _mm_blend_ps(p0, _mm_loadu_ps(d), 0x8));
      _mm_storeu_ps(d + 4, _mm_blend_ps(p1, _mm_loadu_ps(d + 4), 0x8));
      _mm_storeu_ps(d + 8, _mm_blend_ps(p2, _mm_loadu_ps(d + 8), 0x8));
      _mm_storeu_ps(d + 12, _mm_blend_ps(p3, _mm_loadu_ps(d + 12), 0x8));
    }
  }
  // Sixteen pixels in pixel order; three channels through Stores (aligned
  // to 64 bytes when streaming), four with the fourth sample stored back as
  // it was read (a whole-line store, as in the narrower blocks: a masked one
  // waits for the line when the frame is beyond the cache).
  ZEL_AVX512 ZEL_INLINE void put16(int x, const FloatTrio<Ps16>& v) const {
    float* d = p + Channels * x;
    const FloatScatter16<Channels>& s = kFloatScatter16<Channels>;
    for (int r = 0; r < Channels; ++r) {
      const __m512i index = floatPermute(s.part[r]);
      const __m512 out = _mm512_mask_permutexvar_ps(_mm512_permutex2var_ps(v.c0, index, v.c1), s.third[r], index, v.c2);
      if constexpr (Channels == 4)
        _mm512_storeu_ps(d + 16 * r, _mm512_mask_blend_ps(s.fourth[r], out, _mm512_loadu_ps(d + 16 * r)));
      else if constexpr (Stores::streaming)
        _mm512_stream_ps(d + 16 * r, out);
      else
        _mm512_storeu_ps(d + 16 * r, out);
    }
  }
  ZEL_AVX2 ZEL_INLINE void put8(int x, const FloatTrio<Ps8>& v) const {
    float* d = p + Channels * x;
    if constexpr (Channels == 3) {
      const __m256 r = _mm256_shuffle_ps(v.c0, v.c0, _MM_SHUFFLE(1, 2, 3, 0));
      const __m256 g = _mm256_shuffle_ps(v.c1, v.c1, _MM_SHUFFLE(2, 3, 0, 1));
      const __m256 b = _mm256_shuffle_ps(v.c2, v.c2, _MM_SHUFFLE(3, 0, 1, 2));
      // Floats 0..3 | 12..15, 4..7 | 16..19, 8..11 | 20..23 of the block,
      // regrouped into its three 32-byte thirds.
      const __m256 w0 = _mm256_blend_ps(_mm256_blend_ps(r, g, 0x22), b, 0x44);
      const __m256 w1 = _mm256_blend_ps(_mm256_blend_ps(r, g, 0x99), b, 0x22);
      const __m256 w2 = _mm256_blend_ps(_mm256_blend_ps(r, b, 0x99), g, 0x44);
      Stores::put(d, _mm256_permute2f128_ps(w0, w1, 0x20));
      Stores::put(d + 8, _mm256_permute2f128_ps(w2, w0, 0x30));
      Stores::put(d + 16, _mm256_permute2f128_ps(w1, w2, 0x31));
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

// Sixteen-pixel blocks of the 16-bit body below `end` (a multiple of 4), in
// 512-bit registers; returns where they stop.
template <int Channels, bool Signed, typename Body>
ZEL_AVX512 __attribute__((flatten)) int yccBlocks16Wide(const uint16_t* src, uint16_t* dst, int end, Body body) {
  const Read16<Channels, Signed> in{src};
  const Write16<Channels, Signed> out{dst};
  int x = 0;
  for (; x + 16 <= end; x += 16) {
    const FloatTrio<Ps16> v = in.get16(x);
    const FloatTrio<Ps16> r = body(v.c0, v.c1, v.c2);
    out.put16(x, roundEven16(r.c0), roundEven16(r.c1), roundEven16(r.c2));
  }
  return x;
}

// Eight-pixel blocks of the 16-bit body from x below `end`, in AVX2;
// returns where they stop.
template <int Channels, bool Signed, typename Body>
ZEL_AVX2 __attribute__((flatten)) int yccBlocks16Avx(const uint16_t* src, uint16_t* dst, int x, int end, Body body) {
  const Read16<Channels, Signed> in{src};
  const Write16<Channels, Signed> out{dst};
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
void yccRow16(const uint16_t* src, uint16_t* dst, int width, Body body, Tail tail, VectorTier tier) {
  const Read16<Channels, Signed> in{src};
  const Write16<Channels, Signed> out{dst};
  const int end = bodyEnd(width, 4);
  int x = tier >= VectorTier::Avx512 ? yccBlocks16Wide<Channels, Signed>(src, dst, end, body) : 0;
  if (tier >= VectorTier::Avx2) x = yccBlocks16Avx<Channels, Signed>(src, dst, x, end, body);
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

template <int Channels, class Stores, typename Form>
ZEL_AVX512 __attribute__((flatten)) int yccBlocks32fWide(const float* src, float* dst, int x, int width, Form form) {
  const Read32f<Channels> in{src};
  const Write32f<Channels, Stores> out{dst};
  for (; x + 16 <= width; x += 16) {
    const FloatTrio<Ps16> v = in.get16(x);
    out.put16(x, form(v.c0, v.c1, v.c2));
  }
  return x;
}

template <int Channels, class Stores, typename Form>
ZEL_AVX2 __attribute__((flatten)) int yccBlocks32fAvx(const float* src, float* dst, int x, int width, Form form) {
  const Read32f<Channels> in{src};
  const Write32f<Channels, Stores> out{dst};
  for (; x + 8 <= width; x += 8) {
    const FloatTrio<Ps8> v = in.get8(x);
    out.put8(x, form(v.c0, v.c1, v.c2));
  }
  return x;
}

// One formula for every pixel, in blocks of 16 (512-bit), 8 (AVX2) and 4.
// With streaming stores the pixels before the first address aligned to the
// widest vector go one at a time (each block keeps the alignment of the
// narrower ones after it); a row whose samples are off the float grid never
// gets there and stores plainly.
template <int Channels, class Stores, typename Form>
void yccRow32f(const float* src, float* dst, int width, Form form, VectorTier tier) {
  const Read32f<Channels> in{src};
  const Write32f<Channels, Stores> out{dst};
  int x = 0;
  if constexpr (Stores::streaming) {
    if (reinterpret_cast<uintptr_t>(dst) % sizeof(float) != 0) {
      yccRow32f<Channels, PlainStores>(src, dst, width, form, tier);
      return;
    }
    const uintptr_t align = tier >= VectorTier::Avx512 ? 64 : tier >= VectorTier::Avx2 ? 32 : 16;
    for (; x < width && reinterpret_cast<uintptr_t>(dst + Channels * x) % align != 0; ++x) {
      const Float3 v = in.pixel(x);
      out.putPixel(x, form(v.c0, v.c1, v.c2));
    }
  }
  if (tier >= VectorTier::Avx512) x = yccBlocks32fWide<Channels, Stores>(src, dst, x, width, form);
  if (tier >= VectorTier::Avx2) x = yccBlocks32fAvx<Channels, Stores>(src, dst, x, width, form);
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

ZEL_TIER512_END

template <int Channels, bool Signed>
void rgbToYcc16Row(const uint16_t* src, uint16_t* dst, int width, VectorTier tier) {
  yccRow16<Channels, Signed>(src, dst, width, RgbToYccBody16Form{}, Signed ? rgbToYccTail16s : rgbToYccTail16u, tier);
}

template <int Channels, bool Signed>
void yccToRgb16Row(const uint16_t* src, uint16_t* dst, int width, VectorTier tier) {
  yccRow16<Channels, Signed>(src, dst, width, YccToRgbBody16Form{}, Signed ? yccToRgbTail16s : yccToRgbTail16u, tier);
}

template <int Channels, class Stores>
void rgbToYcc32fRow(const float* src, float* dst, int width, VectorTier tier) {
  yccRow32f<Channels, Stores>(src, dst, width, RgbToYcc32fForm{}, tier);
}

template <int Channels, class Stores>
void yccToRgb32fRow(const float* src, float* dst, int width, VectorTier tier) {
  yccRow32f<Channels, Stores>(src, dst, width, YccToRgb32fForm{}, tier);
}

template void rgbToYcc16Row<3, false>(const uint16_t*, uint16_t*, int, VectorTier);
template void rgbToYcc16Row<4, false>(const uint16_t*, uint16_t*, int, VectorTier);
template void rgbToYcc16Row<3, true>(const uint16_t*, uint16_t*, int, VectorTier);
template void rgbToYcc16Row<4, true>(const uint16_t*, uint16_t*, int, VectorTier);
template void yccToRgb16Row<3, false>(const uint16_t*, uint16_t*, int, VectorTier);
template void yccToRgb16Row<4, false>(const uint16_t*, uint16_t*, int, VectorTier);
template void yccToRgb16Row<3, true>(const uint16_t*, uint16_t*, int, VectorTier);
template void yccToRgb16Row<4, true>(const uint16_t*, uint16_t*, int, VectorTier);
template void rgbToYcc32fRow<3, PlainStores>(const float*, float*, int, VectorTier);
template void rgbToYcc32fRow<3, StreamStores>(const float*, float*, int, VectorTier);
template void rgbToYcc32fRow<4, PlainStores>(const float*, float*, int, VectorTier);
template void yccToRgb32fRow<3, PlainStores>(const float*, float*, int, VectorTier);
template void yccToRgb32fRow<3, StreamStores>(const float*, float*, int, VectorTier);
template void yccToRgb32fRow<4, PlainStores>(const float*, float*, int, VectorTier);

}  // namespace zel::lc

using namespace zel::lc;
using zel::PlainStores;
using zel::StreamStores;

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
  const zel::VectorTier tier = zel::widestTier();
  return walkElements(src, srcStep, dst, dstStep, size,
                      [tier](const T* s, T* d, int w) { Row(words(s), words(d), w, tier); });
}

// Three-channel float frames beyond the largest cache stream their output.
template <auto PlainRow, auto StreamRow>
Status walkFloat(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  const int64_t bytes = int64_t(size.width) * size.height * 3 * int64_t(sizeof(float)) * 2;
  if (size.width < 1 || size.height < 1 || !zel::streamsBeyondCache(bytes))
    return walk<PlainRow>(src, srcStep, dst, dstStep, size);
  const Status status = walk<StreamRow>(src, srcStep, dst, dstStep, size);
  zel::StreamStores::fence();
  return status;
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
  return walkFloat<rgbToYcc32fRow<3, PlainStores>, rgbToYcc32fRow<3, StreamStores>>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToYCC_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return walk<rgbToYcc32fRow<4, PlainStores>>(src, srcStep, dst, dstStep, size);
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
  return walkFloat<yccToRgb32fRow<3, PlainStores>, yccToRgb32fRow<3, StreamStores>>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliYCCToRGB_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return walk<yccToRgb32fRow<4, PlainStores>>(src, srcStep, dst, dstStep, size);
}
