// The vector levels of the homogeneity-directed row kernels against their
// scalar forms: every width from 1 to 70, misaligned rows, both site
// phases, full-range and end-of-range samples.
#include "demosaic/ahd_kernels.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <vector>

#include "frame/simd.h"
#include "support/test_image.h"

namespace {

using zel::VectorLevel;
using zel::test::TestImage;

std::vector<VectorLevel> vectorLevels() {
  std::vector<VectorLevel> out = {VectorLevel::Sse41};
  if (zel::hasAvx2()) out.push_back(VectorLevel::Avx2);
  return out;
}

// A row of samples with `reach` samples before the first pixel; every
// third seed pushes samples to the ends of the range.
template <typename T>
struct Row {
  TestImage<T> image;
  int reach;
  Row(int count, int reach_, int offset, uint32_t seed) : image(count + 2 * reach_, 1, offset), reach(reach_) {
    image.fillRandom(seed);
    if (seed % 3 == 0)
      for (int x = 0; x < image.rowSamples(); ++x) image.set(x, 0, image.get(x, 0) & 1 ? T(~T(0)) : T(0));
  }
  const T* at() const { return image.data() + reach; }
};

template <typename T>
void compareGreenAndColour() {
  for (int count = 1; count <= 70; ++count)
    for (int offset : {1, 3})
      for (bool firstGreen : {false, true}) {
        const uint32_t seed = uint32_t(count * 8 + offset * 2 + firstGreen);
        Row<T> c(count, 2, offset, seed), a(count, 2, offset, seed + 1), b(count, 2, offset, seed + 2);
        Row<T> l(count, 2, offset, seed + 3), r(count, 2, offset, seed + 4), s(count, 2, offset, seed + 5);
        std::vector<T> want(count + 1, T(9)), wantB(want);
        // Green along one row (taps at -2..2) and across five rows.
        const zel::GreenTaps<T> along{s.at(), s.at() - 2, s.at() + 2, s.at() - 1, s.at() + 1};
        const zel::GreenTaps<T> across{c.at(), a.at(), b.at(), l.at(), r.at()};
        // Colour from three green rows and three sample rows.
        const zel::ColourTaps<T> colour{a.at(), b.at(), c.at(), l.at(), r.at(), s.at()};
        for (const auto* taps : {&along, &across}) {
          zel::greenRowScalar(*taps, count, firstGreen, want.data());
          for (VectorLevel level : vectorLevels()) {
            std::vector<T> got(count + 1, T(9));
            zel::greenRow(*taps, count, firstGreen, got.data(), level);
            ASSERT_EQ(got, want) << "green, width " << count << " level " << int(level);
          }
        }
        for (bool redRow : {false, true}) {
          zel::colourRowScalar(colour, count, firstGreen, redRow, want.data(), wantB.data());
          for (VectorLevel level : vectorLevels()) {
            std::vector<T> got(count + 1, T(9)), gotB(got);
            zel::colourRow(colour, count, firstGreen, redRow, got.data(), gotB.data(), level);
            ASSERT_EQ(got, want) << "red, width " << count << " level " << int(level);
            ASSERT_EQ(gotB, wantB) << "blue, width " << count << " level " << int(level);
          }
        }
      }
}

TEST(AhdKernels, GreenAndColourRowsMatchTheScalarForm) {
  compareGreenAndColour<uint8_t>();
  compareGreenAndColour<uint16_t>();
}

// Luma-chroma of three rows per direction, one pixel wider on each side;
// with `corners` every colour is a corner of the colour cube, which gives
// the largest chroma distances.
template <typename T>
struct LumaChromaRows {
  std::vector<zel::LumaChromaValue<T>> values[2][3][3];
  zel::LumaChromaView<T> views[2][3];
};

template <typename T>
LumaChromaRows<T> lumaChromaOf(int count, uint32_t seed, bool corners) {
  LumaChromaRows<T> out;
  for (int d = 0; d < 2; ++d)
    for (int k = 0; k < 3; ++k) {
      Row<T> r(count + 2, 0, 1, seed + 3 * (3 * d + k)), g(count + 2, 0, 3, seed + 1 + 3 * (3 * d + k)),
          b(count + 2, 0, 1, seed + 2 + 3 * (3 * d + k));
      if (corners)
        for (TestImage<T>* im : {&r.image, &g.image, &b.image})
          for (int x = 0; x < im->rowSamples(); ++x) im->set(x, 0, im->get(x, 0) & 1 ? T(~T(0)) : T(0));
      for (auto& v : out.values[d][k]) v.assign(count + 2, 0);
      zel::LumaChromaRow<T> row{out.values[d][k][0].data(), out.values[d][k][1].data(), out.values[d][k][2].data()};
      zel::lumaChromaRowScalar(r.at(), g.at(), b.at(), count + 2, row);
      out.views[d][k] = zel::LumaChromaView<T>{row.y + 1, row.cb + 1, row.cr + 1};
    }
  return out;
}

template <typename T>
void compareLumaChromaAndHomogeneity() {
  int32_t widest = 0;
  for (int count = 1; count <= 70; ++count)
    for (int offset : {1, 3}) {
      const uint32_t seed = uint32_t(count * 5 + offset);
      Row<T> r(count, 0, offset, seed), g(count, 0, offset + 2, seed + 1), b(count, 0, offset, seed + 2);
      if (offset == 3)  // colours of the cube's corners: the weighted sums at their ends
        for (TestImage<T>* im : {&r.image, &g.image, &b.image})
          for (int x = 0; x < im->rowSamples(); ++x) im->set(x, 0, im->get(x, 0) & 1 ? T(~T(0)) : T(0));
      std::vector<zel::LumaChromaValue<T>> want[3], got[3];
      for (auto& v : want) v.assign(count + 1, -7);
      zel::lumaChromaRowScalar(r.at(), g.at(), b.at(), count,
                               zel::LumaChromaRow<T>{want[0].data(), want[1].data(), want[2].data()});
      for (VectorLevel level : vectorLevels()) {
        for (auto& v : got) v.assign(count + 1, -7);
        zel::lumaChromaRow(r.at(), g.at(), b.at(), count,
                           zel::LumaChromaRow<T>{got[0].data(), got[1].data(), got[2].data()}, level);
        for (int k = 0; k < 3; ++k) ASSERT_EQ(got[k], want[k]) << "luma-chroma " << k << " width " << count;
      }
      for (bool corners : {false, true}) {
        const LumaChromaRows<T> lc = lumaChromaOf<T>(count, seed * 7, corners);
        std::vector<T> hom(count + 1, T(5));
        zel::homogeneityRowScalar(lc.views[0], lc.views[1], count, hom.data());
        for (VectorLevel level : vectorLevels()) {
          std::vector<T> got2(count + 1, T(5));
          zel::homogeneityRow(lc.views[0], lc.views[1], count, got2.data(), level);
          ASSERT_EQ(got2, hom) << "homogeneity, width " << count << " level " << int(level) << " corners " << corners;
        }
        for (int x = 0; x < count; ++x) {
          const zel::LumaChromaView<T>& row = lc.views[0][1];
          auto at = [&](int i) { return zel::LumaChroma{row.y[i], row.cb[i], row.cr[i]}; };
          widest = std::max(widest, zel::chromaDistance(at(x), at(x + 1)));
        }
      }
    }
  // The 8-bit vector form keeps chroma distances in unsigned words: the
  // data must reach past the signed range.
  EXPECT_GT(widest, 32767);
}

TEST(AhdKernels, LumaChromaAndHomogeneityMatchTheScalarForm) {
  compareLumaChromaAndHomogeneity<uint8_t>();
  compareLumaChromaAndHomogeneity<uint16_t>();
}

// Homogeneity rows that are mostly 0, so that window sums of 0 come in
// runs (within a block and across blocks) and the running choice is
// carried; the densest rows hardly ever sum to 0.
template <typename T>
void compareChoice() {
  std::mt19937 rng(4);
  for (int count = 1; count <= 70; ++count)
    for (int offset : {1, 3})
      for (int density : {2, 12, 100}) {
        TestImage<T> hom(count + 2, 3, offset);
        for (int y = 0; y < 3; ++y)
          for (int x = 0; x < count + 2; ++x)
            hom.set(x, y, T(int(rng() % 100) < density ? int(rng() % 9) - 4 : 0));
        TestImage<T> h(count, 3, offset), v(count, 3, offset + 2);
        h.fillRandom(uint32_t(count)), v.fillRandom(uint32_t(count + 100));
        const T* hp[3] = {h.row(0), h.row(1), h.row(2)};
        const T* vp[3] = {v.row(0), v.row(1), v.row(2)};
        const T* homp[3] = {hom.row(0) + 1, hom.row(1) + 1, hom.row(2) + 1};
        std::vector<T> scalar(3 * count + 1, T(3));
        zel::choiceRowScalar(hp, vp, homp, count, false, scalar.data());
        for (VectorLevel level : vectorLevels()) {
          std::vector<T> pixels(3 * count + 1, T(3));
          zel::choiceRow(hp, vp, homp, count, pixels.data(), level);
          ASSERT_EQ(pixels, scalar) << "choice, width " << count << " density " << density << " level " << int(level);
        }
      }
}

TEST(AhdKernels, ChoiceMatchesTheScalarForm) {
  compareChoice<uint8_t>();
  compareChoice<uint16_t>();
}

TEST(AhdKernels, ChoiceRunsFromHAndRepeatsOnZeroSums) {
  // One homogeneity value of -1 at pixel 10 of the middle row: the sums of
  // pixels 9..11 are -1 (V), and V holds on to the row's end, through
  // blocks of zero sums only; before it H.
  constexpr int count = 60;
  std::vector<uint8_t> hom[3], h[3], v[3];
  for (int k = 0; k < 3; ++k) hom[k].assign(count + 2, 0), h[k].assign(count, 10), v[k].assign(count, 20);
  hom[1][1 + 10] = uint8_t(-1);
  const uint8_t* homp[3] = {hom[0].data() + 1, hom[1].data() + 1, hom[2].data() + 1};
  const uint8_t* hp[3] = {h[0].data(), h[1].data(), h[2].data()};
  const uint8_t* vp[3] = {v[0].data(), v[1].data(), v[2].data()};
  for (VectorLevel level : vectorLevels()) {
    std::vector<uint8_t> out(3 * count);
    zel::choiceRow(hp, vp, homp, count, out.data(), level);
    for (int i = 0; i < count; ++i) ASSERT_EQ(out[3 * i + 1], i < 9 ? 10 : 20) << "pixel " << i;
  }
}

TEST(AhdFormulas, WorkedValues) {
  // Green between l = 100 and r = 120 with c = 90, a = 60, b = 80:
  // 110 + ((30 + 10) >> 2) = 120, inside [100, 120].
  EXPECT_EQ(zel::greenAlong(90, 60, 80, 100, 120), 120);
  // Held at the bounds, and the shift is arithmetic: -3 >> 2 = -1.
  EXPECT_EQ(zel::greenAlong(200, 20, 20, 100, 120), 120);
  EXPECT_EQ(zel::greenAlong(0, 200, 200, 100, 120), 100);
  EXPECT_EQ(zel::greenAlong(10, 11, 12, 50, 51), 50);  // 50 + (-3 >> 2) = 49 -> 50
  // Colour from a pair and from the diagonals: no rounding term, clamped.
  EXPECT_EQ(zel::colourFromPair(100, 31, 40, 255), 95);          // 100 + (-9 >> 1) = 95
  EXPECT_EQ(zel::colourFromDiagonals(100, 403, 400, 255), 100);  // 3 >> 2 = 0
  EXPECT_EQ(zel::colourFromDiagonals(100, 390, 400, 255), 97);   // -10 >> 2 = -3
  EXPECT_EQ(zel::colourFromPair(250, 600, 500, 255), 255);
  EXPECT_EQ(zel::colourFromPair(65000, 10, 70000, 65535), 30005);  // wider clamp of 16 bits
  EXPECT_EQ(zel::colourFromDiagonals(5, 0, 100, 255), 0);
  // White: (220 * 65535 + 128) >> 8 = 56319.6 -> 56319, and a grey has no
  // chroma; chroma rounds down: (-38 * 255 + 128) >> 8 = -37.4 -> -38.
  const zel::LumaChroma white = zel::lumaChroma(65535, 65535, 65535);
  EXPECT_EQ(white.y, 56319);
  EXPECT_EQ(white.cb, 0);
  EXPECT_EQ(white.cr, 0);
  EXPECT_EQ(zel::lumaChroma(255, 0, 0).cb, -38);
}

}  // namespace
