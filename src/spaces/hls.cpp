// HLS public functions, their row kernels and the two instruction sets of
// the vector blocks. A row is converted in groups of 4 pixels up to the
// member's body end (width rounded down to its block), pairs of groups at
// a time with AVX2; the last pixels take the tail recipe one by one.
#include <immintrin.h>

#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "frame/simd.h"
#include "spaces/float_lanes.h"
#include "spaces/hls_formulas.h"
#include "spaces/hls_rows.h"
#include "spaces/space_frame.h"

namespace zel::hls {

using spaces::Lanes;
using spaces::laneCount;
using spaces::pixelsToAlignment;
using spaces::RowContext;
using spaces::RowStores;
using spaces::widestLanes;

// The masked helpers of hls_vector.inl as selects, for the lane sets whose
// masks are all-ones lanes (written into each set, so that they take its
// instruction set).
#define ZEL_HLS_SELECT_FORMS                                                          \
  static M maskAndNot(M a, M b) { return andNot(a, b); }                              \
  static F addWhere(M m, F src, F a, F b) { return select(m, add(a, b), src); }       \
  static F subWhere(M m, F src, F a, F b) { return select(m, sub(a, b), src); }       \
  static F addUnless(M m, F src, F a, F b) { return select(m, src, add(a, b)); }      \
  static F subUnless(M m, F src, F a, F b) { return select(m, src, sub(a, b)); }      \
  static F divUnless(M m, F a, F b) { return andNot(m, div(a, b)); }

struct Sse {
  using F = __m128;
  using I = __m128i;
  using M = __m128;
  static constexpr int kGroups = 1;
  static F set(float v) { return _mm_set1_ps(v); }
  static F add(F a, F b) { return _mm_add_ps(a, b); }
  static F sub(F a, F b) { return _mm_sub_ps(a, b); }
  static F mul(F a, F b) { return _mm_mul_ps(a, b); }
  static F div(F a, F b) { return _mm_div_ps(a, b); }
  static F max(F a, F b) { return _mm_max_ps(a, b); }
  static F min(F a, F b) { return _mm_min_ps(a, b); }
  static F eq(F a, F b) { return _mm_cmpeq_ps(a, b); }
  static F le(F a, F b) { return _mm_cmple_ps(a, b); }
  static F lt(F a, F b) { return _mm_cmplt_ps(a, b); }
  static F notLess(F a, F b) { return _mm_cmpnlt_ps(a, b); }
  static F gt(F a, F b) { return _mm_cmpgt_ps(a, b); }
  static F select(F mask, F yes, F no) { return _mm_blendv_ps(no, yes, mask); }
  static F andNot(F mask, F v) { return _mm_andnot_ps(mask, v); }
  ZEL_HLS_SELECT_FORMS
  static F rcp(F x) { return _mm_rcp_ps(x); }
  static I round(F x) { return _mm_cvtps_epi32(x); }
  static I truncate(F x) { return _mm_cvttps_epi32(x); }
  static F toFloat(I v) { return _mm_cvtepi32_ps(v); }
  static F asFloat(I v) { return _mm_castsi128_ps(v); }
  static I asInt(F v) { return _mm_castps_si128(v); }
  static I clamp(I v, int max) { return _mm_min_epi32(_mm_max_epi32(v, _mm_setzero_si128()), _mm_set1_epi32(max)); }
  static I lowBits(I v, int max) { return _mm_and_si128(v, _mm_set1_epi32(max)); }
  static I join(const __m128i* parts) { return parts[0]; }
  static __m128i part(I v, int) { return v; }
  // Whole vectors of three-float pixels: only with eight or sixteen lanes.
  static constexpr bool kWholeFloat3 = false;
  static void getFloat3(const RowStores&, const float*, F*) {}
  static void putFloat3(const RowStores&, float*, const F*) {}
  static void loadBytes3(const uint8_t*, F*) {}
  static void storeBytes3(uint8_t*, const I*) {}
};

namespace sse41 {
#include "spaces/hls_vector.inl"
}  // namespace sse41

#pragma GCC push_options
#pragma GCC target("avx2")

struct Avx {
  using F = __m256;
  using I = __m256i;
  using M = __m256;
  static constexpr int kGroups = 2;
  static F set(float v) { return _mm256_set1_ps(v); }
  static F add(F a, F b) { return _mm256_add_ps(a, b); }
  static F sub(F a, F b) { return _mm256_sub_ps(a, b); }
  static F mul(F a, F b) { return _mm256_mul_ps(a, b); }
  static F div(F a, F b) { return _mm256_div_ps(a, b); }
  static F max(F a, F b) { return _mm256_max_ps(a, b); }
  static F min(F a, F b) { return _mm256_min_ps(a, b); }
  static F eq(F a, F b) { return _mm256_cmp_ps(a, b, _CMP_EQ_OQ); }
  static F le(F a, F b) { return _mm256_cmp_ps(a, b, _CMP_LE_OS); }
  static F lt(F a, F b) { return _mm256_cmp_ps(a, b, _CMP_LT_OS); }
  static F notLess(F a, F b) { return _mm256_cmp_ps(a, b, _CMP_NLT_US); }
  static F gt(F a, F b) { return _mm256_cmp_ps(a, b, _CMP_GT_OS); }
  static F select(F mask, F yes, F no) { return _mm256_blendv_ps(no, yes, mask); }
  static F andNot(F mask, F v) { return _mm256_andnot_ps(mask, v); }
  ZEL_HLS_SELECT_FORMS
  static F rcp(F x) { return _mm256_rcp_ps(x); }
  static I round(F x) { return _mm256_cvtps_epi32(x); }
  static I truncate(F x) { return _mm256_cvttps_epi32(x); }
  static F toFloat(I v) { return _mm256_cvtepi32_ps(v); }
  static F asFloat(I v) { return _mm256_castsi256_ps(v); }
  static I asInt(F v) { return _mm256_castps_si256(v); }
  static I clamp(I v, int max) {
    return _mm256_min_epi32(_mm256_max_epi32(v, _mm256_setzero_si256()), _mm256_set1_epi32(max));
  }
  static I lowBits(I v, int max) { return _mm256_and_si256(v, _mm256_set1_epi32(max)); }
  static I join(const __m128i* parts) { return _mm256_set_m128i(parts[1], parts[0]); }
  static __m128i part(I v, int k) { return k == 0 ? _mm256_castsi256_si128(v) : _mm256_extracti128_si256(v, 1); }
  static constexpr bool kWholeFloat3 = true;
  static void getFloat3(const RowStores& how, const float* p, F* c) {
    lanes::F8 c0, c1, c2;
    lanes::getPixels<3, false>(how, p, c0, c1, c2);
    c[0] = c0.v, c[1] = c1.v, c[2] = c2.v;
  }
  static void putFloat3(const RowStores& how, float* p, const F* c) {
    lanes::putPixels<3>(how, p, {c[0]}, {c[1]}, {c[2]});
  }
  // Eight pixels of three bytes as float lanes, and integer lanes (already
  // clamped) back to their low bytes.
  static void loadBytes3(const uint8_t* p, F* c) {
    lanes::I8 c0, c1, c2;
    lanes::loadBytes3(p, c0, c1, c2);
    c[0] = _mm256_cvtepi32_ps(c0.v), c[1] = _mm256_cvtepi32_ps(c1.v), c[2] = _mm256_cvtepi32_ps(c2.v);
  }
  static void storeBytes3(uint8_t* p, const I* c) { lanes::storeBytes3(p, {c[0]}, {c[1]}, {c[2]}); }
};

namespace avx2 {
#include "spaces/hls_vector.inl"
}  // namespace avx2

#pragma GCC pop_options

#pragma GCC push_options
#pragma GCC target("avx2,avx512f,avx512bw,avx512vl,avx512dq")
ZEL_TIER512_BEGIN

// Sixteen lanes, masks in mask registers; used by the float members with
// three-float pixels (whole vectors in and out), where the arithmetic
// rather than memory bounds the speed.
struct Avx512 {
  using F = __m512;
  using I = __m512i;
  using M = __mmask16;
  static constexpr int kGroups = 4;
  static F set(float v) { return _mm512_set1_ps(v); }
  static F add(F a, F b) { return _mm512_add_ps(a, b); }
  static F sub(F a, F b) { return _mm512_sub_ps(a, b); }
  static F mul(F a, F b) { return _mm512_mul_ps(a, b); }
  static F div(F a, F b) { return _mm512_div_ps(a, b); }
  static F max(F a, F b) { return lanes::vmax(lanes::F16{a}, lanes::F16{b}).v; }
  static F min(F a, F b) { return lanes::vmin(lanes::F16{a}, lanes::F16{b}).v; }
  static M eq(F a, F b) { return _mm512_cmp_ps_mask(a, b, _CMP_EQ_OQ); }
  static M le(F a, F b) { return _mm512_cmp_ps_mask(a, b, _CMP_LE_OS); }
  static M lt(F a, F b) { return _mm512_cmp_ps_mask(a, b, _CMP_LT_OS); }
  static M notLess(F a, F b) { return _mm512_cmp_ps_mask(a, b, _CMP_NLT_US); }
  static M gt(F a, F b) { return _mm512_cmp_ps_mask(a, b, _CMP_GT_OS); }
  static F select(M mask, F yes, F no) { return _mm512_mask_blend_ps(mask, no, yes); }
  static F andNot(M mask, F v) { return _mm512_maskz_mov_ps(__mmask16(~mask), v); }
  static M maskAndNot(M a, M b) { return __mmask16(b & ~a); }
  static F addWhere(M m, F src, F a, F b) { return _mm512_mask_add_ps(src, m, a, b); }
  static F subWhere(M m, F src, F a, F b) { return _mm512_mask_sub_ps(src, m, a, b); }
  static F addUnless(M m, F src, F a, F b) { return _mm512_mask_add_ps(src, __mmask16(~m), a, b); }
  static F subUnless(M m, F src, F a, F b) { return _mm512_mask_sub_ps(src, __mmask16(~m), a, b); }
  static F divUnless(M m, F a, F b) { return _mm512_maskz_div_ps(__mmask16(~m), a, b); }
  static F rcp(F x) { return lanes::approxRcp(lanes::F16{x}).v; }
  static I round(F x) { return _mm512_cvtps_epi32(x); }
  static I truncate(F x) { return _mm512_cvttps_epi32(x); }
  static F toFloat(I v) { return _mm512_cvtepi32_ps(v); }
  static F asFloat(I v) { return _mm512_castsi512_ps(v); }
  static I asInt(F v) { return _mm512_castps_si512(v); }
  static I clamp(I v, int max) {
    return _mm512_min_epi32(_mm512_max_epi32(v, _mm512_setzero_si512()), _mm512_set1_epi32(max));
  }
  static I lowBits(I v, int max) { return _mm512_and_si512(v, _mm512_set1_epi32(max)); }
  static I join(const __m128i* parts) {
    I v = _mm512_castsi128_si512(parts[0]);
    v = _mm512_inserti32x4(v, parts[1], 1);
    v = _mm512_inserti32x4(v, parts[2], 2);
    return _mm512_inserti32x4(v, parts[3], 3);
  }
  static __m128i part(I v, int k) {
    switch (k) {
      case 0: return _mm512_castsi512_si128(v);
      case 1: return _mm512_extracti32x4_epi32(v, 1);
      case 2: return _mm512_extracti32x4_epi32(v, 2);
      default: return _mm512_extracti32x4_epi32(v, 3);
    }
  }
  static constexpr bool kWholeFloat3 = true;
  static void getFloat3(const RowStores& how, const float* p, F* c) {
    lanes::F16 c0, c1, c2;
    lanes::getPixels<3, false>(how, p, c0, c1, c2);
    c[0] = c0.v, c[1] = c1.v, c[2] = c2.v;
  }
  static void putFloat3(const RowStores& how, float* p, const F* c) {
    lanes::putPixels<3>(how, p, {c[0]}, {c[1]}, {c[2]});
  }
  static void loadBytes3(const uint8_t* p, F* c) {
    lanes::I16 c0, c1, c2;
    lanes::loadBytes3(p, c0, c1, c2);
    c[0] = _mm512_cvtepi32_ps(c0.v), c[1] = _mm512_cvtepi32_ps(c1.v), c[2] = _mm512_cvtepi32_ps(c2.v);
  }
  static void storeBytes3(uint8_t* p, const I* c) { lanes::storeBytes3(p, {c[0]}, {c[1]}, {c[2]}); }
};

namespace avx512 {
#include "spaces/hls_vector.inl"
}  // namespace avx512

ZEL_TIER512_END
#pragma GCC pop_options

namespace {

// ---- row kernels ----

template <class M>
void forwardTailPixel(const typename M::In& in, const typename M::Out& out, int x) {
  const uint32_t flip = M::kBiased ? 0x8000u : 0u;
  float c[3];
  for (int k = 0; k < 3; ++k) c[k] = float(int32_t(in.at(x, k) ^ flip));
  const Hls v = forwardTail<typename M::TailRecipe>(c[M::kRedAt], c[1], c[2 - M::kRedAt]);
  out.put(x, 0, uint32_t(v.h) ^ flip);
  out.put(x, 1, uint32_t(v.l) ^ flip);
  out.put(x, 2, uint32_t(v.s) ^ flip);
  if constexpr (M::kCopyAlpha) out.put(x, 3, in.at(x, 3));
}

// Byte pixels of three samples on both sides take 16-lane groups where the
// processor has them.
template <class M>
constexpr bool kWholeBytes =
    std::is_same_v<typename M::In, Packed<uint8_t, 3>> && std::is_same_v<typename M::Out, Packed<uint8_t, 3>>;

template <class M>
void forwardRow(const typename M::In& in, const typename M::Out& out, int width, const RowContext& context) {
  const int body = bodyEnd(width, M::kBlock);
  int x = 0;
  if constexpr (kWholeBytes<M>)
    if (context.widest == Lanes::Avx512) x = avx512::forwardGroups<Avx512, M>(in, out, x, body);
  if (context.widest != Lanes::Sse4) x = avx2::forwardGroups<Avx, M>(in, out, x, body);
  x = sse41::forwardGroups<Sse, M>(in, out, x, body);
  for (; x < width; ++x) forwardTailPixel<M>(in, out, x);
}

// Three-float pixels on both sides: the 16-lane groups where the processor
// has them, and streamed stores where the call streams. A streaming row is
// cut at its first aligned pixel: the pixels before it go as a part of one
// group, whole groups stream from there, and the body pixels after the
// last whole group go as a part of one more (all body pixels, all by the
// body recipe). `groups(lanes, x, end, how)` runs the group loop of one
// lane set.
template <class Groups>
int floatBody(float* row, int body, const RowContext& context, Groups&& groups) {
  int x = 0;
  if (context.stream) {
    const int group = laneCount(context.widest);
    const int head = pixelsToAlignment(row, 12, 4 * group);
    if (head >= 0 && head + group <= body) {
      if (head > 0) groups(context.widest, 0, group, RowStores{RowStores::Part, head});
      x = groups(context.widest, head, body, RowStores{RowStores::Stream, 0});
      if (x < body) groups(context.widest, x, x + group, RowStores{RowStores::Part, body - x});
      return body;
    }
  }
  if (context.widest == Lanes::Avx512) x = groups(Lanes::Avx512, x, body, RowStores{});
  if (context.widest != Lanes::Sse4) x = groups(Lanes::Avx2, x, body, RowStores{});
  return groups(Lanes::Sse4, x, body, RowStores{});
}

template <class M>
constexpr bool kWholeFloats = M::kFloat && M::In::kChannels == 3 && M::Out::kChannels == 3;

template <class M>
void inverseTailPixel(const typename M::In& in, const typename M::Out& out, int x) {
  uint32_t rgb[3];
  if constexpr (M::kFloat) {
    float v[3];
    inverseFloat<typename M::TailRecipe>(fromBits<float>(in.at(x, 0)), fromBits<float>(in.at(x, 1)),
                                         fromBits<float>(in.at(x, 2)), v);
    for (int c = 0; c < 3; ++c) rgb[c] = bitsOf(v[c]);
  } else {
    const uint32_t flip = M::kBiased ? 0x8000u : 0u;
    int32_t v[3];
    inversePixel<typename M::TailRecipe>(int32_t(in.at(x, 0) ^ flip), int32_t(in.at(x, 1) ^ flip),
                                         int32_t(in.at(x, 2) ^ flip), v);
    for (int c = 0; c < 3; ++c) rgb[c] = uint32_t(v[c]) ^ flip;
  }
  out.put(x, M::kRedAt, rgb[0]);
  out.put(x, 1, rgb[1]);
  out.put(x, 2 - M::kRedAt, rgb[2]);
  if constexpr (M::kCopyAlpha) out.put(x, 3, in.at(x, 3));
}

template <class M>
void inverseRow(const typename M::In& in, const typename M::Out& out, int width, const RowContext& context) {
  const int body = bodyEnd(width, M::kBlock);
  int x = 0;
  if constexpr (kWholeFloats<M>) {
    x = floatBody(out.pixel(0), body, context, [&](Lanes lanes, int from, int end, RowStores how) {
      if (lanes == Lanes::Avx512) return avx512::inverseGroups<Avx512, M>(in, out, from, end, how);
      if (lanes == Lanes::Avx2) return avx2::inverseGroups<Avx, M>(in, out, from, end, how);
      return sse41::inverseGroups<Sse, M>(in, out, from, end, how);
    });
  } else {
    if (context.widest != Lanes::Sse4) x = avx2::inverseGroups<Avx, M>(in, out, x, body);
    x = sse41::inverseGroups<Sse, M>(in, out, x, body);
  }
  for (; x < width; ++x) inverseTailPixel<M>(in, out, x);
}

// Float forward conversion: one formula for every pixel, so the vector
// groups and the last pixels agree whatever the width.
template <int Ch>
void forwardFloatRow(const Packed<float, Ch>& in, const Packed<float, Ch>& out, int width, const RowContext& context) {
  int x = 0;
  if constexpr (Ch == 3) {
    x = floatBody(out.pixel(0), width, context, [&](Lanes lanes, int from, int end, RowStores how) {
      if (lanes == Lanes::Avx512) return avx512::forwardFloatGroups<Avx512>(in, out, from, end, how);
      if (lanes == Lanes::Avx2) return avx2::forwardFloatGroups<Avx>(in, out, from, end, how);
      return sse41::forwardFloatGroups<Sse>(in, out, from, end, how);
    });
  } else {
    if (context.widest != Lanes::Sse4) x = avx2::forwardFloatGroups<Avx>(in, out, x, width);
    x = sse41::forwardFloatGroups<Sse>(in, out, x, width);
  }
  for (; x < width; ++x) {
    const HlsF v = forwardFloat(fromBits<float>(in.at(x, 0)), fromBits<float>(in.at(x, 1)),
                                fromBits<float>(in.at(x, 2)));
    out.put(x, 0, bitsOf(v.h));
    out.put(x, 1, bitsOf(v.l));
    out.put(x, 2, bitsOf(v.s));
  }
}

// ---- drivers ----

// Rows share the widest lanes; float frames of three-float pixels larger
// than the cache stream their output.
template <class M, class Row>
void walk(const typename M::In& in, const typename M::Out& out, ImageSize size, Row row) {
  RowContext context;
  context.widest = widestLanes();
  if constexpr (kWholeFloats<M>)
    context.stream = context.widest != Lanes::Sse4 && streamsBeyondCache(int64_t(size.width) * size.height * 24);
  plainWalk(size.height, [&](int y) { row(in.rowAt(y), out.rowAt(y), size.width, context); });
  if (context.stream) StreamStores::fence();
}

// The RGB families count steps in whole samples: the byte step shifted
// right by 1 for 16-bit samples, by 2 for floats.
template <typename T>
int wholeSamples(int step) {
  constexpr int shift = sizeof(T) == 1 ? 0 : sizeof(T) == 2 ? 1 : 2;
  return (step >> shift) * int(sizeof(T));
}

template <typename T>
uint8_t* bytes(const T* p) {
  return reinterpret_cast<uint8_t*>(const_cast<T*>(p));
}

bool badSize(ImageSize size) { return size.width < 1 || size.height < 1; }

// A side from the caller's pointer: an image pointer, or a plane array of
// which the array and every entry count as pointers.
template <class Side, typename P>
bool isNull(P* p) {
  return !p;
}
template <class Side, typename P>
bool isNull(P* const* planes) {
  if (!planes) return true;
  for (int i = 0; i < Side::kPlanes; ++i)
    if (!planes[i]) return true;
  return false;
}

template <class Side, typename P>
Side sideOf(P* p, int step) {
  return Side{bytes(p), step};
}
template <class Side, typename P>
Side sideOf(P* const* planes, int step) {
  Side side{};
  for (int i = 0; i < Side::kPlanes; ++i) side.base[i] = bytes(planes[i]);
  side.step = step;
  return side;
}

// RGB members: pointers, then size; steps unchecked.
template <class Body, class Tail, int Block, typename T, int Ch, bool Forward>
Status rgbMember(const T* src, int srcStep, T* dst, int dstStep, ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  using M = Member<Body, Tail, Block, Packed<T, Ch>, Packed<T, Ch>, 0, false>;
  const Packed<T, Ch> in{bytes(src), wholeSamples<T>(srcStep)}, out{bytes(dst), wholeSamples<T>(dstStep)};
  if constexpr (Forward)
    walk<M>(in, out, size, [](const auto& i, const auto& o, int w, const RowContext& c) { forwardRow<M>(i, o, w, c); });
  else
    walk<M>(in, out, size, [](const auto& i, const auto& o, int w, const RowContext& c) { inverseRow<M>(i, o, w, c); });
  return StatusOk;
}

template <int Ch>
Status rgbToHlsFloat(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  using M = Member<RgbToHls8C3, RgbToHls8C3, 1, Packed<float, Ch>, Packed<float, Ch>, 0, false>;
  const Packed<float, Ch> in{bytes(src), wholeSamples<float>(srcStep)}, out{bytes(dst), wholeSamples<float>(dstStep)};
  walk<M>(in, out, size,
          [](const auto& i, const auto& o, int w, const RowContext& c) { forwardFloatRow<Ch>(i, o, w, c); });
  return StatusOk;
}

// BGR members: every pointer (plane entries included), then the steps,
// then the size; the interleaved AC4 member tests size before steps.
enum class Order { StepFirst, SizeFirst };

template <class M, bool Forward, Order O, typename S, typename D>
Status bgrMember(S src, int srcStep, D dst, int dstStep, ImageSize size) {
  if (isNull<typename M::In>(src) || isNull<typename M::Out>(dst)) return StatusNullPointerError;
  const bool badStep = srcStep < 1 || dstStep < 1;
  if (O == Order::StepFirst && badStep) return StatusStepError;
  if (badSize(size)) return StatusSizeError;
  if (O == Order::SizeFirst && badStep) return StatusStepError;
  const auto in = sideOf<typename M::In>(src, srcStep);
  const auto out = sideOf<typename M::Out>(dst, dstStep);
  if constexpr (Forward)
    walk<M>(in, out, size, [](const auto& i, const auto& o, int w, const RowContext& c) { forwardRow<M>(i, o, w, c); });
  else
    walk<M>(in, out, size, [](const auto& i, const auto& o, int w, const RowContext& c) { inverseRow<M>(i, o, w, c); });
  return StatusOk;
}

// The BGR family: B, G, R in memory, 4-pixel blocks, truncation.
template <class In, class Out, bool Copy, Order O = Order::StepFirst, typename S, typename D>
Status bgrToHls(S src, int srcStep, D dst, int dstStep, ImageSize size) {
  return bgrMember<Member<BgrToHls8, BgrToHls8, 4, In, Out, 2, Copy>, true, O>(src, srcStep, dst, dstStep, size);
}
template <class In, class Out, bool Copy, typename S, typename D>
Status hlsToBgr(S src, int srcStep, D dst, int dstStep, ImageSize size) {
  using M = Member<HlsToBgr8Body, HlsToBgr8Tail, 4, In, Out, 2, Copy>;
  return bgrMember<M, false, Order::StepFirst>(src, srcStep, dst, dstStep, size);
}

using Pixels3 = Packed<uint8_t, 3>;
using Pixels4 = Packed<uint8_t, 4>;
using Planes3 = Planar<uint8_t, 3>;
using Planes4 = Planar<uint8_t, 4>;

}  // namespace

}  // namespace zel::hls

