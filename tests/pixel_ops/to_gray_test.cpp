// Colour to gray: vector blocks against the scalar formulas, the zones of
// the two 8u formulas, weight conversion and its wrapping.
#include <gtest/gtest.h>

#include <cstring>
#include <random>
#include <vector>

#include "frame/simd.h"
#include "pixel_ops/to_gray.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using namespace zel::gray;
using zel::test::TestImage;

// The formulas pixel by pixel, with the zones of each type.
template <int Ch>
uint8_t expect8u(const uint8_t* p, int x, int width, Weights8 w) {
  return x < blockEnd8<Ch>(width) ? block8(p[0], p[1], p[2], w) : tail8(p[0], p[1], p[2], w);
}
int16_t expect16s(const int16_t* p, int x, int width, WeightsF w) {
  return x < blockEnd16s(width) ? block16s(p[0], p[1], p[2], w) : tail16s(p[0], p[1], p[2], w);
}

std::vector<int> widthsUpTo(int last, std::vector<int> more = {}) {
  std::vector<int> widths;
  for (int w = 1; w <= last; ++w) widths.push_back(w);
  widths.insert(widths.end(), more.begin(), more.end());
  return widths;
}

template <typename T, int Ch, typename W, typename Row, typename Want>
void compareRows(Row row, Want want, const std::vector<W>& weights, double lo = 0, double hi = 1,
                 const std::vector<int>& widths = widthsUpTo(70)) {
  int seed = 1;
  for (size_t set = 0; set < weights.size(); ++set)
    for (int width : widths)
      for (int offset : {0, 1, 2, 3, 4, 6, 12, 20}) {
        if (offset % sizeof(T)) continue;
        TestImage<T> src(width * Ch, 1, offset);
        TestImage<T> dst(width, 1, (offset * 5 + int(sizeof(T))) % 64);
        src.fillRandom(uint32_t(++seed), lo, hi);
        const W& w = weights[set];
        row(src.data(), dst.data(), width, w);
        for (int x = 0; x < width; ++x) {
          const T expected = want(src.data() + x * Ch, x, width, w);
          const T got = dst.get(x, 0);
          ASSERT_EQ(std::memcmp(&got, &expected, sizeof(T)), 0)
              << "width " << width << " pixel " << x << " offset " << offset << " weights " << set;
        }
        ASSERT_TRUE(dst.guardsIntact()) << width;
      }
}

std::vector<Weights8> someWeights8() {
  // The fixed weights, plain user weights, and sums far above one, where
  // the block reads its saturated sum as negative.
  return {kFixed8, weights8(std::vector<float>{0.2f, 0.7f, 0.1f}.data()),
          weights8(std::vector<float>{1.0f, 0.5f, 0.0f}.data()), weights8(std::vector<float>{1.9f, 1.9f, 1.9f}.data()),
          weights8(std::vector<float>{-0.25f, 0.6f, 0.7f}.data())};
}
// The fixed weights, plain user weights, weights whose sums pass 65535
// (16u wraps, the 16s blocks saturate), and negative sums.
std::vector<WeightsF> someWeightsF() {
  return {fixedFloat(), {0.5f, 0.25f, 0.3f}, {1.0f, 1.0f, 0.0f}, {-0.3f, 0.9f, 0.4f}, {0.8f, 1.7f, -2.2f}};
}

using zel::VectorTier;
std::vector<VectorTier> tiersHere() {
  std::vector<VectorTier> tiers;
  for (VectorTier t : {VectorTier::Sse41, VectorTier::Avx2, VectorTier::Avx512})
    if (t <= zel::widestTier()) tiers.push_back(t);
  return tiers;
}

TEST(ToGrayKernels, EightBitBlocksMatchTheirFormulaInEveryZone) {
  for (bool wide : {false, true}) {
    if (wide && !zel::hasAvx2()) continue;
    compareRows<uint8_t, 3, Weights8>(
        [wide](const uint8_t* s, uint8_t* d, int n, Weights8 w) { row8u<3>(s, d, n, w, wide); }, expect8u<3>,
        someWeights8());
    compareRows<uint8_t, 4, Weights8>(
        [wide](const uint8_t* s, uint8_t* d, int n, Weights8 w) { row8u<4>(s, d, n, w, wide); }, expect8u<4>,
        someWeights8());
  }
}

