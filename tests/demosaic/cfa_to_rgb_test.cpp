// Bayer mosaic to RGB: hand-worked pixels, whole frames against the rules
// written out, regions against whole frames, statuses, and the vector rows
// against the scalar pixel.
#include "demosaic/cfa_to_rgb.h"

#include <gtest/gtest.h>

#include <array>
#include <vector>

#include "frame/simd.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using zel::test::TestImage;

Status convert(const uint8_t* s, CfaRegion r, ImageSize f, int ss, uint8_t* d, int ds, int g, int i = 0) {
  return zeliCFAToRGB_8u_C1C3R(s, r, f, ss, d, ds, g, i);
}
Status convert(const uint16_t* s, CfaRegion r, ImageSize f, int ss, uint16_t* d, int ds, int g, int i = 0) {
  return zeliCFAToRGB_16u_C1C3R(s, r, f, ss, d, ds, g, i);
}

// The rules as stated for one pixel: sites by phase, mirrored reads, the
// gradient test only two samples away from every edge.
template <typename T>
std::array<int, 3> expectedPixel(const TestImage<T>& m, int w, int h, int grid, int x, int y) {
  auto s = [&](int dx, int dy) {
    int cx = x + dx, cy = y + dy;
    if (cx < 0) cx = -cx;
    if (cx >= w) cx = 2 * (w - 1) - cx;
    if (cy < 0) cy = -cy;
    if (cy >= h) cy = 2 * (h - 1) - cy;
    return int(m.get(cx, cy));
  };
  // Colour letters of the grid's rows 0 and 1.
  static const char* rows[4][2] = {{"BG", "GR"}, {"RG", "GB"}, {"GB", "RG"}, {"GR", "BG"}};
  auto colour = [&](int cx, int cy) { return rows[grid][cy & 1][cx & 1]; };
  auto channel = [](char c) { return c == 'R' ? 0 : c == 'G' ? 1 : 2; };
  const bool interior = x >= 2 && y >= 2 && x <= w - 3 && y <= h - 3;
  std::array<int, 3> out{};
  const char own = colour(x, y);
  out[channel(own)] = s(0, 0);
  if (own == 'G') {
    out[channel(colour(x + 1, y))] = (s(-1, 0) + s(1, 0) + 1) / 2;
    out[channel(colour(x, y + 1))] = (s(0, -1) + s(0, 1) + 1) / 2;
  } else {
    out[2 - channel(own)] = (s(-1, -1) + s(1, -1) + s(-1, 1) + s(1, 1) + 2) / 4;
    const int dV = std::abs(s(0, -2) - s(0, 2)), dH = std::abs(s(-2, 0) - s(2, 0));
    if (interior && dV < dH)
      out[1] = (s(0, -1) + s(0, 1) + 1) / 2;
    else if (interior && dV > dH)
      out[1] = (s(-1, 0) + s(1, 0) + 1) / 2;
    else
      out[1] = (s(0, -1) + s(-1, 0) + s(1, 0) + s(0, 1) + 2) / 4;
  }
  return out;
}

// Row padding: odd for 8 bits; 16-bit steps count whole samples.
template <typename T>
constexpr int kPad = sizeof(T) == 1 ? 5 : 6;

// Random samples, in a narrow range when `narrow` so that gradients tie.
template <typename T>
void fillMosaic(TestImage<T>& m, uint32_t seed, bool narrow) {
  m.fillRandom(seed);
  if (!narrow) return;
  for (int y = 0; y < m.rows(); ++y)
    for (int x = 0; x < m.rowSamples(); ++x) m.set(x, y, T(m.get(x, y) % 4 + (sizeof(T) == 2 ? 65531 : 251)));
}

// Converts `region` of `m` and compares every pixel with the rules; the
// destination is exactly the clipped region, with guards around it.
template <typename T>
void expectRegion(const TestImage<T>& m, int grid, CfaRegion region, int dstOffset) {
  const int w = m.rowSamples(), h = m.rows();
  const int x0 = region.x, y0 = region.y;
  const int rw = std::max(0, std::min(region.width, w - x0)), rh = std::max(0, std::min(region.height, h - y0));
  TestImage<T> dst(3 * rw, rh, dstOffset, 6);
  dst.fill(T(0x1234));
  ASSERT_EQ(convert(m.data(), region, ImageSize{w, h}, m.step(), dst.data(), dst.step(), grid), StatusOk);
  ASSERT_TRUE(dst.guardsIntact()) << w << "x" << h << " region " << x0 << "," << y0 << " " << rw << "x" << rh;
  for (int y = 0; y < rh; ++y)
    for (int x = 0; x < rw; ++x) {
      const auto want = expectedPixel(m, w, h, grid, x0 + x, y0 + y);
      for (int c = 0; c < 3; ++c)
        ASSERT_EQ(int(dst.get(3 * x + c, y)), want[c]) << "frame " << w << "x" << h << " grid " << grid << " pixel "
                                                       << x0 + x << "," << y0 + y << " channel " << c;
    }
}

