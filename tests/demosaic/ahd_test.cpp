// Adaptive homogeneity-directed demosaicing: whole planes built naively
// over the frame and its margins against the row pipeline, the tiles of
// worked regions, flat and edged mosaics, statuses, scratch and guards.
#include "demosaic/ahd.h"

#include <gtest/gtest.h>

#include <array>
#include <climits>
#include <cstdlib>
#include <random>
#include <vector>

#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using zel::test::TestImage;

Status demosaic(const uint8_t* s, CfaRegion r, ImageSize f, int ss, uint8_t* d, int ds, int g, uint8_t* t, int ts) {
  return zeliDemosaicAHD_8u_C1C3R(s, r, f, ss, d, ds, g, t, ts);
}
Status demosaic(const uint16_t* s, CfaRegion r, ImageSize f, int ss, uint16_t* d, int ds, int g, uint8_t* t, int ts) {
  return zeliDemosaicAHD_16u_C1C3R(s, r, f, ss, d, ds, g, t, ts);
}

// The tiles of a region, as rectangles x, y, width, height before cutting.
std::vector<std::array<int, 4>> tilesOf(int x0, int y0, int rw, int rh, int w, int h, int grid) {
  static const char* rows[4][2] = {{"BG", "GR"}, {"RG", "GB"}, {"GB", "RG"}, {"GR", "BG"}};
  auto colour = [&](int x, int y) { return rows[grid][y & 1][x & 1]; };
  int ix = std::max(x0, 5), iy = std::max(y0, 5);
  int iw = std::min(w - 5, x0 + rw) - ix, ih = std::min(h - 5, y0 + rh) - iy;
  if (colour(ix, iy) == 'B' || (colour(ix, iy) == 'G' && colour(ix + 1, iy) == 'R')) ++ix, --iw;
  if (colour(ix, iy) == 'G') ++iy, --ih;
  iw &= ~1, ih &= ~1;
  std::vector<std::array<int, 4>> out;
  if (iw > 0 && ih > 0) out.push_back({ix, iy, iw, ih});
  if (iy - y0 >= 1) out.push_back({x0, y0, rw, iy - y0});
  if (y0 + rh - (iy + ih) >= 1) out.push_back({x0, iy + ih, rw, y0 + rh - (iy + ih)});
  if (ix - x0 >= 1 && ih >= 1) out.push_back({x0, iy, ix - x0, ih});
  if (x0 + rw - (ix + iw) >= 1 && ih >= 1) out.push_back({ix + iw, iy, x0 + rw - (ix + iw), ih});
  return out;
}

// Every plane of both directions over the frame and a margin of 8, built
// plane by plane from the sample rule; then the decision, tile by tile.
template <typename T>
struct Reference {
  static constexpr int kM = 8;
  int w, h, grid, top;
  bool wrap;            // chroma distances wrap at 32 bits (the rule), or saturate
  std::vector<int> s0;  // the frame's samples
  std::vector<int> g[2], r[2], b[2], lumaY[2], cb[2], cr[2], hom, sum;

  Reference(const TestImage<T>& m, int grid_, bool wrap_ = true)
      : w(m.rowSamples()), h(m.rows()), grid(grid_), top(sizeof(T) == 1 ? 255 : 65535), wrap(wrap_) {
    for (int y = 0; y < h; ++y)
      for (int x = 0; x < w; ++x) s0.push_back(m.get(x, y));
    const size_t n = size_t(w + 2 * kM) * (h + 2 * kM);
    for (int d = 0; d < 2; ++d)
      for (auto* p : {&g[d], &r[d], &b[d], &lumaY[d], &cb[d], &cr[d]}) p->assign(n, 0);
    hom.assign(n, 0);
    sum.assign(n, 0);
    build();
  }
  int at(int x, int y) const { return (y + kM) * (w + 2 * kM) + x + kM; }
  static int fold(int c, int last) {
    while (c < 0 || c > last) c = c < 0 ? -c : 2 * last - c;
    return c;
  }
  int s(int x, int y) const { return s0[size_t(fold(y, h - 1)) * w + fold(x, w - 1)]; }
  char colour(int x, int y) const {
    static const char* rows[4][2] = {{"BG", "GR"}, {"RG", "GB"}, {"GB", "RG"}, {"GR", "BG"}};
    return rows[grid][y & 1][x & 1];
  }
  int clamp(int v) const { return std::min(std::max(v, 0), top); }

