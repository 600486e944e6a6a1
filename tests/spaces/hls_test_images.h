// Images for the HLS tests: one interleaved image or a set of planes with
// a shared step, addressed by pixel and channel alike, and colour content
// that hits the cases the formulas branch on (grey pixels, ties of the
// largest channel) as well as random colours.
#pragma once

#include <cmath>
#include <cstdint>
#include <cstring>
#include <functional>

#include <gtest/gtest.h>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "core/zelcore.h"
#include "frame/simd.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace zel::test {

template <typename T>
class ChannelImage {
 public:
  // channels 3 or 4; planar: one image a channel.
  ChannelImage(bool planar, int channels, int width, int height, int offset, int pad)
      : planar_(planar), channels_(channels), width_(width), height_(height) {
    if (planar)
      for (int c = 0; c < channels; ++c) planes_.push_back(std::make_unique<TestImage<T>>(width, height, offset, pad));
    else
      planes_.push_back(std::make_unique<TestImage<T>>(width * channels, height, offset, pad));
  }
  T get(int x, int y, int c) const {
    return planar_ ? planes_[c]->get(x, y) : planes_[0]->get(x * channels_ + c, y);
  }
  void set(int x, int y, int c, T v) {
    if (planar_) planes_[c]->set(x, y, v);
    else planes_[0]->set(x * channels_ + c, y, v);
  }
  T* data() { return planes_[0]->data(); }
  int step() const { return planes_[0]->step(); }
  // Plane pointers (four entries; unused ones null).
  T* const* planes() {
    for (size_t c = 0; c < 4; ++c) pointers_[c] = c < planes_.size() ? planes_[c]->data() : nullptr;
    return pointers_;
  }
  bool guardsIntact() const {
    for (const auto& p : planes_)
      if (!p->guardsIntact()) return false;
    return true;
  }
  int channels() const { return channels_; }
  int width() const { return width_; }
  int height() const { return height_; }

 private:
  bool planar_;
  int channels_, width_, height_;
  std::vector<std::unique_ptr<TestImage<T>>> planes_;
  T* pointers_[4] = {};
};

// A sample of the type's full range, or a float in 0..1.
template <typename T>
T randomSample(std::mt19937& rng) {
  if constexpr (std::is_same_v<T, float>) return std::uniform_real_distribution<float>(0.0f, 1.0f)(rng);
  else return T(rng());
}

// Colour pixels: one in eight grey, one in eight with two channels tied
// at the top, the rest random; the fourth channel random.
template <typename T>
void fillColours(ChannelImage<T>& img, uint32_t seed) {
  std::mt19937 rng(seed);
  for (int y = 0; y < img.height(); ++y)
    for (int x = 0; x < img.width(); ++x) {
      T v[4];
      for (T& s : v) s = randomSample<T>(rng);
      const uint32_t kind = rng() % 8;
      if (kind == 0) v[1] = v[2] = v[0];
      if (kind == 1) v[(rng() % 3 + 1) % 3] = v[rng() % 3];  // ties in any order
      if constexpr (std::is_same_v<T, float>) {
        // Floats are not clamped: values past 0..1, infinities, NaN.
        const float odd[] = {-0.5f, 1.5f, -0.0f, INFINITY, -INFINITY, NAN};
        if (kind == 2) v[rng() % 3] = odd[rng() % 6];
      }
      for (int c = 0; c < img.channels(); ++c) img.set(x, y, c, v[c]);
    }
}