template <typename T>
void wholeFrames() {
  const int sizes[][2] = {{2, 2}, {3, 2}, {2, 3}, {3, 3}, {4, 5}, {5, 5}, {6, 7}, {9, 6}, {40, 7}, {71, 6}, {5, 33}};
  for (const auto& sz : sizes)
    for (int grid = 0; grid < 4; ++grid)
      for (bool narrow : {false, true}) {
        TestImage<T> m(sz[0], sz[1], 3, kPad<T>);
        fillMosaic(m, uint32_t(sz[0] * 100 + sz[1] * 7 + grid), narrow);
        expectRegion(m, grid, CfaRegion{0, 0, sz[0], sz[1]}, 1);
      }
}

TEST(CfaToRgb, WholeFramesFollowTheRules) {
  wholeFrames<uint8_t>();
  wholeFrames<uint16_t>();
}

TEST(CfaToRgb, TwoByTwoFrameTakesItsOneNeighbour) {
  // R G / G B: both colours everywhere, green of its own or the rounded mean.
  const uint8_t frame[4] = {10, 20, 31, 41};
  uint8_t rgb[12];
  ASSERT_EQ(convert(frame, CfaRegion{0, 0, 2, 2}, ImageSize{2, 2}, 2, rgb, 6, CfaGridRGGB), StatusOk);
  const uint8_t want[12] = {10, 26, 41, 10, 20, 41, 10, 31, 41, 10, 26, 41};
  for (int i = 0; i < 12; ++i) EXPECT_EQ(rgb[i], want[i]) << i;
  // The same samples read as G B / R G.
  ASSERT_EQ(convert(frame, CfaRegion{0, 0, 2, 2}, ImageSize{2, 2}, 2, rgb, 6, CfaGridGBRG), StatusOk);
  const uint8_t want2[12] = {31, 10, 20, 31, 26, 20, 31, 26, 20, 31, 41, 20};
  for (int i = 0; i < 12; ++i) EXPECT_EQ(rgb[i], want2[i]) << i;
}

TEST(CfaToRgb, InteriorGreenFollowsTheFlatterLine) {
  // 5 by 5, RGGB: (2, 2) is the one interior pixel, a red site.
  TestImage<uint16_t> m(5, 5);
  m.fill(0);
  m.set(1, 1, 65535), m.set(3, 1, 65535), m.set(1, 3, 65535), m.set(3, 3, 65534);  // blue diagonals
  m.set(2, 1, 7), m.set(2, 3, 8);                                                  // greens above and below
  m.set(1, 2, 30), m.set(3, 2, 31);                                                // greens left and right
  m.set(2, 2, 500);
  auto centre = [&](int up2, int down2, int left2, int right2) {
    m.set(2, 0, uint16_t(up2)), m.set(2, 4, uint16_t(down2)), m.set(0, 2, uint16_t(left2)),
        m.set(4, 2, uint16_t(right2));
    uint16_t rgb[75];
    EXPECT_EQ(convert(m.data(), CfaRegion{0, 0, 5, 5}, ImageSize{5, 5}, m.step(), rgb, 30, CfaGridRGGB), StatusOk);
    return std::array<int, 3>{rgb[36], rgb[37], rgb[38]};
  };
  // Blue: (3 * 65535 + 65534 + 2) >> 2 rounds up to 65535, with no overflow.
  EXPECT_EQ(centre(100, 100, 0, 50), (std::array<int, 3>{500, 8, 65535}));   // dV 0 < dH 50: column, 7.5 up
  EXPECT_EQ(centre(0, 50, 100, 100), (std::array<int, 3>{500, 31, 65535}));  // dV 50 > dH 0: row, 30.5 up
  EXPECT_EQ(centre(9, 0, 3, 12), (std::array<int, 3>{500, 19, 65535}));      // tie: (7 + 30 + 31 + 8 + 2) >> 2
}

