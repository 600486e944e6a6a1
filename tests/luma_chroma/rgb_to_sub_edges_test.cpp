// Particular cases of the subsampling encoders: where the zones fall, what
// odd sizes write, the clamps of the narrow set, the filtered stream and
// its gamma table, known colours.
#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "luma_chroma/rgb_to_sub_filter.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using zel::test::TestImage;

// Three planes of a subsampled destination.
struct Planes {
  TestImage<uint8_t> y, c1, c2;
  uint8_t* ptrs[3];
  int steps[3];
  Planes(int w, int h, int cw, int ch) : y(w, h, 1, 5), c1(cw, ch, 2, 3), c2(cw, ch, 5, 9) {
    ptrs[0] = y.data();
    ptrs[1] = c1.data();
    ptrs[2] = c2.data();
    steps[0] = y.step();
    steps[1] = c1.step();
    steps[2] = c2.step();
  }
};

void fillPixels(TestImage<uint8_t>& im, int stride, int r, int g, int b, bool bgr) {
  for (int y = 0; y < im.rows(); ++y)
    for (int x = 0; x + stride <= im.rowSamples(); x += stride) {
      im.set(x, y, uint8_t(bgr ? b : r));
      im.set(x + 1, y, uint8_t(g));
      im.set(x + 2, y, uint8_t(bgr ? r : b));
    }
}

// Grey 39: lumaLanes of set601 gives (1283 + 2515 + 489 + 2112) >> 7 = 49,
// lumaWide (56296 * 39 + 1081344) >> 16 = 50.
TEST(SubsampledEdges, TheBlockOfFourIsUsedOnlyWhenWidthAnd7IsFourOrMore) {
  for (int width : {24, 20}) {
    TestImage<uint8_t> src(3 * width, 2);
    fillPixels(src, 3, 39, 39, 39, true);
    Planes dst(width, 2, width / 2, 1);
    ASSERT_EQ(zeliBGRToYCbCr420_8u_C3P3R(src.data(), src.step(), dst.ptrs, dst.steps, {width, 2}), StatusOk);
    for (int x = 0; x < width; ++x) {
      const int want = (width == 24 && x >= 16) ? 50 : 49;
      EXPECT_EQ(dst.y.get(x, 0), want) << "width " << width << " pixel " << x;
      EXPECT_EQ(dst.y.get(x, 1), want);
    }
  }
}

// Every combination of 0 and 255 in the three channels, then random pixels.
void extremes(TestImage<uint8_t>& src, int stride) {
  src.fillRandom(3);
  for (int y = 0; y < src.rows(); ++y)
    for (int x = 0; x < 16 && (x + 1) * stride <= src.rowSamples(); ++x)
      for (int c = 0; c < 3; ++c) src.set(x * stride + c, y, uint8_t(((x >> (c + (y & 1))) & 1) ? 255 : 0));
}

TEST(SubsampledEdges, TheNarrowSetNeverWritesZeroOr255) {
  for (int width : {15, 16, 40, 70}) {
    TestImage<uint8_t> src4(4 * width, 4);
    extremes(src4, 4);
    TestImage<uint8_t> src3(3 * width, 4);
    extremes(src3, 3);
    Planes planes(width, 4, width / 2, 2);
    ASSERT_EQ(zeliBGRToYCbCr420_709HDTV_8u_AC4P3R(src4.data(), src4.step(), planes.ptrs, planes.steps, {width, 4}),
              (width & 1) ? StatusOddSizeWarning : StatusOk);
    TestImage<uint8_t> pairs3(2 * width, 4), pairs4(2 * width, 4);
    ASSERT_EQ(zeliBGRToCbYCr422_709HDTV_8u_C3C2R(src3.data(), src3.step(), pairs3.data(), pairs3.step(), {width, 4}),
              StatusOk);
    ASSERT_EQ(zeliBGRToCbYCr422_709HDTV_8u_AC4C2R(src4.data(), src4.step(), pairs4.data(), pairs4.step(), {width, 4}),
              StatusOk);
    bool sawLow = false, sawHigh = false;
    for (const TestImage<uint8_t>* im : {&planes.y, &planes.c1, &planes.c2, &pairs3, &pairs4})
      for (int y = 0; y < im->rows(); ++y)
        for (int x = 0; x < im->rowSamples(); ++x) {
          const int v = im->get(x, y);
          ASSERT_TRUE(v >= 1 && v <= 254) << "width " << width << " value " << v;
          sawLow |= v == 1;
          sawHigh |= v == 254;
        }
    EXPECT_TRUE(sawLow && sawHigh) << "the extremes reach both clamps";
  }
}

