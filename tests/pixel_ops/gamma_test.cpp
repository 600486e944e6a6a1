// Gamma: the constant 8u tables against the transfer functions, the 16u
// rounding by hand and its table path, the 32f branches and range check.
#include <gtest/gtest.h>

#include <cmath>
#include <random>
#include <vector>

#include "core/zelcore.h"
#include "pixel_ops/gamma_formulas.h"
#include "zelcc/zelcc.h"

namespace {

using namespace zel::gamma;

double F(double x) { return x < 0.018 ? 4.5 * x : 1.099 * std::pow(x, 0.45) - 0.099; }
double G(double x) { return x < 0.0812 ? x * 0.2222222222222222 : std::pow((x + 0.099) * 0.9099181073703366, 2.2222222222222223); }

TEST(GammaTables, EightBitTablesAreTheRoundedFunctions) {
  for (int i = 0; i < 256; ++i) {
    EXPECT_EQ(kForward8[i], int(std::nearbyint(255 * F(i / 255.0)))) << i;
    EXPECT_EQ(kInverse8[i], int(std::nearbyint(255 * G(i / 255.0)))) << i;
  }
  // Entry 1 is 4.5 and entry 3 13.5, both to even.
  const uint8_t head[] = {0, 4, 9, 14, 18, 23, 27, 30, 34, 37};
  const uint8_t tail[] = {252, 252, 253, 253, 254, 254, 255, 255};
  const uint8_t invHead[] = {0, 0, 0, 1, 1, 1, 1, 2};
  const uint8_t invTail[] = {241, 243, 245, 247, 249, 251, 253, 255};
  for (int i = 0; i < 10; ++i) EXPECT_EQ(kForward8[i], head[i]);
  for (int i = 0; i < 8; ++i) {
    EXPECT_EQ(kForward8[248 + i], tail[i]);
    EXPECT_EQ(kInverse8[i], invHead[i]);
    EXPECT_EQ(kInverse8[248 + i], invTail[i]);
  }
}

TEST(GammaEightBit, MembersReadTheTables) {
  std::vector<uint8_t> px(256 * 4);
  for (int i = 0; i < 256 * 4; ++i) px[i] = uint8_t(i / 4);
  std::vector<uint8_t> out(px.size(), 7);
  ASSERT_EQ(zeliGammaFwd_8u_AC4R(px.data(), 1024, out.data(), 1024, ImageSize{256, 1}), StatusOk);
  for (int i = 0; i < 256; ++i) {
    EXPECT_EQ(out[4 * i], kForward8[i]);
    EXPECT_EQ(out[4 * i + 2], kForward8[i]);
    EXPECT_EQ(out[4 * i + 3], 7);
  }
  ASSERT_EQ(zeliGammaInv_8u_C3IR(px.data(), 1024, ImageSize{256, 1}), StatusOk);
  for (int i = 0; i < 1024; ++i) EXPECT_EQ(px[i], i < 768 ? kInverse8[(i / 4)] : i / 4) << i;
}

TEST(GammaEightBit, EveryWidthAndOffsetReadsTheTableAndStopsAtTheRowEnd) {
  // Runs of eight samples, then single ones; rows that start off word
  // boundaries; the padding after each row untouched.
  std::mt19937 rng(5);
  for (int width = 1; width <= 23; ++width)
    for (int offset : {0, 1, 3}) {
      const int rowBytes = width * 3, step = rowBytes + 5, height = 3;
      std::vector<uint8_t> src(offset + step * height), dst(src.size(), 0xA5);
      for (auto& v : src) v = uint8_t(rng());
      ASSERT_EQ(zeliGammaInv_8u_C3R(src.data() + offset, step, dst.data() + offset, step, ImageSize{width, height}),
                StatusOk);
      for (int i = 0; i < int(src.size()); ++i) {
        const int at = i - offset, x = at % step;
        const bool inRow = at >= 0 && x < rowBytes;
        ASSERT_EQ(dst[i], inRow ? kInverse8[src[i]] : 0xA5) << width << " " << offset << " " << i;
      }
    }
}

TEST(GammaSixteenBit, RoundingIsOnTheFloatOfHalfPlusY) {
  EXPECT_EQ(roundHalfEven16(2.5), 2);
  EXPECT_EQ(roundHalfEven16(3.5), 4);
  EXPECT_EQ(roundHalfEven16(2.4), 2);
  EXPECT_EQ(roundHalfEven16(2.6), 3);
  // 0.5 + y rounds to a whole float first: just below a tie an even
  // neighbour wins, an odd one is taken down.
  EXPECT_EQ(roundHalfEven16(1001.4999999), 1002);
  EXPECT_EQ(roundHalfEven16(1000.4999999), 1000);
  // Ends of the range, both directions.
  EXPECT_EQ(forward16(0), 0);
  EXPECT_EQ(inverse16(0), 0);
  EXPECT_EQ(forward16(65535), 65535);
  EXPECT_EQ(inverse16(65535), 65535);
  // The linear parts: 4.5 s and s / 4.5.
  EXPECT_EQ(forward16(100), 450);
  EXPECT_EQ(inverse16(450), 100);
}

// An image of `width` C3 pixels holding the values 0, 1, 2 ... (mod 65536).
std::vector<uint16_t> ramp(int width) {
  std::vector<uint16_t> v(size_t(width) * 3);
  for (size_t i = 0; i < v.size(); ++i) v[i] = uint16_t(i);
  return v;
}

TEST(GammaSixteenBit, TablePathAboveTheDirectSizeGivesTheSameSamples) {
  EXPECT_FALSE(tabulates16(21845, 1));  // 65535 samples
  EXPECT_TRUE(tabulates16(21846, 1));   // 65538 samples
  EXPECT_FALSE(tabulates16(1, 21845));
  for (int width : {21845, 21846}) {
    const auto src = ramp(width);
    std::vector<uint16_t> fwd(src.size()), inv(src.size());
    const int step = width * 6;
    ASSERT_EQ(zeliGammaFwd_16u_C3R(src.data(), step, fwd.data(), step, ImageSize{width, 1}), StatusOk);
    ASSERT_EQ(zeliGammaInv_16u_C3R(src.data(), step, inv.data(), step, ImageSize{width, 1}), StatusOk);
    for (size_t i = 0; i < src.size(); ++i) {
      ASSERT_EQ(fwd[i], forward16(src[i])) << width << " " << i;
      ASSERT_EQ(inv[i], inverse16(src[i])) << width << " " << i;
    }
  }
}

TEST(GammaSixteenBit, OnlyTheTablePathCanRunOutOfMemory) {
  auto src = ramp(21846);
  const auto keep = src;
  uint16_t* planes[3] = {src.data(), src.data() + 21846, src.data() + 2 * 21846};
  zelTestFailMallocAfter(0);
  const Status inPlace = zeliGammaFwd_16u_C3IR(src.data(), 21846 * 6, ImageSize{21846, 1});
  const Status planar = zeliGammaInv_16u_IP3R(planes, 21846 * 2, ImageSize{21846, 1});
  const Status small = zeliGammaFwd_16u_C3IR(src.data(), 21845 * 6, ImageSize{21845, 1});
  zelTestFailMallocAfter(-1);
  EXPECT_EQ(inPlace, StatusOutOfMemoryError);
  EXPECT_EQ(planar, StatusOutOfMemoryError);
  EXPECT_EQ(small, StatusOk);
  for (size_t i = 0; i < 21845 * 3; ++i) ASSERT_EQ(src[i], forward16(keep[i])) << i;
  for (size_t i = 21845 * 3; i < src.size(); ++i) ASSERT_EQ(src[i], keep[i]) << "written on failure at " << i;
}

TEST(GammaFloat, BranchesAndUnclampedSamples) {
  const Range r(0.0f, 255.0f);
  EXPECT_NEAR(forward32f(255.0f, r), 255.0f, 1e-3);
  EXPECT_NEAR(inverse32f(255.0f, r), 255.0f, 1e-3);
  // 4.59 is x = 0.018 (a hair above in float): the power branch, whose
  // value 20.718 is above the linear 20.655.
  EXPECT_NEAR(forward32f(4.59f, r), 255 * (1.099 * std::pow(0.018, 0.45) - 0.099), 1e-3);
  EXPECT_GT(forward32f(4.59f, r), 4.59f * 4.5f + 0.05f);
  // Inverse just below 0.0812 is still linear though 0.081 is F(0.018).
  EXPECT_FLOAT_EQ(inverse32f(0.0811f * 255, r), float(double(0.0811f * 255) * 0.2222222222222222));
  EXPECT_NEAR(inverse32f(0.0813f * 255, r), 255 * G(0.0813), 2e-3);
  EXPECT_LT(inverse32f(0.0813f * 255, r), 0.0813f * 255 * 0.2222f - 0.01f);
  // Below vMin the linear branch, above vMax the curve, neither clamped.
  const Range unit(0.0f, 1.0f);
  EXPECT_FLOAT_EQ(forward32f(-10.0f, unit), -45.0f);
  EXPECT_NEAR(forward32f(2.0f, unit), 1.099 * std::pow(2.0, 0.45) - 0.099, 1e-6);
  // An offset range: G(F(x)) comes back close to x.
  const Range shifted(-3.0f, 5.0f);
  for (float s : {-2.5f, 0.0f, 1.0f, 4.75f}) EXPECT_NEAR(inverse32f(forward32f(s, shifted), shifted), s, 1e-5);
}

TEST(GammaFloat, MembersFollowTheFormulaInEveryLayout) {
  std::mt19937 rng(12);
  std::uniform_real_distribution<float> dist(-0.5f, 2.5f);
  const int width = 9, height = 3;
  const float vMin = -0.25f, vMax = 2.0f;
  const Range r(vMin, vMax);
  std::vector<float> src(width * 4 * height), dst(src.size(), 0.5f);
  for (auto& v : src) v = dist(rng);
  ASSERT_EQ(zeliGammaFwd_32f_AC4R(src.data(), width * 16, dst.data(), width * 16, ImageSize{width, height}, vMin,
                                  vMax),
            StatusOk);
  for (size_t i = 0; i < src.size(); ++i) EXPECT_EQ(dst[i], i % 4 == 3 ? 0.5f : forward32f(src[i], r)) << i;
  const float* in[3] = {src.data(), src.data() + 36, src.data() + 72};
  float* out[3] = {dst.data(), dst.data() + 36, dst.data() + 72};
  ASSERT_EQ(zeliGammaInv_32f_P3R(in, 48, out, 48, ImageSize{width, height}, vMin, vMax), StatusOk);
  for (int k = 0; k < 3; ++k)
    for (int y = 0; y < height; ++y)
      for (int x = 0; x < width; ++x)
        EXPECT_EQ(out[k][y * 12 + x], inverse32f(in[k][y * 12 + x], r)) << k << " " << x << " " << y;
}

TEST(GammaFloat, EmptyRangeComesBeforeEverything) {
  EXPECT_EQ(zeliGammaFwd_32f_C3R(nullptr, 0, nullptr, 0, ImageSize{0, 0}, 1.0f, 1.0f), StatusEmptyRangeError);
  EXPECT_EQ(zeliGammaInv_32f_IP3R(nullptr, 0, ImageSize{0, 0}, 2.0f, 1.0f), StatusEmptyRangeError);
  EXPECT_EQ(zeliGammaFwd_32f_C3R(nullptr, 0, nullptr, 0, ImageSize{0, 0}, NAN, 1.0f), StatusEmptyRangeError);
  // The difference is taken in 32 bits: an infinite one is not empty.
  EXPECT_EQ(zeliGammaFwd_32f_C3IR(nullptr, 0, ImageSize{0, 0}, -3e38f, 3e38f), StatusNullPointerError);
}

}  // namespace