// HLS pixels: one in eight with zero saturation, some hues at the ends of
// the range; for floats a few values past 0..1 as well.
template <typename T>
void fillHls(ChannelImage<T>& img, uint32_t seed) {
  std::mt19937 rng(seed);
  for (int y = 0; y < img.height(); ++y)
    for (int x = 0; x < img.width(); ++x) {
      T v[4];
      for (T& s : v) s = randomSample<T>(rng);
      const uint32_t kind = rng() % 16;
      if constexpr (std::is_same_v<T, float>) {
        if (kind < 2) v[2] = 0.0f;
        if (kind == 2) v[0] = 1.0f;
        if (kind == 3) v[0] = 0.0f;
        if (kind == 4) v[0] = 1.25f;
        if (kind == 5) v[1] = -0.125f;
        if (kind == 6) v[1] = 0.5f;  // where the two forms of hslHigh meet
      } else {
        const T zero = std::is_signed_v<T> ? T(-32768) : T(0);
        const T top = T(std::is_signed_v<T> ? 32767 : (sizeof(T) == 1 ? 255 : 65535));
        if (kind < 2) v[2] = zero;
        if (kind == 2) v[0] = top;
        if (kind == 3) v[0] = zero;
        if (kind == 4) v[1] = top;
      }
      for (int c = 0; c < img.channels(); ++c) img.set(x, y, c, v[c]);
    }
}

// ---- calling members through images ----

template <typename T>
uint32_t bits(T v) {
  if constexpr (std::is_same_v<T, float>) {
    uint32_t b;
    std::memcpy(&b, &v, 4);
    return b;
  } else {
    return std::make_unsigned_t<T>(v);
  }
}
template <typename T>
constexpr uint32_t flipOf() {
  return std::is_same_v<T, int16_t> ? 0x8000u : 0u;
}

template <typename T>
using Call = std::function<Status(ChannelImage<T>& src, ChannelImage<T>& dst, ImageSize size)>;

struct Shape {
  bool srcPlanar;
  int srcChannels;
  bool dstPlanar;
  int dstChannels;
  int redAt;        // 0 for RGB members, 2 for BGR
  bool copyAlpha;   // else a fourth destination channel keeps its value
};

struct Layout {
  int offset, pad;
};

template <typename T>
std::vector<T> fourthChannel(const ChannelImage<T>& img) {
  std::vector<T> out;
  if (img.channels() == 4)
    for (int y = 0; y < img.height(); ++y)
      for (int x = 0; x < img.width(); ++x) out.push_back(img.get(x, y, 3));
  return out;
}

template <typename T>
Call<T> packed(Status (*fn)(const T*, int, T*, int, ImageSize)) {
  return [fn](ChannelImage<T>& s, ChannelImage<T>& d, ImageSize z) {
    return fn(s.data(), s.step(), d.data(), d.step(), z);
  };
}
inline Call<uint8_t> toPlanes(Status (*fn)(const uint8_t*, int, uint8_t* const*, int, ImageSize)) {
  return [fn](ChannelImage<uint8_t>& s, ChannelImage<uint8_t>& d, ImageSize z) {
    return fn(s.data(), s.step(), d.planes(), d.step(), z);
  };
}
inline Call<uint8_t> fromPlanes(Status (*fn)(const uint8_t* const*, int, uint8_t*, int, ImageSize)) {
  return [fn](ChannelImage<uint8_t>& s, ChannelImage<uint8_t>& d, ImageSize z) {
    return fn(s.planes(), s.step(), d.data(), d.step(), z);
  };
}
inline Call<uint8_t> planesToPlanes(Status (*fn)(const uint8_t* const*, int, uint8_t* const*, int, ImageSize)) {
  return [fn](ChannelImage<uint8_t>& s, ChannelImage<uint8_t>& d, ImageSize z) {
    return fn(s.planes(), s.step(), d.planes(), d.step(), z);
  };
}


