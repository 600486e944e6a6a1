// One data-driven test over every export the library has: argument checks
// in their order, nothing written on failure, guard bytes and step padding
// untouched on success, zero steps accepted where steps are not checked.
#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <functional>
#include <set>

#include "frame/descriptor.h"

namespace {

using namespace zel::meta;

std::vector<const Descriptor*> imageFunctions() {
  std::vector<const Descriptor*> out;
  for (const Descriptor& d : allDescriptors())
    if (d.isImageFunction()) out.push_back(&d);
  return out;
}

class Contract : public ::testing::TestWithParam<const Descriptor*> {};

std::string paramName(const ::testing::TestParamInfo<const Descriptor*>& info) { return info.param->name; }

ArgKind slotKind(const Descriptor& d, const ArgSlot& s) {
  switch (s.role) {
    case Role::SrcStep:
    case Role::DstStep:
    case Role::SrcDstStep:
    case Role::ScratchStep: return ArgKind::Int32;
    case Role::SrcRegion: return ArgKind::Region;
    case Role::Size: return ArgKind::Size;
    case Role::Extra: return d.extras[s.extra].kind;
    default: return ArgKind::Pointer;
  }
}

TEST_P(Contract, DescriptorMatchesPrototype) {
  const Descriptor& d = *GetParam();
  ASSERT_EQ(d.prototype.size(), d.slots.size()) << "argument count differs from the prototype";
  for (size_t i = 0; i < d.slots.size(); ++i)
    EXPECT_EQ(int(d.prototype[i]), int(slotKind(d, d.slots[i]))) << "argument " << i;
}

// A way to make one check fail, and the status that check gives.
struct Failure {
  std::string what;
  Status status;
  std::function<void(Workspace&, std::vector<Arg>&, ImageSize&)> apply;
};

std::vector<Failure> failuresOf(const Descriptor& d, const CheckStage& stage) {
  std::vector<Failure> out;
  switch (stage.check) {
    case Check::NullTop:
      for (size_t i = 0; i < d.slots.size(); ++i) {
        const Role r = d.slots[i].role;
        const bool recordPointer = r == Role::Extra && d.extras[d.slots[i].extra].kind == ArgKind::Pointer &&
                                   !d.extras[d.slots[i].extra].optional;
        if (r == Role::SrcPtr || r == Role::DstPtr || r == Role::SrcDstPtr || r == Role::SrcPlanes ||
            r == Role::DstPlanes || r == Role::SrcDstPlanes || recordPointer)
          out.push_back({"null argument " + std::to_string(i), StatusNullPointerError,
                         [i](Workspace&, std::vector<Arg>& a, ImageSize&) { a[i].p = nullptr; }});
      }
      break;
    case Check::NullPlanes:
      for (const ArgSlot& s : d.slots) {
        const int side = s.role == Role::SrcPlanes ? 0 : s.role == Role::DstPlanes ? 1 : s.role == Role::SrcDstPlanes ? 2 : -1;
        if (side < 0 || (stage.side >= 0 && stage.side != side)) continue;
        const Side& sd = side == 1 ? d.dst : d.src;
        const int tested = d.testedPlanes > 0 ? std::min(d.testedPlanes, sd.planes()) : sd.planes();
        for (int k = 0; k < tested; ++k)
          out.push_back({"null plane " + std::to_string(k) + " of side " + std::to_string(side), StatusNullPointerError,
                         [side, k](Workspace& w, std::vector<Arg>&, ImageSize&) { w.planeArray(side)[k] = nullptr; }});
      }
      break;
    case Check::SizePositive:
    case Check::Size: {
      const bool split = std::any_of(d.order.begin(), d.order.end(),
                                     [](const CheckStage& c) { return c.check == Check::SizePositive; });
      const bool positives = !split || stage.check == Check::SizePositive;
      const bool minima = !split || stage.check == Check::Size;
      auto setSize = [](int w, int h) {
        return [w, h](Workspace&, std::vector<Arg>& a, ImageSize& s) {
          s = ImageSize{w == INT32_MIN ? s.width : w, h == INT32_MIN ? s.height : h};
          for (Arg& arg : a)
            if (arg.kind == ArgKind::Size) arg.size = s;
        };
      };
      if (d.minWidth > 0 && positives) {
        out.push_back({"width 0", StatusSizeError, setSize(0, INT32_MIN)});
        out.push_back({"negative width", StatusSizeError, setSize(-7, INT32_MIN)});
      }
      if (d.minHeight > 0 && positives) {
        out.push_back({"height 0", StatusSizeError, setSize(INT32_MIN, 0)});
        out.push_back({"negative height", StatusSizeError, setSize(INT32_MIN, -3)});
      }
      if (!minima) break;
      if (d.minWidth > 1) out.push_back({"width below minimum", StatusSizeError, setSize(d.minWidth - 1, INT32_MIN)});
      if (d.minHeight > 1)
        out.push_back({"height below minimum", StatusSizeError, setSize(INT32_MIN, d.minHeight - 1)});
      if (d.multWidth > 1)
        out.push_back({"width off its multiple", StatusSizeError, setSize(d.validSize(9, 1).width + 1, INT32_MIN)});
      if (d.multHeight > 1)
        out.push_back({"height off its multiple", StatusSizeError, setSize(INT32_MIN, d.validSize(1, 4).height + 1)});
      break;
    }
    case Check::Step:
      for (size_t i = 0; i < d.slots.size(); ++i) {
        const Role r = d.slots[i].role;
        if (r == Role::SrcStep || r == Role::DstStep || r == Role::SrcDstStep) {
          out.push_back({"zero step " + std::to_string(i), StatusStepError,
                         [i](Workspace&, std::vector<Arg>& a, ImageSize&) { a[i].i = 0; }});
          out.push_back({"negative step " + std::to_string(i), StatusStepError,
                         [i](Workspace&, std::vector<Arg>& a, ImageSize&) { a[i].i = -16; }});
        }
      }
      break;
    case Check::Extra: {
      const Extra& e = d.extras[stage.extra];
      size_t index = 0;
      for (size_t i = 0; i < d.slots.size(); ++i)
        if (d.slots[i].role == Role::Extra && d.slots[i].extra == stage.extra) index = i;
      for (const BadValue& b : e.bad)
        out.push_back({e.name + " = " + std::to_string(b.value), b.status,
                       [index, b](Workspace&, std::vector<Arg>& a, ImageSize&) {
                         a[index].f = b.value;
                         a[index].i = std::isfinite(b.value) ? int64_t(b.value) : 0;
                       }});
      break;
    }
  }
  return out;
}

ImageSize workingSize(const Descriptor& d) { return d.validSize(9, 4); }

// Runs one call with the given failures applied; the status must be
// `expected` and no byte of any buffer may change.
void expectRejected(const Descriptor& d, const std::vector<const Failure*>& failures, Status expected) {
  ImageSize size = workingSize(d);
  Workspace w(d, size, 5, 1);
  w.fillRandom(11);
  w.fillDestinations(0x3C);
  std::vector<Arg> args = w.arguments();
  std::string what;
  for (const Failure* f : failures) {
    f->apply(w, args, size);
    what += f->what + "; ";
  }
  const auto before = w.snapshot();
  const Status s = w.call(args);
  EXPECT_EQ(int(s), int(expected)) << what;
  EXPECT_TRUE(before == w.snapshot()) << "a buffer changed on failure: " << what;
}

TEST_P(Contract, EachCheckRejectsAndWritesNothing) {
  const Descriptor& d = *GetParam();
  for (const CheckStage& stage : d.order)
    for (const Failure& f : failuresOf(d, stage)) expectRejected(d, {&f}, f.status);
}

TEST_P(Contract, UncheckedHeightDoesNoRows) {
  const Descriptor& d = *GetParam();
  if (d.minHeight > 0) GTEST_SKIP() << "checks its height";
  for (int height : {0, -2}) {
    ImageSize size = d.validSize(9, 1);
    Workspace w(d, size, 3, 1);
    w.fillRandom(5);
    std::vector<Arg> args = w.arguments();
    for (Arg& a : args)
      if (a.kind == ArgKind::Size) a.size.height = height;
    const auto before = w.snapshot();
    EXPECT_EQ(int(w.call(args)), int(StatusOk));
    EXPECT_TRUE(before == w.snapshot());
  }
}

TEST_P(Contract, ChecksRunInOrder) {
  const Descriptor& d = *GetParam();
  // For every pair of checks, break both: the earlier one decides.
  for (size_t i = 0; i < d.order.size(); ++i)
    for (size_t j = i + 1; j < d.order.size(); ++j) {
      const auto first = failuresOf(d, d.order[i]);
      const auto second = failuresOf(d, d.order[j]);
      for (const Failure& a : first)
        for (const Failure& b : second) expectRejected(d, {&a, &b}, a.status);
    }
}

// Bytes that belong to nobody but the caller: guards around every buffer,
// the padding between rows, the sources, and the alpha of AC4 destinations.
void expectGuardsKept(const Descriptor& d, ImageSize size, int pad, int offset) {
  Workspace w(d, size, pad, offset);
  w.fillRandom(uint32_t(size.width * 131 + size.height));
  w.fillDestinations(0x5A);
  const auto before = w.snapshot();
  const Status s = w.call();
  if (d.warnsOdd)
    EXPECT_TRUE(s == StatusOk || s == StatusOddSizeWarning) << s;
  else
    EXPECT_EQ(int(s), int(StatusOk));
  const std::string guards = w.checkGuards();
  EXPECT_EQ(guards, "") << size.width << "x" << size.height << " pad " << pad << " offset " << offset;
  const auto after = w.snapshot();
  for (size_t i = 0; i < w.buffers().size(); ++i) {
    const Workspace::Buffer& b = w.buffers()[i];
    if (b.side == 0) EXPECT_TRUE(before[i] == after[i]) << "source plane " << b.plane << " was written";
    if (b.side != 0 && d.dst.layout == Layout::AC4 && !d.writesAlpha) {
      const size_t start = size_t(b.first - b.bytes.data());
      const int px = sampleBytes(d.dst.sample);
      for (int y = 0; y < b.geometry.rows; ++y)
        for (int x = 0; x < size.width; ++x)
          for (int k = 0; k < px; ++k) {
            const size_t at = start + size_t(y) * b.pitch + size_t(x) * 4 * px + 3 * px + k;
            ASSERT_EQ(before[i][at], after[i][at]) << "alpha of pixel " << x << "," << y << " was written";
          }
    }
  }
}

TEST_P(Contract, WritesOnlyTheRegion) {
  const Descriptor& d = *GetParam();
  const int sizes[][2] = {{0, 0}, {1, 0}, {0, 1}, {1, 1}, {7, 3}, {16, 2}, {33, 5}, {70, 1}};
  for (const auto& s : sizes) {
    const ImageSize size = d.validSize(d.minWidth + s[0], d.minHeight + s[1]);
    for (int pad : {0, 13})
      for (int offset : {0, 3}) expectGuardsKept(d, size, pad, offset);
  }
}

TEST_P(Contract, ZeroStepsPassWhereStepsAreNotChecked) {
  const Descriptor& d = *GetParam();
  if (d.checksSteps || !d.region) GTEST_SKIP() << "checks its steps or has none";
  const ImageSize size = d.validSize(5, 4);
  Workspace w(d, size, 0, 0);
  w.fillRandom(3);
  std::vector<Arg> args = w.arguments();
  for (size_t i = 0; i < d.slots.size(); ++i) {
    const Role r = d.slots[i].role;
    if (r == Role::SrcStep || r == Role::DstStep || r == Role::SrcDstStep) args[i].i = 0;
  }
  // Per-plane step arrays are zeroed through the arrays themselves.
  std::vector<std::vector<int>> zeroSteps;
  for (size_t i = 0; i < d.slots.size(); ++i) {
    const Role r = d.slots[i].role;
    if (r == Role::SrcSteps || r == Role::DstSteps) {
      zeroSteps.emplace_back(4, 0);
      args[i].p = zeroSteps.back().data();
    }
  }
  const Status s = w.call(args);
  EXPECT_TRUE(s == StatusOk || (d.warnsOdd && s == StatusOddSizeWarning)) << s;
  EXPECT_EQ(w.checkGuards(), "");
}

TEST_P(Contract, OptionalPointersMayBeNull) {
  const Descriptor& d = *GetParam();
  std::vector<size_t> optional;
  for (size_t i = 0; i < d.slots.size(); ++i)
    if (d.slots[i].role == Role::Extra && d.extras[d.slots[i].extra].optional) optional.push_back(i);
  if (optional.empty()) GTEST_SKIP() << "no optional pointer";
  Workspace w(d, ImageSize{std::max(d.minWidth, 11), std::max(d.minHeight, 3)}, 13, 3);
  w.fillRandom(5);
  w.fillDestinations(0x5A);
  std::vector<Arg> args = w.arguments();
  for (size_t i : optional) args[i].p = nullptr;
  EXPECT_EQ(int(w.call(args)), int(StatusOk));
  EXPECT_EQ(w.checkGuards(), "");
}

INSTANTIATE_TEST_SUITE_P(AllExports, Contract, ::testing::ValuesIn(imageFunctions()), paramName);

}  // namespace
