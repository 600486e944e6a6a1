// Row kernels of the packed-word readers against their pixel formulas at
// every width from 1 to 70 and at 129 and 257, rows at odd addresses, the
// SSE4.1 body alone and with AVX2 blocks first; no other byte changes.
#include "packed16/packed_read_rows.h"

#include <gtest/gtest.h>

#include <functional>
#include <string>

#include "frame/simd.h"
#include "packed16/packed_read_lanes.h"
#include "packed16/packed_read_reference.h"
#include "support/test_image.h"

namespace {

using namespace zel::unpack;
using namespace zel::unpack::test;
using zel::test::TestImage;

// Outputs: Y (or the only one), first chroma, second chroma, second Y.
struct Kernel {
  std::string name;
  bool pair;
  std::function<void(const uint16_t* const*, uint8_t* const*, int, bool)> run;
  std::function<Rows(const uint16_t* const*, int)> reference;
};

template <class W, Source At>
std::vector<Kernel> blueLow(const std::string& n) {
  auto pairOf = [](const uint16_t* const* s, uint8_t* const* d) {
    return PairRows{s[0], s[1], d[0], d[3], d[1], d[2]};
  };
  auto rowOf = [](const uint16_t* const* s, uint8_t* const* d) { return PlaneRow{s[0], d[0], d[1], d[2]}; };
  return {
      {n + " 4:2:0", true, [=](auto s, auto d, int w, bool a) { studio420Pair<W>(pairOf(s, d), w, a); },
       [](auto s, int w) { return refStudio420(At, s[0], s[1], w); }},
      {n + " 4:2:2", false, [=](auto s, auto d, int w, bool a) { studio422PlanesRow<W>(rowOf(s, d), w, a); },
       [](auto s, int w) { return refStudio422(At, s[0], w); }},
      {n + " 4:2:2 pairs", false, [](auto s, auto d, int w, bool a) { studio422PairsRow<W>(s[0], d[0], w, a); },
       [](auto s, int w) {
         return Rows{refStudio422Pairs(At, s[0], w), {}, {}, {}};
       }},
      {n + " 4:1:1", false, [=](auto s, auto d, int w, bool a) { studio411Row<W>(rowOf(s, d), w, a); },
       [](auto s, int w) { return refStudio411(At, s[0], w); }},
      {n + " last row", false, [](auto s, auto d, int w, bool) { studioLumaRow<W>(s[0], d[0], w); },
       [](auto s, int w) {
         return Rows{refStudio(At, s[0], nullptr, w, 2, 0).y, {}, {}, {}};
       }},
      {n + " YUV 4:2:0", true, [=](auto s, auto d, int w, bool a) { yuv420Pair<W>(pairOf(s, d), w, a); },
       [](auto s, int w) { return refYuv(At, s[0], s[1], w, false); }},
  };
}

std::vector<Kernel> kernels() {
  using zel::packed::Layout555;
  using zel::packed::Layout565;
  std::vector<Kernel> k = blueLow<Blue555, pixel<Layout555, true>>("BGR555");
  for (const Kernel& x : blueLow<Blue565, pixel<Layout565, true>>("BGR565")) k.push_back(x);
  constexpr Source red = pixel<Layout565, false>;
  k.push_back({"565 to bytes", false, [](auto s, auto d, int w, bool a) { wordsToBytesRow(s[0], d[0], w, a); },
               [](auto s, int w) {
                 return Rows{refWordsToBytes(s[0], w), {}, {}, {}};
               }});
  k.push_back({"RGB565 YUV 4:2:0", true,
               [](auto s, auto d, int w, bool a) {
                 yuvRedLow420Pair(PairRows{s[0], s[1], d[0], d[3], d[1], d[2]}, w, a);
               },
               [=](auto s, int w) { return refYuv(red, s[0], s[1], w, true); }});
  k.push_back({"RGB565 YUV 4:2:2", false,
               [](auto s, auto d, int w, bool a) {
                 yuvRedLow422Row(PlaneRow{s[0], d[0], d[1], d[2]}, w, a);
               },
               [=](auto s, int w) { return refYuv(red, s[0], nullptr, w, true); }});
  return k;
}

// One call on fresh rows: "" or the first wrong output.
std::string check(const Kernel& k, int width, int offset, bool avx2) {
  TestImage<uint16_t> src[2] = {{width, 1, offset}, {width, 1, offset + 5}};
  src[0].fillRandom(uint32_t(width * 7 + offset));
  src[1].fillRandom(uint32_t(width * 7 + offset + 1));
  const uint16_t* s[2] = {src[0].data(), src[1].data()};
  const Rows want = k.reference(s, width);
  const Row* rows[4] = {&want.y, &want.c1, &want.c2, &want.y1};
  std::vector<TestImage<uint8_t>> dst;
  uint8_t* d[4];
  for (int i = 0; i < 4; ++i) {
    dst.emplace_back(std::max<int>(int(rows[i]->size()), 1), 1, (offset + 3 * i + 1) % 16);
    d[i] = dst.back().data();
  }
  k.run(s, d, width, avx2);
  for (int i = 0; i < 4; ++i) {
    for (size_t x = 0; x < rows[i]->size(); ++x) {
      const int want = (*rows[i])[x] < 0 ? TestImage<uint8_t>::kGuard : (*rows[i])[x];
      if (dst[i].get(int(x), 0) != want)
        return "output " + std::to_string(i) + " byte " + std::to_string(x) + ": " +
               std::to_string(dst[i].get(int(x), 0)) + " instead of " + std::to_string(want);
    }
    if (!dst[i].guardsIntact()) return "wrote past output " + std::to_string(i);
  }
  return "";
}

TEST(PackedReadRows, EveryWidthAndAlignmentMatchesTheFormulas) {
  for (const Kernel& k : kernels())
    for (bool avx2 : {false, zel::hasAvx2()})
      for (int width = 1; width <= 257; width += width < 70 ? 1 : 59)
        for (int offset : {0, 1, 6, 11})
          ASSERT_EQ(check(k, width, offset, avx2), "") << k.name << " width " << width << (avx2 ? " avx2" : " sse");
}

}  // namespace
