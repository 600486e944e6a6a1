// Repacking between 4:2:2, 4:2:0 and 4:1:1 layouts: every member against a
// literal model of the chroma rules, over sizes, paddings and alignments.
#include <gtest/gtest.h>

#include <map>
#include <string>
#include <vector>

#include "frame/descriptor.h"
#include "luma_chroma/repack_rows.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using namespace zel::meta;

// Logical planes of an image: Y at full size, Cb and Cr at chroma size.
struct Planes {
  int w = 0, h = 0, cw = 0, ch = 0;
  std::vector<int> y, cb, cr;
  int& Y(int x, int r) { return y[size_t(r) * w + x]; }
  int& Cb(int x, int r) { return cb[size_t(r) * cw + x]; }
  int& Cr(int x, int r) { return cr[size_t(r) * cw + x]; }
};

int chromaCols(Chroma c, int w) { return c == Chroma::S411 ? w / 4 : w / 2; }
int chromaRows(Chroma c, int h) { return c == Chroma::S420 ? h / 2 : h; }

// Byte offsets of Y0, Cb, Y1, Cr in a pair of the format.
std::array<int, 4> pairSlots(const std::string& format) {
  if (format.rfind("CbYCr", 0) == 0) return {1, 0, 3, 2};
  if (format.rfind("YCrCb", 0) == 0) return {0, 3, 2, 1};
  return {0, 1, 2, 3};
}

bool crFirst(const std::string& format) { return format.rfind("YCrCb", 0) == 0; }

// Reads (or, with `write`, stores) logical planes through a side's buffers.
void transfer(Workspace& w, int sideIndex, const Side& side, Planes& p, bool write) {
  auto byte = [&](int plane, int x, int row) -> uint8_t& {
    Workspace::Buffer* b = w.bufferOf(sideIndex, plane);
    return b->first[size_t(row) * b->step + x];
  };
  auto move = [&](uint8_t& at, int& v) {
    if (write)
      at = uint8_t(v);
    else
      v = at;
  };
  const int cbPlane = crFirst(side.format) ? 2 : 1, crPlane = crFirst(side.format) ? 1 : 2;
  for (int r = 0; r < p.h; ++r)
    for (int x = 0; x < p.w; ++x) {
      if (side.layout == Layout::C2) {
        const auto s = pairSlots(side.format);
        move(byte(0, 4 * (x / 2) + ((x & 1) ? s[2] : s[0]), r), p.Y(x, r));
      } else {
        move(byte(0, x, r), p.Y(x, r));
      }
    }
  for (int r = 0; r < p.ch; ++r)
    for (int k = 0; k < p.cw; ++k) {
      if (side.layout == Layout::C2) {
        const auto s = pairSlots(side.format);
        move(byte(0, 4 * k + s[1], r), p.Cb(k, r));
        move(byte(0, 4 * k + s[3], r), p.Cr(k, r));
      } else if (side.layout == Layout::P2) {
        move(byte(1, 2 * k, r), p.Cb(k, r));
        move(byte(1, 2 * k + 1, r), p.Cr(k, r));
      } else {
        move(byte(cbPlane, k, r), p.Cb(k, r));
        move(byte(crPlane, k, r), p.Cr(k, r));
      }
    }
}

Planes shaped(const Side& side, int w, int h) {
  Planes p;
  p.w = w;
  p.h = h;
  p.cw = chromaCols(side.chroma, w);
  p.ch = chromaRows(side.chroma, h);
  p.y.assign(size_t(w) * h, 0);
  p.cb.assign(size_t(p.cw) * p.ch, 0);
  p.cr.assign(size_t(p.cw) * p.ch, 0);
  return p;
}

