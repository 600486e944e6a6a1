// Gamma members: a scalar walk over the samples, C3 and AC4 row by row
// (the fourth sample neither read nor written), P3 plane after plane.
#include <cstdint>
#include <cstring>
#include <type_traits>

#include "frame/allocate.h"
#include "frame/export.h"
#include "frame/image_layout.h"
#include "pixel_ops/gamma_formulas.h"

namespace zel::gamma {

namespace {

enum Kind { Planar = 1, C3 = 3, AC4 = 4 };

// A run of 8-bit samples through a table, eight a step: the eight bytes
// are read as one word and their images written as one.
inline void lookupRun(const uint8_t* s, uint8_t* d, int n, const uint8_t* table) {
  int i = 0;
  for (; i + 8 <= n; i += 8) {
    uint64_t v, o = 0;
    std::memcpy(&v, s + i, 8);
    for (int k = 0; k < 8; ++k) o |= uint64_t(table[(v >> (8 * k)) & 0xFF]) << (8 * k);
    std::memcpy(d + i, &o, 8);
  }
  for (; i < n; ++i) d[i] = table[s[i]];
}

struct Table8 {
  const uint8_t* t;
  uint8_t operator()(uint8_t s) const { return t[s]; }
};

template <int K, typename T, typename F>
void walkRows(const T* src, int srcStep, T* dst, int dstStep, ImageSize size, F f) {
  for (int y = 0; y < size.height; ++y) {
    const T* s = rowAt(src, srcStep, y);
    T* d = rowAt(dst, dstStep, y);
    if constexpr (K == AC4) {
      for (int x = 0; x < size.width; ++x)
        for (int c = 0; c < 3; ++c) d[4 * x + c] = f(s[4 * x + c]);
    } else if constexpr (std::is_same_v<F, Table8>) {
      lookupRun(s, d, K == C3 ? size.width * 3 : size.width, f.t);
    } else {
      const int n = K == C3 ? size.width * 3 : size.width;
      int i = 0;
      for (; i + 2 <= n; i += 2) {
        const T a = s[i], b = s[i + 1];
        d[i] = f(a);
        d[i + 1] = f(b);
      }
      if (i < n) d[i] = f(s[i]);
    }
  }
}

// The whole image; planes one after the other.
template <int K, typename T, typename F>
void walk(const T* const* src, int srcStep, T* const* dst, int dstStep, ImageSize size, F f) {
  if constexpr (K == Planar) {
    for (int k = 0; k < 3; ++k) walkRows<Planar>(src[k], srcStep, dst[k], dstStep, size, f);
  } else {
    walkRows<K>(src[0], srcStep, dst[0], dstStep, size, f);
  }
}

template <bool Forward, int K, typename T>
Status apply(const T* const* src, int srcStep, T* const* dst, int dstStep, ImageSize size, float vMin, float vMax) {
  if constexpr (std::is_same_v<T, uint8_t>) {
    const uint8_t* table = Forward ? kForward8 : kInverse8;
    walk<K>(src, srcStep, dst, dstStep, size, Table8{table});
  } else if constexpr (std::is_same_v<T, uint16_t>) {
    auto evaluate = [](uint16_t s) { return Forward ? forward16(s) : inverse16(s); };
    if (!tabulates16(size.width, size.height)) {
      walk<K>(src, srcStep, dst, dstStep, size, evaluate);
      return StatusOk;
    }
    auto* table = reinterpret_cast<uint16_t*>(allocate16(65536));
    if (!table) return StatusOutOfMemoryError;
    for (int s = 0; s < 65536; ++s) table[s] = evaluate(uint16_t(s));
    walk<K>(src, srcStep, dst, dstStep, size, [table](uint16_t s) { return table[s]; });
    release(table);
  } else {
    const Range range(vMin, vMax);
    walk<K>(src, srcStep, dst, dstStep, size,
            [&range](float s) { return Forward ? forward32f(s, range) : inverse32f(s, range); });
  }
  return StatusOk;
}

// Checks: the float range first, then pointers, size and steps.
template <typename T>
bool emptyRange(float vMin, float vMax) {
  return std::is_same_v<T, float> && !(vMax - vMin > 0.0f);
}

template <bool Forward, int K, typename T>
Status gammaPixels(const T* src, int srcStep, T* dst, int dstStep, ImageSize size, float vMin, float vMax) {
  if (emptyRange<T>(vMin, vMax)) return StatusEmptyRangeError;
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (srcStep < 1 || dstStep < 1) return StatusStepError;
  const T* s[1] = {src};
  T* d[1] = {dst};
  return apply<Forward, K>(s, srcStep, d, dstStep, size, vMin, vMax);
}

template <bool Forward, typename T>
Status gammaPlanes(const T* const* src, int srcStep, T* const* dst, int dstStep, ImageSize size, float vMin,
                   float vMax) {
  if (emptyRange<T>(vMin, vMax)) return StatusEmptyRangeError;
  if (!src || !dst) return StatusNullPointerError;
  for (int k = 0; k < 3; ++k)
    if (!src[k] || !dst[k]) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  if (srcStep < 1 || dstStep < 1) return StatusStepError;
  return apply<Forward, Planar>(src, srcStep, dst, dstStep, size, vMin, vMax);
}

}  // namespace

}  // namespace zel::gamma

