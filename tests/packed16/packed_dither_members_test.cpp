// The dithered writers as a caller sees them: the pattern of white in every
// member, the pattern restarting at the corner of each region, and the lone
// last pixel of interleaved 4:2:2. (Odd sizes, dithered at their true
// coordinates without a warning, are in the member walk over all widths.)
#include <gtest/gtest.h>

#include "packed16/packed_write_model.h"
#include "zelcc/zelcc.h"

namespace {

using namespace zel::pack;
using namespace zel::pack::test;

std::vector<Member> ditheredWriters() {
  std::vector<Member> out;
  for (const Member& m : writers())
    if (m.dither) out.push_back(m);
  return out;
}

// Every sample of a call set to Y (or to chroma c where it is chroma).
void fillFlat(Call& c, int y, int chroma) {
  if (c.m.planar()) {
    c.src[0].fill(uint8_t(y));
    c.src[1].fill(uint8_t(chroma));
    c.src[2].fill(uint8_t(chroma));
    return;
  }
  const int stride = c.m.shape == Shape::Pairs ? 2 : 3;
  for (int r = 0; r < c.height; ++r)
    for (int i = 0; i < c.src[0].rowSamples(); ++i) c.src[0].set(i, r, uint8_t(i % stride == 0 ? y : chroma));
}

TEST(PackedDither, WhiteLeavesOneGreenStepPerTileIn565) {
  const std::vector<Member> all = ditheredWriters();
  ASSERT_EQ(all.size(), 36u);
  for (const Member& m : all) {
    Call c(m, 9, 7, 3, 2, 1);
    fillFlat(c, 255, 128);  // R = G = B = 255 in both transforms
    ASSERT_EQ(int(c.callPublic()), int(StatusOk)) << m.name;
    for (int y = 0; y < 7; ++y)
      for (int x = 0; x < 9; ++x) {
        int want = m.target.packing == Packing::P444 ? 0x0FFF : m.target.packing == Packing::P555 ? 0x7FFF : 0xFFFF;
        if (m.target.packing == Packing::P565 && (x & 3) == 0 && (y & 3) == 3) want = 0xFFDF;  // green 62
        ASSERT_EQ(c.dst.get(x, y), want) << m.name << " " << x << "," << y;
      }
    // Black stays black.
    fillFlat(c, m.shape == Shape::Yuv420Planes ? 0 : 16, 128);
    c.callPublic();
    for (int y = 0; y < 7; ++y)
      for (int x = 0; x < 9; ++x) ASSERT_EQ(c.dst.get(x, y), 0) << m.name;
  }
}

TEST(PackedDither, ThePatternRestartsAtTheRegionsCorner) {
  // A region that starts at column 1, row 2 of a larger image is dithered
  // as if it were an image of its own.
  for (const char* name : {"zeliYCbCrToRGB555Dither_8u16u_C3R", "zeliYCbCr420ToBGR444Dither_8u16u_P3C3R"}) {
    const Member* m = nullptr;
    const std::vector<Member> all = ditheredWriters();
    for (const Member& k : all)
      if (k.name == name) m = &k;
    ASSERT_NE(m, nullptr);
    Call whole(*m, 12, 8, 1, 0, 2), region(*m, 11, 6, 1, 0, 2);
    fillFlat(whole, 130, 100);
    fillFlat(region, 130, 100);
    whole.callPublic();
    const int cx = m->planar() ? 0 : 1, rx = m->planar() ? 1 : 3;  // one pixel in
    uint16_t* dst = whole.dst.row(2) + 1;
    if (m->planar()) {
      const uint8_t* const planes[3] = {whole.src[0].row(2) + rx, whole.src[1].row(1) + cx, whole.src[2].row(1) + cx};
      const int steps[3] = {whole.src[0].step(), whole.src[1].step(), whole.src[2].step()};
      reinterpret_cast<PlanesFn>(m->impl)(planes, steps, dst, whole.dst.step(), {11, 6});
    } else {
      reinterpret_cast<BytesFn>(m->impl)(whole.src[0].row(2) + rx, whole.src[0].step(), dst, whole.dst.step(), {11, 6});
    }
    region.callPublic();
    for (int y = 0; y < 6; ++y)
      for (int x = 0; x < 11; ++x) ASSERT_EQ(whole.dst.get(x + 1, y + 2), region.dst.get(x, y)) << name;
    // The flat colour does rise and fall over the tile.
    EXPECT_NE(region.dst.get(0, 0), region.dst.get(1, 0));
  }
}

TEST(PackedDither, LoneLastPairPixelTakesTheByteAfterItsLuma) {
  // Width 3: the last pixel reads Y and the next byte, which serves as both
  // chroma samples; the plain twin takes Cr from the pair before instead.
  const uint8_t src[6] = {90, 60, 90, 200, 150, 40};
  uint16_t dither[3], plain[3];
  ASSERT_EQ(int(zeliYCbCr422ToRGB565Dither_8u16u_C2C3R(src, 6, dither, 6, {3, 1})), int(StatusOk));
  ASSERT_EQ(int(zeliYCbCr422ToRGB565_8u16u_C2C3R(src, 6, plain, 6, {3, 1})), int(StatusOk));
  const Rgb d = ycbcrLaneForm(150, 40, 40), p = ycbcrTruncatedForm(150, 40, 200);
  EXPECT_EQ(dither[2], Dithering<Layout565>{false}.word(d, 2, 0));
  EXPECT_EQ(plain[2], Truncating<Layout565>{false}.word(p, 2, 0));
  EXPECT_NE(dither[2] & 0x1F, plain[2] & 0x1F) << "red follows the Cr that was read";
}

}  // namespace