  void build() {
    for (int d = 0; d < 2; ++d) {
      const int ax = d == 0 ? 1 : 0, ay = 1 - ax;  // the direction's unit step
      for (int y = -7; y < h + 7; ++y)
        for (int x = -7; x < w + 7; ++x) {
          if (colour(x, y) == 'G') {
            g[d][at(x, y)] = s(x, y);
            continue;
          }
          const int c = s(x, y), a = s(x - 2 * ax, y - 2 * ay), bb = s(x + 2 * ax, y + 2 * ay);
          const int l = s(x - ax, y - ay), rr = s(x + ax, y + ay);
          const int e = ((l + rr) >> 1) + (((c - a) + (c - bb)) >> 2);
          g[d][at(x, y)] = std::min(std::max(e, std::min(l, rr)), std::max(l, rr));
        }
      auto G = [&](int x, int y) { return g[d][at(x, y)]; };
      for (int y = -6; y < h + 6; ++y)
        for (int x = -6; x < w + 6; ++x) {
          int rgb[3];
          const char own = colour(x, y);
          if (own == 'G') {
            const int horizontal = clamp(G(x, y) + (((s(x - 1, y) - G(x - 1, y)) + (s(x + 1, y) - G(x + 1, y))) >> 1));
            const int vertical = clamp(G(x, y) + (((s(x, y - 1) + s(x, y + 1)) - (G(x, y - 1) + G(x, y + 1))) >> 1));
            rgb[colour(x + 1, y) == 'R' ? 0 : 2] = horizontal;
            rgb[colour(x, y + 1) == 'R' ? 0 : 2] = vertical;
          } else {
            int ds = 0, dg = 0;
            for (int oy : {-1, 1})
              for (int ox : {-1, 1}) ds += s(x + ox, y + oy), dg += G(x + ox, y + oy);
            rgb[own == 'R' ? 0 : 2] = s(x, y);
            rgb[own == 'R' ? 2 : 0] = clamp(G(x, y) + ((ds - dg) >> 2));
          }
          rgb[1] = G(x, y);
          const size_t i = at(x, y);
          r[d][i] = rgb[0], b[d][i] = rgb[2];
          lumaY[d][i] = (66 * rgb[0] + 129 * rgb[1] + 25 * rgb[2] + 128) >> 8;
          cb[d][i] = (-38 * rgb[0] - 74 * rgb[1] + 112 * rgb[2] + 128) >> 8;
          cr[d][i] = (112 * rgb[0] - 94 * rgb[1] - 18 * rgb[2] + 128) >> 8;
        }
    }
    const int nx[4] = {-1, 1, 0, 0}, ny[4] = {0, 0, -1, 1};
    for (int y = -5; y < h + 5; ++y)
      for (int x = -5; x < w + 5; ++x) {
        int64_t dY[2][4], dC[2][4];
        for (int d = 0; d < 2; ++d)
          for (int k = 0; k < 4; ++k) {
            const size_t p = at(x, y), q = at(x + nx[k], y + ny[k]);
            dY[d][k] = std::abs(lumaY[d][q] - lumaY[d][p]);
            const int64_t db = cb[d][q] - cb[d][p], dr = cr[d][q] - cr[d][p];
            const int64_t square = db * db + dr * dr;
            dC[d][k] = wrap ? int32_t(uint32_t(uint64_t(square))) : std::min<int64_t>(square, INT32_MAX);
          }
        const int64_t epsY = std::min(std::max(dY[0][0], dY[0][1]), std::max(dY[1][2], dY[1][3]));
        const int64_t epsC = std::min(std::max(dC[0][0], dC[0][1]), std::max(dC[1][2], dC[1][3]));
        int count[2] = {0, 0};
        for (int d = 0; d < 2; ++d)
          for (int k = 0; k < 4; ++k) count[d] += dY[d][k] <= epsY && dC[d][k] <= epsC;
        hom[at(x, y)] = count[0] - count[1];
      }
    for (int y = -4; y < h + 4; ++y)
      for (int x = -4; x < w + 4; ++x)
        for (int oy = -1; oy <= 1; ++oy)
          for (int ox = -1; ox <= 1; ++ox) sum[at(x, y)] += hom[at(x + ox, y + oy)];
  }

