// The arithmetic forms of the YCbCr matrices: reference values, and how
// the forms stand to one another.
#include <gtest/gtest.h>

#include <vector>

#include "luma_chroma/rgb_to_ycbcr_forms.h"
#include "luma_chroma/ycbcr_lanes.h"

namespace {

using namespace zel::lc;

struct Reference {
  int r, g, b;
  YCbCr8 wide, highWord, rounded;
};

// (R, G, B) to (Y, Cb, Cr) in the three forms.
const Reference kForward[] = {
    {0, 0, 0, {16, 128, 128}, {16, 128, 128}, {16, 128, 128}},
    {255, 255, 255, {235, 128, 128}, {235, 128, 128}, {235, 128, 128}},
    {255, 0, 0, {82, 90, 240}, {82, 90, 240}, {81, 90, 239}},
    {0, 255, 0, {145, 54, 34}, {145, 54, 34}, {144, 53, 34}},
    {0, 0, 255, {41, 240, 110}, {41, 240, 110}, {41, 239, 109}},
    {100, 150, 200, {137, 157, 103}, {137, 157, 102}, {136, 157, 102}},
};

void expectSame(const YCbCr8& got, const YCbCr8& want, const char* form, const Reference& ref) {
  EXPECT_EQ(int(got.y), int(want.y)) << form << " Y of " << ref.r << "," << ref.g << "," << ref.b;
  EXPECT_EQ(int(got.cb), int(want.cb)) << form << " Cb of " << ref.r << "," << ref.g << "," << ref.b;
  EXPECT_EQ(int(got.cr), int(want.cr)) << form << " Cr of " << ref.r << "," << ref.g << "," << ref.b;
}

TEST(RgbToYCbCrForms, ReferenceValues) {
  for (const Reference& ref : kForward) {
    expectSame(ycbcrWide(ref.r, ref.g, ref.b), ref.wide, "wide", ref);
    expectSame(ycbcrHighWord(ref.r, ref.g, ref.b), ref.highWord, "high-word", ref);
    expectSame(ycbcrRounded(ref.r, ref.g, ref.b), ref.rounded, "rounded", ref);
  }
}

// Pixels at which a change of one unit in any constant of a form shows.
TEST(RgbToYCbCrForms, EveryConstantShows) {
  const std::pair<YCbCr8, YCbCr8> cases[] = {
      {ycbcrWide(235, 241, 231), {220, 124, 126}}, {ycbcrWide(250, 131, 71), {153, 84, 185}},
      {ycbcrWide(107, 247, 149), {183, 106, 73}}, {ycbcrWide(124, 103, 140), {114, 141, 135}},
      {ycbcrWide(86, 64, 68), {77, 127, 137}}, {ycbcrHighWord(172, 238, 177), {197, 111, 103}},
      {ycbcrHighWord(135, 100, 96), {111, 121, 144}}, {ycbcrHighWord(10, 169, 194), {123, 163, 56}},
      {ycbcrHighWord(99, 165, 130), {137, 122, 101}}, {ycbcrHighWord(225, 206, 45), {182, 54, 148}},
      {ycbcrHighWord(36, 48, 192), {68, 193, 113}}, {ycbcrHighWord(147, 213, 23), {163, 54, 113}},
      {ycbcrHighWord(112, 148, 185), {138, 150, 110}}, {ycbcrHighWord(198, 238, 48), {192, 51, 124}},
      {ycbcrHighWord(50, 42, 197), {69, 195, 120}}, {ycbcrHighWord(31, 0, 187), {42, 205, 128}},
      {ycbcrRounded(192, 225, 247), {203, 142, 112}}, {ycbcrRounded(183, 161, 171), {160, 129, 136}},
      {ycbcrRounded(184, 240, 196), {203, 117, 106}}, {ycbcrRounded(116, 68, 157), {95, 159, 142}},
      {ycbcrRounded(199, 223, 239), {202, 138, 116}}, {ycbcrRounded(19, 143, 102), {103, 128, 76}},
  };
  int line = 0;
  for (const auto& [got, want] : cases) {
    EXPECT_TRUE(got.y == want.y && got.cb == want.cb && got.cr == want.cr)
        << "case " << line << ": " << int(got.y) << "," << int(got.cb) << "," << int(got.cr);
    ++line;
  }
}

// The wide form is never below the others and at most one above; the
// high-word form nearly always agrees, the rounded one is low about half
// the time.
TEST(RgbToYCbCrForms, WideFormBoundsTheOthers) {
  long samples = 0, highEqual = 0, roundedLow = 0;
  auto channels = [](const YCbCr8& p) { return std::vector<int>{p.y, p.cb, p.cr}; };
  for (int r = 0; r < 256; r += 3)
    for (int g = 1; g < 256; g += 3)
      for (int b = 2; b < 256; b += 3) {
        const auto w = channels(ycbcrWide(r, g, b)), h = channels(ycbcrHighWord(r, g, b)),
                   o = channels(ycbcrRounded(r, g, b));
        for (int c = 0; c < 3; ++c) {
          ASSERT_TRUE(w[c] - h[c] == 0 || w[c] - h[c] == 1) << r << "," << g << "," << b << " channel " << c;
          ASSERT_TRUE(w[c] - o[c] == 0 || w[c] - o[c] == 1) << r << "," << g << "," << b << " channel " << c;
          ASSERT_TRUE(w[c] >= 16 && w[c] <= 240);
          highEqual += w[c] == h[c];
          roundedLow += w[c] != o[c];
          ++samples;
        }
      }
  EXPECT_GT(double(highEqual) / samples, 0.99);
  EXPECT_GT(double(roundedLow) / samples, 0.4);
  EXPECT_LT(double(roundedLow) / samples, 0.5);
}

// ---- YCbCr to RGB ----

TEST(YCbCrLanes, WorkedExamples) {
  // Y 235 neutral: the wide truncated form stops at 254 ...
  const Rgb8 truncated = wideTruncated(wide601a, 235, 128, 128);
  EXPECT_EQ(int(truncated.r), 254);
  EXPECT_EQ(int(truncated.g), 254);
  EXPECT_EQ(int(truncated.b), 254);
  // ... the rounded one reaches 255,
  EXPECT_EQ(int(wideRounded(wide601a, 235, 128, 128).g), 255);
  // the lane form without rounding term gives 4078 >> 4 = 254, with it 255.
  EXPECT_EQ(int(laneAdded(lanes601a, 235, 128, 128, 0).r), 254);
  EXPECT_EQ(int(laneAdded(lanes601a, 235, 128, 128, 8).r), 255);
  EXPECT_EQ(int(laneAddedSums(lanes601a, lumaLane(235), 0, 0, 0).r), 4078 >> 4);
  // Below the luma floor the negative sums clamp to 0 in every form.
  for (int y = 0; y < 16; ++y)
    for (const LaneSet& s : {lanes601a, lanes601b, lanes709}) {
      const Rgb8 a = laneAdded(s, y, 128, 128, 8), b = laneSubtracted(s, y, 128, 128);
      const Rgb8 t = wideTruncated(wide601a, y, 128, 128), r = wideRounded(wide601b, y, 128, 128);
      EXPECT_EQ(a.r | a.g | a.b | b.r | b.g | b.b | t.r | t.g | t.b | r.r | r.g | r.b, 0) << "Y " << y;
    }
}

// Pixels at which a change of one unit in any constant of a set, the other
// rounding term, or the other green of the lane forms shows.
TEST(YCbCrLanes, EveryConstantShows) {
  const std::pair<Rgb8, Rgb8> cases[] = {
      {laneAdded(lanes601a, 117, 81, 254, 8), {255, 34, 23}}, {laneAdded(lanes601a, 147, 57, 113, 8), {128, 192, 9}},
      {laneAdded(lanes601a, 242, 198, 218, 8), {255, 163, 255}}, {laneAdded(lanes601a, 22, 220, 27, 8), {0, 53, 192}},
      {laneAdded(lanes601a, 151, 91, 153, 8), {197, 151, 82}}, {laneAdded(lanes601a, 11, 254, 236, 8), {166, 0, 248}},
      {laneAdded(lanes601a, 150, 31, 241, 0), {255, 101, 0}}, {laneAdded(lanes601a, 32, 91, 231, 0), {183, 0, 0}},
      {laneAdded(lanes601a, 74, 226, 15, 0), {0, 120, 255}}, {laneAdded(lanes601a, 18, 227, 57, 0), {0, 21, 201}},
      {laneAdded(lanes601a, 191, 28, 40, 0), {63, 255, 1}}, {laneAdded(lanes601a, 65, 178, 227, 0), {214, 0, 157}},
      {laneAdded(lanes601b, 57, 117, 147, 8), {78, 36, 26}}, {laneAdded(lanes601b, 248, 39, 107, 8), {236, 255, 90}},
      {laneAdded(lanes601b, 187, 54, 243, 8), {255, 135, 50}}, {laneAdded(lanes601b, 61, 216, 244, 8), {238, 0, 230}},
      {laneAdded(lanes601b, 250, 11, 31, 8), {118, 255, 36}}, {laneSubtracted(lanes601b, 84, 54, 231), {244, 25, 0}},
      {laneSubtracted(lanes601b, 248, 39, 107), {236, 255, 90}},
      {laneSubtracted(lanes601b, 222, 238, 175), {255, 159, 255}},
      {laneSubtracted(lanes601b, 250, 11, 31), {118, 255, 36}}, {laneSubtracted(lanes601b, 22, 220, 27), {0, 53, 192}},
      {laneAdded(lanes709, 69, 211, 172, 8), {141, 21, 237}}, {laneAdded(lanes709, 128, 187, 207, 8), {255, 75, 255}},
      {laneAdded(lanes709, 97, 161, 93, 8), {31, 106, 164}}, {laneAdded(lanes709, 87, 153, 122, 8), {72, 80, 135}},
      {laneAdded(lanes709, 242, 165, 0, 8), {34, 255, 255}}, {laneAdded(lanes709, 104, 190, 32, 8), {0, 140, 234}},
      {laneSubtracted(lanes709, 164, 243, 35), {6, 198, 255}}, {laneSubtracted(lanes709, 216, 219, 53), {98, 253, 255}},
      {laneSubtracted(lanes709, 97, 161, 93), {31, 106, 164}}, {laneSubtracted(lanes709, 87, 153, 122), {72, 81, 135}},
      {laneSubtracted(lanes709, 103, 66, 27), {0, 169, 0}}, {laneSubtracted(lanes709, 104, 190, 32), {0, 141, 234}},
      {wideTruncated(wide601a, 23, 18, 164), {65, 21, 0}}, {wideTruncated(wide601a, 191, 28, 40), {63, 255, 2}},
      {wideTruncated(wide601a, 144, 155, 76), {66, 180, 203}}, {wideTruncated(wide601a, 222, 23, 12), {54, 255, 27}},
      {wideTruncated(wide601a, 149, 72, 33), {3, 253, 41}}, {wideRounded(wide601a, 116, 214, 4), {0, 184, 255}},
      {wideRounded(wide601a, 41, 220, 77), {0, 34, 215}}, {wideRounded(wide601a, 30, 140, 210), {147, 0, 41}},
      {wideRounded(wide601a, 59, 112, 216), {190, 0, 18}}, {wideRounded(wide601a, 40, 220, 181), {113, 0, 213}},
      {wideTruncated(wide601b, 176, 195, 203), {255, 98, 255}},
      {wideTruncated(wide601b, 160, 191, 214), {255, 73, 255}},
      {wideTruncated(wide601b, 136, 121, 147), {169, 126, 125}}, {wideTruncated(wide601b, 23, 18, 164), {65, 21, 0}},
      {wideTruncated(wide601b, 106, 148, 68), {8, 145, 145}}, {wideTruncated(wide601b, 163, 63, 28), {11, 255, 40}},
      {wideRounded(wide601b, 226, 14, 130), {248, 255, 14}}, {wideRounded(wide601b, 128, 63, 62), {25, 209, 0}},
      {wideRounded(wide601b, 133, 11, 93), {80, 211, 0}}, {wideRounded(wide601b, 200, 62, 216), {255, 168, 81}},
      {wideRounded(wide601b, 56, 55, 242), {228, 0, 0}}, {wideRounded(wide601b, 198, 224, 15), {31, 255, 255}},
  };
  int line = 0;
  for (const auto& [got, want] : cases) {
    EXPECT_TRUE(got.r == want.r && got.g == want.g && got.b == want.b)
        << "case " << line << ": " << int(got.r) << "," << int(got.g) << "," << int(got.b);
    ++line;
  }
}

// The subtracted green lies 0 or 1 above the added one and red and blue
// agree; the two lane sets of the BGR members agree on neutral pixels.
TEST(YCbCrLanes, FormsAgreeWhereTheyShould) {
  for (const LaneSet& set : {lanes601a, lanes601b, lanes709})
    for (int y = 0; y < 256; ++y)
      for (int u = 0; u < 256; u += 3)
        for (int v = 1; v < 256; v += 3) {
          const Rgb8 a = laneAdded(set, y, u, v, 8), s = laneSubtracted(set, y, u, v);
          ASSERT_TRUE(a.r == s.r && a.b == s.b && (s.g == a.g || s.g == a.g + 1)) << y << "," << u << "," << v;
        }
  for (int y = 0; y < 256; ++y) {
    const Rgb8 a = laneAdded(lanes601b, y, 128, 128, 8), b = laneAdded(lanes709, y, 128, 128, 8);
    EXPECT_TRUE(a.r == b.r && a.g == b.g && a.b == b.b) << "Y " << y;
    const Rgb8 c = laneSubtracted(lanes601b, y, 128, 128), d = laneSubtracted(lanes709, y, 128, 128);
    EXPECT_TRUE(c.r == d.r && c.g == d.g && c.b == d.b) << "Y " << y;
  }
}

}  // namespace