using zel::gamma::AC4;
using zel::gamma::C3;
using zel::gamma::gammaPixels;
using zel::gamma::gammaPlanes;

// Integer members: no range, so the bounds are unused.
#define ZEL_GAMMA_INT(Dir, fwd, T, tok)                                                                              \
  ZEL_PUBLIC Status zeliGamma##Dir##_##tok##_C3R(const T* src, int srcStep, T* dst, int dstStep, ImageSize size) {  \
    return gammaPixels<fwd, C3>(src, srcStep, dst, dstStep, size, 0.0f, 1.0f);                                      \
  }                                                                                                                  \
  ZEL_PUBLIC Status zeliGamma##Dir##_##tok##_AC4R(const T* src, int srcStep, T* dst, int dstStep, ImageSize size) { \
    return gammaPixels<fwd, AC4>(src, srcStep, dst, dstStep, size, 0.0f, 1.0f);                                     \
  }                                                                                                                  \
  ZEL_PUBLIC Status zeliGamma##Dir##_##tok##_C3IR(T* srcDst, int srcDstStep, ImageSize size) {                       \
    return gammaPixels<fwd, C3>(srcDst, srcDstStep, srcDst, srcDstStep, size, 0.0f, 1.0f);                          \
  }                                                                                                                  \
  ZEL_PUBLIC Status zeliGamma##Dir##_##tok##_AC4IR(T* srcDst, int srcDstStep, ImageSize size) {                      \
    return gammaPixels<fwd, AC4>(srcDst, srcDstStep, srcDst, srcDstStep, size, 0.0f, 1.0f);                         \
  }                                                                                                                  \
  ZEL_PUBLIC Status zeliGamma##Dir##_##tok##_P3R(const T* const srcPlanes[3], int srcStep, T* const dstPlanes[3],    \
                                                 int dstStep, ImageSize size) {                                     \
    return gammaPlanes<fwd>(srcPlanes, srcStep, dstPlanes, dstStep, size, 0.0f, 1.0f);                              \
  }                                                                                                                  \
  ZEL_PUBLIC Status zeliGamma##Dir##_##tok##_IP3R(T* const srcDstPlanes[3], int srcDstStep, ImageSize size) {        \
    return gammaPlanes<fwd>(srcDstPlanes, srcDstStep, srcDstPlanes, srcDstStep, size, 0.0f, 1.0f);                  \
  }

#define ZEL_GAMMA_FLOAT(Dir, fwd)                                                                                   \
  ZEL_PUBLIC Status zeliGamma##Dir##_32f_C3R(const float* src, int srcStep, float* dst, int dstStep, ImageSize size, \
                                             float vMin, float vMax) {                                              \
    return gammaPixels<fwd, C3>(src, srcStep, dst, dstStep, size, vMin, vMax);                                     \
  }                                                                                                                 \
  ZEL_PUBLIC Status zeliGamma##Dir##_32f_AC4R(const float* src, int srcStep, float* dst, int dstStep,               \
                                              ImageSize size, float vMin, float vMax) {                            \
    return gammaPixels<fwd, AC4>(src, srcStep, dst, dstStep, size, vMin, vMax);                                    \
  }                                                                                                                 \
  ZEL_PUBLIC Status zeliGamma##Dir##_32f_C3IR(float* srcDst, int srcDstStep, ImageSize size, float vMin,            \
                                              float vMax) {                                                         \
    return gammaPixels<fwd, C3>(srcDst, srcDstStep, srcDst, srcDstStep, size, vMin, vMax);                         \
  }                                                                                                                 \
  ZEL_PUBLIC Status zeliGamma##Dir##_32f_AC4IR(float* srcDst, int srcDstStep, ImageSize size, float vMin,           \
                                               float vMax) {                                                        \
    return gammaPixels<fwd, AC4>(srcDst, srcDstStep, srcDst, srcDstStep, size, vMin, vMax);                        \
  }                                                                                                                 \
  ZEL_PUBLIC Status zeliGamma##Dir##_32f_P3R(const float* const srcPlanes[3], int srcStep,                          \
                                             float* const dstPlanes[3], int dstStep, ImageSize size, float vMin,    \
                                             float vMax) {                                                          \
    return gammaPlanes<fwd>(srcPlanes, srcStep, dstPlanes, dstStep, size, vMin, vMax);                             \
  }                                                                                                                 \
  ZEL_PUBLIC Status zeliGamma##Dir##_32f_IP3R(float* const srcDstPlanes[3], int srcDstStep, ImageSize size,         \
                                              float vMin, float vMax) {                                             \
    return gammaPlanes<fwd>(srcDstPlanes, srcDstStep, srcDstPlanes, srcDstStep, size, vMin, vMax);                 \
  }

ZEL_GAMMA_INT(Fwd, true, uint8_t, 8u)
ZEL_GAMMA_INT(Inv, false, uint8_t, 8u)
ZEL_GAMMA_INT(Fwd, true, uint16_t, 16u)
ZEL_GAMMA_INT(Inv, false, uint16_t, 16u)
ZEL_GAMMA_FLOAT(Fwd, true)
ZEL_GAMMA_FLOAT(Inv, false)
