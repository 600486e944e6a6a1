// The packed writers as the tests see them: every export whose destination
// is a packed word, read from its name, with a per-pixel model built from
// the scalar forms and the zones of each source shape, and the images of
// one call.
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "frame/descriptor.h"
#include "packed16/packed_write_forms.h"
#include "packed16/packed_write_rows.h"
#include "support/test_image.h"

namespace zel::pack::test {

using zel::test::TestImage;

enum class Shape { FullPlanes, HalfPlanes, HalfBothPlanes, QuarterPlanes, Yuv420Planes, YCbCrBytes, Pairs, RgbBytes };

using PlanesFn = Status (*)(const uint8_t* const[3], const int[3], uint16_t*, int, ImageSize);
using BytesFn = Status (*)(const uint8_t*, int, uint16_t*, int, ImageSize);

struct Member {
  std::string name;
  Shape shape;
  PackedTarget target;
  bool dither;
  void (*impl)();
  bool planar() const { return shape != Shape::YCbCrBytes && shape != Shape::Pairs && shape != Shape::RgbBytes; }
};

inline std::vector<Member> writers() {
  std::vector<Member> out;
  for (const meta::Descriptor& d : meta::allDescriptors()) {
    if (!d.isImageFunction() || !d.dst.packedWord) continue;
    Member m{d.name, Shape::FullPlanes, {Packing::P565, d.dst.format.rfind("BGR", 0) == 0},
             d.name.find("Dither") != std::string::npos, d.impl};
    const std::string f = d.dst.format.substr(3, 3);
    m.target.packing = f == "444" ? Packing::P444 : f == "555" ? Packing::P555 : Packing::P565;
    const std::string& s = d.src.format;
    if (s == "BGR" || s == "RGB") m.shape = Shape::RgbBytes;
    else if (s == "YUV420") m.shape = Shape::Yuv420Planes;
    else if (d.src.layout == meta::Layout::C3) m.shape = Shape::YCbCrBytes;
    else if (d.src.layout == meta::Layout::C2) m.shape = Shape::Pairs;
    else if (s == "YCbCr422") m.shape = Shape::HalfPlanes;
    else if (s == "YCbCr420") m.shape = Shape::HalfBothPlanes;
    else if (s == "YCbCr411") m.shape = Shape::QuarterPlanes;
    out.push_back(m);
  }
  return out;
}

inline uint16_t wordOf(const Member& m, const Rgb& c, int x, int y) {
  const bool h = m.target.redHigh;
  switch (m.target.packing) {
    case Packing::P444: return m.dither ? Dithering<Layout444>{h}.word(c, x, y) : Truncating<Layout444>{h}.word(c, x, y);
    case Packing::P555: return m.dither ? Dithering<Layout555>{h}.word(c, x, y) : Truncating<Layout555>{h}.word(c, x, y);
    default: return m.dither ? Dithering<Layout565>{h}.word(c, x, y) : Truncating<Layout565>{h}.word(c, x, y);
  }
}

// Source and destination images of one call, rows `offset` bytes past a
// 64-byte boundary and `pad` bytes apart beyond their samples.
struct Call {
  const Member& m;
  int width, height;
  std::vector<TestImage<uint8_t>> src;
  TestImage<uint16_t> dst;
  static constexpr uint16_t kUnwritten = 0xD3D3;

  Call(const Member& member, int w, int h, int offset, int pad, uint32_t seed)
      : m(member), width(w), height(h), dst(w, h, 2 * (offset % 8), 2 * pad) {
    const int cw = m.shape == Shape::QuarterPlanes ? (w + 3) / 4 : m.shape == Shape::FullPlanes ? w : (w + 1) / 2;
    const int ch = m.shape == Shape::HalfBothPlanes || m.shape == Shape::Yuv420Planes ? (h + 1) / 2 : h;
    if (m.planar()) {
      src.emplace_back(w, h, offset, pad);
      src.emplace_back(cw, ch, offset + 2, pad + 1);
      src.emplace_back(cw, ch, offset + 4, pad + 3);
    } else {
      src.emplace_back(w * (m.shape == Shape::Pairs ? 2 : 3), h, offset, pad);
    }
    for (size_t k = 0; k < src.size(); ++k) src[k].fillRandom(seed + uint32_t(k));
    dst.fill(kUnwritten);
  }

  int sample(int plane, int x, int y) const { return src[plane].get(x, y); }

