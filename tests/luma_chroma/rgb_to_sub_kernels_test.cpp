// Vector blocks of the subsampling encoders against the scalar side of the
// same forms: rows of widths 1..70 and a few past 128 at odd offsets, with
// SSE4.1 alone, with AVX2 first and with 512-bit blocks first, compared byte
// for byte with guards.
#include <gtest/gtest.h>

#include <cstring>
#include <random>
#include <vector>

#include "frame/simd.h"
#include "luma_chroma/rgb_to_sub_filter.h"
#include "luma_chroma/rgb_to_sub_rows.h"
#include "luma_chroma/rgb_to_sub_yuv_forms.h"
#include "luma_chroma/tier_params.h"

namespace {

using namespace zel::lc;
using namespace zel::lc::sub;
using zel::VectorTier;

// Bytes with guards on both sides, the first `offset` bytes past a 64-byte
// boundary; one byte in four is an edge value of the formulas.
struct Guarded {
  std::vector<uint8_t> bytes;
  uint8_t* first;
  Guarded(int size, int offset, uint32_t seed) : bytes(size_t(size) + 192) {
    static const uint8_t edges[] = {0, 1, 2, 127, 128, 129, 253, 254, 255};
    std::mt19937 rng(seed);
    for (uint8_t& b : bytes) {
      const uint32_t r = rng();
      b = (r & 3) == 0 ? edges[(r >> 2) % 9] : uint8_t(r >> 24);
    }
    first = bytes.data() + 64;
    first += (64 - (reinterpret_cast<uintptr_t>(first) & 63u)) & 63u;
    first += offset;
  }
  Guarded(const Guarded& o) : bytes(o.bytes), first(bytes.data() + (o.first - o.bytes.data())) {}
};

// Source and destination views over one buffer each, for a given width.
enum class In { C3, AC4, P3 };
enum class Out { Planes, TwoPlane, Pairs, PairsCrFirst, PairsCbFirst };

int pixelBytes(In in) { return in == In::C3 ? 3 : in == In::AC4 ? 4 : 3; }

// Calls f with a maker of row sources (pointer to source) of the layout.
template <bool Bgr, class F>
auto withSource(In in, int width, F f) {
  switch (in) {
    case In::C3:
      return f([](const uint8_t* p) { return PackedSource<3, Bgr>{{p}}; });
    case In::AC4:
      return f([](const uint8_t* p) { return PackedSource<4, Bgr>{{p}}; });
    default:
      return f([width](const uint8_t* p) { return RgbSource<PlanesIn, Bgr>{{p, p + width, p + 2 * width}}; });
  }
}

// Widths 1..70 and some past two 512-bit blocks.
std::vector<int> testWidths() {
  std::vector<int> w;
  for (int width = 1; width <= 70; ++width) w.push_back(width);
  for (int width : {129, 150, 191, 255, 300}) w.push_back(width);
  return w;
}

// Runs `blocked` (the converter with vector blocks from `tier` down) and
// `plain` (the scalar span) into copies of one destination and compares
// them.
template <class Run>
void agree(VectorTier tier, int inBytes, int outBytes, int rows, Run run) {
  for (int width : testWidths())
    for (int offset : {0, 1, 3, 7}) {
      const uint32_t seed = uint32_t(width * 16 + offset);
      const Guarded src(width * inBytes * rows, offset, seed);
      const Guarded out(width * outBytes * rows, (offset * 5) & 15, seed + 1);
      Guarded blocked(out), plain(out);
      run(src.first, blocked.first, plain.first, width, tier);
      ASSERT_TRUE(blocked.bytes == plain.bytes) << "width " << width << " offset " << offset;
    }
}

// One row of 4:2:2 or 4:1:1: every whole block in the body form.
template <int Ratio, bool Bgr, class Body>
void rowBodyAgrees(VectorTier tier, const Body& body, In in, Out out) {
  agree(tier, pixelBytes(in), 2, 1, [&](const uint8_t* s, uint8_t* b, uint8_t* p, int w, VectorTier t) {
    const int n = w & ~(Ratio - 1);
    withSource<Bgr>(in, w, [&](auto make) {
      const auto src = make(s);
      auto go = [&](const auto& ob, const auto& op) {
        rowSpan<Ratio>(src, ob, rowVectorBlocks<Ratio>(src, ob, n, body, t), n, body);
        rowSpan<Ratio>(src, op, 0, n, body);
      };
      switch (out) {
        case Out::Pairs:
          go(PairsOut<PairOrder::YCbCr>{b}, PairsOut<PairOrder::YCbCr>{p});
          break;
        case Out::PairsCrFirst:
          go(PairsOut<PairOrder::YCrCb>{b}, PairsOut<PairOrder::YCrCb>{p});
          break;
        case Out::PairsCbFirst:
          go(PairsOut<PairOrder::CbYCr>{b}, PairsOut<PairOrder::CbYCr>{p});
          break;
        default:
          go(PlanesOutSub<Ratio>{b, b + w, b + w + w / Ratio}, PlanesOutSub<Ratio>{p, p + w, p + w + w / Ratio});
      }
      return 0;
    });
  });
}

// One row pair of 4:2:0.
template <bool Bgr, class Body>
void pairBodyAgrees(VectorTier tier, const Body& body, In in, Out out) {
  agree(tier, pixelBytes(in), 3, 2, [&](const uint8_t* s, uint8_t* b, uint8_t* p, int w, VectorTier t) {
    const int n = w & ~1;
    const int rowBytes = pixelBytes(in) * w;
    auto run = [&](const auto& top, const auto& bottom) {
      auto go = [&](const auto& ob, const auto& op) {
        pairSpan(top, bottom, ob, pairVectorBlocks(top, bottom, ob, n, body, t), n, body);
        pairSpan(top, bottom, op, 0, n, body);
      };
      if (out == Out::TwoPlane)
        go(TwoPlane420Out{b, b + w, b + 2 * w}, TwoPlane420Out{p, p + w, p + 2 * w});
      else
        go(Planes420Out{b, b + w, b + 2 * w, b + 2 * w + w / 2}, Planes420Out{p, p + w, p + 2 * w, p + 2 * w + w / 2});
      return 0;
    };
    withSource<Bgr>(in, w, [&](auto make) { return run(make(s), make(s + (in == In::P3 ? 3 * w : rowBytes))); });
  });
}

using SubsampledKernels = zel::test::TierTest;

TEST_P(SubsampledKernels, FourTwoZeroBlocksMatchTheScalarForms) {
  pairBodyAgrees<true>(GetParam(), LanesBody<set601, 4>{}, In::C3, Out::Planes);
  pairBodyAgrees<true>(GetParam(), LanesBody<set601, 4>{}, In::AC4, Out::Planes);
  pairBodyAgrees<false>(GetParam(), LanesBody<set601, 4>{}, In::AC4, Out::Planes);
  pairBodyAgrees<true>(GetParam(), LanesBody<set709Csc, 4>{}, In::C3, Out::TwoPlane);
  pairBodyAgrees<true>(GetParam(), LanesBody<set709Hdtv, 4>{}, In::AC4, Out::Planes);
  pairBodyAgrees<false>(GetParam(), RoundedBody<false>{}, In::C3, Out::Planes);
  pairBodyAgrees<false>(GetParam(), RoundedBody<false>{}, In::AC4, Out::TwoPlane);
}

TEST_P(SubsampledKernels, RowBlocksMatchTheScalarForms) {
  rowBodyAgrees<4, true>(GetParam(), RoundedBody<true>{}, In::C3, Out::Planes);
  rowBodyAgrees<4, true>(GetParam(), LanesBody<set601, 4>{}, In::AC4, Out::Planes);
  rowBodyAgrees<2, true>(GetParam(), LanesBody<set601, 2>{}, In::C3, Out::Planes);
  rowBodyAgrees<2, false>(GetParam(), LanesBody<set601, 2>{}, In::C3, Out::Planes);
  rowBodyAgrees<2, true>(GetParam(), LanesBody<set601, 2>{}, In::AC4, Out::Pairs);
  rowBodyAgrees<2, false>(GetParam(), ExactPairBody{}, In::C3, Out::Pairs);
  rowBodyAgrees<2, false>(GetParam(), ExactPairBody{}, In::P3, Out::PairsCrFirst);
  rowBodyAgrees<2, true>(GetParam(), CbYCrBody<set601>{}, In::AC4, Out::PairsCbFirst);
  rowBodyAgrees<2, true>(GetParam(), CbYCrBody<set709Hdtv>{}, In::C3, Out::PairsCbFirst);
}

TEST_P(SubsampledKernels, YuvBlocksMatchTheScalarForms) {
  pairBodyAgrees<true>(GetParam(), DifferenceBody<4>{}, In::AC4, Out::Planes);
  pairBodyAgrees<false>(GetParam(), DifferenceBody<4>{}, In::P3, Out::Planes);
  pairBodyAgrees<false>(GetParam(), RoundedDifferenceBody<4>{}, In::C3, Out::Planes);
  rowBodyAgrees<2, false>(GetParam(), DifferenceBody<2>{}, In::C3, Out::Planes);
  rowBodyAgrees<2, false>(GetParam(), DifferenceBody<2>{}, In::P3, Out::Planes);
  rowBodyAgrees<2, false>(GetParam(), DifferenceBody<2>{}, In::C3, Out::Pairs);
  rowBodyAgrees<2, false>(GetParam(), RoundedDifferenceBody<2>{}, In::C3, Out::Planes);
}

INSTANTIATE_TEST_SUITE_P(Tiers, SubsampledKernels, zel::test::allTiers(), zel::test::tierTestName);

TEST(SubsampledSseKernels, WideYuvBlocksMatchTheWideForm) {
  agree(VectorTier::Sse41, 3, 3, 2, [&](const uint8_t* s, uint8_t* b, uint8_t* p, int w, VectorTier) {
    const PlanesSource top{{s, s + w, s + 2 * w}}, bottom{{s + 3 * w, s + 4 * w, s + 5 * w}};
    const Planes420Out ob{b, b + w, b + 2 * w, b + 2 * w + w / 2}, op{p, p + w, p + 2 * w, p + 2 * w + w / 2};
    const int n = w & ~1;
    pairSpan(top, bottom, ob, wideDifference420Blocks(top, bottom, ob, 0, n), n, WideDifference420Tail{});
    pairSpan(top, bottom, op, 0, n, WideDifference420Tail{});
  });
}

TEST(SubsampledSseKernels, FilteredBlocksMatchTheScalarPairs) {
  for (const uint8_t* table : {static_cast<const uint8_t*>(nullptr), gammaTable()})
    agree(VectorTier::Sse41, 3, 2, 1, [&](const uint8_t* s, uint8_t* b, uint8_t* p, int w, VectorTier) {
      filteredRow(s, b, w, table, true);
      filteredRow(s, p, w, table, false);
    });
}

}  // namespace
