// YCoCg public functions: argument checks, then a driver that walks the
// rows. One step serves all three planes.
#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "ycocg/ycocg_kernels.h"

namespace zel::ycocg {

namespace {

bool anyNull(const void* image, const void* planes) { return !image || !planes; }

bool badSize(ImageSize size) { return size.width < 1 || size.height < 1; }

// Rows of 32-bit planes go through the vector body with non-temporal
// stores when every row pointer is 16-byte aligned and the width is a
// multiple of 8; other rows take ordinary stores. A fence follows the last
// streamed row.
template <typename A, typename B>
bool streamable(const A* interleaved, B* const* planes, int width) {
  return (width & 7) == 0 && isAligned16(interleaved) && isAligned16(planes[0]) && isAligned16(planes[1]) &&
         isAligned16(planes[2]);
}

template <class Op, typename Src, int Ch, bool StreamRule>
void forwardDriver(const Src* src, int srcStep, typename Op::Plane* const* dst, int dstStep, ImageSize size) {
  using Plane = typename Op::Plane;
  const VectorTier tier = widestTier();
  bool streamed = false;
  plainWalk(size.height, [&](int y) {
    const Src* s = rowAt(src, srcStep, y);
    Plane* rows[3] = {rowAt(dst[0], dstStep, y), rowAt(dst[1], dstStep, y), rowAt(dst[2], dstStep, y)};
    if (StreamRule && streamable(s, rows, size.width)) {
      forwardRow<Op, Src, Ch, true>(s, rows, size.width, tier);
      streamed = true;
    } else {
      forwardRow<Op, Src, Ch, false>(s, rows, size.width, tier);
    }
  });
  if (streamed) _mm_sfence();
}

template <class Op, typename Dst, int Ch, bool StreamRule>
void inverseDriver(const typename Op::Plane* const* src, int srcStep, Dst* dst, int dstStep, ImageSize size,
                   Dst alpha) {
  using Plane = typename Op::Plane;
  const VectorTier tier = widestTier();
  bool streamed = false;
  plainWalk(size.height, [&](int y) {
    const Plane* rows[3] = {rowAt(src[0], srcStep, y), rowAt(src[1], srcStep, y), rowAt(src[2], srcStep, y)};
    Dst* d = rowAt(dst, dstStep, y);
    if (StreamRule && streamable(d, rows, size.width)) {
      inverseRow<Op, Dst, Ch, true>(rows, d, size.width, alpha, tier);
      streamed = true;
    } else {
      inverseRow<Op, Dst, Ch, false>(rows, d, size.width, alpha, tier);
    }
  });
  if (streamed) _mm_sfence();
}

// The frame of every member: pointers, then the size where the member
// checks it; a member without the check does nothing for an empty region.
template <class Op, typename Src, int Ch, bool SizeCheck>
Status forward(const Src* src, int srcStep, typename Op::Plane* const* dst, int dstStep, ImageSize size) {
  if (anyNull(src, dst) || anyPlaneNull(dst)) return StatusNullPointerError;
  if (SizeCheck && badSize(size)) return StatusSizeError;
  constexpr bool kStreamRule = sizeof(typename Op::Plane) == 4;
  forwardDriver<Op, Src, Ch, kStreamRule>(src, srcStep, dst, dstStep, size);
  return StatusOk;
}

template <class Op, typename Dst, int Ch, bool SizeCheck>
Status inverse(const typename Op::Plane* const* src, int srcStep, Dst* dst, int dstStep, ImageSize size,
               Dst alpha = 0) {
  if (anyNull(dst, src) || anyPlaneNull(src)) return StatusNullPointerError;
  if (SizeCheck && badSize(size)) return StatusSizeError;
  constexpr bool kStreamRule = sizeof(typename Op::Plane) == 4;
  inverseDriver<Op, Dst, Ch, kStreamRule>(src, srcStep, dst, dstStep, size, alpha);
  return StatusOk;
}

}  // namespace

}  // namespace zel::ycocg

using namespace zel::ycocg;