// One frame: `expect` gives the three colour channels of a pixel in
// destination memory order, by the block formula below the body end and
// the tail formula past it. A fourth channel is copied or keeps its value;
// nothing outside the rows changes.
template <typename T, typename Expect>
void checkFrame(Call<T> call, Shape shape, int block, bool hlsSource, Expect expect, int width, int height,
                Layout src, Layout dst, const std::string& where) {
  // Byte rows take odd paddings; wider samples whole ones, as their steps
  // count whole samples.
  auto padOf = [](int pad) { return sizeof(T) == 1 ? pad + 1 : pad * int(sizeof(T)) / 2; };
  ChannelImage<T> in(shape.srcPlanar, shape.srcChannels, width, height, src.offset, padOf(src.pad));
  ChannelImage<T> out(shape.dstPlanar, shape.dstChannels, width, height, dst.offset, padOf(dst.pad));
  if (hlsSource) fillHls(in, uint32_t(width * 31 + src.offset));
  else fillColours(in, uint32_t(width * 31 + src.offset));
  fillColours(out, uint32_t(width * 17 + 1));
  const std::vector<T> alphaBefore = fourthChannel(out);
  ASSERT_EQ(call(in, out, ImageSize{width, height}), StatusOk);
  const int bodyEnd = width & ~(block - 1);
  for (int y = 0; y < height; ++y)
    for (int x = 0; x < width; ++x) {
      T want[3];
      expect(in, x, y, x < bodyEnd, want);
      for (int c = 0; c < 3; ++c)
        ASSERT_EQ(bits(out.get(x, y, c)), bits(want[c]))
            << "channel " << c << " of pixel " << x << ", row " << y << ", " << where
            << (x < bodyEnd ? " (block)" : " (tail)");
      if (shape.dstChannels == 4)
        ASSERT_EQ(bits(out.get(x, y, 3)), bits(shape.copyAlpha ? in.get(x, y, 3) : alphaBefore[y * width + x]))
            << "fourth channel of pixel " << x << ", " << where;
    }
  ASSERT_TRUE(out.guardsIntact()) << where;
}

// Every width from 1 to 70 (and `more`) at aligned and odd placements.
template <typename T, typename Expect>
void checkEveryWidth(const char* name, Call<T> call, Shape shape, int block, bool hlsSource, Expect expect,
                     std::initializer_list<int> more = {}) {
  SCOPED_TRACE(name);
  const Layout layouts[] = {{0, 0}, {1, 6}, {3, 2}, {2, 10}, {16, 4}};
  std::vector<int> widths;
  for (int width = 1; width <= 70; ++width) widths.push_back(width);
  widths.insert(widths.end(), more.begin(), more.end());
  for (int width : widths)
    for (const Layout& l : layouts) {
      checkFrame<T>(call, shape, block, hlsSource, expect, width, 2, l, Layout{l.offset + 5, l.pad},
                    "width " + std::to_string(width) + ", offset " + std::to_string(l.offset));
      if (::testing::Test::HasFatalFailure()) return;
    }
}

// Frames of more than a mebibyte with the cache said to be one, so that a
// member that streams does: destinations at float offsets from a 64-byte
// boundary (every row of an odd width starts elsewhere) and one off the
// float grid.
template <typename T, typename Expect>
void checkStreamedFrames(const char* name, Call<T> call, Shape shape, int block, bool hlsSource, Expect expect) {
  SCOPED_TRACE(name);
  zelTestOverrideCacheSize(0, 1 << 20);
  for (int width : {45, 203}) {
    const int height = (1 << 20) / (width * 24) + 2;
    for (int offset : {0, 4, 20, 36, 52, 2}) {
      checkFrame<T>(call, shape, block, hlsSource, expect, width, height, Layout{8, 0}, Layout{offset, 0},
                    "width " + std::to_string(width) + ", streamed to offset " + std::to_string(offset));
      if (::testing::Test::HasFatalFailure()) break;
    }
  }
  zelTestOverrideCacheSize(-1, 0);
}

// Runs `check` once at every vector tier the processor has, up to the cap
// in force (a run held to the 256-bit tier stays there).
template <typename Check>
void atEveryTier(Check&& check) {
  const VectorTier before = vectorTierCap();
  std::vector<VectorTier> tiers;
  if (hasAvx512()) tiers.push_back(VectorTier::Avx512);
  if (hasAvx2()) tiers.push_back(VectorTier::Avx2);
  tiers.push_back(VectorTier::Sse41);
  for (VectorTier tier : tiers) {
    SCOPED_TRACE("tier " + std::to_string(int(tier)));
    setVectorTierCap(tier);
    check();
    if (::testing::Test::HasFatalFailure()) break;
  }
  setVectorTierCap(before);
}

}  // namespace zel::test
