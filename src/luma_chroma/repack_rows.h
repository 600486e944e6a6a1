// Byte moves of the repacking family: 4:2:2 pair streams split into planes
// and merged back, chroma pairs zipped and unzipped, even samples kept,
// samples doubled. No arithmetic: every path gives the same bytes.
#pragma once

#include <cstdint>

namespace zel::repack {

// Byte order of a 4:2:2 pair stream.
enum class PairOrder : uint8_t { YCbCr, YCrCb, CbYCr };

// Position of Y0, Cb, Y1, Cr within four bytes of a pair.
struct PairSlots {
  int y0, cb, y1, cr;
};
constexpr PairSlots slotsOf(PairOrder o) {
  return o == PairOrder::YCbCr ? PairSlots{0, 1, 2, 3}
         : o == PairOrder::YCrCb ? PairSlots{0, 3, 2, 1}
                                 : PairSlots{1, 0, 3, 2};
}

// ---- scalar forms, one pixel pair or one sample at a time ----

inline void splitPair(const uint8_t* in, PairOrder o, uint8_t* y, uint8_t* cb, uint8_t* cr) {
  const PairSlots s = slotsOf(o);
  y[0] = in[s.y0];
  y[1] = in[s.y1];
  *cb = in[s.cb];
  *cr = in[s.cr];
}

inline void mergePair(const uint8_t* y, uint8_t cb, uint8_t cr, PairOrder o, uint8_t* out) {
  const PairSlots s = slotsOf(o);
  out[s.y0] = y[0];
  out[s.y1] = y[1];
  out[s.cb] = cb;
  out[s.cr] = cr;
}

// ---- row kernels: a vector body and a scalar tail ----

// `pixels` is even: pixels/2 pairs become pixels luma and pixels/2 of each chroma.
void splitPairs(const uint8_t* in, PairOrder o, uint8_t* y, uint8_t* cb, uint8_t* cr, int pixels);
void mergePairs(const uint8_t* y, const uint8_t* cb, const uint8_t* cr, PairOrder o, uint8_t* out, int pixels,
                bool nonTemporal);
// Rows of luma planes woven with chroma planes, `lumaRowsPerChromaRow` luma
// rows (1 or 2) to each chroma row: mergePairs on each row.
struct PairRows {
  const uint8_t *y, *cb, *cr;
  int yStep, cbStep, crStep;
  int lumaRowsPerChromaRow;
  uint8_t* out;
  int outStep;
};
void mergePairRows(const PairRows& rows, PairOrder o, int width, int height, bool nonTemporal);
// One byte order of pair streams into another, `pixels` even.
void reorderPairs(const uint8_t* in, PairOrder from, uint8_t* out, PairOrder to, int pixels, bool nonTemporal);
// Only the luma of a pair stream, `pixels` samples (a last odd pixel included).
void lumaOfPairs(const uint8_t* in, PairOrder o, uint8_t* y, int pixels);

// Pair streams straight into the planar forms of other schemes, one pass a
// row; a row that keeps its chroma (`pixels` a multiple of 4 for 4:1:1).
// 4:1:1 planes take the chroma of every second pair.
void splitPairs411(const uint8_t* in, PairOrder o, uint8_t* y, uint8_t* cb, uint8_t* cr, int pixels);
// Luma and a row of Cb, Cr byte pairs, at 4:2:2 or 4:1:1 density.
void splitPairsToCbCr(const uint8_t* in, PairOrder o, uint8_t* y, uint8_t* cbcr, int pixels, bool nonTemporal);
void splitPairsToCbCr411(const uint8_t* in, PairOrder o, uint8_t* y, uint8_t* cbcr, int pixels, bool nonTemporal);
// Pair streams from luma and a row of Cb, Cr byte pairs, or from 4:1:1
// planes or byte pairs, each 4:1:1 sample serving two pairs.
void mergePairsCbCr(const uint8_t* y, const uint8_t* cbcr, PairOrder o, uint8_t* out, int pixels, bool nonTemporal);
void mergePairs411(const uint8_t* y, const uint8_t* cb, const uint8_t* cr, PairOrder o, uint8_t* out, int pixels,
                   bool nonTemporal);
void mergePairsCbCr411(const uint8_t* y, const uint8_t* cbcr, PairOrder o, uint8_t* out, int pixels,
                       bool nonTemporal);

// out[2k] = a[k], out[2k+1] = b[k] for k < n.
void zip(const uint8_t* a, const uint8_t* b, uint8_t* out, int n, bool nonTemporal);
// a[k] = in[2k], b[k] = in[2k+1] for k < n.
void unzip(const uint8_t* in, uint8_t* a, uint8_t* b, int n);
// out[k] = in[2k] for k < n.
void keepEven(const uint8_t* in, uint8_t* out, int n);
// out[2k] = out[2k+1] = in[k] for k < n.
void doubleSamples(const uint8_t* in, uint8_t* out, int n, bool nonTemporal);
// a[2k] = a[2k+1] = in[2k], b[2k] = b[2k+1] = in[2k+1] for k < n.
void unzipDouble(const uint8_t* in, uint8_t* a, uint8_t* b, int n);
// out[2k] = a[2k], out[2k+1] = b[2k] for k < n.
void zipEvens(const uint8_t* a, const uint8_t* b, uint8_t* out, int n);
// Byte pairs (a[m], b[m]) dealt out alternately: even[2k], even[2k+1] =
// a[2k], b[2k]; odd[2k], odd[2k+1] = a[2k+1], b[2k+1]; n bytes each (even).
void crossPairs(const uint8_t* a, const uint8_t* b, uint8_t* even, uint8_t* odd, int n);
// out[4k..4k+3] = a[k], b[k], c[k], d[k] for k < n, and back.
void zip4(const uint8_t* a, const uint8_t* b, const uint8_t* c, const uint8_t* d, uint8_t* out, int n);
void unzip4(const uint8_t* in, uint8_t* a, uint8_t* b, uint8_t* c, uint8_t* d, int n);
void copyBytes(const uint8_t* in, uint8_t* out, int n, bool nonTemporal);

}  // namespace zel::repack
