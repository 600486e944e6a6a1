// RGB and BGR to HLS: every member's blocks and tail against the lane
// formulas at every width and alignment, the formulas against the colour
// model in double precision, and the cases where rounding, branch priority
// and the width decide a result.
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstring>
#include <functional>

#include "spaces/hls_formulas.h"
#include "spaces/hls_test_images.h"

namespace {

using namespace zel::hls;
using zel::ApproxRcp;
using zel::RefinedRcp;
using zel::RoundEven;
using zel::TruncateToInt;
using namespace zel::test;

// Expected H, L, S of one pixel, as stored.
template <class R, typename T>
void expectedForward(const ChannelImage<T>& src, int x, int y, int redAt, bool body, T out[3]) {
  constexpr uint32_t flip = flipOf<T>();
  float c[3];
  for (int k = 0; k < 3; ++k) c[k] = float(int32_t(bits(src.get(x, y, k)) ^ flip));
  const Hls v = body ? forwardBody<R>(c[redAt], c[1], c[2 - redAt]) : forwardTail<R>(c[redAt], c[1], c[2 - redAt]);
  out[0] = T(uint32_t(v.h) ^ flip);
  out[1] = T(uint32_t(v.l) ^ flip);
  out[2] = T(uint32_t(v.s) ^ flip);
}

template <class R, typename T>
void checkMember(const char* name, Call<T> call, Shape shape) {
  checkEveryWidth<T>(name, call, shape, R::kBlock, false,
                     [&](const ChannelImage<T>& src, int x, int y, bool body, T* out) {
                       expectedForward<R, T>(src, x, y, shape.redAt, body, out);
                     });
}

TEST(RgbToHls, BlocksAndTailAtEveryWidth) {
  checkMember<RgbToHls8C3, uint8_t>("8u C3", packed(zeliRGBToHLS_8u_C3R), {false, 3, false, 3, 0, false});
  checkMember<RgbToHls8AC4, uint8_t>("8u AC4", packed(zeliRGBToHLS_8u_AC4R), {false, 4, false, 4, 0, false});
  checkMember<RgbToHls16, uint16_t>("16u C3", packed(zeliRGBToHLS_16u_C3R), {false, 3, false, 3, 0, false});
  checkMember<RgbToHls16, uint16_t>("16u AC4", packed(zeliRGBToHLS_16u_AC4R), {false, 4, false, 4, 0, false});
  checkMember<RgbToHls16, int16_t>("16s C3", packed(zeliRGBToHLS_16s_C3R), {false, 3, false, 3, 0, false});
  checkMember<RgbToHls16, int16_t>("16s AC4", packed(zeliRGBToHLS_16s_AC4R), {false, 4, false, 4, 0, false});
}

TEST(BgrToHls, BlocksAndTailAtEveryWidth) {
  checkMember<BgrToHls8, uint8_t>("AC4", packed(zeliBGRToHLS_8u_AC4R), {false, 4, false, 4, 2, false});
  checkMember<BgrToHls8, uint8_t>("AC4P4", toPlanes(zeliBGRToHLS_8u_AC4P4R), {false, 4, true, 4, 2, true});
  checkMember<BgrToHls8, uint8_t>("AP4C4", fromPlanes(zeliBGRToHLS_8u_AP4C4R), {true, 4, false, 4, 2, true});
  checkMember<BgrToHls8, uint8_t>("AP4", planesToPlanes(zeliBGRToHLS_8u_AP4R), {true, 4, true, 4, 2, true});
  checkMember<BgrToHls8, uint8_t>("C3P3", toPlanes(zeliBGRToHLS_8u_C3P3R), {false, 3, true, 3, 2, false});
  checkMember<BgrToHls8, uint8_t>("P3C3", fromPlanes(zeliBGRToHLS_8u_P3C3R), {true, 3, false, 3, 2, false});
  checkMember<BgrToHls8, uint8_t>("P3", planesToPlanes(zeliBGRToHLS_8u_P3R), {true, 3, true, 3, 2, false});
}

void expectedFloat(const ChannelImage<float>& src, int x, int y, bool, float* out) {
  const HlsF v = forwardFloat(src.get(x, y, 0), src.get(x, y, 1), src.get(x, y, 2));
  out[0] = v.h, out[1] = v.l, out[2] = v.s;
}

TEST(RgbToHls, FloatPixelsByTheFloatFormula) {
  // One form for every pixel: no blocks.
  for (int ch : {3, 4})
    checkEveryWidth<float>("32f", packed(ch == 3 ? zeliRGBToHLS_32f_C3R : zeliRGBToHLS_32f_AC4R),
                           {false, ch, false, ch, 0, false}, 1, false, expectedFloat);
}

TEST(RgbToHls, ByteGroupsOfEveryTier) {
  // 8-pixel blocks taken 8 or 16 at a time, or 4 and 4: the same recipe.
  atEveryTier([&] {
    checkEveryWidth<uint8_t>("8u C3", packed(zeliRGBToHLS_8u_C3R), {false, 3, false, 3, 0, false}, 8, false,
                             [](const ChannelImage<uint8_t>& src, int x, int y, bool body, uint8_t* out) {
                               expectedForward<RgbToHls8C3, uint8_t>(src, x, y, 0, body, out);
                             },
                             {129, 150, 203});
  });
}

TEST(RgbToHls, FloatGroupsOfEveryTierAndStreamedRows) {
  // Groups of 4, 8 and 16 pixels, widths past a few 16-pixel groups, and
  // rows streamed past the cache from their first aligned pixel.
  const Shape c3{false, 3, false, 3, 0, false};
  atEveryTier([&] {
    checkEveryWidth<float>("32f C3", packed(zeliRGBToHLS_32f_C3R), c3, 1, false, expectedFloat, {129, 150, 203});
    checkStreamedFrames<float>("32f C3", packed(zeliRGBToHLS_32f_C3R), c3, 1, false, expectedFloat);
  });
}

// ---- the formulas against the colour model ----

struct Model {
  double h, l, s;  // hue in degrees, l and s in 0..1
};
Model modelOf(double r, double g, double b) {
  const double mx = std::max({r, g, b}), mn = std::min({r, g, b});
  Model m{0, (mx + mn) / 2, 0};
  if (mx == mn) return m;
  m.s = m.l <= 0.5 ? (mx - mn) / (mx + mn) : (mx - mn) / (2 - mx - mn);
  if (mx == r) m.h = 60 * (g - b) / (mx - mn);
  else if (mx == g) m.h = 120 + 60 * (b - r) / (mx - mn);
  else m.h = 240 + 60 * (r - g) / (mx - mn);
  if (m.h < 0) m.h += 360;
  return m;
}

// Distance on the hue circle, in units of the sample range.
double hueDistance(double a, double b, double range) {
  const double d = std::fabs(a - b);
  return std::min(d, range - d);
}

// Within one level, plus what a 12-bit reciprocal (or the float spacing
// near 65535) can add to a truncated result.
template <class R>
void compareWithModel(std::mt19937& rng) {
  const double limit = 1.0 + (R::kRefined ? 0.01 : R::kMax * 3.0 / 4096);
  for (int i = 0; i < 200000; ++i) {
    const float r = float(rng() % (R::kMax + 1)), g = float(rng() % (R::kMax + 1)), b = float(rng() % (R::kMax + 1));
    const Model m = modelOf(double(r) / R::kMax, double(g) / R::kMax, double(b) / R::kMax);
    for (bool body : {true, false}) {
      const Hls v = body ? forwardBody<R>(r, g, b) : forwardTail<R>(r, g, b);
      ASSERT_LE(hueDistance(v.h, m.h * R::kMax / 360, R::kMax), limit) << r << " " << g << " " << b << " body " << body;
      ASSERT_LE(std::fabs(v.l - m.l * R::kMax), 1.0) << r << " " << g << " " << b;
      ASSERT_LE(std::fabs(v.s - m.s * R::kMax), limit) << r << " " << g << " " << b << " body " << body;
    }
  }
}

TEST(HlsForwardFormulas, WithinOneLevelOfTheColourModel) {
  std::mt19937 rng(77);
  compareWithModel<RgbToHls8C3>(rng);
  compareWithModel<RgbToHls8AC4>(rng);
  compareWithModel<RgbToHls16>(rng);
  compareWithModel<BgrToHls8>(rng);
  for (int i = 0; i < 100000; ++i) {
    const float r = float(rng()) / 4294967296.0f, g = float(rng()) / 4294967296.0f, b = float(rng()) / 4294967296.0f;
    const Model m = modelOf(r, g, b);
    const HlsF v = forwardFloat(r, g, b);
    // Float differences lose about 1e-7 of the samples; the hue divides
    // them by the spread.
    const double spread = std::max({r, g, b}) - std::min({r, g, b});
    const double tolerance = 1e-6 * (1 + 1 / std::max(spread, 1e-9));
    ASSERT_LE(hueDistance(v.h, m.h / 360, 1.0), tolerance) << r << " " << g << " " << b;
    ASSERT_NEAR(v.l, m.l, 1e-6);
    ASSERT_NEAR(v.s, m.s, tolerance);
  }
}

TEST(HlsForwardFormulas, StoredConstants) {
  const std::pair<float, uint32_t> table[] = {{kHue8, 0x3F355555u}, {kHue16, 0x43360AABu}, {kInv8, 0x3B808081u},
                                              {kDeg8, 0x3FB4B4B5u}, {kInv16, 0x37800080u}, {kDeg16, 0x3BB400B4u},
                                              {kInv60, 0x3C888889u}, {kFlatLimit, 0x34000000u}};
  for (const auto& [value, pattern] : table) EXPECT_EQ(bits(value), pattern);
}

// ---- rounding, priority and zones ----

TEST(HlsForwardValues, LightnessOfAnOddSum) {
  // (3 + 0) / 2 = 1.5: the 8u C3 blocks round to 2, its tail truncates to
  // 1; AC4 rounds in both, the BGR family truncates in both. 2.5 ties to 2.
  EXPECT_EQ(forwardBody<RgbToHls8C3>(3, 0, 0).l, 2);
  EXPECT_EQ(forwardTail<RgbToHls8C3>(3, 0, 0).l, 1);
  EXPECT_EQ(forwardBody<RgbToHls8AC4>(0, 3, 0).l, 2);
  EXPECT_EQ(forwardTail<RgbToHls8AC4>(0, 3, 0).l, 2);
  EXPECT_EQ(forwardBody<BgrToHls8>(0, 0, 3).l, 1);
  EXPECT_EQ(forwardTail<BgrToHls8>(0, 0, 3).l, 1);
  EXPECT_EQ(forwardBody<RgbToHls8C3>(5, 0, 0).l, 2);
  EXPECT_EQ(forwardTail<RgbToHls8AC4>(5, 0, 0).l, 2);
  // Width 7 is all tail for the 8-pixel blocks, width 8 all blocks.
  for (int width : {7, 8}) {
    std::vector<uint8_t> src(3 * width, 0), dst(3 * width);
    for (int x = 0; x < width; ++x) src[3 * x] = 3;
    ASSERT_EQ(zeliRGBToHLS_8u_C3R(src.data(), 3 * width, dst.data(), 3 * width, ImageSize{width, 1}), StatusOk);
    for (int x = 0; x < width; ++x) EXPECT_EQ(dst[3 * x + 1], width == 8 ? 2 : 1) << width;
  }
}

TEST(HlsForwardValues, HueJustBelowZero) {
  // R the largest, B one above G: 0.235 degrees below 360 gives 255 where
  // the form rounds, 254 where it truncates.
  EXPECT_EQ(forwardBody<RgbToHls8C3>(255, 0, 1).h, 255);
  EXPECT_EQ(forwardTail<RgbToHls8C3>(255, 0, 1).h, 254);
  EXPECT_EQ(forwardTail<RgbToHls8AC4>(255, 0, 1).h, 255);
  EXPECT_EQ(forwardBody<BgrToHls8>(255, 0, 1).h, 254);
}

TEST(HlsForwardValues, RedWinsATieWithGreenAndGreenWithBlue) {
  // R = G = mx > B takes the red branch, (rcp * 60) * (G - B) + 0; the
  // green branch would give 120 + (rcp * 60) * (B - R), which differs in
  // the last bits where the reciprocal is not exact.
  int differing = 0;
  for (int mx = 1; mx < 256; ++mx)
    for (int b = 0; b < mx; ++b) {
      const float spread = float(mx - b), rate = ApproxRcp(spread);
      const float red = (rate * 60.0f) * spread, green = (rate * 60.0f) * -spread + 120.0f;
      const Hls v = forwardBody<RgbToHls8C3>(float(mx), float(mx), float(b));
      ASSERT_EQ(v.h, RoundEven(red * kHue8)) << mx << " " << b;
      differing += RoundEven(red * kHue8) != RoundEven(green * kHue8);
      // G = B = mx > R: the green branch, 120 + (rcp * 60) * (B - R).
      const float cyan = (rate * 60.0f) * spread + 120.0f;
      ASSERT_EQ(forwardBody<RgbToHls8C3>(float(b), float(mx), float(mx)).h, RoundEven(cyan * kHue8)) << mx << " " << b;
    }
  EXPECT_GT(differing, 0) << "no case tells the two branches apart";
}

template <class R>
void expectGrey() {
  for (int v = 0; v <= R::kMax; ++v)
    for (const Hls& o : {forwardBody<R>(v, v, v), forwardTail<R>(v, v, v)})
      ASSERT_TRUE(o.h == 0 && o.l == v && o.s == 0) << v;
}

TEST(HlsForwardValues, GreyHasNoHueOrSaturation) {
  // Every level, blocks and tail: H and S at the lowest level, L the sample
  // (the public functions against these formulas, signed bias included,
  // are the sweeps above).
  expectGrey<RgbToHls8C3>();
  expectGrey<RgbToHls8AC4>();
  expectGrey<RgbToHls16>();
  expectGrey<BgrToHls8>();
}

TEST(HlsForwardValues, FloatSpreadBelowTheFlatLimit) {
  const float src[6] = {0.01f, 0.01f + 1e-8f, 0.01f, 0.25f, 0.25f, 0.25f + 2e-7f};
  ASSERT_GT(src[1], src[0]);
  float dst[6];
  ASSERT_EQ(zeliRGBToHLS_32f_C3R(src, 12, dst, 12, ImageSize{2, 1}), StatusOk);
  EXPECT_EQ(dst[0], 0.0f);
  EXPECT_EQ(dst[2], 0.0f);
  EXPECT_EQ(dst[1], (src[1] + src[0]) * 0.5f);
  EXPECT_GT(dst[5], 0.0f) << "a spread above the limit is a colour";
}

// ---- steps ----

TEST(HlsForwardSteps, WholeSamplesAndUpwardRows) {
  // An odd byte step of a 16-bit member drops its last byte; a negative
  // step walks upwards from the first row.
  const int width = 9, height = 3;
  std::mt19937 rng(4);
  std::vector<uint16_t> src(3 * width * height);
  for (auto& v : src) v = uint16_t(rng());
  std::vector<uint16_t> even(src.size()), odd(src.size()), up(src.size());
  const ImageSize size{width, height};
  ASSERT_EQ(zeliRGBToHLS_16u_C3R(src.data(), 6 * width, even.data(), 6 * width, size), StatusOk);
  ASSERT_EQ(zeliRGBToHLS_16u_C3R(src.data(), 6 * width + 1, odd.data(), 6 * width + 1, size), StatusOk);
  EXPECT_EQ(even, odd);
  const int last = 3 * width * (height - 1);
  ASSERT_EQ(zeliRGBToHLS_16u_C3R(src.data() + last, -6 * width, up.data() + last, -6 * width, size), StatusOk);
  EXPECT_EQ(even, up);
}

}  // namespace
