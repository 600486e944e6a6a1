// Expected output rows of the packed-word readers, pixel by pixel from the
// scalar formulas, with the path split of each member: which pixels take
// the body form, which the tail form, which are left alone (-1).
#pragma once

#include <cstdint>
#include <cstring>
#include <vector>

#include "packed16/packed_fields.h"
#include "packed16/packed_read_formulas.h"

namespace zel::unpack::test {

using packed::Rgb;
using Row = std::vector<int>;

template <class L, bool RedHigh>
struct Fields {
  using Layout = L;
  static constexpr bool kRedHigh = RedHigh;
  static Rgb at(const uint16_t* s, int x) {
    uint16_t w;
    std::memcpy(&w, s + x, 2);
    return packed::unpackRgb<L>(w, RedHigh);
  }
};
using BlueLow555 = Fields<packed::Layout555, true>;
using BlueLow565 = Fields<packed::Layout565, true>;
using RedLow565 = Fields<packed::Layout565, false>;

inline Row untouched(int n) { return Row(size_t(n), -1); }
inline Rgb operator+(const Rgb& a, const Rgb& b) { return {a.r + b.r, a.g + b.g, a.b + b.b}; }

// Three bytes a pixel: the low field, green, the top field.
inline Row refWordsToBytes(const uint16_t* s, int w) {
  Row out;
  for (int x = 0; x < w; ++x) {
    const Rgb p = Fields<packed::Layout565, false>::at(s, x);
    out.insert(out.end(), {p.r, p.g, p.b});
  }
  return out;
}

// ---- studio YCbCr ----

template <class F>
int studioLuma(const uint16_t* s, int x, bool body) {
  const Rgb p = F::at(s, x);
  return body ? studioLumaBody(p.r, p.g, p.b) : studioLumaTail(p.r, p.g, p.b);
}

template <int Pixels>
void studioChroma(const Rgb& sum, bool body, int& cb, int& cr) {
  if (body) {
    cb = StudioChromaBody<Pixels>::cb(sum.r, sum.g, sum.b);
    cr = StudioChromaBody<Pixels>::cr(sum.r, sum.g, sum.b);
  } else {
    cb = StudioChromaTail<Pixels>::cb(sum.r, sum.g, sum.b);
    cr = StudioChromaTail<Pixels>::cr(sum.r, sum.g, sum.b);
  }
}

// 4:2:0 row pair: the body below width & ~15, and four more pixels when
// (width & 7) >= 4; a last odd column gets luma in both rows.
struct PairRef {
  Row y0, y1, c1, c2;
};
template <class F>
PairRef refStudio420(const uint16_t* s0, const uint16_t* s1, int w) {
  const int end = (w & ~15) + ((w & 7) >= 4 ? 4 : 0);
  PairRef o{untouched(w), untouched(w), untouched((w + 1) / 2), untouched((w + 1) / 2)};
  for (int x = 0; x < w; ++x) {
    o.y0[x] = studioLuma<F>(s0, x, x < end);
    o.y1[x] = studioLuma<F>(s1, x, x < end);
  }
  for (int j = 0; j < w / 2; ++j) {
    const Rgb sum = F::at(s0, 2 * j) + F::at(s0, 2 * j + 1) + F::at(s1, 2 * j) + F::at(s1, 2 * j + 1);
    studioChroma<4>(sum, 2 * j < end, o.c1[j], o.c2[j]);
  }
  return o;
}

// A last odd row of 4:2:0: luma by the tail form.
template <class F>
Row refStudioLumaTail(const uint16_t* s, int w) {
  Row y(size_t(w), 0);
  for (int x = 0; x < w; ++x) y[x] = studioLuma<F>(s, x, false);
  return y;
}

// 4:2:2: the body below width & ~31, eight more pixels when
// (width & 15) >= 8.
inline int studio422End(int w) { return (w & ~31) + ((w & 15) >= 8 ? 8 : 0); }

struct PlaneRef {
  Row y, c1, c2;
};
template <class F>
PlaneRef refStudio422Planes(const uint16_t* s, int w) {
  const int end = studio422End(w);
  PlaneRef o{untouched(w), untouched((w + 1) / 2), untouched((w + 1) / 2)};
  for (int x = 0; x < w; ++x) o.y[x] = studioLuma<F>(s, x, x < end);
  for (int j = 0; j < w / 2; ++j) studioChroma<2>(F::at(s, 2 * j) + F::at(s, 2 * j + 1), 2 * j < end, o.c1[j], o.c2[j]);
  return o;
}

// Y0 Cb Y1 Cr; an odd width ends with Y and the lone pixel's own Cb.
template <class F>
Row refStudio422Pairs(const uint16_t* s, int w) {
  const PlaneRef p = refStudio422Planes<F>(s, w);
  Row o(size_t(2 * w), 0);
  for (int x = 0; x < w; ++x) o[2 * x] = p.y[x];
  for (int j = 0; j < w / 2; ++j) {
    o[4 * j + 1] = p.c1[j];
    o[4 * j + 3] = p.c2[j];
  }
  if (w & 1) {
    const Rgb a = F::at(s, w - 1);
    o[2 * w - 1] = studioLoneCb(a.r, a.g, a.b);
  }
  return o;
}

// 4:1:1: the body formula up to width & ~3, luma alone by the tail form
// beyond.
template <class F>
PlaneRef refStudio411(const uint16_t* s, int w) {
  const int end = w & ~3;
  PlaneRef o{untouched(w), untouched((w + 3) / 4), untouched((w + 3) / 4)};
  for (int x = 0; x < w; ++x) o.y[x] = studioLuma<F>(s, x, x < end);
  for (int j = 0; j < end / 4; ++j) {
    const Rgb sum = F::at(s, 4 * j) + F::at(s, 4 * j + 1) + F::at(s, 4 * j + 2) + F::at(s, 4 * j + 3);
    studioChroma<4>(sum, true, o.c1[j], o.c2[j]);
  }
  return o;
}

// ---- YUV ----

// Blue-low words, 4:2:0: the body below width & ~7 and four more pixels
// when (width & 6) >= 4; tails in pairs; a last odd column untouched.
template <class F>
PairRef refYuv420(const uint16_t* s0, const uint16_t* s1, int w) {
  const int end = (w & ~7) + ((w & 6) >= 4 ? 4 : 0);
  PairRef o{untouched(w), untouched(w), untouched((w + 1) / 2), untouched((w + 1) / 2)};
  const uint16_t* rows[2] = {s0, s1};
  Row* ys[2] = {&o.y0, &o.y1};
  for (int j = 0; j < w / 2; ++j) {
    const bool body = 2 * j < end;
    int ysum = 0;
    int32_t S = 0;
    Rgb sum{0, 0, 0};
    for (int k = 0; k < 2; ++k)
      for (int x = 2 * j; x < 2 * j + 2; ++x) {
        const Rgb p = F::at(rows[k], x);
        const int y = yuvLumaBodyLane(p.r, p.g, p.b);
        const int32_t yf = yuvLumaSum(p.r, p.g, p.b);
        (*ys[k])[x] = body ? SaturateU8(y) : (yf + 32768) >> 16;
        ysum += y;
        S += yf;
        sum = sum + p;
      }
    o.c1[j] = body ? yuvChromaBody(ysum, sum.b, kYuvUGain) : YuvChromaTail4::u(sum.b, S);
    o.c2[j] = body ? yuvChromaBody(ysum, sum.r, kYuvVGain) : YuvChromaTail4::v(sum.r, S);
  }
  return o;
}

// Red-low 565, groups of four (4:2:0, two rows) or two (4:2:2, s1 null):
// the body below width & ~15, tails in pairs; a last odd column untouched.
inline void refRedLowGroups(const uint16_t* s0, const uint16_t* s1, int w, Row& y0, Row& y1, Row& u, Row& v) {
  const int end = w & ~15;
  const bool four = s1 != nullptr;
  const uint16_t* rows[2] = {s0, s1};
  Row* ys[2] = {&y0, &y1};
  for (int j = 0; j < w / 2; ++j) {
    const bool body = 2 * j < end;
    int y2sum = 0, bsum = 0, rsum = 0;
    int32_t S = 0;
    for (int k = 0; k < (four ? 2 : 1); ++k)
      for (int x = 2 * j; x < 2 * j + 2; ++x) {
        const Rgb p = RedLow565::at(rows[k], x);
        const int y2 = yuvLumaTwice(p.r, p.g, p.b);
        const int32_t yf = yuvLumaSum(p.r, p.g, p.b);
        (*ys[k])[x] = body ? yuvLumaFromTwice(y2) : yf >> 16;
        y2sum += y2;
        S += yf;
        bsum += p.b;
        rsum += p.r;
      }
    if (body) {
      // Means of y2 and of B' = 4b, R' = 4r over the group.
      const int m = y2sum >> (four ? 2 : 1), shift = four ? 3 : 2;
      u[j] = yuvChromaFromTwice((4 * bsum) >> shift, m, kYuvUGainRedLow);
      v[j] = yuvChromaFromTwice((4 * rsum) >> shift, m, kYuvVGain);
    } else if (four) {
      u[j] = YuvChromaTail4::u(bsum, S);
      v[j] = YuvChromaTail4::v(rsum, S);
    } else {
      u[j] = YuvChromaTail2::u(bsum, S);
      v[j] = YuvChromaTail2::v(rsum, S);
    }
  }
}

inline PairRef refRedLow420(const uint16_t* s0, const uint16_t* s1, int w) {
  PairRef o{untouched(w), untouched(w), untouched((w + 1) / 2), untouched((w + 1) / 2)};
  refRedLowGroups(s0, s1, w, o.y0, o.y1, o.c1, o.c2);
  return o;
}

inline PlaneRef refRedLow422(const uint16_t* s, int w) {
  PlaneRef o{untouched(w), untouched((w + 1) / 2), untouched((w + 1) / 2)};
  Row unused;
  refRedLowGroups(s, nullptr, w, o.y, unused, o.c1, o.c2);
  return o;
}

}  // namespace zel::unpack::test
