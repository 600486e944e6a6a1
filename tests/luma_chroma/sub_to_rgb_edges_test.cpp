// Particular cases of the subsampled-to-RGB members: pixels whose zone,
// kernel or row shape shows in the result.
#include <gtest/gtest.h>

#include <cstring>
#include <vector>

#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using zel::test::TestImage;

struct Rgb {
  int r, g, b;
  bool operator==(const Rgb& o) const { return r == o.r && g == o.g && b == o.b; }
};

std::ostream& operator<<(std::ostream& os, const Rgb& p) { return os << p.r << "," << p.g << "," << p.b; }

Rgb bgrAt(const TestImage<uint8_t>& img, int x, int y) {
  return {img.get(3 * x + 2, y), img.get(3 * x + 1, y), img.get(3 * x, y)};
}
Rgb rgbAt(const TestImage<uint8_t>& img, int x, int y) {
  return {img.get(3 * x, y), img.get(3 * x + 1, y), img.get(3 * x + 2, y)};
}

TEST(SubsampledEdges, PairStreamTailStartsAtTheLastWholeGroupOfEight) {
  // Y 235 on neutral chroma: the lane form gives 255, the raw wide form 254.
  for (int width : {16, 15}) {
    TestImage<uint8_t> src(2 * 16, 1), dst(3 * width, 1);
    for (int k = 0; k < 8; ++k) {
      const uint8_t pair[4] = {235, 128, 235, 128};
      std::memcpy(src.row(0) + 4 * k, pair, 4);
    }
    ASSERT_EQ(zeliYCbCr422ToBGR_8u_C2C3R(src.data(), src.step(), dst.data(), dst.step(), ImageSize{width, 1}),
              StatusOk);
    for (int x = 0; x < width; ++x) {
      const int want = width == 15 && x >= 8 ? 254 : 255;
      EXPECT_EQ(bgrAt(dst, x, 0), (Rgb{want, want, want})) << "width " << width << " pixel " << x;
    }
  }
}

// A neutral 4:2:0 or 4:2:2 image of luma 235 through buffers and steps at
// multiples of 16, or with the destination one byte off.
template <class Call>
std::vector<Rgb> neutralRow(int width, int rows, int chromaRows, bool aligned, Call call) {
  const int chroma = (width + 1) / 2;
  TestImage<uint8_t> y(width, rows, 0, (16 - width % 16) % 16);
  TestImage<uint8_t> cb(chroma, chromaRows, 0, (16 - chroma % 16) % 16),
      cr(chroma, chromaRows, 0, (16 - chroma % 16) % 16);
  TestImage<uint8_t> dst(3 * width, rows, aligned ? 0 : 1, (16 - 3 * width % 16) % 16);
  y.fill(235);
  cb.fill(128);
  cr.fill(128);
  const uint8_t* planes[3] = {y.data(), cb.data(), cr.data()};
  const int steps[3] = {y.step(), cb.step(), cr.step()};
  call(planes, steps, dst.data(), dst.step(), ImageSize{width, rows});
  std::vector<Rgb> out;
  for (int x = 0; x < width; ++x) out.push_back(rgbAt(dst, x, rows - 1));
  return out;
}

TEST(SubsampledEdges, AlignmentChoosesTheKernelOfTheBodyAndNotOfTheTail) {
  // 4:2:0 to BGR: width 10 has a body of 8 pixels and one tail pair. The
  // centred pair lanes give 254 for luma 235, the lane form 255, the
  // rounded wide tail 255 under either kernel.
  auto bgr420 = [](const uint8_t* const p[3], const int s[3], uint8_t* d, int ds, ImageSize size) {
    ASSERT_EQ(zeliYCbCr420ToBGR_8u_P3C3R(p, s, d, ds, size), StatusOk);
  };
  const auto aligned = neutralRow(10, 2, 1, true, bgr420), shifted = neutralRow(10, 2, 1, false, bgr420);
  for (int x = 0; x < 10; ++x) {
    EXPECT_EQ(aligned[x], (Rgb{x < 8 ? 254 : 255, x < 8 ? 254 : 255, x < 8 ? 254 : 255})) << x;
    EXPECT_EQ(shifted[x], (Rgb{255, 255, 255})) << x;
  }
  // 4:2:2 to RGB: width 12, body 8; the truncated wide tail gives 254.
  auto rgb422 = [](const uint8_t* const p[3], const int s[3], uint8_t* d, int ds, ImageSize size) {
    ASSERT_EQ(zeliYCbCr422ToRGB_8u_P3C3R(p, s, d, ds, size), StatusOk);
  };
  const auto aligned2 = neutralRow(12, 1, 1, true, rgb422), shifted2 = neutralRow(12, 1, 1, false, rgb422);
  for (int x = 0; x < 12; ++x) {
    EXPECT_EQ(aligned2[x], (Rgb{254, 254, 254})) << x;
    EXPECT_EQ(shifted2[x], (Rgb{x < 8 ? 255 : 254, x < 8 ? 255 : 254, x < 8 ? 255 : 254})) << x;
  }
}

TEST(SubsampledEdges, LargeEvenImagesWithoutStepsAreOneRow) {
  // On (74, 18, 242) the lane shape gives G 50 and the truncated wide form
  // 51. At 18 by 16 the stepped name has a tail pair in every row; the
  // name without steps takes the 288 pixels as one row, all body.
  const int w = 18, h = 16;
  std::vector<uint8_t> y(w * h, 74), u(w * h / 2, 18), v(w * h / 2, 242);
  const uint8_t* planes[3] = {y.data(), u.data(), v.data()};
  const int steps[3] = {w, w / 2, w / 2};
  std::vector<uint8_t> whole(3 * w * h), rows(3 * w * h);
  ASSERT_EQ(zeliYUV422ToRGB_8u_P3C3(planes, whole.data(), ImageSize{w, h}), StatusOk);
  ASSERT_EQ(zeliYUV422ToRGB_8u_P3C3R(planes, steps, rows.data(), 3 * w, ImageSize{w, h}), StatusOk);
  for (int p = 0; p < w * h; ++p) {
    EXPECT_EQ(whole[3 * p + 1], 50) << p;
    EXPECT_EQ(rows[3 * p + 1], p % w >= 16 ? 51 : 50) << p;
  }
  // 16 by 16 is one row too, and 256 pixels are all body either way.
  std::fill(whole.begin(), whole.end(), 0);
  ASSERT_EQ(zeliYUV422ToRGB_8u_P3C3(planes, whole.data(), ImageSize{16, 16}), StatusOk);
  for (int p = 0; p < 256; ++p) EXPECT_EQ(whole[3 * p + 1], 50) << p;
}

}  // namespace