// White and black through the three sets, body and tail alike.
TEST(SubsampledEdges, KnownColours) {
  struct Want {
    int r, g, b, y, cb, cr;
  };
  const int width = 40;  // body 0..31 and 32..39, tail after it in some members
  for (const Want& w : {Want{255, 255, 255, 235, 128, 128}, Want{0, 0, 0, 16, 128, 128}}) {
    TestImage<uint8_t> src(3 * width, 2);
    fillPixels(src, 3, w.r, w.g, w.b, true);
    Planes csc(width, 2, width / 2, 1), lanes(width, 2, width / 2, 1);
    ASSERT_EQ(zeliBGRToYCbCr420_709CSC_8u_C3P3R(src.data(), src.step(), csc.ptrs, csc.steps, {width, 2}), StatusOk);
    ASSERT_EQ(zeliBGRToYCbCr420_8u_C3P3R(src.data(), src.step(), lanes.ptrs, lanes.steps, {width, 2}), StatusOk);
    for (const Planes* p : {&csc, &lanes})
      for (int x = 0; x < width; ++x) {
        EXPECT_EQ(p->y.get(x, 1), w.y);
        if (x < width / 2) EXPECT_EQ(p->c1.get(x, 0), w.cb) << x;
        if (x < width / 2) EXPECT_EQ(p->c2.get(x, 0), w.cr) << x;
      }
  }
  // The narrow set: white to Y 254 (255 clamped), black to Y 1, grey chroma.
  for (int v : {0, 255}) {
    TestImage<uint8_t> src(4 * width, 2);
    fillPixels(src, 4, v, v, v, true);
    Planes p(width, 2, width / 2, 1);
    ASSERT_EQ(zeliBGRToYCbCr420_709HDTV_8u_AC4P3R(src.data(), src.step(), p.ptrs, p.steps, {width, 2}), StatusOk);
    for (int x = 0; x < width; ++x) EXPECT_EQ(p.y.get(x, 0), v ? 254 : 1) << x;
    for (int x = 0; x < width / 2; ++x) EXPECT_EQ(p.c1.get(x, 0), 128) << x;
  }
}

// ---- YUV 4:2:2 in planes ----

// The name without steps treats 18 by 16 pixels as one row, all of it body;
// row by row (the name with steps, given the same steps), columns 16 and 17
// are tail. On 15 by 17 both walk rows and agree.
TEST(SubsampledEdges, TheNameWithoutStepsTakesALargeEvenImageAsOneRow) {
  for (ImageSize size : {ImageSize{18, 16}, ImageSize{15, 17}}) {
    const int w = size.width, h = size.height, cw = w / 2 + (w & 1);
    std::vector<uint8_t> src(size_t(3 * w) * h + 1);
    for (size_t i = 0; i < src.size(); ++i) src[i] = uint8_t(i * 37 + (i >> 3));
    // Tightly packed planes, one byte off a boundary.
    std::vector<std::vector<uint8_t>> whole, rows;
    for (int n : {w * h, cw * h, cw * h}) {
      whole.emplace_back(size_t(n) + 1, 0);
      rows.emplace_back(size_t(n) + 1, 0);
    }
    uint8_t* a[3] = {whole[0].data() + 1, whole[1].data() + 1, whole[2].data() + 1};
    uint8_t* b[3] = {rows[0].data() + 1, rows[1].data() + 1, rows[2].data() + 1};
    const int steps[3] = {w, cw, cw};
    ASSERT_EQ(zeliRGBToYUV422_8u_C3P3(src.data() + 1, a, size), StatusOk);
    ASSERT_EQ(zeliRGBToYUV422_8u_C3P3R(src.data() + 1, 3 * w, b, steps, size), StatusOk);
    int tailColumns = 0, elsewhere = 0;
    for (int r = 0; r < h; ++r)
      for (int x = 0; x < w; ++x) (x >= 16 ? tailColumns : elsewhere) += a[0][r * w + x] != b[0][r * w + x];
    EXPECT_EQ(elsewhere, 0);
    if (w == 18)
      EXPECT_GT(tailColumns, 0);
    else
      EXPECT_TRUE(whole == rows);
  }
}

// ---- the filtered stream ----

