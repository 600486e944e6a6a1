#include "buffers.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cmath>
#include <cstring>
#include <limits>
#include <map>
#include <regex>
#include <sstream>

#include "test_card.h"

namespace zel::tool {

using meta::Chroma;
using meta::Descriptor;
using meta::Layout;
using meta::Sample;
using meta::Side;
using meta::Workspace;

std::vector<std::string> componentNames(const std::string& format, const std::string& other) {
  static const std::map<std::string, std::vector<std::string>> kNames = {
      {"RGB", {"R", "G", "B"}},     {"BGR", {"B", "G", "R"}},    {"SBGR", {"B", "G", "R"}},
      {"YCbCr", {"Y", "Cb", "Cr"}}, {"YCrCb", {"Y", "Cr", "Cb"}}, {"CbYCr", {"Y", "Cb", "Cr"}},
      {"YUV", {"Y", "U", "V"}},     {"YCC", {"Y", "C1", "C2"}},  {"YCoCg", {"Y", "Co", "Cg"}},
      {"HLS", {"H", "L", "S"}},     {"HSV", {"H", "S", "V"}},    {"XYZ", {"X", "Y", "Z"}},
      {"LUV", {"L", "U", "V"}},     {"Lab", {"L", "a", "b"}}};
  for (const std::string* f : {&format, &other}) {
    std::string base;
    for (char c : *f)
      if (!std::isdigit(static_cast<unsigned char>(c))) base += c;
    auto it = kNames.find(base);
    if (it != kNames.end()) return it->second;
  }
  return {"R", "G", "B"};
}

bool blueFirst(const std::string& format) { return format.rfind("BGR", 0) == 0 || format.rfind("SBGR", 0) == 0; }

namespace {

// How a source format takes a colour.
enum class Encoding { Rgb, Bgr, Video, VideoCrCb, Yuv };

Encoding encodingOf(const std::string& format) {
  std::string base;
  for (char c : format)
    if (!std::isdigit(static_cast<unsigned char>(c))) base += c;
  if (base == "YCbCr" || base == "CbYCr") return Encoding::Video;
  if (base == "YCrCb") return Encoding::VideoCrCb;
  if (base == "YUV") return Encoding::Yuv;
  return blueFirst(format) ? Encoding::Bgr : Encoding::Rgb;
}

std::array<uint16_t, 3> encode(Encoding e, uint16_t r, uint16_t g, uint16_t b) {
  if (e == Encoding::Rgb) return {r, g, b};
  if (e == Encoding::Bgr) return {b, g, r};
  const double R = r / 65535.0, G = g / 65535.0, B = b / 65535.0;
  const double luma = 0.299 * R + 0.587 * G + 0.114 * B;
  double y, u, v;
  if (e == Encoding::Yuv) {
    y = luma;
    u = 0.5 + 0.492 * (B - luma);
    v = 0.5 + 0.877 * (R - luma);
  } else {  // luma 16..235, chroma 16..240 around 128, of 255
    y = (16.0 + 219.0 * luma) / 255.0;
    u = (128.0 + 112.0 * (B - luma) / 0.886) / 255.0;
    v = (128.0 + 112.0 * (R - luma) / 0.701) / 255.0;
  }
  auto wide = [](double x) { return uint16_t(std::lround(std::clamp(x, 0.0, 1.0) * 65535.0)); };
  if (e == Encoding::VideoCrCb) return {wide(y), wide(v), wide(u)};
  return {wide(y), wide(u), wide(v)};
}

}  // namespace

std::array<int32_t, 3> ycocgPlanes(const YCoCgForm& form, uint16_t r, uint16_t g, uint16_t b) {
  int32_t R, G, B;
  if (form.byteColour) {
    auto to8 = [](uint16_t w) { return int32_t((uint32_t(w) * 255 + 32767) / 65535); };
    R = to8(r), G = to8(g), B = to8(b);
  } else {
    // Signed 16-bit colour, kept off -32768 so that no plain chroma leaves 16 bits.
    auto to16 = [](uint16_t w) { return std::max(int32_t(w) - 32768, -32767); };
    R = to16(r), G = to16(g), B = to16(b);
  }
  int32_t y, co, cg;
  if (form.lifting) {
    co = R - B;
    const int32_t t = B + (co >> 1);
    cg = G - t;
    y = t + (cg >> 1);
  } else {
    y = (R + 2 * G + B + 2) >> 2;
    co = (R - B + 1) >> 1;
    cg = (2 * G - R - B + 2) >> 2;
  }
  if (form.bytePlanes) {
    co = std::min(co + 128, 255);
    cg = std::clamp(cg + 128, 0, 255);
  }
  return {y, co, cg};
}

std::array<uint16_t, 3> sourceChannels(const std::string& format, uint16_t r, uint16_t g, uint16_t b) {
  return encode(encodingOf(format), r, g, b);
}

namespace {

const meta::Extra* gridExtra(const Descriptor& d, int* index) {
  for (size_t i = 0; i < d.extras.size(); ++i)
    if (d.extras[i].name == "grid" && d.extras[i].kind != meta::ArgKind::Pointer) {
      if (index) *index = int(i);
      return &d.extras[i];
    }
  return nullptr;
}

}  // namespace

bool readsMosaic(const Descriptor& d) {
  return d.src.format == "CFA" || d.operation.rfind("Demosaic", 0) == 0 || gridExtra(d, nullptr) != nullptr;
}

int mosaicGrid(const Descriptor& d, const std::vector<double>& familyValues) {
  int index = -1;
  if (!gridExtra(d, &index) || index >= int(familyValues.size())) return 0;
  const double v = familyValues[index];
  return v >= 0 && v <= 3 ? int(v) : 0;  // a kind the function rejects leaves the mosaic as for 0
}

namespace {

// ---- sources ----

void putSample(uint8_t* at, Sample s, uint16_t wide) {
  switch (s) {
    case Sample::U8:
    case Sample::U1: *at = uint8_t((uint32_t(wide) * 255 + 32767) / 65535); return;
    case Sample::S8: {
      const int8_t v = int8_t(int((uint32_t(wide) * 255 + 32767) / 65535) - 128);
      std::memcpy(at, &v, 1);
      return;
    }
    case Sample::U16: std::memcpy(at, &wide, 2); return;
    case Sample::S16: {
      const int16_t v = int16_t(int(wide) - 32768);
      std::memcpy(at, &v, 2);
      return;
    }
    case Sample::S32: {
      const int32_t v = int32_t(wide) - 32768;
      std::memcpy(at, &v, 4);
      return;
    }
    case Sample::F32: {
      const float v = float(wide) / 65535.0f;
      std::memcpy(at, &v, 4);
      return;
    }
    case Sample::F64: {
      const double v = double(wide) / 65535.0;
      std::memcpy(at, &v, 8);
      return;
    }
  }
}

// Bit widths of the low, middle and high fields of a packed word and whether
// red sits in the low one, from the format's name.
struct PackedFields {
  int bits[3] = {5, 6, 5};
  bool redLow = false;
};

PackedFields packedFields(const std::string& format) {
  PackedFields f;
  static const std::regex re("^(RGB|BGR)(565|555|444)");
  std::smatch m;
  if (std::regex_search(format, m, re)) {
    f.redLow = m[1] == "RGB";
    const std::string n = m[2];
    for (int i = 0; i < 3; ++i) f.bits[i] = n == "565" ? (i == 1 ? 6 : 5) : n == "555" ? 5 : 4;
  }
  return f;
}

// The picture as the source side sees it: components in the format's order.
class SourceView {
 public:
  SourceView(const Picture& p, const Descriptor& d, int grid)
      : p_(p), encoding_(encodingOf(d.src.format)), grid_(grid) {
    std::string base;
    for (char c : d.src.format)
      if (!std::isdigit(static_cast<unsigned char>(c))) base += c;
    ycocg_ = base == "YCoCg";
    form_.lifting = d.qualifier == "Rev";
    form_.byteColour = d.dst.sample == Sample::U8;
    form_.bytePlanes = d.src.sample == Sample::U8;
  }
  // YCoCg planes take the transform's own integers, not a scaled colour.
  bool integerPlanes() const { return ycocg_; }
  int32_t integer(int x, int y, int k) const {
    x = std::clamp(x, 0, p_.width - 1);
    y = std::clamp(y, 0, p_.height - 1);
    return ycocgPlanes(form_, p_.wide(x, y, 0), p_.wide(x, y, 1), p_.wide(x, y, 2))[k];
  }
  int width() const { return p_.width; }
  int height() const { return p_.height; }
  // Component k (0..2 in the format's order, 3 alpha) at (x, y).
  uint16_t component(int x, int y, int k) const {
    x = std::clamp(x, 0, p_.width - 1);
    y = std::clamp(y, 0, p_.height - 1);
    if (k == 3) return p_.wide(x, y, 3);
    return encode(encoding_, p_.wide(x, y, 0), p_.wide(x, y, 1), p_.wide(x, y, 2))[k];
  }
  // Red, green or blue (0, 1, 2) at (x, y), whatever the format.
  uint16_t colour(int x, int y, int meaning) const {
    return p_.wide(std::clamp(x, 0, p_.width - 1), std::clamp(y, 0, p_.height - 1), meaning);
  }
  // What a one-channel source takes: luma, or the mosaic sample.
  uint16_t single(int x, int y) const {
    x = std::clamp(x, 0, p_.width - 1);
    y = std::clamp(y, 0, p_.height - 1);
    if (grid_ >= 0 && p_.hasColour()) return p_.wide(x, y, bayerColour(grid_, x, y));
    return p_.luma(x, y);
  }
  // Mean of component k over the block of fx by fy pixels at (x0, y0).
  uint16_t mean(int k, int x0, int y0, int fx, int fy) const {
    uint64_t sum = 0;
    int n = 0;
    for (int y = y0; y < std::min(y0 + fy, p_.height); ++y)
      for (int x = x0; x < std::min(x0 + fx, p_.width); ++x, ++n) sum += component(x, y, k);
    if (n == 0) return component(x0, y0, k);
    return uint16_t((sum + n / 2) / n);
  }

