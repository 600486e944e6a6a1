// Scalar formulas of the packed-word readers: field expansion, the fixed
// points of black and white, every form against the colour matrix it
// approximates over all field combinations, and how often body and tail
// forms part.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>

#include "packed16/packed_fields.h"
#include "packed16/packed_read_formulas.h"

namespace {

using namespace zel::unpack;
using zel::packed::Layout555;
using zel::packed::Layout565;
using zel::packed::Rgb;
using zel::packed::unpackRgb;

TEST(PackedFields, ExpansionLeavesTheLowBitsZero) {
  const Rgb white565 = unpackRgb<Layout565>(0xFFFF, true);
  EXPECT_EQ(white565.r, 248);
  EXPECT_EQ(white565.g, 252);
  EXPECT_EQ(white565.b, 248);
  // Blue low, red high in a BGR word; the other way in an RGB word.
  const uint16_t word = (3 << 11) | (5 << 5) | 7;
  EXPECT_EQ(unpackRgb<Layout565>(word, true).b, 7 << 3);
  EXPECT_EQ(unpackRgb<Layout565>(word, true).r, 3 << 3);
  EXPECT_EQ(unpackRgb<Layout565>(word, false).r, 7 << 3);
  EXPECT_EQ(unpackRgb<Layout565>(word, false).g, 5 << 2);
  // Bit 15 of a 555 word is no field.
  const uint16_t w555 = (17 << 10) | (9 << 5) | 30;
  const Rgb a = unpackRgb<Layout555>(w555, true), b = unpackRgb<Layout555>(uint16_t(w555 | 0x8000), true);
  EXPECT_EQ(a.r, 17 << 3);
  EXPECT_EQ(a.g, 9 << 3);
  EXPECT_EQ(a.b, 30 << 3);
  EXPECT_EQ(b.r, a.r);
  EXPECT_EQ(b.g, a.g);
  EXPECT_EQ(b.b, a.b);
}

TEST(PackedStudioForms, BlackAndWhite) {
  // Black gives 16, 128, 128 in every path.
  EXPECT_EQ(studioLumaBody(0, 0, 0), 16);
  EXPECT_EQ(studioLumaTail(0, 0, 0), 16);
  EXPECT_EQ(StudioChromaBody<4>::cb(0, 0, 0), 128);
  EXPECT_EQ(StudioChromaBody<4>::cr(0, 0, 0), 128);
  EXPECT_EQ(StudioChromaBody<2>::cb(0, 0, 0), 128);
  EXPECT_EQ(StudioChromaBody<2>::cr(0, 0, 0), 128);
  EXPECT_EQ(StudioChromaTail<4>::cb(0, 0, 0), 128);
  EXPECT_EQ(StudioChromaTail<4>::cr(0, 0, 0), 128);
  EXPECT_EQ(StudioChromaTail<2>::cb(0, 0, 0), 128);
  EXPECT_EQ(StudioChromaTail<2>::cr(0, 0, 0), 128);
  EXPECT_EQ(studioLoneCb(0, 0, 0), 128);
  // White words: 231 for 565 (green 252), 229 for 555 (green 248).
  EXPECT_EQ(studioLumaBody(248, 252, 248), 231);
  EXPECT_EQ(studioLumaTail(248, 252, 248), 231);
  EXPECT_EQ(studioLumaBody(248, 248, 248), 229);
  EXPECT_EQ(studioLumaTail(248, 248, 248), 229);
}

// Every field combination of a 565 word, as 8-bit expansions.
template <typename F>
void forEachColour(F f) {
  for (int r5 = 0; r5 < 32; ++r5)
    for (int g6 = 0; g6 < 64; ++g6)
      for (int b5 = 0; b5 < 32; ++b5) f(r5 << 3, g6 << 2, b5 << 3);
}

TEST(PackedStudioForms, FollowTheMatrixWithinRounding) {
  double worstLuma = 0, worstChroma = 0;
  forEachColour([&](int r, int g, int b) {
    const double y = 16 + 0.25702 * r + 0.504 * g + 0.09802 * b;
    const double cb = 128 - 0.14799 * r - 0.291 * g + 0.439 * b;
    const double cr = 128 + 0.439 * r - 0.368 * g - 0.071 * b;
    for (int v : {int(studioLumaBody(r, g, b)), int(studioLumaTail(r, g, b))})
      worstLuma = std::max(worstLuma, std::abs(v - y));
    // Uniform groups of two and four pixels; the lone pixel's Cb.
    const int cbs[] = {StudioChromaBody<4>::cb(4 * r, 4 * g, 4 * b), StudioChromaBody<2>::cb(2 * r, 2 * g, 2 * b),
                       StudioChromaTail<4>::cb(4 * r, 4 * g, 4 * b), StudioChromaTail<2>::cb(2 * r, 2 * g, 2 * b),
                       studioLoneCb(r, g, b)};
    const int crs[] = {StudioChromaBody<4>::cr(4 * r, 4 * g, 4 * b), StudioChromaBody<2>::cr(2 * r, 2 * g, 2 * b),
                       StudioChromaTail<4>::cr(4 * r, 4 * g, 4 * b), StudioChromaTail<2>::cr(2 * r, 2 * g, 2 * b)};
    for (int v : cbs) worstChroma = std::max(worstChroma, std::abs(v - cb));
    for (int v : crs) worstChroma = std::max(worstChroma, std::abs(v - cr));
  });
  EXPECT_LE(worstLuma, 0.52);   // rounded: 16.5 in both forms
  EXPECT_LE(worstChroma, 0.9);  // truncated with 128.125
}

// Body and tail part in the last bit for a few colours: luma in about 0.3%
// of the field combinations, 4:2:0 chroma in about 0.8%, never by more
// than one.
TEST(PackedStudioForms, BodyAndTailDifferRarelyAndByOne) {
  int lumaDiffers = 0, chromaDiffers = 0, total = 0, worst = 0;
  forEachColour([&](int r, int g, int b) {
    ++total;
    const int dy = studioLumaBody(r, g, b) - studioLumaTail(r, g, b);
    const int dcb = StudioChromaBody<4>::cb(4 * r, 4 * g, 4 * b) - StudioChromaTail<4>::cb(4 * r, 4 * g, 4 * b);
    const int dcr = StudioChromaBody<4>::cr(4 * r, 4 * g, 4 * b) - StudioChromaTail<4>::cr(4 * r, 4 * g, 4 * b);
    lumaDiffers += dy != 0;
    chromaDiffers += (dcb != 0) + (dcr != 0);
    worst = std::max({worst, std::abs(dy), std::abs(dcb), std::abs(dcr)});
  });
  EXPECT_EQ(worst, 1);
  EXPECT_NEAR(100.0 * lumaDiffers / total, 0.3, 0.1);
  EXPECT_NEAR(100.0 * chromaDiffers / (2 * total), 0.8, 0.2);
}

// The YUV forms of 2 x 2 blocks (blue-low words) and of the red-low 565
// member, on uniform groups.
struct YuvOfGroup {
  int y, u, v;
};

YuvOfGroup yuvBody(int r, int g, int b) {
  const int y = yuvLumaBodyLane(r, g, b);
  return {zel::SaturateU8(y), yuvChromaBody(4 * y, 4 * b, kYuvUGain), yuvChromaBody(4 * y, 4 * r, kYuvVGain)};
}

template <class Tail, bool Rounded>
YuvOfGroup yuvTail(int r, int g, int b, int pixels) {
  const int32_t s = yuvLumaSum(r, g, b);
  return {Rounded ? (s + 32768) >> 16 : s >> 16, Tail::u(pixels * b, pixels * s), Tail::v(pixels * r, pixels * s)};
}

YuvOfGroup yuvTwiceBody(int r, int g, int b, int pixels) {
  const int y2 = yuvLumaTwice(r, g, b);
  const int meanShift = pixels == 4 ? 2 : 1, sumShift = pixels == 4 ? 3 : 2;
  const int m = (pixels * y2) >> meanShift;
  return {yuvLumaFromTwice(y2), yuvChromaFromTwice((pixels * 4 * b) >> sumShift, m, kYuvUGainRedLow),
          yuvChromaFromTwice((pixels * 4 * r) >> sumShift, m, kYuvVGain)};
}

TEST(PackedYuvForms, BlackAndSaturatedRed) {
  for (const YuvOfGroup& p : {yuvBody(0, 0, 0), yuvTail<YuvChromaTail4, true>(0, 0, 0, 4),
                              yuvTail<YuvChromaTail2, false>(0, 0, 0, 2), yuvTwiceBody(0, 0, 0, 4),
                              yuvTwiceBody(0, 0, 0, 2)}) {
    EXPECT_EQ(p.y, 0);
    EXPECT_EQ(p.u, 128);
    EXPECT_EQ(p.v, 128);
  }
  // Red minus luma leaves the byte range: V is clamped in every form.
  for (const YuvOfGroup& p : {yuvBody(248, 0, 0), yuvTail<YuvChromaTail4, true>(248, 0, 0, 4),
                              yuvTail<YuvChromaTail2, false>(248, 0, 0, 2), yuvTwiceBody(248, 0, 0, 4)})
    EXPECT_EQ(p.v, 255);
}

TEST(PackedYuvForms, FollowTheMatrix) {
  double worst = 0;
  bool uFits = true;
  forEachColour([&](int r, int g, int b) {
    const double y = 0.299 * r + 0.587 * g + 0.114 * b;
    const double u = 0.492 * (b - y) + 128, v = std::min(255.0, std::max(0.0, 0.877 * (r - y) + 128));
    const YuvOfGroup forms[] = {yuvBody(r, g, b),
                                yuvTail<YuvChromaTail4, true>(r, g, b, 4),
                                yuvTail<YuvChromaTail4, false>(r, g, b, 4),
                                yuvTail<YuvChromaTail2, false>(r, g, b, 2),
                                yuvTwiceBody(r, g, b, 4),
                                yuvTwiceBody(r, g, b, 2)};
    for (const YuvOfGroup& p : forms)
      worst = std::max({worst, std::abs(p.y - y), std::abs(p.u - u), std::abs(p.v - v)});
    // U of the tails is stored unclamped: blue minus luma keeps it a byte.
    const int32_t s = yuvLumaSum(r, g, b);
    const int32_t raw = ((YuvChromaTail4::difference(4 * b, 4 * s) * kYuvUTail) >> 18) + 128;
    uFits = uFits && raw >= 0 && raw <= 255;
  });
  EXPECT_LE(worst, 1.5);
  EXPECT_TRUE(uFits);
}

}  // namespace