  // The output of a region: row by row within each tile cut to the region,
  // later tiles over earlier ones.
  std::vector<int> run(int x0, int y0, int rw, int rh) const {
    std::vector<int> out(size_t(rw) * rh * 3, -1);
    for (const auto& t : tilesOf(x0, y0, rw, rh, w, h, grid)) {
      const int left = std::max(t[0], x0), right = std::min(t[0] + t[2], x0 + rw);
      const int up = std::max(t[1], y0), down = std::min(t[1] + t[3], y0 + rh);
      for (int y = up; y < down; ++y) {
        int choice = 1;
        for (int x = left; x < right; ++x) {
          if (sum[at(x, y)] != 0) choice = sum[at(x, y)];
          const int d = choice < 0 ? 1 : 0;
          int* px = &out[(size_t(y - y0) * rw + (x - x0)) * 3];
          px[0] = r[d][at(x, y)], px[1] = g[d][at(x, y)], px[2] = b[d][at(x, y)];
        }
      }
    }
    return out;
  }
};

// Runs the export on a region with a destination of exactly the clipped
// region and a scratch of exactly 30 rows of width + 6 samples, both
// guarded, and returns the pixels.
template <typename T>
std::vector<int> runExport(const TestImage<T>& m, int grid, CfaRegion region, int scratchPad = 0) {
  const int w = m.rowSamples(), h = m.rows();
  const int x0 = std::max(region.x, 0), y0 = std::max(region.y, 0);
  const int rw = std::max(0, std::min(region.width, w - x0)), rh = std::max(0, std::min(region.height, h - y0));
  TestImage<T> dst(3 * std::max(rw, 1), std::max(rh, 1), 2, 4);
  TestImage<uint8_t> tmp((rw + 6) * int(sizeof(T)), 30, 1, scratchPad);
  EXPECT_EQ(demosaic(m.data(), region, ImageSize{w, h}, m.step(), dst.data(), dst.step(), grid, tmp.data(), tmp.step()),
            StatusOk);
  EXPECT_TRUE(dst.guardsIntact()) << "destination guards, region " << x0 << "," << y0 << " " << rw << "x" << rh;
  EXPECT_TRUE(tmp.guardsIntact()) << "scratch guards, region " << x0 << "," << y0 << " " << rw << "x" << rh;
  std::vector<int> out;
  for (int y = 0; y < rh; ++y)
    for (int x = 0; x < 3 * rw; ++x) out.push_back(dst.get(x, y));
  return out;
}

template <typename T>
void expectLikeReference(const TestImage<T>& m, int grid, CfaRegion region) {
  const Reference<T> ref(m, grid);
  const int x0 = std::max(region.x, 0), y0 = std::max(region.y, 0);
  const int rw = std::max(0, std::min(region.width, m.rowSamples() - x0));
  const int rh = std::max(0, std::min(region.height, m.rows() - y0));
  const std::vector<int> want = ref.run(x0, y0, rw, rh);
  const std::vector<int> got = runExport(m, grid, region, 3);
  ASSERT_EQ(got.size(), want.size());
  for (size_t i = 0; i < got.size(); ++i)
    ASSERT_EQ(got[i], want[i]) << "frame " << m.rowSamples() << "x" << m.rows() << " grid " << grid << " region "
                               << region.x << "," << region.y << " " << region.width << "x" << region.height
                               << " pixel " << (i / 3) % rw << "," << (i / 3) / rw << " channel " << i % 3;
}

