// The forms of the subsampled-to-RGB members: values worked out by hand
// from the formulas, where two forms part in the last bit, and every
// vector form against its scalar form over every pair of chroma samples.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "luma_chroma/sub_to_rgb_rows.h"
#include "support/test_image.h"

namespace {

using namespace zel::lc;
using namespace zel::lc::expand;

std::string str(Rgb8 p) { return std::to_string(p.r) + "," + std::to_string(p.g) + "," + std::to_string(p.b); }

struct Worked {
  int y, u, v;
  Rgb8 want;
};

void expectWorked(const char* form, Rgb8 (*f)(int, int, int), std::initializer_list<Worked> cases) {
  for (const Worked& c : cases)
    EXPECT_EQ(str(f(c.y, c.u, c.v)), str(c.want)) << form << " at " << c.y << "," << c.u << "," << c.v;
}

TEST(SubsampledForms, PairLanesCentredAndRawPartWhereTheirOffsetsDo) {
  // y = 219: L(219, 4769) = 2039; 2039 >> 3 = 254 in the centred form. The
  // raw form takes L(235, 4769) = 2188 less the set's offsets.
  expectWorked("centred A", [](int y, int u, int v) { return pairLanesCentred(pairLanesA, y, u, v); },
               {{235, 128, 128, {254, 254, 254}}, {16, 128, 128, {0, 0, 0}}, {44, 205, 246, {220, 0, 187}}});
  expectWorked("raw A", [](int y, int u, int v) { return pairLanesRaw(pairLanesA, y, u, v); },
               {{235, 128, 128, {255, 255, 255}}, {128, 128, 128, {130, 131, 130}}, {145, 54, 34, {0, 255, 1}}});
  expectWorked("raw B", [](int y, int u, int v) { return pairLanesRaw(pairLanesB, y, u, v); },
               {{235, 128, 128, {254, 255, 254}}, {128, 128, 128, {130, 130, 130}}, {84, 111, 30, {0, 165, 44}}});
}

TEST(SubsampledForms, LaneFormsAgainstTheirWideTails) {
  auto lanesB = [](int y, int u, int v) { return laneAdded(lanes601b, y, u, v, 8); };
  auto lanes7 = [](int y, int u, int v) { return laneAdded(lanes709, y, u, v, 8); };
  expectWorked("lanes 601b", lanesB, {{235, 128, 128, {255, 255, 255}}, {44, 205, 246, {221, 0, 188}}});
  expectWorked("lanes 709", lanes7, {{219, 86, 135, {249, 241, 147}}, {81, 90, 240, {255, 24, 0}}});
  expectWorked("wide 709", [](int y, int u, int v) { return wideRounded(wide709, y, u, v); },
               {{219, 86, 135, {249, 242, 147}}});
  expectWorked("wide 601a", [](int y, int u, int v) { return wideRounded(wide601a, y, u, v); },
               {{84, 111, 30, {0, 165, 45}}, {90, 29, 131, {91, 123, 0}}});
}

TEST(SubsampledForms, FourOneOneTailCarriesItsOwnConstants) {
  // 76294 Y and -25625 u: (76294 * 90 - 25625 * -99 - 53281 * 3 - 1187936) >> 16 = 122, where
  // the 601 constants give 123.
  expectWorked("wide 411", [](int y, int u, int v) { return wideRounded(wide411, y, u, v); },
               {{90, 29, 131, {91, 122, 0}}, {176, 181, 128, {186, 166, 255}}, {76, 30, 215, {209, 37, 0}}});
}

TEST(SubsampledForms, RawWideOffsetsLieShortOfTheCentringConstants) {
  // R of (160, 252, 132): (76284 * 160 + 104595 * 132 - 14608761) >> 16 = 173; the exact offset gives 174.
  expectWorked("raw", wideRaw,
               {{160, 252, 132, {173, 115, 255}}, {135, 109, 107, {104, 163, 100}}, {235, 128, 128, {254, 254, 254}}});
  expectWorked("wide 601a truncated", [](int y, int u, int v) { return wideTruncated(wide601a, y, u, v); },
               {{160, 252, 132, {174, 115, 255}}, {135, 109, 107, {105, 163, 100}}});
}

TEST(SubsampledForms, HdtvFormsKeepTheLumaBias) {
  const auto hdtv = [](int y, int u, int v) { return lumaSixteenths(lanesHDTV, y, u, v); };
  const auto wide = [](int y, int u, int v) { return wideRounded(wideHDTV, y, u, v); };
  // Black only for Y = 0: a neutral Y of 16 stays 16.
  expectWorked("hdtv lanes", hdtv,
               {{0, 128, 128, {0, 0, 0}}, {16, 128, 128, {16, 16, 16}}, {195, 158, 176, {255, 168, 249}}});
  expectWorked("hdtv wide", wide,
               {{0, 128, 128, {0, 0, 0}}, {16, 128, 128, {16, 16, 16}}, {195, 158, 176, {255, 167, 249}}});
}

TEST(SubsampledForms, YuvLaneShapesAndSets) {
  expectWorked("halves, second set", [](int y, int u, int v) { return YuvHalvesForm{rgbLanes2Set}.pixel(y, u, v); },
               {{8, 161, 12, {0, 62, 75}}, {81, 90, 240, {208, 30, 3}}});
  expectWorked("halves, first set", [](int y, int u, int v) { return YuvHalvesForm{rgbLanes1Set}.pixel(y, u, v); },
               {{8, 161, 12, {0, 61, 75}}, {91, 161, 0, {0, 151, 158}}});
  expectWorked("quad lanes", [](int y, int u, int v) { return lumaSixteenths(lanesYuvQuad, y, u, v); },
               {{212, 44, 124, {207, 248, 41}}, {128, 128, 128, {128, 128, 128}}});
  expectWorked("wide A rounded",
               [](int y, int u, int v) { return YuvWideForm{rgbWideA, {32768, 32768, 32768}}.pixel(y, u, v); },
               {{212, 44, 124, {207, 247, 41}}});
}

// ---- vector forms against scalar forms ----

// A 4:2:2 row whose chroma runs through all 65536 pairs of samples, luma
// from a seed; the whole row is body, converted in vector blocks.
template <class Form>
void expectVectorMatchesScalar(const char* name, const Form& form, bool avx2) {
  constexpr int kPairs = 65536, kWidth = 2 * kPairs;
  std::vector<uint8_t> cb(kPairs), cr(kPairs), out(3 * kWidth);
  for (int k = 0; k < kPairs; ++k) {
    cb[k] = uint8_t(k);
    cr[k] = uint8_t(k >> 8);
  }
  for (int seed : {0, 255}) {
    std::vector<uint8_t> y(kWidth);
    for (int x = 0; x < kWidth; ++x) y[x] = uint8_t(x * 97 + seed + (x >> 9));
    const RowSet<1, LumaRow, ChromaPlanes<2>, PackedOut3<false>> row{
        {LumaRow{y.data()}}, ChromaPlanes<2>{cb.data(), cr.data()}, {PackedOut3<false>{out.data()}}};
    expandRow(row, kWidth, kWidth, form, form, avx2);
    for (int x = 0; x < kWidth; ++x) {
      const Rgb8 want = form.pixel(y[x], cb[x / 2], cr[x / 2]);
      const Rgb8 got{out[3 * x], out[3 * x + 1], out[3 * x + 2]};
      if (str(got) != str(want)) {
        FAIL() << name << (avx2 ? " (AVX2)" : " (SSE4.1)") << " at " << int(y[x]) << "," << int(cb[x / 2]) << ","
               << int(cr[x / 2]) << ": " << str(got) << " for " << str(want);
      }
    }
  }
}

std::vector<bool> vectorWidths() {
  std::vector<bool> w{false};
  if (zel::hasAvx2()) w.push_back(true);
  return w;
}

TEST(SubsampledForms, VectorFormsMatchTheirScalarFormsOnEveryChromaPair) {
  for (bool avx2 : vectorWidths()) {
    expectVectorMatchesScalar("lanes 601a", LanesForm{lanes601a}, avx2);
    expectVectorMatchesScalar("lanes 601b", LanesForm{lanes601b}, avx2);
    expectVectorMatchesScalar("lanes 709", LanesForm{lanes709}, avx2);
    expectVectorMatchesScalar("pair centred A", PairCentredForm{pairLanesA}, avx2);
    expectVectorMatchesScalar("pair raw A", PairRawForm{pairLanesA}, avx2);
    expectVectorMatchesScalar("pair raw B", PairRawForm{pairLanesB}, avx2);
    expectVectorMatchesScalar("hdtv", SixteenthsForm{lanesHDTV}, avx2);
    expectVectorMatchesScalar("yuv quad", SixteenthsForm{lanesYuvQuad}, avx2);
    expectVectorMatchesScalar("halves 2", YuvHalvesForm{rgbLanes2Set}, avx2);
    expectVectorMatchesScalar("halves 1", YuvHalvesForm{rgbLanes1Set}, avx2);
    expectVectorMatchesScalar("yuv wide truncated", YuvWideForm{rgbWideA, {0, 0, 0}}, avx2);
    expectVectorMatchesScalar("yuv wide rounded", YuvWideForm{rgbWideA, {32768, 32768, 32768}}, avx2);
  }
}

}  // namespace
