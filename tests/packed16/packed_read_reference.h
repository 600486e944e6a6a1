// Expected output rows of the packed-word readers, pixel by pixel from the
// scalar formulas and each member's path split; -1 marks a byte left alone.
#pragma once

#include <cstdint>
#include <cstring>
#include <vector>

#include "packed16/packed_fields.h"
#include "packed16/packed_read_formulas.h"

namespace zel::unpack::test {

using packed::Rgb;
using Row = std::vector<int>;

// Output rows of one call of a row kernel: Y (or the only output), then
// the first and second chroma; a 4:2:0 pair has its second luma row last.
struct Rows {
  Row y, c1, c2, y1;
};

template <class L, bool RedHigh>
Rgb pixel(const uint16_t* s, int x) {
  uint16_t w;
  std::memcpy(&w, s + x, 2);
  return packed::unpackRgb<L>(w, RedHigh);
}
using Source = Rgb (*)(const uint16_t*, int);
inline Rgb operator+(const Rgb& a, const Rgb& b) { return {a.r + b.r, a.g + b.g, a.b + b.b}; }

inline Row refWordsToBytes(const uint16_t* s, int w) {
  Row out;
  for (int x = 0; x < w; ++x) {
    const Rgb p = pixel<packed::Layout565, false>(s, x);  // the low field first
    out.insert(out.end(), {p.r, p.g, p.b});
  }
  return out;
}

// Studio YCbCr of a row (s1 null) or a 4:2:0 row pair: body forms for the
// pixels below `end`, luma of every pixel, chroma of every whole group of
// `group` columns.
inline Rows refStudio(Source at, const uint16_t* s0, const uint16_t* s1, int w, int group, int end) {
  const int samples = (w + group - 1) / group;
  Rows o{Row(w, -1), Row(samples, -1), Row(samples, -1), Row(s1 ? w : 0, -1)};
  for (int k = 0; k < (s1 ? 2 : 1); ++k)
    for (int x = 0; x < w; ++x) {
      const Rgb p = at(k ? s1 : s0, x);
      (k ? o.y1 : o.y)[x] = x < end ? studioLumaBody(p.r, p.g, p.b) : studioLumaTail(p.r, p.g, p.b);
    }
  const bool four = group * (s1 ? 2 : 1) == 4;
  for (int j = 0; j < w / group; ++j) {
    Rgb s{0, 0, 0};
    for (int x = group * j; x < group * (j + 1); ++x) s = s1 ? s + at(s0, x) + at(s1, x) : s + at(s0, x);
    const bool body = group * j < end;
    o.c1[j] = body ? (four ? StudioChromaBody<4>::cb(s.r, s.g, s.b) : StudioChromaBody<2>::cb(s.r, s.g, s.b))
                   : (four ? StudioChromaTail<4>::cb(s.r, s.g, s.b) : StudioChromaTail<2>::cb(s.r, s.g, s.b));
    o.c2[j] = body ? (four ? StudioChromaBody<4>::cr(s.r, s.g, s.b) : StudioChromaBody<2>::cr(s.r, s.g, s.b))
                   : (four ? StudioChromaTail<4>::cr(s.r, s.g, s.b) : StudioChromaTail<2>::cr(s.r, s.g, s.b));
  }
  return o;
}

// The path splits: 4:2:0 has its body below width & ~15 and four more
// pixels when (width & 7) >= 4; 4:2:2 below width & ~31 and eight more
// when (width & 15) >= 8; 4:1:1 up to width & ~3.
inline Rows refStudio420(Source at, const uint16_t* s0, const uint16_t* s1, int w) {
  return refStudio(at, s0, s1, w, 2, (w & ~15) + ((w & 7) >= 4 ? 4 : 0));
}
inline Rows refStudio422(Source at, const uint16_t* s, int w) {
  return refStudio(at, s, nullptr, w, 2, (w & ~31) + ((w & 15) >= 8 ? 8 : 0));
}
inline Rows refStudio411(Source at, const uint16_t* s, int w) { return refStudio(at, s, nullptr, w, 4, w & ~3); }

// Y0 Cb Y1 Cr; an odd width ends with Y and the lone pixel's own Cb.
inline Row refStudio422Pairs(Source at, const uint16_t* s, int w) {
  const Rows p = refStudio422(at, s, w);
  Row o(size_t(2 * w), 0);
  for (int x = 0; x < w; ++x) {
    o[2 * x] = p.y[x];
    o[2 * x + 1] = (x & 1 ? p.c2 : p.c1)[x / 2];
  }
  const Rgb a = at(s, w - 1);
  if (w & 1) o[2 * w - 1] = studioLoneCb(a.r, a.g, a.b);
  return o;
}

// YUV, the even part of a row pair (4:2:0) or row (4:2:2, s1 null).
// Blue-low words: body below width & ~7 and four more when (width & 6) >= 4.
// Red-low 565 words: body below width & ~15, the doubled-luma forms.
inline Rows refYuv(Source at, const uint16_t* s0, const uint16_t* s1, int w, bool redLow) {
  const int end = redLow ? w & ~15 : (w & ~7) + ((w & 6) >= 4 ? 4 : 0);
  const int rows = s1 ? 2 : 1;
  Rows o{Row(w, -1), Row((w + 1) / 2, -1), Row((w + 1) / 2, -1), Row(s1 ? w : 0, -1)};
  for (int j = 0; j < w / 2; ++j) {
    const bool body = 2 * j < end;
    int ys = 0;
    int32_t S = 0;
    Rgb sum{0, 0, 0};
    for (int k = 0; k < rows; ++k)
      for (int x = 2 * j; x < 2 * j + 2; ++x) {
        const Rgb p = at(k ? s1 : s0, x);
        const int y = redLow ? yuvLumaTwice(p.r, p.g, p.b) : yuvLumaBodyLane(p.r, p.g, p.b);
        const int32_t yf = yuvLumaSum(p.r, p.g, p.b);
        const int wide = redLow ? yf >> 16 : (yf + 32768) >> 16;
        (k ? o.y1 : o.y)[x] = !body ? wide : redLow ? yuvLumaFromTwice(y) : SaturateU8(y);
        ys += y;
        S += yf;
        sum = sum + p;
      }
    if (body && redLow) {  // means of y2 and of 4b, 4r over the group
      const int m = ys >> rows, shift = rows + 1;
      o.c1[j] = yuvChromaFromTwice((4 * sum.b) >> shift, m, kYuvUGainRedLow);
      o.c2[j] = yuvChromaFromTwice((4 * sum.r) >> shift, m, kYuvVGain);
    } else if (body) {
      o.c1[j] = yuvChromaBody(ys, sum.b, kYuvUGain);
      o.c2[j] = yuvChromaBody(ys, sum.r, kYuvVGain);
    } else {
      o.c1[j] = rows == 2 ? YuvChromaTail4::u(sum.b, S) : YuvChromaTail2::u(sum.b, S);
      o.c2[j] = rows == 2 ? YuvChromaTail4::v(sum.r, S) : YuvChromaTail2::v(sum.r, S);
    }
  }
  return o;
}

}  // namespace zel::unpack::test
