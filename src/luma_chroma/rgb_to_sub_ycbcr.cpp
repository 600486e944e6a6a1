// RGB or BGR to subsampled video-range YCbCr: 4:2:0 in planes and in a
// luma plane with chroma pairs, 4:2:2 in planes and in pair streams, 4:1:1
// in planes. Each member has a body form over the first N pixels of a row
// (or row pair) and an exact wide tail after it; the member decides the
// forms and N.
#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "luma_chroma/rgb_to_sub_rows.h"

namespace zel::lc::sub {

namespace {

// ---- 4:2:0 ----

// Row pairs into planes Y, C1, C2 (C1, C2 swapped by the YCrCb members).
template <class Body, class Tail, class Rows>
void walk420(const Rows& rows, uint8_t* y, int yStep, uint8_t* c1, int c1Step, uint8_t* c2, int c2Step, ImageSize size,
             int n) {
  const VectorTier tier = zel::widestTierWithBytePermutes();
  rowPairWalk(size.height, [&](int r, int c) {
    const Planes420Out out{rowAt(y, yStep, r), rowAt(y, yStep, r + 1), rowAt(c1, c1Step, c), rowAt(c2, c2Step, c)};
    convertPair(rows(r), rows(r + 1), out, size.width, n, Body{}, Tail{}, tier);
  });
}

template <class Body, class Tail, class Rows>
void walk420TwoPlane(const Rows& rows, uint8_t* y, int yStep, uint8_t* cbcr, int cbcrStep, ImageSize size, int n) {
  const VectorTier tier = zel::widestTierWithBytePermutes();
  rowPairWalk(size.height, [&](int r, int c) {
    const TwoPlane420Out out{rowAt(y, yStep, r), rowAt(y, yStep, r + 1), rowAt(cbcr, cbcrStep, c)};
    convertPair(rows(r), rows(r + 1), out, size.width, n, Body{}, Tail{}, tier);
  });
}

// The lane members of a set: body of 16-pixel blocks and one of 4, wide tail.
template <const MatrixSet& S, int Stride, bool Bgr, bool CrFirst>
Status lanes420(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size,
                int minimum) {
  if (!src || !dst || !dstStep) return StatusNullPointerError;
  if (size.width < minimum || size.height < minimum) return StatusSizeError;
  if (anyPlaneNull(dst, 3)) return StatusNullPointerError;
  const int a = CrFirst ? 2 : 1, b = CrFirst ? 1 : 2;
  walk420<LanesBody<S, 4>, WideTail<S, 4>>(PackedRows<Stride, Bgr>{src, srcStep}, dst[0], dstStep[0], dst[a],
                                           dstStep[a], dst[b], dstStep[b], size, bodyBy16Then4(size.width));
  return oddWarning(size, true);
}

// lumaRounded and chromaRounded420 over half-width blocks, wide tail.
template <int Stride>
Status rounded420Planes(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size) {
  if (!src || !dst || !dstStep) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (anyPlaneNull(dst, 3)) return StatusNullPointerError;
  walk420<RoundedBody<false>, WideTail<set601, 4>>(PackedRows<Stride, false>{src, srcStep}, dst[0], dstStep[0], dst[1],
                                                   dstStep[1], dst[2], dstStep[2], size, bodyByHalfWidth(size.width));
  return oddWarning(size, true);
}

template <int Stride>
Status rounded420TwoPlane(const uint8_t* src, int srcStep, uint8_t* dstY, int dstYStep, uint8_t* dstCbCr,
                          int dstCbCrStep, ImageSize size) {
  if (!src || !dstY || !dstCbCr) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  walk420TwoPlane<RoundedBody<false>, WideTail<set601, 4>>(PackedRows<Stride, false>{src, srcStep}, dstY, dstYStep,
                                                           dstCbCr, dstCbCrStep, size, bodyByHalfWidth(size.width));
  return oddWarning(size, true);
}

// ---- 4:2:2 and 4:1:1 rows ----

template <int Ratio, class Body, class Tail, class Rows, class OutRow>
void walkRows(const Rows& rows, const OutRow& outRow, ImageSize size, int n) {
  const VectorTier tier = zel::widestTierWithBytePermutes();
  plainWalk(size.height, [&](int y) { convertRow<Ratio>(rows(y), outRow(y), size.width, n, Body{}, Tail{}, tier); });
}

template <int Ratio, bool OddChroma = false>
struct PlaneOutRows {
  uint8_t* const* dst;
  const int* steps;
  PlanesOutSub<Ratio, OddChroma> operator()(int y) const {
    return {rowAt(dst[0], steps[0], y), rowAt(dst[1], steps[1], y), rowAt(dst[2], steps[2], y)};
  }
};

template <PairOrder O>
struct PairOutRows {
  uint8_t* dst;
  int step;
  PairsOut<O> operator()(int y) const { return {rowAt(dst, step, y)}; }
};

// lumaLanes and chromaLanes422 of set601: blocks of 32 and one of 8.
template <int Stride, bool Bgr>
Status lanes422Planes(const uint8_t* src, int srcStep, uint8_t* const dst[3], const int dstStep[3], ImageSize size) {
  if (!src || !dst || !dstStep) return StatusNullPointerError;
  if (size.width < 2 || size.height < 1) return StatusSizeError;
  if (anyPlaneNull(dst, 3)) return StatusNullPointerError;
  walkRows<2, LanesBody<set601, 2>, WideTail<set601, 2>>(
      PackedRows<Stride, Bgr>{src, srcStep}, PlaneOutRows<2>{dst, dstStep}, size, bodyBy32Then8(size.width));
  return StatusOk;
}

template <int Stride>
Status lanes422Pairs(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 2 || size.height < 1) return StatusSizeError;
  walkRows<2, LanesBody<set601, 2>, WideTail<set601, 2>>(PackedRows<Stride, true>{src, srcStep},
                                                         PairOutRows<PairOrder::YCbCr>{dst, dstStep}, size,
                                                         bodyBy32Then8(size.width));
  return StatusOk;
}

// The pair members with exact chroma: body of 8-pixel blocks.
template <PairOrder O, class Rows>
Status exactPairs(const Rows& rows, uint8_t* dst, int dstStep, ImageSize size) {
  walkRows<2, ExactPairBody, ExactPairTail>(rows, PairOutRows<O>{dst, dstStep}, size, size.width & ~7);
  return StatusOk;
}

// The CbYCr streams of the BGR members.
template <const MatrixSet& S, int Stride>
Status cbycrPairs(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size, int n) {
  walkRows<2, CbYCrBody<S>, CbYCrTail<S>>(PackedRows<Stride, true>{src, srcStep},
                                          PairOutRows<PairOrder::CbYCr>{dst, dstStep}, size, n);
  return StatusOk;
}

}  // namespace

}  // namespace zel::lc::sub

