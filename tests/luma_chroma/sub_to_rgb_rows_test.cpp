// The expanding row kernel over every source view and destination writer:
// widths 1 to 70, rows at odd addresses, SSE4.1 alone and with AVX2, against
// the scalar forms applied to samples read straight from the bytes.
#include <gtest/gtest.h>

#include <cstring>
#include <random>
#include <string>
#include <vector>

#include "luma_chroma/sub_to_rgb_rows.h"

namespace {

using namespace zel::lc;
using namespace zel::lc::expand;
using zel::repack::PairOrder;

constexpr uint8_t kGuard = 0xB9;

// A byte buffer whose data starts `offset` bytes past a 64-byte boundary,
// with guard bytes on both sides.
struct Buffer {
  std::vector<uint8_t> bytes;
  uint8_t* data;
  int size;
  Buffer(int n, int offset) : bytes(size_t(n) + 192, kGuard), size(n) {
    uint8_t* base = bytes.data() + 64;
    base += (64 - (reinterpret_cast<uintptr_t>(base) & 63u)) & 63u;
    data = base + offset;
  }
  Buffer(const Buffer& o) : bytes(o.bytes), data(bytes.data() + (o.data - o.bytes.data())), size(o.size) {}
  Buffer& operator=(const Buffer& o) {
    bytes = o.bytes;
    data = bytes.data() + (o.data - o.bytes.data());
    size = o.size;
    return *this;
  }
  void randomise(std::mt19937& rng) {
    for (int i = 0; i < size; ++i) data[i] = uint8_t(rng() >> 24);
  }
  bool guardsKept() const {
    for (const uint8_t* p = bytes.data(); p < data; ++p)
      if (*p != kGuard) return false;
    for (const uint8_t* p = data + size; p < bytes.data() + bytes.size(); ++p)
      if (*p != kGuard) return false;
    return true;
  }
};

// Samples of a source in one layout, row r of a kernel call (r = 1 is the
// second luma row of a 4:2:0 pair).
enum class Source { Planes422, Planes411, Planes420, Pairs420, PairsCr420, StreamYCbCr, StreamYCrCb, StreamCbYCr };

struct Samples {
  Source kind;
  std::vector<Buffer> in;
  Samples(Source k, int width, int offset, std::mt19937& rng) : kind(k) {
    const int half = (width + 1) / 2, quarter = (width + 3) / 4;
    switch (k) {
      case Source::Planes422: in = {{width, offset}, {half, offset + 3}, {half, offset + 5}}; break;
      case Source::Planes411: in = {{width, offset}, {quarter, offset + 3}, {quarter, offset + 5}}; break;
      case Source::Planes420: in = {{width, offset}, {width, offset + 1}, {half, offset + 3}, {half, offset + 7}}; break;
      case Source::Pairs420:
      case Source::PairsCr420: in = {{width, offset}, {width, offset + 1}, {2 * half, offset + 3}}; break;
      default: in = {{4 * half, offset}}; break;
    }
    for (Buffer& b : in) b.randomise(rng);
  }
  int rows() const { return kind == Source::Planes420 || kind == Source::Pairs420 || kind == Source::PairsCr420 ? 2 : 1; }
  bool stream() const { return kind >= Source::StreamYCbCr; }
  PairOrder order() const {
    return kind == Source::StreamYCrCb ? PairOrder::YCrCb : kind == Source::StreamCbYCr ? PairOrder::CbYCr
                                                                                      : PairOrder::YCbCr;
  }
  // Y, U, V of pixel x in row r.
  void at(int x, int r, int& y, int& u, int& v) const {
    if (stream()) {
      const zel::repack::PairSlots s = zel::repack::slotsOf(order());
      const uint8_t* p = in[0].data + 4 * (x / 2);
      y = p[x % 2 ? s.y1 : s.y0];
      u = p[s.cb];
      v = p[s.cr];
      return;
    }
    y = in[r].data[x];
    const int c = rows();
    switch (kind) {
      case Source::Planes411: u = in[1].data[x / 4], v = in[2].data[x / 4]; break;
      case Source::Pairs420: u = in[2].data[2 * (x / 2)], v = in[2].data[2 * (x / 2) + 1]; break;
      case Source::PairsCr420: v = in[2].data[2 * (x / 2)], u = in[2].data[2 * (x / 2) + 1]; break;
      default: u = in[c].data[x / 2], v = in[c + 1].data[x / 2]; break;
    }
  }
};

enum class Dest { Bgr, Rgba, Planes };

struct Written {
  Dest kind;
  std::vector<Buffer> out;  // per row: one buffer, or three planes
  Written(Dest k, int width, int rows, int offset) : kind(k) {
    for (int r = 0; r < rows; ++r) {
      if (k == Dest::Planes)
        for (int p = 0; p < 3; ++p) out.emplace_back(width, offset + 2 * p + r);
      else
        out.emplace_back(width * (k == Dest::Bgr ? 3 : 4), offset + r);
    }
  }
  std::vector<int> pixel(int x, int r) const {
    switch (kind) {
      case Dest::Bgr: return {out[r].data[3 * x + 2], out[r].data[3 * x + 1], out[r].data[3 * x]};
      case Dest::Rgba:
        return {out[r].data[4 * x], out[r].data[4 * x + 1], out[r].data[4 * x + 2], out[r].data[4 * x + 3]};
      case Dest::Planes: return {out[3 * r].data[x], out[3 * r + 1].data[x], out[3 * r + 2].data[x]};
    }
    return {};
  }
};

constexpr uint8_t kAlpha = 0x5E;

template <class Luma, class Chroma, class Out, int Rows, class Body, class Tail>
void run(const RowSet<Rows, Luma, Chroma, Out>& rows, int bodyEnd, int end, const Body& body, const Tail& tail,
         bool avx2) {
  expandRow(rows, bodyEnd, end, body, tail, avx2);
}

template <int Rows, class Luma, class Chroma, class Body, class Tail>
void runWith(const Written& w, const Luma (&luma)[Rows], const Chroma& chroma, int bodyEnd, int end,
             const Body& body, const Tail& tail, bool avx2) {
  auto out = [&](auto make) {
    using Out = decltype(make(0));
    RowSet<Rows, Luma, Chroma, Out> set{{}, chroma, {}};
    for (int r = 0; r < Rows; ++r) {
      set.luma[r] = luma[r];
      set.out[r] = make(r);
    }
    run(set, bodyEnd, end, body, tail, avx2);
  };
  switch (w.kind) {
    case Dest::Bgr: out([&](int r) { return PackedOut3<true>{w.out[r].data}; }); break;
    case Dest::Rgba: out([&](int r) { return PackedOutAlpha<false>{w.out[r].data, kAlpha}; }); break;
    case Dest::Planes:
      out([&](int r) { return PlanesOut{w.out[3 * r].data, w.out[3 * r + 1].data, w.out[3 * r + 2].data}; });
      break;
  }
}

template <class Body, class Tail>
void convert(const Samples& s, const Written& w, int bodyEnd, int end, const Body& body, const Tail& tail,
             bool avx2) {
  const auto& in = s.in;
  switch (s.kind) {
    case Source::Planes422: {
      const LumaRow luma[1] = {{in[0].data}};
      runWith(w, luma, ChromaPlanes<2>{in[1].data, in[2].data}, bodyEnd, end, body, tail, avx2);
      break;
    }
    case Source::Planes411: {
      const LumaRow luma[1] = {{in[0].data}};
      runWith(w, luma, ChromaPlanes<4>{in[1].data, in[2].data}, bodyEnd, end, body, tail, avx2);
      break;
    }
    case Source::Planes420: {
      const LumaRow luma[2] = {{in[0].data}, {in[1].data}};
      runWith(w, luma, ChromaPlanes<2>{in[2].data, in[3].data}, bodyEnd, end, body, tail, avx2);
      break;
    }
    case Source::Pairs420: {
      const LumaRow luma[2] = {{in[0].data}, {in[1].data}};
      runWith(w, luma, ChromaPairs<false>{in[2].data}, bodyEnd, end, body, tail, avx2);
      break;
    }
    case Source::PairsCr420: {
      const LumaRow luma[2] = {{in[0].data}, {in[1].data}};
      runWith(w, luma, ChromaPairs<true>{in[2].data}, bodyEnd, end, body, tail, avx2);
      break;
    }
    case Source::StreamYCbCr: {
      const PairStream<PairOrder::YCbCr> luma[1] = {{in[0].data}};
      runWith(w, luma, luma[0], bodyEnd, end, body, tail, avx2);
      break;
    }
    case Source::StreamYCrCb: {
      const PairStream<PairOrder::YCrCb> luma[1] = {{in[0].data}};
      runWith(w, luma, luma[0], bodyEnd, end, body, tail, avx2);
      break;
    }
    case Source::StreamCbYCr: {
      const PairStream<PairOrder::CbYCr> luma[1] = {{in[0].data}};
      runWith(w, luma, luma[0], bodyEnd, end, body, tail, avx2);
      break;
    }
  }
}

struct Combination {
  Source source;
  Dest dest;
};

// Body in pixels [0, bodyEnd) with the lane form, the raw wide form after
// it; every pixel of the row must show the form of its zone.
template <class Body>
void expectRows(const Combination& c, const Body& body, bool avx2) {
  std::mt19937 rng(uint32_t(int(c.source) * 31 + int(c.dest)));
  const RawTail tail;
  for (int width = 1; width <= 70; ++width) {
    const int offset = 1 + 2 * (width % 7);
    Samples s(c.source, width, offset, rng);
    const int end = s.rows() == 2 ? width & ~1 : width;
    const int bodyEnd = width % 3 == 0 ? end : end & ~7;
    Written w(c.dest, width, s.rows(), offset + 4);
    for (Buffer& b : w.out) std::memset(b.data, 0xEE, size_t(b.size));
    convert(s, w, bodyEnd, end, body, tail, avx2);
    for (int r = 0; r < s.rows(); ++r)
      for (int x = 0; x < width; ++x) {
        int y, u, v;
        s.at(x, r, y, u, v);
        std::vector<int> want(c.dest == Dest::Rgba ? 4 : 3, 0xEE);
        if (x < end) {
          const Rgb8 p = x < bodyEnd ? body.pixel(y, u, v) : tail.pixel(y, u, v);
          want = {p.r, p.g, p.b};
          if (c.dest == Dest::Rgba) want.push_back(kAlpha);
        }
        ASSERT_EQ(w.pixel(x, r), want) << "source " << int(c.source) << " destination " << int(c.dest) << " width "
                                       << width << " pixel " << x << " row " << r << (avx2 ? " (AVX2)" : " (SSE4.1)");
      }
    for (const Buffer& b : w.out) ASSERT_TRUE(b.guardsKept()) << "width " << width;
    for (const Buffer& b : s.in) ASSERT_TRUE(b.guardsKept());
  }
}

const Combination kCombinations[] = {
    {Source::Planes422, Dest::Bgr},    {Source::Planes411, Dest::Rgba},    {Source::Planes420, Dest::Planes},
    {Source::Pairs420, Dest::Rgba},    {Source::PairsCr420, Dest::Bgr},    {Source::StreamYCbCr, Dest::Planes},
    {Source::StreamYCrCb, Dest::Rgba}, {Source::StreamCbYCr, Dest::Bgr}, {Source::Planes422, Dest::Planes},
};

std::vector<bool> vectorWidths() {
  std::vector<bool> w{false};
  if (zel::hasAvx2()) w.push_back(true);
  return w;
}

TEST(SubsampledRows, EverySourceAndDestinationOnBothVectorWidths) {
  for (bool avx2 : vectorWidths())
    for (const Combination& c : kCombinations) {
      expectRows(c, LanesForm{lanes601b}, avx2);
      expectRows(c, YuvWideForm{rgbWideA, {0, 32768, 0}}, avx2);
    }
}

}  // namespace