// The chroma rule of one plane, literally.
void applyRule(Chroma from, Chroma to, const std::vector<int>& c, int ccols, std::vector<int>& o, int ocols, int orows) {
  auto C = [&](int row, int col) { return c[size_t(row) * ccols + col]; };
  for (int i = 0; i < orows; ++i)
    for (int k = 0; k < ocols; ++k) {
      int v;
      if (from == to) v = C(i, k);
      else if (from == Chroma::S422 && to == Chroma::S420) v = C(2 * i, k);
      else if (from == Chroma::S420 && to == Chroma::S422) v = C(i / 2, k);
      else if (from == Chroma::S422 && to == Chroma::S411) v = C(i, 2 * k);
      else if (from == Chroma::S411 && to == Chroma::S422) v = C(i, k / 2);
      else if (from == Chroma::S411 && to == Chroma::S420) v = C(2 * i + (k & 1), k / 2);
      else v = C(i / 2, 2 * k + (i & 1));  // 4:2:0 to 4:1:1
      o[size_t(i) * ocols + k] = v;
    }
}

// Region used: rounded down to the schemes' grid.
ImageSize usedRegion(const Descriptor& d, ImageSize size) {
  const bool has411 = d.src.chroma == Chroma::S411 || d.dst.chroma == Chroma::S411;
  const bool has420 = d.src.chroma == Chroma::S420 || d.dst.chroma == Chroma::S420;
  return ImageSize{size.width & (has411 ? ~3 : ~1), has420 ? size.height & ~1 : size.height};
}

std::vector<std::string> plainMembers() {
  std::vector<std::string> out;
  for (const Descriptor& d : allDescriptors()) {
    if (!d.isImageFunction() || d.src.sample != Sample::U8) continue;
    const bool subsampled = d.src.chroma != Chroma::Full && d.dst.chroma != Chroma::Full;
    if (subsampled && d.name != "zeliYCbCr411To420_8u_P3R" && d.name != "zeliYCbCr420To411_8u_P3R" &&
        d.name.find("Filter") == std::string::npos && d.name.find("Interlace") == std::string::npos &&
        d.src.chroma != Chroma::S1620 && d.dst.chroma != Chroma::S1620)
      out.push_back(d.name);
  }
  return out;
}

TEST(Repack, EveryMemberFollowsTheChromaRules) {
  const auto members = plainMembers();
  ASSERT_EQ(members.size(), 50u);
  for (const std::string& name : members) {
    const Descriptor& d = *findDescriptor(name);
    for (int width : {4, 5, 6, 7, 8, 13, 32, 34, 37, 70})
      for (int height : {2, 3, 4, 5})
        for (int offset : {0, 1}) {
          const ImageSize size{width, height};
          Workspace w(d, size, 3 * offset, offset);
          w.fillRandom(uint32_t(width * 97 + height));
          w.fillDestinations(0xEE);
          ASSERT_EQ(w.call(), StatusOk) << name << " " << width << "x" << height;
          const ImageSize used = usedRegion(d, size);
          Planes in = shaped(d.src, used.width, used.height);
          transfer(w, 0, d.src, in, false);
          Planes want = shaped(d.dst, used.width, used.height);
          want.y = in.y;
          applyRule(d.src.chroma, d.dst.chroma, in.cb, in.cw, want.cb, want.cw, want.ch);
          applyRule(d.src.chroma, d.dst.chroma, in.cr, in.cw, want.cr, want.cw, want.ch);
          Planes got = shaped(d.dst, used.width, used.height);
          transfer(w, 1, d.dst, got, false);
          ASSERT_EQ(got.y, want.y) << name << " luma " << width << "x" << height;
          ASSERT_EQ(got.cb, want.cb) << name << " Cb " << width << "x" << height;
          ASSERT_EQ(got.cr, want.cr) << name << " Cr " << width << "x" << height;
          // Outside the region used nothing is written.
          for (Workspace::Buffer& b : w.buffers()) {
            if (b.side != 1) continue;
            int touched = 0;
            for (int r = 0; r < b.geometry.rows; ++r)
              for (int x = 0; x < b.geometry.rowBytes; ++x) touched += b.first[size_t(r) * b.step + x] != 0xEE;
            const PlaneGeometry g = planeGeometry(d.dst, b.plane, used.width, used.height);
            ASSERT_LE(touched, g.rows * g.rowBytes) << name << " plane " << b.plane << " wrote outside";
          }
          ASSERT_EQ(w.checkGuards(), "") << name;
        }
  }
}

