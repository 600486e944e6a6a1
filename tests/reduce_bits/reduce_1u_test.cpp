// Reduction to one bit a pixel: bit packing at every offset, the threshold
// body against its per-pixel rule, integer Stucki against an independent
// model, and the allocation failure.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "core/zelcore.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace {

using zel::test::TestImage;

Status reduce1u(const TestImage<uint8_t>& src, TestImage<uint8_t>& dst, int width, int height, int bitOffset,
                int kind, uint8_t threshold) {
  return zeliReduceBits_8u1u_C1R(src.data(), src.step(), dst.data(), dst.step(), bitOffset,
                                 ImageSize{width, height}, 0x5eed, -1, kind, threshold);
}

// The destination bytes a row must hold: pixel bits from bit `off` of the
// first byte down; with an offset the first byte keeps only its top `off`
// bits, and otherwise a last partial byte keeps its unused low bits.
std::vector<uint8_t> expectedRow(const std::vector<int>& bits, int off, const uint8_t* before) {
  const int width = int(bits.size());
  const int bytes = (off + width + 7) / 8;
  std::vector<uint8_t> out(before, before + bytes);
  for (int i = 0; i < bytes; ++i) {
    const int firstBit = i * 8, lastBit = std::min(off + width, firstBit + 8);  // bit positions in the row
    uint8_t keep = 0;
    if (i == 0 && off != 0) keep = uint8_t(0xFF00 >> off);
    else if (lastBit < firstBit + 8) keep = uint8_t((1 << (firstBit + 8 - lastBit)) - 1);
    out[i] &= keep;
    for (int b = std::max(firstBit, off); b < lastBit; ++b)
      if (bits[b - off]) out[i] = uint8_t(out[i] | (0x80 >> (b - firstBit)));
  }
  return out;
}

TEST(ReduceBitsTo1u, DocumentedPacking) {
  TestImage<uint8_t> src(12, 1), dst(2, 1);
  for (int x = 0; x < 12; ++x) src.set(x, 0, uint8_t(x % 3 == 0 ? 200 : 10));  // 1 0 0 1 0 0 ...
  // Offset 3, width 2: bits 4 and 3 hold the pixels, 7..5 stay, 2..0 clear.
  dst.set(0, 0, 0xFF);
  ASSERT_EQ(reduce1u(src, dst, 2, 1, 3, 0, 100), StatusOk);
  EXPECT_EQ(dst.get(0, 0), 0xF0);
  // Offset 0, width 12: a full byte, then the top 4 bits of a byte whose
  // low 4 bits stay. Offsets 8 and 0 mean the same.
  for (int offset : {0, 8, 16}) {
    dst.set(0, 0, 0x00);
    dst.set(1, 0, 0x0F);
    ASSERT_EQ(reduce1u(src, dst, 12, 1, offset, 0, 100), StatusOk);
    EXPECT_EQ(dst.get(0, 0), 0x92);
    EXPECT_EQ(dst.get(1, 0), 0x4F);
  }
  EXPECT_TRUE(dst.guardsIntact());
}

TEST(ReduceBitsTo1u, ThresholdAtEveryOffsetAndWidth) {
  for (int width = 1; width <= 70; ++width)
    for (int bitOffset = 0; bitOffset < 10; ++bitOffset)
      for (int threshold : {0, 1, 127, 128, 255}) {
        const int rowBytes = (bitOffset % 8 + width + 7) / 8;
        TestImage<uint8_t> src(width, 3, 1 + width % 4, 3), dst(rowBytes, 3, 3, 1);
        src.fillRandom(uint32_t(width * 11 + threshold));
        if (threshold == 0)
          for (int x = 0; x < width; x += 3) src.set(x, 1, 0);
        dst.fillRandom(uint32_t(width + bitOffset));
        std::vector<std::vector<uint8_t>> before;
        for (int y = 0; y < 3; ++y) before.emplace_back(dst.row(y), dst.row(y) + rowBytes);
        ASSERT_EQ(reduce1u(src, dst, width, 3, bitOffset, 0, uint8_t(threshold)), StatusOk);
        for (int y = 0; y < 3; ++y) {
          std::vector<int> bits;
          for (int x = 0; x < width; ++x) bits.push_back(src.get(x, y) > threshold ? 1 : 0);
          const auto expected = expectedRow(bits, bitOffset % 8, before[y].data());
          ASSERT_EQ(std::vector<uint8_t>(dst.row(y), dst.row(y) + rowBytes), expected)
              << "width " << width << " offset " << bitOffset << " threshold " << threshold << " row " << y;
        }
        ASSERT_TRUE(dst.guardsIntact());
      }
}

TEST(ReduceBitsTo1u, StuckiMatchesTheModel) {
  // A 13 by 4 pattern; the bit rows of an independent model at two
  // thresholds, packed at three offsets.
  const int width = 13, height = 4;
  TestImage<uint8_t> src(width, height, 1), dst(3, height, 2);
  for (int y = 0; y < height; ++y)
    for (int x = 0; x < width; ++x) src.set(x, y, uint8_t((x * 37 + y * 101 + 11) % 256));
  struct Case {
    uint8_t threshold;
    const char* rows[4];
  };
  for (const Case& c : {Case{128, {"0001111000111", "0111000011100", "1100011110001", "0011110001111"}},
                        Case{0, {"1111111011111", "1111001111100", "1100011110011", "0011110000111"}}})
    for (int bitOffset : {0, 3, 7}) {
      dst.fill(0xA5);
      ASSERT_EQ(reduce1u(src, dst, width, height, bitOffset, 3, c.threshold), StatusOk);
      const uint8_t filler[3] = {0xA5, 0xA5, 0xA5};
      for (int y = 0; y < height; ++y) {
        std::vector<int> bits;
        for (const char* b = c.rows[y]; *b; ++b) bits.push_back(*b - '0');
        const auto expected = expectedRow(bits, bitOffset, filler);
        EXPECT_EQ(std::vector<uint8_t>(dst.row(y), dst.row(y) + expected.size()), expected)
            << int(c.threshold) << " offset " << bitOffset << " row " << y;
      }
    }
  EXPECT_TRUE(dst.guardsIntact());
}

TEST(ReduceBitsTo1u, MemoryOfTheDiffusion) {
  TestImage<uint8_t> src(9, 2), dst(2, 2);
  src.fillRandom(5);
  dst.fill(0x3C);
  zelTestFailMallocAfter(0);
  const Status stucki = reduce1u(src, dst, 9, 2, 0, 3, 50);
  zelTestFailMallocAfter(-1);
  EXPECT_EQ(stucki, StatusOutOfMemoryError);
  for (int y = 0; y < 2; ++y) EXPECT_TRUE(dst.get(0, y) == 0x3C && dst.get(1, y) == 0x3C);
  zelTestFailMallocAfter(0);
  EXPECT_EQ(reduce1u(src, dst, 9, 2, 0, 0, 50), StatusOk);  // the threshold needs no memory
  zelTestFailMallocAfter(-1);
}

}  // namespace
