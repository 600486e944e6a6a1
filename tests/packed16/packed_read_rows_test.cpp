// Row kernels of the packed-word readers against their pixel formulas:
// every width from 1 to 70, rows at odd byte addresses, the SSE4.1 body
// alone and with AVX2 blocks first; bytes outside a row's results keep
// their value.
#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <vector>

#include "frame/simd.h"
#include "packed16/packed_read_lanes.h"
#include "packed16/packed_read_rows.h"
#include "packed16/packed_read_reference.h"
#include "support/test_image.h"

namespace {

using namespace zel::unpack;
using namespace zel::unpack::test;
using zel::test::TestImage;
using Src = std::vector<const uint16_t*>;
using Dst = std::vector<uint8_t*>;

struct Kernel {
  std::string name;
  int sourceRows;
  std::function<std::vector<int>(int)> outputLengths;  // bytes of each output row
  std::function<void(const Src&, const Dst&, int, bool)> run;
  std::function<std::vector<Row>(const Src&, int)> reference;
};

int half(int w) { return (w + 1) / 2; }

std::vector<int> pairLengths(int w) { return {w, w, half(w), half(w)}; }
std::vector<Row> rowsOf(const PairRef& r) { return {r.y0, r.y1, r.c1, r.c2}; }
std::vector<Row> rowsOf(const PlaneRef& r) { return {r.y, r.c1, r.c2}; }
PairRows pairRows(const Src& s, const Dst& d) { return {s[0], s[1], d[0], d[1], d[2], d[3]}; }
PlaneRow planeRow(const Src& s, const Dst& d) { return {s[0], d[0], d[1], d[2]}; }

template <class W, class F>
std::vector<Kernel> studioKernels(const std::string& layout) {
  return {
      {layout + " 4:2:0", 2, pairLengths,
       [](const Src& s, const Dst& d, int w, bool a) { studio420Pair<W>(pairRows(s, d), w, a); },
       [](const Src& s, int w) { return rowsOf(refStudio420<F>(s[0], s[1], w)); }},
      {layout + " 4:2:2 planes", 1, [](int w) { return std::vector<int>{w, half(w), half(w)}; },
       [](const Src& s, const Dst& d, int w, bool a) { studio422PlanesRow<W>(planeRow(s, d), w, a); },
       [](const Src& s, int w) { return rowsOf(refStudio422Planes<F>(s[0], w)); }},
      {layout + " 4:2:2 pairs", 1, [](int w) { return std::vector<int>{2 * w}; },
       [](const Src& s, const Dst& d, int w, bool a) { studio422PairsRow<W>(s[0], d[0], w, a); },
       [](const Src& s, int w) { return std::vector<Row>{refStudio422Pairs<F>(s[0], w)}; }},
      {layout + " 4:1:1", 1, [](int w) { return std::vector<int>{w, (w + 3) / 4, (w + 3) / 4}; },
       [](const Src& s, const Dst& d, int w, bool a) { studio411Row<W>(planeRow(s, d), w, a); },
       [](const Src& s, int w) { return rowsOf(refStudio411<F>(s[0], w)); }},
      {layout + " luma row", 1, [](int w) { return std::vector<int>{w}; },
       [](const Src& s, const Dst& d, int w, bool) { studioLumaRow<W>(s[0], d[0], w); },
       [](const Src& s, int w) { return std::vector<Row>{refStudioLumaTail<F>(s[0], w)}; }},
      {layout + " YUV 4:2:0", 2, pairLengths,
       [](const Src& s, const Dst& d, int w, bool a) { yuv420Pair<W>(pairRows(s, d), w, a); },
       [](const Src& s, int w) { return rowsOf(refYuv420<F>(s[0], s[1], w)); }},
  };
}

std::vector<Kernel> allKernels() {
  std::vector<Kernel> k = studioKernels<Blue555, BlueLow555>("BGR555");
  for (Kernel& x : studioKernels<Blue565, BlueLow565>("BGR565")) k.push_back(x);
  k.push_back({"565 to bytes", 1, [](int w) { return std::vector<int>{3 * w}; },
               [](const Src& s, const Dst& d, int w, bool a) { wordsToBytesRow(s[0], d[0], w, a); },
               [](const Src& s, int w) { return std::vector<Row>{refWordsToBytes(s[0], w)}; }});
  k.push_back({"RGB565 YUV 4:2:0", 2, pairLengths,
               [](const Src& s, const Dst& d, int w, bool a) { yuvRedLow420Pair(pairRows(s, d), w, a); },
               [](const Src& s, int w) { return rowsOf(refRedLow420(s[0], s[1], w)); }});
  k.push_back({"RGB565 YUV 4:2:2", 1, [](int w) { return std::vector<int>{w, half(w), half(w)}; },
               [](const Src& s, const Dst& d, int w, bool a) { yuvRedLow422Row(planeRow(s, d), w, a); },
               [](const Src& s, int w) { return rowsOf(refRedLow422(s[0], w)); }});
  return k;
}

std::string rowText(const Row& r) {
  std::string t;
  for (int v : r) t += std::to_string(v) + " ";
  return t;
}

// One kernel call on fresh rows; a message on the first wrong byte.
std::string check(const Kernel& k, int width, int srcOffset, int dstOffset, bool avx2, uint32_t seed) {
  std::vector<TestImage<uint16_t>> src;
  for (int r = 0; r < k.sourceRows; ++r) {
    src.emplace_back(width, 1, srcOffset + 5 * r);
    src.back().fillRandom(seed + r);
  }
  const std::vector<int> lengths = k.outputLengths(width);
  std::vector<TestImage<uint8_t>> dst;
  for (size_t i = 0; i < lengths.size(); ++i) dst.emplace_back(lengths[i], 1, (dstOffset + 3 * int(i)) % 16);
  Src s;
  Dst d;
  for (auto& i : src) s.push_back(i.data());
  for (auto& i : dst) d.push_back(i.data());
  k.run(s, d, width, avx2);
  const std::vector<Row> want = k.reference(s, width);
  for (size_t i = 0; i < dst.size(); ++i) {
    Row got;
    for (int x = 0; x < lengths[i]; ++x) {
      const int v = dst[i].get(x, 0);
      got.push_back(want[i][x] < 0 && v == TestImage<uint8_t>::kGuard ? -1 : v);
    }
    if (got != want[i])
      return k.name + " width " + std::to_string(width) + " output " + std::to_string(i) + (avx2 ? " avx2" : " sse") +
             "\n got  " + rowText(got) + "\n want " + rowText(want[i]);
    if (!dst[i].guardsIntact()) return k.name + " width " + std::to_string(width) + " wrote past output " + std::to_string(i);
  }
  return "";
}

TEST(PackedReadRows, EveryWidthAndAlignmentMatchesTheFormulas) {
  std::vector<bool> widths = {false};
  if (zel::hasAvx2()) widths.push_back(true);
  for (const Kernel& k : allKernels())
    for (int width = 1; width <= 70; ++width)
      for (int offset : {0, 1, 6, 11})
        for (bool avx2 : widths) {
          const std::string m = check(k, width, offset, offset + 1, avx2, uint32_t(width * 7 + offset));
          ASSERT_EQ(m, "");
        }
}

// Long rows: many whole blocks of both widths.
TEST(PackedReadRows, LongRowsMatchTheFormulas) {
  std::vector<bool> widths = {false};
  if (zel::hasAvx2()) widths.push_back(true);
  for (const Kernel& k : allKernels())
    for (int width : {129, 200, 257})
      for (bool avx2 : widths) ASSERT_EQ(check(k, width, 3, 0, avx2, 99), "");
}

}  // namespace