  // The word of pixel (x, y), or -1 where the member writes nothing.
  int expected(int x, int y) const {
    const int w = width, h = height;
    auto planes = [&](int cx, int cy, Rgb (*form)(int, int, int)) {
      return form(sample(0, x, y), sample(1, cx, cy), sample(2, cx, cy));
    };
    Rgb c{};
    switch (m.shape) {
      case Shape::FullPlanes: c = planes(x, y, ycbcrLaneForm); break;
      case Shape::HalfPlanes: c = planes(x >> 1, y, ycbcrLaneForm); break;
      case Shape::HalfBothPlanes: c = planes(x >> 1, y >> 1, ycbcrLaneForm); break;
      case Shape::QuarterPlanes: c = planes(x >> 2, y, x < (w & ~3) ? ycbcrLaneForm : ycbcrRoundedForm); break;
      case Shape::Yuv420Planes:
        if (!m.dither && (w == 1 || h == 1)) return -1;
        c = planes(x >> 1, y >> 1, m.dither || (x < (w & ~1) && y < (h & ~1)) ? yuvLaneForm : yuvWideForm);
        break;
      case Shape::YCbCrBytes: {
        auto b = [&](int i) { return sample(0, 3 * x + i, y); };
        c = (m.dither || x < (w & ~7) ? ycbcrLaneForm : ycbcrTruncatedForm)(b(0), b(1), b(2));
        break;
      }
      case Shape::Pairs: {
        auto b = [&](int i) { return sample(0, i, y); };
        if ((w & 1) && x == w - 1)
          c = m.dither ? ycbcrLaneForm(b(2 * x), b(2 * x + 1), b(2 * x + 1))
                       : ycbcrTruncatedForm(b(2 * x), b(2 * x + 1), b(2 * x - 1));
        else
          c = (m.dither || x < (w & ~7) ? ycbcrLaneForm : ycbcrOffsetForm)(b(2 * x), b(4 * (x >> 1) + 1),
                                                                          b(4 * (x >> 1) + 3));
        break;
      }
      case Shape::RgbBytes: {
        auto b = [&](int i) { return sample(0, 3 * x + i, y); };
        return (b(0) >> 3) | ((b(1) >> 2) << 5) | ((b(2) >> 3) << 11);
      }
    }
    return wordOf(m, c, x, y);
  }

  // Through the public function; the destination step may carry an odd
  // extra byte, which the step in words drops.
  Status callPublic(int dstStepExtra = 0) {
    const int steps[3] = {src[0].step(), m.planar() ? src[1].step() : 0, m.planar() ? src[2].step() : 0};
    if (m.planar()) {
      const uint8_t* const planes[3] = {src[0].data(), src[1].data(), src[2].data()};
      return reinterpret_cast<PlanesFn>(m.impl)(planes, steps, dst.data(), dst.step() + dstStepExtra, {width, height});
    }
    return reinterpret_cast<BytesFn>(m.impl)(src[0].data(), steps[0], dst.data(), dst.step() + dstStepExtra,
                                             {width, height});
  }

  // Through the row driver, choosing the vector width.
  void drive(bool avx2) {
    const int steps[3] = {src[0].step(), m.planar() ? src[1].step() : 0, m.planar() ? src[2].step() : 0};
    const uint8_t* const planes[3] = {src[0].data(), m.planar() ? src[1].data() : nullptr,
                                      m.planar() ? src[2].data() : nullptr};
    const WordRows out{dst.data(), dst.step() >> 1};
    const ImageSize size{width, height};
    switch (m.shape) {
      case Shape::FullPlanes: return ycbcrPlanesToWords(PlaneChroma::Full, planes, steps, out, size, m.target, m.dither, avx2);
      case Shape::HalfPlanes: return ycbcrPlanesToWords(PlaneChroma::Half, planes, steps, out, size, m.target, m.dither, avx2);
      case Shape::HalfBothPlanes:
        return ycbcrPlanesToWords(PlaneChroma::HalfBoth, planes, steps, out, size, m.target, m.dither, avx2);
      case Shape::QuarterPlanes: return ycbcr411ToWords(planes, steps, out, size, m.target, avx2);
      case Shape::Yuv420Planes: return yuv420ToWords(planes, steps, out, size, m.target, m.dither, avx2);
      case Shape::YCbCrBytes: return ycbcrPixelsToWords(planes[0], steps[0], out, size, m.target, m.dither, avx2);
      case Shape::Pairs: return ycbcrPairsToWords(planes[0], steps[0], out, size, m.target, m.dither, avx2);
      case Shape::RgbBytes: return bytesTo565Words(planes[0], steps[0], out, size, avx2);
    }
  }

  // Every word against the model; "" when all agree.
  std::string mismatch() const {
    for (int y = 0; y < height; ++y)
      for (int x = 0; x < width; ++x) {
        const int want = expected(x, y);
        const int got = dst.get(x, y);
        if (got != (want < 0 ? kUnwritten : want))
          return m.name + " " + std::to_string(width) + "x" + std::to_string(height) + ": pixel " +
                 std::to_string(x) + "," + std::to_string(y) + " is " + std::to_string(got) + ", wants " +
                 std::to_string(want);
      }
    if (!dst.guardsIntact()) return m.name + ": bytes outside the rows changed";
    return "";
  }
};

}  // namespace zel::pack::test
