// RGB and LUV: reference pixels of each form, where the forms and zones part
// ways on purpose, every member against its formulas, vector bodies against
// the body formulas.
#include <gtest/gtest.h>

#include <cmath>

#include "spaces/luv_formulas.h"
#include "spaces/luv_kernels.h"
#include "spaces/space_test_support.h"

namespace {

using namespace zel::spaces::luv;
using zel::spaces::StepUnit;
using zel::test::convertRow;
using zel::test::Member;
using zel::test::repeat;

// CIE L*u*v* of linear RGB in double precision.
Floats exactLuv(double r, double g, double b) {
  const double x = 0.412453 * r + 0.35758 * g + 0.180423 * b;
  const double y = 0.212671 * r + 0.71516 * g + 0.072169 * b;
  const double z = 0.019334 * r + 0.119193 * g + 0.950227 * b;
  const double l = y > 0.008856 ? 116 * std::cbrt(y) - 16 : 903.3 * y;
  const double d = x + 15 * y + 3 * z;
  const double up = d > 0 ? 4 * x / d : 0, vp = d > 0 ? 9 * y / d : 0;
  return {{float(l), float(13 * l * (up - 0.197839)), float(13 * l * (vp - 0.468342))}};
}

TEST(LuvReference, BlackInTheSixteenBitZones) {
  // A block adds 3 to the zero D and codes U, V from it; the last pixels of
  // a row code them as zero. Width 4 is one block, width 3 has none.
  for (int width : {3, 4, 5, 8}) {
    const auto out = convertRow(zeliRGBToLUV_16u_C3R, repeat<uint16_t>({0, 0, 0}, width), 3);
    const int body = width & ~3;
    for (int x = 0; x < width; ++x) {
      EXPECT_EQ(out[x * 3], 0);
      EXPECT_EQ(out[x * 3 + 1], x < body ? 24807 : 0) << width << " " << x;
      EXPECT_EQ(out[x * 3 + 2], x < body ? 35019 : 0) << width << " " << x;
    }
  }
  // 16s: the same levels, biased back.
  const auto s = convertRow(zeliRGBToLUV_16s_AC4R, repeat<int16_t>({-32768, -32768, -32768, 0}, 5), 4);
  EXPECT_EQ(s[1], 24807 - 32768);
  EXPECT_EQ(s[2], 35019 - 32768);
  EXPECT_EQ(s[4 * 4], -32768);
  EXPECT_EQ(s[4 * 4 + 1], -32768);
  EXPECT_EQ(s[4 * 4 + 2], -32768);
  EXPECT_EQ(s[4 * 4 + 3], 7);
}

TEST(LuvReference, BlackInTheEightBitForms) {
  // U from 96.525 and V from 136.26, in the table form (both zones) and in
  // the power form.
  for (int width : {3, 4, 5}) {
    const auto table = convertRow(zeliRGBToLUV_8u_C3R, repeat<uint8_t>({0, 0, 0}, width), 3);
    const auto power = convertRow(zeliRGBToLUV_8u_AC4R, repeat<uint8_t>({0, 0, 0, 0}, width), 4);
    for (int x = 0; x < width; ++x) {
      EXPECT_EQ(table[x * 3], 0);
      EXPECT_EQ(table[x * 3 + 1], 97);
      EXPECT_EQ(table[x * 3 + 2], 136);
      EXPECT_EQ(power[x * 4], 0);
      EXPECT_EQ(power[x * 4 + 1], 97);
      EXPECT_EQ(power[x * 4 + 2], 136);
      EXPECT_EQ(power[x * 4 + 3], 7);
    }
  }
}

TEST(LuvReference, PowerFormTruncatesL) {
  // The same grey: rounded in the table form, truncated in the power form.
  int higher = 0;
  for (int v = 0; v < 256; ++v) {
    const int table = forwardTable8u(v, v, v, Zone::Tail).c[0], power = forwardPower8u(v, v, v).c[0];
    EXPECT_TRUE(table == power || table == power + 1) << v << ": " << table << " " << power;
    higher += table == power + 1;
  }
  EXPECT_GT(higher, 50);
}

TEST(LuvReference, FloatFormsTrackTheExactLuv) {
  std::mt19937 rng(5);
  std::uniform_real_distribution<double> dist(0, 1);
  for (int i = 0; i < 2000; ++i) {
    const double r = dist(rng), g = dist(rng), b = dist(rng);
    const Floats want = exactLuv(r, g, b);
    for (Zone zone : {Zone::Body, Zone::Tail}) {
      const Floats got = forward32f(float(r), float(g), float(b), zone);
      for (int k = 0; k < 3; ++k) ASSERT_NEAR(got.c[k], want.c[k], 2e-3) << r << " " << g << " " << b << " " << k;
    }
    // Back again through both inverse forms.
    const Floats luv = forward32f(float(r), float(g), float(b), Zone::Tail);
    const Floats tail = inverseTail32f(luv.c[0], luv.c[1], luv.c[2]);
    const Floats body = inverseBody32f(luv.c[0], luv.c[1], luv.c[2]);
    const double rgb[3] = {r, g, b};
    if (luv.c[0] > 1.0f)
      for (int k = 0; k < 3; ++k) {
        EXPECT_NEAR(tail.c[k], rgb[k], 2e-3);
        EXPECT_NEAR(body.c[k], rgb[k], 2e-3);
      }
  }
}

TEST(LuvReference, SixteenBitFormsTrackTheExactLuv) {
  std::mt19937 rng(9);
  for (int i = 0; i < 2000; ++i) {
    const int r = int(rng() & 0xffff), g = int(rng() & 0xffff), b = int(rng() & 0xffff);
    const Floats want = exactLuv(r / 65535.0, g / 65535.0, b / 65535.0);
    const double coded[3] = {want.c[0] * 655.35, (want.c[1] + 134) * 65535 / 354, (want.c[2] + 140) * 65535 / 262};
    for (Zone zone : {Zone::Body, Zone::Tail}) {
      const Levels got = forward16(r, g, b, zone == Zone::Body ? kForwardBody16 : kTailRounding16, zone);
      for (int k = 0; k < 3; ++k) ASSERT_NEAR(got.c[k], coded[k], 3.0) << r << " " << g << " " << b << " " << k;
    }
    // And the inverse of the coded values comes back near the sample.
    const Levels luv = forward16(r, g, b, kTailRounding16, Zone::Tail);
    if (luv.c[0] > 8000) {
      const Levels body = inverseBody16(luv.c[0], luv.c[1], luv.c[2]);
      const Levels tail = inverseTail(luv.c[0], luv.c[1], luv.c[2], true);
      const int rgb[3] = {r, g, b};
      for (int k = 0; k < 3; ++k) {
        EXPECT_NEAR(body.c[k], rgb[k], 200) << k;
        EXPECT_NEAR(tail.c[k], rgb[k], 200) << k;
      }
    }
  }
}

TEST(LuvReference, SixteenBitTailsRoundOrTruncateByMember) {
  // C3 rounds its last pixels, AC4 truncates them; the blocks agree.
  int differ = 0;
  std::mt19937 rng(2);
  for (int i = 0; i < 200; ++i) {
    const uint16_t r = uint16_t(rng()), g = uint16_t(rng()), b = uint16_t(rng());
    const auto c3 = convertRow(zeliRGBToLUV_16u_C3R, repeat<uint16_t>({r, g, b}, 5), 3);
    const auto ac4 = convertRow(zeliRGBToLUV_16u_AC4R, repeat<uint16_t>({r, g, b, 0}, 5), 4);
    for (int k = 0; k < 3; ++k) {
      EXPECT_EQ(c3[k], ac4[k]);
      EXPECT_LE(ac4[16 + k], c3[12 + k]);
      differ += ac4[16 + k] != c3[12 + k];
    }
  }
  EXPECT_GT(differ, 100);
}

TEST(LuvReference, InverseOfZeroLightness) {
  // The tail gives black; a block runs on the guarded L and gives values
  // near 0 that depend on U and V.
  for (int width : {3, 4}) {
    const auto out = convertRow(zeliLUVToRGB_8u_C3R, repeat<uint8_t>({0, 97, 136}, width), 3);
    for (uint8_t v : out) EXPECT_LE(v, 2);
  }
  bool dependsOnChroma = false;
  const Floats neutral = inverseBodyRgb(0.0f, 97.0f, 136.0f, kBody8uC3);
  for (int u = 0; u < 256; u += 15)
    for (int v = 0; v < 256; v += 15) {
      const Levels tail = inverseTail(0, u, v, false);
      EXPECT_EQ(tail.c[0] + tail.c[1] + tail.c[2], 0);
      const Levels body = inverseBody8u(0, u, v, false);
      for (int k = 0; k < 3; ++k) EXPECT_LE(body.c[k], 1);
      const Floats raw = inverseBodyRgb(0.0f, float(u), float(v), kBody8uC3);
      for (int k = 0; k < 3; ++k) dependsOnChroma |= raw.c[k] != neutral.c[k];
    }
  EXPECT_TRUE(dependsOnChroma);
  // 16-bit tails: black is 0 in 16u and -32768 in 16s.
  const auto s = convertRow(zeliLUVToRGB_16s_C3R, repeat<int16_t>({-32768, 100, -200}, 3), 3);
  for (int16_t v : s) EXPECT_EQ(v, -32768);
}

TEST(LuvReference, FloatInverseClampsOnlyInTheTail) {
  // An out-of-gamut triple: negative samples in a block, 0 in the tail.
  const Floats body = inverseBody32f(50.0f, -120.0f, 100.0f);
  const Floats tail = inverseTail32f(50.0f, -120.0f, 100.0f);
  bool negative = false;
  for (int k = 0; k < 3; ++k) {
    negative |= body.c[k] < 0.0f;
    EXPECT_GE(tail.c[k], 0.0f);
    EXPECT_LE(tail.c[k], 1.0f);
  }
  EXPECT_TRUE(negative);
  const auto out = convertRow(zeliLUVToRGB_32f_C3R, repeat<float>({50.0f, -120.0f, 100.0f}, 5), 3);
  for (int k = 0; k < 3; ++k) {
    EXPECT_EQ(out[k], body.c[k]);
    EXPECT_EQ(out[12 + k], tail.c[k]);
  }
}

// ---- every member over all widths ----

uint8_t luvByte(std::mt19937& rng) {
  const uint32_t r = rng();
  return (r & 7) == 0 ? uint8_t(0) : uint8_t(r >> 8);
}
template <typename T>
T luvWord(std::mt19937& rng) {
  const uint32_t r = rng();
  return (r & 7) == 0 ? T(std::is_signed_v<T> ? -32768 : 0) : T(r >> 8);
}

// L, U, V over their ranges, with zero and tiny lightness now and then.
float luvFloat(std::mt19937& rng) {
  const uint32_t r = rng();
  switch (r & 7) {
    case 0: return 0.0f;
    case 1: return 5e-5f;
    default: return float(r >> 8) / 16777216.0f * 300.0f - 140.0f;
  }
}
float unitFloat(std::mt19937& rng) {
  const uint32_t r = rng();
  return (r & 7) == 0 ? 0.0f : float(r >> 8) / 16777216.0f;
}

using M8 = Member<uint8_t, uint8_t>;
using M32 = Member<float, float>;

template <typename T, int Stride>
Member<T, T> forwardWide(const char* name, Status (*fn)(const T*, int, T*, int, ImageSize)) {
  constexpr bool truncating = Stride == 4 && std::is_same_v<T, uint16_t>;
  return Member<T, T>(name, fn)
      .stride(Stride)
      .zones(4, forward16Blocks<Stride, T>, forward16Pixel<T, Zone::Body>, forward16Pixel<T, Zone::Tail, truncating>)
      .stepsInSamples()
      .samples(luvWord<T>);
}
template <typename T, int Stride>
Member<T, T> inverseWide(const char* name, Status (*fn)(const T*, int, T*, int, ImageSize)) {
  return Member<T, T>(name, fn)
      .stride(Stride)
      .zones(4, inverse16Blocks<Stride, T>, inverse16Pixel<T, Zone::Body>, inverse16Pixel<T, Zone::Tail>)
      .stepsInSamples()
      .samples(luvWord<T>);
}
template <int Stride, bool Bgr>
M8 inverse8u(const char* name, M8::Export fn) {
  return M8(name, fn)
      .stride(Stride)
      .zones(4, inverse8uBlocks<Stride, Bgr>, inverse8uPixel<Bgr, Stride == 4, Zone::Body>,
             inverse8uPixel<Bgr, Stride == 4, Zone::Tail>)
      .samples(luvByte);
}
template <int Stride, bool Bgr>
M32 forwardFloat(const char* name, M32::Export fn) {
  return M32(name, fn)
      .stride(Stride)
      .zones(4, forward32fBlocks<Stride, Bgr>, forward32fPixel<Bgr, Zone::Body>, forward32fPixel<Bgr, Zone::Tail>)
      .samples(unitFloat);
}

TEST(LuvMembers, FollowTheirFormulasInEveryZone) {
  zel::test::expectMembers<uint8_t, uint8_t>({
      M8("RGBToLUV_8u_C3", zeliRGBToLUV_8u_C3R)
          .zones(4, forwardTableBlocks<false>, forwardTablePixel<false, Zone::Body>, forwardTablePixel<false, Zone::Tail>)
          .samples(luvByte),
      M8("BGRToLUV_8u_C3", zeliBGRToLUV_8u_C3R)
          .zones(4, forwardTableBlocks<true>, forwardTablePixel<true, Zone::Body>, forwardTablePixel<true, Zone::Tail>)
          .samples(luvByte),
      M8("RGBToLUV_8u_AC4", zeliRGBToLUV_8u_AC4R).stride(4).oneFormula(forwardPowerPixel).samples(luvByte),
      inverse8u<3, false>("LUVToRGB_8u_C3", zeliLUVToRGB_8u_C3R),
      inverse8u<3, true>("LUVToBGR_8u_C3", zeliLUVToBGR_8u_C3R),
      inverse8u<4, false>("LUVToRGB_8u_AC4", zeliLUVToRGB_8u_AC4R),
  });
  zel::test::expectMembers<uint16_t, uint16_t>({
      forwardWide<uint16_t, 3>("RGBToLUV_16u_C3", zeliRGBToLUV_16u_C3R),
      forwardWide<uint16_t, 4>("RGBToLUV_16u_AC4", zeliRGBToLUV_16u_AC4R),
      inverseWide<uint16_t, 3>("LUVToRGB_16u_C3", zeliLUVToRGB_16u_C3R),
      inverseWide<uint16_t, 4>("LUVToRGB_16u_AC4", zeliLUVToRGB_16u_AC4R),
  });
  zel::test::expectMembers<int16_t, int16_t>({
      forwardWide<int16_t, 3>("RGBToLUV_16s_C3", zeliRGBToLUV_16s_C3R),
      forwardWide<int16_t, 4>("RGBToLUV_16s_AC4", zeliRGBToLUV_16s_AC4R),
      inverseWide<int16_t, 3>("LUVToRGB_16s_C3", zeliLUVToRGB_16s_C3R),
      inverseWide<int16_t, 4>("LUVToRGB_16s_AC4", zeliLUVToRGB_16s_AC4R),
  });
  zel::test::expectMembers<float, float>({
      // Three-float members: 16-lane bodies, streamed beyond the cache.
      forwardFloat<3, false>("RGBToLUV_32f_C3", zeliRGBToLUV_32f_C3R).lanes16().streamed(),
      forwardFloat<4, false>("RGBToLUV_32f_AC4", zeliRGBToLUV_32f_AC4R),
      forwardFloat<3, true>("BGRToLUV_32f_C3", zeliBGRToLUV_32f_C3R).lanes16().streamed(),
      M32("LUVToRGB_32f_C3", zeliLUVToRGB_32f_C3R)
          .zones(4, inverse32fBlocks<false>, inverse32fPixel<false, Zone::Body>, inverse32fPixel<false, Zone::Tail>)
          .samples(luvFloat)
          .lanes16()
          .streamed(),
      M32("LUVToBGR_32f_C3", zeliLUVToBGR_32f_C3R)
          .zones(4, inverse32fBlocks<true>, inverse32fPixel<true, Zone::Body>, inverse32fPixel<true, Zone::Tail>)
          .samples(luvFloat)
          .lanes16()
          .streamed(),
      M32("LUVToRGB_32f_AC4", zeliLUVToRGB_32f_AC4R)
          .stride(4)
          .oneFormula(inverse32fPixel<false, Zone::Tail>)
          .stepsInSamples()
          .samples(luvFloat),
  });
}

TEST(LuvMembers, StepUnitsDifferAmongTheFloatMembers) {
  // LUVToRGB_32f_AC4R drops the odd bytes of a step; LUVToRGB_32f_C3R keeps
  // them.
  std::vector<uint8_t> src(64, 0), dst(64, 0);
  const float pixel[4] = {60.0f, 10.0f, 20.0f, 0.0f};
  std::memcpy(src.data() + 16, pixel, 16);  // second row at 16 bytes for a step of 17 in samples
  ASSERT_EQ(zeliLUVToRGB_32f_AC4R(reinterpret_cast<const float*>(src.data()), 17, reinterpret_cast<float*>(dst.data()),
                                  17, ImageSize{1, 2}),
            StatusOk);
  float got[3], want[4];
  inverse32fPixel<false, Zone::Tail>(pixel, want);
  std::memcpy(got, dst.data() + 16, 12);
  for (int k = 0; k < 3; ++k) EXPECT_EQ(got[k], want[k]);
  std::vector<uint8_t> src3(64, 0), dst3(64, 0);
  std::memcpy(src3.data() + 13, pixel, 12);
  ASSERT_EQ(zeliLUVToRGB_32f_C3R(reinterpret_cast<const float*>(src3.data()), 13,
                                 reinterpret_cast<float*>(dst3.data()), 13, ImageSize{1, 2}),
            StatusOk);
  std::memcpy(got, dst3.data() + 13, 12);
  for (int k = 0; k < 3; ++k) EXPECT_EQ(got[k], want[k]);
}

}  // namespace
