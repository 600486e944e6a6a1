// Bit-depth reduction: the public frame of the 32 level-reducing members.
// Checks in order (pointers, size, noise, levels), then one driver chosen
// by dither kind and by whether there is noise.
#include "frame/export.h"
#include "reduce_bits/reduce_drivers.h"

namespace zel::reduce {

namespace {

template <typename Src, typename Dst, LayoutCode L>
Status reduceBits(const Src* src, int srcStep, Dst* dst, int dstStep, ImageSize size, int noise, int ditherKind,
                  int levels) {
  using M = Member<Src, Dst>;
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (uint32_t(noise) > 100u) return StatusNoiseError;
  if (levels < 2 || levels > M::maxLevels) return StatusLevelsError;
  // An unknown kind is no error: nothing to do.
  if (uint32_t(ditherKind) > uint32_t(ReduceDitherOrdered4x4)) return StatusOk;

  const Image<Src, Dst> im{src, srcStep, dst, dstStep, size.width, size.height};
  switch (uint32_t(ditherKind)) {
    case ReduceDitherOff:
      plainDriver<M, L>(im, levels);
      return StatusOk;
    case ReduceDitherFloydSteinberg:
      return noise ? floydSteinbergDriver<M, L, true>(im, levels, noise)
                   : floydSteinbergDriver<M, L, false>(im, levels, noise);
    case ReduceDitherJarvisJudiceNinke:
    case ReduceDitherStucki:
      return noise ? threeRowDriver<M, L, true>(im, levels, noise, uint32_t(ditherKind))
                   : threeRowDriver<M, L, false>(im, levels, noise, uint32_t(ditherKind));
    default:
      return noise ? orderedDriver<M, L, true>(im, levels, noise) : orderedDriver<M, L, false>(im, levels, noise);
  }
}

}  // namespace

}  // namespace zel::reduce

#define ZEL_REDUCE_BITS(stem, Src, Dst, layout)                                                                \
  ZEL_PUBLIC Status zeliReduceBits_##stem##_##layout##R(const Src* src, int srcStep, Dst* dst, int dstStep,   \
                                                         ImageSize size, int noise, int ditherKind, int levels) { \
    return zel::reduce::reduceBits<Src, Dst, zel::reduce::LayoutCode::layout>(src, srcStep, dst, dstStep, size,  \
                                                                              noise, ditherKind, levels);     \
  }
#define ZEL_REDUCE_BITS_LAYOUTS(stem, Src, Dst) \
  ZEL_REDUCE_BITS(stem, Src, Dst, C1)           \
  ZEL_REDUCE_BITS(stem, Src, Dst, C3)           \
  ZEL_REDUCE_BITS(stem, Src, Dst, C4)           \
  ZEL_REDUCE_BITS(stem, Src, Dst, AC4)

ZEL_REDUCE_BITS_LAYOUTS(8u, uint8_t, uint8_t)
ZEL_REDUCE_BITS_LAYOUTS(16u, uint16_t, uint16_t)
ZEL_REDUCE_BITS_LAYOUTS(16s, int16_t, int16_t)
ZEL_REDUCE_BITS_LAYOUTS(16u8u, uint16_t, uint8_t)
ZEL_REDUCE_BITS_LAYOUTS(16s8u, int16_t, uint8_t)
ZEL_REDUCE_BITS_LAYOUTS(32f8u, float, uint8_t)
ZEL_REDUCE_BITS_LAYOUTS(32f16u, float, uint16_t)
ZEL_REDUCE_BITS_LAYOUTS(32f16s, float, int16_t)
