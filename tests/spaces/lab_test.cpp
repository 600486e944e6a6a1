// RGB and Lab: reference pixels, the tabled cube root against the true one,
// the missing linear segment of the inverse, every member against its
// formulas, vector bodies against the body formulas.
#include <gtest/gtest.h>

#include <cmath>

#include "spaces/lab_formulas.h"
#include "spaces/lab_kernels.h"
#include "spaces/space_test_support.h"

namespace {

using namespace zel::spaces::lab;
using zel::spaces::CubeRootTable;
using zel::test::convertRow;
using zel::test::Member;
using zel::test::repeat;

// Lab of linear RGB in double precision, for the float forms.
Floats exactLab(double r, double g, double b) {
  const double x = (0.412453 * r + 0.35758 * g + 0.180423 * b) / 0.950456;
  const double y = 0.212671 * r + 0.71516 * g + 0.072169 * b;
  const double z = (0.019334 * r + 0.119193 * g + 0.950227 * b) / 1.0887539;
  auto f = [](double t) { return t <= 0.008856 ? 7.787 * t + 16.0 / 116 : std::cbrt(t); };
  const double l = y <= 0.008856 ? 903.3 * y : 116 * std::cbrt(y) - 16;
  return {{float(l), float(500 * (f(x) - f(y))), float(200 * (f(y) - f(z)))}};
}

TEST(LabReference, BlackAndWhiteAreNeutral) {
  for (int width : {3, 4, 5}) {
    const auto black = convertRow(zeliRGBToLab_8u_C3R, repeat<uint8_t>({0, 0, 0}, width));
    const auto white = convertRow(zeliBGRToLab_8u_C3R, repeat<uint8_t>({255, 255, 255}, width));
    for (int x = 0; x < width; ++x) {
      EXPECT_EQ(black[x * 3], 0);
      EXPECT_EQ(black[x * 3 + 1], 128);
      EXPECT_EQ(black[x * 3 + 2], 128);
      EXPECT_EQ(white[x * 3], 255);
      EXPECT_EQ(white[x * 3 + 1], 128);
      EXPECT_EQ(white[x * 3 + 2], 128);
    }
  }
  // White scaled by the reference white lies within 2e-6 of 1, in cell 127.
  const float y = zel::spaces::matrixRow(zel::spaces::kRgbToXyz[1], 255.0f, 255.0f, 255.0f) * kWhite8.y;
  EXPECT_NEAR(y, 1.0f, 2e-6f);
  EXPECT_EQ(zel::TruncateToInt(y * zel::spaces::kCubeIndexScale), 127);
  // Greys in the 16-bit coding: a and b near 128 * 255.
  for (int v : {1, 50, 128, 255}) {
    const auto out = convertRow(
        zeliBGRToLab_8u16u_C3R, repeat<uint8_t>({uint8_t(v), uint8_t(v), uint8_t(v)}, 5));
    for (int x = 0; x < 5; ++x) {
      EXPECT_NEAR(out[x * 3 + 1], 32640, 40) << v;
      EXPECT_NEAR(out[x * 3 + 2], 32640, 40) << v;
    }
  }
}

TEST(LabReference, TabledCubeRootFollowsItsSeries) {
  // Above the linear limit the 4-term series of cell 1 runs at e near -0.43
  // and is visibly off the true root; the 8-term series is closer.
  const float t = 0.0089f;
  EXPECT_EQ(zel::TruncateToInt(t * zel::spaces::kCubeIndexScale), 1);
  const double truth = std::cbrt(double(t));
  const float four = zel::spaces::cubeRoot(CubeRootTable, zel::spaces::kSeries4, t);
  const float eight = zel::spaces::cubeRoot(CubeRootTable, zel::spaces::kSeries8, t);
  EXPECT_GT(std::fabs(four - truth), 1e-4);
  EXPECT_LT(std::fabs(eight - truth), std::fabs(four - truth) / 20);
  // Above the limit the 8-term form is within a few millionths of the root.
  for (int i = 0; i <= 1000; ++i) {
    const float u = 0.0089f + (1.0f - 0.0089f) * float(i) / 1000.0f;
    EXPECT_NEAR(zel::spaces::cubeRoot(CubeRootTable, zel::spaces::kSeries8, u), std::cbrt(double(u)), 4e-6) << u;
    EXPECT_NEAR(zel::spaces::cubeRoot(CubeRootTable, zel::spaces::kSeries4, u), std::cbrt(double(u)), 2e-4) << u;
  }
}

TEST(LabReference, FloatFormsTrackTheExactLab) {
  std::mt19937 rng(3);
  std::uniform_real_distribution<double> dist(0, 1);
  for (int i = 0; i < 2000; ++i) {
    const double r = dist(rng), g = dist(rng), b = dist(rng);
    const Floats got = rgbToLab(float(r), float(g), float(b), kWhite32f, zel::spaces::kSeries8);
    const Floats want = exactLab(r, g, b);
    for (int k = 0; k < 3; ++k) ASSERT_NEAR(got.c[k], want.c[k], 2e-3) << r << " " << g << " " << b << " " << k;
    // And back through the inverse, which has no linear segment: only
    // pixels whose f values all lie on the cube root come back.
    const Floats back = labToRgb(got, kWhiteBack32f);
    if (want.c[0] > 8.0f && std::fabs(want.c[1]) < 60 && std::fabs(want.c[2]) < 60 && std::min({r, g, b}) > 0.05) {
      EXPECT_NEAR(back.c[0], r, 1e-3);
      EXPECT_NEAR(back.c[1], g, 1e-3);
      EXPECT_NEAR(back.c[2], b, 1e-3);
    }
  }
}

TEST(LabReference, InverseHasNoLinearSegment) {
  // L = 0 with neutral a, b: fy = 16/116, Y about 0.669 of 255, so the
  // result is 1, 1, 1 and not black.
  for (int width : {3, 4, 5}) {
    const auto rgb = convertRow(zeliLabToRGB_8u_C3R, repeat<uint8_t>({0, 128, 128}, width));
    for (uint8_t v : rgb) EXPECT_EQ(v, 1);
  }
  // Float outputs are not clamped: a saturated Lab leaves 0..1.
  const auto rgb = convertRow(zeliLabToRGB_32f_C3R, repeat<float>({60.0f, 120.0f, -110.0f}, 5));
  bool outside = false;
  for (float v : rgb) outside |= v < 0.0f || v > 1.0f;
  EXPECT_TRUE(outside);
  // The 16-bit coding of neutral black: the same as 8u.
  const auto grey = convertRow(zeliLabToBGR_16u8u_C3R, repeat<uint16_t>({0, 32640, 32640}, 3));
  for (uint8_t v : grey) EXPECT_EQ(v, 1);
}

std::vector<uint8_t> bytes(Status (*fn)(const uint8_t*, int, uint8_t*, int, ImageSize), const std::vector<uint8_t>& s) {
  return convertRow(fn, s);
}

std::vector<uint8_t> swapOuter(std::vector<uint8_t> v) {
  for (size_t i = 0; i < v.size(); i += 3) std::swap(v[i], v[i + 2]);
  return v;
}

TEST(LabReference, BgrNamesSwapTheRgbSide) {
  const std::vector<uint8_t> rgb = {10, 200, 90, 250, 3, 17, 0, 0, 255, 1, 2, 3, 99, 98, 97};
  const auto lab = bytes(zeliRGBToLab_8u_C3R, rgb);
  EXPECT_EQ(lab, bytes(zeliBGRToLab_8u_C3R, swapOuter(rgb)));
  EXPECT_NE(lab, bytes(zeliRGBToLab_8u_C3R, swapOuter(rgb)));
  const auto back = bytes(zeliLabToRGB_8u_C3R, lab);
  EXPECT_EQ(swapOuter(back), bytes(zeliLabToBGR_8u_C3R, lab));
  // Linear 8-bit RGB comes back within a step or two.
  for (size_t i = 0; i < rgb.size(); ++i) EXPECT_NEAR(back[i], rgb[i], 2) << i;
}

// ---- every member over all widths ----

template <typename S, typename D, bool Bgr>
Member<S, D> forward(const char* name, Status (*fn)(const S*, int, D*, int, ImageSize)) {
  return Member<S, D>(name, fn).zones(4, forwardBlocks<S, D, Bgr>, forwardPixel<S, D, Bgr, Zone::Body>,
                                      forwardPixel<S, D, Bgr, Zone::Tail>);
}

template <typename S, typename D, bool Bgr>
Member<S, D> inverse(const char* name, Status (*fn)(const S*, int, D*, int, ImageSize)) {
  return Member<S, D>(name, fn).zones(4, inverseBlocks<S, D, Bgr>, inversePixel<S, D, Bgr>, inversePixel<S, D, Bgr>);
}

float labFloat(std::mt19937& rng) { return float(std::uniform_real_distribution<double>(-128, 127)(rng)); }

TEST(LabMembers, FollowTheirFormulasInEveryZone) {
  // The byte and float forward forms have 16-lane bodies; the float ones
  // stream frames beyond the cache.
  zel::test::expectMembers<uint8_t, uint8_t>({
      forward<uint8_t, uint8_t, false>("RGBToLab_8u", zeliRGBToLab_8u_C3R).lanes16(),
      forward<uint8_t, uint8_t, true>("BGRToLab_8u", zeliBGRToLab_8u_C3R).lanes16(),
      inverse<uint8_t, uint8_t, false>("LabToRGB_8u", zeliLabToRGB_8u_C3R),
      inverse<uint8_t, uint8_t, true>("LabToBGR_8u", zeliLabToBGR_8u_C3R),
  });
  zel::test::expectMembers<uint8_t, uint16_t>({forward<uint8_t, uint16_t, true>("BGRToLab_8u16u", zeliBGRToLab_8u16u_C3R)});
  zel::test::expectMembers<uint16_t, uint8_t>({inverse<uint16_t, uint8_t, true>("LabToBGR_16u8u", zeliLabToBGR_16u8u_C3R)});
  zel::test::expectMembers<float, float>({
      forward<float, float, false>("RGBToLab_32f", zeliRGBToLab_32f_C3R).lanes16().streamed(),
      forward<float, float, true>("BGRToLab_32f", zeliBGRToLab_32f_C3R).lanes16().streamed(),
      inverse<float, float, false>("LabToRGB_32f", zeliLabToRGB_32f_C3R).samples(labFloat),
      inverse<float, float, true>("LabToBGR_32f", zeliLabToBGR_32f_C3R).samples(labFloat),
  });
}

TEST(LabMembers, FloatStepsStayInBytes) {
  // A float row step of 13 bytes: the second row starts 13 bytes on.
  std::vector<uint8_t> src(13 + 12), dst(13 + 12, 0);
  const float second[3] = {0.25f, 0.5f, 0.75f};
  std::memcpy(src.data() + 13, second, 12);
  ASSERT_EQ(zeliRGBToLab_32f_C3R(reinterpret_cast<const float*>(src.data()), 13, reinterpret_cast<float*>(dst.data()),
                                 13, ImageSize{1, 2}),
            StatusOk);
  float want[3], got[3];
  forwardPixel<float, float, false, Zone::Tail>(second, want);
  std::memcpy(got, dst.data() + 13, 12);
  for (int k = 0; k < 3; ++k) EXPECT_EQ(got[k], want[k]);
}

}  // namespace
