// Field layouts, the two reductions and the colour forms of the packed
// writers: worked values, and the vector blocks lane by lane against the
// scalar forms on random samples.
#include <gtest/gtest.h>

#include <random>

#include "frame/simd.h"
#include "packed16/packed_write_forms.h"
#include "packed16/packed_write_lanes.h"

namespace {

using namespace zel::pack;

template <class L>
uint16_t truncated(bool redHigh, int r, int g, int b) {
  return Truncating<L>{redHigh}.word({r, g, b}, 0, 0);
}

TEST(PackedFields, NamesListTheFieldsFromTheLowBitsUp) {
  // Pure red, green and blue at full strength, BGR names then RGB names.
  EXPECT_EQ(truncated<Layout565>(true, 255, 0, 0), 0xF800);
  EXPECT_EQ(truncated<Layout565>(false, 255, 0, 0), 0x001F);
  EXPECT_EQ(truncated<Layout565>(true, 0, 255, 0), 0x07E0);
  EXPECT_EQ(truncated<Layout565>(false, 0, 0, 255), 0xF800);
  EXPECT_EQ(truncated<Layout555>(true, 255, 0, 0), 0x7C00);
  EXPECT_EQ(truncated<Layout555>(false, 255, 0, 0), 0x001F);
  EXPECT_EQ(truncated<Layout555>(true, 0, 255, 0), 0x03E0);
  EXPECT_EQ(truncated<Layout555>(true, 255, 255, 255), 0x7FFF);
  EXPECT_EQ(truncated<Layout444>(true, 255, 0, 0), 0x0F00);
  EXPECT_EQ(truncated<Layout444>(false, 255, 0, 0), 0x000F);
  EXPECT_EQ(truncated<Layout444>(true, 0, 255, 0), 0x00F0);
  EXPECT_EQ(truncated<Layout444>(false, 255, 255, 255), 0x0FFF);
  // Truncation: the low bits go, nothing rounds.
  EXPECT_EQ(truncated<Layout565>(false, 7, 3, 0), 0);
  EXPECT_EQ(truncated<Layout565>(false, 8, 4, 0), 0x0021);
  EXPECT_EQ(truncated<Layout444>(false, 15, 16, 0), 0x0010);
}

TEST(PackedFields, OrderedDitherThresholds) {
  for (int y = 0; y < 8; ++y)
    for (int x = 0; x < 8; ++x) {
      // Colour 0 never rises; 255 fills a 4- and a 5-bit field.
      EXPECT_EQ(ditherToField<5>(0, ditherThreshold<5>(x, y)), 0);
      EXPECT_EQ(ditherToField<6>(0, ditherThreshold<6>(x, y)), 0);
      EXPECT_EQ(ditherToField<5>(255, ditherThreshold<5>(x, y)), 31);
      EXPECT_EQ(ditherToField<4>(255, ditherThreshold<4>(x, y)), 15);
      // At 6 bits white lies 1048 above level 62, equal to the halved 2097
      // of (0, 3): the comparison is strict, so that place stays at 62.
      EXPECT_EQ(ditherToField<6>(255, ditherThreshold<6>(x, y)), (x & 3) == 0 && (y & 3) == 3 ? 62 : 63);
      // Colour 1 at 5 bits is 256 above 0: only thresholds 0 and 139 are
      // below it.
      const bool rises = ((x & 3) == 0 && (y & 3) == 0) || ((x & 3) == 2 && (y & 3) == 2);
      EXPECT_EQ(ditherToField<5>(1, ditherThreshold<5>(x, y)), rises ? 1 : 0) << x << "," << y;
    }
  // One threshold serves the three fields of a pixel: 254 lies 1874 above
  // level 30 of a 5-bit field and 792 above level 62 of the 6-bit green.
  const Dithering<Layout565> bgr{true};
  EXPECT_EQ(bgr.word({254, 254, 254}, 2, 1), (30 << 11) | (62 << 5) | 30);  // T 1957, T / 2 978
  EXPECT_EQ(bgr.word({254, 254, 254}, 0, 1), (31 << 11) | (62 << 5) | 31);  // T 1678, T / 2 839
  EXPECT_EQ(bgr.word({254, 254, 254}, 0, 0), 0xFFFF);
}

TEST(PackedForms, WorkedValues) {
  auto eq = [](Rgb c, int r, int g, int b) { return c.r == r && c.g == g && c.b == b; };
  EXPECT_TRUE(eq(ycbcrLaneForm(16, 128, 128), 0, 0, 0));
  EXPECT_TRUE(eq(ycbcrLaneForm(235, 128, 128), 254, 254, 254));
  EXPECT_TRUE(eq(ycbcrLaneForm(255, 128, 128), 255, 255, 255));
  EXPECT_TRUE(eq(ycbcrLaneForm(81, 90, 240), 254, 0, 0));
  EXPECT_TRUE(eq(ycbcrLaneForm(100, 60, 200), 212, 65, 0));
  EXPECT_TRUE(eq(ycbcrRoundedForm(100, 60, 200), 213, 66, 0));
  EXPECT_TRUE(eq(ycbcrLaneForm(50, 180, 100), 0, 42, 144));
  EXPECT_TRUE(eq(ycbcrTruncatedForm(50, 180, 100), 0, 41, 144));
  EXPECT_TRUE(eq(ycbcrOffsetForm(60, 0, 126), 48, 103, 0));
  EXPECT_TRUE(eq(ycbcrLaneForm(60, 0, 126), 47, 103, 0));
  EXPECT_TRUE(eq(ycbcrOneColumnForm(120, 130), 124, 118, 125));
  EXPECT_TRUE(eq(yuvLaneForm(100, 60, 200), 182, 85, 0));
  EXPECT_TRUE(eq(yuvWideForm(100, 60, 200), 182, 84, 0));
  EXPECT_TRUE(eq(yuvLaneForm(255, 128, 128), 255, 255, 255));
  EXPECT_TRUE(eq(yuvWideForm(0, 128, 128), 0, 0, 0));
}

// One block of the given form and reduction in unit U, from 16-bit samples.
template <class U, class Form, class Writer>
ZEL_INLINE void blockWords(const Form& form, const Writer& writer, int y, const int16_t* s0, const int16_t* s1, const int16_t* s2,
                uint16_t* out) {
  auto ld = [](const int16_t* p) ZEL_LAMBDA_INLINE {
    if constexpr (U::kWords == 8) return zel::load128(p);
    else return zel::load256(p);
  };
  U::storeWords(out, wordsOfBlock<U>(Trio<U>{ld(s0), ld(s1), ld(s2)}, form, writer, RowWords<U, Writer>(writer, y)));
}

template <class Form, class Writer>
ZEL_AVX2 __attribute__((flatten)) void blockWordsAvx(const Form& form, const Writer& writer, int y, const int16_t* s0,
                                                     const int16_t* s1, const int16_t* s2, uint16_t* out) {
  blockWords<AvxWords>(form, writer, y, s0, s1, s2, out);
}

template <class Form, class Writer>
void expectLanesMatch(const Form& form, const Writer& writer, const char* what) {
  std::mt19937 rng(17);
  int16_t s[3][16];
  for (int round = 0; round < 3000; ++round) {
    for (auto& plane : s)
      for (int16_t& v : plane) v = int16_t(round < 2 ? (round ? 255 : 0) : rng() & 255);
    const int y = round & 3;
    uint16_t sse[16], avx[16];
    blockWords<SseWords>(form, writer, y, s[0], s[1], s[2], sse);
    blockWords<SseWords>(form, writer, y, s[0] + 8, s[1] + 8, s[2] + 8, sse + 8);
    if (zel::hasAvx2()) blockWordsAvx(form, writer, y, s[0], s[1], s[2], avx);
    for (int i = 0; i < 16; ++i) {
      const uint16_t want = writer.word(form.pixel({s[0][i], s[1][i], s[2][i]}), i, y);
      ASSERT_EQ(sse[i], want) << what << " lane " << i;
      if (zel::hasAvx2()) ASSERT_EQ(avx[i], want) << what << " AVX2 lane " << i;
    }
  }
}

TEST(PackedForms, VectorLanesMatchTheScalarForms) {
  for (bool high : {false, true}) {
    expectLanesMatch(YCbCrLanes{}, Truncating<Layout565>{high}, "YCbCr 565");
    expectLanesMatch(YCbCrLanes{}, Dithering<Layout565>{high}, "YCbCr dithered 565");
    expectLanesMatch(YCbCrLanes{}, Dithering<Layout555>{high}, "YCbCr dithered 555");
    expectLanesMatch(YCbCrLanes{}, Truncating<Layout444>{high}, "YCbCr 444");
    expectLanesMatch(YuvLanes{}, Dithering<Layout444>{high}, "YUV dithered 444");
    expectLanesMatch(YuvLanes{}, Truncating<Layout555>{high}, "YUV 555");
  }
  expectLanesMatch(SameBytes{}, Truncating<Layout565>{false}, "bytes 565");
}

}  // namespace