// Every tier of blocks the processor has, past a few whole 512-bit blocks.
TEST(ToGrayKernels, WideSamplesMatchTheirFormulaInEveryTier) {
  const std::vector<int> widths = widthsUpTo(70, {127, 128, 129, 141, 150});
  auto u16 = [](const uint16_t* p, int, int, WeightsF w) { return gray16u(p[0], p[1], p[2], w); };
  auto f32 = [](const float* p, int, int, WeightsF w) { return gray32f(p[0], p[1], p[2], w); };
  for (VectorTier t : tiersHere()) {
    SCOPED_TRACE(int(t));
    auto at = [t](auto row) { return [t, row](auto s, auto d, int n, WeightsF w) { row(s, d, n, w, t); }; };
    compareRows<uint16_t, 3, WeightsF>(at(row16u<3>), u16, someWeightsF(), 0, 1, widths);
    compareRows<uint16_t, 4, WeightsF>(at(row16u<4>), u16, someWeightsF(), 0, 1, widths);
    compareRows<int16_t, 3, WeightsF>(at(row16s<3>), expect16s, someWeightsF(), 0, 1, widths);
    compareRows<int16_t, 4, WeightsF>(at(row16s<4>), expect16s, someWeightsF(), 0, 1, widths);
    compareRows<float, 3, WeightsF>(at(row32f<3>), f32, someWeightsF(), -2, 3, widths);
    compareRows<float, 4, WeightsF>(at(row32f<4>), f32, someWeightsF(), -2, 3, widths);
  }
  auto f64 = [](const double* p, int, int, WeightsD w) { return gray64f(p[0], p[1], p[2], w); };
  const std::vector<WeightsD> wd = {fixedDouble(), {0.1, 0.7, 0.25}};
  compareRows<double, 3, WeightsD>(row64f<3>, f64, wd, -2, 3);
  compareRows<double, 4, WeightsD>(row64f<4>, f64, wd, -2, 3);
}

// Through the public functions with the tier capped: whole images with
// padded rows give every tier's bits.
TEST(ToGrayKernels, EveryTierGivesTheSameImages) {
  const VectorTier cap = zel::vectorTierCap();
  const ImageSize size{53, 3};
  const float coeffs[3] = {1.0f, 1.0f, 0.25f};
  TestImage<uint16_t> u(size.width * 3, size.height, 2, 6);
  TestImage<int16_t> s(size.width * 4, size.height, 0, 2);
  TestImage<float> f(size.width * 3, size.height, 4, 12);
  u.fillRandom(5);
  s.fillRandom(6);
  f.fillRandom(7, -1, 2);
  std::vector<std::vector<uint16_t>> outU;
  std::vector<std::vector<int16_t>> outS;
  std::vector<std::vector<float>> outF;
  for (VectorTier t : tiersHere()) {
    zel::setVectorTierCap(t);
    outU.emplace_back(size.width * size.height);
    outS.emplace_back(size.width * size.height);
    outF.emplace_back(size.width * size.height);
    const int step = size.width * 2;
    EXPECT_EQ(zeliColorToGray_16u_C3C1R(u.data(), u.step(), outU.back().data(), step, size, coeffs), StatusOk);
    EXPECT_EQ(zeliColorToGray_16s_AC4C1R(s.data(), s.step(), outS.back().data(), step, size, coeffs), StatusOk);
    EXPECT_EQ(zeliRGBToGray_32f_C3C1R(f.data(), f.step(), outF.back().data(), step * 2, size), StatusOk);
  }
  zel::setVectorTierCap(cap);
  const WeightsF w{coeffs[0], coeffs[1], coeffs[2]};
  for (size_t t = 0; t < outU.size(); ++t)
    for (int y = 0; y < size.height; ++y)
      for (int x = 0; x < size.width; ++x) {
        const int i = y * size.width + x;
        const uint16_t* pu = u.row(y) + 3 * x;
        ASSERT_EQ(outU[t][i], gray16u(pu[0], pu[1], pu[2], w)) << "tier " << t << " pixel " << x << "," << y;
        ASSERT_EQ(outS[t][i], expect16s(s.row(y) + 4 * x, x, size.width, w)) << "tier " << t << " pixel " << x;
        const float* pf = f.row(y) + 3 * x;
        ASSERT_EQ(outF[t][i], gray32f(pf[0], pf[1], pf[2], fixedFloat())) << "tier " << t << " pixel " << x;
      }
}

