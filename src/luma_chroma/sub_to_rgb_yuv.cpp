// Subsampled YUV to RGB or BGR: 4:2:0 and 4:2:2 planes, the 4:2:2 pair
// stream, and the names without steps, whose images are tightly packed.
// 4:2:0 members walk row pairs and leave a last odd row and column
// unwritten; 4:2:2 members give a last odd pixel the chroma of its pair.
#include "frame/export.h"
#include "luma_chroma/sub_to_rgb_drivers.h"

namespace zel::lc::expand {

namespace {

constexpr RgbRounding kTruncated{0, 0, 0};
constexpr RgbRounding kRounded{32768, 32768, 32768};

// The AC4 members write 0 into every fourth byte.
constexpr uint8_t kZeroAlpha = 0;

template <class MakeOut, class Body, class Tail>
Status planes420(const SubPlanes& src, int bodyEnd, MakeOut out, ImageSize size, const Body& body, const Tail& tail) {
  return expandPairs(
      size, bodyEnd, [=](int y) { return src.luma(y); }, [=](int j) { return chromaPlanes<2>(src, j); }, out, body,
      tail);
}

template <class MakeOut, class Body, class Tail>
void planes422(const SubPlanes& src, MakeOut out, ImageSize size, int bodyEnd, const Body& body, const Tail& tail) {
  using Set = RowSet<1, LumaRow, ChromaPlanes<2>, decltype(out(0))>;
  expandRows(
      size.height, bodyEnd, size.width,
      [=](int y) {
        return Set{{LumaRow{src.luma(y)}}, chromaPlanes<2>(src, y), {out(y)}};
      },
      body, tail);
}

// The lane shape of the second YUV set up to width AND NOT 15, the
// truncated wide form after it.
const YuvHalvesForm kHalves2{rgbLanes2Set};
const YuvWideForm kWideTruncated{rgbWideA, kTruncated};

// A 4:2:2 plane set without steps: one row of width times height pixels
// when the image allows it, rows with the implied steps otherwise.
template <class Out>
void planes422Packed(const uint8_t* const srcPlanes[3], ImageSize size, Out (*outRow)(uint8_t* const*, int, int),
                     uint8_t* const* dst) {
  if (wholeImageAsRow(size)) {
    const int n = size.width * size.height;
    const RowSet<1, LumaRow, ChromaPlanes<2>, Out> row{
        {LumaRow{srcPlanes[0]}}, ChromaPlanes<2>{srcPlanes[1], srcPlanes[2]}, {outRow(dst, 0, 0)}};
    expandRow(row, n & ~15, n, kHalves2, kWideTruncated, zel::widestTierWithBytePermutes());
    return;
  }
  const int chroma = (size.width >> 1) + (size.width & 1);
  const int steps[3] = {size.width, chroma, chroma};
  planes422(
      SubPlanes{srcPlanes, steps}, [=](int y) { return outRow(dst, size.width, y); }, size, size.width & ~15, kHalves2,
      kWideTruncated);
}

PackedOut3<false> packedOutRow(uint8_t* const* dst, int width, int y) { return {dst[0] + 3 * size_t(width) * y}; }
PlanesOut planesOutRow(uint8_t* const* dst, int width, int y) {
  const size_t at = size_t(width) * y;
  return {dst[0] + at, dst[1] + at, dst[2] + at};
}

Status planeArguments(const uint8_t* const srcPlanes[3], const void* dst, ImageSize size, int minimum = 1) {
  if (!srcPlanes || !dst) return StatusNullPointerError;
  if (sizeBelow(size, minimum, minimum)) return StatusSizeError;
  if (anyPlaneNull(srcPlanes)) return StatusNullPointerError;
  return StatusOk;
}

// Both arrays, the size, then the source entries and the destination's.
Status planeSetArguments(const uint8_t* const srcPlanes[3], uint8_t* const dstPlanes[3], ImageSize size) {
  if (!srcPlanes || !dstPlanes) return StatusNullPointerError;
  if (sizeBelow(size, 1, 1)) return StatusSizeError;
  if (anyPlaneNull(srcPlanes) || anyPlaneNull(dstPlanes)) return StatusNullPointerError;
  return StatusOk;
}

}  // namespace

}  // namespace zel::lc::expand

using namespace zel::lc::expand;
using zel::lc::rgbLanes1Set;
using zel::lc::rgbLanes2Set;
using zel::lc::rgbWideA;

// ---- 4:2:0 ----

// One exact formula for every pixel, in vector blocks.
ZEL_PUBLIC Status zeliYUV420ToRGB_8u_P3R(const uint8_t* const srcPlanes[3], const int srcSteps[3],
                                         uint8_t* const dstPlanes[3], int dstStep, ImageSize size) {
  if (const Status s = planeSetArguments(srcPlanes, dstPlanes, size)) return s;
  return planes420(SubPlanes{srcPlanes, srcSteps}, size.width & ~1, planeOutRows(dstPlanes, dstStep), size,
                   kWideTruncated, kWideTruncated);
}

