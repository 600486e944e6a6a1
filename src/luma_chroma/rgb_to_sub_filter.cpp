// RGB to a CbYCr stream with filtered chroma: every even pixel's Cb and Cr
// weigh the pixel fully and its two neighbours by half, so the chroma of
// a pair sees three pixels. One exact formula for the whole row; only a
// last pixel of an odd width takes the wide single-pixel form.
#include "luma_chroma/rgb_to_sub_filter.h"

#include <array>
#include <cmath>

#include "frame/export.h"
#include "frame/image_layout.h"
#include "frame/row_driver.h"
#include "frame/simd.h"
#include "luma_chroma/rgb_to_sub_rows.h"

namespace zel::lc::sub {

namespace {

std::array<uint8_t, 256> makeGammaTable() {
  std::array<uint8_t, 256> t{};
  for (int i = 0; i < 256; ++i) {
    // On the linear segment 255 f(i / 255) is 4.5 i exactly, so that its
    // halves (i = 1, 3) meet the tie rule.
    const double x = i / 255.0;
    const double v = x < 0.018 ? 4.5 * i : 255.0 * (1.099 * std::pow(x, 0.45) - 0.099);
    // Nearest, ties to even.
    double r = std::floor(v);
    const double frac = v - r;
    if (frac > 0.5 || (frac == 0.5 && std::fmod(r, 2.0) != 0.0)) r += 1.0;
    t[i] = static_cast<uint8_t>(r);
  }
  return t;
}

// Built once when the library loads; read-only after.
const std::array<uint8_t, 256> kGamma = makeGammaTable();

// Pixels of a row, through the table when there is one.
struct FilterSource {
  const uint8_t* p;
  const uint8_t* table;
  Rgb pixel(int x) const {
    const uint8_t* q = p + 3 * x;
    if (table) return {table[q[0]], table[q[1]], table[q[2]]};
    return {q[0], q[1], q[2]};
  }
};

void scalarPairs(const FilterSource& in, uint8_t* dst, int x, int end) {
  for (; x < end; x += 2) {
    const Rgb p0 = in.pixel(x), p1 = in.pixel(x + 1);
    if (x > 0) {
      const Rgb prev = in.pixel(x - 1);
      filteredPair(&prev, p0, p1, dst + 2 * x);
    } else {
      filteredPair(nullptr, p0, p1, dst + 2 * x);
    }
  }
}

// Taps of one chroma for the pairs of eight pixels in 16-bit lanes: the
// centre weight on even lanes with the side weight on odd lanes, and the
// side weight alone on odd lanes.
struct Taps {
  int r, g, b;     // centre
  int sr, sg, sb;  // side
};
constexpr Taps kCbTaps{-2426, -4769, 7193, -1213, -2385, 3596};
constexpr Taps kCrTaps{7193, -6030, -1164, 3596, -3015, -582};

using M = More<Sse>;
using S = Sse;

// Chroma of four pairs: centre(2i) + side(2i + 1) + side(2i - 1) + addend,
// >> 15; `carry` holds side(2i + 1) of the previous four pairs.
inline __m128i filteredChroma(__m128i r, __m128i g, __m128i b, const Taps& t, __m128i& carry) {
  const __m128i own = S::add32(S::add32(S::madd16(r, M::pair16(t.r, t.sr)), S::madd16(g, M::pair16(t.g, t.sg))),
                               S::madd16(b, M::pair16(t.b, t.sb)));
  const __m128i side = S::add32(S::add32(S::madd16(r, M::pair16(0, t.sr)), S::madd16(g, M::pair16(0, t.sg))),
                                S::madd16(b, M::pair16(0, t.sb)));
  const __m128i before = _mm_alignr_epi8(side, carry, 12);
  carry = side;
  return S::sra32<15>(S::add32(S::add32(own, before), S::set32(kFilterAddend)));
}

// Blocks of 16 pixels; returns the first pixel not converted.
int vectorPairs(const FilterSource& in, uint8_t* dst, int end) {
  __m128i cbCarry = _mm_setzero_si128(), crCarry = _mm_setzero_si128();
  int x = 0;
  alignas(16) uint8_t mapped[48];
  const PairsOut<PairOrder::CbYCr> out{dst};
  for (; x + 16 <= end; x += 16) {
    const uint8_t* block = in.p + 3 * x;
    if (in.table) {
      for (int i = 0; i < 48; ++i) mapped[i] = in.table[block[i]];
      block = mapped;
    }
    const Trio<Sse> s = PackedIn<3>{block}.block<Sse>(0);
    const Wide16<Sse> r = widen<Sse>(s.c0), g = widen<Sse>(s.c1), b = widen<Sse>(s.c2);
    const __m128i yLo = dot3Shift<Sse, 15>(r.lo, g.lo, b.lo, 8422, 16515, 3212, 540672);
    const __m128i yHi = dot3Shift<Sse, 15>(r.hi, g.hi, b.hi, 8422, 16515, 3212, 540672);
    const __m128i cbLo = filteredChroma(r.lo, g.lo, b.lo, kCbTaps, cbCarry);
    const __m128i cbHi = filteredChroma(r.hi, g.hi, b.hi, kCbTaps, cbCarry);
    const __m128i crLo = filteredChroma(r.lo, g.lo, b.lo, kCrTaps, crCarry);
    const __m128i crHi = filteredChroma(r.hi, g.hi, b.hi, kCrTaps, crCarry);
    const __m128i cc = _mm_packus_epi16(S::packS32(cbLo, cbHi), S::packS32(crLo, crHi));
    out.block<Sse>(x, _mm_packus_epi16(yLo, yHi), cc);
  }
  return x;
}

}  // namespace

const uint8_t* gammaTable() { return kGamma.data(); }

void filteredRow(const uint8_t* src, uint8_t* dst, int width, const uint8_t* table, bool vector) {
  const FilterSource in{src, table};
  const int pairsEnd = width & ~1;
  const int x = vector ? vectorPairs(in, dst, pairsEnd) : 0;
  scalarPairs(in, dst, x, pairsEnd);
  if (width & 1) {
    // The last pixel alone: Cb and Y, no Cr.
    const Rgb p = in.pixel(width - 1);
    dst[2 * (width - 1)] = chromaWideSingle<set601>(p).c1;
    dst[2 * (width - 1) + 1] = lumaWide<set601>(p);
  }
}

namespace {

Status filtered(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, ImageSize size, const uint8_t* table) {
  if (!src || !dst) return StatusNullPointerError;
  if (size.width < 1 || size.height < 1) return StatusSizeError;
  plainWalk(size.height,
            [&](int y) { filteredRow(rowAt(src, srcStep, y), rowAt(dst, dstStep, y), size.width, table, true); });
  return StatusOk;
}

}  // namespace

}  // namespace zel::lc::sub

ZEL_PUBLIC Status zeliRGBToCbYCr422_8u_C3C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                             ImageSize size) {
  return zel::lc::sub::filtered(src, srcStep, dst, dstStep, size, nullptr);
}

ZEL_PUBLIC Status zeliRGBToCbYCr422Gamma_8u_C3C2R(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep,
                                                  ImageSize size) {
  return zel::lc::sub::filtered(src, srcStep, dst, dstStep, size, zel::lc::sub::gammaTable());
}
