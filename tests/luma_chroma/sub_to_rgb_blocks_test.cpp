// Vector blocks of the expanding kernel against its scalar pixels: pair
// streams read in one pass and 4:2:0 plane pairs, into three- and four-byte
// pixels, at widths 1..70 and odd offsets, with SSE4.1 alone and with AVX2
// first (whose four-byte blocks are laid out differently), byte for byte
// with guards.
#include <gtest/gtest.h>

#include <random>
#include <vector>

#include "luma_chroma/sub_to_rgb_drivers.h"

namespace {

using namespace zel::lc;
using namespace zel::lc::expand;
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

// Runs the kernel (blocks first, then pixels) and the pixels alone into two
// copies of one destination, for every width and offset.
template <class Run>
void agree(const char* name, Run run) {
  for (bool avx2 : {false, true}) {
    if (avx2 && !zel::hasAvx2()) continue;
    for (int width = 1; width <= 70; ++width)
      for (int offset : {0, 1, 5}) {
        const uint32_t seed = uint32_t(width * 8 + offset);
        const std::vector<uint8_t> src = randomBytes(size_t(width) * 4, seed);
        std::vector<uint8_t> blocked = randomBytes(size_t(width) * 8, seed + 1), plain = blocked;
        run(src.data() + 64 + offset, blocked.data() + 64 + offset, plain.data() + 64 + offset, width, avx2);
        ASSERT_TRUE(blocked == plain) << name << " width " << width << " offset " << offset << " avx2 " << avx2;
      }
  }
}

template <PairOrder Order, class Form>
void streamAgrees(const char* name, const Form& form) {
  agree(name, [&](const uint8_t* s, uint8_t* b, uint8_t* p, int w, bool avx2) {
    const int end = w & ~1;
    expandRow(streamRow<Order>(s, PackedOutAlpha<true>{b, 200}), end, end, form, form, avx2);
    expandPixels(streamRow<Order>(s, PackedOutAlpha<true>{p, 200}), 0, end, form);
    uint8_t* b3 = b + 4 * w;
    uint8_t* p3 = p + 4 * w;
    constexpr bool kReverse = Order != PairOrder::YCbCr;
    expandRow(streamRow<Order>(s, PackedOut3<kReverse>{b3}), end, end, form, form, avx2);
    expandPixels(streamRow<Order>(s, PackedOut3<kReverse>{p3}), 0, end, form);
  });
}

// Two luma rows of `w` bytes and two chroma planes of (w + 1) / 2 bytes,
// into four-byte pixels and into three-byte ones.
template <class Out, class Form>
void planePairInto(const uint8_t* s, const Out& b0, const Out& b1, const Out& p0, const Out& p1, int w, bool avx2,
                   const Form& form) {
  using Set = RowSet<2, LumaRow, ChromaPlanes<2>, Out>;
  const int end = w & ~1, half = (w + 1) / 2;
  const ChromaPlanes<2> chroma{s + 2 * w, s + 2 * w + half};
  expandRow(Set{{LumaRow{s}, LumaRow{s + w}}, chroma, {b0, b1}}, end, end, form, form, avx2);
  expandPixels(Set{{LumaRow{s}, LumaRow{s + w}}, chroma, {p0, p1}}, 0, end, form);
}

template <class Form>
void planePairAgrees(const char* name, const Form& form) {
  agree(name, [&](const uint8_t* s, uint8_t* b, uint8_t* p, int w, bool avx2) {
    planePairInto(s, PackedOutAlpha<false>{b, 9}, PackedOutAlpha<false>{b + 4 * w, 9}, PackedOutAlpha<false>{p, 9},
                  PackedOutAlpha<false>{p + 4 * w, 9}, w, avx2, form);
  });
  agree(name, [&](const uint8_t* s, uint8_t* b, uint8_t* p, int w, bool avx2) {
    planePairInto(s, PackedOut3<true>{b}, PackedOut3<true>{b + 3 * w}, PackedOut3<true>{p},
                  PackedOut3<true>{p + 3 * w}, w, avx2, form);
  });
}

TEST(SubsampledBlocks, PairStreamsMatchTheScalarForms) {
  streamAgrees<PairOrder::YCbCr>("lanes 601b", LanesForm{lanes601b});
  streamAgrees<PairOrder::YCbCr>("lanes 601a", LanesForm{lanes601a});
  streamAgrees<PairOrder::YCrCb>("pair raw B", PairRawForm{pairLanesB});
  streamAgrees<PairOrder::CbYCr>("hdtv", SixteenthsForm{lanesHDTV});
}

TEST(SubsampledBlocks, FourTwoZeroPlanePairsMatchTheScalarForms) {
  planePairAgrees("pair raw A", PairRawForm{pairLanesA});
  planePairAgrees("lanes 709", LanesForm{lanes709});
  planePairAgrees("hdtv", SixteenthsForm{lanesHDTV});
}

}  // namespace
