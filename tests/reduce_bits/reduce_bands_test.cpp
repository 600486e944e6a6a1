// The banded error diffusions (rows side by side in vector lanes) against
// the row-by-row walk of the same formulas, for every kind, member and
// layout, with and without noise, over widths and heights around the band
// and skew sizes.
#include <gtest/gtest.h>

#include <cmath>
#include <limits>

#include "frame/allocate.h"
#include "reduce_bits/reduce_drivers.h"
#include "reduce_support.h"

namespace {

using namespace zel::test;
using namespace zel::reduce;

// Random samples; float sources reach beyond 0..1 and hold a few
// infinities and NaNs, which the lanes must treat as the scalar walk does.
template <typename Src>
void fillSource(TestImage<Src>& img, int rowSamples, int rows, uint32_t seed) {
  img.fillRandom(seed, -0.3, 1.3);
  if constexpr (std::is_same_v<Src, float>) {
    const float odd[] = {std::numeric_limits<float>::infinity(), -std::numeric_limits<float>::infinity(),
                         std::numeric_limits<float>::quiet_NaN(), 1.0f, 0.0f, 1.1920929e-7f};
    for (int k = 0; k < 6; ++k) img.set(int((seed + 7u * k) % uint32_t(rowSamples)), int((seed + k) % uint32_t(rows)), odd[k]);
  }
}

// kind 1 Floyd-Steinberg, 2 and 3 the three-row kinds.
template <typename M, LayoutCode L, bool Noisy>
void bandsAgree(int kind, int width, int height, int levels, uint32_t seed) {
  using Src = typename M::Source;
  using Dst = typename M::Dest;
  const int samples = width * LayoutOf<L>::stride;
  TestImage<Src> src(samples, height, 1, 3 * int(sizeof(Src)));
  fillSource(src, samples, height, seed);
  const int pad = 5 * int(sizeof(Dst));
  TestImage<Dst> rows(samples, height, 1, pad), sse(samples, height, 1, pad), avx(samples, height, 1, pad);
  const QuantValues qv = quantValues<Src>(levels);
  NoiseTables tables;
  if constexpr (Noisy) ASSERT_EQ(diffusionNoise(tables, 35, qv.q), StatusOk);
  std::vector<float> block(size_t(3 * width + 12));
  const ThreeRowWeights k = threeRowWeights(uint32_t(kind));
  auto run = [&](TestImage<Dst>& dst, int how) {
    std::fill(block.begin(), block.end(), 0.0f);
    const Image<Src, Dst> im{src.data(), src.step(), dst.data(), dst.step(), width, height};
    if (kind == 1) {
      if (how == 0) floydSteinbergRows<M, L, Noisy>(im, block.data(), qv, tables);
      else floydSteinbergBands<M, L, Noisy>(im, block.data(), qv, tables, how == 2);
    } else {
      if (how == 0) threeRowRows<M, L, Noisy>(im, block.data(), qv, k, tables);
      else threeRowBands<M, L, Noisy>(im, block.data(), qv, k, tables, how == 2);
    }
  };
  run(rows, 0);
  run(sse, 1);
  EXPECT_TRUE(regionBytes(sse) == regionBytes(rows)) << "SSE";
  EXPECT_TRUE(sse.guardsIntact());
  if (zel::hasAvx2()) {
    run(avx, 2);
    EXPECT_TRUE(regionBytes(avx) == regionBytes(rows)) << "AVX2";
    EXPECT_TRUE(avx.guardsIntact());
  }
  if constexpr (Noisy) releaseNoiseTables(tables);
}

template <typename Src, typename Dst, LayoutCode L>
void layoutAgrees(int kind) {
  using M = Member<Src, Dst>;
  const int levels[] = {2, 3, 7, 16, 255, M::maxLevels};
  uint32_t seed = 1;
  for (int width : {1, 2, 3, 4, 5, 7, 9, 12, 17, 23, 24, 25, 47, 61, 70})
    for (int height : {1, 2, 3, 5, 8, 9, 16, 17, 33}) {
      SCOPED_TRACE("width " + std::to_string(width) + " height " + std::to_string(height));
      ++seed;
      bandsAgree<M, L, false>(kind, width, height, levels[seed % 6], seed);
      bandsAgree<M, L, true>(kind, width, height, levels[(seed + 3) % 6], seed);
    }
}

template <typename Src, typename Dst>
void memberAgrees(const char* name) {
  for (int kind = 1; kind <= 3; ++kind) {
    SCOPED_TRACE(std::string(name) + " kind " + std::to_string(kind));
    layoutAgrees<Src, Dst, LayoutCode::C1>(kind);
    layoutAgrees<Src, Dst, LayoutCode::C3>(kind);
    layoutAgrees<Src, Dst, LayoutCode::C4>(kind);
    layoutAgrees<Src, Dst, LayoutCode::AC4>(kind);
  }
}

TEST(ReduceBitsBands, DiffusionMatchesTheRowWalk) {
  memberAgrees<uint8_t, uint8_t>("8u");
  memberAgrees<uint16_t, uint16_t>("16u");
  memberAgrees<int16_t, int16_t>("16s");
  memberAgrees<uint16_t, uint8_t>("16u8u");
  memberAgrees<int16_t, uint8_t>("16s8u");
  memberAgrees<float, uint8_t>("32f8u");
  memberAgrees<float, uint16_t>("32f16u");
  memberAgrees<float, int16_t>("32f16s");
}

}  // namespace
