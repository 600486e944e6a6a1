// Lane-by-lane comparison of a vector form with its scalar form, for the
// 8-bit forms of the YUV and Photo YCC families: one SSE4.1 unit or one AVX2
// unit of 16-bit lanes at a time, every lane after SaturateU8.
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "frame/scalar_ops.h"
#include "luma_chroma/tier_params.h"
#include "luma_chroma/vector_units.h"
#include "luma_chroma/yuv_lanes.h"

namespace zel::lc::test {

struct Triple {
  int a, b, c;
};

inline std::string str(Pixel8 p) {
  return std::to_string(p.c0) + "," + std::to_string(p.c1) + "," + std::to_string(p.c2);
}
inline std::string str(Triple t) {
  return std::to_string(t.a) + "," + std::to_string(t.b) + "," + std::to_string(t.c);
}
inline bool same(Pixel8 a, Pixel8 b) { return a.c0 == b.c0 && a.c1 == b.c1 && a.c2 == b.c2; }

// A form as a type: `scalar(a, b, c)` and `vec<U>(Trio<U>)`.
#define ZEL_LANE_FORM(Name, call)                         \
  struct Name {                                           \
    Pixel8 scalar(int a, int b, int c) const {            \
      return call(a, b, c);                               \
    }                                                     \
    template <class U>                                    \
    ZEL_INLINE Trio<U> vec(const Trio<U>& t) const {      \
      return call<U>(t);                                  \
    }                                                     \
  };

template <class F>
void computeSse(const F& f, const int16_t* a, const int16_t* b, const int16_t* c, int16_t (*out)[16]) {
  auto ld = [](const int16_t* p) { return _mm_loadu_si128(reinterpret_cast<const __m128i*>(p)); };
  const Trio<Sse> r = f.template vec<Sse>(Trio<Sse>{ld(a), ld(b), ld(c)});
  _mm_storeu_si128(reinterpret_cast<__m128i*>(out[0]), r.c0);
  _mm_storeu_si128(reinterpret_cast<__m128i*>(out[1]), r.c1);
  _mm_storeu_si128(reinterpret_cast<__m128i*>(out[2]), r.c2);
}

template <class F>
ZEL_AVX2 __attribute__((flatten)) void computeAvx(const F& f, const int16_t* a, const int16_t* b, const int16_t* c,
                                                  int16_t (*out)[16]) {
  const Trio<Avx> r = f.template vec<Avx>(Trio<Avx>{_mm256_loadu_si256(reinterpret_cast<const __m256i*>(a)),
                                                    _mm256_loadu_si256(reinterpret_cast<const __m256i*>(b)),
                                                    _mm256_loadu_si256(reinterpret_cast<const __m256i*>(c))});
  _mm256_storeu_si256(reinterpret_cast<__m256i*>(out[0]), r.c0);
  _mm256_storeu_si256(reinterpret_cast<__m256i*>(out[1]), r.c1);
  _mm256_storeu_si256(reinterpret_cast<__m256i*>(out[2]), r.c2);
}

// `triples` holds a multiple of 16 entries.
template <class F>
void expectLanesMatch(const char* name, const F& f, bool avx2, const std::vector<Triple>& triples) {
  const int lanes = avx2 ? 16 : 8;
  for (size_t i = 0; i + lanes <= triples.size(); i += lanes) {
    int16_t a[16], b[16], c[16], out[3][16];
    for (int k = 0; k < lanes; ++k) {
      a[k] = int16_t(triples[i + k].a);
      b[k] = int16_t(triples[i + k].b);
      c[k] = int16_t(triples[i + k].c);
    }
    if (avx2)
      computeAvx(f, a, b, c, out);
    else
      computeSse(f, a, b, c, out);
    for (int k = 0; k < lanes; ++k) {
      const Triple& t = triples[i + k];
      const Pixel8 want = f.scalar(t.a, t.b, t.c);
      const Pixel8 got{SaturateU8(out[0][k]), SaturateU8(out[1][k]), SaturateU8(out[2][k])};
      if (!same(got, want))
        FAIL() << name << (avx2 ? " (AVX2)" : " (SSE4.1)") << " at " << str(t) << ": " << str(got) << " for "
               << str(want);
    }
  }
}

// The widths this processor runs: SSE4.1, and AVX2 where present.
inline std::vector<bool> vectorWidths() {
  std::vector<bool> widths{false};
  if (hasAvx2()) widths.push_back(true);
  return widths;
}

// The tiers of the row kernels this processor runs (under the tier cap):
// SSE4.1, AVX2 where present, and the 512-bit tier, with the byte permutes
// where the kernels need them.
inline std::vector<VectorTier> rowTiers(bool bytePermutes = true) {
  std::vector<VectorTier> tiers{VectorTier::Sse41};
  if (hasAvx2()) tiers.push_back(VectorTier::Avx2);
  if (bytePermutes ? hasAvx512Vbmi() : hasAvx512()) tiers.push_back(VectorTier::Avx512);
  return tiers;
}

// Row widths for the kernel tests: every width up to 70 (the 16- and 32-pixel
// blocks and every tail), and some past 128 for the 64-pixel blocks.
inline std::vector<int> rowWidths() {
  std::vector<int> widths;
  for (int w = 1; w <= 70; ++w) widths.push_back(w);
  for (int w : {127, 128, 129, 143, 191, 200, 263}) widths.push_back(w);
  return widths;
}

}  // namespace zel::lc::test
