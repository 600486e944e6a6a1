// 4:2:0 YCbCr to RGB or BGR: a luma plane with a plane of chroma pairs, or
// three planes. Each public function holds its row-pair loop; a last odd
// row and column stay unwritten and the call then warns.
#include "frame/export.h"
#include "luma_chroma/sub_to_rgb_drivers.h"

namespace zel::lc::expand {

namespace {

// Luma and chroma pairs: every pixel of the even part of a row takes the
// raw pair-lane form, and there is no tail.
template <bool CrFirst, class MakeOut>
Status pairPlane420(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep, MakeOut out,
                    ImageSize size) {
  const PairRawForm body{pairLanesA};
  return expandPairs(
      size, size.width & ~1, [=](int y) { return rowAt(srcY, srcYStep, y); },
      [=](int j) { return ChromaPairs<CrFirst>{rowAt(srcCbCr, srcCbCrStep, j)}; }, out, body, body);
}

// The three-plane members: body pixels in whole groups of 8, the pairs
// after them in the tail.
int groupsOf8(int width) { return 2 * ((width >> 1) & ~3); }

template <bool CrFirst, class MakeOut, class Body, class Tail>
Status planes420(const SubPlanes& src, int bodyEnd, MakeOut out, ImageSize size, const Body& body, const Tail& tail) {
  return expandPairs(
      size, bodyEnd, [=](int y) { return src.luma(y); }, [=](int j) { return chromaPlanes<2, CrFirst>(src, j); }, out,
      body, tail);
}

// Pointers and the size; the pair stream's two planes have no entries.
Status pairArguments(const uint8_t* srcY, const uint8_t* srcCbCr, const uint8_t* dst, ImageSize size) {
  if (!srcY || !srcCbCr || !dst) return StatusNullPointerError;
  if (sizeBelow(size, 1, 1)) return StatusSizeError;
  return StatusOk;
}

// The array and the destination, the size, then the plane entries.
Status planeArguments(const uint8_t* const srcPlanes[3], const void* dst, ImageSize size, int minimum = 1) {
  if (!srcPlanes || !dst) return StatusNullPointerError;
  if (sizeBelow(size, minimum, minimum)) return StatusSizeError;
  if (anyPlaneNull(srcPlanes)) return StatusNullPointerError;
  return StatusOk;
}

}  // namespace

}  // namespace zel::lc::expand

using namespace zel::lc::expand;
using zel::lc::lanes601b;
using zel::lc::lanes709;
using zel::lc::wide601a;

// ---- luma plane and chroma pairs ----

ZEL_PUBLIC Status zeliYCbCr420ToRGB_8u_P2C3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep,
                                             uint8_t* dst, int dstStep, ImageSize size) {
  if (const Status s = pairArguments(srcY, srcCbCr, dst, size)) return s;
  return pairPlane420<false>(srcY, srcYStep, srcCbCr, srcCbCrStep, packedRows3<false>(dst, dstStep), size);
}

ZEL_PUBLIC Status zeliYCbCr420ToRGB_8u_P2C4R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep,
                                             uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha) {
  if (const Status s = pairArguments(srcY, srcCbCr, dst, size)) return s;
  return pairPlane420<false>(srcY, srcYStep, srcCbCr, srcCbCrStep, packedRows4<false>(dst, dstStep, alpha), size);
}

ZEL_PUBLIC Status zeliYCbCr420ToBGR_8u_P2C3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep,
                                             uint8_t* dst, int dstStep, ImageSize size) {
  if (const Status s = pairArguments(srcY, srcCbCr, dst, size)) return s;
  return pairPlane420<false>(srcY, srcYStep, srcCbCr, srcCbCrStep, packedRows3<true>(dst, dstStep), size);
}

ZEL_PUBLIC Status zeliYCbCr420ToBGR_8u_P2C4R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCbCr, int srcCbCrStep,
                                             uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha) {
  if (const Status s = pairArguments(srcY, srcCbCr, dst, size)) return s;
  return pairPlane420<false>(srcY, srcYStep, srcCbCr, srcCbCrStep, packedRows4<true>(dst, dstStep, alpha), size);
}

ZEL_PUBLIC Status zeliYCrCb420ToRGB_8u_P2C3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCrCb, int srcCrCbStep,
                                             uint8_t* dst, int dstStep, ImageSize size) {
  if (const Status s = pairArguments(srcY, srcCrCb, dst, size)) return s;
  return pairPlane420<true>(srcY, srcYStep, srcCrCb, srcCrCbStep, packedRows3<false>(dst, dstStep), size);
}