ZEL_PUBLIC Status zeliYUV420ToRGB_8u_P3(const uint8_t* const srcPlanes[3], uint8_t* const dstPlanes[3],
                                        ImageSize size) {
  if (const Status s = planeSetArguments(srcPlanes, dstPlanes, size)) return s;
  const int steps[3] = {size.width, size.width >> 1, size.width >> 1};
  return planes420(SubPlanes{srcPlanes, steps}, size.width & ~1, planeOutRows(dstPlanes, size.width), size,
                   kWideTruncated, kWideTruncated);
}

ZEL_PUBLIC Status zeliYUV420ToRGB_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst,
                                           int dstStep, ImageSize size) {
  if (const Status s = planeArguments(srcPlanes, dst, size)) return s;
  return planes420(SubPlanes{srcPlanes, srcSteps}, size.width & ~1, packedRows3<false>(dst, dstStep), size, kHalves2,
                   kHalves2);
}

ZEL_PUBLIC Status zeliYUV420ToRGB_8u_P3C3(const uint8_t* const srcPlanes[3], uint8_t* dst, ImageSize size) {
  if (const Status s = planeArguments(srcPlanes, dst, size)) return s;
  const int steps[3] = {size.width, size.width >> 1, size.width >> 1};
  return planes420(SubPlanes{srcPlanes, steps}, size.width & ~1, packedRows3<false>(dst, 3 * size.width), size,
                   kHalves2, kHalves2);
}

// The shape of the second lane set with the constants of the first.
ZEL_PUBLIC Status zeliYUV420ToBGR_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst,
                                           int dstStep, ImageSize size) {
  if (const Status s = planeArguments(srcPlanes, dst, size, 2)) return s;
  const YuvHalvesForm body{rgbLanes1Set};
  return planes420(SubPlanes{srcPlanes, srcSteps}, size.width & ~1, packedRows3<true>(dst, dstStep), size, body, body);
}

// Blocks of 4 chroma pairs and then 2; a remaining pair takes the rounded
// wide form.
ZEL_PUBLIC Status zeliYUV420ToRGB_8u_P3AC4R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst,
                                            int dstStep, ImageSize size) {
  if (const Status s = planeArguments(srcPlanes, dst, size)) return s;
  return planes420(SubPlanes{srcPlanes, srcSteps}, 2 * ((size.width >> 1) & ~1),
                   packedRows4<false>(dst, dstStep, kZeroAlpha), size, SixteenthsForm{lanesYuvQuad},
                   YuvWideForm{rgbWideA, kRounded});
}

// ---- 4:2:2 ----

ZEL_PUBLIC Status zeliYUV422ToRGB_8u_C2C3R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (sizeBelow(size, 1, 1)) return StatusSizeError;
  const auto out = packedRows3<false>(dst, dstStep);
  expandRows(
      size.height, size.width & ~15, size.width,
      [=](int y) { return streamRow<zel::repack::PairOrder::YCbCr>(zel::rowAt(src, srcStep, y), out(y)); }, kHalves2,
      YuvWideForm{rgbWideA, kRounded});
  return StatusOk;
}

ZEL_PUBLIC Status zeliYUV422ToRGB_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst,
                                           int dstStep, ImageSize size) {
  if (const Status s = planeArguments(srcPlanes, dst, size)) return s;
  planes422(SubPlanes{srcPlanes, srcSteps}, packedRows3<false>(dst, dstStep), size, size.width & ~15, kHalves2,
            kWideTruncated);
  return StatusOk;
}

ZEL_PUBLIC Status zeliYUV422ToRGB_8u_P3C3(const uint8_t* const srcPlanes[3], uint8_t* dst, ImageSize size) {
  if (const Status s = planeArguments(srcPlanes, dst, size)) return s;
  uint8_t* const out[1] = {dst};
  planes422Packed(srcPlanes, size, packedOutRow, out);
  return StatusOk;
}

ZEL_PUBLIC Status zeliYUV422ToRGB_8u_P3R(const uint8_t* const srcPlanes[3], const int srcSteps[3],
                                         uint8_t* const dstPlanes[3], int dstStep, ImageSize size) {
  if (const Status s = planeSetArguments(srcPlanes, dstPlanes, size)) return s;
  planes422(SubPlanes{srcPlanes, srcSteps}, planeOutRows(dstPlanes, dstStep), size, size.width & ~15, kHalves2,
            kWideTruncated);
  return StatusOk;
}

ZEL_PUBLIC Status zeliYUV422ToRGB_8u_P3(const uint8_t* const srcPlanes[3], uint8_t* const dstPlanes[3],
                                        ImageSize size) {
  if (const Status s = planeSetArguments(srcPlanes, dstPlanes, size)) return s;
  planes422Packed(srcPlanes, size, planesOutRow, dstPlanes);
  return StatusOk;
}

// Blocks of 8 pixels and then 4; the remaining pair and a last odd pixel
// take the truncated wide form.
ZEL_PUBLIC Status zeliYUV422ToRGB_8u_P3AC4R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst,
                                            int dstStep, ImageSize size) {
  if (const Status s = planeArguments(srcPlanes, dst, size)) return s;
  planes422(SubPlanes{srcPlanes, srcSteps}, packedRows4<false>(dst, dstStep, kZeroAlpha), size, size.width & ~3,
            SixteenthsForm{lanesYuvQuad}, kWideTruncated);
  return StatusOk;
}