TEST(Repack, OddSizeWritesTheEvenPartOnly) {
  // 5 x 3 through 4:2:2 to 4:2:0 planes: four columns, two rows.
  const Descriptor& d = *findDescriptor("zeliYCbCr422ToYCbCr420_8u_P3R");
  Workspace w(d, ImageSize{5, 3});
  w.fillRandom(9);
  w.fillDestinations(0x11);
  ASSERT_EQ(w.call(), StatusOk);
  Workspace::Buffer* y = w.bufferOf(1, 0);
  for (int r = 0; r < 3; ++r)
    for (int x = 0; x < 5; ++x)
      EXPECT_EQ(y->first[size_t(r) * y->step + x] == 0x11, r == 2 || x == 4) << x << "," << r;
}

TEST(Repack, ChromaSurvivesTheRoundTripThrough411) {
  // 4:2:0 to 4:1:1 and back loses nothing.
  const int w = 24, h = 6;
  zel::test::TestImage<uint8_t> y(w, h), cbcr(w, h / 2), y2(w, h), cb(w / 4, h), cr(w / 4, h), back(w, h / 2);
  y.fillRandom(1);
  cbcr.fillRandom(2);
  uint8_t* planes[3] = {y2.data(), cb.data(), cr.data()};
  const int steps[3] = {y2.step(), cb.step(), cr.step()};
  ASSERT_EQ(zeliYCbCr420ToYCbCr411_8u_P2P3R(y.data(), y.step(), cbcr.data(), cbcr.step(), planes, steps,
                                            ImageSize{w, h}),
            StatusOk);
  const uint8_t* cplanes[3] = {y2.data(), cb.data(), cr.data()};
  zel::test::TestImage<uint8_t> y3(w, h);
  ASSERT_EQ(zeliYCbCr411ToYCbCr420_8u_P3P2R(cplanes, steps, y3.data(), y3.step(), back.data(), back.step(),
                                            ImageSize{w, h}),
            StatusOk);
  for (int r = 0; r < h / 2; ++r)
    for (int x = 0; x < w; ++x) ASSERT_EQ(back.get(x, r), cbcr.get(x, r)) << x << "," << r;
}

// The filtered members, with a model of their block and single zones.
int truncMean(int a, int b) { return (a + b) >> 1; }
int roundMean(int a, int b) { return (a + b + 1) >> 1; }

TEST(Repack, Filtered411To420AveragesWithBlockRounding) {
  for (int width : {4, 8, 64, 68, 72, 128, 260, 272, 280})
    for (int offset : {0, 3}) {
      const int h = 8, n = width / 4;
      zel::test::TestImage<uint8_t> sy(width, h, offset), scb(n, h, offset), scr(n, h, offset);
      zel::test::TestImage<uint8_t> dy(width, h, offset), dcb(width / 2, h / 2, offset), dcr(width / 2, h / 2, offset);
      sy.fillRandom(3);
      scb.fillRandom(4);
      scr.fillRandom(5);
      const uint8_t* src[3] = {sy.data(), scb.data(), scr.data()};
      const int ss[3] = {sy.step(), scb.step(), scr.step()};
      uint8_t* dst[3] = {dy.data(), dcb.data(), dcr.data()};
      const int ds[3] = {dy.step(), dcb.step(), dcr.step()};
      ASSERT_EQ(zeliYCbCr411To420_8u_P3R(src, ss, dst, ds, ImageSize{width, h}), StatusOk);
      // Zones: blocks of 64 while more than 64 remain, then 16 while more
      // than 16 remain, then single samples.
      std::vector<bool> inBlock(n, false);
      int k = 0;
      while (n - k > 64) {
        for (int j = 0; j < 64; ++j) inBlock[k + j] = true;
        k += 64;
      }
      while (n - k > 16) {
        for (int j = 0; j < 16; ++j) inBlock[k + j] = true;
        k += 16;
      }
      for (auto* pair : {&scb, &scr}) {
        auto* out = pair == &scb ? &dcb : &dcr;
        for (int i = 0; i < h / 2; ++i)
          for (int c = 0; c < n; ++c) {
            const int a = pair->get(c, 2 * i);
            const int b = c + 1 < n ? pair->get(c + 1, 2 * i) : a;
            ASSERT_EQ(out->get(2 * c, i), a);
            const int want = c + 1 == n ? a : inBlock[c] ? roundMean(a, b) : truncMean(a, b);
            ASSERT_EQ(out->get(2 * c + 1, i), want) << width << " col " << c;
          }
        ASSERT_TRUE(out->guardsIntact());
      }
      for (int r = 0; r < h; ++r)
        for (int x = 0; x < width; ++x) ASSERT_EQ(dy.get(x, r), sy.get(x, r));
    }
}

