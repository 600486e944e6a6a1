// RGB and HSV: reference colours, ties between the hue branches, the top
// hue, every member against its formulas, vector bodies against the body.
#include <gtest/gtest.h>

#include "spaces/hsv_formulas.h"
#include "spaces/hsv_kernels.h"
#include "spaces/space_test_support.h"

namespace {

using namespace zel::spaces::hsv;
using zel::spaces::StepUnit;
using zel::test::convertRow;
using zel::test::Member;
using zel::test::repeat;

template <typename T, Levels (*F)(int32_t, int32_t, int32_t)>
void levelsPixel(const T* in, T* out) {
  const Levels o = F(zel::spaces::level(in), zel::spaces::level(in + 1), zel::spaces::level(in + 2));
  for (int k = 0; k < 3; ++k) zel::spaces::storeLevel(out + k, o.c[k]);
}

TEST(HsvReference, GreyAndBlackHaveNoHueOrSaturation) {
  for (int width : {3, 4, 7}) {
    for (uint8_t g : {0, 1, 128, 255}) {
      const auto out = convertRow(zeliRGBToHSV_8u_C3R, repeat<uint8_t>({g, g, g}, width), 3);
      for (int x = 0; x < width; ++x) {
        EXPECT_EQ(out[x * 3], 0);
        EXPECT_EQ(out[x * 3 + 1], 0);
        EXPECT_EQ(out[x * 3 + 2], g);
      }
    }
    for (uint16_t g : {0, 1, 40000, 65535}) {
      const auto out = convertRow(zeliRGBToHSV_16u_AC4R, repeat<uint16_t>({g, g, g, 9}, width), 4);
      for (int x = 0; x < width; ++x) {
        EXPECT_EQ(out[x * 4], 0);
        EXPECT_EQ(out[x * 4 + 1], 0);
        EXPECT_EQ(out[x * 4 + 2], g);
        EXPECT_EQ(out[x * 4 + 3], 7);
      }
    }
  }
}

TEST(HsvReference, PrimariesSitOnWholeSextants) {
  // 16u: h = 0, 2, 4 sextants; H = 0.5 + h * 65535 / 6, truncated.
  const Levels red = rgbToHsv16u(65535, 0, 0), green = rgbToHsv16u(0, 65535, 0), blue = rgbToHsv16u(0, 0, 65535);
  EXPECT_EQ(red.c[0], 0);
  EXPECT_EQ(green.c[0], 21845);
  EXPECT_EQ(blue.c[0], 43690);
  for (const Levels& l : {red, green, blue}) {
    EXPECT_EQ(l.c[1], 65535);
    EXPECT_EQ(l.c[2], 65535);
  }
  // 8u: 42.5 per sextant.
  EXPECT_EQ(rgbToHsvTail8u(0, 200, 0).c[0], 85);
  EXPECT_EQ(rgbToHsvBody8u(0, 0, 200).c[0], 170);
  EXPECT_EQ(rgbToHsvBody8u(200, 0, 0).c[0], 0);
  EXPECT_EQ(rgbToHsvBody8u(200, 0, 0).c[2], 200);
  // The unrefined 1/max leaves a pure colour's S at 254 or 255.
  for (int v = 1; v < 256; ++v) EXPECT_GE(rgbToHsvBody8u(v, 0, 0).c[1], 254) << v;
}

TEST(HsvReference, HueJustBelowRedWrapsToTheTop) {
  // Red with blue a little above green: t is slightly negative, 255 is added.
  EXPECT_EQ(rgbToHsvTail8u(255, 0, 1).c[0], 255);   // 254.83
  EXPECT_EQ(rgbToHsvBody8u(255, 0, 10).c[0], 253);  // 253.33
  EXPECT_EQ(rgbToHsv16u(65535, 0, 1).c[0], 65535);
  // H = 255 reads back as hue 0: pure red.
  const Levels back = hsvToRgb8u(255, 255, 255);
  EXPECT_EQ(back.c[0], 255);
  EXPECT_EQ(back.c[1], 0);
  EXPECT_EQ(back.c[2], 0);
  const Levels back16 = hsvToRgb16u(65535, 65535, 65535);
  EXPECT_EQ(back16.c[0], 65535);
  EXPECT_EQ(back16.c[1], 0);
  EXPECT_EQ(back16.c[2], 0);
}

TEST(HsvReference, InverseSextants) {
  // H = 254: 5.97 sextants, the sixth row of the table (V, p, q).
  const Levels l = hsvToRgb8u(254, 255, 200);
  EXPECT_EQ(l.c[0], 200);
  EXPECT_EQ(l.c[1], 0);
  EXPECT_LE(l.c[2], 10);
  // S = 0 copies V into all three for any hue.
  for (int h : {0, 17, 200, 255}) {
    const Levels g = hsvToRgb8u(h, 0, 77);
    EXPECT_EQ(g.c[0], 77);
    EXPECT_EQ(g.c[1], 77);
    EXPECT_EQ(g.c[2], 77);
  }
  const Levels green = hsvToRgb8u(85, 255, 255);
  EXPECT_EQ(green.c[0], 0);
  EXPECT_EQ(green.c[1], 255);
  EXPECT_EQ(green.c[2], 0);
  // Every 8u hue lands in a sextant 0..5 and every 16u hue too.
  for (int h = 0; h < 256; ++h) {
    const Levels c = hsvToRgb8u(h, 255, 255);
    EXPECT_TRUE(c.c[0] == 255 || c.c[1] == 255 || c.c[2] == 255) << h;
  }
  for (int h = 0; h < 65536; h += 7) {
    const Levels c = hsvToRgb16u(h, 65535, 65535);
    ASSERT_TRUE(c.c[0] == 65535 || c.c[1] == 65535 || c.c[2] == 65535) << h;
  }
}

TEST(HsvReference, TiesBetweenHueBranches) {
  // R = G = max: the block takes the red branch, the tail the green one.
  // Both are one sextant, up to the reciprocal's rounding.
  int differing = 0;
  for (int m = 2; m < 256; ++m)
    for (int b = 0; b < m; b += 13) {
      const Levels body = rgbToHsv8u(m, m, b, Ties::Block), tail = rgbToHsv8u(m, m, b, Ties::Tail);
      EXPECT_NEAR(body.c[0], 42.5, 1.0);
      EXPECT_NEAR(tail.c[0], 42.5, 1.0);
      differing += body.c[0] != tail.c[0];
      // R = B = max: the blue branch in both.
      EXPECT_EQ(rgbToHsv8u(m, b, m, Ties::Block).c[0], rgbToHsv8u(m, b, m, Ties::Tail).c[0]);
      // G = B = max: green in the block, blue in the tail; three sextants.
      EXPECT_NEAR(rgbToHsv8u(b, m, m, Ties::Block).c[0], 127.5, 1.0);
      EXPECT_NEAR(rgbToHsv8u(b, m, m, Ties::Tail).c[0], 127.5, 1.0);
    }
  EXPECT_GT(differing, 0) << "the branch order made no difference anywhere";
  // Through the export: width 4 is all body, width 3 all tail.
  const auto blocks = convertRow(zeliRGBToHSV_8u_C3R, repeat<uint8_t>({200, 200, 50}, 4), 3);
  const auto tails = convertRow(zeliRGBToHSV_8u_C3R, repeat<uint8_t>({200, 200, 50}, 3), 3);
  EXPECT_EQ(blocks[0], rgbToHsv8u(200, 200, 50, Ties::Block).c[0]);
  EXPECT_EQ(tails[0], rgbToHsv8u(200, 200, 50, Ties::Tail).c[0]);
  // 16u, one pixel at a time, lets the last test win: G = B gives blue's
  // (4 - aR) + aG = 3 sextants, the same as green's (aR + 2) - aB.
  EXPECT_EQ(rgbToHsv16u(0, 65535, 65535).c[0], 32768);
}

// ---- every member over all widths ----

uint8_t hsvByte(std::mt19937& rng) {
  const uint32_t r = rng();
  switch (r & 7) {
    case 0: return 0;
    case 1: return 255;
    default: return uint8_t(r >> 8);
  }
}
uint16_t hsvWord(std::mt19937& rng) {
  const uint32_t r = rng();
  switch (r & 7) {
    case 0: return 0;
    case 1: return 65535;
    default: return uint16_t(r >> 8);
  }
}

// Few distinct values, so that ties between channels are frequent.
uint8_t tiedByte(std::mt19937& rng) {
  const uint32_t r = rng();
  return (r & 1) ? uint8_t(r >> 8) : uint8_t(((r >> 8) % 4) * 85);
}

TEST(HsvMembers, FollowTheirFormulasInEveryZone) {
  using M8 = Member<uint8_t, uint8_t>;
  using M16 = Member<uint16_t, uint16_t>;
  const auto forwardBody = levelsPixel<uint8_t, rgbToHsvBody8u>, forwardTail = levelsPixel<uint8_t, rgbToHsvTail8u>;
  const auto inverse8 = levelsPixel<uint8_t, hsvToRgb8u>;
  const auto inverse16 = levelsPixel<uint16_t, hsvToRgb16u>;
  zel::test::expectMembers<uint8_t, uint8_t>({
      M8("RGBToHSV_8u_C3", zeliRGBToHSV_8u_C3R)
          .zones(4, rgbToHsvBlocks8u<3>, forwardBody, forwardTail)
          .samples(tiedByte)
          .lanes16(),
      M8("RGBToHSV_8u_AC4", zeliRGBToHSV_8u_AC4R)
          .stride(4)
          .zones(4, rgbToHsvBlocks8u<4>, forwardBody, forwardTail)
          .samples(tiedByte)
          .lanes16(),
      M8("HSVToRGB_8u_C3", zeliHSVToRGB_8u_C3R)
          .zones(4, hsvToRgbBlocks<3, uint8_t>, inverse8, inverse8)
          .samples(hsvByte)
          .lanes16(),
      M8("HSVToRGB_8u_AC4", zeliHSVToRGB_8u_AC4R)
          .stride(4)
          .zones(4, hsvToRgbBlocks<4, uint8_t>, inverse8, inverse8)
          .samples(hsvByte)
          .lanes16(),
  });
  zel::test::expectMembers<uint16_t, uint16_t>({
      M16("RGBToHSV_16u_C3", zeliRGBToHSV_16u_C3R)
          .oneFormula(levelsPixel<uint16_t, rgbToHsv16u>)
          .stepsInSamples()
          .samples(hsvWord),
      M16("RGBToHSV_16u_AC4", zeliRGBToHSV_16u_AC4R)
          .stride(4)
          .oneFormula(levelsPixel<uint16_t, rgbToHsv16u>)
          .stepsInSamples()
          .samples(hsvWord),
      M16("HSVToRGB_16u_C3", zeliHSVToRGB_16u_C3R)
          .zones(4, hsvToRgbBlocks<3, uint16_t>, inverse16, inverse16)
          .stepsInSamples()
          .samples(hsvWord),
      M16("HSVToRGB_16u_AC4", zeliHSVToRGB_16u_AC4R)
          .stride(4)
          .zones(4, hsvToRgbBlocks<4, uint16_t>, inverse16, inverse16)
          .stepsInSamples()
          .samples(hsvWord),
  });
}

TEST(HsvMembers, SixteenBitStepsDropAnOddByte) {
  const std::vector<uint16_t> src = {1000, 2000, 3000, 60000, 100, 5};
  std::vector<uint16_t> dst(6, 0);
  ASSERT_EQ(zeliRGBToHSV_16u_C3R(src.data(), 7, dst.data(), 7, ImageSize{1, 2}), StatusOk);
  const Levels second = rgbToHsv16u(60000, 100, 5);
  for (int k = 0; k < 3; ++k) EXPECT_EQ(dst[3 + k], second.c[k]);
}

}  // namespace