 private:
  const Picture& p_;
  Encoding encoding_;
  int grid_;
  bool ycocg_ = false;
  YCoCgForm form_;
};

// An integer stored as the sample type takes it: bytes clamped, 16 bits
// wrapped (as the transforms wrap), 32 bits whole.
void putInteger(uint8_t* at, Sample s, int32_t v) {
  switch (s) {
    case Sample::S16:
    case Sample::U16: {
      const uint16_t w = uint16_t(uint32_t(v));
      std::memcpy(at, &w, 2);
      return;
    }
    case Sample::S32: std::memcpy(at, &v, 4); return;
    case Sample::F32: {
      const float f = float(v);
      std::memcpy(at, &f, 4);
      return;
    }
    case Sample::F64: {
      const double f = v;
      std::memcpy(at, &f, 8);
      return;
    }
    default: *at = uint8_t(std::clamp(v, 0, 255)); return;
  }
}

void chromaFactors(Chroma c, int& fx, int& fy) {
  fx = fy = 1;
  switch (c) {
    case Chroma::S422: fx = 2; break;
    case Chroma::S420: fx = fy = 2; break;
    case Chroma::S411: fx = 4; break;
    case Chroma::S1620: fx = fy = 4; break;
    case Chroma::Full: break;
  }
}

bool lumaFirstInStream(const std::string& format) { return format.rfind("Cb", 0) != 0 && format.rfind("Cr", 0) != 0; }

void fillBuffer(Workspace::Buffer& b, const Side& side, const SourceView& v) {
  const int bytes = meta::sampleBytes(side.sample);
  const int samplesPerRow = b.geometry.rowBytes / bytes;
  const int width = v.width();
  for (int y = 0; y < b.geometry.rows; ++y) {
    uint8_t* row = b.first + size_t(y) * b.step;
    auto put = [&](int i, uint16_t wide) {
      if (i >= 0 && i < samplesPerRow) putSample(row + size_t(i) * bytes, side.sample, wide);
    };
    if (v.integerPlanes() && !side.packedWord && side.layout != Layout::C2 && side.layout != Layout::P2) {
      const int n = side.isPlanar() ? 1 : side.channels();
      for (int i = 0; i < samplesPerRow; ++i) {
        const int k = side.isPlanar() ? b.plane : i % n;
        const int x = i / n;
        putInteger(row + size_t(i) * bytes, side.sample, k < 3 ? v.integer(x, y, k) : 0);
      }
      continue;
    }
    if (side.sample == Sample::U1) {  // packed bits, first pixel in the high bit
      std::memset(row, 0, b.geometry.rowBytes);
      for (int x = 0; x < width && x / 8 < b.geometry.rowBytes; ++x)
        if (v.single(x, y) >= 32768) row[x / 8] |= uint8_t(0x80 >> (x & 7));
      continue;
    }
    if (side.packedWord) {
      const PackedFields f = packedFields(side.format);
      for (int x = 0; x < samplesPerRow; ++x) {
        // Fields from the low end: red or blue, green, the other.
        const int low = f.redLow ? 0 : 2;
        const uint16_t fields[3] = {v.colour(x, y, low), v.colour(x, y, 1), v.colour(x, y, 2 - low)};
        uint16_t word = 0;
        int shift = 0;
        for (int i = 0; i < 3; ++i) {
          word = uint16_t(word | ((fields[i] >> (16 - f.bits[i])) << shift));
          shift += f.bits[i];
        }
        putSample(row + size_t(x) * 2, Sample::U16, word);
      }
      continue;
    }
    switch (side.layout) {
      case Layout::C1:
        for (int x = 0; x < samplesPerRow; ++x) put(x, v.single(x, y));
        break;
      case Layout::C2: {  // a 4:2:2 stream: two pixels in four samples
        const bool lumaFirst = lumaFirstInStream(side.format);
        for (int x = 0; x < (samplesPerRow + 1) / 2; ++x) {
          const int pair = x & ~1;
          const uint16_t chroma = v.mean(1 + (x & 1), pair, y, 2, 1);
          put(2 * x + (lumaFirst ? 0 : 1), v.component(x, y, 0));
          put(2 * x + (lumaFirst ? 1 : 0), chroma);
        }
        break;
      }
      case Layout::C3:
      case Layout::C4:
      case Layout::AC4: {
        const int n = side.channels();
        for (int x = 0; x * n < samplesPerRow; ++x)
          for (int k = 0; k < n; ++k) put(x * n + k, v.component(x, y, k));
        break;
      }
      case Layout::P2:
        if (b.plane == 0) {
          for (int x = 0; x < samplesPerRow; ++x) put(x, v.component(x, y, 0));
        } else {
          int fx, fy;
          chromaFactors(side.chroma, fx, fy);
          for (int i = 0; i < samplesPerRow; ++i) put(i, v.mean(1 + (i & 1), (i / 2) * fx, y * fy, fx, fy));
        }
        break;
      case Layout::P3:
      case Layout::P4:
      case Layout::AP4: {
        int fx = 1, fy = 1;
        if (b.plane == 1 || b.plane == 2) chromaFactors(side.chroma, fx, fy);
        for (int x = 0; x < samplesPerRow; ++x)
          put(x, fx == 1 && fy == 1 ? v.component(x, y, b.plane) : v.mean(b.plane, x * fx, y * fy, fx, fy));
        break;
      }
    }
  }
}

// ---- destinations ----

float getSample(const uint8_t* at, Sample s) {
  switch (s) {
    case Sample::U8:
    case Sample::U1: return *at;
    case Sample::S8: {
      int8_t v;
      std::memcpy(&v, at, 1);
      return v;
    }
    case Sample::U16: {
      uint16_t v;
      std::memcpy(&v, at, 2);
      return v;
    }
    case Sample::S16: {
      int16_t v;
      std::memcpy(&v, at, 2);
      return v;
    }
    case Sample::S32: {
      int32_t v;
      std::memcpy(&v, at, 4);
      return float(v);
    }
    case Sample::F32: {
      float v;
      std::memcpy(&v, at, 4);
      return v;
    }
    case Sample::F64: {
      double v;
      std::memcpy(&v, at, 8);
      return float(v);
    }
  }
  return 0;
}

// Samples of one output picture before they are mapped to 8 or 16 bits.
struct RawImage {
  std::string suffix;
  int width = 0, height = 0, channels = 1;
  Sample sample = Sample::U8;  // what the values are
  std::vector<float> values;
  RawImage(std::string s, int w, int h, int c, Sample t)
      : suffix(std::move(s)), width(w), height(h), channels(c), sample(t), values(size_t(w) * h * c, 0.0f) {}
  float& at(int x, int y, int c) { return values[(size_t(y) * width + x) * channels + c]; }
};

bool isReal(Sample s) { return s == Sample::F32 || s == Sample::F64; }

void readBuffer(const Workspace::Buffer& b, const Side& side, const Descriptor& d, int width,
                const std::vector<double>& familyValues, std::vector<RawImage>& out) {
  const int bytes = meta::sampleBytes(side.sample);
  const int samplesPerRow = b.geometry.rowBytes / bytes;
  const int rows = b.geometry.rows;
  auto sampleAt = [&](int y, int i) { return getSample(b.first + size_t(y) * b.step + size_t(i) * bytes, side.sample); };
  const std::vector<std::string> names = componentNames(side.format, side.format == d.src.format ? d.dst.format : d.src.format);
  auto planeName = [&](int k) { return k < 3 ? "_" + names[k] : std::string("_A"); };

  if (side.sample == Sample::U1) {
    int offset = 0;
    for (size_t i = 0; i < d.extras.size() && i < familyValues.size(); ++i)
      if (d.extras[i].name.find("BitOffset") != std::string::npos) offset = std::clamp(int(familyValues[i]), 0, 7);
    RawImage img("", width, rows, 1, Sample::U8);
    for (int y = 0; y < rows; ++y) {
      const uint8_t* row = b.first + size_t(y) * b.step;
      for (int x = 0; x < width && (offset + x) / 8 < b.geometry.rowBytes; ++x)
        img.at(x, y, 0) = (row[(offset + x) / 8] & (0x80 >> ((offset + x) & 7))) ? 255.0f : 0.0f;
    }
    out.push_back(std::move(img));
    return;
  }
  if (side.packedWord) {
    const PackedFields f = packedFields(side.format);
    RawImage img("", samplesPerRow, rows, 3, Sample::U8);
    for (int y = 0; y < rows; ++y)
      for (int x = 0; x < samplesPerRow; ++x) {
        const unsigned word = unsigned(sampleAt(y, x));
        int shift = 0;
        uint8_t fields[3];
        for (int i = 0; i < 3; ++i) {
          const unsigned value = (word >> shift) & ((1u << f.bits[i]) - 1);
          // Widen by repeating the top bits below the field.
          unsigned wide = value << (8 - f.bits[i]);
          wide |= wide >> f.bits[i];
          fields[i] = uint8_t(wide);
          shift += f.bits[i];
        }
        img.at(x, y, f.redLow ? 0 : 2) = fields[0];
        img.at(x, y, 1) = fields[1];
        img.at(x, y, f.redLow ? 2 : 0) = fields[2];
      }
    out.push_back(std::move(img));
    return;
  }
  switch (side.layout) {
    case Layout::C1: {
      RawImage img("", samplesPerRow, rows, 1, side.sample);
      for (int y = 0; y < rows; ++y)
        for (int x = 0; x < samplesPerRow; ++x) img.at(x, y, 0) = sampleAt(y, x);
      out.push_back(std::move(img));
      return;
    }
    case Layout::C2: {
      const bool lumaFirst = lumaFirstInStream(side.format);
      const int pixels = samplesPerRow / 2, chromaWidth = (pixels + 1) / 2;
      RawImage luma(planeName(0), pixels, rows, 1, side.sample);
      RawImage first(planeName(1), chromaWidth, rows, 1, side.sample);
      RawImage second(planeName(2), chromaWidth, rows, 1, side.sample);
      for (int y = 0; y < rows; ++y)
        for (int x = 0; x < pixels; ++x) {
          luma.at(x, y, 0) = sampleAt(y, 2 * x + (lumaFirst ? 0 : 1));
          (x & 1 ? second : first).at(x / 2, y, 0) = sampleAt(y, 2 * x + (lumaFirst ? 1 : 0));
        }
      out.push_back(std::move(luma));
      out.push_back(std::move(first));
      out.push_back(std::move(second));
      return;
    }
    case Layout::C3:
    case Layout::C4:
    case Layout::AC4: {
      const int n = side.channels();
      const int kept = side.layout == Layout::AC4 && !d.writesAlpha ? 3 : n;
      const bool swap = blueFirst(side.format);
      RawImage img("", samplesPerRow / n, rows, kept, side.sample);
      for (int y = 0; y < rows; ++y)
        for (int x = 0; x < img.width; ++x)
          for (int k = 0; k < kept; ++k) img.at(x, y, k < 3 && swap ? 2 - k : k) = sampleAt(y, x * n + k);
      out.push_back(std::move(img));
      return;
    }
    case Layout::P2:
      if (b.plane == 0) {
        RawImage img(planeName(0), samplesPerRow, rows, 1, side.sample);
        for (int y = 0; y < rows; ++y)
          for (int x = 0; x < samplesPerRow; ++x) img.at(x, y, 0) = sampleAt(y, x);
        out.push_back(std::move(img));
      } else {
        RawImage first(planeName(1), samplesPerRow / 2, rows, 1, side.sample);
        RawImage second(planeName(2), samplesPerRow / 2, rows, 1, side.sample);
        for (int y = 0; y < rows; ++y)
          for (int x = 0; x < samplesPerRow / 2; ++x) {
            first.at(x, y, 0) = sampleAt(y, 2 * x);
            second.at(x, y, 0) = sampleAt(y, 2 * x + 1);
          }
        out.push_back(std::move(first));
        out.push_back(std::move(second));
      }
      return;
    case Layout::P3:
    case Layout::P4:
    case Layout::AP4: {
      RawImage img(planeName(b.plane), samplesPerRow, rows, 1, side.sample);
      for (int y = 0; y < rows; ++y)
        for (int x = 0; x < samplesPerRow; ++x) img.at(x, y, 0) = sampleAt(y, x);
      out.push_back(std::move(img));
      return;
    }
  }
}

}  // namespace

void fillSources(Workspace& ws, const Picture& picture, int grid) {
  const Descriptor& d = ws.descriptor();
  const SourceView view(picture, d, grid);
  for (Workspace::Buffer& b : ws.buffers())
    if (b.isSource) fillBuffer(b, d.src, view);
}

Outputs destinationImages(Workspace& ws, const std::vector<double>& familyValues) {
  const Descriptor& d = ws.descriptor();
  const Side& side = d.inPlace ? d.src : d.dst;
  std::vector<RawImage> raws;
  for (const Workspace::Buffer& b : ws.buffers())
    if (b.isDestination && b.geometry.rows > 0 && b.geometry.rowBytes > 0)
      readBuffer(b, side, d, ws.size().width, familyValues, raws);

  // Floats show 0..1 as black to white; when any leaves that range the
  // whole destination is stretched over its own range instead.
  float lo = std::numeric_limits<float>::infinity(), hi = -lo;
  for (const RawImage& r : raws)
    if (isReal(r.sample))
      for (float v : r.values)
        if (std::isfinite(v)) {
          lo = std::min(lo, v);
          hi = std::max(hi, v);
        }
  float base = 0.0f, scale = 255.0f;
  Outputs out;
  if (lo <= hi && (lo < 0.0f || hi > 1.0f)) {
    base = lo;
    scale = hi > lo ? 255.0f / (hi - lo) : 0.0f;
    std::ostringstream note;
    note << "float samples span " << lo << " to " << hi << "; shown stretched over 0..255";
    out.note = note.str();
  }
  // Signed integers on a scale far below their type's (the planes of an
  // 8-bit YCoCg in 16 bits) are stretched over their range too.
  float ilo = std::numeric_limits<float>::infinity(), ihi = -ilo;
  for (const RawImage& r : raws)
    if (r.sample == Sample::S16 || r.sample == Sample::S32)
      for (float v : r.values) {
        ilo = std::min(ilo, v);
        ihi = std::max(ihi, v);
      }
  const bool stretchIntegers = ilo < ihi && ihi - ilo < 4096.0f;
  if (stretchIntegers) {
    std::ostringstream note;
    note << "signed samples span " << ilo << " to " << ihi << "; shown stretched over 0..255";
    out.note = note.str();
  }
  for (RawImage& r : raws) {
    const bool signedInteger = r.sample == Sample::S16 || r.sample == Sample::S32;
    if (signedInteger && stretchIntegers) {
      for (float& v : r.values) v = std::round((v - ilo) * 255.0f / (ihi - ilo));
      r.sample = Sample::U8;
    }
    const bool wide = r.sample == Sample::U16 || r.sample == Sample::S16 || r.sample == Sample::S32;
    Picture p(r.width, r.height, r.channels, wide ? 16 : 8);
    for (size_t i = 0; i < r.values.size(); ++i) {
      const float v = r.values[i];
      double mapped;
      switch (r.sample) {
        case Sample::S8: mapped = v + 128.0; break;
        case Sample::S16:
        case Sample::S32: mapped = double(v) + 32768.0; break;
        case Sample::F32:
        case Sample::F64: mapped = std::isnan(v) ? 0.0 : std::round((double(v) - base) * scale); break;
        default: mapped = v; break;
      }
      p.samples[i] = uint16_t(std::clamp(mapped, 0.0, double(p.maxValue())));
    }
    out.images.push_back({r.suffix, std::move(p)});
  }
  return out;
}

}  // namespace zel::tool
