// Shared checks of the colour-space families: an export against its scalar
// formulas over every width (body and tail zones), alignments and steps, and
// a vector body against its body formula.
#pragma once

#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <random>
#include <string>
#include <vector>

#include "core/zelcore.h"
#include "spaces/space_frame.h"
#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace zel::test {

using spaces::Lanes;
using spaces::RowStores;
using spaces::StepUnit;

// One export: its formulas by zone, its vector body, how it counts steps
// and what its source samples look like. Built with chained setters.
template <typename S, typename D>
struct Member {
  using Export = Status (*)(const S*, int, D*, int, ImageSize);
  using Blocks = int (*)(Lanes, const S*, D*, int, RowStores);
  using Pixel = std::function<void(const S* in, D* out)>;  // writes the 3 samples of a pixel
  std::string name;
  Export fn = nullptr;
  int srcStride = 3, dstStride = 3;
  // Pixels [0, width AND NOT (block - 1)) take `body`, the rest `tail`;
  // block 0 means one formula for the whole row (`tail`).
  int block = 0;
  Blocks blocks = nullptr;  // the vector body, checked against `body`
  Pixel body, tail;
  StepUnit unit = StepUnit::Bytes;
  std::function<S(std::mt19937&)> sample;  // random bits (or 0..1 floats) when empty
  int widest = 8;        // lanes of the widest body (16 with a 512-bit one)
  bool streams = false;  // float rows stream their body beyond the cache

  Member(std::string n, Export f) : name(std::move(n)), fn(f) {}
  Member& stride(int s) { srcStride = dstStride = s; return *this; }
  Member& zones(int b, Blocks v, Pixel inBody, Pixel inTail) {
    block = b, blocks = v, body = std::move(inBody), tail = std::move(inTail);
    return *this;
  }
  Member& oneFormula(Pixel f) {
    tail = std::move(f);
    return *this;
  }
  Member& stepsInSamples() {
    unit = StepUnit::Samples;
    return *this;
  }
  Member& lanes16() {
    widest = 16;
    return *this;
  }
  Member& streamed() {
    streams = true;
    return *this;
  }
  Member& samples(std::function<S(std::mt19937&)> g) {
    sample = std::move(g);
    return *this;
  }
};

// One row through an export, the destination filled with 7s first.
template <typename S, typename D>
std::vector<D> convertRow(Status (*fn)(const S*, int, D*, int, ImageSize), const std::vector<S>& src, int stride = 3) {
  const int width = int(src.size()) / stride;
  std::vector<D> dst(src.size(), D(7));
  EXPECT_EQ(fn(src.data(), width * stride * int(sizeof(S)), dst.data(), width * stride * int(sizeof(D)),
               ImageSize{width, 1}),
            StatusOk);
  return dst;
}

// `width` copies of one pixel.
template <typename T>
std::vector<T> repeat(std::initializer_list<T> pixel, int width) {
  std::vector<T> out(size_t(width) * pixel.size());
  for (size_t i = 0; i < out.size(); ++i) out[i] = pixel.begin()[i % pixel.size()];
  return out;
}

template <typename T>
T randomSample(std::mt19937& rng) {
  if constexpr (std::is_floating_point_v<T>) {
    return T(std::uniform_real_distribution<double>(0.0, 1.0)(rng));
  } else {
    return T(rng());
  }
}

template <typename S, typename D>
void fillSource(TestImage<S>& img, const Member<S, D>& m, uint32_t seed) {
  std::mt19937 rng(seed);
  for (int y = 0; y < img.rows(); ++y)
    for (int x = 0; x < img.rowSamples(); ++x) img.set(x, y, m.sample ? m.sample(rng) : randomSample<S>(rng));
}

template <typename T>
bool sameBits(const T& a, const T& b) {
  return std::memcmp(&a, &b, sizeof(T)) == 0;
}

// The image's samples through the formulas of each zone, on top of the
// destination's earlier content (the fourth sample of AC4 stays).
template <typename S, typename D>
std::vector<D> expectedRows(const Member<S, D>& m, const TestImage<S>& src, const TestImage<D>& dstBefore, int width) {
  std::vector<D> out;
  const int body = m.block ? (width & ~(m.block - 1)) : 0;
  for (int y = 0; y < src.rows(); ++y) {
    std::vector<D> row(size_t(width) * m.dstStride);
    for (int i = 0; i < int(row.size()); ++i) row[i] = dstBefore.get(i, y);
    for (int x = 0; x < width; ++x) {
      S in[8];
      for (int c = 0; c < m.srcStride; ++c) in[c] = src.get(x * m.srcStride + c, y);
      (x < body ? m.body : m.tail)(in, &row[size_t(x) * m.dstStride]);
    }
    out.insert(out.end(), row.begin(), row.end());
  }
  return out;
}

