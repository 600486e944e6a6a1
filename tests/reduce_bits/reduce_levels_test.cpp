// Bit-depth reduction: the plain levels and the ordered dither of every
// member against their per-sample formulas over all widths and odd
// alignments, the documented examples, and the family's checks.
#include <gtest/gtest.h>

#include "frame/image_layout.h"
#include "reduce_bits/noise_generator.h"
#include "reduce_bits/reduce_drivers.h"
#include "reduce_support.h"

namespace {

using namespace zel::test;
using namespace zel::reduce;
using zel::bodyEnd;

template <typename Src, typename Dst>
int levelsFor(int width) {
  const int choices[] = {2, 3, 7, 16, 255, Member<Src, Dst>::maxLevels, 1000};
  const int l = choices[width % 7];
  return l > Member<Src, Dst>::maxLevels ? 5 : l;
}

// Runs every layout of a stem over widths 1..70 and odd alignments, on
// random samples (floats beyond 0..1, where the stores of body and end
// differ) or, every third width, the pattern with many top samples. Each
// sample must equal `expect(call, levels, x, y, c)`; the AC4 alpha, the
// padding and the source stay.
template <typename Src, typename Dst, typename Expect>
void againstFormula(const Stem<Src, Dst>& stem, int kind, int noise, int pad, Expect&& expect) {
  for (LayoutCode layout : kLayouts)
    for (int width = 1; width <= 70; ++width)
      for (int offset : {0, 1, 3}) {
        SCOPED_TRACE(std::string(stem.name) + " " + layoutName(layout) + " width " + std::to_string(width) +
                     " offset " + std::to_string(offset) + " noise " + std::to_string(noise));
        ReduceCall<Src, Dst> call(layout, width, 5, offset, pad);
        call.src.fillRandom(uint32_t(width * 5 + offset), -0.3, 1.3);
        if (width % 3 == 0) call.pattern(true);
        const int levels = levelsFor<Src, Dst>(width);
        const auto srcBefore = regionBytes(call.src), dstBefore = regionBytes(call.dst);
        ASSERT_EQ(call.run(stem, noise, kind, levels), StatusOk);
        for (int y = 0; y < call.height; ++y)
          for (int x = 0; x < width; ++x)
            for (int c = 0; c < channelsOf(layout); ++c)
              ASSERT_EQ(call.dst.get(x * strideOf(layout) + c, y), expect(call, levels, x, y, c))
                  << "pixel " << x << "," << y << " channel " << c;
        ASSERT_TRUE(call.dst.guardsIntact());
        ASSERT_TRUE(call.alphaKept(dstBefore));
        ASSERT_TRUE(regionBytes(call.src) == srcBefore);
      }
}

TEST(ReduceBitsLevels, EveryMemberMatchesItsFormula) {
  forEachStem([](const auto& stem) {
    // An odd step (pad 5): the plain levels honour it to the byte.
    againstFormula(stem, ReduceDitherOff, 17, 5, [](const auto& call, int levels, int x, int y, int c) {
      using Call = std::decay_t<decltype(call)>;
      const int width = call.width, stride = strideOf(call.layout), at = x * stride + c;
      const int block = plainBlock<typename Call::Source, typename Call::Dest>();
      // The row's end: samples behind the last whole block of the run (AC4:
      // pixels not wholly inside the blocks of 4 * width samples).
      const bool atEnd = call.layout == LayoutCode::AC4 ? 4 * x + 4 > bodyEnd(4 * width, block)
                                                        : at >= bodyEnd(width * stride, block);
      return plainSample<typename Call::Source, typename Call::Dest>(call.src.get(at, y), plainLevels(levels), atEnd,
                                                                     call.layout == LayoutCode::AC4);
    });
  });
}

template <typename Src, typename Dst>
void orderedAgainstFormula(const Stem<Src, Dst>& stem, int noise) {
  using M = Member<Src, Dst>;
  NoiseTables tables;
  if (noise) ASSERT_EQ(buildNoiseTables(tables, float(-noise) / 100.0f, float(noise) / 100.0f), StatusOk);
  // Steps of whole samples (pad 12): the dithers round others down.
  againstFormula(stem, ReduceDitherOrdered4x4, noise, 12, [&](const auto& call, int levels, int x, int y, int c) {
    const int width = call.width;
    const QuantValues qv = quantValues<Src>(levels);
    // The row's end of C1 integer-to-byte members stores the bare low byte;
    // 8u AC4 with noise thresholds its end by the bare matrix entry.
    int wrapFrom = width, bareFrom = width;
    if (call.layout == LayoutCode::C1 && M::byteDest && M::source != SourceClass::Float)
      wrapFrom = (!noise && M::source == SourceClass::Bits8) ? (width & ~7) : (width & ~3);
    if (call.layout == LayoutCode::AC4 && noise && M::source == SourceClass::Bits8) bareFrom = width & ~3;
    float t = orderedThreshold(qv, x, y);
    if (noise)
      t = x >= bareFrom ? kOrderedMatrix[y & 3][x & 3]
                        : noisyOrderedThreshold(qv, tables.values[noiseIndex(tables.randomIndex, x, y)], x, y);
    const int32_t v = orderedInteger<M>(orderedLevel(working(call.src.get(x * strideOf(call.layout) + c, y)), t, qv));
    return x >= wrapFrom ? Dst(orderedWrappedByte(v)) : orderedStore<M>(v);
  });
  if (noise) releaseNoiseTables(tables);
}

TEST(ReduceBitsLevels, OrderedDitherMatchesItsFormula) {
  forEachStem([](const auto& stem) {
    orderedAgainstFormula(stem, 0);
    orderedAgainstFormula(stem, 45);
  });
}

// The SSE blocks alone give what the AVX2 blocks give (the exported calls
// take AVX2 where the processor has it).
template <typename Src, typename Dst>
void vectorWidthsAgree(uint32_t seed) {
  using M = Member<Src, Dst>;
  if (!zel::hasAvx2()) GTEST_SKIP() << "no AVX2";
  TestImage<Src> src(70, 1, 1);
  src.fillRandom(seed, -0.3, 1.3);
  NoiseTables tables;
  ASSERT_EQ(buildNoiseTables(tables, -0.4f, 0.4f), StatusOk);
  for (int count = 1; count <= 70; ++count) {
    TestImage<Dst> sse(count, 1, 3), avx(count, 1, 3);
    const PlainLevels p = plainLevels(5);
    plainRun<M, LayoutCode::C1>(src.data(), sse.data(), count, p, false);
    plainRun<M, LayoutCode::C1>(src.data(), avx.data(), count, p, true);
    ASSERT_TRUE(regionBytes(sse) == regionBytes(avx)) << count;
    const QuantValues qv = quantValues<Src>(7);
    const OrderedZones z = orderedZones<M, LayoutCode::C1, true>(count);
    orderedRow<M, LayoutCode::C1, true>(src.data(), sse.data(), count, 2, qv, tables, z, false);
    orderedRow<M, LayoutCode::C1, true>(src.data(), avx.data(), count, 2, qv, tables, z, true);
    ASSERT_TRUE(regionBytes(sse) == regionBytes(avx)) << count;
    ASSERT_TRUE(sse.guardsIntact() && avx.guardsIntact());
  }
  releaseNoiseTables(tables);
}

TEST(ReduceBitsLevels, VectorWidthsAgree) {
  vectorWidthsAgree<uint8_t, uint8_t>(1);
  vectorWidthsAgree<uint16_t, uint16_t>(2);
  vectorWidthsAgree<int16_t, int16_t>(3);
  vectorWidthsAgree<uint16_t, uint8_t>(4);
  vectorWidthsAgree<int16_t, uint8_t>(5);
  vectorWidthsAgree<float, uint8_t>(6);
  vectorWidthsAgree<float, uint16_t>(7);
  vectorWidthsAgree<float, int16_t>(8);
}

TEST(ReduceBitsLevels, DocumentedLevels) {
  // Levels 2: up to 127 gives 0, from 128 on 255. Levels 256: every value
  // stays. The top value mostly stays, but where inv * (levels - 1) rounds
  // below 1 (levels 42, 250 and others) it scales to 254.
  ReduceCall<uint8_t, uint8_t> call(LayoutCode::C1, 256, 1, 1);
  for (int v = 0; v < 256; ++v) call.src.set(v, 0, uint8_t(v));
  ASSERT_EQ(call.run(k8u, 0, 0, 2), StatusOk);
  for (int v = 0; v < 256; ++v) ASSERT_EQ(call.dst.get(v, 0), v < 128 ? 0 : 255) << v;
  ASSERT_EQ(call.run(k8u, 0, 0, 256), StatusOk);
  for (int v = 0; v < 256; ++v) ASSERT_EQ(call.dst.get(v, 0), v) << v;
  ReduceCall<uint8_t, uint8_t> top(LayoutCode::C3, 7, 1);
  top.src.fill(255);
  for (int levels : {2, 3, 17, 41, 43, 255, 256, 42, 250}) {
    ASSERT_EQ(top.run(k8u, 0, 0, levels), StatusOk);
    for (int v : top.result()) ASSERT_EQ(v, levels == 42 || levels == 250 ? 254 : 255) << levels;
  }
  // Signed 16 bits keep both ends.
  ReduceCall<int16_t, int16_t> s16(LayoutCode::C1, 2, 1);
  s16.src.set(0, 0, -32768);
  s16.src.set(1, 0, 32767);
  ASSERT_EQ(s16.run(k16s, 0, 0, 2), StatusOk);
  EXPECT_EQ(s16.result(), (std::vector<int>{-32768, 32767}));
}

TEST(ReduceBitsLevels, FloatsBeyondTheRange) {
  // 200.0 at levels 2 scales to 51000: saturated in the body, its low 16
  // bits read as signed and clamped (0) at the row's end.
  ReduceCall<float, uint8_t> bytes(LayoutCode::C1, 5, 1);
  bytes.src.fill(200.0f);
  ASSERT_EQ(bytes.run(k32f8u, 0, 0, 2), StatusOk);
  EXPECT_EQ(bytes.result(), (std::vector<int>{255, 255, 255, 255, 0}));
  // 2.0 scales to 131070: C1 keeps the low 16 bits, AC4 clamps.
  ReduceCall<float, uint16_t> words(LayoutCode::C1, 3, 1), alpha(LayoutCode::AC4, 3, 1);
  words.src.fill(2.0f);
  alpha.src.fill(2.0f);
  ASSERT_EQ(words.run(k32f16u, 0, 0, 2), StatusOk);
  ASSERT_EQ(alpha.run(k32f16u, 0, 0, 2), StatusOk);
  EXPECT_EQ(words.result(), std::vector<int>(3, 65534));
  EXPECT_EQ(alpha.result(), std::vector<int>(9, 65535));
}

TEST(ReduceBitsLevels, UnknownKindsAndIgnoredNoise) {
  // An unknown kind does nothing and succeeds (after the noise check);
  // 257 levels are too many for bytes only; noise leaves the plain levels.
  ReduceCall<uint8_t, uint8_t> call(LayoutCode::C1, 9, 2);
  call.pattern();
  const auto before = regionBytes(call.dst);
  EXPECT_EQ(call.run(k8u, 100, 7, 4), StatusOk);
  EXPECT_EQ(call.run(k8u, 0, -1, 4), StatusOk);
  EXPECT_EQ(call.run(k8u, 101, 7, 4), StatusNoiseError);
  EXPECT_TRUE(regionBytes(call.dst) == before);
  ReduceCall<uint16_t, uint16_t> wide(LayoutCode::C1, 9, 2);
  EXPECT_EQ(wide.run(k16u, 0, 0, 257), StatusOk);
  ASSERT_EQ(call.run(k8u, 50, 0, 4), StatusOk);
  const auto withNoise = call.result();
  ASSERT_EQ(call.run(k8u, 0, 0, 4), StatusOk);
  EXPECT_EQ(call.result(), withNoise);
}

}  // namespace