TEST(CfaToRgb, BorderTakesMirroredMeans) {
  // 6 by 6 BGGR; the border rules written out edge by edge.
  TestImage<uint8_t> m(6, 6);
  m.fillRandom(5);
  auto s = [&](int x, int y) { return int(m.get(x, y)); };
  std::vector<uint8_t> rgb(6 * 6 * 3);
  ASSERT_EQ(convert(m.data(), CfaRegion{0, 0, 6, 6}, ImageSize{6, 6}, m.step(), rgb.data(), 18, CfaGridBGGR), StatusOk);
  auto px = [&](int x, int y, int c) { return int(rgb[(y * 6 + x) * 3 + c]); };
  // Top row, blue site (2, 0): green from both row neighbours and twice the one below.
  EXPECT_EQ(px(2, 0, 1), (s(1, 0) + s(3, 0) + 2 * s(2, 1) + 2) >> 2);
  EXPECT_EQ(px(2, 0, 0), (s(1, 1) + s(3, 1) + 1) >> 1);
  // Corner (0, 0), blue: one row and one column neighbour, the one diagonal.
  EXPECT_EQ(px(0, 0, 1), (s(1, 0) + s(0, 1) + 1) >> 1);
  EXPECT_EQ(px(0, 0, 0), s(1, 1));
  // Corner (5, 5), red.
  EXPECT_EQ(px(5, 5, 1), (s(4, 5) + s(5, 4) + 1) >> 1);
  EXPECT_EQ(px(5, 5, 2), s(4, 4));
  // Left edge green (0, 1) in a row of reds: red from its one neighbour.
  EXPECT_EQ(px(0, 1, 0), s(1, 1));
  EXPECT_EQ(px(0, 1, 2), (s(0, 0) + s(0, 2) + 1) >> 1);
  // Right edge red (5, 3): no gradient test.
  EXPECT_EQ(px(5, 3, 1), (s(5, 2) + s(5, 4) + 2 * s(4, 3) + 2) >> 2);
  // Row 1 and column 4 have every neighbour: the full means.
  EXPECT_EQ(px(3, 1, 1), (s(3, 0) + s(2, 1) + s(4, 1) + s(3, 2) + 2) >> 2);
  EXPECT_EQ(px(4, 2, 0), (s(3, 1) + s(5, 1) + s(3, 3) + s(5, 3) + 2) >> 2);
}

template <typename T>
void regions() {
  TestImage<T> m(37, 23, 1, kPad<T>);
  fillMosaic(m, 77, false);
  const CfaRegion cases[] = {
      {3, 5, 17, 11},    // odd origin in the middle
      {0, 0, 37, 23},    // the whole frame
      {30, 18, 50, 50},  // past the right and bottom: clipped, last column by the border rule
      {1, 1, 1, 1},      // one border pixel
      {2, 2, 1, 21},     // one interior column down to the border
      {35, 0, 2, 23},    // the two right border columns only
      {4, 21, 33, 2},    // the two bottom border rows only
  };
  for (int grid = 0; grid < 4; ++grid)
    for (const CfaRegion& r : cases) expectRegion(m, grid, r, 2);
}

TEST(CfaToRgb, RegionsGiveTheWholeFramesPixels) {
  regions<uint8_t>();
  regions<uint16_t>();
}

TEST(CfaToRgb, EmptyRegionsWriteNothing) {
  TestImage<uint8_t> m(8, 8);
  m.fillRandom(1);
  TestImage<uint8_t> dst(24, 8);
  const CfaRegion empty[] = {{2, 2, 0, 5}, {2, 2, 5, 0}, {8, 0, 4, 4}, {0, 8, 4, 4}, {3, 3, -2, 4}};
  for (const CfaRegion& r : empty) {
    ASSERT_EQ(convert(m.data(), r, ImageSize{8, 8}, m.step(), dst.data(), dst.step(), 0), StatusOk);
    for (int y = 0; y < 8; ++y)
      for (int x = 0; x < 24; ++x) ASSERT_EQ(dst.get(x, y), TestImage<uint8_t>::kGuard);
  }
}