template <typename S, typename D>
void expectSameRows(const Member<S, D>& m, const std::vector<D>& want, const TestImage<D>& got, int width,
                    const std::string& where) {
  const int n = width * m.dstStride;
  for (int y = 0; y < got.rows(); ++y)
    for (int i = 0; i < n; ++i)
      if (!sameBits(want[size_t(y) * n + i], got.get(i, y))) {
        ADD_FAILURE() << m.name << " " << where << ": row " << y << " pixel " << i / m.dstStride << " sample "
                      << i % m.dstStride << " is " << +got.get(i, y) << ", formula gives " << +want[size_t(y) * n + i];
        return;
      }
}

// One frame through the export: every pixel as its zone's formula says,
// nothing outside the rows written, the source unchanged.
template <typename S, typename D>
void expectFrameFollowsFormulas(const Member<S, D>& m, int width, int height, int srcOffset, int dstOffset, int pad,
                                uint32_t seed, const std::string& where) {
  // A member counting steps in samples needs whole-sample padding.
  const int padUnit = m.unit == StepUnit::Samples ? int(sizeof(S) > sizeof(D) ? sizeof(S) : sizeof(D)) : 1;
  TestImage<S> src(width * m.srcStride, height, srcOffset, pad * padUnit + padUnit);
  TestImage<D> dst(width * m.dstStride, height, dstOffset, pad * padUnit);
  fillSource(src, m, seed);
  {
    std::mt19937 rng{uint32_t(width) + 5};
    for (int y = 0; y < height; ++y)
      for (int i = 0; i < width * m.dstStride; ++i) dst.set(i, y, D(rng()));
  }
  std::vector<S> srcCopy;
  for (int y = 0; y < height; ++y)
    for (int i = 0; i < width * m.srcStride; ++i) srcCopy.push_back(src.get(i, y));
  const std::vector<D> want = expectedRows(m, src, dst, width);
  ASSERT_EQ(m.fn(src.data(), src.step(), dst.data(), dst.step(), ImageSize{width, height}), StatusOk) << where;
  expectSameRows(m, want, dst, width, where);
  EXPECT_TRUE(dst.guardsIntact()) << m.name << " " << where << ": a byte outside the rows changed";
  for (int y = 0; y < height; ++y)
    for (int i = 0; i < width * m.srcStride; ++i)
      ASSERT_TRUE(sameBits(src.get(i, y), srcCopy[size_t(y) * width * m.srcStride + i]))
          << m.name << ": source written";
}

// Widths 1..70 at several alignments and paddings.
template <typename S, typename D>
void expectExportFollowsFormulas(const Member<S, D>& m, uint32_t seed = 1) {
  for (int width = 1; width <= 70; ++width)
    for (int variant = 0; variant < 2; ++variant) {
      const int srcOffset = variant ? 3 : 0, dstOffset = variant ? 1 + int(sizeof(D)) : 0;
      expectFrameFollowsFormulas(m, width, 3, srcOffset, dstOffset, variant ? 3 : 0,
                                 seed + uint32_t(width) * 977u + uint32_t(variant),
                                 "width " + std::to_string(width) + (variant ? " misaligned" : ""));
      if (::testing::Test::HasFailure()) return;
    }
}

// The vector tiers a test can take on this processor, widest first.
inline std::vector<VectorTier> availableTiers() {
  std::vector<VectorTier> tiers;
  if (hasAvx512()) tiers.push_back(VectorTier::Avx512);
  if (hasAvx2()) tiers.push_back(VectorTier::Avx2);
  tiers.push_back(VectorTier::Sse41);
  return tiers;
}

// Sets the tier cap for one scope, and the cache size the streaming
// decision reads (a small one makes a modest frame stream).
class TierScope {
 public:
  explicit TierScope(VectorTier tier) : before_(vectorTierCap()) { setVectorTierCap(tier); }
  ~TierScope() { setVectorTierCap(before_); }

 private:
  VectorTier before_;
};
class CacheScope {
 public:
  explicit CacheScope(int bytes) { zelTestOverrideCacheSize(0, bytes); }
  ~CacheScope() { zelTestOverrideCacheSize(-1, 0); }
};

