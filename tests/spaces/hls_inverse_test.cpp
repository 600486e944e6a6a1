// HLS to RGB and BGR: every member's blocks and tail against the lane
// formulas at every width and alignment, the formulas against the colour
// model, and the grey, hue-wrap and zone cases.
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <random>

#include "spaces/hls_formulas.h"
#include "spaces/hls_test_images.h"

namespace {

using namespace zel::hls;
using namespace zel::test;

// Expected colour channels of one pixel, in destination memory order.
template <class Body, class Tail, typename T>
void expectedInverse(const ChannelImage<T>& src, int x, int y, int redAt, bool body, T out[3]) {
  uint32_t rgb[3];
  if constexpr (std::is_same_v<T, float>) {
    float v[3];
    if (body) inverseFloat<Body>(src.get(x, y, 0), src.get(x, y, 1), src.get(x, y, 2), v);
    else inverseFloat<Tail>(src.get(x, y, 0), src.get(x, y, 1), src.get(x, y, 2), v);
    for (int c = 0; c < 3; ++c) rgb[c] = bits(v[c]);
  } else {
    constexpr uint32_t flip = flipOf<T>();
    const int32_t h = int32_t(bits(src.get(x, y, 0)) ^ flip), l = int32_t(bits(src.get(x, y, 1)) ^ flip),
                  s = int32_t(bits(src.get(x, y, 2)) ^ flip);
    int32_t v[3];
    if (body) inversePixel<Body>(h, l, s, v);
    else inversePixel<Tail>(h, l, s, v);
    for (int c = 0; c < 3; ++c) rgb[c] = uint32_t(v[c]) ^ flip;
  }
  uint32_t ordered[3] = {rgb[0], rgb[1], rgb[2]};
  ordered[redAt] = rgb[0];
  ordered[2 - redAt] = rgb[2];
  for (int c = 0; c < 3; ++c) {
    if constexpr (std::is_same_v<T, float>) std::memcpy(&out[c], &ordered[c], 4);
    else out[c] = T(ordered[c]);
  }
}

template <class Body, class Tail, int Block, typename T>
void checkMember(const char* name, Call<T> call, Shape shape) {
  checkEveryWidth<T>(name, call, shape, Block, true, [&](const ChannelImage<T>& src, int x, int y, bool body, T* out) {
    expectedInverse<Body, Tail, T>(src, x, y, shape.redAt, body, out);
  });
}

TEST(HlsToRgb, BlocksAndTailAtEveryWidth) {
  const Shape c3{false, 3, false, 3, 0, false}, ac4{false, 4, false, 4, 0, false};
  checkMember<HlsToRgb8Body, HlsToRgb8Tail, 8, uint8_t>("8u C3", packed(zeliHLSToRGB_8u_C3R), c3);
  checkMember<HlsToRgb8Body, HlsToRgb8Tail, 8, uint8_t>("8u AC4", packed(zeliHLSToRGB_8u_AC4R), ac4);
  checkMember<HlsToRgb16Body, HlsToRgb16Tail, 4, uint16_t>("16u C3", packed(zeliHLSToRGB_16u_C3R), c3);
  checkMember<HlsToRgb16Body, HlsToRgb16Tail, 4, uint16_t>("16u AC4", packed(zeliHLSToRGB_16u_AC4R), ac4);
  checkMember<HlsToRgb16Body, HlsToRgb16Tail, 4, int16_t>("16s C3", packed(zeliHLSToRGB_16s_C3R), c3);
  checkMember<HlsToRgb16Body, HlsToRgb16Tail, 4, int16_t>("16s AC4", packed(zeliHLSToRGB_16s_AC4R), ac4);
  checkMember<HlsToRgbFloatBody, HlsToRgbFloatTail, 4, float>("32f C3", packed(zeliHLSToRGB_32f_C3R), c3);
  checkMember<HlsToRgbFloatBody, HlsToRgbFloatTail, 4, float>("32f AC4", packed(zeliHLSToRGB_32f_AC4R), ac4);
}

TEST(HlsToBgr, BlocksAndTailAtEveryWidth) {
  using B = HlsToBgr8Body;
  using T = HlsToBgr8Tail;
  checkMember<B, T, 4, uint8_t>("AC4P4", toPlanes(zeliHLSToBGR_8u_AC4P4R), {false, 4, true, 4, 2, true});
  checkMember<B, T, 4, uint8_t>("AP4C4", fromPlanes(zeliHLSToBGR_8u_AP4C4R), {true, 4, false, 4, 2, true});
  checkMember<B, T, 4, uint8_t>("AP4", planesToPlanes(zeliHLSToBGR_8u_AP4R), {true, 4, true, 4, 2, true});
  checkMember<B, T, 4, uint8_t>("C3P3", toPlanes(zeliHLSToBGR_8u_C3P3R), {false, 3, true, 3, 2, false});
  checkMember<B, T, 4, uint8_t>("P3C3", fromPlanes(zeliHLSToBGR_8u_P3C3R), {true, 3, false, 3, 2, false});
  checkMember<B, T, 4, uint8_t>("P3", planesToPlanes(zeliHLSToBGR_8u_P3R), {true, 3, true, 3, 2, false});
}

// ---- the formulas against the colour model ----

// R, G, B in 0..1 from hue in degrees, l and s in 0..1.
void modelRgb(double h, double l, double s, double* rgb) {
  const double high = l <= 0.5 ? l * (1 + s) : l + s - l * s, low = 2 * l - high;
  auto level = [&](double a) {
    if (a < 60) return low + (high - low) * a / 60;
    if (a < 180) return high;
    if (a < 240) return low + (high - low) * (240 - a) / 60;
    return low;
  };
  rgb[0] = level(h + 120 > 360 ? h - 240 : h + 120);
  rgb[1] = level(h);
  rgb[2] = level(h - 120 < 0 ? h + 240 : h - 120);
}

template <class R>
void compareWithModel(std::mt19937& rng, int max) {
  for (int i = 0; i < 200000; ++i) {
    const int32_t H = int32_t(rng() % (max + 1)), L = int32_t(rng() % (max + 1)), S = int32_t(rng() % (max + 1));
    double want[3];
    modelRgb(H * 360.0 / max, double(L) / max, double(S) / max, want);
    int32_t got[3];
    inversePixel<R>(H, L, S, got);
    for (int c = 0; c < 3; ++c)
      ASSERT_LE(std::fabs(got[c] - want[c] * max), 1.01) << H << " " << L << " " << S << " channel " << c;
  }
}

TEST(HlsInverseFormulas, WithinOneLevelOfTheColourModel) {
  std::mt19937 rng(21);
  compareWithModel<HlsToRgb8Body>(rng, 255);
  compareWithModel<HlsToRgb8Tail>(rng, 255);
  compareWithModel<HlsToRgb16Body>(rng, 65535);
  compareWithModel<HlsToRgb16Tail>(rng, 65535);
  compareWithModel<HlsToBgr8Body>(rng, 255);
  compareWithModel<HlsToBgr8Tail>(rng, 255);
  for (int i = 0; i < 100000; ++i) {
    const float h = float(rng() % 1000000) / 1e6f, l = float(rng() % 1000000) / 1e6f, s = float(rng() % 1000000) / 1e6f;
    double want[3];
    modelRgb(double(h) * 360, l, s, want);
    float body[3], tail[3];
    inverseFloat<HlsToRgbFloatBody>(h, l, s, body);
    inverseFloat<HlsToRgbFloatTail>(h, l, s, tail);
    for (int c = 0; c < 3; ++c) {
      ASSERT_NEAR(body[c], want[c], 2e-6) << h << " " << l << " " << s;
      ASSERT_NEAR(tail[c], want[c], 2e-6) << h << " " << l << " " << s;
    }
  }
}

// ---- grey, hue ends, zones ----

// One row of 13 pixels (8 or 12 in blocks, the rest in the tail).
template <typename T>
std::vector<T> row(Status (*fn)(const T*, int, T*, int, ImageSize), int ch, const std::vector<std::array<T, 3>>& px) {
  const int width = int(px.size());
  std::vector<T> src(width * ch, T(0)), dst(width * ch, T(0));
  for (int x = 0; x < width; ++x)
    for (int c = 0; c < 3; ++c) src[x * ch + c] = px[x][c];
  EXPECT_EQ(fn(src.data(), width * ch * int(sizeof(T)), dst.data(), width * ch * int(sizeof(T)), ImageSize{width, 1}),
            StatusOk);
  return dst;
}

TEST(HlsInverseValues, ZeroSaturationGivesLightness) {
  // Any hue: all three channels equal L exactly, in blocks and tail, for
  // every 8-bit level and every 16-bit level.
  std::mt19937 rng(6);
  std::vector<std::array<uint8_t, 3>> px8;
  for (int l = 0; l < 256; ++l) px8.push_back({uint8_t(rng()), uint8_t(l), 0});
  px8.resize(259, {9, 200, 0});  // a tail after the last block
  for (auto fn : {zeliHLSToRGB_8u_C3R, zeliHLSToRGB_8u_AC4R}) {
    const int ch = fn == zeliHLSToRGB_8u_C3R ? 3 : 4;
    const auto out = row<uint8_t>(fn, ch, px8);
    for (size_t x = 0; x < px8.size(); ++x)
      for (int c = 0; c < 3; ++c) ASSERT_EQ(out[x * ch + c], px8[x][1]) << "pixel " << x;
  }
  {
    std::vector<uint8_t> planes[3];
    for (auto& p : planes) p.resize(px8.size());
    for (size_t x = 0; x < px8.size(); ++x)
      for (int c = 0; c < 3; ++c) planes[c][x] = px8[x][c];
    const uint8_t* const in[3] = {planes[0].data(), planes[1].data(), planes[2].data()};
    std::vector<uint8_t> out(3 * px8.size());
    ASSERT_EQ(zeliHLSToBGR_8u_P3C3R(in, 1000, out.data(), 1000, ImageSize{int(px8.size()), 1}), StatusOk);
    for (size_t x = 0; x < px8.size(); ++x)
      for (int c = 0; c < 3; ++c) ASSERT_EQ(out[x * 3 + c], px8[x][1]) << "BGR pixel " << x;
  }
  std::vector<std::array<uint16_t, 3>> px16;
  for (int l = 0; l < 65536; ++l) px16.push_back({uint16_t(rng()), uint16_t(l), 0});
  px16.resize(65539, {1, 40000, 0});
  const auto out16 = row<uint16_t>(zeliHLSToRGB_16u_C3R, 3, px16);
  for (size_t x = 0; x < px16.size(); ++x)
    for (int c = 0; c < 3; ++c) ASSERT_EQ(out16[x * 3 + c], px16[x][1]) << "16u pixel " << x;
  std::vector<std::array<int16_t, 3>> px16s;
  for (int l = -32768; l < 32768; l += 7) px16s.push_back({int16_t(rng()), int16_t(l), -32768});
  const auto out16s = row<int16_t>(zeliHLSToRGB_16s_AC4R, 4, px16s);
  for (size_t x = 0; x < px16s.size(); ++x)
    for (int c = 0; c < 3; ++c) ASSERT_EQ(out16s[x * 4 + c], px16s[x][1]) << "16s pixel " << x;
}

TEST(HlsInverseValues, HueAtBothEndsOfTheRange) {
  // H = 255 is 360 degrees, which falls through to the lowest level like
  // 0 degrees: both give the same colour, in blocks and tail.
  std::mt19937 rng(10);
  for (int i = 0; i < 2000; ++i) {
    const uint8_t l = uint8_t(rng()), s = uint8_t(rng());
    std::vector<std::array<uint8_t, 3>> px(8, {255, l, s});
    px[0][0] = 0;
    const auto out = row<uint8_t>(zeliHLSToRGB_8u_C3R, 3, px);
    ASSERT_TRUE(std::equal(out.begin(), out.begin() + 3, out.begin() + 3)) << int(l) << " " << int(s);
    int32_t a[3], b[3];
    inversePixel<HlsToRgb8Tail>(0, l, s, a);
    inversePixel<HlsToRgb8Tail>(255, l, s, b);
    ASSERT_TRUE(std::equal(a, a + 3, b)) << int(l) << " " << int(s);
    inversePixel<HlsToBgr8Body>(0, l, s, a);
    inversePixel<HlsToBgr8Body>(255, l, s, b);
    ASSERT_TRUE(std::equal(a, a + 3, b));
    inversePixel<HlsToBgr8Tail>(0, l, s, a);
    inversePixel<HlsToBgr8Tail>(255, l, s, b);
    ASSERT_TRUE(std::equal(a, a + 3, b));
  }
}

TEST(HlsInverseValues, FloatHueOutsideTheRangeIsNotWrapped) {
  // 1.25 is 450 degrees: green falls to the lowest level (90 degrees would
  // be the highest), red lands at 210 degrees on the falling band.
  for (bool body : {true, false}) {
    float v[3];
    if (body) inverseFloat<HlsToRgbFloatBody>(1.25f, 0.5f, 1.0f, v);
    else inverseFloat<HlsToRgbFloatTail>(1.25f, 0.5f, 1.0f, v);
    EXPECT_EQ(v[1], 0.0f);
    EXPECT_NEAR(v[0], 0.5f, 1e-6f);
    EXPECT_EQ(v[2], 0.0f);
  }
}

TEST(HlsInverseValues, WidthDecidesTheRecipeOfAPixel) {
  // The 8-bit RGB blocks round, the tail truncates: in a row of 9 equal
  // pixels the ninth, alone in the tail, often differs from the others.
  std::mt19937 rng(12);
  int differing = 0;
  for (int i = 0; i < 500; ++i) {
    const std::array<uint8_t, 3> p{uint8_t(rng()), uint8_t(rng()), uint8_t(rng())};
    const auto out = row<uint8_t>(zeliHLSToRGB_8u_C3R, 3, std::vector<std::array<uint8_t, 3>>(9, p));
    differing += !std::equal(out.begin(), out.begin() + 3, out.begin() + 24);
  }
  EXPECT_GT(differing, 100);
}

}  // namespace
