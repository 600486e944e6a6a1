// Shared pieces of the bit-depth reduction tests: the members by type, a
// deterministic sample pattern, and a call on test images.
#pragma once

#include <gtest/gtest.h>

#include <vector>

#include "reduce_bits/reduce_formulas.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace zel::test {

using reduce::LayoutCode;

template <typename Src, typename Dst>
using ReduceFn = Status (*)(const Src*, int, Dst*, int, ImageSize, int, int, int);

template <typename Src, typename Dst>
struct Stem {
  const char* name;
  ReduceFn<Src, Dst> c1, c3, c4, ac4;
  ReduceFn<Src, Dst> of(LayoutCode l) const {
    return l == LayoutCode::C1 ? c1 : l == LayoutCode::C3 ? c3 : l == LayoutCode::C4 ? c4 : ac4;
  }
};

#define ZEL_STEM(stem) \
  { #stem, zeliReduceBits_##stem##_C1R, zeliReduceBits_##stem##_C3R, zeliReduceBits_##stem##_C4R, zeliReduceBits_##stem##_AC4R }

inline const Stem<uint8_t, uint8_t> k8u = ZEL_STEM(8u);
inline const Stem<uint16_t, uint16_t> k16u = ZEL_STEM(16u);
inline const Stem<int16_t, int16_t> k16s = ZEL_STEM(16s);
inline const Stem<uint16_t, uint8_t> k16u8u = ZEL_STEM(16u8u);
inline const Stem<int16_t, uint8_t> k16s8u = ZEL_STEM(16s8u);
inline const Stem<float, uint8_t> k32f8u = ZEL_STEM(32f8u);
inline const Stem<float, uint16_t> k32f16u = ZEL_STEM(32f16u);
inline const Stem<float, int16_t> k32f16s = ZEL_STEM(32f16s);

// Calls `fn` on every stem with its types.
template <typename Fn>
void forEachStem(Fn&& fn) {
  fn(k8u);
  fn(k16u);
  fn(k16s);
  fn(k16u8u);
  fn(k16s8u);
  fn(k32f8u);
  fn(k32f16u);
  fn(k32f16s);
}

inline constexpr LayoutCode kLayouts[] = {LayoutCode::C1, LayoutCode::C3, LayoutCode::C4, LayoutCode::AC4};
inline int strideOf(LayoutCode l) { return l == LayoutCode::C1 ? 1 : l == LayoutCode::C3 ? 3 : 4; }
inline int channelsOf(LayoutCode l) { return l == LayoutCode::C1 ? 1 : l == LayoutCode::C4 ? 4 : 3; }
inline const char* layoutName(LayoutCode l) {
  return l == LayoutCode::C1 ? "C1" : l == LayoutCode::C3 ? "C3" : l == LayoutCode::C4 ? "C4" : "AC4";
}

// A sample of a fixed pattern; `tops` puts the largest byte on every third
// diagonal. Float samples run from about -0.1 to 1.15.
template <typename T>
T patternSample(int x, int y, int c, bool tops = false) {
  const int p = tops && (x + y) % 3 == 0 ? 255 : (x * 37 + y * 101 + c * 53 + 11) % 256;
  if constexpr (std::is_same_v<T, uint8_t>) return T(p);
  else if constexpr (std::is_same_v<T, uint16_t>) return T(p * 256 + (x * 13 + y) % 256);
  else if constexpr (std::is_same_v<T, int16_t>) return T(p * 256 + (x * 13 + y) % 256 - 32768);
  else return float(p * 5 - 100) / 1024.0f;
}

// The region's bytes, row after row (TestImage copies share storage).
template <typename T>
std::vector<uint8_t> regionBytes(const TestImage<T>& img) {
  std::vector<uint8_t> out;
  for (int y = 0; y < img.rows(); ++y) {
    const auto* row = reinterpret_cast<const uint8_t*>(img.row(y));
    out.insert(out.end(), row, row + size_t(img.rowSamples()) * sizeof(T));
  }
  return out;
}

// A call's images: the source with the pattern (AC4 alpha random), the
// destination preset to `fill`.
template <typename Src, typename Dst>
struct ReduceCall {
  using Source = Src;
  using Dest = Dst;
  LayoutCode layout;
  int width, height;
  TestImage<Src> src;
  TestImage<Dst> dst;
  ReduceCall(LayoutCode l, int w, int h, int offset = 0, int pad = 0)
      : layout(l), width(w), height(h), src(w * strideOf(l), h, offset, pad), dst(w * strideOf(l), h, offset, pad) {
    src.fillRandom(uint32_t(w * 31 + h));
    dst.fillRandom(uint32_t(w * 17 + h));
  }
  void pattern(bool tops = false) {
    for (int y = 0; y < height; ++y)
      for (int x = 0; x < width; ++x)
        for (int c = 0; c < channelsOf(layout); ++c)
          src.set(x * strideOf(layout) + c, y, patternSample<Src>(x, y, c, tops));
  }
  Status run(const Stem<Src, Dst>& stem, int noise, int kind, int levels) {
    return stem.of(layout)(src.data(), src.step(), dst.data(), dst.step(), ImageSize{width, height}, noise, kind,
                           levels);
  }
  // True when no AC4 alpha sample of the destination differs from `before`
  // (its regionBytes).
  bool alphaKept(const std::vector<uint8_t>& before) const {
    if (layout != LayoutCode::AC4) return true;
    const std::vector<uint8_t> now = regionBytes(dst);
    for (size_t i = 0; i < now.size(); ++i)
      if ((i / sizeof(Dst)) % 4 == 3 && now[i] != before[i]) return false;
    return true;
  }
  // Destination samples of the worked channels, row by row, pixel by pixel.
  std::vector<int> result() const {
    std::vector<int> out;
    for (int y = 0; y < height; ++y)
      for (int x = 0; x < width; ++x)
        for (int c = 0; c < channelsOf(layout); ++c) out.push_back(int(dst.get(x * strideOf(layout) + c, y)));
    return out;
  }
};

}  // namespace zel::test