TEST(ToGrayFormulas, WeightConversionWraps) {
  EXPECT_EQ(weight8(1.0f), 32768);
  EXPECT_EQ(weight8(0.5f), 16384);
  EXPECT_EQ(weight8(0.0f), 0);
  EXPECT_EQ(weight8(-0.5f), 49153);  // -16383 as unsigned 16 bits
  EXPECT_EQ(weight8(2.0f), 0);       // 65536 keeps no low bits
  EXPECT_EQ(weight8(1.25f), 40960);
  const uint32_t fixedBits[3] = {0x3E991687u, 0x3F1645A2u, 0x3DE978D5u};
  const WeightsF f = fixedFloat();
  EXPECT_EQ(std::memcmp(&f.w0, &fixedBits[0], 4), 0);
  EXPECT_EQ(std::memcmp(&f.w2, &fixedBits[2], 4), 0);
  EXPECT_EQ(fixedDouble().w1, 0.5870000123977661);
  EXPECT_EQ(kFixed8.c0 + kFixed8.c1 + kFixed8.c2, 32769);
}

// One row through the public function.
template <typename T, typename Fn, typename... Extra>
std::vector<T> grayOf(Fn fn, const std::vector<T>& pixels, int channels, Extra... extra) {
  const int width = int(pixels.size()) / channels;
  std::vector<T> out(width, T(99));
  EXPECT_EQ(fn(pixels.data(), int(pixels.size() * sizeof(T)), out.data(), int(out.size() * sizeof(T)),
               ImageSize{width, 1}, extra...),
            StatusOk);
  return out;
}

TEST(ToGrayReference, PrimariesAndWhiteInBothFormulas) {
  // Width 9: eight pixels in the block, the last in the tail.
  for (const uint8_t px : {0, 1, 2, 3}) {
    std::vector<uint8_t> row;
    for (int x = 0; x < 9; ++x)
      for (int c = 0; c < 3; ++c) row.push_back(px == 3 || c == px ? 255 : 0);
    const uint8_t want[] = {76, 150, 29, 255};
    for (uint8_t g : grayOf(zeliRGBToGray_8u_C3C1R, row, 3)) EXPECT_EQ(g, want[px]) << int(px);
  }
}

TEST(ToGrayReference, OverweightedWhiteTurnsBlackInTheBlockOnly) {
  const float coeffs[3] = {1.0f, 0.5f, 0.0f};
  // C3: width 9 is 8 block + 1 tail; width 4 the block of 4; width 3 all
  // tail; width 11 block of 8 and a tail of 3.
  for (int width : {9, 4, 3, 11}) {
    const std::vector<uint8_t> white(width * 3, 255);
    const auto g = grayOf(zeliColorToGray_8u_C3C1R, white, 3, coeffs);
    const int block = width & ~3;
    for (int x = 0; x < width; ++x) EXPECT_EQ(g[x], x < block ? 0 : 127) << "width " << width << " pixel " << x;
  }
  // AC4 has blocks of 8 only: width 12 leaves a tail of 4.
  const std::vector<uint8_t> white4(12 * 4, 255);
  const auto g4 = grayOf(zeliColorToGray_8u_AC4C1R, white4, 4, coeffs);
  for (int x = 0; x < 12; ++x) EXPECT_EQ(g4[x], x < 8 ? 0 : 127) << x;
}

