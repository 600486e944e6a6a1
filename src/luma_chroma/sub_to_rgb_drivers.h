// Row walks of the subsampled-to-RGB members: 4:2:0 row pairs held by the
// public function, plain walks of 4:2:2 and 4:1:1 rows, and the argument
// tests they share.
#pragma once

#include <climits>
#include <cstdint>

#include "frame/image_layout.h"
#include "frame/simd.h"
#include "luma_chroma/sub_to_rgb_rows.h"
#include "zelcc/zelcc.h"

namespace zel::lc::expand {

inline bool sizeBelow(ImageSize size, int minWidth, int minHeight) {
  return size.width < minWidth || size.height < minHeight;
}

// The warning of the 4:2:0 members, from the size alone.
inline Status oddSizeStatus(ImageSize size) {
  return (size.width & 1) || (size.height & 1) ? StatusOddSizeWarning : StatusOk;
}

// Pointers and steps of a three-plane subsampled source; `chromaRow` is the
// chroma row that serves luma row y.
struct SubPlanes {
  const uint8_t* const* planes;
  const int* steps;
  const uint8_t* luma(int y) const { return rowAt(planes[0], steps[0], y); }
  const uint8_t* plane(int k, int row) const { return rowAt(planes[k], steps[k], row); }
  bool aligned() const {
    for (int k = 0; k < 3; ++k)
      if (!isAligned16(planes[k]) || !isAligned16(steps[k])) return false;
    return true;
  }
};

// Chroma planes in the order Cb, Cr of a plane set that holds them as
// planes 1, 2 (CrFirst: 2, 1).
template <int Spread, bool CrFirst = false>
inline ChromaPlanes<Spread> chromaPlanes(const SubPlanes& s, int row) {
  return {s.plane(CrFirst ? 2 : 1, row), s.plane(CrFirst ? 1 : 2, row)};
}

// Makers of destination row views.
template <bool Reverse>
inline auto packedRows3(uint8_t* dst, int step) {
  return [=](int y) { return PackedOut3<Reverse>{rowAt(dst, step, y)}; };
}
template <bool Reverse>
inline auto packedRows4(uint8_t* dst, int step, uint8_t alpha) {
  return [=](int y) { return PackedOutAlpha<Reverse>{rowAt(dst, step, y), alpha}; };
}
inline auto planeOutRows(uint8_t* const planes[3], int step) {
  return [=](int y) {
    return PlanesOut{rowAt(planes[0], step, y), rowAt(planes[1], step, y), rowAt(planes[2], step, y)};
  };
}

// The 4:2:0 row-pair loop: luma rows 2j and 2j + 1 with chroma row j, for
// height / 2 pairs; a last odd row and column are not written. The makers
// give the views of a luma row, a chroma row and a destination row.
template <class MakeLuma, class MakeChroma, class MakeOut, class Body, class Tail>
inline Status expandPairs(ImageSize size, int bodyEnd, MakeLuma luma, MakeChroma chroma, MakeOut out, const Body& body,
                          const Tail& tail) {
  const int end = size.width & ~1;
  const VectorTier tier = zel::widestTierWithBytePermutes();
  using Set = RowSet<2, LumaRow, decltype(chroma(0)), decltype(out(0))>;
  for (int j = 0; j < size.height >> 1; ++j) {
    const Set rows{{LumaRow{luma(2 * j)}, LumaRow{luma(2 * j + 1)}}, chroma(j), {out(2 * j), out(2 * j + 1)}};
    expandRow(rows, bodyEnd, end, body, tail, tier);
  }
  return oddSizeStatus(size);
}

// A plain walk of single rows; `row(y)` gives the views of row y.
template <class MakeRow, class Body, class Tail>
inline void expandRows(int height, int bodyEnd, int end, MakeRow row, const Body& body, const Tail& tail) {
  const VectorTier tier = zel::widestTierWithBytePermutes();
  for (int y = 0; y < height; ++y) expandRow(row(y), bodyEnd, end, body, tail, tier);
}

// A pair stream row with its destination row.
template <repack::PairOrder Order, class Out>
inline RowSet<1, PairStream<Order>, PairStream<Order>, Out> streamRow(const uint8_t* src, const Out& out) {
  return {{PairStream<Order>{src}}, PairStream<Order>{src}, {out}};
}

// Whether a 4:2:2 member without steps takes its image as one row: at
// least 256 pixels and an even width (rows then follow each other).
inline bool wholeImageAsRow(ImageSize size) {
  const long long pixels = static_cast<long long>(size.width) * size.height;
  return pixels >= 256 && (size.width & 1) == 0 && pixels <= INT_MAX;
}

}  // namespace zel::lc::expand
