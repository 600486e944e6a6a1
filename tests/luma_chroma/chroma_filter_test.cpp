// Filtered, interlaced and 1620 chroma resampling against literal per-pixel
// models, including the vector/single zones, slices and the BGR transform.
#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <vector>

#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using zel::test::TestImage;
using Img = TestImage<uint8_t>;

int aru(int a, int b) { return (a + b + 1) >> 1; }
int tm(int a, int b) { return (a + b) >> 1; }
int sat(int v) { return std::clamp(v, 0, 255); }

struct P3 {
  Img y, c1, c2;
  P3(int w, int h, int cw, int ch, int offset) : y(w, h, offset, 3), c1(cw, ch, offset, 5), c2(cw, ch, offset, 1) {}
  const uint8_t* cp[3];
  uint8_t* p[3];
  int steps[3];
  const uint8_t* const* csrc() {
    cp[0] = y.data(), cp[1] = c1.data(), cp[2] = c2.data();
    steps[0] = y.step(), steps[1] = c1.step(), steps[2] = c2.step();
    return cp;
  }
  uint8_t* const* dst() {
    p[0] = y.data(), p[1] = c1.data(), p[2] = c2.data();
    steps[0] = y.step(), steps[1] = c1.step(), steps[2] = c2.step();
    return p;
  }
  Img& plane(int i) { return i == 0 ? y : i == 1 ? c1 : c2; }
};

TEST(ChromaFilters, Grow1620To420FollowsItsZones) {
  for (int w : {4, 8, 64, 68, 72, 128, 132, 136, 140, 200})
    for (int h : {4, 8, 12}) {
      P3 s(w, h, w / 4, h / 4, 1), d(w, h, w / 2, h / 2, 2);
      s.y.fillRandom(1), s.c1.fillRandom(2), s.c2.fillRandom(3);
      s.csrc();
      ASSERT_EQ(zeliYCbCr1620To420_8u_P3R(s.cp, s.steps, d.dst(), d.steps, ImageSize{w, h}), StatusOk);
      const int n = w / 4, rows = h / 4;
      for (int pl = 1; pl <= 2; ++pl) {
        Img& c = s.plane(pl);
        Img& o = d.plane(pl);
        for (int i = 0; i < rows; ++i) {
          const bool lastRow = i == rows - 1;
          // Column zones: blocks of 32 while 33 remain (not in the last
          // row), of 16 while 17 remain, then single columns.
          std::vector<bool> block(n, false);
          int j = 0;
          while (!lastRow && n - j >= 33) std::fill(block.begin() + j, block.begin() + j + 32, true), j += 32;
          while (n - j >= 17) std::fill(block.begin() + j, block.begin() + j + 16, true), j += 16;
          for (j = 0; j < n; ++j) {
            const int a = c.get(j, i);
            int top1, bot0, bot1;
            if (j == n - 1) {
              top1 = a;
              bot0 = bot1 = lastRow ? a : tm(a, c.get(j, i + 1));
            } else {
              auto m = block[j] ? aru : tm;
              top1 = m(a, c.get(j + 1, i));
              if (lastRow) {
                bot0 = bot1 = a;
              } else {
                bot0 = m(a, c.get(j, i + 1));
                bot1 = m(m(a, c.get(j + 1, i)), m(c.get(j, i + 1), c.get(j + 1, i + 1)));
              }
            }
            ASSERT_EQ(o.get(2 * j, 2 * i), a) << w << "x" << h << " " << j << "," << i;
            ASSERT_EQ(o.get(2 * j + 1, 2 * i), top1) << w << "x" << h << " " << j << "," << i;
            ASSERT_EQ(o.get(2 * j, 2 * i + 1), bot0) << w << "x" << h << " " << j << "," << i;
            ASSERT_EQ(o.get(2 * j + 1, 2 * i + 1), bot1) << w << "x" << h << " " << j << "," << i;
          }
        }
        ASSERT_TRUE(o.guardsIntact());
      }
    }
}