template <typename T>
void wholeFrames() {
  // The widest rows cross the column chunks of the luma-chroma rows.
  const int sizes[][2] = {{5, 5}, {6, 5}, {5, 7}, {11, 11}, {12, 13}, {16, 9}, {23, 18}, {40, 12}, {273, 9}, {301, 12}};
  for (const auto& sz : sizes)
    for (int grid = 0; grid < 4; ++grid) {
      TestImage<T> m(sz[0], sz[1], 1, sizeof(T) == 1 ? 3 : 0);
      m.fillRandom(uint32_t(sz[0] * 57 + sz[1] + grid));
      expectLikeReference(m, grid, CfaRegion{0, 0, sz[0], sz[1]});
    }
}

TEST(DemosaicAhd, WholeFramesMatchThePlanes) {
  wholeFrames<uint8_t>();
  wholeFrames<uint16_t>();
}

TEST(DemosaicAhd, SixteenBitChromaSquaresWrap) {
  // Blocks of colours at the corners of the colour cube, at full scale:
  // chroma steps pass 46341, their squares pass 2^31 and wrap. In these two
  // mosaics the wrapped distances decide some pixels.
  static const int channels[4][2][2] = {{{2, 1}, {1, 0}}, {{0, 1}, {1, 2}}, {{1, 2}, {0, 1}}, {{1, 0}, {2, 1}}};
  for (int seed : {584, 1846}) {
    std::mt19937 rng(seed);
    const int grid = seed & 3, bw = 1 + rng() % 5, bh = 1 + rng() % 5;
    int corner[8][8];
    for (auto& row : corner)
      for (int& c : row) c = int(rng() % 8);
    TestImage<uint16_t> m(24, 20);
    for (int y = 0; y < 20; ++y)
      for (int x = 0; x < 24; ++x) {
        const int c = corner[y / bh % 8][x / bw % 8];
        m.set(x, y, uint16_t((c >> channels[grid][y & 1][x & 1]) & 1 ? 65535 : 0));
      }
    ASSERT_NE(Reference<uint16_t>(m, grid, false).run(0, 0, 24, 20), Reference<uint16_t>(m, grid).run(0, 0, 24, 20))
        << "mosaic " << seed << " no longer depends on the wrap";
    expectLikeReference(m, grid, CfaRegion{0, 0, 24, 20});
  }
}

template <typename T>
void regions() {
  TestImage<T> m(29, 24, 3, 2);
  m.fillRandom(9);
  const CfaRegion cases[] = {
      {7, 9, 13, 8},   // inside, odd origin
      {0, 0, 3, 3},    // within the first rows and columns
      {0, 0, 29, 3},   // top tile higher than the region
      {2, 1, 40, 50},  // past the right and bottom edges
      {26, 2, 3, 20},  // within the last columns: the right tile starts left of it
      {1, 20, 27, 4},  // the last rows
      {-3, -2, 9, 8},  // negative origin raised to 0, width kept
      {6, 6, 1, 1},    // one pixel
      {5, 5, 2, 2},    // one interior block, moved off its site
  };
  for (int grid = 0; grid < 4; ++grid)
    for (const CfaRegion& r : cases) expectLikeReference(m, grid, r);
}

TEST(DemosaicAhd, RegionsMatchThePlanes) {
  regions<uint8_t>();
  regions<uint16_t>();
}