TEST(Repack, Filtered411To420NeighboursTenAndEleven) {
  // 10 next to 11: 11 inside a vector block, 10 as a single sample.
  const int width = 4 * 40, n = 40;
  std::vector<uint8_t> y(width * 4, 0), cb(n * 4, 10), cr(n * 4, 10), dy(width * 4), dcb(width), dcr(width);
  cb[0] = 10, cb[1] = 11;            // in the first block of 16
  cb[n - 3] = 10, cb[n - 2] = 11;    // in the single samples at the end
  const uint8_t* src[3] = {y.data(), cb.data(), cr.data()};
  const int ss[3] = {width, n, n};
  uint8_t* dst[3] = {dy.data(), dcb.data(), dcr.data()};
  const int ds[3] = {width, width / 2, width / 2};
  ASSERT_EQ(zeliYCbCr411To420_8u_P3R(src, ss, dst, ds, ImageSize{width, 4}), StatusOk);
  EXPECT_EQ(dcb[1], 11);
  EXPECT_EQ(dcb[2 * (n - 3) + 1], 10);
}

TEST(Repack, Filtered420To411AveragesRowsWithBlockRounding) {
  for (int width : {4, 8, 124, 128, 132, 256, 260})
    for (int height : {2, 4, 6}) {
      const int n = width / 4, rows = height / 2;
      zel::test::TestImage<uint8_t> sy(width, height, 1), scb(width / 2, rows, 1), scr(width / 2, rows, 1);
      zel::test::TestImage<uint8_t> dy(width, height, 2), dcb(n, height, 2), dcr(n, height, 2);
      sy.fillRandom(6);
      scb.fillRandom(7);
      scr.fillRandom(8);
      const uint8_t* src[3] = {sy.data(), scb.data(), scr.data()};
      const int ss[3] = {sy.step(), scb.step(), scr.step()};
      uint8_t* dst[3] = {dy.data(), dcb.data(), dcr.data()};
      const int ds[3] = {dy.step(), dcb.step(), dcr.step()};
      ASSERT_EQ(zeliYCbCr420To411_8u_P3R(src, ss, dst, ds, ImageSize{width, height}), StatusOk);
      const int blockEnd = n / 32 * 32;
      for (auto* pair : {&scb, &scr}) {
        auto* out = pair == &scb ? &dcb : &dcr;
        for (int i = 0; i < rows; ++i)
          for (int k = 0; k < n; ++k) {
            const int a = pair->get(2 * k, i);
            ASSERT_EQ(out->get(k, 2 * i), a);
            int want = a;
            if (i + 1 < rows) {
              const int b = pair->get(2 * k, i + 1);
              want = k < blockEnd ? roundMean(a, b) : truncMean(a, b);
            }
            ASSERT_EQ(out->get(k, 2 * i + 1), want) << width << "x" << height << " " << k << "," << i;
          }
        ASSERT_TRUE(out->guardsIntact());
      }
    }
}

