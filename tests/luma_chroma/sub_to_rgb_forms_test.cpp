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

// Values worked out by hand from the formulas, chosen where two forms that
// could stand for one another part in the last bit.
TEST(SubsampledForms, WorkedValues) {
  using F = Rgb8 (*)(int, int, int);
  struct Case {
    const char* form;
    F f;
    int y, u, v;
    Rgb8 want;
  };
  const F centredA = [](int y, int u, int v) { return pairLanesCentred(pairLanesA, y, u, v); };
  const F rawA = [](int y, int u, int v) { return pairLanesRaw(pairLanesA, y, u, v); };
  const F rawB = [](int y, int u, int v) { return pairLanesRaw(pairLanesB, y, u, v); };
  const F lanesB = [](int y, int u, int v) { return laneAdded(lanes601b, y, u, v, 8); };
  const F lanes7 = [](int y, int u, int v) { return laneAdded(lanes709, y, u, v, 8); };
  const F wide7 = [](int y, int u, int v) { return wideRounded(wide709, y, u, v); };
  const F wideA = [](int y, int u, int v) { return wideRounded(wide601a, y, u, v); };
  const F wideATruncated = [](int y, int u, int v) { return wideTruncated(wide601a, y, u, v); };
  const F wide411r = [](int y, int u, int v) { return wideRounded(wide411, y, u, v); };
  const F hdtv = [](int y, int u, int v) { return lumaSixteenths(lanesHDTV, y, u, v); };
  const F hdtvWide = [](int y, int u, int v) { return wideRounded(wideHDTV, y, u, v); };
  const F quad = [](int y, int u, int v) { return lumaSixteenths(lanesYuvQuad, y, u, v); };
  const F halves2 = [](int y, int u, int v) { return YuvHalvesForm{rgbLanes2Set}.pixel(y, u, v); };
  const F halves1 = [](int y, int u, int v) { return YuvHalvesForm{rgbLanes1Set}.pixel(y, u, v); };
  const F yuvWide = [](int y, int u, int v) { return YuvWideForm{rgbWideA, {32768, 32768, 32768}}.pixel(y, u, v); };
  const Case cases[] = {
      // L(219, 4769) = 2039 and 2039 >> 3 = 254; the lane form reaches 255.
      {"centred A", centredA, 235, 128, 128, {254, 254, 254}},
      {"lanes 601b", lanesB, 235, 128, 128, {255, 255, 255}},
      {"centred A", centredA, 44, 205, 246, {220, 0, 187}},
      {"lanes 601b", lanesB, 44, 205, 246, {221, 0, 188}},
      // The raw form's offsets: set A rounds green up where set B does not.
      {"raw A", rawA, 128, 128, 128, {130, 131, 130}},
      {"raw B", rawB, 128, 128, 128, {130, 130, 130}},
      {"raw B", rawB, 235, 128, 128, {254, 255, 254}},
      {"raw B", rawB, 84, 111, 30, {0, 165, 44}},
      {"wide 601a", wideA, 84, 111, 30, {0, 165, 45}},
      {"lanes 709", lanes7, 219, 86, 135, {249, 241, 147}},
      {"wide 709", wide7, 219, 86, 135, {249, 242, 147}},
      // (76294 * 90 - 25625 * -99 - 53281 * 3 - 1187936) >> 16 = 122; the 601 constants give 123.
      {"wide 411", wide411r, 90, 29, 131, {91, 122, 0}},
      {"wide 601a", wideA, 90, 29, 131, {91, 123, 0}},
      // (76284 * 160 + 104595 * 132 - 14608761) >> 16 = 173; the exact offset gives 174.
      {"raw", wideRaw, 160, 252, 132, {173, 115, 255}},
      {"wide 601a truncated", wideATruncated, 160, 252, 132, {174, 115, 255}},
      {"raw", wideRaw, 235, 128, 128, {254, 254, 254}},
      // The HDTV forms keep the luma bias: black only for Y = 0.
      {"hdtv", hdtv, 0, 128, 128, {0, 0, 0}},
      {"hdtv", hdtv, 16, 128, 128, {16, 16, 16}},
      {"hdtv wide", hdtvWide, 16, 128, 128, {16, 16, 16}},
      {"hdtv", hdtv, 195, 158, 176, {255, 168, 249}},
      {"hdtv wide", hdtvWide, 195, 158, 176, {255, 167, 249}},
      {"halves, second set", halves2, 8, 161, 12, {0, 62, 75}},
      {"halves, first set", halves1, 8, 161, 12, {0, 61, 75}},
      {"quad lanes", quad, 212, 44, 124, {207, 248, 41}},
      {"yuv wide rounded", yuvWide, 212, 44, 124, {207, 247, 41}},
  };
  for (const Case& c : cases)
    EXPECT_EQ(str(c.f(c.y, c.u, c.v)), str(c.want)) << c.form << " at " << c.y << "," << c.u << "," << c.v;
}

// ---- vector forms against scalar forms ----

// A 4:2:2 row whose chroma runs through all 65536 pairs of samples, luma
// from a seed; the whole row is body, converted in vector blocks.
template <class Form>
void expectVectorMatchesScalar(const char* name, const Form& form, zel::VectorTier tier) {
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
    expandRow(row, kWidth, kWidth, form, form, tier);
    for (int x = 0; x < kWidth; ++x) {
      const Rgb8 want = form.pixel(y[x], cb[x / 2], cr[x / 2]);
      const Rgb8 got{out[3 * x], out[3 * x + 1], out[3 * x + 2]};
      if (str(got) != str(want)) {
        FAIL() << name << " (tier " << int(tier) << ") at " << int(y[x]) << "," << int(cb[x / 2]) << ","
               << int(cr[x / 2]) << ": " << str(got) << " for " << str(want);
      }
    }
  }
}

std::vector<zel::VectorTier> vectorTiers() {
  std::vector<zel::VectorTier> t;
  for (int k = 0; k <= int(zel::widestTierWithBytePermutes()); ++k) t.push_back(zel::VectorTier(k));
  return t;
}

TEST(SubsampledForms, VectorFormsMatchTheirScalarFormsOnEveryChromaPair) {
  for (zel::VectorTier tier : vectorTiers()) {
    expectVectorMatchesScalar("lanes 601a", LanesForm{lanes601a}, tier);
    expectVectorMatchesScalar("lanes 601b", LanesForm{lanes601b}, tier);
    expectVectorMatchesScalar("lanes 709", LanesForm{lanes709}, tier);
    expectVectorMatchesScalar("pair centred A", PairCentredForm{pairLanesA}, tier);
    expectVectorMatchesScalar("pair raw A", PairRawForm{pairLanesA}, tier);
    expectVectorMatchesScalar("pair raw B", PairRawForm{pairLanesB}, tier);
    expectVectorMatchesScalar("hdtv", SixteenthsForm{lanesHDTV}, tier);
    expectVectorMatchesScalar("yuv quad", SixteenthsForm{lanesYuvQuad}, tier);
    expectVectorMatchesScalar("halves 2", YuvHalvesForm{rgbLanes2Set}, tier);
    expectVectorMatchesScalar("halves 1", YuvHalvesForm{rgbLanes1Set}, tier);
    expectVectorMatchesScalar("yuv wide truncated", YuvWideForm{rgbWideA, {0, 0, 0}}, tier);
    expectVectorMatchesScalar("yuv wide rounded", YuvWideForm{rgbWideA, {32768, 32768, 32768}}, tier);
  }
}

}  // namespace