TEST(DemosaicAhd, TilesOfWorkedRegions) {
  zel::AhdTile t[5];
  // 20 by 16 RGGB, the whole frame: (5, 5) is blue, so the interior starts
  // at (6, 6) and is 8 by 4.
  int n = zel::ahdTiles(zel::ClippedRegion{0, 0, 20, 16}, ImageSize{20, 16}, CfaGridRGGB, t);
  ASSERT_EQ(n, 5);
  const int want[5][4] = {{6, 6, 8, 4}, {0, 0, 20, 6}, {0, 10, 20, 6}, {0, 6, 6, 4}, {14, 6, 6, 4}};
  for (int i = 0; i < 5; ++i)
    EXPECT_EQ((std::array<int, 4>{t[i].x, t[i].y, t[i].width, t[i].height}),
              (std::array<int, 4>{want[i][0], want[i][1], want[i][2], want[i][3]}))
        << i;
  // GRBG: (5, 5) is green in a row of blues: only the row moves.
  n = zel::ahdTiles(zel::ClippedRegion{0, 0, 20, 16}, ImageSize{20, 16}, CfaGridGRBG, t);
  ASSERT_GE(n, 1);
  EXPECT_EQ((std::array<int, 4>{t[0].x, t[0].y, t[0].width, t[0].height}), (std::array<int, 4>{5, 6, 10, 4}));
  // Three rows at the top of a high frame: the five-row top tile is cut to
  // the region, and nothing else runs.
  n = zel::ahdTiles(zel::ClippedRegion{0, 0, 20, 3}, ImageSize{20, 100}, CfaGridBGGR, t);
  ASSERT_EQ(n, 1);
  EXPECT_EQ((std::array<int, 4>{t[0].x, t[0].y, t[0].width, t[0].height}), (std::array<int, 4>{0, 0, 20, 3}));
  // A 5 by 5 frame has outer tiles only, all within the frame.
  n = zel::ahdTiles(zel::ClippedRegion{0, 0, 5, 5}, ImageSize{5, 5}, CfaGridRGGB, t);
  for (int i = 0; i < n; ++i) {
    EXPECT_GE(t[i].x, 0);
    EXPECT_GE(t[i].y, 0);
    EXPECT_LE(t[i].x + t[i].width, 5);
    EXPECT_LE(t[i].y + t[i].height, 5);
    EXPECT_FALSE(t[i].x == 5 && t[i].y == 5);
  }
}

TEST(DemosaicAhd, FlatGreyStaysGrey) {
  TestImage<uint16_t> m(14, 12);
  m.fill(40000);
  const auto out = runExport(m, CfaGridGBRG, CfaRegion{0, 0, 14, 12});
  for (int v : out) ASSERT_EQ(v, 40000);
}

TEST(DemosaicAhd, VerticalEdgeTakesTheColumn) {
  // Two flat greys side by side: along the columns nothing changes, so V is
  // exact there while H smears across the edge.
  for (int grid = 0; grid < 4; ++grid)
    for (int edge : {9, 10}) {
      TestImage<uint8_t> m(20, 16);
      for (int y = 0; y < 16; ++y)
        for (int x = 0; x < 20; ++x) m.set(x, y, x < edge ? 40 : 220);
      const auto out = runExport(m, grid, CfaRegion{0, 0, 20, 16});
      for (int y = 0; y < 16; ++y)
        for (int x = 0; x < 20; ++x)
          for (int c = 0; c < 3; ++c)
            ASSERT_EQ(out[(y * 20 + x) * 3 + c], x < edge ? 40 : 220) << grid << " " << edge << " " << x << "," << y;
    }
}

TEST(DemosaicAhd, SubRegionsDifferOnlyInTies) {
  // The same pixels as the whole frame wherever the window sum decides.
  TestImage<uint8_t> m(31, 27);
  m.fillRandom(21);
  for (int grid = 0; grid < 4; ++grid) {
    const Reference<uint8_t> ref(m, grid);
    const auto whole = runExport(m, grid, CfaRegion{0, 0, 31, 27});
    const auto part = runExport(m, grid, CfaRegion{7, 8, 15, 12});
    for (int y = 0; y < 12; ++y)
      for (int x = 0; x < 15; ++x) {
        if (ref.sum[ref.at(7 + x, 8 + y)] == 0) continue;
        for (int c = 0; c < 3; ++c)
          ASSERT_EQ(part[(y * 15 + x) * 3 + c], whole[((8 + y) * 31 + 7 + x) * 3 + c]) << x << "," << y;
      }
  }
}

