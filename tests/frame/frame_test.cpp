// The call frame's own parts: entry table, load routine, zelcore, temporary
// buffers and the byte fill.
#include <gtest/gtest.h>

#include <cstring>
#include <fstream>
#include <map>
#include <regex>
#include <set>
#include <vector>

#include "core/zelcore.h"
#include "frame/allocate.h"
#include "frame/entry_table.h"
#include "frame/fill_bytes.h"
#include "frame/load.h"
#include "frame/row_driver.h"
#include "support/test_image.h"

namespace {

TEST(EntryTable, ByteOrderOneImplementationPerSlotButTheSharedPairs) {
  ASSERT_GT(zel::kEntryCount, 0);
  EXPECT_STREQ(zel::kEntryTable[0].name, "zelccGetLibVersion");
  std::map<void (*)(), std::vector<std::string>> byImpl;
  for (int i = 0; i < zel::kEntryCount; ++i) {
    ASSERT_NE(zel::kEntryTable[i].impl, nullptr) << zel::kEntryTable[i].name;
    if (i > 0) EXPECT_LT(std::strcmp(zel::kEntryTable[i - 1].name, zel::kEntryTable[i].name), 0);
    byImpl[zel::kEntryTable[i].impl].push_back(zel::kEntryTable[i].name);
  }
  // Only the two symmetric packings may share; when present they must.
  const std::set<std::set<std::string>> allowed = {
      {"zeliBGR565ToBGR_16u8u_C3R", "zeliRGB565ToRGB_16u8u_C3R"},
      {"zeliBGRToBGR565_8u16u_C3R", "zeliRGBToRGB565_8u16u_C3R"}};
  std::set<std::string> names;
  for (int i = 0; i < zel::kEntryCount; ++i) names.insert(zel::kEntryTable[i].name);
  for (const auto& [impl, list] : byImpl)
    if (list.size() > 1) EXPECT_TRUE(allowed.count(std::set<std::string>(list.begin(), list.end()))) << list[0];
  for (const auto& pair : allowed) {
    if (!names.count(*pair.begin()) || !names.count(*pair.rbegin())) continue;
    void (*a)() = nullptr;
    void (*b)() = nullptr;
    for (int i = 0; i < zel::kEntryCount; ++i) {
      if (zel::kEntryTable[i].name == *pair.begin()) a = zel::kEntryTable[i].impl;
      if (zel::kEntryTable[i].name == *pair.rbegin()) b = zel::kEntryTable[i].impl;
    }
    EXPECT_EQ(a, b) << *pair.begin();
  }
}

TEST(LoadRoutine, RecordsTheFeaturePairOnAttachOnly) {
  const uint64_t features = zelGetEnabledCpuFeatures();
  const int expected = (features & 16u) && (features & 32u) ? 1 : 0;
  EXPECT_EQ(zel::cpuPairEnabled, expected);  // set when the library was loaded
  zel::cpuPairEnabled = 7;
  for (int reason : {0, 2, 3}) EXPECT_EQ(zel::onLoad(reason), 1);
  EXPECT_EQ(zel::cpuPairEnabled, 7);
  EXPECT_EQ(zel::onLoad(zel::kAttachProcess), 1);
  EXPECT_EQ(zel::cpuPairEnabled, expected);
}

TEST(Zelcore, ReportsRealFeaturesAndCache) {
  const uint64_t f = zelGetEnabledCpuFeatures();
  EXPECT_EQ(bool(f & zelCpuSSE41), bool(__builtin_cpu_supports("sse4.1")));
  EXPECT_EQ(bool(f & zelCpuSSSE3), bool(__builtin_cpu_supports("ssse3")));
  EXPECT_EQ(bool(f & zelCpuAVX2), bool(__builtin_cpu_supports("avx2")));
  int size = 0;
  ASSERT_EQ(zelGetMaxCacheSizeB(&size), 0);
  EXPECT_GE(size, 32 * 1024);
  EXPECT_NE(zelGetMaxCacheSizeB(nullptr), 0);
}

TEST(Allocate, CountsBelowOneNeverReachZelcoreAndFailuresAreNull) {
  // With a budget of zero successes, any call that reached zelMalloc fails.
  zelTestFailMallocAfter(1);
  EXPECT_EQ(zel::allocate32(0), nullptr);
  EXPECT_EQ(zel::allocate16(-4), nullptr);
  int32_t* one = zel::allocate32(3);  // uses the one success left
  ASSERT_NE(one, nullptr);
  one[2] = 5;
  EXPECT_EQ(zel::allocate16(8), nullptr);
  zelTestFailMallocAfter(-1);
  int16_t* two = zel::allocate16(8);
  ASSERT_NE(two, nullptr);
  two[7] = 1;
  zel::release(one);
  zel::release(two);
}

TEST(Drivers, BufferedWalkReportsOutOfMemory) {
  zelTestFailMallocAfter(0);
  bool ran = false;
  EXPECT_EQ(zel::bufferedWalk16(64, [&](int16_t*) { ran = true; }), StatusOutOfMemoryError);
  EXPECT_EQ(zel::bufferedWalk32(64, [&](int32_t*) { ran = true; }), StatusOutOfMemoryError);
  EXPECT_FALSE(ran);
  zelTestFailMallocAfter(-1);
  EXPECT_EQ(zel::bufferedWalk32(64, [&](int32_t* b) { b[63] = 1, ran = true; }), StatusOk);
  EXPECT_TRUE(ran);
}

TEST(Drivers, RowPairWalkLeavesTheLastOddRow) {
  std::vector<std::pair<int, int>> seen;
  zel::rowPairWalk(5, [&](int luma, int chroma) { seen.push_back({luma, chroma}); });
  EXPECT_EQ(seen, (std::vector<std::pair<int, int>>{{0, 0}, {2, 1}}));
}

using zel::test::TestImage;

TEST(FillBytes, ChecksAndEveryShapeOfRow) {
  uint8_t byte = 1;
  EXPECT_EQ(zel::fillBytes(9, nullptr, 1, 1, 1), StatusNullPointerError);
  EXPECT_EQ(zel::fillBytes(9, nullptr, 1, 0, 1), StatusNullPointerError);
  EXPECT_EQ(zel::fillBytes(9, &byte, 1, 0, 1), StatusSizeError);
  EXPECT_EQ(zel::fillBytes(9, &byte, 1, 1, -1), StatusSizeError);
  EXPECT_EQ(byte, 1);
  EXPECT_EQ(zel::fillBytes(9, &byte, 1, 1, 1), StatusOk);
  EXPECT_EQ(byte, 9);
  // Lengths around the 16- and 64-byte thresholds, every start alignment,
  // padded and contiguous rows.
  for (int width : {1, 15, 16, 17, 63, 64, 65, 127, 200})
    for (int offset = 0; offset < 16; ++offset)
      for (int pad : {0, 9}) {
        TestImage<uint8_t> img(width, 3, offset, pad);
        ASSERT_EQ(zel::fillBytes(0x42, img.data(), img.step(), width, 3), StatusOk);
        for (int y = 0; y < 3; ++y)
          for (int x = 0; x < width; ++x) ASSERT_EQ(img.get(x, y), 0x42) << width << " " << offset;
        ASSERT_TRUE(img.guardsIntact()) << width << " " << offset << " " << pad;
      }
}

TEST(FillBytes, LargeFillsBypassTheCacheWithTheSameBytes) {
  // 2048 x 2048 contiguous bytes, a cache no larger than that: non-temporal.
  zelTestOverrideCacheSize(0, 2048 * 2048);
  EXPECT_TRUE(zel::fillBytesNonTemporal(2048 * 2048));
  EXPECT_FALSE(zel::fillBytesNonTemporal(1048576));  // at or below 1 MiB never asks
  zelTestOverrideCacheSize(0, 2048 * 2048 + 1);
  EXPECT_FALSE(zel::fillBytesNonTemporal(2048 * 2048));
  for (int mode : {0, 1}) {  // non-temporal route, then a failing cache query
    zelTestOverrideCacheSize(mode, 1 << 20);
    EXPECT_EQ(zel::fillBytesNonTemporal(2048 * 2048), mode == 0);
    TestImage<uint8_t> img(2048, 2048, 5);
    ASSERT_EQ(zel::fillBytes(0xE1, img.data(), 2048, 2048, 2048), StatusOk);
    for (int y = 0; y < 2048; y += 97)
      for (int x = 0; x < 2048; ++x) ASSERT_EQ(img.get(x, y), 0xE1);
    EXPECT_EQ(img.get(2047, 2047), 0xE1);
    EXPECT_TRUE(img.guardsIntact());
  }
  zelTestOverrideCacheSize(-1, 0);
}

}  // namespace
