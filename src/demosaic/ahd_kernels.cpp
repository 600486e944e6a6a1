#include "demosaic/ahd_kernels.h"

#include "demosaic/rgb_store.h"
#include "frame/simd.h"

namespace zel {

namespace {

// Four samples into 32-bit lanes, unsigned or (homogeneity differences)
// signed, and back by their low bits.
inline __m128i load4(const uint8_t* p) { return _mm_cvtepu8_epi32(load32(p)); }
inline __m128i load4(const uint16_t* p) { return _mm_cvtepu16_epi32(load64(p)); }
inline __m128i load4Signed(const uint8_t* p) { return _mm_cvtepi8_epi32(load32(p)); }
inline __m128i load4Signed(const uint16_t* p) { return _mm_cvtepi16_epi32(load64(p)); }
inline void store4(uint8_t* p, __m128i v) {
  const __m128i low = _mm_shuffle_epi8(v, _mm_setr_epi8(0, 4, 8, 12, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1, -1));
  const int32_t w = _mm_cvtsi128_si32(low);
  __builtin_memcpy(p, &w, 4);
}
inline void store4(uint16_t* p, __m128i v) {
  store64(p, _mm_shuffle_epi8(v, _mm_setr_epi8(0, 1, 4, 5, 8, 9, 12, 13, -1, -1, -1, -1, -1, -1, -1, -1)));
}
inline __m128i loadLanes(const int32_t* p) { return _mm_loadu_si128(reinterpret_cast<const __m128i*>(p)); }
inline void storeLanes(int32_t* p, __m128i v) { _mm_storeu_si128(reinterpret_cast<__m128i*>(p), v); }

// All ones in the lanes of green sites.
inline __m128i greenLanes4(bool firstGreen) {
  return firstGreen ? _mm_setr_epi32(-1, 0, -1, 0) : _mm_setr_epi32(0, -1, 0, -1);
}

template <typename T>
inline __m128i clampLanes(__m128i v) {
  return _mm_min_epi32(_mm_max_epi32(v, _mm_setzero_si128()), _mm_set1_epi32(sizeof(T) == 1 ? 255 : 65535));
}

}  // namespace

template <typename T>
void greenRow(const GreenTaps<T>& t, int count, bool firstGreen, T* out) {
  const __m128i green = greenLanes4(firstGreen);
  int i = 0;
  for (; i + 4 <= count; i += 4) {
    const __m128i c = load4(t.c + i), a = load4(t.a + i), b = load4(t.b + i);
    const __m128i l = load4(t.l + i), r = load4(t.r + i);
    const __m128i e = _mm_add_epi32(_mm_srai_epi32(_mm_add_epi32(l, r), 1),
                                    _mm_srai_epi32(_mm_add_epi32(_mm_sub_epi32(c, a), _mm_sub_epi32(c, b)), 2));
    const __m128i g = _mm_min_epi32(_mm_max_epi32(e, _mm_min_epi32(l, r)), _mm_max_epi32(l, r));
    store4(out + i, _mm_blendv_epi8(g, c, green));
  }
  greenRowScalar(GreenTaps<T>{t.c + i, t.a + i, t.b + i, t.l + i, t.r + i}, count - i, firstGreen, out + i);
}

template <typename T>
void colourRow(const ColourTaps<T>& t, int count, bool firstGreen, bool redRow, T* outR, T* outB) {
  const __m128i green = greenLanes4(firstGreen);
  int i = 0;
  for (; i + 4 <= count; i += 4) {
    const __m128i g = load4(t.g + i);
    const __m128i rowPair = _mm_sub_epi32(_mm_add_epi32(load4(t.s + i - 1), load4(t.s + i + 1)),
                                          _mm_add_epi32(load4(t.g + i - 1), load4(t.g + i + 1)));
    const __m128i columnPair = _mm_sub_epi32(_mm_add_epi32(load4(t.sUp + i), load4(t.sDown + i)),
                                             _mm_add_epi32(load4(t.gUp + i), load4(t.gDown + i)));
    const __m128i sDiagonals = _mm_add_epi32(_mm_add_epi32(load4(t.sUp + i - 1), load4(t.sUp + i + 1)),
                                             _mm_add_epi32(load4(t.sDown + i - 1), load4(t.sDown + i + 1)));
    const __m128i gDiagonals = _mm_add_epi32(_mm_add_epi32(load4(t.gUp + i - 1), load4(t.gUp + i + 1)),
                                             _mm_add_epi32(load4(t.gDown + i - 1), load4(t.gDown + i + 1)));
    const __m128i alongRow = clampLanes<T>(_mm_add_epi32(g, _mm_srai_epi32(rowPair, 1)));
    const __m128i alongColumn = clampLanes<T>(_mm_add_epi32(g, _mm_srai_epi32(columnPair, 1)));
    const __m128i diagonal = clampLanes<T>(_mm_add_epi32(g, _mm_srai_epi32(_mm_sub_epi32(sDiagonals, gDiagonals), 2)));
    const __m128i rowColour = _mm_blendv_epi8(load4(t.s + i), alongRow, green);
    const __m128i otherColour = _mm_blendv_epi8(diagonal, alongColumn, green);
    store4(outR + i, redRow ? rowColour : otherColour);
    store4(outB + i, redRow ? otherColour : rowColour);
  }
  const ColourTaps<T> rest{t.gUp + i, t.g + i, t.gDown + i, t.sUp + i, t.s + i, t.sDown + i};
  colourRowScalar(rest, count - i, firstGreen, redRow, outR + i, outB + i);
}

template <typename T>
void lumaChromaRow(const T* r, const T* g, const T* b, int count, const LumaChromaRow& out) {
  auto weigh = [](__m128i r4, __m128i g4, __m128i b4, int kr, int kg, int kb) {
    const __m128i s = _mm_add_epi32(_mm_add_epi32(_mm_mullo_epi32(r4, _mm_set1_epi32(kr)), _mm_mullo_epi32(g4, _mm_set1_epi32(kg))),
                                    _mm_add_epi32(_mm_mullo_epi32(b4, _mm_set1_epi32(kb)), _mm_set1_epi32(128)));
    return _mm_srai_epi32(s, 8);
  };
  int i = 0;
  for (; i + 4 <= count; i += 4) {
    const __m128i r4 = load4(r + i), g4 = load4(g + i), b4 = load4(b + i);
    storeLanes(out.y + i, weigh(r4, g4, b4, 66, 129, 25));
    storeLanes(out.cb + i, weigh(r4, g4, b4, -38, -74, 112));
    storeLanes(out.cr + i, weigh(r4, g4, b4, 112, -94, -18));
  }
  lumaChromaRowScalar(r + i, g + i, b + i, count - i, LumaChromaRow{out.y + i, out.cb + i, out.cr + i});
}

template <typename T>
void homogeneityRow(const LumaChromaView h[3], const LumaChromaView v[3], int count, T* out) {
  const __m128i ones = _mm_set1_epi32(-1);
  int i = 0;
  for (; i + 4 <= count; i += 4) {
    // Distances to the left, right, upper and lower neighbour, per direction.
    __m128i dY[2][4], dC[2][4];
    for (int d = 0; d < 2; ++d) {
      const LumaChromaView* rows = d == 0 ? h : v;
      const __m128i y = loadLanes(rows[1].y + i), cb = loadLanes(rows[1].cb + i), cr = loadLanes(rows[1].cr + i);
      const int32_t* ny[4] = {rows[1].y + i - 1, rows[1].y + i + 1, rows[0].y + i, rows[2].y + i};
      const int32_t* nb[4] = {rows[1].cb + i - 1, rows[1].cb + i + 1, rows[0].cb + i, rows[2].cb + i};
      const int32_t* nr[4] = {rows[1].cr + i - 1, rows[1].cr + i + 1, rows[0].cr + i, rows[2].cr + i};
      for (int n = 0; n < 4; ++n) {
        dY[d][n] = _mm_abs_epi32(_mm_sub_epi32(loadLanes(ny[n]), y));
        const __m128i db = _mm_sub_epi32(loadLanes(nb[n]), cb), dr = _mm_sub_epi32(loadLanes(nr[n]), cr);
        dC[d][n] = _mm_add_epi32(_mm_mullo_epi32(db, db), _mm_mullo_epi32(dr, dr));  // wraps at 32 bits
      }
    }
    const __m128i epsY = _mm_min_epi32(_mm_max_epi32(dY[0][0], dY[0][1]), _mm_max_epi32(dY[1][2], dY[1][3]));
    const __m128i epsC = _mm_min_epi32(_mm_max_epi32(dC[0][0], dC[0][1]), _mm_max_epi32(dC[1][2], dC[1][3]));
    // Each homogeneous neighbour adds -1 to its direction's tally.
    __m128i tally[2];
    for (int d = 0; d < 2; ++d) {
      tally[d] = _mm_setzero_si128();
      for (int n = 0; n < 4; ++n) {
        const __m128i outside = _mm_or_si128(_mm_cmpgt_epi32(dY[d][n], epsY), _mm_cmpgt_epi32(dC[d][n], epsC));
        tally[d] = _mm_add_epi32(tally[d], _mm_xor_si128(outside, ones));
      }
    }
    store4(out + i, _mm_sub_epi32(tally[1], tally[0]));
  }
  LumaChromaView hr[3], vr[3];
  for (int k = 0; k < 3; ++k) {
    hr[k] = LumaChromaView{h[k].y + i, h[k].cb + i, h[k].cr + i};
    vr[k] = LumaChromaView{v[k].y + i, v[k].cb + i, v[k].cr + i};
  }
  homogeneityRowScalar(hr, vr, count - i, out + i);
}

template <typename T>
void windowSumRow(const T* up, const T* mid, const T* down, int count, int32_t* sums) {
  int i = 0;
  for (; i + 4 <= count; i += 4) {
    __m128i s = _mm_setzero_si128();
    for (const T* row : {up, mid, down})
      s = _mm_add_epi32(_mm_add_epi32(s, load4Signed(row + i - 1)),
                        _mm_add_epi32(load4Signed(row + i), load4Signed(row + i + 1)));
    storeLanes(sums + i, s);
  }
  windowSumRowScalar(up + i, mid + i, down + i, count - i, sums + i);
}

template <typename T>
void chooseRow(const T* const h[3], const T* const v[3], const uint8_t* takeV, int count, T* dst) {
  constexpr int block = 16 / int(sizeof(T));
  int i = 0;
  for (; i + block <= count; i += block) {
    const __m128i mask = sizeof(T) == 1 ? load128(takeV + i) : _mm_cvtepi8_epi16(load64(takeV + i));
    __m128i c[3];
    for (int k = 0; k < 3; ++k) c[k] = _mm_blendv_epi8(load128(h[k] + i), load128(v[k] + i), mask);
    storeRgb(dst + 3 * i, c[0], c[1], c[2]);
  }
  const T* hr[3] = {h[0] + i, h[1] + i, h[2] + i};
  const T* vr[3] = {v[0] + i, v[1] + i, v[2] + i};
  chooseRowScalar(hr, vr, takeV + i, count - i, dst + 3 * i);
}

#define ZEL_AHD_KERNELS(T)                                                                               \
  template void greenRow<T>(const GreenTaps<T>&, int, bool, T*);                                        \
  template void colourRow<T>(const ColourTaps<T>&, int, bool, bool, T*, T*);                            \
  template void lumaChromaRow<T>(const T*, const T*, const T*, int, const LumaChromaRow&);              \
  template void homogeneityRow<T>(const LumaChromaView[3], const LumaChromaView[3], int, T*);          \
  template void windowSumRow<T>(const T*, const T*, const T*, int, int32_t*);                          \
  template void chooseRow<T>(const T* const[3], const T* const[3], const uint8_t*, int, T*);
ZEL_AHD_KERNELS(uint8_t)
ZEL_AHD_KERNELS(uint16_t)
#undef ZEL_AHD_KERNELS

}  // namespace zel