TEST(ChromaFilters, Grow1620EdgeCases) {
  // 4 x 4: one chroma sample, all four outputs equal to it.
  P3 s(4, 4, 1, 1, 0), d(4, 4, 2, 2, 0);
  s.c1.set(0, 0, 77), s.c2.set(0, 0, 9);
  s.csrc();
  ASSERT_EQ(zeliYCbCr1620To420_8u_P3R(s.cp, s.steps, d.dst(), d.steps, ImageSize{4, 4}), StatusOk);
  for (int y = 0; y < 2; ++y)
    for (int x = 0; x < 2; ++x) {
      EXPECT_EQ(d.c1.get(x, y), 77);
      EXPECT_EQ(d.c2.get(x, y), 9);
    }
  // 10 next to 11: 11 in a vector block, 10 in a single column.
  for (int w : {4 * 40, 4 * 3}) {
    P3 a(w, 8, w / 4, 2, 0), b(w, 8, w / 2, 4, 0);
    a.c1.fill(10);
    a.c1.set(1, 0, 11);
    a.csrc();
    ASSERT_EQ(zeliYCbCr1620To420_8u_P3R(a.cp, a.steps, b.dst(), b.steps, ImageSize{w, 8}), StatusOk);
    EXPECT_EQ(b.c1.get(1, 0), w > 4 * 17 ? 11 : 10) << w;
  }
}

TEST(ChromaFilters, Shrink420To1620TakesEvenSamples) {
  P3 s(16, 8, 8, 4, 3), d(16, 8, 4, 2, 1);
  s.y.fillRandom(4), s.c1.fillRandom(5), s.c2.fillRandom(6);
  s.csrc();
  ASSERT_EQ(zeliYCbCr420To1620_8u_P3R(s.cp, s.steps, d.dst(), d.steps, ImageSize{16, 8}), StatusOk);
  for (int i = 0; i < 2; ++i)
    for (int j = 0; j < 4; ++j) EXPECT_EQ(d.c2.get(j, i), s.c2.get(2 * j, 2 * i));
  EXPECT_EQ(zeliYCbCr420To1620_8u_P3R(s.cp, s.steps, d.dst(), d.steps, ImageSize{18, 8}), StatusSizeError);
}

TEST(ChromaFilters, InterlacedDownKeepsFields) {
  for (int w : {2, 3, 34, 67})
    for (int h : {4, 6, 8, 13}) {
      const int cw = (w & ~1) / 2, hu = h & ~3;
      const Status want = (w & 1) || (h & 3) ? StatusOddSizeWarning : StatusOk;
      P3 s(w, h, (w + 1) / 2, h, 1), d(w, h, (w + 1) / 2, (h + 1) / 2, 0);
      s.y.fillRandom(7), s.c1.fillRandom(8), s.c2.fillRandom(9);
      s.csrc();
      ASSERT_EQ(zeliYCbCr422To420_Interlace_8u_P3R(s.cp, s.steps, d.dst(), d.steps, ImageSize{w, h}), want);
      // The same chroma as a CbYCr stream.
      Img stream(2 * w, h, 2);
      for (int r = 0; r < h; ++r)
        for (int k = 0; k < cw; ++k) {
          stream.set(4 * k, r, s.c1.get(k, r));
          stream.set(4 * k + 1, r, s.y.get(2 * k, r));
          stream.set(4 * k + 2, r, s.c2.get(k, r));
          stream.set(4 * k + 3, r, s.y.get(2 * k + 1, r));
        }
      P3 e(w, h, (w + 1) / 2, (h + 1) / 2, 3);
      ASSERT_EQ(zeliCbYCr422ToYCbCr420_Interlace_8u_C2P3R(stream.data(), stream.step(), e.dst(), e.steps,
                                                           ImageSize{w, h}),
                want);
      for (int pl = 1; pl <= 2; ++pl)
        for (int k = 0; k < hu / 4; ++k)
          for (int x = 0; x < cw; ++x) {
            Img& r = s.plane(pl);
            const int o0 = (3 * r.get(x, 4 * k) + r.get(x, 4 * k + 2) + 2) >> 2;
            const int o1 = (r.get(x, 4 * k + 1) + 3 * r.get(x, 4 * k + 3) + 2) >> 2;
            ASSERT_EQ(d.plane(pl).get(x, 2 * k), o0);
            ASSERT_EQ(d.plane(pl).get(x, 2 * k + 1), o1);
            ASSERT_EQ(e.plane(pl).get(x, 2 * k), o0);
            ASSERT_EQ(e.plane(pl).get(x, 2 * k + 1), o1);
          }
      for (int r = 0; r < hu; ++r)
        for (int x = 0; x < (w & ~1); ++x) ASSERT_EQ(e.y.get(x, r), s.y.get(x, r));
      ASSERT_TRUE(d.c1.guardsIntact() && e.c2.guardsIntact() && e.y.guardsIntact());
    }
}

