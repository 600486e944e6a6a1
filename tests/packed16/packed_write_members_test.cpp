// Every packed writer against its model at widths 1..70, on both vector
// widths, at odd addresses with padded rows; then the particular cases of
// the plain members: the frame's statuses, the one-column path, steps, the
// shared 565 packer and the width that decides a pixel's form.
#include <gtest/gtest.h>

#include <cstring>

#include "packed16/packed_write_model.h"
#include "zelcc/zelcc.h"

namespace {

using namespace zel::pack;
using namespace zel::pack::test;

const Member& member(const std::string& name) {
  static const std::vector<Member> all = writers();
  for (const Member& m : all)
    if (m.name == name) return m;
  throw std::runtime_error("no member " + name);
}

TEST(PackedWriters, EveryMemberFollowsItsFormsAtEveryWidth) {
  const std::vector<Member> all = writers();
  ASSERT_EQ(all.size(), 76u);
  for (const Member& m : all)
    for (int h : {1, 2, 3, 6})
      for (int w = 1; w <= 70; ++w) {
        if (m.shape == Shape::QuarterPlanes && w < 4) continue;
        if (m.shape == Shape::Pairs && !m.dither && w == 1) continue;  // unpacked bytes, below
        const int offset = 1 + (w * 5) % 15, pad = (w * 3) % 7;
        Call viaPublic(m, w, h, offset, pad, uint32_t(w * 31 + h));
        const Status s = viaPublic.callPublic(w & 1);
        const bool warns = m.shape == Shape::QuarterPlanes && (w & 3);
        ASSERT_EQ(int(s), warns ? int(StatusOddSizeWarning) : int(StatusOk)) << m.name << " width " << w;
        ASSERT_EQ(viaPublic.mismatch(), "");
        Call viaSse(m, w, h, offset + 1, pad, uint32_t(w * 31 + h));
        viaSse.drive(false);
        ASSERT_EQ(viaSse.mismatch(), "") << "SSE4.1 blocks";
        // Unused top bits stay zero.
        const int unused = m.target.packing == Packing::P444 ? 0xF000 : m.target.packing == Packing::P555 ? 0x8000 : 0;
        for (int x = 0; x < w; ++x)
          if (viaSse.expected(x, 0) >= 0) ASSERT_EQ(viaSse.dst.get(x, 0) & unused, 0) << m.name;
      }
}

TEST(PackedWriters, SizesAndStatusesOfTheFrame) {
  // 4:1:1 needs four columns and warns when the width is no multiple of 4.
  for (int w : {3, 4, 5, 6, 7, 8}) {
    Call c(member("zeliYCbCr411ToBGR565_8u16u_P3C3R"), w, 2, 3, 0, 7);
    const Status want = w < 4 ? StatusSizeError : (w & 3) ? StatusOddSizeWarning : StatusOk;
    EXPECT_EQ(int(c.callPublic()), int(want)) << w;
    if (w >= 4) EXPECT_EQ(c.mismatch(), "") << "six columns are all written and warned about";
  }
  // 1 x 1 YUV 4:2:0 writes nothing; YCbCr 4:2:0 writes its one word.
  Call yuv(member("zeliYUV420ToBGR565_8u16u_P3C3R"), 1, 1, 1, 0, 3);
  EXPECT_EQ(int(yuv.callPublic()), int(StatusOk));
  EXPECT_EQ(yuv.dst.get(0, 0), Call::kUnwritten);
  Call ycc(member("zeliYCbCr420ToBGR565_8u16u_P3C3R"), 1, 1, 1, 0, 3);
  EXPECT_EQ(int(ycc.callPublic()), int(StatusOk));
  EXPECT_EQ(ycc.dst.get(0, 0), ycc.expected(0, 0));
  // A null plane with an empty size is a size error; with a good size a
  // null pointer.
  const uint8_t y[4] = {}, *planes[3] = {y, nullptr, y};
  const int steps[3] = {2, 1, 1};
  uint16_t out[4];
  EXPECT_EQ(int(zeliYCbCr420ToRGB555_8u16u_P3C3R(planes, steps, out, 4, {0, 2})), int(StatusSizeError));
  EXPECT_EQ(int(zeliYCbCr420ToRGB555_8u16u_P3C3R(planes, steps, out, 4, {2, 2})), int(StatusNullPointerError));
  EXPECT_EQ(int(zeliYCbCr411ToBGR555_8u16u_P3C3R(planes, steps, out, 8, {0, 2})), int(StatusNullPointerError));
}

TEST(PackedWriters, OneColumnOfInterleaved422WritesThreeBytesAtHalfSteps) {
  // Y 120 and the chroma byte 130 give R, G, B = 124, 118, 125 by the
  // one-column form, Y 235 and 16 give 76, 255, 29; rows start dstStep >> 1
  // bytes apart.
  const uint8_t src[3][2] = {{120, 130}, {120, 130}, {235, 16}};
  for (const char* name : {"zeliYCbCr422ToBGR565_8u16u_C2C3R", "zeliYCbCr422ToRGB444_8u16u_C2C3R"}) {
    uint8_t dst[40];
    std::memset(dst, 0xEE, sizeof dst);
    const int dstStep = 17;  // rows 8 bytes apart
    EXPECT_EQ(int(reinterpret_cast<BytesFn>(member(name).impl)(src[0], 2, reinterpret_cast<uint16_t*>(dst), dstStep,
                                                               {1, 3})),
              int(StatusOk));
    const uint8_t want[24] = {124, 118, 125, 0xEE, 0xEE, 0xEE, 0xEE, 0xEE, 124, 118, 125, 0xEE,
                              0xEE, 0xEE, 0xEE, 0xEE, 76,  255, 29,  0xEE, 0xEE, 0xEE, 0xEE, 0xEE};
    EXPECT_EQ(std::memcmp(dst, want, 24), 0) << name;
    for (int i = 24; i < 40; ++i) EXPECT_EQ(dst[i], 0xEE);
  }
}

TEST(PackedWriters, NegativeStepsWalkUpwards) {
  const Member& m = member("zeliYCbCrToRGB555_8u16u_C3R");
  Call c(m, 11, 3, 5, 2, 9);
  const uint8_t* lastSrc = c.src[0].row(2);
  uint16_t* lastDst = c.dst.row(2);
  EXPECT_EQ(int(zeliYCbCrToRGB555_8u16u_C3R(lastSrc, -c.src[0].step(), lastDst, -c.dst.step(), {11, 3})),
            int(StatusOk));
  EXPECT_EQ(c.mismatch(), "");
}

TEST(PackedWriters, BothNamesOf565PackingAreOneFunction) {
  EXPECT_EQ(reinterpret_cast<void*>(&zeliBGRToBGR565_8u16u_C3R), reinterpret_cast<void*>(&zeliRGBToRGB565_8u16u_C3R));
  // The first byte goes low, the third high: fields 31, 1, 1 make 0x083F.
  const uint8_t px[3] = {0xFF, 0x07, 0x0F};
  uint16_t word = 0;
  EXPECT_EQ(int(zeliRGBToRGB565_8u16u_C3R(px, 3, &word, 2, {1, 1})), int(StatusOk));
  EXPECT_EQ(word, 0x083F);
}

// A pixel whose lane form and last-pixel form differ in their words:
// placed at column `x`, it takes the lane form at `bodyWidth` and the other
// form at `tailWidth`.
void expectWidthDecides(const char* name, int x, int bodyWidth, int tailWidth, int y0, int c1, int c2) {
  const Member& m = member(name);
  uint16_t words[2];
  for (int k = 0; k < 2; ++k) {
    const int w = k ? tailWidth : bodyWidth;
    Call c(m, w, 2, 1, 0, 1);
    for (int yy = 0; yy < 2; ++yy)
      for (int i = 0; i < c.src[0].rowSamples(); ++i) {
        if (m.planar()) c.src[0].set(i, yy, uint8_t(y0));
        else if (m.shape == Shape::Pairs) c.src[0].set(i, yy, uint8_t(i % 2 == 0 ? y0 : i % 4 == 1 ? c1 : c2));
        else c.src[0].set(i, yy, uint8_t(i % 3 == 0 ? y0 : i % 3 == 1 ? c1 : c2));
      }
    if (m.planar()) {
      c.src[1].fill(uint8_t(c1));
      c.src[2].fill(uint8_t(c2));
    }
    c.callPublic();
    EXPECT_EQ(c.mismatch(), "");
    words[k] = c.dst.get(x, 0);
  }
  EXPECT_NE(words[0], words[1]) << name;
}

TEST(PackedWriters, TheWidthDecidesWhichFormAPixelTakes) {
  // (16, 43, 115): green 44 by the lane form, 43 truncated.
  expectWidthDecides("zeliYCbCrToBGR565_8u16u_C3R", 0, 8, 7, 16, 43, 115);
  // (60, 0, 126): red 47 by the lane form, 48 by the offset form of pairs.
  expectWidthDecides("zeliYCbCr422ToBGR565_8u16u_C2C3R", 8, 16, 10, 60, 0, 126);
  // (60, 0, 7): green 199 by the lane form, 200 rounded.
  expectWidthDecides("zeliYCbCr411ToBGR565_8u16u_P3C3R", 4, 8, 5, 60, 0, 7);
  // (60, 0, 84): green 136 by the YUV lane form, 135 by the 16.16 form.
  expectWidthDecides("zeliYUV420ToRGB565_8u16u_P3C3R", 2, 4, 3, 60, 0, 84);
}

}  // namespace
