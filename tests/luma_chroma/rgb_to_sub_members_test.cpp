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
  int lr, lg, lb, k;                   // luma lanes
  int cbR, cbG, cbB, crR, crG, crB;    // chroma lanes, positive
  int wr, wg, wb;                      // luma 16.16
  int wcbR, wcbG, wcbB, wcrR, wcrG, wcrB;
  bool narrow;
};
const Set k601{8422, 16515, 3212, 2112, 9699, 19071, 28770, 28770, 24117, 4653,
               16843, 33030, 6423, -9699, -19071, 28770, 28770, -24117, -4653, false};
const Set kCsc{5997, 20120, 2032, 2112, 6619, 22151, 28770, 28770, 26149, 2621,
               11993, 40239, 4063, -6619, -22151, 28770, 28770, -26149, -2621, false};
const Set kHdtv{6980, 23429, 2359, 64, 3834, 12911, 16744, 16744, 15204, 1540,
                13959, 46858, 4719, -7668, -25821, 33489, 33489, -30409, -3080, true};

int clamp(int v, int lo, int hi) { return std::min(std::max(v, lo), hi); }
int sat(const Set& s, int v) { return s.narrow ? clamp(v, 1, 254) : clamp(v, 0, 255); }
int wideByte(const Set& s, int v) { return s.narrow ? clamp(v, 1, 254) : (v & 255); }
int sat8(int v) { return clamp(v, 0, 255); }

// ---- the forms ----

int lumaLanes(const Set& s, Px p) {
  return sat(s, (((p.r * s.lr) >> 8) + ((p.g * s.lg) >> 8) + ((p.b * s.lb) >> 8) + s.k) >> 7);
}
int lumaWide(const Set& s, Px p, int addend) { return wideByte(s, (s.wr * p.r + s.wg * p.g + s.wb * p.b + addend) >> 16); }
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
  return {Geo::S420, d, false, byHalf, [](Px p, int) { return lumaRounded(p); },
          [](Px p, int) { return lumaWide(k601, p); },
          [](const std::vector<Px>& v) { return rounded420(sumOf(v)); },
          [](const std::vector<Px>& v) { return wide420(k601, sumOf(v)); }, nullptr};
}

Model lanes422Model(Dst d, bool bgr) {
  return {Geo::S422, d, bgr, by32Then8, [](Px p, int) { return lumaLanes(k601, p); },
          [](Px p, int) { return lumaWide(k601, p); },
          [](const std::vector<Px>& v) { return lanes422(k601, sumOf(v)); },
          [](const std::vector<Px>& v) { return wide422(k601, sumOf(v)); },
          [](Px p) { return wideSingle(k601, p); }, d != Dst::P3};
}

Model exactPairModel(Dst d) {
  return {Geo::S422, d, false, [](int w) { return w & ~7; }, [](Px p, int) { return lumaExactLow(p); },
          [](Px p, int k) { return lumaWide(k601, p, k ? 1048576 : 1081344); },
          [](const std::vector<Px>& v) { return exact422(sumOf(v)); },
          [](const std::vector<Px>& v) { return exact422(sumOf(v)); }, [](Px p) { return wideSingle(k601, p); }};
}

Model cbycrModel(const Set& s, std::function<int(int)> n) {
  return {Geo::S422, Dst::C2CbYCr, true, n, [&s](Px p, int) { return lumaLanes(s, p); },
          [&s](Px p, int) { return lumaWide(s, p); },
          [&s](const std::vector<Px>& v) { return s.narrow ? lanes422(s, sumOf(v)) : signed422(sumOf(v)); },
          [&s](const std::vector<Px>& v) { return wide(s, sumOf(v), 16842752, 16842750, 17); },
          [&s](Px p) { return wideSingle(s, p); }};
}