using namespace zel::lc::sub;
using zel::anyPlaneNull;
using zel::lc::PackedIn;

// ---- 4:2:0, lane bodies ----

ZEL_PUBLIC Status zeliBGRToYCbCr420_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                             const int dstSteps[3], ImageSize size) {
  return lanes420<set601, 3, true, false>(src, srcStep, dstPlanes, dstSteps, size, 2);
}
ZEL_PUBLIC Status zeliBGRToYCbCr420_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                              const int dstSteps[3], ImageSize size) {
  return lanes420<set601, 4, true, false>(src, srcStep, dstPlanes, dstSteps, size, 2);
}
ZEL_PUBLIC Status zeliBGRToYCrCb420_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                             const int dstSteps[3], ImageSize size) {
  return lanes420<set601, 3, true, true>(src, srcStep, dstPlanes, dstSteps, size, 2);
}
ZEL_PUBLIC Status zeliBGRToYCrCb420_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                              const int dstSteps[3], ImageSize size) {
  return lanes420<set601, 4, true, true>(src, srcStep, dstPlanes, dstSteps, size, 2);
}
ZEL_PUBLIC Status zeliRGBToYCrCb420_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                              const int dstSteps[3], ImageSize size) {
  return lanes420<set601, 4, false, true>(src, srcStep, dstPlanes, dstSteps, size, 2);
}
ZEL_PUBLIC Status zeliBGRToYCbCr420_709CSC_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                                    const int dstSteps[3], ImageSize size) {
  return lanes420<set709Csc, 3, true, false>(src, srcStep, dstPlanes, dstSteps, size, 2);
}
ZEL_PUBLIC Status zeliBGRToYCbCr420_709CSC_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                                     const int dstSteps[3], ImageSize size) {
  return lanes420<set709Csc, 4, true, false>(src, srcStep, dstPlanes, dstSteps, size, 2);
}
ZEL_PUBLIC Status zeliBGRToYCrCb420_709CSC_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                                    const int dstSteps[3], ImageSize size) {
  return lanes420<set709Csc, 3, true, true>(src, srcStep, dstPlanes, dstSteps, size, 2);
}
ZEL_PUBLIC Status zeliBGRToYCrCb420_709CSC_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                                     const int dstSteps[3], ImageSize size) {
  return lanes420<set709Csc, 4, true, true>(src, srcStep, dstPlanes, dstSteps, size, 2);
}
ZEL_PUBLIC Status zeliBGRToYCbCr420_709HDTV_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                                      const int dstSteps[3], ImageSize size) {
  return lanes420<set709Hdtv, 4, true, false>(src, srcStep, dstPlanes, dstSteps, size, 2);
}

