// RGB to full-range YUV at full resolution. Each member has its own pair of
// forms: a 16-bit lane body over the first pixels of a row and an exact wide
// tail, and the two differ in the last bit by design.
#include "frame/export.h"
#include "luma_chroma/pixel_rows.h"
#include "luma_chroma/yuv_driver.h"
#include "luma_chroma/yuv_kernels.h"
#include "luma_chroma/yuv_lanes.h"

namespace zel::lc {

namespace {

// The matrix lane form straight from bytes: samples land in the high bytes
// of the lanes as S << 8, and S << 7 is that shifted right once. U and V are
// clamped to -128..127 by a signed pack and moved up by 128 with the top bit
// of each byte, which is SaturateU8 of the value plus 128.
struct MatrixBytes {
  static constexpr bool kVector = true;
  static constexpr bool kBytes = true;
  Samples3 pixel(const Samples3& s) const { return samplesOf(yuvMatrixLanes(s.c0, s.c1, s.c2)); }

  template <class U>
  ZEL_INLINE Trio<U> half(typename U::V r8, typename U::V g8, typename U::V b8) const {
    using V = typename U::V;
    const V y = U::addSatU16(U::addSatU16(U::mulHighU16(r8, U::set16(19595)), U::mulHighU16(g8, U::set16(38469))),
                             U::mulHighU16(b8, U::set16(7471)));
    const V r7 = U::template srl16<1>(r8), g7 = U::template srl16<1>(g8), b7 = U::template srl16<1>(b8);
    const V u = U::addSatS16(U::addSatS16(U::mulHighS16(r7, U::set16(-4816)), U::mulHighS16(g7, U::set16(-9469))),
                             U::mulHighS16(b7, U::set16(14286)));
    const V v = U::addSatS16(U::addSatS16(U::mulHighS16(r7, U::set16(20152)), U::mulHighS16(g7, U::set16(-16875))),
                             U::mulHighS16(b7, U::set16(-3276)));
    return {U::template srl16<8>(y), U::template sra16<6>(u), U::template sra16<6>(v)};
  }

  template <class U>
  ZEL_INLINE Trio<U> bytes(const Trio<U>& rgb) const {
    const Wide16<U> r = widenHigh<U>(rgb.c0), g = widenHigh<U>(rgb.c1), b = widenHigh<U>(rgb.c2);
    return highBytes<U>({r.lo, g.lo, b.lo}, {r.hi, g.hi, b.hi});
  }

