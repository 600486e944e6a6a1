// Row kernels of the homogeneity-directed demosaicing. Each works on
// `count` pixels of one row with pointers placed at the first pixel; taps
// reach the stated number of samples to either side. A scalar form built
// from the formulas of ahd.h and a vector form give the same values: 16-bit
// samples in 32-bit lanes, 8-bit ones in 16-bit lanes, where every value
// of theirs fits a word.
#pragma once

#include <cstdint>
#include <type_traits>

#include "demosaic/ahd.h"

namespace zel {

// Lanes of a row that hold green sites alternate; `firstGreen` tells the
// phase of the first pixel.
inline bool isGreenLane(bool firstGreen, int i) { return ((i & 1) == 0) == firstGreen; }

// Step 1: green along a line through the site. `c` are the sites, `a` and
// `b` the same colour two away on either side, `l` and `r` the greens
// between. For the row direction these are one row at offsets 0, -2, +2,
// -1, +1; for the column direction five rows.
template <typename T>
struct GreenTaps {
  const T *c, *a, *b, *l, *r;
};

// Step 2: red and blue from the direction's green plane (rows above, at
// and below; reach 1) and the samples (reach 1). `redRow`: the row's sites
// other than green are red.
template <typename T>
struct ColourTaps {
  const T *gUp, *g, *gDown;
  const T *sUp, *s, *sDown;
};

// Step 3 output, one row: luma and the two chroma values. Those of 8-bit
// samples fit 16 bits (luma 0..219, chroma -112..112).
template <typename T>
using LumaChromaValue = std::conditional_t<sizeof(T) == 1, int16_t, int32_t>;
template <typename T>
struct LumaChromaRow {
  LumaChromaValue<T> *y, *cb, *cr;
};
template <typename T>
struct LumaChromaView {
  const LumaChromaValue<T> *y, *cb, *cr;
};

template <typename T>
void greenRowScalar(const GreenTaps<T>& t, int count, bool firstGreen, T* out) {
  for (int i = 0; i < count; ++i) {
    const int c = loadSample(t.c + i);
    storeSample(out + i, T(isGreenLane(firstGreen, i) ? c
                                                      : greenAlong(c, loadSample(t.a + i), loadSample(t.b + i),
                                                                   loadSample(t.l + i), loadSample(t.r + i))));
  }
}

template <typename T>
void colourRowScalar(const ColourTaps<T>& t, int count, bool firstGreen, bool redRow, T* outR, T* outB) {
  constexpr int top = sizeof(T) == 1 ? 255 : 65535;
  auto at = [](const T* p, int i) { return int(loadSample(p + i)); };
  for (int i = 0; i < count; ++i) {
    const int g = at(t.g, i);
    int rowColour, otherColour;  // the row's non-green colour and the other one
    if (isGreenLane(firstGreen, i)) {
      rowColour = colourFromPair(g, at(t.s, i - 1) + at(t.s, i + 1), at(t.g, i - 1) + at(t.g, i + 1), top);
      otherColour = colourFromPair(g, at(t.sUp, i) + at(t.sDown, i), at(t.gUp, i) + at(t.gDown, i), top);
    } else {
      rowColour = at(t.s, i);
      otherColour =
          colourFromDiagonals(g, at(t.sUp, i - 1) + at(t.sUp, i + 1) + at(t.sDown, i - 1) + at(t.sDown, i + 1),
                              at(t.gUp, i - 1) + at(t.gUp, i + 1) + at(t.gDown, i - 1) + at(t.gDown, i + 1), top);
    }
    storeSample(outR + i, T(redRow ? rowColour : otherColour));
    storeSample(outB + i, T(redRow ? otherColour : rowColour));
  }
}

template <typename T>
void lumaChromaRowScalar(const T* r, const T* g, const T* b, int count, const LumaChromaRow<T>& out) {
  for (int i = 0; i < count; ++i) {
    const LumaChroma v = lumaChroma(loadSample(r + i), loadSample(g + i), loadSample(b + i));
    using V = LumaChromaValue<T>;
    out.y[i] = V(v.y), out.cb[i] = V(v.cb), out.cr[i] = V(v.cr);
  }
}

// Step 4: the difference of the homogeneity counts from luma-chroma rows
// above, at and below, per direction (reach 1 in the middle row). The
// result is stored as a signed sample.
template <typename T>
void homogeneityRowScalar(const LumaChromaView<T> h[3], const LumaChromaView<T> v[3], int count, T* out) {
  auto pick = [](const LumaChromaView<T>& r, int i) {
    return LumaChroma{int32_t(r.y[i]), int32_t(r.cb[i]), int32_t(r.cr[i])};
  };
  for (int i = 0; i < count; ++i) {
    const Neighbourhood nh{pick(h[1], i), pick(h[1], i - 1), pick(h[1], i + 1), pick(h[0], i), pick(h[2], i)};
    const Neighbourhood nv{pick(v[1], i), pick(v[1], i - 1), pick(v[1], i + 1), pick(v[0], i), pick(v[2], i)};
    storeSample(out + i, T(homogeneityDifference(nh, nv)));
  }
}

template <typename T>
inline int signedSample(const T* p) {
  return sizeof(T) == 1 ? int(int8_t(loadSample(p))) : int(int16_t(loadSample(p)));
}

// Step 5: the sum of the 3 by 3 window of homogeneity differences around
// pixel i of the middle row (`hom` holds the rows above, at and below).
template <typename T>
int windowSum(const T* const hom[3], int i) {
  int s = 0;
  for (int r = 0; r < 3; ++r)
    for (int k = -1; k <= 1; ++k) s += signedSample(hom[r] + i + k);
  return s;
}

// Step 5 output: a running choice walks the row. A non-zero window sum
// decides (V where it is negative), a zero sum repeats the last decision;
// `takingV` is the choice before the first pixel. The pixels of the chosen
// direction are stored; returns the choice after the last pixel.
template <typename T>
bool choiceRowScalar(const T* const h[3], const T* const v[3], const T* const hom[3], int count, bool takingV,
                     T* dst) {
  for (int i = 0; i < count; ++i) {
    const int s = windowSum(hom, i);
    if (s != 0) takingV = s < 0;
    for (int k = 0; k < 3; ++k) storeSample(dst + 3 * i + k, loadSample((takingV ? v[k] : h[k]) + i));
  }
  return takingV;
}

// The widest vector form in use: chosen once per call from the processor;
// every level gives the same values.
enum class VectorLevel { Scalar, Sse41, Avx2 };
VectorLevel bestVectorLevel();

// Vector blocks of the chosen level (AVX2, or SSE4.1 with half as many
// pixels), the last block overlapping the one before to end at the row's
// end; the scalar form for a row narrower than a block.
template <typename T>
void greenRow(const GreenTaps<T>& t, int count, bool firstGreen, T* out, VectorLevel level);
template <typename T>
void colourRow(const ColourTaps<T>& t, int count, bool firstGreen, bool redRow, T* outR, T* outB, VectorLevel level);
template <typename T>
void lumaChromaRow(const T* r, const T* g, const T* b, int count, const LumaChromaRow<T>& out, VectorLevel level);
template <typename T>
void homogeneityRow(const LumaChromaView<T> h[3], const LumaChromaView<T> v[3], int count, T* out, VectorLevel level);
// The choice of a whole row of a tile, starting with H: SSE4.1 blocks of
// 16 pixels (window sums in bytes, the running choice carried through the
// block by a prefix scan), the scalar form for the rest.
template <typename T>
void choiceRow(const T* const h[3], const T* const v[3], const T* const hom[3], int count, T* dst,
               VectorLevel level);

}  // namespace zel
