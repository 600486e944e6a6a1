// Tone mapping: the reductions and the scaling pass against their scalar
// meanings, the outcomes of black, negative and NaN images, and the
// rounding of the mean's float sums.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <random>
#include <vector>

#include "core/zelcore.h"
#include "frame/fill_bytes.h"
#include "frame/image_layout.h"
#include "support/test_image.h"
#include "tone_map/tone_map.h"
#include "zelcc/zelcc.h"

namespace {

using namespace zel::tone;
using zel::test::TestImage;

// The sum as its lanes take it: below width 17 in 64 bits; above, per row
// a head up to a 32-byte boundary into lane 0 (rows not on a 64-byte
// boundary), pairs k, k + 8 of each 16 into lane k of eight, a remainder
// of 8 into those, of 4 into four more lanes, singles into lane 0.
double laneSum(const float* src, int step, int width, int height) {
  if (width <= 16) {
    double sum = 0;
    for (int y = 0; y < height; ++y)
      for (int x = 0; x < width; ++x) sum += double(zel::rowAt(src, step, y)[x]);
    return sum;
  }
  float eight[8] = {}, four[4] = {};
  for (int y = 0; y < height; ++y) {
    const float* s = zel::rowAt(src, step, y);
    const uintptr_t at = reinterpret_cast<uintptr_t>(s);
    int x = 0;
    if (at % 64) {
      const int head = int((32 - at % 32) % 32 + 3) / 4;
      for (; x < head && x < width; ++x) four[0] += s[x];
    }
    for (; x + 16 <= width; x += 16)
      for (int k = 0; k < 8; ++k) eight[k] += s[x + k] + s[x + k + 8];
    if (x + 8 <= width) {
      for (int k = 0; k < 8; ++k) eight[k] += s[x + k];
      x += 8;
    }
    if (x + 4 <= width) {
      for (int k = 0; k < 4; ++k) four[k] += s[x + k];
      x += 4;
    }
    for (; x < width; ++x) four[0] += s[x];
  }
  for (int k = 0; k < 4; ++k) four[k] += eight[k] + eight[k + 4];
  return double((four[0] + four[2]) + (four[1] + four[3]));
}

TEST(ToneMapReductions, MaximumAndSumMatchTheirScalarMeaning) {
  std::mt19937 rng(21);
  for (int width = 1; width <= 70; ++width)
    for (int offset : {0, 4, 8, 12, 36, 2}) {
      const int height = 1 + width % 3;
      TestImage<float> src(width, height, offset, 4 * (width % 5));
      src.fillRandom(rng(), -100, 1000);
      float want = -3.4028235e38f;
      for (int y = 0; y < height; ++y)
        for (int x = 0; x < width; ++x) want = std::max(want, src.get(x, y));
      ASSERT_EQ(imageMax(src.data(), src.step(), width, height), want) << width << " " << offset;
      ASSERT_EQ(imageSum(src.data(), src.step(), width, height), laneSum(src.data(), src.step(), width, height))
          << width << " " << offset;
    }
}

TEST(ToneMapReductions, WideRowsSumInFloats) {
  // 2^24 followed by ones: the 64-bit sum keeps every one, float lanes
  // lose those that meet the big sample in a lane.
  // The row starts on a 64-byte boundary, so no sample goes in singly.
  alignas(64) float row[20];
  std::fill(row, row + 20, 1.0f);
  row[0] = 16777216.0f;
  EXPECT_EQ(imageSum(row, 80, 16, 1), 16777216.0 + 15);
  const double wide = imageSum(row, 80, 20, 1);
  EXPECT_EQ(wide, laneSum(row, 80, 20, 1));
  EXPECT_NE(wide, 16777216.0 + 19);
}

template <Scaling S>
void checkScaling(float scale) {
  std::mt19937 rng(S == Scaling::Linear ? 5 : 6);
  for (int width = 1; width <= 70; ++width)
    for (int offset : {0, 1, 7, 15}) {
      TestImage<float> src(width, 1, 4 * (offset % 3));
      TestImage<uint8_t> dst(width, 1, offset);
      src.fillRandom(rng(), -3, 300.0 / scale);
      scaleRow<S>(src.data(), dst.data(), width, scale);
      for (int x = 0; x < width; ++x) {
        const uint8_t want = S == Scaling::Linear ? linearSample(scale, src.get(x, 0)) : meanSample(scale, src.get(x, 0));
        ASSERT_EQ(dst.get(x, 0), want) << width << " " << offset << " " << x;
      }
      ASSERT_TRUE(dst.guardsIntact());
      // Overlapping rows (bytes written over the floats already read).
      if (width >= 7) {
        std::vector<float> both(width);
        for (int x = 0; x < width; ++x) both[x] = src.get(x, 0);
        scaleRow<S>(both.data(), reinterpret_cast<uint8_t*>(both.data()), width, scale);
        for (int x = 0; x < width; ++x) ASSERT_EQ(reinterpret_cast<uint8_t*>(both.data())[x], dst.get(x, 0)) << x;
      }
    }
}

TEST(ToneMapScaling, BlocksMatchTheSampleFormulas) {
  checkScaling<Scaling::Linear>(0.73f);
  checkScaling<Scaling::Mean>(0.73f);
  checkScaling<Scaling::Mean>(127.5f);
}

using ToneFn = Status (*)(const float*, int, uint8_t*, int, ImageSize);

std::vector<uint8_t> run(ToneFn fn, const std::vector<float>& src, int width, Status want, uint8_t fill = 0x77) {
  const int height = int(src.size()) / width;
  std::vector<uint8_t> dst(src.size(), fill);
  EXPECT_EQ(fn(src.data(), width * 4, dst.data(), width, ImageSize{width, height}), want);
  return dst;
}

TEST(ToneMapOutcomes, BlackNegativeTinyAndNaNImages) {
  for (ToneFn fn : {zeliToneMapLinear_32f8u_C1R, zeliToneMapMean_32f8u_C1R}) {
    for (uint8_t v : run(fn, std::vector<float>(40, 0.0f), 20, StatusOk)) EXPECT_EQ(v, 0);
    for (uint8_t v : run(fn, std::vector<float>(40, -1.0f), 20, StatusNothingDoneWarning)) EXPECT_EQ(v, 0x77);
    EXPECT_EQ(run(fn, {1e-39f}, 1, StatusOk)[0], 0);
    for (uint8_t v : run(fn, std::vector<float>(21, NAN), 7, StatusOk)) EXPECT_EQ(v, 0);
  }
}

TEST(ToneMapOutcomes, NegativeSamplesWrapInLinearAndSaturateInMean) {
  // Maximum 255: scale 1, so -1.5 truncates to -1 (255) and -2.5 to -2.
  const std::vector<float> src = {255.0f, -1.5f, -2.5f, 100.9f, 0.5f, -300.0f, 3.0f, 254.99f, -0.5f};
  const auto linear = run(zeliToneMapLinear_32f8u_C1R, src, 9, StatusOk);
  const uint8_t want[] = {255, 255, 254, 100, 0, uint8_t(-300), 3, 254, 0};
  for (int i = 0; i < 9; ++i) EXPECT_EQ(linear[i], want[i]) << i;
  const auto mean = run(zeliToneMapMean_32f8u_C1R, src, 9, StatusOk);
  for (int i : {1, 2, 5}) EXPECT_EQ(mean[i], 0) << i;
  EXPECT_EQ(mean[0], 255);  // far above twice the mean
}

TEST(ToneMapOutcomes, TheMaximumGives255Or254) {
  int seen[2] = {0, 0};
  std::mt19937 rng(8);
  for (int i = 0; i < 200; ++i) {
    const float m = std::uniform_real_distribution<float>(0.01f, 1000.0f)(rng);
    const bool full = linearScale(m) * m >= 255.0f;
    ++seen[full];
    EXPECT_EQ(run(zeliToneMapLinear_32f8u_C1R, {m, m / 2, m}, 3, StatusOk)[2], full ? 255 : 254) << m;
  }
  EXPECT_GT(seen[0], 0);
  EXPECT_GT(seen[1], 0);
}

TEST(ToneMapOutcomes, ConstantOneMapsTo127InBothSumPaths) {
  for (int width : {16, 17, 40})
    for (uint8_t v : run(zeliToneMapMean_32f8u_C1R, std::vector<float>(width * 3, 1.0f), width, StatusOk))
      EXPECT_EQ(v, 127) << width;
}

TEST(ToneMapOutcomes, MeanScaleFollowsTheFloatSum) {
  // Rows of 2^24 and ones lose bits in float lanes. Probes p and -p at k
  // and k + 8 of a block add exactly 0 to both sums, so they can be set
  // between the scale's boundaries after the sums are known.
  const int width = 32, height = 24;
  TestImage<float> img(width, height, 0);  // every row on a 64-byte boundary
  for (int y = 0; y < height; ++y)
    for (int x = 0; x < width; ++x) {
      const float probe = x < 24 ? 3.0f : -3.0f;
      img.set(x, y, x == 0 ? 16777216.0f : (x >= 16 && y > 0 ? probe : 1.0f));
    }
  double exact = 0;
  for (int y = 0; y < height; ++y)
    for (int x = 0; x < width; ++x) exact += img.get(x, y);
  const double count = double(width * height);
  const float lane = meanScale(2.0 * (laneSum(img.data(), img.step(), width, height) / count));
  const float full = meanScale(2.0 * (exact / count));
  ASSERT_NE(lane, full);
  for (int y = 1; y < height; ++y)
    for (int k = 0; k < 8; ++k) {
      const double level = y * 10 + k;
      const float p = float((level / lane + level / full) / 2);
      img.set(16 + k, y, p);
      img.set(24 + k, y, -p);
    }
  std::vector<uint8_t> out(width * height, 0x77);
  ASSERT_EQ(zeliToneMapMean_32f8u_C1R(img.data(), img.step(), out.data(), width, ImageSize{width, height}), StatusOk);
  int differ = 0;
  for (int y = 0; y < height; ++y)
    for (int x = 0; x < width; ++x) {
      ASSERT_EQ(out[y * width + x], meanSample(lane, img.get(x, y))) << x << " " << y;
      differ += meanSample(lane, img.get(x, y)) != meanSample(full, img.get(x, y));
    }
  EXPECT_GT(differ, 20) << "the probes do not tell the sums apart";
}

TEST(ToneMapOutcomes, LargeBlackImageFillsWithoutTheCaches) {
  const int width = 1100, height = 1000;
  std::vector<float> src(size_t(width) * height, 0.0f);
  std::vector<uint8_t> dst(src.size() + 16, 0x77);
  zelTestOverrideCacheSize(0, 1 << 20);
  EXPECT_TRUE(zel::fillBytesNonTemporal(int64_t(width) * height));
  const Status s = zeliToneMapLinear_32f8u_C1R(src.data(), width * 4, dst.data(), width, ImageSize{width, height});
  zelTestOverrideCacheSize(-1, 0);
  EXPECT_EQ(s, StatusOk);
  EXPECT_TRUE(std::all_of(dst.begin(), dst.end() - 16, [](uint8_t v) { return v == 0; }));
  EXPECT_TRUE(std::all_of(dst.end() - 16, dst.end(), [](uint8_t v) { return v == 0x77; }));
}

}  // namespace