TEST(ChromaFilters, InterlacedUpTapsWithinAField) {
  for (int w : {2, 40, 66})
    for (int h : {4, 8, 12, 16}) {
      const int cw = w / 2;
      P3 s(w, h, cw, h / 2, 1), d(w, h, cw, h, 2);
      s.y.fillRandom(10), s.c1.fillRandom(11), s.c2.fillRandom(12);
      s.csrc();
      ASSERT_EQ(zeliYCbCr420To422_Interlace_8u_P3R(s.cp, s.steps, d.dst(), d.steps, ImageSize{w, h}), StatusOk);
      Img stream(2 * w, h, 1);
      ASSERT_EQ(zeliYCbCr420ToCbYCr422_Interlace_8u_P3C2R(s.cp, s.steps, stream.data(), stream.step(),
                                                           ImageSize{w, h}),
                StatusOk);
      for (int pl = 1; pl <= 2; ++pl)
        for (int x = 0; x < cw; ++x) {
          Img& c = s.plane(pl);
          auto S = [&](int r) { return int(c.get(x, r)); };
          std::vector<int> o(h);
          o[0] = S(0), o[1] = S(1);
          for (int dd = 2; dd < h - 2; dd += 4) {
            const int t = (dd - 2) / 2;
            o[dd] = (5 * S(t) + 3 * S(t + 2) + 4) >> 3;
            o[dd + 1] = (7 * S(t + 1) + S(t + 3) + 4) >> 3;
            o[dd + 2] = (S(t) + 7 * S(t + 2) + 4) >> 3;
            o[dd + 3] = (3 * S(t + 1) + 5 * S(t + 3) + 4) >> 3;
          }
          o[h - 2] = S(h / 2 - 2), o[h - 1] = S(h / 2 - 1);
          for (int r = 0; r < h; ++r) {
            ASSERT_EQ(d.plane(pl).get(x, r), o[r]) << w << "x" << h << " row " << r;
            ASSERT_EQ(stream.get(4 * x + (pl == 1 ? 0 : 2), r), o[r]);
          }
        }
      for (int r = 0; r < h; ++r)
        for (int x = 0; x < w; ++x) ASSERT_EQ(stream.get(4 * (x / 2) + 1 + 2 * (x & 1), r), s.y.get(x, r));
      ASSERT_TRUE(stream.guardsIntact());
    }
}