using namespace zel::hls;

// ---- RGB to HLS ----
ZEL_PUBLIC Status zeliRGBToHLS_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return rgbMember<RgbToHls8C3, RgbToHls8C3, 8, uint8_t, 3, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToHLS_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return rgbMember<RgbToHls8AC4, RgbToHls8AC4, 4, uint8_t, 4, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToHLS_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size) {
  return rgbMember<RgbToHls16, RgbToHls16, 4, uint16_t, 3, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToHLS_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                        ImageSize size) {
  return rgbMember<RgbToHls16, RgbToHls16, 4, uint16_t, 4, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToHLS_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size) {
  return rgbMember<RgbToHls16, RgbToHls16, 4, int16_t, 3, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToHLS_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size) {
  return rgbMember<RgbToHls16, RgbToHls16, 4, int16_t, 4, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToHLS_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return rgbToHlsFloat<3>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToHLS_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return rgbToHlsFloat<4>(src, srcStep, dst, dstStep, size);
}

// ---- HLS to RGB ----
ZEL_PUBLIC Status zeliHLSToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return rgbMember<HlsToRgb8Body, HlsToRgb8Tail, 8, uint8_t, 3, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliHLSToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return rgbMember<HlsToRgb8Body, HlsToRgb8Tail, 8, uint8_t, 4, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliHLSToRGB_16u_C3R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                       ImageSize size) {
  return rgbMember<HlsToRgb16Body, HlsToRgb16Tail, 4, uint16_t, 3, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliHLSToRGB_16u_AC4R(const uint16_t* src, int srcStep, uint16_t* dst, int dstStep,
                                        ImageSize size) {
  return rgbMember<HlsToRgb16Body, HlsToRgb16Tail, 4, uint16_t, 4, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliHLSToRGB_16s_C3R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size) {
  return rgbMember<HlsToRgb16Body, HlsToRgb16Tail, 4, int16_t, 3, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliHLSToRGB_16s_AC4R(const int16_t* src, int srcStep, int16_t* dst, int dstStep, ImageSize size) {
  return rgbMember<HlsToRgb16Body, HlsToRgb16Tail, 4, int16_t, 4, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliHLSToRGB_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return rgbMember<HlsToRgbFloatBody, HlsToRgbFloatTail, 4, float, 3, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliHLSToRGB_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size) {
  return rgbMember<HlsToRgbFloatBody, HlsToRgbFloatTail, 4, float, 4, false>(src, srcStep, dst, dstStep, size);
}

// ---- BGR to HLS ----
ZEL_PUBLIC Status zeliBGRToHLS_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  // The fourth byte of the destination is never written; size before steps.
  return bgrToHls<Pixels4, PackedSkipAlpha<uint8_t>, false, Order::SizeFirst>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToHLS_8u_AC4P4R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[4], int dstStep,
                                         ImageSize size) {
  return bgrToHls<Pixels4, Planes4, true>(src, srcStep, dstPlanes, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToHLS_8u_AP4C4R(const uint8_t* const srcPlanes[4], int srcStep, uint8_t* dst, int dstStep,
                                         ImageSize size) {
  return bgrToHls<Planes4, Pixels4, true>(srcPlanes, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToHLS_8u_AP4R(const uint8_t* const srcPlanes[4], int srcStep, uint8_t* const dstPlanes[4],
                                       int dstStep, ImageSize size) {
  return bgrToHls<Planes4, Planes4, true>(srcPlanes, srcStep, dstPlanes, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToHLS_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep,
                                        ImageSize size) {
  return bgrToHls<Pixels3, Planes3, false>(src, srcStep, dstPlanes, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToHLS_8u_P3C3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                        ImageSize size) {
  return bgrToHls<Planes3, Pixels3, false>(srcPlanes, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToHLS_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                      int dstStep, ImageSize size) {
  return bgrToHls<Planes3, Planes3, false>(srcPlanes, srcStep, dstPlanes, dstStep, size);
}

// ---- HLS to BGR ----
ZEL_PUBLIC Status zeliHLSToBGR_8u_AC4P4R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[4], int dstStep,
                                         ImageSize size) {
  return hlsToBgr<Pixels4, Planes4, true>(src, srcStep, dstPlanes, dstStep, size);
}
ZEL_PUBLIC Status zeliHLSToBGR_8u_AP4C4R(const uint8_t* const srcPlanes[4], int srcStep, uint8_t* dst, int dstStep,
                                         ImageSize size) {
  return hlsToBgr<Planes4, Pixels4, true>(srcPlanes, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliHLSToBGR_8u_AP4R(const uint8_t* const srcPlanes[4], int srcStep, uint8_t* const dstPlanes[4],
                                       int dstStep, ImageSize size) {
  return hlsToBgr<Planes4, Planes4, true>(srcPlanes, srcStep, dstPlanes, dstStep, size);
}
ZEL_PUBLIC Status zeliHLSToBGR_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep,
                                        ImageSize size) {
  return hlsToBgr<Pixels3, Planes3, false>(src, srcStep, dstPlanes, dstStep, size);
}
ZEL_PUBLIC Status zeliHLSToBGR_8u_P3C3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                        ImageSize size) {
  return hlsToBgr<Planes3, Pixels3, false>(srcPlanes, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliHLSToBGR_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                      int dstStep, ImageSize size) {
  return hlsToBgr<Planes3, Planes3, false>(srcPlanes, srcStep, dstPlanes, dstStep, size);
}