TEST(Repack, GrayTakesTheLumaOfPairs) {
  for (int width = 1; width <= 40; ++width) {
    zel::test::TestImage<uint8_t> src(2 * width, 2, width & 3), dst(width, 2, 1);
    src.fillRandom(uint32_t(width));
    ASSERT_EQ(zeliYCbCr422ToGray_8u_C2C1R(src.data(), src.step(), dst.data(), dst.step(), ImageSize{width, 2}),
              StatusOk);
    for (int r = 0; r < 2; ++r)
      for (int x = 0; x < width; ++x) ASSERT_EQ(dst.get(x, r), src.get(2 * x, r)) << width;
    ASSERT_TRUE(dst.guardsIntact());
  }
}

TEST(Repack, RowMovesMatchTheirScalarForms) {
  using namespace zel::repack;
  // Vector bodies against the pair-by-pair forms, every length to 70.
  for (int n = 2; n <= 70; n += 2)
    for (PairOrder o : {PairOrder::YCbCr, PairOrder::YCrCb, PairOrder::CbYCr}) {
      zel::test::TestImage<uint8_t> in(2 * n, 1, 3);
      in.fillRandom(uint32_t(n));
      std::vector<uint8_t> y(n), cb(n / 2), cr(n / 2), wy(n), wcb(n / 2), wcr(n / 2);
      splitPairs(in.data(), o, y.data(), cb.data(), cr.data(), n);
      for (int x = 0; x < n; x += 2) splitPair(in.data() + 2 * x, o, &wy[x], &wcb[x / 2], &wcr[x / 2]);
      ASSERT_EQ(y, wy);
      ASSERT_EQ(cb, wcb);
      ASSERT_EQ(cr, wcr);
      for (PairOrder to : {PairOrder::YCbCr, PairOrder::YCrCb, PairOrder::CbYCr}) {
        zel::test::TestImage<uint8_t> out(2 * n, 1, 1);
        reorderPairs(in.data(), o, out.data(), to, n, false);
        std::vector<uint8_t> want(2 * n);
        for (int x = 0; x < n; x += 2) mergePair(&wy[x], wcb[x / 2], wcr[x / 2], to, &want[2 * x]);
        for (int x = 0; x < 2 * n; ++x) ASSERT_EQ(out.get(x, 0), want[x]) << n;
        ASSERT_TRUE(out.guardsIntact());
      }
      for (bool nt : {false, true}) {
        zel::test::TestImage<uint8_t> out(2 * n, 1, nt ? 0 : 5);
        mergePairs(y.data(), cb.data(), cr.data(), o, out.data(), n, nt);
        _mm_sfence();
        for (int x = 0; x < 2 * n; ++x) ASSERT_EQ(out.get(x, 0), in.get(x, 0)) << n;
        ASSERT_TRUE(out.guardsIntact());
      }
    }
}

// Single-pass moves between layouts of different schemes against byte-wise
// models, over lengths that reach the wide and narrow bodies and the tails,
// at odd alignments, with nothing written past the ends.
using Row = zel::test::TestImage<uint8_t>;

Row randomRow(int n, int offset, uint32_t seed) {
  Row r(n, 1, offset);
  r.fillRandom(seed);
  return r;
}

void expectRow(const Row& got, const std::vector<uint8_t>& want, const char* what, int n) {
  for (size_t i = 0; i < want.size(); ++i) ASSERT_EQ(got.get(int(i), 0), want[i]) << what << " n=" << n << " at " << i;
  ASSERT_TRUE(got.guardsIntact()) << what << " n=" << n;
}