TEST(ChromaFilters, HalfSampleFilterWithRepeatedEdges) {
  for (int w : {2, 34, 70})
    for (int h : {8, 9, 16, 24}) {
      const int hu = h & ~7, cw = w / 2, n = hu / 2;
      P3 s(w, h, cw, (h + 1) / 2, 1), d(w, h, cw, h, 0), e(w, h, cw, h, 2), f(w, h, cw, h, 3);
      s.y.fillRandom(13), s.c1.fillRandom(14), s.c2.fillRandom(15);
      s.csrc();
      ASSERT_EQ(zeliYCbCr420ToYCbCr422_Filter_8u_P3R(s.cp, s.steps, d.dst(), d.steps, ImageSize{w, h}), StatusOk);
      ASSERT_EQ(zeliYCrCb420ToYCbCr422_Filter_8u_P3R(s.cp, s.steps, e.dst(), e.steps, ImageSize{w, h}), StatusOk);
      Img pairs(2 * cw, (h + 1) / 2, 1);
      for (int r = 0; r < n; ++r)
        for (int k = 0; k < cw; ++k) pairs.set(2 * k, r, s.c1.get(k, r)), pairs.set(2 * k + 1, r, s.c2.get(k, r));
      ASSERT_EQ(zeliYCbCr420ToYCbCr422_Filter_8u_P2P3R(s.y.data(), s.y.step(), pairs.data(), pairs.step(), f.dst(),
                                                       f.steps, ImageSize{w, h}),
                StatusOk);
      for (int pl = 1; pl <= 2; ++pl)
        for (int x = 0; x < cw; ++x) {
          auto S = [&](Img& c, int k) { return int(c.get(x, std::clamp(k, 0, n - 1))); };
          for (int k = 0; k < n; ++k) {
            Img& c = s.plane(pl);
            Img& swapped = s.plane(3 - pl);
            const int odd = sat((9 * (S(c, k) + S(c, k + 1)) - S(c, k - 1) - S(c, k + 2) + 8) >> 4);
            const int oddSwapped =
                sat((9 * (S(swapped, k) + S(swapped, k + 1)) - S(swapped, k - 1) - S(swapped, k + 2) + 8) >> 4);
            ASSERT_EQ(d.plane(pl).get(x, 2 * k), S(c, k));
            ASSERT_EQ(d.plane(pl).get(x, 2 * k + 1), odd) << w << "x" << h;
            ASSERT_EQ(f.plane(pl).get(x, 2 * k + 1), odd);
            ASSERT_EQ(e.plane(pl).get(x, 2 * k + 1), oddSwapped);  // Cb from the third plane
          }
        }
      ASSERT_TRUE(d.c1.guardsIntact() && f.c2.guardsIntact());
    }
  // Flat 255 stays 255 through the negative taps.
  P3 s(4, 8, 2, 4, 0), d(4, 8, 2, 8, 0);
  s.c1.fill(255), s.c2.fill(255);
  s.csrc();
  ASSERT_EQ(zeliYCbCr420ToYCbCr422_Filter_8u_P3R(s.cp, s.steps, d.dst(), d.steps, ImageSize{4, 8}), StatusOk);
  EXPECT_EQ(d.c1.get(1, 3), 255);
}

// ---- the two-plane slice filters ----

// A frame of luma and chroma pairs, with rows above and below for slices.
struct Frame420 {
  int w, h;
  Img y, c;
  Frame420(int width, int height, uint32_t seed, bool aligned = false)
      : w(width), h(height), y(width, height, aligned ? 0 : 1), c(width, height / 2, aligned ? 0 : 3) {
    y.fillRandom(seed);
    c.fillRandom(seed + 1);
  }
  int Y(int r, int x) const { return y.get(x, r); }
  int C(int r, int x) const { return c.get(x, r); }
};

