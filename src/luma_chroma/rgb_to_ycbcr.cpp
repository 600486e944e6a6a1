// RGB to video-range YCbCr at full resolution. The member and the pixel's
// place in the row choose the form: the interleaved member has a rounded
// body in blocks of 16, the planar destinations a high-word body in blocks
// of 8, and every row ends in the exact wide form.
#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "luma_chroma/pixel_rows.h"
#include "luma_chroma/rgb_to_ycbcr_forms.h"

namespace zel::lc {

namespace {

// Plain walk: every row takes the body form up to width AND NOT blockMask
// and the wide form after it.
template <class Body, class InRow, class OutRow>
void walkRows(ImageSize size, int blockMask, const Body& body, InRow inRow, OutRow outRow) {
  const VectorTier tier = zel::widestTierWithBytePermutes();
  const int bodyEnd = size.width & ~blockMask;
  plainWalk(size.height,
            [&](int y) { convertRow(inRow(y), outRow(y), size.width, bodyEnd, body, WideFwd{}, tier); });
}

bool badSize(ImageSize size) { return size.width < 1 || size.height < 1; }

template <int Stride>
PackedIn<Stride> packedIn(const uint8_t* src, int step, int y) {
  return {rowAt(src, step, y)};
}
PlanesIn planesIn(const uint8_t* const planes[3], int step, int y) {
  return {rowAt(planes[0], step, y), rowAt(planes[1], step, y), rowAt(planes[2], step, y)};
}
PlanesOut planesOut(uint8_t* const planes[3], int step, int y) {
  return {rowAt(planes[0], step, y), rowAt(planes[1], step, y), rowAt(planes[2], step, y)};
}

// Interleaved source to three planes: high-word body in blocks of 8.
template <int Stride>
Status packedToPlanes(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep, ImageSize size) {
  walkRows(size, 7, HighWordFwd{}, [&](int y) { return packedIn<Stride>(src, srcStep, y); },
           [&](int y) { return planesOut(dstPlanes, dstStep, y); });
  return StatusOk;
}

}  // namespace

}  // namespace zel::lc

using namespace zel::lc;

ZEL_PUBLIC Status zeliRGBToYCbCr_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  // Aligned and unaligned destinations share one kernel: the bytes agree.
  walkRows(size, 15, RoundedFwd{}, [&](int y) { return packedIn<3>(src, srcStep, y); },
           [&](int y) { return PackedOut3<false>{zel::rowAt(dst, dstStep, y)}; });
  return StatusOk;
}

ZEL_PUBLIC Status zeliRGBToYCbCr_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                         ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  // No body: every pixel takes the wide form; the fourth byte stays.
  const int width = size.width;
  zel::plainWalk(size.height,
                 [&](int y) { keepAlphaRow(zel::rowAt(src, srcStep, y), zel::rowAt(dst, dstStep, y), width, WideFwd{}); });
  return StatusOk;
}

ZEL_PUBLIC Status zeliRGBToYCbCr_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep,
                                          ImageSize size) {
  if (!src || !dstPlanes || !dstPlanes[0] || !dstPlanes[1] || !dstPlanes[2]) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  return packedToPlanes<3>(src, srcStep, dstPlanes, dstStep, size);
}

ZEL_PUBLIC Status zeliRGBToYCbCr_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3], int dstStep,
                                           ImageSize size) {
  if (!src || !dstPlanes || !dstPlanes[0] || !dstPlanes[1] || !dstPlanes[2]) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  return packedToPlanes<4>(src, srcStep, dstPlanes, dstStep, size);
}

ZEL_PUBLIC Status zeliRGBToYCbCr_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                        int dstStep, ImageSize size) {
  if (!srcPlanes || !dstPlanes) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  if (!srcPlanes[0] || !srcPlanes[1] || !srcPlanes[2]) return StatusNullPointerError;
  if (!dstPlanes[0] || !dstPlanes[1] || !dstPlanes[2]) return StatusNullPointerError;
  // The fast 16-pixel loop of fully aligned images and the general 8-pixel
  // loop compute the same form; one blocked kernel serves both.
  walkRows(size, 7, HighWordFwd{}, [&](int y) { return planesIn(srcPlanes, srcStep, y); },
           [&](int y) { return planesOut(dstPlanes, dstStep, y); });
  return StatusOk;
}