TEST(DemosaicAhd, ChecksInOrderAndWriteNothing) {
  TestImage<uint8_t> m(8, 100);
  m.fillRandom(3);
  TestImage<uint8_t> dst(24, 100);
  std::vector<uint8_t> tmp(30 * 14, 0x5C);
  auto call = [&](const uint8_t* s, ImageSize f, uint8_t* d, int grid) {
    return demosaic(s, CfaRegion{0, 0, 8, 100}, f, m.step(), d, dst.step(), grid, tmp.data(), 14);
  };
  EXPECT_EQ(call(nullptr, ImageSize{8, 100}, dst.data(), 0), StatusNullPointerError);
  EXPECT_EQ(call(m.data(), ImageSize{8, 100}, nullptr, 0), StatusNullPointerError);
  EXPECT_EQ(call(nullptr, ImageSize{4, 100}, dst.data(), 4), StatusNullPointerError);
  EXPECT_EQ(call(m.data(), ImageSize{4, 100}, dst.data(), 4), StatusSizeError);
  EXPECT_EQ(call(m.data(), ImageSize{8, 4}, dst.data(), 0), StatusSizeError);
  EXPECT_EQ(call(m.data(), ImageSize{8, 100}, dst.data(), 4), StatusBadArgumentError);
  EXPECT_EQ(call(m.data(), ImageSize{8, 100}, dst.data(), -2), StatusBadArgumentError);
  for (int y = 0; y < 100; ++y)
    for (int x = 0; x < 24; ++x) ASSERT_EQ(dst.get(x, y), TestImage<uint8_t>::kGuard);
  for (uint8_t v : tmp) ASSERT_EQ(v, 0x5C);
  // Empty regions end the call before anything is touched, even the scratch.
  for (const CfaRegion& r : {CfaRegion{0, 0, 0, 5}, CfaRegion{8, 0, 3, 3}, CfaRegion{2, 100, 3, 3}})
    EXPECT_EQ(demosaic(m.data(), r, ImageSize{8, 100}, m.step(), dst.data(), dst.step(), 1, nullptr, 0), StatusOk);
}

TEST(DemosaicAhd, SixteenBitStepsSourceInBytesDestinationInSamples) {
  // An odd source step is a byte count: rows start at odd addresses. An odd
  // destination step loses its last bit.
  TestImage<uint16_t> even(13, 11), odd(13, 11, 1, 1);
  even.fillRandom(8);
  for (int y = 0; y < 11; ++y)
    for (int x = 0; x < 13; ++x) odd.set(x, y, even.get(x, y));
  ASSERT_EQ(odd.step() % 2, 1);
  std::vector<uint8_t> tmp(30 * 19 * 2);
  std::vector<uint16_t> a(13 * 11 * 3 + 4), b(13 * 11 * 3 + 4, 0xABCD);
  const CfaRegion r{0, 0, 13, 11};
  ASSERT_EQ(demosaic(even.data(), r, ImageSize{13, 11}, even.step(), a.data(), 78, 0, tmp.data(), 38), StatusOk);
  ASSERT_EQ(demosaic(odd.data(), r, ImageSize{13, 11}, odd.step(), b.data(), 79, 0, tmp.data(), 38), StatusOk);
  for (size_t i = 0; i < 13 * 11 * 3; ++i) ASSERT_EQ(a[i], b[i]) << i;
  EXPECT_EQ(b[13 * 11 * 3], 0xABCD);
}

}  // namespace