// Expected Y0 Cb Y1 Cr rows of the interleaved filter for a whole frame.
std::vector<std::vector<int>> interleavedWholeFrame(const Frame420& f) {
  const int w = f.w, h = f.h, n = h / 2;
  std::vector<std::vector<int>> out(h, std::vector<int>(2 * w));
  auto blend = [&](int r, int x, bool rounded) {
    const int c = r / 2;
    const int a = f.C(c, x), b = c < n - 1 ? f.C(c + 1, x) : f.C(n - 2, x);
    return rounded ? aru(a, b) : tm(a, b);
  };
  for (int r = 0; r < h; ++r)
    for (int x = 0; x < w; ++x) {
      int yv, cv;
      if (h == 2) {
        yv = r == 0 ? sat((3 * f.Y(0, x) + f.Y(1, x) + 4) >> 2) : sat((f.Y(0, x) + 3 * f.Y(1, x) + 4) >> 2);
        cv = f.C(0, x);
      } else if (r == 0 || r == 1 || r >= h - 2) {
        if (r == 0) yv = sat((3 * f.Y(0, x) + f.Y(1, x) + 4) >> 2);
        else if (r == h - 1) yv = sat((f.Y(r - 1, x) + 3 * f.Y(r, x) + 4) >> 2);
        else yv = sat((f.Y(r - 1, x) + 2 * f.Y(r, x) + f.Y(r + 1, x) + 4) >> 2);
        cv = blend(r == h - 1 ? h - 2 : r, x, false);
      } else if (x < (w & ~31)) {
        yv = aru(aru(f.Y(r, x), f.Y(r - 1, x)), aru(f.Y(r, x), f.Y(r + 1, x)));
        cv = blend(r, x, true);
      } else {
        const int up = f.Y(r - 1, x), y = f.Y(r, x), down = f.Y(r + 1, x);
        yv = (x & 1) ? sat((up + 2 * y + down + 4) >> 2) : sat(((((up + down) >> 1) + y) >> 1) + 1);
        cv = blend(r, x, false);
      }
      out[r][2 * x] = yv;
      out[r][2 * x + 1] = cv;
    }
  return out;
}

TEST(SliceFilters, InterleavedWholeFrame) {
  for (int w : {2, 8, 30, 32, 33, 64, 70})
    for (int h : {2, 3, 4, 6, 10}) {
      Frame420 f(w & ~1, h & ~1, uint32_t(w * h));
      Img out(2 * w, h, 5);
      ASSERT_EQ(zeliYCbCr420ToYCbCr422_Filter_8u_P2C2R(f.y.data(), f.y.step(), f.c.data(), f.c.step(), out.data(),
                                                       out.step(), ImageSize{w, h}, 21),
                StatusOk);
      const auto want = interleavedWholeFrame(f);
      for (int r = 0; r < (h & ~1); ++r)
        for (int x = 0; x < 2 * (w & ~1); ++x) ASSERT_EQ(out.get(x, r), want[r][x]) << w << "x" << h << " " << x << "," << r;
      for (int x = 2 * (w & ~1); x < 2 * w; ++x) ASSERT_EQ(out.get(x, 0), Img::kGuard);
    }
}

TEST(SliceFilters, FlatLumaEdgeCases) {
  for (int flat : {255, 100}) {
    Frame420 f(40, 8, 1);
    f.y.fill(uint8_t(flat));
    Img out(80, 8);
    ASSERT_EQ(zeliYCbCr420ToYCbCr422_Filter_8u_P2C2R(f.y.data(), f.y.step(), f.c.data(), f.c.step(), out.data(),
                                                     out.step(), ImageSize{40, 8}, 21),
              StatusOk);
    if (flat == 255) {
      EXPECT_EQ(out.get(0, 0), 255);  // (1020 + 4) >> 2 clamped
    } else {
      EXPECT_EQ(out.get(0, 0), 101);
      EXPECT_EQ(out.get(0, 1), 101);
      EXPECT_EQ(out.get(2 * 5, 3), 100);   // inner row, vector block
      EXPECT_EQ(out.get(2 * 35, 3), 101);  // inner row, tail
      EXPECT_EQ(out.get(2 * 36, 3), 101);
    }
  }
}

TEST(SliceFilters, UnknownLayoutWritesNothing) {
  Frame420 f(16, 8, 2);
  Img out(32, 8);
  Img planes0(16, 8), planes1(8, 4), planes2(8, 4);
  uint8_t* p[3] = {planes0.data(), planes1.data(), planes2.data()};
  const int steps[3] = {planes0.step(), planes1.step(), planes2.step()};
  for (int layout : {0, 2, 5, 17, 20}) {
    EXPECT_EQ(zeliYCbCr420ToYCbCr422_Filter_8u_P2C2R(f.y.data(), f.y.step(), f.c.data(), f.c.step(), out.data(),
                                                     out.step(), ImageSize{16, 8}, layout),
              StatusOk);
    EXPECT_EQ(zeliYCbCr420ToYCrCb420_Filter_8u_P2P3R(f.y.data(), f.y.step(), f.c.data(), f.c.step(), p, steps,
                                                     ImageSize{16, 8}, layout),
              StatusOk);
  }
  for (int r = 0; r < 8; ++r) {
    for (int x = 0; x < 32; ++x) ASSERT_EQ(out.get(x, r), Img::kGuard);
    for (int x = 0; x < 16; ++x) ASSERT_EQ(planes0.get(x, r), Img::kGuard);
  }
}