TEST(SubsampledEdges, FilteredChromaLacksTheLeftTapAtTheRowStart) {
  const int width = 12;
  TestImage<uint8_t> src(3 * width, 1);
  fillPixels(src, 3, 200, 60, 30, false);
  TestImage<uint8_t> dst(2 * width, 1);
  ASSERT_EQ(zeliRGBToCbYCr422_8u_C3C2R(src.data(), src.step(), dst.data(), dst.step(), {width, 1}), StatusOk);
  // Cb = (W + 2 w + addend) >> 15 inside the row, (W + w + addend) >> 15 at its start.
  const int w = 3596 * 30 - 1213 * 200 - 2385 * 60, W = 7193 * 30 - 2426 * 200 - 4769 * 60;
  EXPECT_EQ(dst.get(0, 0), (W + w + 4210687) >> 15);
  for (int pair = 1; pair < width / 2; ++pair) EXPECT_EQ(dst.get(4 * pair, 0), (W + 2 * w + 4210687) >> 15);
  EXPECT_NE(dst.get(0, 0), dst.get(4, 0));
  EXPECT_EQ(dst.get(1, 0), dst.get(3, 0));  // luma has no taps
}

// The three-tap model of a whole image, with or without the gamma table.
void filteredModel(bool gamma) {
  std::vector<int> table(256);
  for (int i = 0; i < 256; ++i) table[i] = gamma ? zel::lc::sub::gammaTable()[i] : i;
  for (int width : {1, 2, 3, 7, 16, 17, 31, 32, 33, 50}) {
    TestImage<uint8_t> src(3 * width, 3, width & 3, 2);
    src.fillRandom(uint32_t(width));
    TestImage<uint8_t> dst(2 * width + 2, 3, 1, 3);
    dst.fill(0xEE);
    const ImageSize size{width, 3};
    const Status s = gamma ? zeliRGBToCbYCr422Gamma_8u_C3C2R(src.data(), src.step(), dst.data(), dst.step(), size)
                           : zeliRGBToCbYCr422_8u_C3C2R(src.data(), src.step(), dst.data(), dst.step(), size);
    ASSERT_EQ(s, StatusOk);
    for (int y = 0; y < 3; ++y) {
      auto px = [&](int x, int c) { return table[src.get(3 * x + c, y)]; };
      auto cb = [&](int x, int k) { return k * (3596 * px(x, 2) - 1213 * px(x, 0) - 2385 * px(x, 1)); };
      auto cr = [&](int x, int k) { return k * (3596 * px(x, 0) - 3015 * px(x, 1) - 582 * px(x, 2)); };
      auto luma = [&](int x) { return (8422 * px(x, 0) + 16515 * px(x, 1) + 3212 * px(x, 2) + 540672) >> 15; };
      for (int x = 0; x + 1 < width; x += 2) {
        const int left = x > 0 ? 1 : 0;
        // The centre taps are not quite twice the side taps.
        const int b =
            (7193 * px(x, 2) - 2426 * px(x, 0) - 4769 * px(x, 1) + cb(x - left, left) + cb(x + 1, 1) + 4210687) >> 15;
        const int r =
            (7193 * px(x, 0) - 6030 * px(x, 1) - 1164 * px(x, 2) + cr(x - left, left) + cr(x + 1, 1) + 4210687) >> 15;
        ASSERT_EQ(dst.get(2 * x, y), b) << width << " " << x;
        ASSERT_EQ(dst.get(2 * x + 1, y), luma(x));
        ASSERT_EQ(dst.get(2 * x + 2, y), r);
        ASSERT_EQ(dst.get(2 * x + 3, y), luma(x + 1));
      }
      if (width & 1) {
        const int x = width - 1;
        EXPECT_EQ(dst.get(2 * x, y), (28770 * px(x, 2) - 19071 * px(x, 1) - 9699 * px(x, 0) + 8396800) >> 16);
        EXPECT_EQ(dst.get(2 * x + 1, y), (16843 * px(x, 0) + 33030 * px(x, 1) + 6423 * px(x, 2) + 1081344) >> 16);
      }
      EXPECT_EQ(dst.get(2 * width, y), 0xEE);
    }
    EXPECT_TRUE(dst.guardsIntact() && src.guardsIntact());
  }
}

TEST(SubsampledEdges, FilteredStreamFollowsItsTaps) {
  filteredModel(false);
  filteredModel(true);
}

TEST(SubsampledEdges, GammaTableRoundsTiesToEven) {
  const uint8_t* t = zel::lc::sub::gammaTable();
  // The linear segment: 4.5 i, with the halves at 1 and 3 going to even.
  const int linear[] = {0, 4, 9, 14, 18};
  for (int i = 0; i < 5; ++i) EXPECT_EQ(t[i], linear[i]) << i;
  for (int i = 5; i < 256; ++i) {
    const long double v = 255.0L * (1.099L * std::pow(i / 255.0L, 0.45L) - 0.099L);
    ASSERT_GT(std::fabs(v - std::floor(v) - 0.5L), 1e-6L) << "no tie on the power segment";
    EXPECT_EQ(t[i], int(std::floor(v + 0.5L))) << i;
  }
  EXPECT_EQ(t[255], 255);
}

}  // namespace