// These two test the size before the pointers.
ZEL_PUBLIC Status zeliYCrCb420ToRGB_8u_P2C4R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCrCb, int srcCrCbStep,
                                             uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha) {
  if (sizeBelow(size, 1, 1)) return StatusSizeError;
  if (!srcY || !srcCrCb || !dst) return StatusNullPointerError;
  return pairPlane420<true>(srcY, srcYStep, srcCrCb, srcCrCbStep, packedRows4<false>(dst, dstStep, alpha), size);
}

ZEL_PUBLIC Status zeliYCrCb420ToBGR_8u_P2C3R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCrCb, int srcCrCbStep,
                                             uint8_t* dst, int dstStep, ImageSize size) {
  if (const Status s = pairArguments(srcY, srcCrCb, dst, size)) return s;
  return pairPlane420<true>(srcY, srcYStep, srcCrCb, srcCrCbStep, packedRows3<true>(dst, dstStep), size);
}

ZEL_PUBLIC Status zeliYCrCb420ToBGR_8u_P2C4R(const uint8_t* srcY, int srcYStep, const uint8_t* srcCrCb, int srcCrCbStep,
                                             uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha) {
  if (sizeBelow(size, 1, 1)) return StatusSizeError;
  if (!srcY || !srcCrCb || !dst) return StatusNullPointerError;
  return pairPlane420<true>(srcY, srcYStep, srcCrCb, srcCrCbStep, packedRows4<true>(dst, dstStep, alpha), size);
}

// ---- three planes ----

ZEL_PUBLIC Status zeliYCbCr420ToBGR_8u_P3C4R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst,
                                             int dstStep, ImageSize size, uint8_t alpha) {
  if (const Status s = planeArguments(srcPlanes, dst, size)) return s;
  const PairRawForm body{pairLanesA};
  return planes420<false>(SubPlanes{srcPlanes, srcSteps}, size.width & ~1, packedRows4<true>(dst, dstStep, alpha), size,
                          body, body);
}

// Planes Y, Cr, Cb.
ZEL_PUBLIC Status zeliYCrCb420ToRGB_8u_P3C4R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst,
                                             int dstStep, ImageSize size, uint8_t alpha) {
  if (const Status s = planeArguments(srcPlanes, dst, size)) return s;
  const PairRawForm body{pairLanesA};
  return planes420<true>(SubPlanes{srcPlanes, srcSteps}, size.width & ~1, packedRows4<false>(dst, dstStep, alpha), size,
                         body, body);
}

// Two kernels of different results: the centred pair lanes when every
// pointer and step is a multiple of 16, the lane form otherwise. One image
// takes one kernel throughout; the tail is the same in both.
ZEL_PUBLIC Status zeliYCbCr420ToBGR_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst,
                                             int dstStep, ImageSize size) {
  if (const Status s = planeArguments(srcPlanes, dst, size)) return s;
  const SubPlanes src{srcPlanes, srcSteps};
  const WideTail tail{wide601a, 32768};
  const int bodyEnd = groupsOf8(size.width);
  if (src.aligned() && zel::isAligned16(dst) && zel::isAligned16(dstStep))
    return planes420<false>(src, bodyEnd, packedRows3<true>(dst, dstStep), size, PairCentredForm{pairLanesA}, tail);
  return planes420<false>(src, bodyEnd, packedRows3<true>(dst, dstStep), size, LanesForm{lanes601b}, tail);
}

ZEL_PUBLIC Status zeliYCbCr420ToRGB_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3], uint8_t* dst,
                                             int dstStep, ImageSize size) {
  if (const Status s = planeArguments(srcPlanes, dst, size)) return s;
  return planes420<false>(SubPlanes{srcPlanes, srcSteps}, groupsOf8(size.width), packedRows3<false>(dst, dstStep), size,
                          LanesForm{lanes601b}, WideTail{wide601a, 32768});
}

ZEL_PUBLIC Status zeliYCbCr420ToBGR_709CSC_8u_P3C3R(const uint8_t* const srcPlanes[3], const int srcSteps[3],
                                                    uint8_t* dst, int dstStep, ImageSize size) {
  if (const Status s = planeArguments(srcPlanes, dst, size)) return s;
  return planes420<false>(SubPlanes{srcPlanes, srcSteps}, groupsOf8(size.width), packedRows3<true>(dst, dstStep), size,
                          LanesForm{lanes709}, WideTail{wide709, 32768});
}

ZEL_PUBLIC Status zeliYCbCr420ToBGR_709HDTV_8u_P3C4R(const uint8_t* const srcPlanes[3], const int srcSteps[3],
                                                     uint8_t* dst, int dstStep, ImageSize size, uint8_t alpha) {
  if (const Status s = planeArguments(srcPlanes, dst, size)) return s;
  return planes420<false>(SubPlanes{srcPlanes, srcSteps}, groupsOf8(size.width), packedRows4<true>(dst, dstStep, alpha),
                          size, SixteenthsForm{lanesHDTV}, WideTail{wideHDTV, 32768});
}