// Expected slice rows of the interleaved filter: rows first..last of a
// slice of height h whose pointers stand at frame row `top`.
std::vector<int> interleavedSliceRow(const Frame420& f, int top, int h, int layout, int r) {
  const int w = f.w, n = h / 2;
  const bool firstRows = layout == 1 && r < 2, lastRows = layout == 16 && r >= h - 2;
  const int bodyEnd = w & ~((firstRows || lastRows) ? 7 : 31);
  std::vector<int> row(2 * w);
  const int c = (r + 64) / 2 - 32;  // floor of r / 2
  for (int x = 0; x < w; ++x) {
    const int Y = f.Y(top + r, x);
    const bool body = x < bodyEnd;
    int yv;
    if (layout == 1 && r == 0) {
      const int down = f.Y(top + 1, x);
      yv = body ? aru(Y, aru(Y, down)) : (3 * Y + down) >> 2;
    } else if (layout == 16 && r == h - 1) {
      const int up = f.Y(top + r - 1, x);
      yv = body ? aru(Y, aru(Y, up)) : (up + 3 * Y) >> 2;
    } else {
      const int up = f.Y(top + r - 1, x), down = f.Y(top + r + 1, x);
      yv = body ? aru(aru(Y, up), aru(Y, down)) : (up + 2 * Y + down) >> 2;
    }
    const int cr = top / 2 + c;
    const int a = f.C(cr, x), b = c < n - 1 ? f.C(cr + 1, x) : f.C(top / 2 + n - 2, x);
    row[2 * x] = yv;
    row[2 * x + 1] = body ? aru(a, b) : tm(a, b);
  }
  return row;
}

TEST(SliceFilters, InterleavedSlicesWriteTheirRows) {
  // A 48-row frame fed as slices of 16: first, middle, last.
  for (int w : {16, 40, 70}) {
    Frame420 f(w, 48, uint32_t(w));
    Img out(2 * w, 48, 1);
    for (int s = 0; s < 3; ++s) {
      const int layout = s == 0 ? 1 : s == 1 ? 4 : 16, top = 16 * s;
      ASSERT_EQ(zeliYCbCr420ToYCbCr422_Filter_8u_P2C2R(f.y.row(top), f.y.step(), f.c.row(top / 2), f.c.step(),
                                                       out.row(top), out.step(), ImageSize{w, 16}, layout),
                StatusOk);
      const int first = layout == 1 ? 0 : -2, last = layout == 16 ? 15 : 13;
      for (int r = first; r <= last; ++r) {
        auto want = interleavedSliceRow(f, top, 16, layout, r);
        if (layout == 16 && r == 15)  // the tail of the very last row repeats the chroma above
          for (int x = w & ~7; x < w; ++x) want[2 * x + 1] = out.get(2 * x + 1, top + 14);
        for (int x = 0; x < 2 * w; ++x) ASSERT_EQ(out.get(x, top + r), want[x]) << w << " slice " << s << " row " << r;
      }
      if (layout != 16)  // the last two rows wait for the next slice
        for (int x = 0; x < 2 * w; ++x) ASSERT_EQ(out.get(x, top + 15), Img::kGuard);
    }
    ASSERT_TRUE(out.guardsIntact());
  }
}

