// The 16 exported readers of packed words: every pixel of every size
// against the formulas, statuses, rows of odd steps and addresses, the
// worked values of the family, and the one code behind the two
// 565-to-bytes names.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <random>
#include <stdexcept>
#include <string>
#include <vector>

#include "packed16/packed_read_reference.h"
#include "zelcc/zelcc.h"

namespace {

using namespace zel::unpack::test;
using zel::packed::Layout555;
using zel::packed::Layout565;

enum class Kind { Bytes, Studio420, Studio422, Pairs422, Studio411, Yuv420, RedLow420, RedLow422 };
using PlanarFn = Status (*)(const uint16_t*, int, uint8_t* const[3], const int[3], ImageSize);
using SingleFn = Status (*)(const uint16_t*, int, uint8_t*, int, ImageSize);

struct Member {
  const char* name;
  Kind kind;
  Source at;
  PlanarFn planar;
  SingleFn single;
  bool crFirst;
  int minWidth, minHeight;
};

constexpr Source b555 = pixel<Layout555, true>, b565 = pixel<Layout565, true>, r565 = pixel<Layout565, false>;
const Member kMembers[] = {
    {"BGR565ToBGR", Kind::Bytes, b565, nullptr, zeliBGR565ToBGR_16u8u_C3R, false, 1, 1},
    {"RGB565ToRGB", Kind::Bytes, r565, nullptr, zeliRGB565ToRGB_16u8u_C3R, false, 1, 1},
    {"BGR555ToYCbCr411", Kind::Studio411, b555, zeliBGR555ToYCbCr411_16u8u_C3P3R, nullptr, false, 4, 1},
    {"BGR565ToYCbCr411", Kind::Studio411, b565, zeliBGR565ToYCbCr411_16u8u_C3P3R, nullptr, false, 4, 1},
    {"BGR555ToYCbCr420", Kind::Studio420, b555, zeliBGR555ToYCbCr420_16u8u_C3P3R, nullptr, false, 2, 2},
    {"BGR565ToYCbCr420", Kind::Studio420, b565, zeliBGR565ToYCbCr420_16u8u_C3P3R, nullptr, false, 2, 2},
    {"BGR555ToYCrCb420", Kind::Studio420, b555, zeliBGR555ToYCrCb420_16u8u_C3P3R, nullptr, true, 2, 2},
    {"BGR565ToYCrCb420", Kind::Studio420, b565, zeliBGR565ToYCrCb420_16u8u_C3P3R, nullptr, true, 2, 2},
    {"BGR555ToYCbCr422C2", Kind::Pairs422, b555, nullptr, zeliBGR555ToYCbCr422_16u8u_C3C2R, false, 2, 1},
    {"BGR565ToYCbCr422C2", Kind::Pairs422, b565, nullptr, zeliBGR565ToYCbCr422_16u8u_C3C2R, false, 2, 1},
    {"BGR555ToYCbCr422P3", Kind::Studio422, b555, zeliBGR555ToYCbCr422_16u8u_C3P3R, nullptr, false, 2, 1},
    {"BGR565ToYCbCr422P3", Kind::Studio422, b565, zeliBGR565ToYCbCr422_16u8u_C3P3R, nullptr, false, 2, 1},
    {"BGR555ToYUV420", Kind::Yuv420, b555, zeliBGR555ToYUV420_16u8u_C3P3R, nullptr, false, 2, 2},
    {"BGR565ToYUV420", Kind::Yuv420, b565, zeliBGR565ToYUV420_16u8u_C3P3R, nullptr, false, 2, 2},
    {"RGB565ToYUV420", Kind::RedLow420, r565, zeliRGB565ToYUV420_16u8u_C3P3R, nullptr, false, 1, 1},
    {"RGB565ToYUV422", Kind::RedLow422, r565, zeliRGB565ToYUV422_16u8u_C3P3R, nullptr, false, 1, 1},
};

const Member& member(const std::string& name) {
  for (const Member& m : kMembers)
    if (name == m.name) return m;
  throw std::runtime_error(name);
}

bool pairs420(Kind k) { return k == Kind::Studio420 || k == Kind::Yuv420 || k == Kind::RedLow420; }

// Source row y: whole words apart for 565 to bytes; the partner row of a
// 4:2:0 pair (step rounded down to even) past its even row; else y steps.
long rowOffset(Kind k, int step, int y) {
  if (k == Kind::Bytes) return 2L * (step >> 1) * y;
  if (pairs420(k) && (y & 1)) return long(step) * (y - 1) + (step & ~1);
  return long(step) * y;
}

// Bytes a row and rows of each output.
std::vector<std::pair<int, int>> outputs(Kind k, ImageSize s) {
  const int w = s.width, h = s.height, c = k == Kind::Studio411 ? (w + 3) / 4 : (w + 1) / 2;
  if (k == Kind::Bytes || k == Kind::Pairs422) return {{(k == Kind::Bytes ? 3 : 2) * w, h}};
  return {{w, h}, {c, pairs420(k) ? (h + 1) / 2 : h}, {c, pairs420(k) ? (h + 1) / 2 : h}};
}

using Words = std::vector<std::vector<uint16_t>>;
using Plane = std::vector<Row>;

// Expected outputs, -1 where nothing is written.
std::vector<Plane> expected(const Member& m, const Words& words, ImageSize s) {
  std::vector<Plane> out;
  for (auto [bytes, rows] : outputs(m.kind, s)) out.emplace_back(size_t(rows), Row(size_t(bytes), -1));
  const int w = s.width, h = s.height;
  auto row = [&](int y) { return words[size_t(y)].data(); };
  auto put = [&](int plane, int y, const Row& r) {
    for (size_t x = 0; x < r.size(); ++x)
      if (r[x] >= 0) out[size_t(plane)][size_t(y)][x] = r[x];
  };
  for (int y = 0; y < h; ++y) {
    Rows r;
    switch (m.kind) {
      case Kind::Bytes:
        put(0, y, refWordsToBytes(row(y), w));
        continue;
      case Kind::Pairs422:
        put(0, y, refStudio422Pairs(m.at, row(y), w));
        continue;
      case Kind::Studio422:
        r = refStudio422(m.at, row(y), w);
        break;
      case Kind::Studio411:
        r = refStudio411(m.at, row(y), w);
        break;
      case Kind::RedLow422:
        r = refYuv(m.at, row(y), nullptr, w, true);
        break;
      default:
        if (y & 1) continue;
        if (y + 1 == h) {  // a last odd row: luma by the tail form in YCbCr
          if (m.kind == Kind::Studio420) put(0, y, refStudio(m.at, row(y), nullptr, w, 2, 0).y);
          continue;
        }
        r = m.kind == Kind::Studio420 ? refStudio420(m.at, row(y), row(y + 1), w)
                                      : refYuv(m.at, row(y), row(y + 1), w, m.kind == Kind::RedLow420);
        put(0, y + 1, r.y1);
    }
    const int c = pairs420(m.kind) ? y / 2 : y;
    put(0, y, r.y);
    put(m.crFirst ? 2 : 1, c, r.c1);
    put(m.crFirst ? 1 : 2, c, r.c2);
  }
  return out;
}

Status expectedStatus(Kind k, ImageSize s) {
  const bool oddW = s.width & 1, oddH = s.height & 1;
  if (k == Kind::Studio411) return (s.width & 3) ? StatusOddSizeWarning : StatusOk;
  if (k == Kind::Yuv420 || k == Kind::RedLow420) return oddW || oddH ? StatusOddSizeWarning : StatusOk;
  if (k == Kind::RedLow422) return oddW ? StatusOddSizeWarning : StatusOk;
  return StatusOk;
}

// One call: the source rows placed by rowOffset, destinations filled with
// kFill and read back whole, guards and padding included.
struct Call {
  static constexpr uint8_t kFill = 0xA3;
  std::vector<uint8_t> src;
  std::vector<std::vector<uint8_t>> dst;
  std::vector<uint8_t*> first;
  std::vector<int> steps;
  Status status;
  Call(const Member& m, const Words& words, ImageSize s, int srcStep, int srcOffset, int pad, int dstOffset) {
    src.assign(size_t(128 + srcOffset + rowOffset(m.kind, srcStep, s.height) + 2 * s.width), 0x5D);
    for (int y = 0; y < s.height; ++y)
      std::memcpy(src.data() + 64 + srcOffset + rowOffset(m.kind, srcStep, y), words[size_t(y)].data(),
                  2 * size_t(s.width));
    for (auto [bytes, rows] : outputs(m.kind, s)) {
      steps.push_back(bytes + pad);
      dst.emplace_back(size_t(128 + dstOffset + (bytes + pad) * rows), kFill);
      first.push_back(dst.back().data() + 64 + dstOffset);
    }
    const auto* p = reinterpret_cast<const uint16_t*>(src.data() + 64 + srcOffset);
    status =
        m.single ? m.single(p, srcStep, first[0], steps[0], s) : m.planar(p, srcStep, first.data(), steps.data(), s);
  }
  int at(int plane, int x, int y) const { return first[size_t(plane)][y * steps[size_t(plane)] + x]; }
  std::string compare(const std::vector<Plane>& want) const {
    for (size_t i = 0; i < dst.size(); ++i) {
      std::vector<int> expect(dst[i].size(), kFill);
      const long start = long(first[i] - dst[i].data());
      for (size_t y = 0; y < want[i].size(); ++y)
        for (size_t x = 0; x < want[i][y].size(); ++x)
          if (want[i][y][x] >= 0) expect[size_t(start + long(y) * steps[i]) + x] = want[i][y][x];
      for (size_t k = 0; k < expect.size(); ++k)
        if (dst[i][k] != expect[k])
          return "output " + std::to_string(i) + " byte " + std::to_string(long(k) - start) + ": " +
                 std::to_string(dst[i][k]) + " instead of " + std::to_string(expect[k]);
    }
    return "";
  }
};

Words randomWords(ImageSize s, uint32_t seed) {
  std::mt19937 rng(seed);
  Words w(size_t(s.height), std::vector<uint16_t>(size_t(s.width)));
  for (auto& row : w)
    for (auto& v : row) v = uint16_t(rng());
  return w;
}

std::string check(const Member& m, ImageSize s, int srcStep, int srcOffset, int pad, int dstOffset, uint32_t seed) {
  const Words words = randomWords(s, seed);
  const Call c(m, words, s, srcStep, srcOffset, pad, dstOffset);
  if (c.status != expectedStatus(m.kind, s)) return "status " + std::to_string(c.status);
  return c.compare(expected(m, words, s));
}

TEST(PackedReaders, EverySizeMatchesTheFormulas) {
  for (const Member& m : kMembers)
    for (int h = m.minHeight; h <= 5; ++h)
      for (int w = m.minWidth; w <= 40; ++w)
        for (int v = 0; v < 2; ++v)
          ASSERT_EQ(check(m, {w, h}, 2 * w + 6 * v, 2 * v, 3 * v, v, uint32_t(w * 31 + h * 7 + v)), "")
              << m.name << " " << w << "x" << h << " variant " << v;
}

// Odd source steps, rows at odd addresses.
TEST(PackedReaders, OddSourceStepsAndAddresses) {
  for (const Member& m : kMembers)
    for (int offset : {0, 1}) EXPECT_EQ(check(m, {13, 5}, 33, offset, 1, 3, 5), "") << m.name << " offset " << offset;
}

TEST(PackedReaders, OneCodeBehindBothByteOrders) {
  EXPECT_EQ(reinterpret_cast<void*>(&zeliBGR565ToBGR_16u8u_C3R), reinterpret_cast<void*>(&zeliRGB565ToRGB_16u8u_C3R));
  const uint16_t word = (3 << 11) | (5 << 5) | 7;
  uint8_t bytes[3] = {};
  ASSERT_EQ(zeliRGB565ToRGB_16u8u_C3R(&word, 2, bytes, 3, {1, 1}), StatusOk);
  EXPECT_EQ(bytes[0], 7 << 3);  // the low field first
  EXPECT_EQ(bytes[1], 5 << 2);
  EXPECT_EQ(bytes[2], 3 << 3);
}

Call uniform(const char* name, ImageSize s, uint16_t word) {
  return Call(member(name), Words(size_t(s.height), std::vector<uint16_t>(size_t(s.width), word)), s, 2 * s.width, 0, 0,
              0);
}

// 4:2:0 at width 24: pixels 16 to 23 take the tail forms; at width 28 the
// four pixels 16 to 19 still take the body forms.
TEST(PackedReaders, WidthDecidesTheForms) {
  int word = 0, body = 0, tail = 0;
  for (; word < 65536 && body == tail; ++word) {
    const uint16_t w = uint16_t(word);
    const Rgb p = b565(&w, 0);
    body = zel::unpack::studioLumaBody(p.r, p.g, p.b);
    tail = zel::unpack::studioLumaTail(p.r, p.g, p.b);
  }
  const Call w24 = uniform("BGR565ToYCbCr420", {24, 2}, uint16_t(word - 1));
  const Call w28 = uniform("BGR565ToYCbCr420", {28, 2}, uint16_t(word - 1));
  for (int x = 0; x < 24; ++x) EXPECT_EQ(w24.at(0, x, 1), x < 16 ? body : tail) << x;
  for (int x = 0; x < 28; ++x) EXPECT_EQ(w28.at(0, x, 1), x < 20 ? body : tail) << x;
  // Blue-low YUV, width 10: U of this colour is 190 by the body (pixels 0
  // to 7) and 189 by the tail.
  const Call yuv = uniform("BGR565ToYUV420", {10, 2}, 0x0032);
  for (int j = 0; j < 5; ++j) EXPECT_EQ(yuv.at(1, j, 0), j < 4 ? 190 : 189) << j;
  // White: 231 in 565, 229 in 555, body and tail alike.
  const Call white565 = uniform("BGR565ToYCbCr422P3", {41, 1}, 0xFFFF),
             white555 = uniform("BGR555ToYCbCr411", {41, 1}, 0xFFFF);
  for (int x : {0, 40}) {
    EXPECT_EQ(white565.at(0, x, 0), 231);
    EXPECT_EQ(white555.at(0, x, 0), 229);
  }
}

TEST(PackedReaders, OddSizes) {
  // Width 3, YUV 4:2:0: two luma columns, one U and V, a warning.
  const Call yuv = uniform("BGR555ToYUV420", {3, 2}, 0x1234);
  EXPECT_EQ(yuv.status, StatusOddSizeWarning);
  EXPECT_NE(yuv.at(0, 1, 1), Call::kFill);
  EXPECT_EQ(yuv.at(0, 2, 1), Call::kFill);
  EXPECT_NE(yuv.at(1, 0, 0), Call::kFill);
  EXPECT_EQ(yuv.at(1, 1, 0), Call::kFill);
  // Width 3, YCbCr 4:2:0: three luma columns, one Cb and Cr, no warning.
  const Call ycc = uniform("BGR555ToYCbCr420", {3, 2}, 0x1234);
  EXPECT_EQ(ycc.status, StatusOk);
  EXPECT_NE(ycc.at(0, 2, 1), Call::kFill);
  EXPECT_NE(ycc.at(2, 0, 0), Call::kFill);
  EXPECT_EQ(ycc.at(2, 1, 0), Call::kFill);
  // Width 6, 4:1:1: six luma, one Cb and Cr a row, a warning.
  const Call q = uniform("BGR565ToYCbCr411", {6, 2}, 0x1234);
  EXPECT_EQ(q.status, StatusOddSizeWarning);
  EXPECT_NE(q.at(0, 5, 1), Call::kFill);
  EXPECT_NE(q.at(1, 0, 1), Call::kFill);
  EXPECT_EQ(q.at(1, 1, 1), Call::kFill);
  // Red-low 565: height 1 in 4:2:0, width 1 in both: nothing, a warning.
  for (auto [name, size] : {std::pair{"RGB565ToYUV420", ImageSize{8, 1}}, std::pair{"RGB565ToYUV420", ImageSize{1, 4}},
                            std::pair{"RGB565ToYUV422", ImageSize{1, 4}}}) {
    const Call c = uniform(name, size, 0x1234);
    EXPECT_EQ(c.status, StatusOddSizeWarning) << name;
    for (const auto& b : c.dst) EXPECT_EQ(std::count(b.begin(), b.end(), Call::kFill), long(b.size())) << name;
  }
}

}  // namespace
