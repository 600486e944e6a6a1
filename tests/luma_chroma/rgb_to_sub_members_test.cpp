// The subsampling encoders as a whole: every export against a plain model
// of its forms and zones, written with the integer identities of the lane
// operations ((S c) >> 8 for a high word of S << 8, and so on) rather than
// with the lanes themselves. The model knows which pixels take the body,
// which the tail, what an odd last column or row gets, and leaves every
// other byte alone; the calls run over many sizes, paddings and offsets.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <functional>
#include <string>
#include <vector>

#include "frame/descriptor.h"
#include "zelcc/zelcc.h"

namespace {

using namespace zel::meta;

struct Px {
  int r, g, b;
};
struct Sums {
  int r, g, b;
};
struct CC {
  int c1, c2;
};

// ---- constant sets, as the matrix tables give them ----

struct Set {
  int lr, lg, lb, k;                 // luma lanes
  int cbR, cbG, cbB, crR, crG, crB;  // chroma lanes, positive
  int wr, wg, wb;                    // luma 16.16
  int wcbR, wcbG, wcbB, wcrR, wcrG, wcrB;
  bool narrow;
};
const Set k601{8422,  16515, 3212, 2112,  9699,   19071, 28770, 28770,  24117, 4653,
               16843, 33030, 6423, -9699, -19071, 28770, 28770, -24117, -4653, false};
const Set kCsc{5997,  20120, 2032, 2112,  6619,   22151, 28770, 28770,  26149, 2621,
               11993, 40239, 4063, -6619, -22151, 28770, 28770, -26149, -2621, false};
const Set kHdtv{6980,  23429, 2359, 64,    3834,   12911, 16744, 16744,  15204, 1540,
                13959, 46858, 4719, -7668, -25821, 33489, 33489, -30409, -3080, true};

int clamp(int v, int lo, int hi) { return std::min(std::max(v, lo), hi); }
int sat(const Set& s, int v) { return s.narrow ? clamp(v, 1, 254) : clamp(v, 0, 255); }
int wideByte(const Set& s, int v) { return s.narrow ? clamp(v, 1, 254) : (v & 255); }
int sat8(int v) { return clamp(v, 0, 255); }

// ---- the forms ----

int lumaLanes(const Set& s, Px p) {
  return sat(s, (((p.r * s.lr) >> 8) + ((p.g * s.lg) >> 8) + ((p.b * s.lb) >> 8) + s.k) >> 7);
}
int lumaWide(const Set& s, Px p, int addend) {
  return wideByte(s, (s.wr * p.r + s.wg * p.g + s.wb * p.b + addend) >> 16);
}
int lumaWide(const Set& s, Px p) { return lumaWide(s, p, s.narrow ? 32768 : 1081344); }
int m8(int v, int c) { return (v * c + 128) >> 8; }  // MulHighRound(v << 7, c)
int lumaRounded(Px p) { return sat8((m8(p.r, 4211) + m8(p.g, 8258) + m8(p.b, 1606) + 1026) >> 6); }
int lumaRounded411(Px p) { return sat8(((m8(p.r, 4211) + m8(p.g, 8258) + m8(p.b, 1606)) >> 6) + 16); }
int lumaExactLow(Px p) { return ((((p.r * 16843) >> 8) + ((p.g * 33030) >> 8) + ((p.b * 6423) >> 8)) >> 8) + 16; }

// Sums shifted left by `in`, high words of the products with positive
// constants: (X c) >> (16 - in).
CC chromaLanes(const Set& s, Sums x, int in, int addend, int out) {
  auto g = [in](int v, int c) { return (v * c) >> (16 - in); };
  return {sat(s, (g(x.b, s.cbB) - g(x.r, s.cbR) - g(x.g, s.cbG) + addend) >> out),
          sat(s, (g(x.r, s.crR) - g(x.g, s.crG) - g(x.b, s.crB) + addend) >> out)};
}
CC lanes420(const Set& s, Sums x) { return s.narrow ? chromaLanes(s, x, 5, 8224, 6) : chromaLanes(s, x, 5, 16400, 7); }
CC lanes422(const Set& s, Sums x) { return s.narrow ? chromaLanes(s, x, 6, 8224, 6) : chromaLanes(s, x, 5, 8200, 6); }
CC wide(const Set& s, Sums x, int cbAdd, int crAdd, int shift) {
  return {wideByte(s, (s.wcbR * x.r + s.wcbG * x.g + s.wcbB * x.b + cbAdd) >> shift),
          wideByte(s, (s.wcrR * x.r + s.wcrG * x.g + s.wcrB * x.b + crAdd) >> shift)};
}
CC wide420(const Set& s, Sums x) { return wide(s, x, 33587200, 33587200, 18); }
CC wide422(const Set& s, Sums x) { return wide(s, x, 16793600, 16793600, 17); }
CC wideSingle(const Set& s, Px p) { return wide(s, Sums{p.r, p.g, p.b}, 8396800, 8396800, 16); }
CC exact422(Sums x) { return wide(k601, x, 16842752, 16842752, 17); }
int m5(int v, int c) { return (v * c + 512) >> 10; }  // MulHighRound(v << 5, c)
CC rounded420(Sums x) {
  return {sat8((m5(x.b, 7193) - m5(x.g, 4768) - m5(x.r, 2425) + 8194) >> 6),
          sat8((m5(x.r, 7193) - m5(x.g, 6029) - m5(x.b, 1163) + 8194) >> 6)};
}
CC rounded411(Sums x) {
  return {sat8(((m5(x.b, 7193) - m5(x.g, 4768) - m5(x.r, 2425)) >> 6) + 128),
          sat8(((m5(x.r, 7193) - m5(x.g, 6029) - m5(x.b, 1163)) >> 6) + 128)};
}
int floorMul(int v, int c) { return (v * c) >> 16; }  // MulHighS16
CC signed422(Sums x) {
  auto l = [](int v, int c) { return floorMul(v << 6, c); };
  return {sat8((l(x.b, 28770) + l(x.g, -19071) + l(x.r, -9699) + 16448) >> 7),
          sat8((l(x.r, 28770) + l(x.g, -24117) + l(x.b, -4653) + 16448) >> 7)};
}

// ---- YUV forms ----

Sums sumOf(const std::vector<Px>& px);

int yuvP(Px p) { return floorMul(p.r << 2, 9798) + floorMul(p.g << 2, 19235) + floorMul(p.b << 2, 3736); }
int yuvQ(Px p) { return m8(p.r, 4899) + m8(p.g, 9617) + m8(p.b, 1868); }
int yuvT(Px p) { return 19595 * p.r + 38470 * p.g + 7471 * p.b; }
int yuvT14(Px p) { return 4899 * p.r + 9617 * p.g + 1868 * p.b; }
int yuvT15(Px p) { return 9798 * p.r + 19235 * p.g + 3736 * p.b; }
int roundMul(int v, int c) { return (v * c + 16384) >> 15; }  // MulHighRound
template <class F>
int sumOf(const std::vector<Px>& px, F f) {
  int s = 0;
  for (const Px& p : px) s += f(p);
  return s;
}

// Y = p >> 1; U from (sum of B << 2) >> 3 and (sum of p) >> 2 over 2 by 2.
CC difference420(const std::vector<Px>& v) {
  const Sums x = sumOf(v);
  const int p = sumOf(v, yuvP);
  return {sat8(floorMul(((x.b << 2) >> 3) - (p >> 2), 16121) + 128),
          sat8(floorMul(((x.r << 2) >> 3) - (p >> 2), 28737) + 128)};
}
CC difference422(const std::vector<Px>& v) {
  const Sums x = sumOf(v);
  const int p = sumOf(v, yuvP);
  return {sat8((floorMul((x.b << 1) - p, 16121) >> 1) + 128), sat8((floorMul((x.r << 1) - p, 28737) >> 1) + 128)};
}
CC roundedDifference420(const std::vector<Px>& v) {
  const Sums x = sumOf(v);
  const int q = sumOf(v, yuvQ);
  return {sat8((roundMul((x.b << 5) - (q >> 1), 8061) >> 6) + 128),
          sat8((roundMul((x.r << 5) - (q >> 1), 14369) >> 6) + 128)};
}
CC roundedDifference422(const std::vector<Px>& v) {
  const Sums x = sumOf(v);
  const int q = sumOf(v, yuvQ);
  return {sat8((roundMul((x.b << 6) - q, 8061) >> 6) + 128), sat8((roundMul((x.r << 6) - q, 14369) >> 6) + 128)};
}
CC wideDifference(const std::vector<Px>& v, int half, int shift) {
  const Sums x = sumOf(v);
  const int t = sumOf(v, yuvT);
  return {((((x.b << 16) - t + half) >> 16) * 32244 >> shift) + 128 & 255,
          sat8(((((x.r << 16) - t + half) >> 16) * 57475 >> shift) + 128)};
}
CC wide14Difference(const std::vector<Px>& v) {
  const Sums x = sumOf(v);
  const int t = sumOf(v, yuvT14);
  return {((((x.b << 14) - t) >> 14) * 8061 >> 16) + 128 & 255, sat8(((((x.r << 14) - t) >> 14) * 14369 >> 16) + 128)};
}
int splitLuma(Px p) { return ((9798 * p.r + 19235 * p.g) >> 14) + ((3736 * p.b) >> 14); }
CC splitPair(const std::vector<Px>& v) {
  const int m = (splitLuma(v[0]) + splitLuma(v[1])) >> 1;
  return {sat8(floorMul(v[0].b + v[1].b - m, 16121) + 128), sat8(floorMul(v[0].r + v[1].r - m, 28737) + 128)};
}
CC odd15(Px p, bool rounding) {
  const int t = yuvT15(p);
  return {((((p.b << 15) - t + (rounding ? 16383 : 0)) >> 15) * 16121 >> 15) + 128 & 255,
          sat8(((((p.r << 15) - t + (rounding ? 32767 : 0)) >> 15) * 28737 >> 15) + 128)};
}

// ---- members ----

enum class Geo { S420, S422, S411 };
enum class Dst { P3, P3CrFirst, P2, C2YCbCr, C2YCrCb, C2CbYCr };

struct Model {
  Geo geo;
  Dst dst;
  bool bgr;
  std::function<int(int)> bodyEnd;
  // Luma of a pixel by zone; k is its place in its pair.
  std::function<int(Px, int)> bodyLuma, tailLuma;
  std::function<CC(const std::vector<Px>&)> bodyChroma, tailChroma;
  // The last pixel of an odd 4:2:2 width: Y and the chroma it writes.
  std::function<CC(Px)> oddChroma;
  bool oddWritesChroma = true;
  std::function<int(Px)> oddLuma = nullptr;  // when it is not the tail's
  bool oneRow = false;                       // the whole-image rule of the names without steps
};

Sums sumOf(const std::vector<Px>& px) {
  Sums s{0, 0, 0};
  for (const Px& p : px) s = {s.r + p.r, s.g + p.g, s.b + p.b};
  return s;
}

int by16Then4(int w) { return (w & ~15) + ((w & 7) >= 4 ? 4 : 0); }
int byHalf(int w) { return 2 * ((w / 2) & ~7) + (((w / 2) & 4) ? 8 : 0); }
int by32Then8(int w) { return (w & ~31) + ((w & 15) >= 8 ? 8 : 0); }

Model lanes420Model(const Set& s, Dst d, bool bgr, std::function<int(int)> n) {
  return {Geo::S420,
          d,
          bgr,
          n,
          [&s](Px p, int) { return lumaLanes(s, p); },
          [&s](Px p, int) { return lumaWide(s, p); },
          [&s](const std::vector<Px>& v) { return lanes420(s, sumOf(v)); },
          [&s](const std::vector<Px>& v) { return wide420(s, sumOf(v)); },
          nullptr};
}

Model rounded420Model(Dst d) {
  return {Geo::S420,
          d,
          false,
          byHalf,
          [](Px p, int) { return lumaRounded(p); },
          [](Px p, int) { return lumaWide(k601, p); },
          [](const std::vector<Px>& v) { return rounded420(sumOf(v)); },
          [](const std::vector<Px>& v) { return wide420(k601, sumOf(v)); },
          nullptr};
}

Model lanes422Model(Dst d, bool bgr) {
  return {Geo::S422,
          d,
          bgr,
          by32Then8,
          [](Px p, int) { return lumaLanes(k601, p); },
          [](Px p, int) { return lumaWide(k601, p); },
          [](const std::vector<Px>& v) { return lanes422(k601, sumOf(v)); },
          [](const std::vector<Px>& v) { return wide422(k601, sumOf(v)); },
          [](Px p) { return wideSingle(k601, p); },
          d != Dst::P3};
}

Model exactPairModel(Dst d) {
  return {Geo::S422,
          d,
          false,
          [](int w) { return w & ~7; },
          [](Px p, int) { return lumaExactLow(p); },
          [](Px p, int k) { return lumaWide(k601, p, k ? 1048576 : 1081344); },
          [](const std::vector<Px>& v) { return exact422(sumOf(v)); },
          [](const std::vector<Px>& v) { return exact422(sumOf(v)); },
          [](Px p) { return wideSingle(k601, p); }};
}

Model cbycrModel(const Set& s, std::function<int(int)> n) {
  return {Geo::S422,
          Dst::C2CbYCr,
          true,
          n,
          [&s](Px p, int) { return lumaLanes(s, p); },
          [&s](Px p, int) { return lumaWide(s, p); },
          [&s](const std::vector<Px>& v) { return s.narrow ? lanes422(s, sumOf(v)) : signed422(sumOf(v)); },
          [&s](const std::vector<Px>& v) { return wide(s, sumOf(v), 16842752, 16842750, 17); },
          [&s](Px p) { return wideSingle(s, p); }};
}

Model model411(bool lanes) {
  return {Geo::S411,
          Dst::P3,
          true,
          [lanes](int w) { return lanes ? w & ~31 : w & ~15; },
          [lanes](Px p, int) { return lanes ? lumaLanes(k601, p) : lumaRounded411(p); },
          [](Px p, int) { return lumaWide(k601, p); },
          [lanes](const std::vector<Px>& v) { return lanes ? lanes420(k601, sumOf(v)) : rounded411(sumOf(v)); },
          [](const std::vector<Px>& v) { return wide420(k601, sumOf(v)); },
          nullptr};
}

Model yuv420Model(bool bgr, std::function<int(int)> n) {
  return {Geo::S420,
          Dst::P3,
          bgr,
          n,
          [](Px p, int) { return sat8(yuvP(p) >> 1); },
          [](Px p, int) { return yuvT(p) >> 16; },
          difference420,
          [](const std::vector<Px>& v) { return wideDifference(v, 131071, 18); },
          nullptr};
}
Model yuv420RoundedModel() {
  return {Geo::S420,
          Dst::P3,
          false,
          byHalf,
          [](Px p, int) { return sat8(yuvQ(p) >> 6); },
          [](Px p, int) { return yuvT14(p) >> 14; },
          roundedDifference420,
          wide14Difference,
          nullptr};
}
Model yuv422Model(bool interleaved, bool oneRow) {
  Model m{Geo::S422,
          Dst::P3,
          false,
          [](int w) { return w & ~15; },
          [](Px p, int) { return sat8(yuvP(p) >> 1); },
          [](Px p, int) { return yuvT(p) >> 16; },
          difference422,
          [](const std::vector<Px>& v) { return wideDifference(v, 65535, 17); },
          [interleaved](Px p) { return odd15(p, interleaved); }};
  m.oddLuma = [](Px p) { return yuvT15(p) >> 15; };
  m.oneRow = oneRow;
  return m;
}
// The pair stream: rounded luma, and the rounded difference form of the
// full-resolution family (Y and U) for a last odd pixel.
Model yuv422PairsModel() {
  return {Geo::S422,
          Dst::C2YCbCr,
          false,
          [](int w) { return w & ~15; },
          [](Px p, int) { return sat8(yuvP(p) >> 1); },
          [](Px p, int) { return (yuvT(p) + 32768) >> 16; },
          difference422,
          [](const std::vector<Px>& v) { return wideDifference(v, 32768, 17); },
          [](Px p) {
            return CC{((((p.b << 16) - yuvT(p) + 32768) >> 16) * 32244 >> 16) + 128 & 255, 0};
          }};
}

// The second kernel of the interleaved member, for aligned buffers.
Model yuv422AlignedModel() {
  Model m{Geo::S422,
          Dst::P3,
          false,
          [](int w) { return w & ~15; },
          [](Px p, int) { return sat8(yuvQ(p) >> 6); },
          [](Px p, int) { return sat8(splitLuma(p) >> 1); },
          roundedDifference422,
          splitPair,
          [](Px p) { return odd15(p, true); }};
  m.oddLuma = [](Px p) { return yuvT15(p) >> 15; };
  return m;
}

struct Case {
  std::string name;
  Model model;
  std::vector<Model> aligned = {};  // a kernel of its own for aligned buffers
};

const std::vector<Case>& cases() {
  static const std::vector<Case> all = {
      {"zeliBGRToYCbCr420_8u_C3P3R", lanes420Model(k601, Dst::P3, true, by16Then4)},
      {"zeliBGRToYCbCr420_8u_AC4P3R", lanes420Model(k601, Dst::P3, true, by16Then4)},
      {"zeliBGRToYCrCb420_8u_C3P3R", lanes420Model(k601, Dst::P3CrFirst, true, by16Then4)},
      {"zeliBGRToYCrCb420_8u_AC4P3R", lanes420Model(k601, Dst::P3CrFirst, true, by16Then4)},
      {"zeliRGBToYCrCb420_8u_AC4P3R", lanes420Model(k601, Dst::P3CrFirst, false, by16Then4)},
      {"zeliBGRToYCbCr420_709CSC_8u_C3P3R", lanes420Model(kCsc, Dst::P3, true, by16Then4)},
      {"zeliBGRToYCbCr420_709CSC_8u_AC4P3R", lanes420Model(kCsc, Dst::P3, true, by16Then4)},
      {"zeliBGRToYCrCb420_709CSC_8u_C3P3R", lanes420Model(kCsc, Dst::P3CrFirst, true, by16Then4)},
      {"zeliBGRToYCrCb420_709CSC_8u_AC4P3R", lanes420Model(kCsc, Dst::P3CrFirst, true, by16Then4)},
      {"zeliBGRToYCbCr420_709CSC_8u_C3P2R", lanes420Model(kCsc, Dst::P2, true, byHalf)},
      {"zeliBGRToYCbCr420_709HDTV_8u_AC4P3R", lanes420Model(kHdtv, Dst::P3, true, by16Then4)},
      {"zeliRGBToYCbCr420_8u_C3P3R", rounded420Model(Dst::P3)},
      {"zeliRGBToYCbCr420_8u_C3P2R", rounded420Model(Dst::P2)},
      {"zeliRGBToYCbCr420_8u_C4P2R", rounded420Model(Dst::P2)},
      {"zeliBGRToYCbCr411_8u_C3P3R", model411(false)},
      {"zeliBGRToYCbCr411_8u_AC4P3R", model411(true)},
      {"zeliBGRToYCbCr422_8u_C3P3R", lanes422Model(Dst::P3, true)},
      {"zeliBGRToYCbCr422_8u_AC4P3R", lanes422Model(Dst::P3, true)},
      {"zeliRGBToYCbCr422_8u_C3P3R", lanes422Model(Dst::P3, false)},
      {"zeliBGRToYCbCr422_8u_C3C2R", lanes422Model(Dst::C2YCbCr, true)},
      {"zeliBGRToYCbCr422_8u_AC4C2R", lanes422Model(Dst::C2YCbCr, true)},
      {"zeliRGBToYCbCr422_8u_C3C2R", exactPairModel(Dst::C2YCbCr)},
      {"zeliRGBToYCbCr422_8u_P3C2R", exactPairModel(Dst::C2YCbCr)},
      {"zeliRGBToYCrCb422_8u_C3C2R", exactPairModel(Dst::C2YCrCb)},
      {"zeliRGBToYCrCb422_8u_P3C2R", exactPairModel(Dst::C2YCrCb)},
      {"zeliBGRToCbYCr422_8u_AC4C2R", cbycrModel(k601, [](int w) { return w & ~7; })},
      {"zeliBGRToCbYCr422_709HDTV_8u_AC4C2R", cbycrModel(kHdtv, [](int w) { return w & ~7; })},
      {"zeliBGRToCbYCr422_709HDTV_8u_C3C2R", cbycrModel(kHdtv, by32Then8)},
      {"zeliBGRToYUV420_8u_AC4P3R", yuv420Model(true, [](int w) { return w & ~15; })},
      {"zeliRGBToYUV420_8u_P3R", yuv420Model(false, [](int) { return 0; })},
      {"zeliRGBToYUV420_8u_P3", yuv420Model(false, [](int) { return 0; })},
      {"zeliRGBToYUV420_8u_C3P3R", yuv420RoundedModel()},
      {"zeliRGBToYUV420_8u_C3P3", yuv420RoundedModel()},
      {"zeliRGBToYUV422_8u_C3P3R", yuv422Model(true, false), {yuv422AlignedModel()}},
      {"zeliRGBToYUV422_8u_C3P3", yuv422Model(true, true), {yuv422AlignedModel()}},
      {"zeliRGBToYUV422_8u_P3R", yuv422Model(false, false)},
      {"zeliRGBToYUV422_8u_P3", yuv422Model(false, true)},
      {"zeliRGBToYUV422_8u_C3C2R", yuv422PairsModel()},
  };
  return all;
}

// ---- running the model over a workspace ----

Px pixelAt(Workspace& w, const Descriptor& d, bool bgr, int x, int y) {
  int c[3];
  if (d.src.layout == Layout::P3) {
    for (int k = 0; k < 3; ++k) {
      const Workspace::Buffer* b = w.bufferOf(0, k);
      c[k] = b->first[size_t(y) * b->step + x];
    }
  } else {
    const Workspace::Buffer* b = w.bufferOf(0, 0);
    const int stride = d.src.layout == Layout::C3 ? 3 : 4;
    for (int k = 0; k < 3; ++k) c[k] = b->first[size_t(y) * b->step + size_t(x) * stride + k];
  }
  return bgr ? Px{c[2], c[1], c[0]} : Px{c[0], c[1], c[2]};
}

// The destination bytes the model expects, as whole buffers (guards
// included), starting from the buffers before the call.
std::vector<std::vector<uint8_t>> expected(Workspace& w, const Model& m) {
  const Descriptor& d = w.descriptor();
  std::vector<std::vector<uint8_t>> out = w.snapshot();
  auto bufferIndex = [&](int plane) {
    for (size_t i = 0; i < w.buffers().size(); ++i)
      if (w.buffers()[i].side == 1 && w.buffers()[i].plane == plane) return int(i);
    return -1;
  };
  auto put = [&](int plane, int x, int y, int v) {
    const int i = bufferIndex(plane);
    const Workspace::Buffer& b = w.buffers()[i];
    out[i][size_t(b.first - b.bytes.data()) + size_t(y) * b.step + x] = uint8_t(v);
  };
  const int width = w.size().width, height = w.size().height;
  const int n = m.bodyEnd(width);
  const bool crFirst = m.dst == Dst::P3CrFirst;
  auto putChroma = [&](int i, int row, CC c) {
    switch (m.dst) {
      case Dst::P3:
      case Dst::P3CrFirst:
        put(crFirst ? 2 : 1, i, row, c.c1);
        put(crFirst ? 1 : 2, i, row, c.c2);
        break;
      case Dst::P2:
        put(1, 2 * i, row, c.c1);
        put(1, 2 * i + 1, row, c.c2);
        break;
      default:
        break;
    }
  };
  if (m.geo == Geo::S420) {
    for (int y = 0; y + 1 < height; y += 2)
      for (int x = 0; x + 1 < width; x += 2) {
        const bool body = x < n;
        std::vector<Px> px;
        for (int dy = 0; dy < 2; ++dy)
          for (int dx = 0; dx < 2; ++dx) {
            const Px p = pixelAt(w, d, m.bgr, x + dx, y + dy);
            px.push_back(p);
            put(0, x + dx, y + dy, body ? m.bodyLuma(p, dx) : m.tailLuma(p, dx));
          }
        putChroma(x / 2, y / 2, body ? m.bodyChroma(px) : m.tailChroma(px));
      }
    return out;
  }
  // A row of `count` pixels, pixel i at (x, y) = at(i); chroma sample j of
  // the row at chromaAt(j). Body up to the member's N of `count`.
  const int ratio = m.geo == Geo::S411 ? 4 : 2;
  struct At {
    int x, y;
  };
  auto row = [&](int count, const std::function<At(int)>& at, const std::function<At(int)>& chromaAt) {
    const int rowN = m.bodyEnd(count);
    auto pixel = [&](int i) { return pixelAt(w, d, m.bgr, at(i).x, at(i).y); };
    auto putByte = [&](int i, int slot, int v) { put(0, 2 * at(i).x + slot, at(i).y, v); };
    for (int x = 0; x + ratio <= count; x += ratio) {
      const bool body = x < rowN;
      std::vector<Px> px;
      int ys[4];
      for (int k = 0; k < ratio; ++k) {
        px.push_back(pixel(x + k));
        ys[k] = body ? m.bodyLuma(px[k], k & 1) : m.tailLuma(px[k], k & 1);
      }
      const CC c = body ? m.bodyChroma(px) : m.tailChroma(px);
      if (m.dst == Dst::P3) {
        for (int k = 0; k < ratio; ++k) put(0, at(x + k).x, at(x + k).y, ys[k]);
        putChroma(chromaAt(x / ratio).x, chromaAt(x / ratio).y, c);
      } else {
        // Pair streams: byte positions of Y0, Cb, Y1, Cr.
        const int slots[3][4] = {{0, 1, 2, 3}, {0, 3, 2, 1}, {1, 0, 3, 2}};
        const int* sl = slots[m.dst == Dst::C2YCbCr ? 0 : m.dst == Dst::C2YCrCb ? 1 : 2];
        putByte(x, sl[0], ys[0]);
        putByte(x, sl[1], c.c1);
        putByte(x, sl[2], ys[1]);
        putByte(x, sl[3], c.c2);
      }
    }
    if (m.geo == Geo::S422 && (count & 1)) {
      const int i = count - 1;
      const Px p = pixel(i);
      const int yv = m.oddLuma ? m.oddLuma(p) : m.tailLuma(p, 0);
      const CC c = m.oddChroma(p);
      if (m.dst == Dst::P3) {
        put(0, at(i).x, at(i).y, yv);
        if (m.oddWritesChroma) putChroma(chromaAt(i / 2).x, chromaAt(i / 2).y, c);
      } else if (m.dst == Dst::C2CbYCr) {
        putByte(i, 0, c.c1);
        putByte(i, 1, yv);
      } else {
        putByte(i, 0, yv);
        putByte(i, 1, m.dst == Dst::C2YCbCr ? c.c1 : c.c2);
      }
    }
  };
  const int64_t total = int64_t(width) * height;
  if (m.oneRow && !(width & 1) && total >= 256) {
    // The whole image as one row, cut after total AND NOT 7 pixels.
    const int first = int(total) & ~7, half = width / 2;
    for (int start : {0, first}) {
      const int count = start == 0 ? first : int(total) - first;
      row(
          count,
          [&](int i) {
            return At{(start + i) % width, (start + i) / width};
          },
          [&](int j) {
            return At{(start / 2 + j) % half, (start / 2 + j) / half};
          });
    }
    return out;
  }
  for (int y = 0; y < height; ++y)
    row(
        width,
        [y](int i) {
          return At{i, y};
        },
        [y](int j) {
          return At{j, y};
        });
  return out;
}

Status expectedStatus(const Descriptor& d, ImageSize s) {
  if (s.width < d.minWidth || s.height < d.minHeight) return StatusSizeError;
  if (!d.warnsOdd) return StatusOk;
  const std::string& n = d.name;
  const bool odd = n.find("411") != std::string::npos   ? (s.width & 3) != 0
                   : n.find("420") != std::string::npos ? ((s.width | s.height) & 1) != 0
                                                        : (s.width & 1) != 0;
  return odd ? StatusOddSizeWarning : StatusOk;
}

// The sizes every member runs: each width 1..40 and a few longer rows, at
// one to five rows.
std::vector<ImageSize> sizes() {
  std::vector<ImageSize> out;
  for (int w = 1; w <= 40; ++w) out.push_back({w, 1 + w % 5});
  for (int w : {47, 48, 52, 56, 63, 64, 65, 71, 72, 76, 88, 100}) out.push_back({w, 2 + w % 3});
  return out;
}

// Every buffer and step a multiple of 16.
bool buffersAligned(Workspace& w) {
  for (const Workspace::Buffer& b : w.buffers())
    if ((reinterpret_cast<uintptr_t>(b.first) & 15) || (b.step & 15)) return false;
  return true;
}

void runOne(const Case& c, const Descriptor& d, ImageSize size, int pad, int offset, uint32_t seed) {
  Workspace w(d, size, pad, offset);
  w.fillRandom(seed);
  w.fillDestinations(0x5A);
  const bool oneRow = c.model.oneRow && !(size.width & 1) && int64_t(size.width) * size.height >= 256;
  const Model& m = !c.aligned.empty() && !oneRow && buffersAligned(w) ? c.aligned[0] : c.model;
  const auto want = expected(w, m);
  const Status s = w.call();
  ASSERT_EQ(int(s), int(expectedStatus(d, size))) << c.name << " " << size.width << "x" << size.height;
  if (s == StatusSizeError) return;
  const auto got = w.snapshot();
  for (size_t i = 0; i < got.size(); ++i)
    ASSERT_TRUE(got[i] == want[i]) << c.name << " " << size.width << "x" << size.height << " pad " << pad << " offset "
                                   << offset << " buffer " << i << (&m == &c.model ? "" : " (aligned kernel)");
}

void runModel(const Case& c) {
  const Descriptor* d = findDescriptor(c.name);
  ASSERT_NE(d, nullptr) << c.name;
  uint32_t seed = 1;
  for (ImageSize size : sizes()) {
    runOne(c, *d, size, size.width % 3 == 0 ? 0 : 7, size.width % 4, ++seed);
    if (::testing::Test::HasFatalFailure()) return;
  }
  // Steps and rows that are all multiples of 16, then the same rows moved off
  // the boundary; and images of at least 256 pixels.
  for (ImageSize size : {ImageSize{32, 1}, ImageSize{64, 3}, ImageSize{96, 2}, ImageSize{16, 16}, ImageSize{15, 17},
                         ImageSize{34, 8}, ImageSize{35, 8}, ImageSize{130, 2}})
    for (int offset : {0, 3}) {
      runOne(c, *d, size, 16, offset, ++seed);
      if (::testing::Test::HasFatalFailure()) return;
    }
}

TEST(SubsampledMembers, EveryMemberFollowsItsFormsAndZones) {
  for (const Case& c : cases()) runModel(c);
}

}  // namespace