TEST(CfaToRgb, ChecksInOrderAndWriteNothing) {
  TestImage<uint8_t> m(6, 6);
  m.fillRandom(2);
  TestImage<uint8_t> dst(18, 6);
  const CfaRegion r{0, 0, 6, 6};
  const ImageSize ok{6, 6};
  auto status = [&](const uint8_t* s, ImageSize f, uint8_t* d, int grid) {
    return convert(s, r, f, m.step(), d, dst.step(), grid);
  };
  EXPECT_EQ(status(nullptr, ok, dst.data(), 0), StatusNullPointerError);
  EXPECT_EQ(status(m.data(), ok, nullptr, 0), StatusNullPointerError);
  EXPECT_EQ(status(nullptr, ImageSize{1, 6}, dst.data(), 9), StatusNullPointerError);
  EXPECT_EQ(status(m.data(), ImageSize{1, 6}, dst.data(), 0), StatusSizeError);
  EXPECT_EQ(status(m.data(), ImageSize{6, 1}, dst.data(), 0), StatusSizeError);
  EXPECT_EQ(status(m.data(), ImageSize{6, -1}, dst.data(), 4), StatusSizeError);
  EXPECT_EQ(status(m.data(), ok, dst.data(), 4), StatusBadArgumentError);
  EXPECT_EQ(status(m.data(), ok, dst.data(), -1), StatusBadArgumentError);
  // The grid is checked before the region is looked at.
  EXPECT_EQ(convert(m.data(), CfaRegion{2, 2, 0, 0}, ok, m.step(), dst.data(), dst.step(), 4), StatusBadArgumentError);
  for (int y = 0; y < 6; ++y)
    for (int x = 0; x < 18; ++x) ASSERT_EQ(dst.get(x, y), TestImage<uint8_t>::kGuard);
  // The interpolation argument is not read.
  std::vector<uint8_t> a(108), b(108);
  ASSERT_EQ(convert(m.data(), r, ok, m.step(), a.data(), 18, 3, 0), StatusOk);
  ASSERT_EQ(convert(m.data(), r, ok, m.step(), b.data(), 18, 3, 12345), StatusOk);
  EXPECT_EQ(a, b);
}

TEST(CfaToRgb, SixteenBitStepsLoseTheirLastBit) {
  TestImage<uint16_t> m(9, 7, 0, 2);  // step 20 bytes
  m.fillRandom(4);
  std::vector<uint16_t> even(9 * 7 * 3 + 8), odd(9 * 7 * 3 + 8, 0xBEEF);
  const CfaRegion r{0, 0, 9, 7};
  ASSERT_EQ(convert(m.data(), r, ImageSize{9, 7}, m.step(), even.data(), 54, 1), StatusOk);
  ASSERT_EQ(convert(m.data(), r, ImageSize{9, 7}, m.step() + 1, odd.data(), 55, 1), StatusOk);
  for (size_t i = 0; i < 9 * 7 * 3; ++i) ASSERT_EQ(even[i], odd[i]) << i;
  EXPECT_EQ(odd[9 * 7 * 3], 0xBEEF);
}

// The vector rows against the scalar pixel: every width from 1 to 70, both
// row phases and both column phases of every grid, odd alignments, values
// that tie and values at the top of the range.
template <typename T>
void vectorRows() {
  for (int count = 1; count <= 70; ++count)
    for (int offset : {0, 1, 3})
      for (int start : {2, 3}) {
        const int w = start + count + 2;
        TestImage<T> m(w, 7, offset * int(sizeof(T)) + (sizeof(T) == 2 ? offset : 0), 1);
        fillMosaic(m, uint32_t(count * 31 + offset + start), (count + offset) % 2 == 0);
        const zel::CfaFrame<T> f{m.data(), m.step(), w, 7};
        for (int grid = 0; grid < 4; ++grid)
          for (int y : {2, 3}) {
            std::vector<T> want(3 * count + 1, T(7)), sse(want), avx(want);
            zel::cfaInteriorRowScalar(f, grid, start, y, count, want.data());
            zel::cfaInteriorRowSse(f, grid, start, y, count, sse.data());
            ASSERT_EQ(sse, want) << "SSE width " << count << " offset " << offset << " grid " << grid << " row " << y;
            if (!zel::hasAvx2()) continue;
            zel::cfaInteriorRowAvx2(f, grid, start, y, count, avx.data());
            ASSERT_EQ(avx, want) << "AVX2 width " << count << " offset " << offset << " grid " << grid << " row " << y;
          }
      }
}

TEST(CfaToRgb, VectorRowsMatchTheScalarPixel) {
  vectorRows<uint8_t>();
  vectorRows<uint16_t>();
}

}  // namespace
