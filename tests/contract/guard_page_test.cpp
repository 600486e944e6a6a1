// Every export over small sizes with each buffer against an inaccessible
// page: right after the last byte the call may touch, or right before the
// first. One byte read or written too far faults at once; the fault is
// caught and told as the buffer, the direction and the distance it hit.
#include <gtest/gtest.h>

#include <cstring>
#include <set>
#include <sstream>

#include "frame/descriptor.h"
#include "support/guarded_call.h"

namespace {

using namespace zel::meta;
using zel::test::GuardedCall;

std::vector<const Descriptor*> imageFunctions() {
  std::vector<const Descriptor*> out;
  for (const Descriptor& d : allDescriptors())
    if (d.isImageFunction()) out.push_back(&d);
  return out;
}

class GuardPages : public ::testing::TestWithParam<const Descriptor*> {};

std::string paramName(const ::testing::TestParamInfo<const Descriptor*>& info) { return info.param->name; }

// Widths 1 to 40: every width up to two blocks of 8, then the widths around
// the block sizes 16 and 32 and a few in between.
const std::vector<int>& widths() {
  static const std::vector<int> w = [] {
    std::vector<int> v;
    for (int x = 1; x <= 17; ++x) v.push_back(x);
    for (int x : {19, 21, 23, 24, 25, 29, 31, 32, 33, 35, 39, 40}) v.push_back(x);
    return v;
  }();
  return w;
}

// The sizes one member is called with: each width at a few heights, raised
// to the member's minima and multiples, each size once.
std::vector<ImageSize> sizesOf(const Descriptor& d) {
  std::vector<ImageSize> out;
  std::set<std::pair<int, int>> seen;
  for (int h : {1, 2, 3})
    for (int w : widths()) {
      const ImageSize s = d.validSize(w, h);
      if (seen.insert({s.width, s.height}).second) out.push_back(s);
    }
  return out;
}

const char* fenceName(Fence f) { return f == Fence::After ? "after" : "before"; }

// One call per size with every buffer fenced on one side; the first fault
// or stray write ends the fence's sweep with a message.
void sweep(const Descriptor& d, Fence fence, int stepSign) {
  GuardedCall guarded;
  for (const ImageSize& size : sizesOf(d)) {
    Workspace w(d, size, 0, 0, fence, stepSign);
    w.fillRandom(uint32_t(size.width * 977 + size.height));
    w.fillDestinations(0x5A);
    const GuardedCall::Outcome out = guarded.call(w);
    std::ostringstream where;
    where << size.width << "x" << size.height << ", page " << fenceName(fence) << " each buffer"
          << (stepSign < 0 ? ", negative steps" : "");
    if (out.faulted) {
      ADD_FAILURE() << d.name << " at " << where.str() << ": " << out.message;
      return;
    }
    if (!(out.status == StatusOk || (d.warnsOdd && out.status == StatusOddSizeWarning))) {
      ADD_FAILURE() << d.name << " at " << where.str() << ": status " << out.status;
      return;
    }
    const std::string stray = w.checkGuards();
    if (!stray.empty()) {
      ADD_FAILURE() << d.name << " at " << where.str() << ": " << stray;
      return;
    }
  }
}

// Where steps are taken unchecked, also with negative steps: the first row
// lies highest, its end meets the page after and the last row's start the
// page before.
TEST_P(GuardPages, TouchesNothingPastEitherEnd) {
  const Descriptor& d = *GetParam();
  sweep(d, Fence::After, 1);
  sweep(d, Fence::Before, 1);
  if (d.checksSteps || !d.region) return;
  sweep(d, Fence::After, -1);
  sweep(d, Fence::Before, -1);
}

INSTANTIATE_TEST_SUITE_P(AllExports, GuardPages, ::testing::ValuesIn(imageFunctions()), paramName);

// The fence itself: a read one byte past a fenced buffer is caught and
// told, and a read of its last byte is not.
TEST(GuardPageFence, CatchesAReadOneBytePastTheEnd) {
  const Descriptor* d = findDescriptor("zeliGrayToRGB_8u_C1C3R");
  ASSERT_NE(d, nullptr);
  for (Fence fence : {Fence::After, Fence::Before}) {
    Workspace w(*d, ImageSize{5, 2}, 0, 0, fence);
    const Workspace::Buffer& src = *w.bufferOf(0, 0);
    const uint8_t* lastByte = src.first + src.pitch + src.geometry.rowBytes - 1;
    const uint8_t* beyond = fence == Fence::After ? lastByte + 1 : src.first - 1;
    GuardedCall guarded;
    EXPECT_FALSE(guarded.touch(w, fence == Fence::After ? lastByte : src.first).faulted);
    const GuardedCall::Outcome out = guarded.touch(w, beyond);
    ASSERT_TRUE(out.faulted) << fenceName(fence);
    EXPECT_NE(out.message.find("source plane 0"), std::string::npos) << out.message;
    EXPECT_NE(out.message.find(fence == Fence::After ? "1 byte past its end" : "1 byte before its start"),
              std::string::npos)
        << out.message;
  }
}

// Rows lie where the steps put them, whatever their sign, and a byte
// changed between rows or beside them is told.
TEST(GuardPageFence, RowsLieWhereTheStepsSay) {
  const Descriptor* d = findDescriptor("zeliGrayToRGB_16u_C1C3R");
  ASSERT_NE(d, nullptr);
  for (Fence fence : {Fence::None, Fence::After, Fence::Before})
    for (int sign : {1, -1, 0}) {
      Workspace w(*d, ImageSize{3, 4}, 5, 3, fence, sign);
      Workspace::Buffer& dst = *w.bufferOf(1, 0);
      EXPECT_EQ(dst.step, sign * (18 + 5));
      EXPECT_EQ(dst.pitch, sign * (18 + 5));
      std::vector<Arg> args = w.arguments();
      EXPECT_EQ(args[3].i, dst.step);
      // The rows, and nothing else, are the call's.
      for (int y = 0; y < 4; ++y) std::memset(dst.first + ptrdiff_t(y) * dst.pitch, 0x11, 18);
      EXPECT_EQ(w.checkGuards(), "") << int(fence) << " " << sign;
      if (sign == 0) continue;
      uint8_t* pad = dst.first + ptrdiff_t(1) * dst.pitch + 18;  // after the second row
      *pad = 0;
      EXPECT_NE(w.checkGuards().find("destination plane 0: byte at offset " + std::to_string(pad - dst.first)),
                std::string::npos)
          << w.checkGuards();
      *pad = Workspace::kGuardByte;
      uint8_t* last = dst.first + ptrdiff_t(3) * dst.pitch;
      const uint8_t* lowest = sign > 0 ? dst.first : last;
      if (fence == Fence::Before) EXPECT_EQ(reinterpret_cast<uintptr_t>(lowest) % 4096, 0u);
      if (fence == Fence::After)
        EXPECT_EQ(reinterpret_cast<uintptr_t>((sign > 0 ? last : dst.first) + 18) % 4096, 0u);
    }
}

}  // namespace
