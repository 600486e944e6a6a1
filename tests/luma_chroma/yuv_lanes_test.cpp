// The YUV forms: published reference values, values worked out by hand from
// the formulas, and every vector form against its scalar form lane by lane.
#include <gtest/gtest.h>

#include <random>
#include <vector>

#include "luma_chroma/yuv_lanes.h"

namespace {

using namespace zel;

struct Triple {
  int a, b, c;
};

std::string str(Pixel8 p) {
  return std::to_string(p.c0) + "," + std::to_string(p.c1) + "," + std::to_string(p.c2);
}
std::string str(Triple t) { return std::to_string(t.a) + "," + std::to_string(t.b) + "," + std::to_string(t.c); }
int packed(Pixel8 p) { return p.c0 << 16 | p.c1 << 8 | p.c2; }

void expectPixel(Pixel8 got, Triple want, const std::string& what) {
  EXPECT_EQ(str(got), str(want)) << what;
}

TEST(YuvForms, ReferenceValuesOfTheFiveForwardForms) {
  struct Row {
    Triple rgb, rounded, truncated, lanes, matrixLanes, matrixWide;
  };
  const Row rows[] = {
      {{0, 0, 0}, {0, 128, 128}, {0, 128, 128}, {0, 127, 127}, {0, 128, 128}, {0, 128, 128}},
      {{255, 255, 255}, {255, 128, 128}, {255, 128, 128}, {255, 128, 128}, {254, 127, 127}, {254, 128, 128}},
      {{0, 255, 0}, {150, 54, 0}, {149, 54, 0}, {150, 54, 0}, {149, 54, 0}, {149, 54, 0}},
      {{0, 0, 255}, {29, 239, 102}, {29, 239, 102}, {29, 238, 102}, {29, 239, 102}, {29, 239, 102}},
  };
  for (const Row& r : rows) {
    const std::string in = str(r.rgb);
    expectPixel(yuvDifferenceRounded(r.rgb.a, r.rgb.b, r.rgb.c), r.rounded, "rounded " + in);
    expectPixel(yuvDifferenceTruncated(r.rgb.a, r.rgb.b, r.rgb.c), r.truncated, "truncated " + in);
    expectPixel(yuvDifferenceLanes(r.rgb.a, r.rgb.b, r.rgb.c), r.lanes, "lanes " + in);
    expectPixel(yuvMatrixLanes(r.rgb.a, r.rgb.b, r.rgb.c), r.matrixLanes, "matrix lanes " + in);
    expectPixel(yuvMatrixWide(r.rgb.a, r.rgb.b, r.rgb.c), r.matrixWide, "matrix wide " + in);
  }
}

TEST(YuvForms, InverseFormsDifferWhereTheirConstantsAndRoundingDo) {
  // Worked through by hand from each form's formula: the sets and rounding
  // terms show in the last bit.
  struct Row {
    Triple yuv, lanes1, lanes2, lanes3, wideAGreenTruncated, wideARounded, wideB;
  };
  const Row rows[] = {
      {{128, 128, 128}, {128, 128, 128}, {128, 128, 128}, {128, 128, 128}, {128, 128, 128}, {128, 128, 128},
       {128, 128, 128}},
      {{128, 170, 178}, {185, 81, 213}, {184, 81, 213}, {185, 83, 213}, {185, 82, 213}, {185, 82, 213},
       {184, 82, 213}},
      {{118, 161, 233}, {237, 42, 185}, {237, 44, 185}, {238, 44, 185}, {238, 43, 185}, {238, 44, 185},
       {237, 43, 185}},
      {{81, 90, 240}, {208, 29, 3}, {208, 30, 3}, {209, 31, 4}, {209, 30, 4}, {209, 31, 4}, {208, 30, 3}},
      {{0, 0, 0}, {0, 124, 0}, {0, 124, 0}, {0, 125, 0}, {0, 124, 0}, {0, 125, 0}, {0, 124, 0}},
      {{255, 255, 255}, {255, 130, 255}, {255, 130, 255}, {255, 131, 255}, {255, 131, 255}, {255, 131, 255},
       {255, 131, 255}},
  };
  const RgbRounding greenTruncated{32768, 0, 32768}, allRounded{32768, 32768, 32768}, none{0, 0, 0};
  for (const Row& r : rows) {
    const int y = r.yuv.a, u = r.yuv.b, v = r.yuv.c;
    const std::string in = str(r.yuv);
    expectPixel(rgbLanes1(y, u, v), r.lanes1, "lanes1 " + in);
    expectPixel(rgbLanes2(y, u, v), r.lanes2, "lanes2 " + in);
    expectPixel(rgbLanes3(y, u, v), r.lanes3, "lanes3 " + in);
    expectPixel(rgbWide(rgbWideA, greenTruncated, y, u, v), r.wideAGreenTruncated, "wide A " + in);
    expectPixel(rgbWide(rgbWideA, allRounded, y, u, v), r.wideARounded, "wide A rounded " + in);
    expectPixel(rgbWide(rgbWideB, none, y, u, v), r.wideB, "wide B " + in);
  }
}

// Sample triples for the lane comparisons: a grid with the extremes, then
// random triples.
const std::vector<Triple>& sampleTriples() {
  static const std::vector<Triple> all = [] {
    std::vector<int> levels;
  for (int v = 0; v < 256; v += 7) levels.push_back(v);
  for (int v : {1, 2, 127, 128, 129, 254, 255}) levels.push_back(v);
  std::vector<Triple> out;
  for (int a : levels)
    for (int b : levels)
      for (int c : levels) out.push_back({a, b, c});
  std::mt19937 rng(2024);
  for (int i = 0; i < 60000; ++i) out.push_back({int(rng() & 255), int(rng() & 255), int(rng() & 255)});
  while (out.size() % 16) out.push_back({255, 255, 255});
  return out;
  }();
  return all;
}

// Runs `vec` over eight (SSE) or sixteen (AVX2) triples at a time and checks
// each lane, after the byte pack, against `scalar`.
template <typename Scalar, typename Vec>
void expectLanesMatch(const char* name, Scalar scalar, Vec vec) {
  const std::vector<Triple>& triples = sampleTriples();
  for (size_t i = 0; i < triples.size(); i += 8) {
    alignas(16) int16_t a[8], b[8], c[8];
    for (int k = 0; k < 8; ++k) {
      a[k] = int16_t(triples[i + k].a);
      b[k] = int16_t(triples[i + k].b);
      c[k] = int16_t(triples[i + k].c);
    }
    const Lanes3 r = vec(_mm_load_si128(reinterpret_cast<const __m128i*>(a)),
                         _mm_load_si128(reinterpret_cast<const __m128i*>(b)),
                         _mm_load_si128(reinterpret_cast<const __m128i*>(c)));
    alignas(16) uint8_t o0[16], o1[16], o2[16];
    _mm_store_si128(reinterpret_cast<__m128i*>(o0), _mm_packus_epi16(r.c0, r.c0));
    _mm_store_si128(reinterpret_cast<__m128i*>(o1), _mm_packus_epi16(r.c1, r.c1));
    _mm_store_si128(reinterpret_cast<__m128i*>(o2), _mm_packus_epi16(r.c2, r.c2));
    for (int k = 0; k < 8; ++k) {
      const Triple& t = triples[i + k];
      const Pixel8 want = scalar(t.a, t.b, t.c), got{o0[k], o1[k], o2[k]};
      if (packed(got) != packed(want)) FAIL() << name << " at " << str(t) << ": " << str(got) << " for " << str(want);
    }
  }
}

template <typename Scalar, typename Vec>
ZEL_AVX2 void expectLanesMatchAvx2(const char* name, Scalar scalar, Vec vec) {
  const std::vector<Triple>& triples = sampleTriples();
  for (size_t i = 0; i < triples.size(); i += 16) {
    alignas(32) int16_t a[16], b[16], c[16];
    for (int k = 0; k < 16; ++k) {
      a[k] = int16_t(triples[i + k].a);
      b[k] = int16_t(triples[i + k].b);
      c[k] = int16_t(triples[i + k].c);
    }
    const Lanes3x16 r = vec(_mm256_load_si256(reinterpret_cast<const __m256i*>(a)),
                            _mm256_load_si256(reinterpret_cast<const __m256i*>(b)),
                            _mm256_load_si256(reinterpret_cast<const __m256i*>(c)));
    alignas(32) int16_t o[3][16];
    _mm256_store_si256(reinterpret_cast<__m256i*>(o[0]), r.c0);
    _mm256_store_si256(reinterpret_cast<__m256i*>(o[1]), r.c1);
    _mm256_store_si256(reinterpret_cast<__m256i*>(o[2]), r.c2);
    for (int k = 0; k < 16; ++k) {
      const Triple& t = triples[i + k];
      const Pixel8 got{SaturateU8(o[0][k]), SaturateU8(o[1][k]), SaturateU8(o[2][k])};
      const Pixel8 want = scalar(t.a, t.b, t.c);
      if (packed(got) != packed(want)) FAIL() << name << " at " << str(t) << ": " << str(got) << " for " << str(want);
    }
  }
}

using S = Pixel8 (*)(int, int, int);
using V = Lanes3 (*)(__m128i, __m128i, __m128i);
using X = Lanes3x16 (*)(__m256i, __m256i, __m256i);

TEST(YuvForms, VectorFormsGiveTheScalarBitsLaneByLane) {
  expectLanesMatch("yuvDifferenceRounded", S(yuvDifferenceRounded), V(yuvDifferenceRounded));
  expectLanesMatch("yuvDifferenceTruncated", S(yuvDifferenceTruncated), V(yuvDifferenceTruncated));
  expectLanesMatch("yuvDifferenceLanes", S(yuvDifferenceLanes), V(yuvDifferenceLanes));
  expectLanesMatch("yuvMatrixLanes", S(yuvMatrixLanes), V(yuvMatrixLanes));
  expectLanesMatch("yuvMatrixWide", S(yuvMatrixWide), V(yuvMatrixWide));
  expectLanesMatch("rgbLanes1", S(rgbLanes1), V(rgbLanes1));
  expectLanesMatch("rgbLanes2", S(rgbLanes2), V(rgbLanes2));
  expectLanesMatch("rgbLanes3", S(rgbLanes3), V(rgbLanes3));
  const RgbRounding roundings[] = {{32768, 0, 32768}, {32768, 32768, 32768}, {0, 0, 0}};
  for (const RgbWideSet* set : {&rgbWideA, &rgbWideB})
    for (const RgbRounding& r : roundings)
      expectLanesMatch(
          "rgbWide", [&](int y, int u, int v) { return rgbWide(*set, r, y, u, v); },
          [&](__m128i y, __m128i u, __m128i v) { return rgbWide(*set, r, y, u, v); });
}

TEST(YuvForms, Avx2FormsGiveTheScalarBitsLaneByLane) {
  if (!hasAvx2()) GTEST_SKIP() << "no AVX2 on this processor";
  expectLanesMatchAvx2("yuvDifferenceLanes", S(yuvDifferenceLanes), X(yuvDifferenceLanes));
  expectLanesMatchAvx2("yuvMatrixLanes", S(yuvMatrixLanes), X(yuvMatrixLanes));
  expectLanesMatchAvx2("rgbLanes1", S(rgbLanes1), X(rgbLanes1));
  expectLanesMatchAvx2("rgbLanes2", S(rgbLanes2), X(rgbLanes2));
  expectLanesMatchAvx2("rgbLanes3", S(rgbLanes3), X(rgbLanes3));
}

TEST(YuvForms, SubtractedGreenFloorsDifferentlyFromAddedNegatives) {
  // The same third-set constants added as negatives would floor the other
  // way: somewhere in the range the two greens must part.
  int differ = 0;
  for (int u = 0; u < 256; ++u)
    for (int v = 0; v < 256; ++v) {
      const Pixel8 sub = rgbLanes3(100, u, v);
      const Pixel8 add = rgbLanesShape<3, 7, 4, 3, false>(RgbLaneSet{4669, -2380, -1614, 8323}, 100, u, v);
      EXPECT_EQ(sub.c0, add.c0);
      EXPECT_EQ(sub.c2, add.c2);
      EXPECT_LE(std::abs(sub.c1 - add.c1), 1);
      differ += sub.c1 != add.c1;
    }
  EXPECT_GT(differ, 0);
}

}  // namespace
