// RGB and XYZ: reference pixels, the two fixed-point zones of 8u, every
// member against its formulas, the vector bodies against the body formulas.
#include <gtest/gtest.h>
#include <limits>

#include "spaces/xyz_formulas.h"
#include "spaces/xyz_kernels.h"
#include "spaces/space_test_support.h"

namespace {

using namespace zel::spaces::xyz;
using zel::spaces::StepUnit;
using zel::test::convertRow;
using zel::test::Member;
using zel::test::repeat;
using zel::test::TestImage;

// Formulas as pixel functions for the checks.
template <typename T, Levels (*F)(int32_t, int32_t, int32_t)>
void levelsPixel(const T* in, T* out) {
  const Levels o = F(zel::spaces::level(in), zel::spaces::level(in + 1), zel::spaces::level(in + 2));
  for (int k = 0; k < 3; ++k) zel::spaces::storeLevel(out + k, o.c[k]);
}
template <Floats (*F)(float, float, float)>
void floatsPixel(const float* in, float* out) {
  const Floats o = F(in[0], in[1], in[2]);
  for (int k = 0; k < 3; ++k) out[k] = o.c[k];
}

// Mostly random bytes, with runs of the extremes so that saturation shows.
uint8_t byteSample(std::mt19937& rng) {
  const uint32_t r = rng();
  return (r & 3) == 0 ? uint8_t(r & 0x100 ? 255 : 0) : uint8_t(r >> 8);
}

TEST(XyzReference, WhiteTakesEachZonesMatrix) {
  // Y sums to 32768 in the body's table and to 65534 in the tail's; Z
  // passes 255 in both (277) and is limited.
  for (int width : {7, 8, 9, 16, 17}) {
    const auto out = convertRow(zeliRGBToXYZ_8u_C3R, std::vector<uint8_t>(size_t(width) * 3, 255), 3);
    const int body = width & ~7;
    for (int x = 0; x < width; ++x) {
      EXPECT_EQ(out[x * 3 + 0], 242) << width << " " << x;
      EXPECT_EQ(out[x * 3 + 1], x < body ? 255 : 254) << width << " " << x;
      EXPECT_EQ(out[x * 3 + 2], 255) << width << " " << x;
    }
  }
  // AC4 blocks are 4 pixels: width 3 is all tail, width 4 all body.
  for (int width : {3, 4, 5}) {
    std::vector<uint8_t> src(size_t(width) * 4, 255);
    const auto out = convertRow(zeliRGBToXYZ_8u_AC4R, src, 4);
    for (int x = 0; x < width; ++x) EXPECT_EQ(out[x * 4 + 1], x < (width & ~3) ? 255 : 254) << width << " " << x;
  }
}

TEST(XyzReference, FixedPointTruncatesWithoutRounding) {
  // Red alone: 13515 * 255 / 32768 = 105.2 and 27030 * 255 / 65536 = 105.2.
  EXPECT_EQ(rgbToXyzBody8u(255, 0, 0).c[0], 105);
  EXPECT_EQ(rgbToXyzTail8u(255, 0, 0).c[0], 105);
  // 6969 * 147 / 32768 = 31.26 in the body, 13937 * 147 / 65536 = 31.26.
  EXPECT_EQ(rgbToXyzBody8u(147, 0, 0).c[1], 31);
  // Large X with small Y and Z: red saturates, green and blue go to 0.
  for (auto f : {xyzToRgbBody8u, xyzToRgbTail8u}) {
    const Levels o = f(255, 80, 0);
    EXPECT_EQ(o.c[0], 255);
    EXPECT_EQ(o.c[1], 0);
    EXPECT_EQ(o.c[2], 0);
  }
  // X alone keeps a little blue: 456 * 255 >> 13 = 14, 3646 * 255 >> 16 = 14.
  EXPECT_EQ(xyzToRgbBody8u(255, 0, 0).c[2], 14);
  EXPECT_EQ(xyzToRgbTail8u(255, 0, 0).c[2], 14);
}

TEST(XyzReference, SignedSamplesWorkOnTheBiasedRange) {
  const auto low = convertRow(zeliRGBToXYZ_16s_C3R, std::vector<int16_t>(15, -32768), 3);
  for (int16_t v : low) EXPECT_EQ(v, -32768);
  // 65535 * (0.412453 + 0.35758 + 0.180423) = 62288.13: truncated, less
  // 32768; Y and Z saturate (Z from 71351).
  const auto high = convertRow(zeliRGBToXYZ_16s_C3R, std::vector<int16_t>(15, 32767), 3);
  for (int x = 0; x < 5; ++x) {
    EXPECT_EQ(high[x * 3 + 0], 29520);
    EXPECT_EQ(high[x * 3 + 1], 32767);
    EXPECT_EQ(high[x * 3 + 2], 32767);
  }
  const auto inverseLow = convertRow(zeliXYZToRGB_16s_AC4R, std::vector<int16_t>(20, -32768), 4);
  for (int x = 0; x < 5; ++x) EXPECT_EQ(inverseLow[x * 4], -32768);
}

TEST(XyzReference, FloatForwardClampsOnlyZ) {
  for (int width : {3, 4, 5}) {
    std::vector<float> src;
    for (int x = 0; x < width; ++x) src.insert(src.end(), {1.0f, 1.0f, 2.0f});
    const auto out = convertRow(zeliRGBToXYZ_32f_C3R, src, 3);
    for (int x = 0; x < width; ++x) {
      EXPECT_EQ(out[x * 3 + 0], (0.412453f * 1.0f + 0.35758f * 1.0f) + 0.180423f * 2.0f);
      EXPECT_GT(out[x * 3 + 0], 1.0f);
      EXPECT_EQ(out[x * 3 + 2], 1.0f);
    }
  }
  // A negative Z is raised to 0, X and Y stay negative.
  const Floats neg = rgbToXyz32f(-1.0f, -1.0f, -1.0f);
  EXPECT_LT(neg.c[0], 0.0f);
  EXPECT_LT(neg.c[1], 0.0f);
  EXPECT_EQ(neg.c[2], 0.0f);
  // The inverse clamps all three.
  const Floats rgb = xyzToRgb32f(1.0f, 0.0f, 0.0f);
  EXPECT_EQ(rgb.c[0], 1.0f);
  EXPECT_EQ(rgb.c[1], 0.0f);
  EXPECT_EQ(rgb.c[2], 0.055648f);
}

// ---- every member over all widths ----

using M8 = Member<uint8_t, uint8_t>;
using M16 = Member<uint16_t, uint16_t>;
using M16s = Member<int16_t, int16_t>;
using M32 = Member<float, float>;

// Beyond 0..1 too, so that the float clamps act.
float wideFloat(std::mt19937& rng) { return float(std::uniform_real_distribution<double>(-0.5, 1.8)(rng)); }

TEST(XyzMembers, FollowTheirFormulasInEveryZone) {
  // 8u: C3 blocks of 8 pixels, AC4 blocks of 4, two fixed-point tables.
  zel::test::expectMembers<uint8_t, uint8_t>({
      M8("RGBToXYZ_8u_C3", zeliRGBToXYZ_8u_C3R)
          .zones(8, rgbToXyzBlocks8u<3>, levelsPixel<uint8_t, rgbToXyzBody8u>, levelsPixel<uint8_t, rgbToXyzTail8u>)
          .samples(byteSample),
      M8("RGBToXYZ_8u_AC4", zeliRGBToXYZ_8u_AC4R)
          .stride(4)
          .zones(4, rgbToXyzBlocks8u<4>, levelsPixel<uint8_t, rgbToXyzBody8u>, levelsPixel<uint8_t, rgbToXyzTail8u>)
          .samples(byteSample),
      M8("XYZToRGB_8u_C3", zeliXYZToRGB_8u_C3R)
          .zones(8, xyzToRgbBlocks8u<3>, levelsPixel<uint8_t, xyzToRgbBody8u>, levelsPixel<uint8_t, xyzToRgbTail8u>)
          .samples(byteSample),
      M8("XYZToRGB_8u_AC4", zeliXYZToRGB_8u_AC4R)
          .stride(4)
          .zones(4, xyzToRgbBlocks8u<4>, levelsPixel<uint8_t, xyzToRgbBody8u>, levelsPixel<uint8_t, xyzToRgbTail8u>)
          .samples(byteSample),
  });
  // 16-bit: one float formula in both zones.
  auto wide = [](auto member, auto blocks, auto formula, int stride) {
    return member.stride(stride).zones(4, blocks, formula, formula).stepsInSamples();
  };
  zel::test::expectMembers<uint16_t, uint16_t>({
      wide(M16("RGBToXYZ_16u_C3", zeliRGBToXYZ_16u_C3R), rgbToXyzBlocks16<3, uint16_t>,
           levelsPixel<uint16_t, rgbToXyz16>, 3),
      wide(M16("RGBToXYZ_16u_AC4", zeliRGBToXYZ_16u_AC4R), rgbToXyzBlocks16<4, uint16_t>,
           levelsPixel<uint16_t, rgbToXyz16>, 4),
      wide(M16("XYZToRGB_16u_C3", zeliXYZToRGB_16u_C3R), xyzToRgbBlocks16<3, uint16_t>,
           levelsPixel<uint16_t, xyzToRgb16>, 3),
      wide(M16("XYZToRGB_16u_AC4", zeliXYZToRGB_16u_AC4R), xyzToRgbBlocks16<4, uint16_t>,
           levelsPixel<uint16_t, xyzToRgb16>, 4),
  });
  zel::test::expectMembers<int16_t, int16_t>({
      wide(M16s("RGBToXYZ_16s_C3", zeliRGBToXYZ_16s_C3R), rgbToXyzBlocks16<3, int16_t>,
           levelsPixel<int16_t, rgbToXyz16>, 3),
      wide(M16s("RGBToXYZ_16s_AC4", zeliRGBToXYZ_16s_AC4R), rgbToXyzBlocks16<4, int16_t>,
           levelsPixel<int16_t, rgbToXyz16>, 4),
      wide(M16s("XYZToRGB_16s_C3", zeliXYZToRGB_16s_C3R), xyzToRgbBlocks16<3, int16_t>,
           levelsPixel<int16_t, xyzToRgb16>, 3),
      wide(M16s("XYZToRGB_16s_AC4", zeliXYZToRGB_16s_AC4R), xyzToRgbBlocks16<4, int16_t>,
           levelsPixel<int16_t, xyzToRgb16>, 4),
  });
  // Float: the inverse has one formula for every pixel, so its vector body
  // is held to it too; some samples are NaN, which the clamps let through.
  // The C3 members have 16-lane bodies and stream frames beyond the cache.
  auto withNaN = [](std::mt19937& rng) {
    return rng() % 16 == 0 ? std::numeric_limits<float>::quiet_NaN() : wideFloat(rng);
  };
  zel::test::expectMembers<float, float>({
      wide(M32("RGBToXYZ_32f_C3", zeliRGBToXYZ_32f_C3R), rgbToXyzBlocks32f<3>, floatsPixel<rgbToXyz32f>, 3)
          .samples(wideFloat)
          .lanes16()
          .streamed(),
      wide(M32("RGBToXYZ_32f_AC4", zeliRGBToXYZ_32f_AC4R), rgbToXyzBlocks32f<4>, floatsPixel<rgbToXyz32f>, 4)
          .samples(wideFloat),
      wide(M32("XYZToRGB_32f_C3", zeliXYZToRGB_32f_C3R), xyzToRgbBlocks32f<3>, floatsPixel<xyzToRgb32f>, 3)
          .samples(withNaN)
          .lanes16()
          .streamed(),
      wide(M32("XYZToRGB_32f_AC4", zeliXYZToRGB_32f_AC4R), xyzToRgbBlocks32f<4>, floatsPixel<xyzToRgb32f>, 4)
          .samples(withNaN),
  });
}

TEST(XyzMembers, WideSamplesCountStepsInWholeSamples) {
  // A 16-bit step of 2 * 3 * 2 + 1 bytes moves by 12 bytes: the odd byte is
  // dropped, and the second row is read from right after the first.
  std::vector<uint16_t> src = {100, 200, 300, 400, 500, 600, 700, 800, 900, 1000, 1100, 1200};
  std::vector<uint16_t> dst(12, 0);
  ASSERT_EQ(zeliRGBToXYZ_16u_C3R(src.data(), 13, dst.data(), 13, ImageSize{2, 2}), StatusOk);
  for (int p = 0; p < 4; ++p) {
    const Levels want = rgbToXyz16(src[p * 3], src[p * 3 + 1], src[p * 3 + 2]);
    for (int k = 0; k < 3; ++k) EXPECT_EQ(dst[p * 3 + k], want.c[k]) << p;
  }
  // Floats drop up to three bytes.
  std::vector<float> fsrc = {0.1f, 0.2f, 0.3f, 0.4f, 0.5f, 0.6f};
  std::vector<float> fdst(6, -1.0f);
  ASSERT_EQ(zeliXYZToRGB_32f_C3R(fsrc.data(), 15, fdst.data(), 15, ImageSize{1, 2}), StatusOk);
  const Floats second = xyzToRgb32f(0.4f, 0.5f, 0.6f);
  for (int k = 0; k < 3; ++k) EXPECT_EQ(fdst[3 + k], second.c[k]);
}

TEST(XyzMembers, NegativeStepWalksUpwards) {
  std::vector<uint8_t> src = {10, 20, 30, 200, 100, 50};  // two rows of one pixel
  std::vector<uint8_t> dst(6, 0);
  ASSERT_EQ(zeliRGBToXYZ_8u_C3R(src.data() + 3, -3, dst.data() + 3, -3, ImageSize{1, 2}), StatusOk);
  const Levels top = rgbToXyzTail8u(200, 100, 50), up = rgbToXyzTail8u(10, 20, 30);
  for (int k = 0; k < 3; ++k) {
    EXPECT_EQ(dst[3 + k], top.c[k]);
    EXPECT_EQ(dst[k], up.c[k]);
  }
}

}  // namespace
