// The YUV forms: published reference values, values worked out by hand from
// the formulas, and every vector form against its scalar form lane by lane.
#include <gtest/gtest.h>

#include <random>
#include <vector>

#include "luma_chroma/yuv_lanes.h"
#include "luma_chroma/yuv_lane_check.h"

namespace {

using namespace zel::lc;
using namespace zel::lc::test;

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

ZEL_LANE_FORM(DifferenceRounded, yuvDifferenceRounded)
ZEL_LANE_FORM(DifferenceTruncated, yuvDifferenceTruncated)
ZEL_LANE_FORM(DifferenceLanes, yuvDifferenceLanes)
ZEL_LANE_FORM(MatrixLanes, yuvMatrixLanes)
ZEL_LANE_FORM(MatrixWide, yuvMatrixWide)
ZEL_LANE_FORM(Lanes1, rgbLanes1)
ZEL_LANE_FORM(Lanes2, rgbLanes2)
ZEL_LANE_FORM(Lanes3, rgbLanes3)

struct WideForm {
  const RgbWideSet* set;
  RgbRounding rounding;
  Pixel8 scalar(int y, int u, int v) const { return rgbWide(*set, rounding, y, u, v); }
  template <class U>
  ZEL_INLINE Trio<U> vec(const Trio<U>& t) const {
    return rgbWide<U>(*set, rounding, t);
  }
};

TEST(YuvForms, VectorFormsGiveTheScalarBitsLaneByLane) {
  const std::vector<Triple>& t = sampleTriples();
  for (bool avx2 : vectorWidths()) {
    expectLanesMatch("yuvDifferenceRounded", DifferenceRounded{}, avx2, t);
    expectLanesMatch("yuvDifferenceTruncated", DifferenceTruncated{}, avx2, t);
    expectLanesMatch("yuvDifferenceLanes", DifferenceLanes{}, avx2, t);
    expectLanesMatch("yuvMatrixLanes", MatrixLanes{}, avx2, t);
    expectLanesMatch("yuvMatrixWide", MatrixWide{}, avx2, t);
    expectLanesMatch("rgbLanes1", Lanes1{}, avx2, t);
    expectLanesMatch("rgbLanes2", Lanes2{}, avx2, t);
    expectLanesMatch("rgbLanes3", Lanes3{}, avx2, t);
    const RgbRounding roundings[] = {{32768, 0, 32768}, {32768, 32768, 32768}, {0, 0, 0}};
    for (const RgbWideSet* set : {&rgbWideA, &rgbWideB})
      for (const RgbRounding& r : roundings) expectLanesMatch("rgbWide", WideForm{set, r}, avx2, t);
  }
}

}  // namespace
