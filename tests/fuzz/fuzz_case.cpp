#include "fuzz/fuzz_case.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>
#include <sstream>
#include <vector>

#include "frame/descriptor.h"

namespace zel::fuzz {

namespace {

using namespace zel::meta;

// Takes values from the front of the input; past its end every value is 0.
class Reader {
 public:
  Reader(const uint8_t* data, size_t size) : p_(data), n_(size) {}
  uint8_t u8() {
    if (n_ == 0) return 0;
    --n_;
    return *p_++;
  }
  uint16_t u16() { return uint16_t(u8() | u8() << 8); }
  uint32_t u32() { return uint32_t(u16()) | uint32_t(u16()) << 16; }
  // A float in [0, 1].
  float unit() { return float(u16()) / 65535.0f; }
  const uint8_t* rest() const { return p_; }
  size_t left() const { return n_; }

 private:
  const uint8_t* p_;
  size_t n_;
};

const std::vector<const Descriptor*>& imageFunctions() {
  static const std::vector<const Descriptor*> all = [] {
    std::vector<const Descriptor*> out;
    for (const Descriptor& d : allDescriptors())
      if (d.isImageFunction()) out.push_back(&d);
    return out;
  }();
  return all;
}

const char* fenceName(Fence f) { return f == Fence::None ? "heap" : f == Fence::After ? "page after" : "page before"; }

// The values of a family argument that lie strictly between its nearest
// rejected values below and above the default; a side with no rejected
// value ends at the default.
struct Range {
  double low, high;
};
Range validRange(const Extra& e) {
  double below = -std::numeric_limits<double>::infinity(), above = std::numeric_limits<double>::infinity();
  for (const BadValue& b : e.bad) {
    if (std::isnan(b.value)) continue;
    if (b.value < e.good) below = std::max(below, b.value);
    if (b.value > e.good) above = std::min(above, b.value);
  }
  const bool whole = e.kind != ArgKind::Float32 && e.kind != ArgKind::Float64;
  Range r{std::isinf(below) ? e.good : below, std::isinf(above) ? e.good : above};
  if (whole) {
    if (!std::isinf(below)) r.low += 1;
    if (!std::isinf(above)) r.high -= 1;
  }
  return r;
}

bool isRejected(const Extra& e, double v) {
  for (const BadValue& b : e.bad)
    if (b.value == v || (std::isnan(b.value) && std::isnan(v))) return true;
  return false;
}

// Everything the input chooses.
struct Plan {
  const Descriptor* d = nullptr;
  ImageSize size{0, 0};
  bool sizeRejected = false;  // a checked dimension off its minimum or multiple
  bool noRows = false;        // an unchecked height of 0 or below
  Fence fence = Fence::None;
  int stepSign = 1, pad = 0, offset = 0;
  std::vector<double> values;                 // family values
  std::vector<std::vector<uint8_t>> records;  // bytes behind pointer arguments
  std::vector<bool> nullRecord;               // an optional pointer passed as null
  bool valueRejected = false, allDefault = true;
  int dataMode = 0;
  uint32_t seed = 0;
  uint8_t constant = 0, dstFill = 0;
  std::vector<uint8_t> pattern;  // source bytes, repeated
};

Plan makePlan(const uint8_t* data, size_t size) {
  Reader r(data, size);
  Plan p;
  const auto& all = imageFunctions();
  const Descriptor& d = *all[r.u16() % all.size()];
  p.d = &d;

  // Size: mostly valid; now and then a width or height the member rejects,
  // or an unchecked height that does no rows.
  const uint8_t sizeMode = r.u8();
  int w = 1 + r.u8() % 48, h = 1 + r.u8() % 9;
  p.size = d.validSize(w, h);
  switch (sizeMode % 16) {
    case 0:
    case 1: {
      const bool across = sizeMode % 16 == 0;
      const int minimum = across ? d.minWidth : d.minHeight, multiple = across ? d.multWidth : d.multHeight;
      int& side = across ? p.size.width : p.size.height;
      const bool checked =
          minimum > 0 && std::any_of(d.order.begin(), d.order.end(), [](const CheckStage& c) {
            return c.check == Check::Size || c.check == Check::SizePositive;
          });
      if (!checked) {
        // No check: no pixels for a width of 0, no rows for a height of 0
        // or below.
        side = across ? 0 : -int(r.u8() % 3);
        p.noRows = true;
        break;
      }
      const int pick = r.u8() % 4;
      if (pick == 0) side = 0;
      else if (pick == 1) side = -1 - int(r.u8() % 100);
      else if (pick == 2 && minimum > 1) side = minimum - 1;
      else if (pick == 3 && multiple > 1) side += 1;
      else side = 0;
      p.sizeRejected = true;
      break;
    }
    default: break;
  }

  // Where the buffers lie and how the steps run.
  p.fence = Fence(r.u8() % 3);
  const uint8_t stepMode = r.u8();
  if (!d.checksSteps && d.region) p.stepSign = stepMode % 4 == 2 ? -1 : stepMode % 4 == 3 ? 0 : 1;
  // Steps other than positive are kept to multiples of 8 bytes, so that
  // members taking them in whole samples meet no rounding.
  p.pad = p.stepSign == 1 ? r.u8() % 24 : 8 * (r.u8() % 3);
  p.offset = r.u8() % 16;

  // Family values.
  for (size_t i = 0; i < d.extras.size(); ++i) {
    const Extra& e = d.extras[i];
    double v = e.good;
    std::vector<uint8_t> record;
    bool null = false;
    if (e.kind == ArgKind::Pointer) {
      // Floats in [-1, 1] where the record holds floats of 0.25 by default.
      const uint8_t mode = r.u8();
      record.resize(size_t(e.good));
      if (e.optional && mode % 8 == 0) {
        null = true;
      } else if (mode % 4 != 1) {
        for (size_t at = 0; at + 4 <= record.size(); at += 4) {
          const float f = r.unit() * 2.0f - 1.0f;
          std::memcpy(&record[at], &f, 4);
        }
        p.allDefault = false;
      } else {
        const float quarter = 0.25f;
        for (size_t at = 0; at + 4 <= record.size(); at += 4) std::memcpy(&record[at], &quarter, 4);
      }
    } else if (!e.bad.empty()) {
      const uint8_t mode = r.u8();
      if (mode % 8 == 0) {
        v = e.bad[(mode / 8) % e.bad.size()].value;
        p.valueRejected = true;
      } else if (mode % 8 != 1) {
        const Range range = validRange(e);
        const double t = double(r.u32()) / 4294967295.0;
        v = range.low + (range.high - range.low) * t;
        if (e.kind != ArgKind::Float32 && e.kind != ArgKind::Float64) v = std::floor(v);
        if (e.kind == ArgKind::Float32) v = double(float(v));
        if (isRejected(e, v)) v = e.good;
      }
    } else {
      // Values no check rejects: any sample value; other kinds keep their
      // default, since their meaning is the family's.
      switch (e.kind) {
        case ArgKind::UInt8: v = r.u8(); break;
        case ArgKind::UInt16: v = r.u16(); break;
        case ArgKind::Int16: v = int16_t(r.u16()); break;
        case ArgKind::Float32: v = r.unit(); break;
        default: break;
      }
    }
    if (v != e.good) p.allDefault = false;
    p.values.push_back(v);
    p.records.push_back(std::move(record));
    p.nullRecord.push_back(null);
  }

  // Source data: random from a seed, one value, or the rest of the input.
  p.dataMode = r.u8() % 3;
  p.seed = r.u32();
  p.constant = r.u8();
  p.dstFill = r.u8();
  p.pattern.assign(r.rest(), r.rest() + r.left());
  return p;
}

void fillSources(Workspace& w, const Plan& p) {
  if (p.dataMode == 0 || (p.dataMode == 2 && p.pattern.empty())) {
    w.fillRandom(p.seed);
    return;
  }
  const bool floats = p.d->src.sample == Sample::F32;
  size_t at = 0;
  auto next = [&]() -> uint8_t { return p.dataMode == 1 ? p.constant : p.pattern[at++ % p.pattern.size()]; };
  for (Workspace::Buffer& b : w.buffers()) {
    if (!b.isSource) continue;
    for (int y = 0; y < b.geometry.rows; ++y) {
      uint8_t* row = b.first + ptrdiff_t(y) * b.pitch;
      if (floats) {
        // Floats in 0..1, the range colour functions take.
        for (int x = 0; x + 4 <= b.geometry.rowBytes; x += 4) {
          const float f = float(next() | next() << 8) / 65535.0f;
          std::memcpy(row + x, &f, 4);
        }
      } else {
        for (int x = 0; x < b.geometry.rowBytes; ++x) row[x] = next();
      }
    }
  }
}

bool knownStatus(Status s) {
  switch (s) {
    case StatusOk:
    case StatusNothingDoneWarning:
    case StatusOddSizeWarning:
    case StatusBadArgumentError:
    case StatusSizeError:
    case StatusNullPointerError:
    case StatusOutOfMemoryError:
    case StatusStepError:
    case StatusStateIdentityError:
    case StatusEmptyRangeError:
    case StatusLevelsError:
    case StatusNoiseError:
    case StatusDitherKindError: return true;
  }
  return false;
}

std::string describe(const Plan& p) {
  std::ostringstream o;
  o << p.d->name << " " << p.size.width << "x" << p.size.height << ", " << fenceName(p.fence) << ", steps "
    << (p.stepSign > 0 ? "positive" : p.stepSign < 0 ? "negative" : "zero") << ", pad " << p.pad << ", offset "
    << p.offset;
  for (size_t i = 0; i < p.values.size(); ++i) {
    const Extra& e = p.d->extras[i];
    o << ", " << e.name << " ";
    if (e.kind == ArgKind::Pointer) o << (p.nullRecord[i] ? "null" : "record");
    else o << p.values[i];
  }
  o << ", data " << (p.dataMode == 0 ? "random" : p.dataMode == 1 ? "constant" : "from the input");
  return o.str();
}

// Bytes of every AC4 destination pixel's fourth sample.
std::vector<uint8_t> alphaBytes(Workspace& w, const Plan& p) {
  std::vector<uint8_t> out;
  const Descriptor& d = *p.d;
  if (d.dst.layout != Layout::AC4 || d.writesAlpha) return out;
  const int px = sampleBytes(d.dst.sample);
  for (const Workspace::Buffer& b : w.buffers()) {
    if (b.side == 0 || b.side == 3) continue;
    for (int y = 0; y < b.geometry.rows; ++y)
      for (int x = 0; x < std::max(p.size.width, 0); ++x)
        for (int k = 0; k < px; ++k) out.push_back(b.first[ptrdiff_t(y) * b.pitch + x * 4 * px + 3 * px + k]);
  }
  return out;
}

void restore(Workspace& w, const std::vector<std::vector<uint8_t>>& bytes) {
  for (size_t i = 0; i < w.buffers().size(); ++i)
    std::memcpy(w.buffers()[i].bytes.data(), bytes[i].data(), bytes[i].size());
}

}  // namespace

std::string describeCase(const uint8_t* data, size_t size) { return describe(makePlan(data, size)); }

std::string runCase(const uint8_t* data, size_t size) {
  const Plan p = makePlan(data, size);
  const Descriptor& d = *p.d;
  Workspace w(d, p.size, p.pad, p.offset, p.fence, p.stepSign);
  fillSources(w, p);
  w.fillDestinations(p.dstFill);
  std::vector<Arg> args = w.arguments(&p.values);
  for (size_t i = 0; i < d.slots.size(); ++i) {
    if (d.slots[i].role != Role::Extra || d.extras[d.slots[i].extra].kind != ArgKind::Pointer) continue;
    const int k = d.slots[i].extra;
    Memory& m = w.record(k);
    std::memcpy(m.data(), p.records[k].data(), std::min(m.size(), p.records[k].size()));
    if (p.nullRecord[k]) args[i].p = nullptr;
  }
  std::vector<std::vector<uint8_t>> records;
  for (size_t k = 0; k < d.extras.size(); ++k) records.emplace_back(w.record(int(k)).begin(), w.record(int(k)).end());

  const auto before = w.snapshot();
  const auto alphaBefore = alphaBytes(w, p);
  const Status s = w.call(args);
  auto fail = [&](const std::string& what) { return describe(p) + ": " + what; };

  if (!knownStatus(s)) return fail("status " + std::to_string(s) + " is not one of the library's");
  if ((p.sizeRejected || p.valueRejected) && s >= 0)
    return fail("status " + std::to_string(s) + " where a size or value must be rejected");
  if (!p.sizeRejected && !p.valueRejected && p.allDefault && s < 0)
    return fail("status " + std::to_string(s) + " with a valid size and default values");
  const auto after = w.snapshot();
  if (s < 0 || p.noRows) {
    if (after != before) return fail("status " + std::to_string(s) + " but a buffer changed");
  }
  const std::string stray = w.checkGuards();
  if (!stray.empty()) return fail(stray);
  for (size_t i = 0; i < w.buffers().size(); ++i)
    if (w.buffers()[i].side == 0 && after[i] != before[i])
      return fail("source plane " + std::to_string(w.buffers()[i].plane) + " was written");
  for (size_t k = 0; k < d.extras.size(); ++k)
    if (!std::equal(records[k].begin(), records[k].end(), w.record(int(k)).begin()))
      return fail("the record of " + d.extras[k].name + " was written");
  if (alphaBytes(w, p) != alphaBefore) return fail("the alpha of the destination was written");

  // The same call on the same bytes gives the same bytes.
  restore(w, before);
  const Status again = w.call(args);
  if (again != s) return fail("status " + std::to_string(s) + ", then " + std::to_string(again));
  if (w.snapshot() != after) return fail("a second call on the same bytes gave other bytes");
  return "";
}

}  // namespace zel::fuzz