namespace {

// The aligned kernel past its blocks of 16: whole pairs in the split-luma
// form, a last odd pixel in the 15-bit form. Buffers and steps multiples
// of 16 with a width that is not.
TEST(SubsampledMembers, TheAlignedYuvKernelEndsInSplitPairs) {
  const Model m = yuv422AlignedModel();
  for (int width : {20, 21, 30, 31, 47}) {
    const int h = 3, srcStep = 160, yStep = 64, cStep = 32;
    alignas(64) static uint8_t src[160 * 3], planes[3][64 * 3];
    for (int i = 0; i < 160 * 3; ++i) src[i] = uint8_t(i * 73 + width);
    std::memset(planes, 0xEE, sizeof(planes));
    uint8_t* dst[3] = {planes[0], planes[1], planes[2]};
    const int steps[3] = {yStep, cStep, cStep};
    ASSERT_EQ(zeliRGBToYUV422_8u_C3P3R(src, srcStep, dst, steps, {width, h}), StatusOk);
    for (int y = 0; y < h; ++y) {
      auto px = [&](int x) {
        const uint8_t* p = src + y * srcStep + 3 * x;
        return Px{p[0], p[1], p[2]};
      };
      for (int x = 0; x + 1 < width; x += 2) {
        const bool body = x < (width & ~15);
        const std::vector<Px> pair = {px(x), px(x + 1)};
        const CC c = body ? m.bodyChroma(pair) : m.tailChroma(pair);
        for (int k = 0; k < 2; ++k)
          EXPECT_EQ(planes[0][y * yStep + x + k], body ? m.bodyLuma(pair[k], k) : m.tailLuma(pair[k], k)) << x;
        EXPECT_EQ(planes[1][y * cStep + x / 2], c.c1) << width << " " << x;
        EXPECT_EQ(planes[2][y * cStep + x / 2], c.c2) << width << " " << x;
      }
      if (width & 1) {
        const Px p = px(width - 1);
        EXPECT_EQ(planes[0][y * yStep + width - 1], m.oddLuma(p));
        EXPECT_EQ(planes[1][y * cStep + width / 2], m.oddChroma(p).c1);
        EXPECT_EQ(planes[2][y * cStep + width / 2], m.oddChroma(p).c2);
      }
      EXPECT_EQ(planes[0][y * yStep + width], 0xEE);
      EXPECT_EQ(planes[1][y * cStep + (width + 1) / 2], 0xEE);
    }
  }
}

}  // namespace