TEST(Repack, PairStreamsSplitIntoOtherSchemesInOnePass) {
  using namespace zel::repack;
  for (int pixels = 4; pixels <= 140; pixels += 4)
    for (PairOrder o : {PairOrder::YCbCr, PairOrder::YCrCb, PairOrder::CbYCr})
      for (int offset : {0, 3}) {
        const Row in = randomRow(2 * pixels, offset, uint32_t(pixels + 7 * int(o)));
        std::vector<uint8_t> y(pixels), cb(pixels / 2), cr(pixels / 2);
        for (int x = 0; x < pixels; x += 2) splitPair(in.data() + 2 * x, o, &y[x], &cb[x / 2], &cr[x / 2]);
        std::vector<uint8_t> cb4(pixels / 4), cr4(pixels / 4), cbcr(pixels), cbcr4(pixels / 2);
        for (int k = 0; k < pixels / 4; ++k) {
          cb4[k] = cb[2 * k];
          cr4[k] = cr[2 * k];
          cbcr4[2 * k] = cb[2 * k];
          cbcr4[2 * k + 1] = cr[2 * k];
        }
        for (int k = 0; k < pixels / 2; ++k) {
          cbcr[2 * k] = cb[k];
          cbcr[2 * k + 1] = cr[k];
        }
        Row gy(pixels, 1, offset + 1), gcb(pixels / 4, 1, 5), gcr(pixels / 4, 1, 2);
        splitPairs411(in.data(), o, gy.data(), gcb.data(), gcr.data(), pixels);
        expectRow(gy, y, "411 luma", pixels);
        expectRow(gcb, cb4, "411 Cb", pixels);
        expectRow(gcr, cr4, "411 Cr", pixels);
        for (bool nt : {false, true}) {
          Row ly(pixels, 1, nt ? 0 : 1), lc(pixels, 1, nt ? 0 : 7), ly4(pixels, 1, nt ? 0 : 9), lc4(pixels / 2, 1, 3);
          splitPairsToCbCr(in.data(), o, ly.data(), lc.data(), pixels, nt);
          splitPairsToCbCr411(in.data(), o, ly4.data(), lc4.data(), pixels, nt);
          _mm_sfence();
          expectRow(ly, y, "pairs luma", pixels);
          expectRow(lc, cbcr, "pairs chroma", pixels);
          expectRow(ly4, y, "411 pairs luma", pixels);
          expectRow(lc4, cbcr4, "411 pairs chroma", pixels);
        }
        Row luma(pixels, 1, 11);
        lumaOfPairs(in.data(), o, luma.data(), pixels);
        expectRow(luma, y, "luma only", pixels);
      }
}

TEST(Repack, PairStreamsWovenFromOtherSchemesInOnePass) {
  using namespace zel::repack;
  for (int pixels = 4; pixels <= 140; pixels += 4)
    for (PairOrder o : {PairOrder::YCbCr, PairOrder::YCrCb, PairOrder::CbYCr})
      for (bool nt : {false, true}) {
        const Row y = randomRow(pixels, 1, uint32_t(pixels));
        const Row cbcr = randomRow(pixels, 2, uint32_t(pixels + 1));
        const Row cb = randomRow(pixels / 4, 3, uint32_t(pixels + 2)), cr = randomRow(pixels / 4, 0, uint32_t(pixels + 3));
        std::vector<uint8_t> want(2 * pixels), want4(2 * pixels), wantPlanes4(2 * pixels);
        for (int x = 0; x < pixels; x += 2) {
          mergePair(y.data() + x, cbcr.get(x, 0), cbcr.get(x + 1, 0), o, &want[2 * x]);
          mergePair(y.data() + x, cbcr.get(2 * (x / 4), 0), cbcr.get(2 * (x / 4) + 1, 0), o, &want4[2 * x]);
          mergePair(y.data() + x, cb.get(x / 4, 0), cr.get(x / 4, 0), o, &wantPlanes4[2 * x]);
        }
        Row a(2 * pixels, 1, nt ? 0 : 5), b(2 * pixels, 1, nt ? 0 : 1), c(2 * pixels, 1, nt ? 0 : 6);
        mergePairsCbCr(y.data(), cbcr.data(), o, a.data(), pixels, nt);
        mergePairsCbCr411(y.data(), cbcr.data(), o, b.data(), pixels, nt);
        mergePairs411(y.data(), cb.data(), cr.data(), o, c.data(), pixels, nt);
        _mm_sfence();
        expectRow(a, want, "from byte pairs", pixels);
        expectRow(b, want4, "from 411 byte pairs", pixels);
        expectRow(c, wantPlanes4, "from 411 planes", pixels);
      }
}