// ---- forward ----
ZEL_PUBLIC Status zeliBGRToYCoCg_8u16s_C3P3R(const uint8_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                             ImageSize size) {
  return forward<PlainBytes, uint8_t, 3, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToYCoCg_8u16s_C4P3R(const uint8_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                             ImageSize size) {
  return forward<PlainBytes, uint8_t, 4, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToYCoCg_Rev_8u16s_C3P3R(const uint8_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                                 ImageSize size) {
  return forward<LiftBytes, uint8_t, 3, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToYCoCg_Rev_8u16s_C4P3R(const uint8_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                                 ImageSize size) {
  return forward<LiftBytes, uint8_t, 4, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToYCoCg_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dst[3], int dstStep,
                                          ImageSize size) {
  return forward<BytePlanes, uint8_t, 3, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliSBGRToYCoCg_16s32s_C3P3R(const int16_t* src, int srcStep, int32_t* const dst[3], int dstStep,
                                               ImageSize size) {
  return forward<Wide<false>, int16_t, 3, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliSBGRToYCoCg_16s32s_C4P3R(const int16_t* src, int srcStep, int32_t* const dst[3], int dstStep,
                                               ImageSize size) {
  return forward<Wide<false>, int16_t, 4, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliSBGRToYCoCg_16s_C3P3R(const int16_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                            ImageSize size) {
  return forward<PlainShort, int16_t, 3, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliSBGRToYCoCg_16s_C4P3R(const int16_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                            ImageSize size) {
  return forward<PlainShort, int16_t, 4, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliSBGRToYCoCg_Rev_16s32s_C3P3R(const int16_t* src, int srcStep, int32_t* const dst[3], int dstStep,
                                                   ImageSize size) {
  return forward<Wide<true>, int16_t, 3, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliSBGRToYCoCg_Rev_16s32s_C4P3R(const int16_t* src, int srcStep, int32_t* const dst[3], int dstStep,
                                                   ImageSize size) {
  return forward<Wide<true>, int16_t, 4, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliSBGRToYCoCg_Rev_16s_C3P3R(const int16_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                                ImageSize size) {
  return forward<LiftShort, int16_t, 3, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliSBGRToYCoCg_Rev_16s_C4P3R(const int16_t* src, int srcStep, int16_t* const dst[3], int dstStep,
                                                ImageSize size) {
  return forward<LiftShort, int16_t, 4, false>(src, srcStep, dst, dstStep, size);
}

// ---- inverse ----
ZEL_PUBLIC Status zeliYCoCgToBGR_16s8u_P3C3R(const int16_t* const src[3], int srcStep, uint8_t* dst, int dstStep,
                                             ImageSize size) {
  return inverse<Short<false>, uint8_t, 3, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliYCoCgToBGR_16s8u_P3C4R(const int16_t* const src[3], int srcStep, uint8_t* dst, int dstStep,
                                             ImageSize size, uint8_t alpha) {
  return inverse<Short<false>, uint8_t, 4, false>(src, srcStep, dst, dstStep, size, alpha);
}
ZEL_PUBLIC Status zeliYCoCgToBGR_Rev_16s8u_P3C3R(const int16_t* const src[3], int srcStep, uint8_t* dst, int dstStep,
                                                 ImageSize size) {
  return inverse<Short<true>, uint8_t, 3, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliYCoCgToBGR_Rev_16s8u_P3C4R(const int16_t* const src[3], int srcStep, uint8_t* dst, int dstStep,
                                                 ImageSize size, uint8_t alpha) {
  return inverse<Short<true>, uint8_t, 4, false>(src, srcStep, dst, dstStep, size, alpha);
}
ZEL_PUBLIC Status zeliYCoCgToRGB_8u_P3C3R(const uint8_t* const src[3], int srcStep, uint8_t* dst, int dstStep,
                                          ImageSize size) {
  return inverse<BytePlanesBack, uint8_t, 3, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliYCoCgToSBGR_16s_P3C3R(const int16_t* const src[3], int srcStep, int16_t* dst, int dstStep,
                                            ImageSize size) {
  return inverse<Short<false>, int16_t, 3, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliYCoCgToSBGR_16s_P3C4R(const int16_t* const src[3], int srcStep, int16_t* dst, int dstStep,
                                            ImageSize size, int16_t alpha) {
  return inverse<Short<false>, int16_t, 4, true>(src, srcStep, dst, dstStep, size, alpha);
}
ZEL_PUBLIC Status zeliYCoCgToSBGR_32s16s_P3C3R(const int32_t* const src[3], int srcStep, int16_t* dst, int dstStep,
                                               ImageSize size) {
  return inverse<Long<false>, int16_t, 3, true>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliYCoCgToSBGR_32s16s_P3C4R(const int32_t* const src[3], int srcStep, int16_t* dst, int dstStep,
                                               ImageSize size, int16_t alpha) {
  return inverse<Long<false>, int16_t, 4, true>(src, srcStep, dst, dstStep, size, alpha);
}
ZEL_PUBLIC Status zeliYCoCgToSBGR_Rev_16s_P3C3R(const int16_t* const src[3], int srcStep, int16_t* dst, int dstStep,
                                                ImageSize size) {
  return inverse<Short<true>, int16_t, 3, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliYCoCgToSBGR_Rev_16s_P3C4R(const int16_t* const src[3], int srcStep, int16_t* dst, int dstStep,
                                                ImageSize size, int16_t alpha) {
  return inverse<Short<true>, int16_t, 4, false>(src, srcStep, dst, dstStep, size, alpha);
}
ZEL_PUBLIC Status zeliYCoCgToSBGR_Rev_32s16s_P3C3R(const int32_t* const src[3], int srcStep, int16_t* dst, int dstStep,
                                                   ImageSize size) {
  return inverse<Long<true>, int16_t, 3, false>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliYCoCgToSBGR_Rev_32s16s_P3C4R(const int32_t* const src[3], int srcStep, int16_t* dst, int dstStep,
                                                   ImageSize size, int16_t alpha) {
  return inverse<Long<true>, int16_t, 4, false>(src, srcStep, dst, dstStep, size, alpha);
}