// A member that streams: frames of more than a mebibyte with the cache
// said to be one, at every tier, with destinations at every float offset
// from a 64-byte boundary (and one off the float grid, which cannot
// stream): the heads before the first aligned pixel, the streamed blocks
// and the rest of each row all follow the formulas.
template <typename S, typename D>
void expectStreamedFramesFollowFormulas(const Member<S, D>& m) {
  const CacheScope cache(1 << 20);
  for (VectorTier tier : availableTiers()) {
    const TierScope scope(tier);
    for (int width : {45, 203}) {
      const int pixelBytes = m.srcStride * int(sizeof(S)) + m.dstStride * int(sizeof(D));
      const int height = (1 << 20) / (width * pixelBytes) + 2;
      for (int dstOffset : {0, 4, 20, 36, 52, 2}) {
        const std::string where = "tier " + std::to_string(int(tier)) + " width " + std::to_string(width) +
                                  " offset " + std::to_string(dstOffset) + " streamed";
        expectFrameFollowsFormulas(m, width, height, 8, dstOffset, 0, uint32_t(width + dstOffset), where);
        if (::testing::Test::HasFailure()) return;
      }
    }
  }
}

// A vector body alone, every lane width, at odd alignments: each converted
// pixel equals the body formula, and nothing past the converted pixels
// moves. Streaming bodies also store a streamed run (the destination
// aligned) and a head of each length.
template <typename S, typename D>
void expectBlocksRun(const Member<S, D>& m, Lanes lanes, int n, int dstOffset, RowStores how, int expectDone,
                     uint32_t seed, const std::string& where) {
  TestImage<S> src(n * m.srcStride, 1, 1 + n % 7, 0);
  TestImage<D> dst(n * m.dstStride, 1, dstOffset, 0);
  fillSource(src, m, seed);
  std::mt19937 rng{uint32_t(n)};
  for (int i = 0; i < n * m.dstStride; ++i) dst.set(i, 0, D(rng()));
  std::vector<D> want(size_t(n) * m.dstStride);
  for (int i = 0; i < int(want.size()); ++i) want[i] = dst.get(i, 0);
  const int done = m.blocks(lanes, src.data(), dst.data(), n, how);
  ASSERT_EQ(done, expectDone) << m.name << " " << where;
  const int written = how.kind == RowStores::Part ? how.keep : done;
  for (int x = 0; x < written; ++x) {
    S in[8];
    for (int c = 0; c < m.srcStride; ++c) in[c] = src.get(x * m.srcStride + c, 0);
    m.body(in, &want[size_t(x) * m.dstStride]);
  }
  for (int i = 0; i < n * m.dstStride; ++i)
    if (!sameBits(want[i], dst.get(i, 0))) {
      ADD_FAILURE() << m.name << " " << where << ": pixel " << i / m.dstStride << " sample " << i % m.dstStride
                    << " is " << +dst.get(i, 0) << ", body formula gives " << +want[i];
      return;
    }
  ASSERT_TRUE(dst.guardsIntact()) << m.name << " " << where;
}

template <typename S, typename D>
void expectBlocksFollowBody(const Member<S, D>& m, uint32_t seed = 7) {
  for (Lanes lanes : {Lanes::Sse4, Lanes::Avx2, Lanes::Avx512}) {
    if (lanes == Lanes::Avx2 && !hasAvx2()) continue;
    if (lanes == Lanes::Avx512 && (!hasAvx512() || m.widest < 16)) continue;
    const int count = spaces::laneCount(lanes);
    const std::string tier = lanes == Lanes::Avx512 ? "512-bit" : (lanes == Lanes::Avx2 ? "AVX2" : "SSE4.1");
    std::vector<int> widths;
    for (int n = 1; n <= 70; ++n) widths.push_back(n);
    for (int n : {129, 150, 203}) widths.push_back(n);
    for (int n : widths) {
      expectBlocksRun(m, lanes, n, 3 + n % 5, RowStores{}, n / count * count, seed + uint32_t(n) * 31u,
                      tier + " n " + std::to_string(n));
      if (::testing::Test::HasFailure()) return;
    }
    if (!m.streams) continue;
    for (int n : {count, 3 * count + 5}) {
      expectBlocksRun(m, lanes, n, 0, RowStores{RowStores::Stream, 0}, n / count * count, seed + uint32_t(n),
                      tier + " streamed n " + std::to_string(n));
    }
    for (int keep = 1; keep < count; ++keep)
      expectBlocksRun(m, lanes, count, 4 * keep + 4, RowStores{RowStores::Part, keep}, count, seed + uint32_t(keep),
                      tier + " part of " + std::to_string(keep));
    if (::testing::Test::HasFailure()) return;
  }
}

// Both checks, for each member of a list.
template <typename S, typename D>
void expectMembers(const std::vector<Member<S, D>>& members) {
  for (const Member<S, D>& m : members) {
    expectExportFollowsFormulas(m);
    if (m.blocks) expectBlocksFollowBody(m);
    if (m.streams) expectStreamedFramesFollowFormulas(m);
  }
}

}  // namespace zel::test