Model model411(bool lanes) {
  return {Geo::S411, Dst::P3, true, [lanes](int w) { return lanes ? w & ~31 : w & ~15; },
          [lanes](Px p, int) { return lanes ? lumaLanes(k601, p) : lumaRounded411(p); },
          [](Px p, int) { return lumaWide(k601, p); },
          [lanes](const std::vector<Px>& v) { return lanes ? lanes420(k601, sumOf(v)) : rounded411(sumOf(v)); },
          [](const std::vector<Px>& v) { return wide420(k601, sumOf(v)); }, nullptr};
}

struct Case {
  std::string name;
  Model model;
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
      default: break;
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
  const int ratio = m.geo == Geo::S411 ? 4 : 2;
  for (int y = 0; y < height; ++y) {
    for (int x = 0; x + ratio <= width; x += ratio) {
      const bool body = x < n;
      std::vector<Px> px;
      int ys[4];
      for (int k = 0; k < ratio; ++k) {
        px.push_back(pixelAt(w, d, m.bgr, x + k, y));
        ys[k] = body ? m.bodyLuma(px[k], k & 1) : m.tailLuma(px[k], k & 1);
      }
      const CC c = body ? m.bodyChroma(px) : m.tailChroma(px);
      if (m.dst == Dst::P3) {
        for (int k = 0; k < ratio; ++k) put(0, x + k, y, ys[k]);
        putChroma(x / ratio, y, c);
      } else {
        // Pair streams: byte positions of Y0, Cb, Y1, Cr.
        const int slots[3][4] = {{0, 1, 2, 3}, {0, 3, 2, 1}, {1, 0, 3, 2}};
        const int* s = slots[m.dst == Dst::C2YCbCr ? 0 : m.dst == Dst::C2YCrCb ? 1 : 2];
        put(0, 2 * x + s[0], y, ys[0]);
        put(0, 2 * x + s[1], y, c.c1);
        put(0, 2 * x + s[2], y, ys[1]);
        put(0, 2 * x + s[3], y, c.c2);
      }
    }
    if (m.geo == Geo::S422 && (width & 1)) {
      const int x = width - 1;
      const Px p = pixelAt(w, d, m.bgr, x, y);
      const int yv = m.tailLuma(p, 0);
      const CC c = m.oddChroma(p);
      if (m.dst == Dst::P3) {
        put(0, x, y, yv);
        if (m.oddWritesChroma) putChroma(x / 2, y, c);
      } else if (m.dst == Dst::C2CbYCr) {
        put(0, 2 * x, y, c.c1);
        put(0, 2 * x + 1, y, yv);
      } else {
        put(0, 2 * x, y, yv);
        put(0, 2 * x + 1, y, m.dst == Dst::C2YCbCr ? c.c1 : c.c2);
      }
    }
  }
  return out;
}

Status expectedStatus(const Descriptor& d, ImageSize s) {
  if (s.width < d.minWidth || s.height < d.minHeight) return StatusSizeError;
  if (!d.warnsOdd) return StatusOk;
  const std::string& n = d.name;
  const bool odd = n.find("411") != std::string::npos ? (s.width & 3) != 0
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

void runModel(const std::string& name, const Model& m) {
  const Descriptor* d = findDescriptor(name);
  ASSERT_NE(d, nullptr) << name;
  int seed = 1;
  for (ImageSize size : sizes()) {
    const int pad = size.width % 3 == 0 ? 0 : 7, offset = size.width % 4;
    Workspace w(*d, size, pad, offset);
    w.fillRandom(uint32_t(++seed));
    w.fillDestinations(0x5A);
    const auto want = expected(w, m);
    const Status s = w.call();
    ASSERT_EQ(int(s), int(expectedStatus(*d, size))) << name << " " << size.width << "x" << size.height;
    if (s == StatusSizeError) continue;
    const auto got = w.snapshot();
    for (size_t i = 0; i < got.size(); ++i)
      ASSERT_TRUE(got[i] == want[i]) << name << " " << size.width << "x" << size.height << " buffer " << i;
  }
}

TEST(SubsampledYCbCr, EveryMemberFollowsItsFormsAndZones) {
  for (const Case& c : cases()) runModel(c.name, c.model);
}

}  // namespace
