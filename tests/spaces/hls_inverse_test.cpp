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

TEST(HlsToRgb, FloatGroupsOfEveryTierAndStreamedRows) {
  // The block recipe in groups of 4, 8 and 16 pixels (widths past a few
  // 16-pixel groups), the tail recipe in the last width & 3 pixels; rows
  // streamed past the cache keep both.
  const Shape c3{false, 3, false, 3, 0, false};
  auto expect = [](const ChannelImage<float>& src, int x, int y, bool body, float* out) {
    expectedInverse<HlsToRgbFloatBody, HlsToRgbFloatTail, float>(src, x, y, 0, body, out);
  };
  atEveryTier([&] {
    checkEveryWidth<float>("32f C3", packed(zeliHLSToRGB_32f_C3R), c3, 4, true, expect, {129, 150, 203});
    checkStreamedFrames<float>("32f C3", packed(zeliHLSToRGB_32f_C3R), c3, 4, true, expect);
  });
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

template <class R>
void expectGrey(std::mt19937& rng) {
  int32_t out[3];
  for (int32_t l = 0; l <= R::kMax; ++l) {
    inversePixel<R>(int32_t(rng() % (R::kMax + 1)), l, 0, out);
    ASSERT_TRUE(out[0] == l && out[1] == l && out[2] == l) << l;
  }
}

TEST(HlsInverseValues, ZeroSaturationGivesLightness) {
  // Any hue, every level: the three channels equal L exactly, whether the
  // recipe copies L, takes l as the level or runs the general steps.
  std::mt19937 rng(6);
  expectGrey<HlsToRgb8Body>(rng);
  expectGrey<HlsToRgb8Tail>(rng);
  expectGrey<HlsToRgb16Body>(rng);
  expectGrey<HlsToRgb16Tail>(rng);
  expectGrey<HlsToBgr8Body>(rng);
  expectGrey<HlsToBgr8Tail>(rng);
}

template <class R>
void expectHueEndsAgree(int max) {
  int32_t a[3], b[3];
  for (int32_t l = 0; l < 256; ++l)
    for (int32_t s = 0; s < 256; ++s) {
      inversePixel<R>(0, l * max / 255, s * max / 255, a);
      inversePixel<R>(max, l * max / 255, s * max / 255, b);
      ASSERT_TRUE(std::equal(a, a + 3, b)) << l << " " << s;
    }
}

TEST(HlsInverseValues, HueAtBothEndsOfTheRange) {
  // The top hue is 360 degrees, which falls through to the lowest level
  // like 0 degrees: both give the same colour.
  expectHueEndsAgree<HlsToRgb8Body>(255);
  expectHueEndsAgree<HlsToRgb8Tail>(255);
  expectHueEndsAgree<HlsToBgr8Body>(255);
  expectHueEndsAgree<HlsToBgr8Tail>(255);
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
    std::vector<uint8_t> src(27), dst(27);
    for (int c = 0; c < 3; ++c) src[c] = uint8_t(rng());
    for (int x = 1; x < 9; ++x) std::copy(src.begin(), src.begin() + 3, src.begin() + 3 * x);
    ASSERT_EQ(zeliHLSToRGB_8u_C3R(src.data(), 27, dst.data(), 27, ImageSize{9, 1}), StatusOk);
    differing += !std::equal(dst.begin(), dst.begin() + 3, dst.begin() + 24);
  }
  EXPECT_GT(differing, 100);
}

}  // namespace
