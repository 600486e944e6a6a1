// Video-range YCbCr to RGB or BGR at full resolution. One matrix, several
// forms: each member has its lane form for the body (coefficient set,
// rounding term, added or subtracted green) and, for the RGB names, a wide
// form for the last pixels of the row. The BGR names run their lane form to
// the row's end.
#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "luma_chroma/pixel_rows.h"
#include "luma_chroma/ycbcr_lanes.h"

namespace zel::lc {

namespace {

bool badSize(ImageSize size) { return size.width < 1 || size.height < 1; }

PlanesIn planesIn(const uint8_t* const planes[3], int step, int y) {
  return {rowAt(planes[0], step, y), rowAt(planes[1], step, y), rowAt(planes[2], step, y)};
}

// Plain walk over rows; pixels [0, bodyEnd) take the body form.
template <class Body, class Tail, class InRow, class OutRow>
void walkRows(ImageSize size, int bodyEnd, const Body& body, const Tail& tail, InRow inRow, OutRow outRow) {
  const VectorTier tier = zel::widestTierWithBytePermutes();
  plainWalk(size.height, [&](int y) { convertRow(inRow(y), outRow(y), size.width, bodyEnd, body, tail, tier); });
}

// Three planes to interleaved pixels; the BGR names take the body form
// across the whole row.
template <class Out, class Body, class Tail>
void planesToPacked(const uint8_t* const srcPlanes[3], int srcStep, Out (*outRow)(uint8_t*, uint8_t), uint8_t* dst,
                    int dstStep, uint8_t alpha, ImageSize size, int bodyEnd, const Body& body, const Tail& tail) {
  walkRows(size, bodyEnd, body, tail, [&](int y) { return planesIn(srcPlanes, srcStep, y); },
           [&](int y) { return outRow(rowAt(dst, dstStep, y), alpha); });
}

template <bool Reverse>
PackedOut3<Reverse> out3(uint8_t* row, uint8_t) {
  return {row};
}
template <bool Reverse>
PackedOutAlpha<Reverse> out4(uint8_t* row, uint8_t alpha) {
  return {row, alpha};
}

// The BGR names: pointers and plane entries, then the size; one form.
template <class Out, class Body>
Status bgrMember(const uint8_t* const srcPlanes[3], int srcStep, Out (*outRow)(uint8_t*, uint8_t), uint8_t* dst,
                 int dstStep, uint8_t alpha, ImageSize size, const Body& body) {
  if (!srcPlanes || !dst || anyPlaneNull(srcPlanes)) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  planesToPacked(srcPlanes, srcStep, outRow, dst, dstStep, alpha, size, size.width, body, body);
  return StatusOk;
}

}  // namespace

}  // namespace zel::lc

using namespace zel::lc;
using zel::anyPlaneNull;

ZEL_PUBLIC Status zeliYCbCrToRGB_8u_AC4R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                         ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  // No body: every pixel takes the wide truncated form; the fourth byte stays.
  const WideRgbForm wide{wide601a, 0};
  const int width = size.width;
  zel::plainWalk(size.height,
                 [&](int y) { keepAlphaRow(zel::rowAt(src, srcStep, y), zel::rowAt(dst, dstStep, y), width, wide); });
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCbCrToRGB_8u_C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  walkRows(size, size.width & ~3, LaneAddedBytes<lanes601a, 8>{}, WideRgbForm{wide601a, 0},
           [&](int y) { return PackedIn<3>{zel::rowAt(src, srcStep, y)}; },
           [&](int y) { return PackedOut3<false>{zel::rowAt(dst, dstStep, y)}; });
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCbCrToRGB_8u_P3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* const dstPlanes[3],
                                        int dstStep, ImageSize size) {
  if (!srcPlanes || !dstPlanes) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  if (!dstPlanes[0] || !dstPlanes[1] || !dstPlanes[2]) return StatusNullPointerError;
  if (anyPlaneNull(srcPlanes)) return StatusNullPointerError;
  // Blocks of 16, 8 and 4 all compute the body form (no rounding term);
  // the last width AND 3 pixels round in the wide form.
  walkRows(size, size.width & ~3, LaneAddedBytes<lanes601a, 0>{}, WideRgbForm{wide601a, 32768},
           [&](int y) { return planesIn(srcPlanes, srcStep, y); },
           [&](int y) {
             return PlanesOut{zel::rowAt(dstPlanes[0], dstStep, y), zel::rowAt(dstPlanes[1], dstStep, y),
                              zel::rowAt(dstPlanes[2], dstStep, y)};
           });
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCbCrToRGB_8u_P3C3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                          ImageSize size) {
  if (!srcPlanes || !dst) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  if (anyPlaneNull(srcPlanes)) return StatusNullPointerError;
  planesToPacked(srcPlanes, srcStep, &out3<false>, dst, dstStep, 0, size, size.width & ~7,
                 LaneAddedForm{lanes601b, 8}, WideRgbForm{wide601b, 0});
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCbCrToRGB_8u_P3C4R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                          ImageSize size, uint8_t alpha) {
  if (!srcPlanes || !dst) return StatusNullPointerError;
  if (badSize(size)) return StatusSizeError;
  if (anyPlaneNull(srcPlanes)) return StatusNullPointerError;
  planesToPacked(srcPlanes, srcStep, &out4<false>, dst, dstStep, alpha, size, size.width & ~7,
                 LaneSubtractedForm{lanes601b}, WideRgbForm{wide601b, 32768});
  return StatusOk;
}

ZEL_PUBLIC Status zeliYCbCrToBGR_8u_P3C3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                          ImageSize size) {
  return bgrMember(srcPlanes, srcStep, &out3<true>, dst, dstStep, 0, size, LaneAddedForm{lanes601b, 8});
}

ZEL_PUBLIC Status zeliYCbCrToBGR_8u_P3C4R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                          ImageSize size, uint8_t alpha) {
  return bgrMember(srcPlanes, srcStep, &out4<true>, dst, dstStep, alpha, size, LaneSubtractedForm{lanes601b});
}

ZEL_PUBLIC Status zeliYCbCrToBGR_709CSC_8u_P3C3R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst,
                                                 int dstStep, ImageSize size) {
  return bgrMember(srcPlanes, srcStep, &out3<true>, dst, dstStep, 0, size, LaneAddedForm{lanes709, 8});
}

ZEL_PUBLIC Status zeliYCbCrToBGR_709CSC_8u_P3C4R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst,
                                                 int dstStep, ImageSize size, uint8_t alpha) {
  return bgrMember(srcPlanes, srcStep, &out4<true>, dst, dstStep, alpha, size, LaneSubtractedForm{lanes709});
}