ZEL_PUBLIC Status zeliBGRToYCbCr420_709CSC_8u_C3P2R(const uint8_t* src, int srcStep, uint8_t* dstY, int dstYStep,
                                                    uint8_t* dstCbCr, int dstCbCrStep, ImageSize size) {
  if (!src || !dstY || !dstCbCr) return StatusNullPointerError;
  if (size.width < 2 || size.height < 2) return StatusSizeError;
  walk420TwoPlane<LanesBody<set709Csc, 4>, WideTail<set709Csc, 4>>(
      PackedRows<3, true>{src, srcStep}, dstY, dstYStep, dstCbCr, dstCbCrStep, size, bodyByHalfWidth(size.width));
  return oddWarning(size, true);
}

// ---- 4:2:0, rounded bodies ----

ZEL_PUBLIC Status zeliRGBToYCbCr420_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                             const int dstSteps[3], ImageSize size) {
  // Aligned planes would take aligned stores; the bytes are the same.
  return rounded420Planes<3>(src, srcStep, dstPlanes, dstSteps, size);
}
ZEL_PUBLIC Status zeliRGBToYCbCr420_8u_C3P2R(const uint8_t* src, int srcStep, uint8_t* dstY, int dstYStep,
                                             uint8_t* dstCbCr, int dstCbCrStep, ImageSize size) {
  return rounded420TwoPlane<3>(src, srcStep, dstY, dstYStep, dstCbCr, dstCbCrStep, size);
}
ZEL_PUBLIC Status zeliRGBToYCbCr420_8u_C4P2R(const uint8_t* src, int srcStep, uint8_t* dstY, int dstYStep,
                                             uint8_t* dstCbCr, int dstCbCrStep, ImageSize size) {
  return rounded420TwoPlane<4>(src, srcStep, dstY, dstYStep, dstCbCr, dstCbCrStep, size);
}

// ---- 4:1:1 ----