TEST(ToGrayReference, NullWeightsAreTheFixedOnes) {
  std::mt19937 rng(7);
  std::vector<uint8_t> p8(23 * 3);
  for (auto& v : p8) v = uint8_t(rng());
  EXPECT_EQ(grayOf(zeliColorToGray_8u_C3C1R, p8, 3, static_cast<const float*>(nullptr)),
            grayOf(zeliRGBToGray_8u_C3C1R, p8, 3));
  std::vector<float> pf(13 * 4);
  for (auto& v : pf) v = float(rng() % 1000) / 999.0f;
  EXPECT_EQ(grayOf(zeliColorToGray_32f_AC4C1R, pf, 4, static_cast<const float*>(nullptr)),
            grayOf(zeliRGBToGray_32f_AC4C1R, pf, 4));
  std::vector<double> pd(7 * 3);
  for (auto& v : pd) v = double(rng() % 1000) / 999.0;
  const auto gd = grayOf(zeliColorToGray_64f_C3C1R, pd, 3, static_cast<const double*>(nullptr));
  for (int x = 0; x < 7; ++x)
    EXPECT_EQ(gd[x], (pd[3 * x] * 0.29899999499320984 + pd[3 * x + 1] * 0.5870000123977661) +
                         pd[3 * x + 2] * 0.11400000005960464);
}

TEST(ToGrayReference, SixteenBitOverflowWrapsOrSaturates) {
  const float coeffs[3] = {1.0f, 1.0f, 0.0f};
  // 16u white: 131070 keeps its low 16 bits, in every zone.
  const std::vector<uint16_t> white16(5 * 3, 65535);
  for (uint16_t g : grayOf(zeliColorToGray_16u_C3C1R, white16, 3, coeffs)) EXPECT_EQ(g, 65534);
  // 16s white works on 65535 + 65535 - 32768: the block of 4 saturates, the
  // fifth pixel keeps the low 16 bits.
  const std::vector<int16_t> white16s(5 * 4, 32767);
  const auto g = grayOf(zeliColorToGray_16s_AC4C1R, white16s, 4, coeffs);
  for (int x = 0; x < 4; ++x) EXPECT_EQ(g[x], 32767);
  EXPECT_EQ(g[4], 32766);
  // The lowest level is -32768, not 0, and stays there.
  const std::vector<int16_t> black16s(6 * 3, -32768);
  for (int16_t v : grayOf(zeliRGBToGray_16s_C3C1R, black16s, 3)) EXPECT_EQ(v, -32768);
}

TEST(ToGrayReference, AlphaIsNeverRead) {
  std::mt19937 rng(3);
  std::vector<uint8_t> a(21 * 4);
  for (auto& v : a) v = uint8_t(rng());
  std::vector<uint8_t> b = a;
  for (size_t i = 3; i < b.size(); i += 4) b[i] = uint8_t(~b[i]);
  EXPECT_EQ(grayOf(zeliRGBToGray_8u_AC4C1R, a, 4), grayOf(zeliRGBToGray_8u_AC4C1R, b, 4));
  std::vector<uint16_t> a16(a.begin(), a.end()), b16(b.begin(), b.end());
  EXPECT_EQ(grayOf(zeliRGBToGray_16u_AC4C1R, a16, 4), grayOf(zeliRGBToGray_16u_AC4C1R, b16, 4));
}

TEST(ToGrayFrame, StepsCountWholeSamplesAndMayBeNegative) {
  // A 16u step of 13 bytes is 6 samples: rows lie 12 bytes apart.
  std::vector<uint16_t> src(4 * 6, 0), dst(4 * 6, 0);
  for (int y = 0; y < 4; ++y)
    for (int c = 0; c < 3; ++c) src[y * 6 + c] = uint16_t(1000 * (y + 1));
  ASSERT_EQ(zeliRGBToGray_16u_C3C1R(src.data(), 13, dst.data(), 13, ImageSize{1, 4}), StatusOk);
  for (int y = 0; y < 4; ++y) EXPECT_EQ(dst[y * 6], 1000 * (y + 1)) << y;
  // A negative step walks upwards from the given row.
  const uint8_t rows[2][3] = {{255, 0, 0}, {0, 255, 0}};
  uint8_t out[2] = {1, 1};
  ASSERT_EQ(zeliRGBToGray_8u_C3C1R(rows[1], -3, out + 1, -1, ImageSize{1, 2}), StatusOk);
  EXPECT_EQ(out[1], 150);
  EXPECT_EQ(out[0], 76);
}

}  // namespace