TEST(SliceFilters, PlanarWholeFrameAndSlices) {
  // General kernels (unaligned width), whole frame against a model.
  for (int w : {6, 34, 70})
    for (int h : {2, 4, 8}) {
      Frame420 f(w, h, uint32_t(w + h));
      Img y(w, h, 1), p1(w / 2, h / 2, 2), p2(w / 2, h / 2, 3);
      uint8_t* planes[3] = {y.data(), p1.data(), p2.data()};
      const int steps[3] = {y.step(), p1.step(), p2.step()};
      ASSERT_EQ(zeliYCbCr420ToYCrCb420_Filter_8u_P2P3R(f.y.data(), f.y.step(), f.c.data(), f.c.step(), planes, steps,
                                                       ImageSize{w, h}, 21),
                StatusOk);
      const int n = h / 2, cw = w / 2;
      for (int r = 0; r < h; ++r)
        for (int x = 0; x < w; ++x) {
          int want;
          const int Y = f.Y(r, x);
          if (h == 2) want = r == 0 ? sat((3 * Y + f.Y(1, x) + 4) >> 2) : sat((f.Y(0, x) + 3 * Y + 4) >> 2);
          else if (r == 0) want = (3 * Y + f.Y(1, x)) >> 2;
          else if (r == h - 1) want = (f.Y(r - 1, x) + 3 * Y) >> 2;
          else if (x < (w & ~15)) want = aru(aru(Y, f.Y(r - 1, x)), aru(Y, f.Y(r + 1, x)));
          else want = (f.Y(r - 1, x) + 2 * Y + f.Y(r + 1, x)) >> 2;
          ASSERT_EQ(y.get(x, r), want) << w << "x" << h << " " << x << "," << r;
        }
      for (int j = 0; j < n; ++j)
        for (int k = 0; k < cw; ++k)
          for (int b = 0; b < 2; ++b) {
            int want;
            if (h == 2) {
              want = f.C(0, 2 * k + b);
            } else {
              const int a = f.C(j, 2 * k + b), c = j < n - 1 ? f.C(j + 1, 2 * k + b) : f.C(n - 2, 2 * k + b);
              want = (j < n - 1 && k < (cw & ~15)) ? aru(a, c) : tm(a, c);
            }
            ASSERT_EQ((b ? p2 : p1).get(k, j), want) << w << "x" << h << " chroma " << k << "," << j;
          }
    }
}

TEST(SliceFilters, PlanarMiddleSliceCrossesChromaSteps) {
  // Chroma planes with different steps: rows of the first advance by the
  // second's step and the other way round, from one row above each pointer.
  const int w = 20, h = 8;
  Frame420 f(w, 3 * h, 9);
  Img y(w, 3 * h), p1(w / 2, 3 * h), p2(w / 2 + 6, 3 * h);
  const int top = h;
  uint8_t* planes[3] = {y.row(top), p1.row(8), p2.row(8)};
  const int steps[3] = {y.step(), p1.step(), p2.step()};
  ASSERT_EQ(zeliYCbCr420ToYCrCb420_Filter_8u_P2P3R(f.y.row(top), f.y.step(), f.c.row(top / 2), f.c.step(), planes,
                                                   steps, ImageSize{w, h}, 4),
            StatusOk);
  for (int j = -1; j <= h / 2 - 2; ++j) {
    const uint8_t* row1 = p1.row(8) - p1.step() + (j + 1) * p2.step();
    const uint8_t* row2 = p2.row(8) - p2.step() + (j + 1) * p1.step();
    for (int k = 0; k < w / 2; ++k) {
      const int cr = top / 2 + j;
      EXPECT_EQ(row1[k], tm(f.C(cr, 2 * k), f.C(cr + 1, 2 * k))) << j << " " << k;
      EXPECT_EQ(row2[k], tm(f.C(cr, 2 * k + 1), f.C(cr + 1, 2 * k + 1))) << j << " " << k;
    }
  }
}

