// Vector blocks of the expanding kernel against its scalar pixels: pair
// streams read in one pass, 4:2:0 plane pairs and 4:2:2 and 4:1:1 planes,
// into three- and four-byte pixels and planes, at widths 1..70 and a few
// past 128 and odd offsets, with SSE4.1 alone, with AVX2 first and with
// 512-bit blocks first (whose four-byte blocks are laid out differently),
// byte for byte with guards.
#include <gtest/gtest.h>

#include <random>
#include <vector>

#include "luma_chroma/sub_to_rgb_drivers.h"
#include "luma_chroma/tier_params.h"

namespace {

using namespace zel::lc;
using namespace zel::lc::expand;
using zel::VectorTier;
using zel::repack::PairOrder;

// Random bytes, one in four an edge value, with 64 guard bytes each side.
std::vector<uint8_t> randomBytes(size_t n, uint32_t seed) {
  static const uint8_t edges[] = {0, 1, 15, 16, 127, 128, 235, 240, 255};
  std::mt19937 rng(seed);
  std::vector<uint8_t> v(n + 128);
  for (uint8_t& b : v) {
    const uint32_t r = rng();
    b = (r & 3) == 0 ? edges[(r >> 2) % 9] : uint8_t(r >> 24);
  }
  return v;
}

// Runs the kernel (blocks from `tier` down, then pixels) and the pixels
// alone into two copies of one destination, for widths 1..70 and some past
// two 512-bit blocks, at several offsets.
template <class Run>
void agree(const char* name, VectorTier tier, Run run) {
  std::vector<int> widths;
  for (int width = 1; width <= 70; ++width) widths.push_back(width);
  for (int width : {129, 158, 191, 254, 301}) widths.push_back(width);
  for (int width : widths)
    for (int offset : {0, 1, 5}) {
      const uint32_t seed = uint32_t(width * 8 + offset);
      const std::vector<uint8_t> src = randomBytes(size_t(width) * 4, seed);
      std::vector<uint8_t> blocked = randomBytes(size_t(width) * 8, seed + 1), plain = blocked;
      run(src.data() + 64 + offset, blocked.data() + 64 + offset, plain.data() + 64 + offset, width, tier);
      ASSERT_TRUE(blocked == plain) << name << " width " << width << " offset " << offset;
    }
}

template <PairOrder Order, class Form>
void streamAgrees(const char* name, VectorTier tier, const Form& form) {
  agree(name, tier, [&](const uint8_t* s, uint8_t* b, uint8_t* p, int w, VectorTier t) {
    const int end = w & ~1;
    expandRow(streamRow<Order>(s, PackedOutAlpha<true>{b, 200}), end, end, form, form, t);
    expandPixels(streamRow<Order>(s, PackedOutAlpha<true>{p, 200}), 0, end, form);
    uint8_t* b3 = b + 4 * w;
    uint8_t* p3 = p + 4 * w;
    constexpr bool kReverse = Order != PairOrder::YCbCr;
    expandRow(streamRow<Order>(s, PackedOut3<kReverse>{b3}), end, end, form, form, t);
    expandPixels(streamRow<Order>(s, PackedOut3<kReverse>{p3}), 0, end, form);
  });
}

// Two luma rows of `w` bytes and two chroma planes of (w + 1) / 2 bytes,
// into four-byte pixels and into three-byte ones.
template <class Out, class Form>
void planePairInto(const uint8_t* s, const Out& b0, const Out& b1, const Out& p0, const Out& p1, int w, VectorTier t,
                   const Form& form) {
  using Set = RowSet<2, LumaRow, ChromaPlanes<2>, Out>;
  const int end = w & ~1, half = (w + 1) / 2;
  const ChromaPlanes<2> chroma{s + 2 * w, s + 2 * w + half};
  expandRow(Set{{LumaRow{s}, LumaRow{s + w}}, chroma, {b0, b1}}, end, end, form, form, t);
  expandPixels(Set{{LumaRow{s}, LumaRow{s + w}}, chroma, {p0, p1}}, 0, end, form);
}

template <class Form>
void planePairAgrees(const char* name, VectorTier tier, const Form& form) {
  agree(name, tier, [&](const uint8_t* s, uint8_t* b, uint8_t* p, int w, VectorTier t) {
    planePairInto(s, PackedOutAlpha<false>{b, 9}, PackedOutAlpha<false>{b + 4 * w, 9}, PackedOutAlpha<false>{p, 9},
                  PackedOutAlpha<false>{p + 4 * w, 9}, w, t, form);
  });
  agree(name, tier, [&](const uint8_t* s, uint8_t* b, uint8_t* p, int w, VectorTier t) {
    planePairInto(s, PackedOut3<true>{b}, PackedOut3<true>{b + 3 * w}, PackedOut3<true>{p},
                  PackedOut3<true>{p + 3 * w}, w, t, form);
  });
}

// One luma row and two chroma planes subsampled by Spread into planes and
// into four-byte pixels.
template <int Spread, class Form>
void planeRowAgrees(const char* name, VectorTier tier, const Form& form) {
  agree(name, tier, [&](const uint8_t* s, uint8_t* b, uint8_t* p, int w, VectorTier t) {
    const int n = (w + Spread - 1) / Spread;
    const ChromaPlanes<Spread> chroma{s + w, s + w + n};
    using Planes = RowSet<1, LumaRow, ChromaPlanes<Spread>, PlanesOut>;
    expandRow(Planes{{LumaRow{s}}, chroma, {PlanesOut{b, b + w, b + 2 * w}}}, w, w, form, form, t);
    expandPixels(Planes{{LumaRow{s}}, chroma, {PlanesOut{p, p + w, p + 2 * w}}}, 0, w, form);
    using Quads = RowSet<1, LumaRow, ChromaPlanes<Spread>, PackedOutAlpha<true>>;
    expandRow(Quads{{LumaRow{s}}, chroma, {PackedOutAlpha<true>{b + 3 * w, 7}}}, w, w, form, form, t);
    expandPixels(Quads{{LumaRow{s}}, chroma, {PackedOutAlpha<true>{p + 3 * w, 7}}}, 0, w, form);
  });
}

using SubsampledBlocks = zel::test::TierTest;

TEST_P(SubsampledBlocks, PairStreamsMatchTheScalarForms) {
  streamAgrees<PairOrder::YCbCr>("lanes 601b", GetParam(), LanesForm{lanes601b});
  streamAgrees<PairOrder::YCbCr>("lanes 601a", GetParam(), LanesForm{lanes601a});
  streamAgrees<PairOrder::YCrCb>("pair raw B", GetParam(), PairRawForm{pairLanesB});
  streamAgrees<PairOrder::CbYCr>("hdtv", GetParam(), SixteenthsForm{lanesHDTV});
}

TEST_P(SubsampledBlocks, FourTwoZeroPlanePairsMatchTheScalarForms) {
  planePairAgrees("pair raw A", GetParam(), PairRawForm{pairLanesA});
  planePairAgrees("pair centred A", GetParam(), PairCentredForm{pairLanesA});
  planePairAgrees("lanes 601b", GetParam(), LanesForm{lanes601b});
  planePairAgrees("lanes 709", GetParam(), LanesForm{lanes709});
  planePairAgrees("hdtv", GetParam(), SixteenthsForm{lanesHDTV});
}

TEST_P(SubsampledBlocks, PlaneRowsMatchTheScalarForms) {
  planeRowAgrees<2>("422 lanes 601b", GetParam(), LanesForm{lanes601b});
  planeRowAgrees<4>("411 lanes 601a", GetParam(), LanesForm{lanes601a});
}

INSTANTIATE_TEST_SUITE_P(Tiers, SubsampledBlocks, zel::test::allTiers(), zel::test::tierTestName);

}  // namespace