TEST(Repack, ChromaRowDealsMatchTheirByteModels) {
  using namespace zel::repack;
  for (int n = 1; n <= 70; ++n)
    for (int offset : {0, 1}) {
      const uint32_t seed = uint32_t(n * 5 + offset);
      const Row a = randomRow(4 * n, offset, seed), b = randomRow(4 * n, 2 + offset, seed + 1);
      const Row c = randomRow(n, 3, seed + 2), d = randomRow(n, 0, seed + 3);
      // keepEven: out[k] = in[2k].
      std::vector<uint8_t> w(n);
      for (int k = 0; k < n; ++k) w[k] = a.get(2 * k, 0);
      Row kept(n, 1, offset + 2);
      keepEven(a.data(), kept.data(), n);
      expectRow(kept, w, "keepEven", n);
      // unzipDouble and zipEvens.
      std::vector<uint8_t> wa(2 * n), wb(2 * n), wz(2 * n);
      for (int k = 0; k < n; ++k) {
        wa[2 * k] = wa[2 * k + 1] = a.get(2 * k, 0);
        wb[2 * k] = wb[2 * k + 1] = a.get(2 * k + 1, 0);
        wz[2 * k] = a.get(2 * k, 0);
        wz[2 * k + 1] = b.get(2 * k, 0);
      }
      Row ua(2 * n, 1, 1), ub(2 * n, 1, 4), z(2 * n, 1, 3 - offset);
      unzipDouble(a.data(), ua.data(), ub.data(), n);
      zipEvens(a.data(), b.data(), z.data(), n);
      expectRow(ua, wa, "unzipDouble a", n);
      expectRow(ub, wb, "unzipDouble b", n);
      expectRow(z, wz, "zipEvens", n);
      // crossPairs over 2n bytes.
      std::vector<uint8_t> we(2 * n), wo(2 * n);
      for (int k = 0; k < 2 * n; k += 2) {
        we[k] = a.get(k, 0);
        we[k + 1] = b.get(k, 0);
        wo[k] = a.get(k + 1, 0);
        wo[k + 1] = b.get(k + 1, 0);
      }
      Row ce(2 * n, 1, 5), co(2 * n, 1, offset);
      crossPairs(a.data(), b.data(), ce.data(), co.data(), 2 * n);
      expectRow(ce, we, "crossPairs even", n);
      expectRow(co, wo, "crossPairs odd", n);
      // zip4 and unzip4 undo each other.
      std::vector<uint8_t> w4(4 * n);
      for (int k = 0; k < n; ++k) {
        w4[4 * k] = a.get(k, 0);
        w4[4 * k + 1] = b.get(k, 0);
        w4[4 * k + 2] = c.get(k, 0);
        w4[4 * k + 3] = d.get(k, 0);
      }
      Row z4(4 * n, 1, 1 + offset);
      zip4(a.data(), b.data(), c.data(), d.data(), z4.data(), n);
      expectRow(z4, w4, "zip4", n);
      Row q[4] = {Row(n, 1, 1), Row(n, 1, 2), Row(n, 1, 0), Row(n, 1, 7)};
      unzip4(a.data(), q[0].data(), q[1].data(), q[2].data(), q[3].data(), n);
      for (int j = 0; j < 4; ++j) {
        std::vector<uint8_t> wq(n);
        for (int k = 0; k < n; ++k) wq[k] = a.get(4 * k + j, 0);
        expectRow(q[j], wq, "unzip4", n);
      }
    }
}