ZEL_PUBLIC Status zeliBGRToYCbCr411_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                             const int dstSteps[3], ImageSize size) {
  if (!src || !dstPlanes || !dstSteps) return StatusNullPointerError;
  if (size.width < 4 || size.height < 1) return StatusSizeError;
  if (anyPlaneNull(dstPlanes, 3)) return StatusNullPointerError;
  walkRows<4, RoundedBody<true>, WideTail<set601, 4>>(PackedRows<3, true>{src, srcStep},
                                                      PlaneOutRows<4>{dstPlanes, dstSteps}, size, size.width & ~15);
  return (size.width & 3) ? StatusOddSizeWarning : StatusOk;
}
ZEL_PUBLIC Status zeliBGRToYCbCr411_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                              const int dstSteps[3], ImageSize size) {
  if (!src || !dstPlanes || !dstSteps) return StatusNullPointerError;
  if (size.width < 4 || size.height < 1) return StatusSizeError;
  if (anyPlaneNull(dstPlanes, 3)) return StatusNullPointerError;
  walkRows<4, LanesBody<set601, 4>, WideTail<set601, 4>>(PackedRows<4, true>{src, srcStep},
                                                         PlaneOutRows<4>{dstPlanes, dstSteps}, size, size.width & ~31);
  return (size.width & 3) ? StatusOddSizeWarning : StatusOk;
}

// ---- 4:2:2, lane bodies ----

ZEL_PUBLIC Status zeliBGRToYCbCr422_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                             const int dstSteps[3], ImageSize size) {
  return lanes422Planes<3, true>(src, srcStep, dstPlanes, dstSteps, size);
}
ZEL_PUBLIC Status zeliBGRToYCbCr422_8u_AC4P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                              const int dstSteps[3], ImageSize size) {
  return lanes422Planes<4, true>(src, srcStep, dstPlanes, dstSteps, size);
}
ZEL_PUBLIC Status zeliRGBToYCbCr422_8u_C3P3R(const uint8_t* src, int srcStep, uint8_t* const dstPlanes[3],
                                             const int dstSteps[3], ImageSize size) {
  const Status s = lanes422Planes<3, false>(src, srcStep, dstPlanes, dstSteps, size);
  return s == StatusOk && (size.width & 1) ? StatusOddSizeWarning : s;
}
ZEL_PUBLIC Status zeliBGRToYCbCr422_8u_C3C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                             ImageSize size) {
  return lanes422Pairs<3>(src, srcStep, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliBGRToYCbCr422_8u_AC4C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                              ImageSize size) {
  return lanes422Pairs<4>(src, srcStep, dst, dstStep, size);
}

// ---- 4:2:2 pairs with exact chroma ----

ZEL_PUBLIC Status zeliRGBToYCbCr422_8u_C3C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                             ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  return exactPairs<PairOrder::YCbCr>(PackedRows<3, false>{src, srcStep}, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToYCrCb422_8u_C3C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                             ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  return exactPairs<PairOrder::YCrCb>(PackedRows<3, false>{src, srcStep}, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToYCbCr422_8u_P3C2R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                             ImageSize size) {
  if (!srcPlanes || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (anyPlaneNull(srcPlanes, 3)) return StatusNullPointerError;
  return exactPairs<PairOrder::YCbCr>(PlaneRows{srcPlanes, srcStep}, dst, dstStep, size);
}
ZEL_PUBLIC Status zeliRGBToYCrCb422_8u_P3C2R(const uint8_t* const srcPlanes[3], int srcStep, uint8_t* dst, int dstStep,
                                             ImageSize size) {
  if (!srcPlanes || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (anyPlaneNull(srcPlanes, 3)) return StatusNullPointerError;
  return exactPairs<PairOrder::YCrCb>(PlaneRows{srcPlanes, srcStep}, dst, dstStep, size);
}

// ---- CbYCr streams of BGR ----

ZEL_PUBLIC Status zeliBGRToCbYCr422_8u_AC4C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                              ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  // Aligned and unaligned images share one kernel: the bytes agree.
  return cbycrPairs<set601, 4>(src, srcStep, dst, dstStep, size, size.width & ~7);
}
ZEL_PUBLIC Status zeliBGRToCbYCr422_709HDTV_8u_AC4C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                                      ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  return cbycrPairs<set709Hdtv, 4>(src, srcStep, dst, dstStep, size, size.width & ~7);
}
ZEL_PUBLIC Status zeliBGRToCbYCr422_709HDTV_8u_C3C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                                     ImageSize size) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  return cbycrPairs<set709Hdtv, 3>(src, srcStep, dst, dstStep, size, bodyBy32Then8(size.width));
}