  // Two halves of samples already in the high bytes of the lanes.
  static constexpr bool kHighBytes = true;
  template <class U>
  ZEL_INLINE Trio<U> highBytes(const Trio<U>& lo8, const Trio<U>& hi8) const {
    const Trio<U> lo = half<U>(lo8.c0, lo8.c1, lo8.c2), hi = half<U>(hi8.c0, hi8.c1, hi8.c2);
    const typename U::V top = U::set8(0x80);
    return {U::packU8(lo.c0, hi.c0), U::xor_(U::packS8(lo.c1, hi.c1), top), U::xor_(U::packS8(lo.c2, hi.c2), top)};
  }
};

struct DifferenceLanes {
  static constexpr bool kVector = true;
  Samples3 pixel(const Samples3& s) const { return samplesOf(yuvDifferenceLanes(s.c0, s.c1, s.c2)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    return yuvDifferenceLanes<U>(s);
  }
};

struct DifferenceRounded {
  static constexpr bool kVector = true;
  Samples3 pixel(const Samples3& s) const { return samplesOf(yuvDifferenceRounded(s.c0, s.c1, s.c2)); }
  template <class U>
  ZEL_INLINE Trio<U> lanes(const Trio<U>& s) const {
    return yuvDifferenceRounded<U>(s);
  }
};

struct DifferenceTruncated {
  static constexpr bool kVector = false;
  Samples3 pixel(const Samples3& s) const { return samplesOf(yuvDifferenceTruncated(s.c0, s.c1, s.c2)); }
};

struct MatrixWide {
  static constexpr bool kVector = false;
  Samples3 pixel(const Samples3& s) const { return samplesOf(yuvMatrixWide(s.c0, s.c1, s.c2)); }
};

PlanesOut planesOut(uint8_t* const dst[]) { return {dst[0], dst[1], dst[2]}; }

// The fourth byte of 16 four-byte pixels, gathered.
inline __m128i fourthBytes(const uint8_t* p) {
  const __m128i pick = _mm_setr_epi8(3, 7, 11, 15, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1);
  const __m128i a = _mm_shuffle_epi8(load128(p), pick), b = _mm_shuffle_epi8(load128(p + 16), pick);
  const __m128i c = _mm_shuffle_epi8(load128(p + 32), pick), d = _mm_shuffle_epi8(load128(p + 48), pick);
  return _mm_unpacklo_epi64(_mm_unpacklo_epi32(a, b), _mm_unpacklo_epi32(c, d));
}

}  // namespace

void rgbToYuvC3Row(const uint8_t* src, uint8_t* dst, int width, VectorTier tier) {
  convertRow(PackedIn<3>{src}, PackedOut3<false>{dst}, width, width & ~15, MatrixBytes{}, DifferenceTruncated{}, tier);
}

void rgbToYuvC3P3Row(const uint8_t* src, uint8_t* const dst[3], int width, VectorTier tier) {
  convertRow(PackedIn<3>{src}, planesOut(dst), width, width & ~7, MatrixBytes{}, DifferenceTruncated{}, tier);
}

// Y, U and V of a row come from one pass: with planes that do not overlap
// (the only defined use) that is the same as a pass per output plane.
void rgbToYuvP3Row(const uint8_t* const src[3], uint8_t* const dst[3], int width, VectorTier tier) {
  convertRow(PlanesIn{src[0], src[1], src[2]}, planesOut(dst), width, width & ~15, MatrixBytes{}, MatrixWide{}, tier);
}

// One exact formula for the whole row, in vector blocks and one by one.
void rgbToYuvAC4Row(const uint8_t* src, uint8_t* dst, int width, VectorTier tier) {
  convertRow(PackedIn<4>{src}, PackedOutKeep{dst}, width, width, DifferenceRounded{}, DifferenceRounded{}, tier);
}

void rgbToYuvAC4P4Row(const uint8_t* src, uint8_t* const dst[4], int width, VectorTier tier) {
  convertRow(PackedIn<4>{src}, planesOut(dst), width, width & ~7, DifferenceLanes{}, DifferenceRounded{}, tier);
  // The fourth source byte of every pixel goes to the fourth plane.
  int x = 0;
  for (; x + 16 <= width; x += 16) store128(dst[3] + x, fourthBytes(src + 4 * x));
  for (; x < width; ++x) dst[3][x] = src[4 * x + 3];
}

}  // namespace zel::lc

using namespace zel::lc;
using zel::anyPlaneNull;

ZEL_PUBLIC Status zeliRGBToYUV_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return walkInterleaved(src, srcStep, dst, dstStep, size, rgbToYuvC3Row);
}

ZEL_PUBLIC Status zeliRGBToYUV_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  return walkInterleaved(src, srcStep, dst, dstStep, size, rgbToYuvAC4Row);
}

ZEL_PUBLIC Status zeliRGBToYUV_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep,
                                        ImageSize size) {
  if (!src || !dstPlanes) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  if (anyPlaneNull(dstPlanes, 3)) return StatusNullPointerError;
  const zel::VectorTier tier = zel::widestTierWithBytePermutes();
  zel::plainWalk(size.height, [&](int y) {
    const PlaneRows<uint8_t, 3> d(dstPlanes, dstStep, y);
    rgbToYuvC3P3Row(zel::rowAt(src, srcStep, y), d.p, size.width, tier);
  });
  return StatusOk;
}

// The fourth plane is not tested and is written.
ZEL_PUBLIC Status zeliRGBToYUV_8u_AC4P4R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[4], int dstStep,
                                         ImageSize size) {
  if (!src || !dstPlanes) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  if (anyPlaneNull(dstPlanes, 3)) return StatusNullPointerError;
  const zel::VectorTier tier = zel::widestTierWithBytePermutes();
  zel::plainWalk(size.height, [&](int y) {
    const PlaneRows<uint8_t, 4> d(dstPlanes, dstStep, y);
    rgbToYuvAC4P4Row(zel::rowAt(src, srcStep, y), d.p, size.width, tier);
  });
  return StatusOk;
}

ZEL_PUBLIC Status zeliRGBToYUV_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                      int dstStep, ImageSize size) {
  if (!srcPlanes || !dstPlanes) return StatusNullPointerError;
  if (sizeBelowOne(size)) return StatusSizeError;
  if (anyPlaneNull(srcPlanes, 3)) return StatusNullPointerError;
  if (anyPlaneNull(dstPlanes, 3)) return StatusNullPointerError;
  const zel::VectorTier tier = zel::widestTierWithBytePermutes();
  zel::plainWalk(size.height, [&](int y) {
    const PlaneRows<const uint8_t, 3> s(srcPlanes, srcStep, y);
    const PlaneRows<uint8_t, 3> d(dstPlanes, dstStep, y);
    rgbToYuvP3Row(s.p, d.p, size.width, tier);
  });
  return StatusOk;
}
