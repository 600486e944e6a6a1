// Scalar formulas of the packed-word readers: the fixed points of black
// and white, every form against the colour matrix it approximates over all
// field combinations, and how often body and tail forms part.
#include "packed16/packed_read_formulas.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>

#include "packed16/packed_fields.h"

namespace {

using namespace zel::unpack;
using zel::packed::Layout555;
using zel::packed::Layout565;
using zel::packed::unpackRgb;

TEST(PackedReadFormulas, BlackAndWhite) {
  for (int v : {int(studioLumaBody(0, 0, 0)), int(studioLumaTail(0, 0, 0))}) EXPECT_EQ(v, 16);
  for (int v : {StudioChromaBody<4>::cb(0, 0, 0), StudioChromaBody<4>::cr(0, 0, 0), StudioChromaBody<2>::cb(0, 0, 0),
                StudioChromaBody<2>::cr(0, 0, 0), StudioChromaTail<4>::cb(0, 0, 0), StudioChromaTail<4>::cr(0, 0, 0),
                StudioChromaTail<2>::cb(0, 0, 0), StudioChromaTail<2>::cr(0, 0, 0), studioLoneCb(0, 0, 0)})
    EXPECT_EQ(v, 128);
  // White expands to 248, 252, 248 (565) and 248, 248, 248 (555); bit 15
  // of a 555 word is no field.
  const auto w565 = unpackRgb<Layout565>(0xFFFF, true), w555 = unpackRgb<Layout555>(0xFFFF, true);
  EXPECT_EQ(w565.g, 252);
  EXPECT_EQ(w555.g, 248);
  EXPECT_EQ(unpackRgb<Layout555>(0x7FFF, true).r, w555.r);
  EXPECT_EQ(studioLumaBody(w565.r, w565.g, w565.b), 231);
  EXPECT_EQ(studioLumaTail(w565.r, w565.g, w565.b), 231);
  EXPECT_EQ(studioLumaBody(w555.r, w555.g, w555.b), 229);
  EXPECT_EQ(studioLumaTail(w555.r, w555.g, w555.b), 229);
  // Black is 0, 128, 128 in YUV; red minus luma leaves the byte range and
  // V is clamped.
  EXPECT_EQ(yuvLumaBodyLane(0, 0, 0), 0);
  EXPECT_EQ(yuvChromaBody(0, 0, kYuvUGain), 128);
  EXPECT_EQ(YuvChromaTail4::u(0, 0), 128);
  EXPECT_EQ(YuvChromaTail2::v(0, 0), 128);
  EXPECT_EQ(yuvChromaFromTwice(0, 0, kYuvUGainRedLow), 128);
  EXPECT_EQ(YuvChromaTail4::v(4 * 248, 4 * yuvLumaSum(248, 0, 0)), 255);
  EXPECT_EQ(yuvChromaBody(4 * yuvLumaBodyLane(248, 0, 0), 4 * 248, kYuvVGain), 255);
}

template <typename F>
void forEachColour(F f) {
  for (int r5 = 0; r5 < 32; ++r5)
    for (int g6 = 0; g6 < 64; ++g6)
      for (int b5 = 0; b5 < 32; ++b5) f(r5 << 3, g6 << 2, b5 << 3);
}

// Uniform groups of every 565 colour: studio luma rounds (within 0.52),
// studio chroma truncates with 128.125 (within 0.9), the YUV forms stay
// within 1.5 of the matrix; U of the tails fits a byte unclamped.
TEST(PackedReadFormulas, EveryFormFollowsItsMatrix) {
  double studioY = 0, studioC = 0, yuv = 0;
  bool uFits = true;
  forEachColour([&](int r, int g, int b) {
    const double y = 16 + 0.25702 * r + 0.504 * g + 0.09802 * b;
    const double cb = 128 - 0.14799 * r - 0.291 * g + 0.439 * b, cr = 128 + 0.439 * r - 0.368 * g - 0.071 * b;
    studioY = std::max({studioY, std::abs(studioLumaBody(r, g, b) - y), std::abs(studioLumaTail(r, g, b) - y)});
    for (int k : {2, 4}) {
      const int R = k * r, G = k * g, B = k * b;
      const int c[] = {k == 4 ? StudioChromaBody<4>::cb(R, G, B) : StudioChromaBody<2>::cb(R, G, B),
                       k == 4 ? StudioChromaTail<4>::cb(R, G, B) : StudioChromaTail<2>::cb(R, G, B),
                       k == 4 ? StudioChromaBody<4>::cr(R, G, B) : StudioChromaBody<2>::cr(R, G, B),
                       k == 4 ? StudioChromaTail<4>::cr(R, G, B) : StudioChromaTail<2>::cr(R, G, B)};
      studioC = std::max({studioC, std::abs(c[0] - cb), std::abs(c[1] - cb), std::abs(c[2] - cr), std::abs(c[3] - cr)});
    }
    studioC = std::max(studioC, std::abs(studioLoneCb(r, g, b) - cb));

    const double l = 0.299 * r + 0.587 * g + 0.114 * b;
    const double u = 0.492 * (b - l) + 128, v = std::clamp(0.877 * (r - l) + 128, 0.0, 255.0);
    const int yb = yuvLumaBodyLane(r, g, b), y2 = yuvLumaTwice(r, g, b);
    const int32_t s = yuvLumaSum(r, g, b);
    const double got[][3] = {
        {double(zel::SaturateU8(yb)), double(yuvChromaBody(4 * yb, 4 * b, kYuvUGain)),
         double(yuvChromaBody(4 * yb, 4 * r, kYuvVGain))},
        {double((s + 32768) >> 16), double(YuvChromaTail4::u(4 * b, 4 * s)), double(YuvChromaTail4::v(4 * r, 4 * s))},
        {double(s >> 16), double(YuvChromaTail2::u(2 * b, 2 * s)), double(YuvChromaTail2::v(2 * r, 2 * s))},
        {double(yuvLumaFromTwice(y2)), double(yuvChromaFromTwice(2 * b, y2, kYuvUGainRedLow)),
         double(yuvChromaFromTwice(2 * r, y2, kYuvVGain))}};
    for (const auto& p : got) yuv = std::max({yuv, std::abs(p[0] - l), std::abs(p[1] - u), std::abs(p[2] - v)});
    const int32_t raw = ((YuvChromaTail4::difference(4 * b, 4 * s) * kYuvUTail) >> 18) + 128;
    uFits = uFits && raw >= 0 && raw <= 255;
  });
  EXPECT_LE(studioY, 0.52);
  EXPECT_LE(studioC, 0.9);
  EXPECT_LE(yuv, 1.5);
  EXPECT_TRUE(uFits);
}

// Studio body and tail part by one at most: luma in about 0.3% of the
// field combinations, 4:2:0 chroma in about 0.8%.
TEST(PackedReadFormulas, BodyAndTailPartRarelyAndByOne) {
  int luma = 0, chroma = 0, total = 0, worst = 0;
  forEachColour([&](int r, int g, int b) {
    ++total;
    const int R = 4 * r, G = 4 * g, B = 4 * b;
    const int dy = studioLumaBody(r, g, b) - studioLumaTail(r, g, b);
    const int dcb = StudioChromaBody<4>::cb(R, G, B) - StudioChromaTail<4>::cb(R, G, B);
    const int dcr = StudioChromaBody<4>::cr(R, G, B) - StudioChromaTail<4>::cr(R, G, B);
    luma += dy != 0;
    chroma += (dcb != 0) + (dcr != 0);
    worst = std::max({worst, std::abs(dy), std::abs(dcb), std::abs(dcr)});
  });
  EXPECT_EQ(worst, 1);
  EXPECT_NEAR(100.0 * luma / total, 0.3, 0.1);
  EXPECT_NEAR(100.0 * chroma / (2 * total), 0.8, 0.2);
}

}  // namespace