TEST(SliceFilters, PlanarAlignedSlicesUseVectorFormsEverywhere) {
  const int w = 64, h = 16;
  Frame420 f(w, 2 * h, 4, true);
  Img y(w, 2 * h), p1(w / 2, h), p2(w / 2, h);  // steps are multiples of 32 here
  ASSERT_EQ(y.step() % 32, 0);
  uint8_t* planes[3] = {y.data(), p1.data(), p2.data()};
  const int steps[3] = {y.step(), p1.step(), p2.step()};
  ASSERT_EQ(zeliYCbCr420ToYCrCb420_Filter_8u_P2P3R(f.y.data(), f.y.step(), f.c.data(), f.c.step(), planes, steps,
                                                   ImageSize{w, h}, 1),
            StatusOk);
  for (int x = 0; x < w; ++x) {
    EXPECT_EQ(y.get(x, 0), aru(f.Y(0, x), aru(f.Y(0, x), f.Y(1, x))));
    EXPECT_EQ(y.get(x, 5), aru(aru(f.Y(5, x), f.Y(4, x)), aru(f.Y(5, x), f.Y(6, x))));
  }
  for (int k = 0; k < w / 2; ++k) EXPECT_EQ(p1.get(k, 2), aru(f.C(2, 2 * k), f.C(3, 2 * k)));
  EXPECT_EQ(p1.get(0, 7), Img::kGuard);  // chroma rows 0 .. (h - 2) / 2 - 1 only
}

// ---- 4:2:0 to BGR with horizontal chroma interpolation ----

void bgrModel(int Y, int cr, int cb, bool wide, int* bgr) {
  if (wide) {
    const int d = Y * 4769 - 76304;
    bgr[2] = sat((d + (cr - 128) * 6537) >> 12);
    bgr[1] = sat((d - (cr - 128) * 3330 - (cb - 128) * 1605) >> 12);
    bgr[0] = sat((d + (cb - 128) * 8263) >> 12);
    return;
  }
  auto mh = [](int a, int b) { return int16_t((int(int16_t(a)) * b) >> 16); };
  const int y = mh((Y - 16) * 128, 4769), crs = (cr - 128) * 128, cbs = (cb - 128) * 128;
  bgr[2] = sat(int16_t(y + mh(crs, 6537)) >> 3);
  bgr[1] = sat(int16_t(y - mh(cbs, 1605) - mh(crs, 3330)) >> 3);
  bgr[0] = sat(int16_t(y + mh(cbs, 8263)) >> 3);
}

TEST(ChromaFilters, BgrFromInterpolatedChroma) {
  for (int w : {1, 2, 3, 17, 18, 19, 34, 35, 50, 70, 100})
    for (int h : {1, 2, 3, 4})
      for (int offset : {0, 1}) {
        const int room = std::max(w, 2);
        P3 s(room, h, (room + 1) / 2, (h + 1) / 2, offset);
        s.y.fillRandom(uint32_t(w)), s.c1.fillRandom(uint32_t(h)), s.c2.fillRandom(5);
        s.csrc();
        Img out(4 * room, h, offset + 2);
        const Status st = zeliYCrCb420ToBGR_Filter_8u_P3C4R(s.cp, s.steps, out.data(), out.step(), ImageSize{w, h}, 200);
        ASSERT_EQ(st, (w & 1) || (h & 1) ? StatusOddSizeWarning : StatusOk);
        const int pairs = std::max(w / 2, 1), bodyPairs = std::max((w / 2 - 1) & ~7, 0);
        for (int r = 0; r < h; ++r)
          for (int px = 0; px < 2 * pairs; ++px) {
            const int k = px / 2;
            int cr = s.c1.get(k, r / 2), cb = s.c2.get(k, r / 2);
            if ((px & 1) && k + 1 < pairs) cr = aru(cr, s.c1.get(k + 1, r / 2)), cb = aru(cb, s.c2.get(k + 1, r / 2));
            int bgr[3];
            bgrModel(s.y.get(px, r), cr, cb, k >= bodyPairs, bgr);
            const bool written = r < (h & ~1);
            for (int ch = 0; ch < 3; ++ch)
              ASSERT_EQ(out.get(4 * px + ch, r), written ? bgr[ch] : Img::kGuard) << w << "x" << h << " " << px << "," << r;
            ASSERT_EQ(out.get(4 * px + 3, r), written ? 200 : Img::kGuard);
          }
        ASSERT_TRUE(out.guardsIntact());
      }
}

}  // namespace