TEST(Repack, GaplessFramesGoAsOneRow) {
  // Rows without padding are joined into one long row; a frame large enough
  // for the whole-plane copy gives the same bytes as the rule.
  const int w = 512, h = 256;
  Row y(w * h, 1, 0), cbcr(w * h / 2, 1, 0), y2(w * h, 1, 0), cb(w * h / 4, 1, 0), cr(w * h / 4, 1, 0);
  y.fillRandom(3);
  cbcr.fillRandom(4);
  uint8_t* planes[3] = {y2.data(), cb.data(), cr.data()};
  const int steps[3] = {w, w / 2, w / 2};
  ASSERT_EQ(zeliYCbCr420_8u_P2P3R(y.data(), w, cbcr.data(), w, planes, steps, ImageSize{w, h}), StatusOk);
  for (int i = 0; i < w * h; ++i) ASSERT_EQ(y2.get(i, 0), y.get(i, 0)) << i;
  for (int i = 0; i < w * h / 4; ++i) {
    ASSERT_EQ(cb.get(i, 0), cbcr.get(2 * i, 0)) << i;
    ASSERT_EQ(cr.get(i, 0), cbcr.get(2 * i + 1, 0)) << i;
  }
  ASSERT_TRUE(y2.guardsIntact() && cb.guardsIntact() && cr.guardsIntact());
  Row y3(w * h, 1, 0), back(w * h / 2, 1, 0);
  const uint8_t* cplanes[3] = {y2.data(), cb.data(), cr.data()};
  ASSERT_EQ(zeliYCbCr420_8u_P3P2R(cplanes, steps, y3.data(), w, back.data(), w, ImageSize{w, h}), StatusOk);
  for (int i = 0; i < w * h; ++i) ASSERT_EQ(y3.get(i, 0), y.get(i, 0)) << i;
  for (int i = 0; i < w * h / 2; ++i) ASSERT_EQ(back.get(i, 0), cbcr.get(i, 0)) << i;
  ASSERT_TRUE(y3.guardsIntact() && back.guardsIntact());
}

TEST(Repack, GaplessPlanesWeaveAsOneRow) {
  // 4:2:2 planes without padding weave as one long row: the same pair
  // stream as row by row on padded planes, in the plain and in the
  // streaming member.
  const int w = 1030, h = 600;
  Row y(w, h, 0), cb(w / 2, h, 0), cr(w / 2, h, 0);
  y.fillRandom(5);
  cb.fillRandom(6);
  cr.fillRandom(7);
  Row py(w, h, 0, 16), pcb(w / 2, h, 0, 16), pcr(w / 2, h, 0, 16);
  for (int r = 0; r < h; ++r)
    for (int x = 0; x < w; ++x) {
      py.set(x, r, y.get(x, r));
      if (x < w / 2) pcb.set(x, r, cb.get(x, r)), pcr.set(x, r, cr.get(x, r));
    }
  const uint8_t* tight[3] = {y.data(), cb.data(), cr.data()};
  const uint8_t* padded[3] = {py.data(), pcb.data(), pcr.data()};
  const int tightSteps[3] = {w, w / 2, w / 2}, paddedSteps[3] = {py.step(), pcb.step(), pcr.step()};
  using Weave = Status (*)(const uint8_t* const*, const int*, uint8_t*, int, ImageSize);
  for (Weave weave : {Weave(zeliYCbCr422_8u_P3C2R), Weave(zeliYCbCr422ToYCrCb422_8u_P3C2R)}) {
    Row one(2 * w, h, 0), rows(2 * w, h, 0, 16);
    ASSERT_EQ(weave(tight, tightSteps, one.data(), 2 * w, ImageSize{w, h}), StatusOk);
    ASSERT_EQ(weave(padded, paddedSteps, rows.data(), rows.step(), ImageSize{w, h}), StatusOk);
    for (int r = 0; r < h; ++r)
      for (int x = 0; x < 2 * w; ++x) ASSERT_EQ(one.get(x, r), rows.get(x, r)) << x << ", " << r;
    ASSERT_TRUE(one.guardsIntact() && rows.guardsIntact());
  }
}

TEST(Repack, StreamedCopiesMatchPlainOnes) {
  using namespace zel::repack;
  // Any start and length: the skewed head, the streamed blocks, the rest.
  for (int n = 1; n <= 200; n += 7)
    for (int offset : {0, 1, 8, 15})
      for (bool nt : {false, true}) {
        const Row in = randomRow(n, 3, uint32_t(n));
        Row out(n, 1, offset);
        copyBytes(in.data(), out.data(), n, nt);
        _mm_sfence();
        std::vector<uint8_t> want(n);
        for (int i = 0; i < n; ++i) want[i] = in.get(i, 0);
        expectRow(out, want, nt ? "streamed copy" : "copy", n);
      }
}

}  // namespace
