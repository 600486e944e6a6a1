#include "frame/descriptor.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <map>
#include <random>
#include <regex>
#include <sstream>

#include <sys/mman.h>
#include <unistd.h>

#include <cstdlib>
#include <new>

#include "frame/invoke.h"

namespace zel::meta {

int Side::planes() const {
  switch (layout) {
    case Layout::P2: return 2;
    case Layout::P3: return 3;
    case Layout::P4:
    case Layout::AP4: return 4;
    default: return 1;
  }
}

int Side::channels() const {
  if (packedWord) return 1;
  switch (layout) {
    case Layout::C1: return 1;
    case Layout::C2: return 2;
    case Layout::C3: return 3;
    case Layout::C4:
    case Layout::AC4: return 4;
    default: return 1;
  }
}

int sampleBytes(Sample s) {
  switch (s) {
    case Sample::U8:
    case Sample::S8:
    case Sample::U1: return 1;
    case Sample::U16:
    case Sample::S16: return 2;
    case Sample::S32:
    case Sample::F32: return 4;
    case Sample::F64: return 8;
  }
  return 1;
}

const char* sampleName(Sample s) {
  static const char* names[] = {"8u", "8s", "16u", "16s", "32s", "32f", "64f", "1u"};
  return names[int(s)];
}

const char* layoutName(Layout l) {
  static const char* names[] = {"C1", "C2", "C3", "C4", "AC4", "P2", "P3", "P4", "AP4"};
  return names[int(l)];
}

namespace {

int ceilDiv(int a, int b) { return (a + b - 1) / b; }

int chromaWidth(Chroma c, int width) {
  switch (c) {
    case Chroma::S422:
    case Chroma::S420: return ceilDiv(width, 2);
    case Chroma::S411: return ceilDiv(width, 4);
    case Chroma::S1620: return ceilDiv(width, 4);
    default: return width;
  }
}

int chromaHeight(Chroma c, int height) {
  switch (c) {
    case Chroma::S420: return ceilDiv(height, 2);
    case Chroma::S1620: return ceilDiv(height, 4);
    default: return height;
  }
}

}  // namespace

PlaneGeometry planeGeometry(const Side& side, int plane, int width, int height) {
  const int bytes = sampleBytes(side.sample);
  PlaneGeometry g{0, height, bytes};
  if (side.sample == Sample::U1) {
    g.rowBytes = ceilDiv(width, 8);
    return g;
  }
  switch (side.layout) {
    case Layout::P2:
      if (plane == 0) {
        g.rowBytes = width * bytes;
      } else {
        g.rowBytes = 2 * chromaWidth(side.chroma, width) * bytes;
        g.rows = chromaHeight(side.chroma, height);
      }
      return g;
    case Layout::P3:
    case Layout::P4:
    case Layout::AP4:
      if (plane == 1 || plane == 2) {
        g.rowBytes = chromaWidth(side.chroma, width) * bytes;
        g.rows = chromaHeight(side.chroma, height);
      } else {
        g.rowBytes = width * bytes;
      }
      return g;
    default:
      g.rowBytes = width * side.channels() * bytes;
      return g;
  }
}

namespace {

// ---- name grammar ----

bool parseSample(const std::string& t, Sample& s) {
  static const std::map<std::string, Sample> m = {{"8u", Sample::U8},   {"8s", Sample::S8},   {"16u", Sample::U16},
                                                  {"16s", Sample::S16}, {"32s", Sample::S32}, {"32f", Sample::F32},
                                                  {"64f", Sample::F64}, {"1u", Sample::U1}};
  auto it = m.find(t);
  if (it == m.end()) return false;
  s = it->second;
  return true;
}

bool parseLayout(const std::string& t, Layout& l) {
  static const std::map<std::string, Layout> m = {{"C1", Layout::C1},   {"C2", Layout::C2}, {"C3", Layout::C3},
                                                  {"C4", Layout::C4},   {"AC4", Layout::AC4}, {"P2", Layout::P2},
                                                  {"P3", Layout::P3},   {"P4", Layout::P4}, {"AP4", Layout::AP4}};
  auto it = m.find(t);
  if (it == m.end()) return false;
  l = it->second;
  return true;
}

void describeFormat(const std::string& format, Side& side) {
  side.format = format;
  if (format.find("1620") != std::string::npos) side.chroma = Chroma::S1620;
  else if (format.find("420") != std::string::npos) side.chroma = Chroma::S420;
  else if (format.find("422") != std::string::npos) side.chroma = Chroma::S422;
  else if (format.find("411") != std::string::npos) side.chroma = Chroma::S411;
  static const std::regex packed("^(RGB|BGR)(565|555|444)(Dither)?$");
  side.packedWord = std::regex_match(format, packed);
}

// Family extras: trailing arguments by name, and flags.
struct ExtraKind {
  ArgKind kind;
  double good;
  std::vector<BadValue> bad;
};

ArgKind sampleArgKind(Sample s) {
  switch (s) {
    case Sample::U8: return ArgKind::UInt8;
    case Sample::U16: return ArgKind::UInt16;
    case Sample::S16: return ArgKind::Int16;
    case Sample::F32: return ArgKind::Float32;
    case Sample::F64: return ArgKind::Float64;
    default: return ArgKind::Int32;
  }
}

bool parseExtras(const std::string& extras, Descriptor& d, std::string& error) {
  std::istringstream in(extras);
  std::string word;
  std::vector<std::string> order;  // custom order words, if given
  std::vector<std::string> presize;  // family arguments that precede size
  while (in >> word) {
    if (word == "alpha") {
      // The destination's fourth channel value, in its sample type.
      d.extras.push_back({"alpha", sampleArgKind(d.dst.sample), d.dst.sample == Sample::F32 ? 0.5 : 200.0, {}});
    } else if (word.rfind("arg:", 0) == 0) {
      // arg:NAME:KIND:GOOD[:BAD=STATUS]... ; KIND u8 u16 s16 i32 f32 f64 ptr.
      // A ptr argument points to GOOD bytes of float 0.25 values; its null
      // is checked with the image pointers.
      std::vector<std::string> f;
      std::string piece;
      std::istringstream fields(word.substr(4));
      while (std::getline(fields, piece, ':')) f.push_back(piece);
      static const std::map<std::string, ArgKind> kinds = {
          {"u8", ArgKind::UInt8},    {"u16", ArgKind::UInt16},  {"s16", ArgKind::Int16}, {"i32", ArgKind::Int32},
          {"f32", ArgKind::Float32}, {"f64", ArgKind::Float64}, {"ptr", ArgKind::Pointer}};
      if (f.size() < 3 || !kinds.count(f[1])) {
        error = "bad arg: in extras of " + d.name;
        return false;
      }
      Extra e{f[0], kinds.at(f[1]), std::atof(f[2].c_str()), {}};
      for (size_t k = 3; k < f.size(); ++k) {
        if (f[k] == "optional" && e.kind == ArgKind::Pointer) {
          e.optional = true;
          continue;
        }
        const size_t eq = f[k].find('=');
        if (eq == std::string::npos) {
          error = "bad value list in extras of " + d.name;
          return false;
        }
        e.bad.push_back({std::atof(f[k].substr(0, eq).c_str()), static_cast<Status>(std::atoi(f[k].c_str() + eq + 1))});
      }
      d.extras.push_back(e);
    } else if (word.rfind("presize=", 0) == 0) {
      // presize=NAME: the family argument NAME stands before size.
      presize.push_back(word.substr(8));
    } else if (word.rfind("min=", 0) == 0) {
      if (std::sscanf(word.c_str() + 4, "%dx%d", &d.minWidth, &d.minHeight) != 2) {
        error = "bad min= in extras of " + d.name;
        return false;
      }
    } else if (word.rfind("mult=", 0) == 0) {
      if (std::sscanf(word.c_str() + 5, "%dx%d", &d.multWidth, &d.multHeight) != 2 || d.multWidth < 1 ||
          d.multHeight < 1) {
        error = "bad mult= in extras of " + d.name;
        return false;
      }
    } else if (word.rfind("room=", 0) == 0) {
      if (std::sscanf(word.c_str() + 5, "%dx%d", &d.roomWidth, &d.roomHeight) != 2) {
        error = "bad room= in extras of " + d.name;
        return false;
      }
    } else if (word == "warn") {
      d.warnsOdd = true;
    } else if (word == "steps") {
      d.checksSteps = true;
    } else if (word == "samplesteps" || word == "samplesteps=dst") {
      // 16-bit and 32-bit steps are shifted into samples, odd bytes dropped;
      // with =dst the source's step stays a byte count.
      d.stepsInSamples = true;
      d.srcStepInBytes = word != "samplesteps";
    } else if (word == "onecolumnbytes") {
      d.oneColumnBytes = true;
    } else if (word == "alphawritten") {
      d.writesAlpha = true;
    } else if (word == "streams") {
      d.streams = true;
    } else if (word.rfind("planestested=", 0) == 0) {
      // Only the first N entries of a plane array are tested for null.
      d.testedPlanes = std::atoi(word.c_str() + 13);
    } else if (word == "frame") {
      d.frameSource = true;
    } else if (word.rfind("scratch=", 0) == 0) {
      // scratch=ROWS:PAD, a pointer and a step after the family values.
      if (std::sscanf(word.c_str() + 8, "%d:%d", &d.scratchRows, &d.scratchPad) != 2 || d.scratchRows < 1) {
        error = "bad scratch= in extras of " + d.name;
        return false;
      }
    } else if (word.rfind("order=", 0) == 0) {
      std::string rest = word.substr(6);
      std::replace(rest.begin(), rest.end(), ',', ' ');
      std::istringstream parts(rest);
      std::string part;
      while (parts >> part) order.push_back(part);
    } else {
      error = "unknown extra '" + word + "' of " + d.name;
      return false;
    }
  }
  for (const std::string& name : presize) {
    auto it = std::find_if(d.extras.begin(), d.extras.end(), [&](const Extra& e) { return e.name == name; });
    if (it == d.extras.end()) {
      error = "presize names unknown argument '" + name + "' in " + d.name;
      return false;
    }
    it->beforeSize = true;
  }
  // Check order: pointers (top level, then plane entries), size, steps,
  // family values, unless the family names its own.
  if (order.empty()) {
    order = {"null", "planes", "size"};
    if (d.checksSteps) order.push_back("step");
    for (const Extra& e : d.extras)
      if (!e.bad.empty()) order.push_back(e.name);
  }
  for (const std::string& o : order) {
    if (o == "null") d.order.push_back({Check::NullTop});
    else if (o == "planes") d.order.push_back({Check::NullPlanes});
    // The entries of one side's plane array, where the two sides are tested
    // apart.
    else if (o == "srcplanes") d.order.push_back({Check::NullPlanes, -1, 0});
    else if (o == "dstplanes") d.order.push_back({Check::NullPlanes, -1, 1});
    else if (o == "size") d.order.push_back({Check::Size});
    else if (o == "positive") d.order.push_back({Check::SizePositive});
    else if (o == "step") d.order.push_back({Check::Step});
    else {
      auto it = std::find_if(d.extras.begin(), d.extras.end(), [&](const Extra& e) { return e.name == o; });
      if (it == d.extras.end()) {
        error = "order names unknown check '" + o + "' in " + d.name;
        return false;
      }
      it->stage = int(d.order.size());
      d.order.push_back({Check::Extra, int(it - d.extras.begin())});
    }
  }
  return true;
}

void addSideSlots(Descriptor& d, const Side& side, Role ptr, Role planes, Role step, Role steps) {
  if (side.layout == Layout::P2) {
    d.slots.push_back({ptr, 0});
    if (d.region) d.slots.push_back({step, 0});
    d.slots.push_back({ptr, 1});
    if (d.region) d.slots.push_back({step, 1});
    return;
  }
  if (side.isPlanar()) {
    d.slots.push_back({planes});
    if (d.region) d.slots.push_back({side.stepPerPlane() ? steps : step});
    return;
  }
  d.slots.push_back({ptr});
  if (d.region) d.slots.push_back({step});
}

}  // namespace

bool describe(const std::string& name, const std::string& extras, Descriptor& d, std::string& error) {
  d = Descriptor{};
  d.name = name;
  if (name.rfind("zeli", 0) != 0) {
    error = "not an image function: " + name;
    return false;
  }
  std::vector<std::string> parts;
  {
    std::string rest = name.substr(4), part;
    std::istringstream in(rest);
    while (std::getline(in, part, '_')) parts.push_back(part);
  }
  if (parts.size() < 3 || parts.size() > 4) {
    error = "name does not follow the grammar: " + name;
    return false;
  }
  d.operation = parts[0];
  if (parts.size() == 4) d.qualifier = parts[1];
  const std::string types = parts[parts.size() - 2];
  std::string layout = parts.back();

  // Types: one or two sample tokens.
  static const std::regex typeRe("^(8u|8s|16u|16s|32s|32f|64f|1u)(8u|8s|16u|16s|32s|32f|64f|1u)?$");
  std::smatch tm;
  if (!std::regex_match(types, tm, typeRe)) {
    error = "bad sample types in " + name;
    return false;
  }
  parseSample(tm[1], d.src.sample);
  d.dst.sample = d.src.sample;
  if (tm[2].matched) parseSample(tm[2], d.dst.sample);

  // Layout: tokens, then I (in place) and R (region) flags.
  d.region = !layout.empty() && layout.back() == 'R';
  if (d.region) layout.pop_back();
  if (!layout.empty() && layout.back() == 'I') {
    d.inPlace = true;
    layout.pop_back();
  }
  if (!layout.empty() && layout[0] == 'I') {
    d.inPlace = true;
    layout.erase(0, 1);
  }
  static const std::regex tokenRe("(AC4|AP4|C[1-4]|P[2-4])");
  std::vector<std::string> tokens;
  for (auto it = std::sregex_iterator(layout.begin(), layout.end(), tokenRe); it != std::sregex_iterator(); ++it)
    tokens.push_back(it->str());
  std::string joined;
  for (auto& t : tokens) joined += t;
  if (tokens.empty() || tokens.size() > 2 || joined != layout) {
    error = "bad layout in " + name;
    return false;
  }
  parseLayout(tokens[0], d.src.layout);
  parseLayout(tokens.back(), d.dst.layout);

  // Formats on each side of "To"; operators name one format for both.
  const std::string& op = d.operation;
  const size_t to = op.find("To");
  std::string srcFormat = op, dstFormat = op;
  if (to != std::string::npos && to > 0) {
    srcFormat = op.substr(0, to);
    dstFormat = op.substr(to + 2);
  }
  for (const char* glued : {"Dither", "Gamma"}) {
    const size_t g = dstFormat.find(glued);
    if (g != std::string::npos && g > 0 && g + std::strlen(glued) == dstFormat.size()) dstFormat.erase(g);
  }
  describeFormat(srcFormat, d.src);
  describeFormat(dstFormat, d.dst);
  d.srcWholePairs = d.src.layout == Layout::C2 && !d.dst.packedWord && (d.dst.format == "RGB" || d.dst.format == "BGR");
  // Planes converted to or from packed words take a step per plane, at full
  // resolution too.
  if (d.dst.packedWord) d.src.planeSteps = true;
  if (d.src.packedWord) d.dst.planeSteps = true;

  if (!parseExtras(extras, d, error)) return false;

  // Arguments: source, destination, size, family values; a frame source
  // is pointer, region, frame size, step.
  if (d.frameSource) {
    d.slots = {{Role::SrcPtr}, {Role::SrcRegion}, {Role::Size}, {Role::SrcStep}};
    addSideSlots(d, d.dst, Role::DstPtr, Role::DstPlanes, Role::DstStep, Role::DstSteps);
    for (int i = 0; i < int(d.extras.size()); ++i) d.slots.push_back({Role::Extra, 0, i});
    if (d.scratchRows > 0) d.slots.insert(d.slots.end(), {{Role::Scratch}, {Role::ScratchStep}});
    return true;
  }
  if (d.inPlace) {
    addSideSlots(d, d.src, Role::SrcDstPtr, Role::SrcDstPlanes, Role::SrcDstStep, Role::SrcDstStep);
  } else {
    addSideSlots(d, d.src, Role::SrcPtr, Role::SrcPlanes, Role::SrcStep, Role::SrcSteps);
    addSideSlots(d, d.dst, Role::DstPtr, Role::DstPlanes, Role::DstStep, Role::DstSteps);
  }
  for (int i = 0; i < int(d.extras.size()); ++i)
    if (d.extras[i].beforeSize) d.slots.push_back({Role::Extra, 0, i});
  d.slots.push_back({Role::Size});
  for (int i = 0; i < int(d.extras.size()); ++i)
    if (!d.extras[i].beforeSize) d.slots.push_back({Role::Extra, 0, i});
  if (d.scratchRows > 0) d.slots.insert(d.slots.end(), {{Role::Scratch}, {Role::ScratchStep}});
  return true;
}

namespace {

struct ManifestLine {
  const char* name;
  const char* extras;
  void (*impl)();
  Invoker invoke;
  std::vector<ArgKind> (*kinds)();
};

#define ZEL_EXPORT(name, extras)                                                                           \
  {#name, extras, reinterpret_cast<void (*)()>(&::name), &InvokerOf<decltype(&::name), &::name>::call, \
   &InvokerOf<decltype(&::name), &::name>::kinds},
#define ZEL_SHARED(name, other, extras) ZEL_EXPORT(name, extras)


const std::vector<ManifestLine>& manifest() {
  static const std::vector<ManifestLine> lines = {
#include "frame/manifest.inc"
  };
  return lines;
}

}  // namespace

const std::vector<Descriptor>& allDescriptors() {
  static const std::vector<Descriptor> all = [] {
    std::vector<Descriptor> out;
    for (const ManifestLine& line : manifest()) {
      Descriptor d;
      std::string error;
      const std::string name = line.name;
      if (name == "zelccGetLibVersion") {  // the one export without images
        d.name = name;
        d.impl = line.impl;
        out.push_back(d);
        continue;
      }
      if (!describe(name, line.extras, d, error)) {
        std::fprintf(stderr, "zelcc descriptors: %s\n", error.c_str());
        std::abort();
      }
      d.impl = line.impl;
      d.invoke = line.invoke;
      d.prototype = line.kinds();
      out.push_back(d);
    }
    return out;
  }();
  return all;
}

const Descriptor* findDescriptor(const std::string& name) {
  for (const Descriptor& d : allDescriptors())
    if (d.name == name) return &d;
  return nullptr;
}

// ---- Memory ----

Memory::Memory(size_t length, uint8_t fill, Fence fence) {
  if (fence == Fence::None) {
    base_ = new uint8_t[std::max<size_t>(length, 1)];
    baseSize_ = length;
    data_ = base_;
  } else {
    const size_t page = size_t(sysconf(_SC_PAGESIZE));
    const size_t pages = (length + page - 1) / page;
    void* m = mmap(nullptr, (pages + 1) * page, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (m == MAP_FAILED) throw std::bad_alloc();
    heap_ = false;
    base_ = static_cast<uint8_t*>(m);
    baseSize_ = (pages + 1) * page;
    uint8_t* fencePage = fence == Fence::After ? base_ + pages * page : base_;
    if (mprotect(fencePage, page, PROT_NONE) != 0) {
      munmap(base_, baseSize_);
      throw std::bad_alloc();
    }
    data_ = fence == Fence::After ? fencePage - length : base_ + page;
  }
  size_ = length;
  std::memset(data_, fill, length);
}

Memory& Memory::operator=(Memory&& other) noexcept {
  if (this != &other) {
    release();
    base_ = std::exchange(other.base_, nullptr);
    baseSize_ = std::exchange(other.baseSize_, 0);
    heap_ = std::exchange(other.heap_, true);
    data_ = std::exchange(other.data_, nullptr);
    size_ = std::exchange(other.size_, 0);
  }
  return *this;
}

void Memory::release() {
  if (!base_) return;
  if (heap_) delete[] base_;
  else munmap(base_, baseSize_);
  base_ = nullptr;
}

// ---- Workspace ----

Workspace::Workspace(const Descriptor& d, ImageSize size, int padBytes, int offset, Fence fence, int stepSign)
    : d_(d), size_(size), pad_(padBytes) {
  // Names without steps take tightly packed images, rows going down.
  if (!d.region) {
    pad_ = padBytes = 0;
    stepSign = 1;
  }
  // Per buffer, what a row step is cut down to: whole samples of this many
  // bytes, or 0 for half the step (see oneColumnBytes).
  std::vector<int> stepUnits;
  const int w = std::max(std::max(size.width, 0), d.roomWidth), h = std::max(std::max(size.height, 0), d.roomHeight);
  auto addSide = [&](const Side& side, int sideIndex) {
    for (int p = 0; p < side.planes(); ++p) {
      Buffer b;
      b.geometry = planeGeometry(side, p, w, h);
      // Their 4:2:0 chroma rows are width >> 1 samples long.
      if (!d.region && side.chroma == Chroma::S420 && side.isPlanar() && p > 0) b.geometry.rowBytes = w >> 1;
      if (sideIndex == 0 && d.srcWholePairs) b.geometry.rowBytes = (w + 1) / 2 * 4 * b.geometry.sampleBytes;
      b.step = b.geometry.rowBytes + padBytes;
      const bool inSamples = d.stepsInSamples && !(sideIndex == 0 && d.srcStepInBytes);
      int unit = inSamples ? b.geometry.sampleBytes : 1;
      if (d.oneColumnBytes && sideIndex == 1 && size.width == 1) {
        b.geometry.rowBytes = 3;
        unit = 0;
      }
      stepUnits.push_back(unit);
      b.side = sideIndex;
      b.plane = p;
      b.isSource = sideIndex != 1;
      b.isDestination = sideIndex != 0;
      buffers_.push_back(std::move(b));
    }
  };
  if (d.inPlace) {
    addSide(d.src, 2);
  } else {
    addSide(d.src, 0);
    addSide(d.dst, 1);
  }
  if (d.scratchRows > 0) {
    // Every byte of the rows belongs to the call; guards lie outside them.
    Buffer b;
    b.step = (w + d.scratchPad) * sampleBytes(d.src.sample) + padBytes;
    b.geometry = PlaneGeometry{b.step, d.scratchRows, 1};
    b.side = 3;
    buffers_.push_back(std::move(b));
    stepUnits.push_back(1);
  }
  for (const Extra& e : d.extras) {
    // Floats 0.25 behind a pointer; a fenced record is exactly as long as
    // the family reads.
    Memory m;
    if (e.kind == ArgKind::Pointer) {
      const size_t length = fence == Fence::None ? (size_t(std::max(e.good, 4.0)) / 4 + 1) * 4 : size_t(e.good);
      m = Memory(length, 0, fence);
      const float quarter = 0.25f;
      for (size_t at = 0; at + 4 <= length; at += 4) std::memcpy(m.data() + at, &quarter, 4);
    }
    extraBuffers_.push_back(std::move(m));
  }
  for (size_t k = 0; k < buffers_.size(); ++k) {
    // Steps by sign; the rows lie where a member taking them in whole
    // samples (rounding down) or halved puts them.
    Buffer& b = buffers_[k];
    const int unit = stepUnits[k];
    const int sign = b.side == 3 ? 1 : stepSign;
    b.step = sign > 0 ? b.step : sign < 0 ? -b.step : 0;
    if (unit == 0) b.pitch = b.step >> 1;
    else b.pitch = b.step >= 0 ? b.step / unit * unit : -((-b.step + unit - 1) / unit * unit);
    const int rows = std::max(b.geometry.rows, 1);
    const ptrdiff_t last = ptrdiff_t(rows - 1) * b.pitch;
    const ptrdiff_t low = std::min<ptrdiff_t>(0, last);  // lowest row start, from the first row's
    const size_t span = size_t(std::max<ptrdiff_t>(0, last) - low + b.geometry.rowBytes);
    uint8_t* lowest = nullptr;
    switch (fence) {
      case Fence::None: {
        // The first row starts `offset` bytes past a 64-byte boundary.
        const size_t rowsBytes = std::max(span, size_t(std::abs(b.step)) * rows);
        b.bytes = Memory(size_t(kGuard) * 2 + size_t(offset) + rowsBytes + 64, kGuardByte, fence);
        uint8_t* base = b.bytes.data() + kGuard;
        const uintptr_t mis = reinterpret_cast<uintptr_t>(base) & 63u;
        lowest = base + ((64 - mis) & 63u) + offset;
        break;
      }
      case Fence::After:
        b.bytes = Memory(size_t(kGuard) + span, kGuardByte, fence);
        lowest = b.bytes.data() + kGuard;
        break;
      case Fence::Before:
        b.bytes = Memory(span + size_t(kGuard), kGuardByte, fence);
        lowest = b.bytes.data();
        break;
    }
    b.first = lowest - low;
    if (b.side == 3) continue;
    if (b.side == 0) {
      srcPlanes_.push_back(b.first);
      srcSteps_.push_back(b.step);
    } else if (b.side == 1) {
      dstPlanes_.push_back(b.first);
      dstSteps_.push_back(b.step);
    } else {
      srcDstPlanes_.push_back(b.first);
      srcSteps_.push_back(b.step);
    }
  }
}

Workspace::Buffer* Workspace::bufferOf(int side, int plane) {
  for (Buffer& b : buffers_)
    if (b.side == side && b.plane == plane) return &b;
  return nullptr;
}

std::vector<const void*>& Workspace::planeArray(int side) {
  return side == 0 ? srcPlanes_ : side == 1 ? dstPlanes_ : srcDstPlanes_;
}

void Workspace::fillRandom(uint32_t seed) {
  std::mt19937 rng(seed);
  for (Buffer& b : buffers_) {
    if (!b.isSource) continue;
    for (int y = 0; y < b.geometry.rows; ++y) {
      uint8_t* row = b.first + ptrdiff_t(y) * b.pitch;
      if (d_.src.sample == Sample::F32) {
        // Floats in 0..1, the range colour functions take.
        std::uniform_real_distribution<float> dist(0.0f, 1.0f);
        for (int x = 0; x + 4 <= b.geometry.rowBytes; x += 4) {
          float v = dist(rng);
          std::memcpy(row + x, &v, 4);
        }
      } else {
        for (int x = 0; x < b.geometry.rowBytes; ++x) row[x] = uint8_t(rng() >> 24);
      }
    }
  }
}

void Workspace::fillDestinations(uint8_t value) {
  for (Buffer& b : buffers_) {
    if (!b.isDestination || b.isSource) continue;
    for (int y = 0; y < b.geometry.rows; ++y) std::memset(b.first + ptrdiff_t(y) * b.pitch, value, b.geometry.rowBytes);
  }
}

std::vector<Arg> Workspace::arguments(const std::vector<double>* extraValues) {
  std::vector<Arg> args;
  auto pointerArg = [](const void* p) {
    Arg a;
    a.kind = ArgKind::Pointer;
    a.p = p;
    return a;
  };
  auto intArg = [](int64_t v) {
    Arg a;
    a.kind = ArgKind::Int32;
    a.i = v;
    return a;
  };
  auto sideOf = [](Role r) {
    switch (r) {
      case Role::SrcPtr:
      case Role::SrcPlanes:
      case Role::SrcStep:
      case Role::SrcSteps: return 0;
      case Role::DstPtr:
      case Role::DstPlanes:
      case Role::DstStep:
      case Role::DstSteps: return 1;
      default: return 2;
    }
  };
  for (const ArgSlot& s : d_.slots) {
    switch (s.role) {
      case Role::SrcPtr:
      case Role::DstPtr:
      case Role::SrcDstPtr: args.push_back(pointerArg(bufferOf(sideOf(s.role), s.plane)->first)); break;
      case Role::SrcPlanes:
      case Role::DstPlanes:
      case Role::SrcDstPlanes: args.push_back(pointerArg(planeArray(sideOf(s.role)).data())); break;
      case Role::SrcStep:
      case Role::DstStep:
      case Role::SrcDstStep: args.push_back(intArg(bufferOf(sideOf(s.role), s.plane)->step)); break;
      case Role::SrcSteps: args.push_back(pointerArg(srcSteps_.data())); break;
      case Role::SrcRegion: {
        Arg a;
        a.kind = ArgKind::Region;
        a.region = CfaRegion{0, 0, size_.width, size_.height};
        args.push_back(a);
        break;
      }
      case Role::Scratch: args.push_back(pointerArg(bufferOf(3, 0)->first)); break;
      case Role::ScratchStep: args.push_back(intArg(bufferOf(3, 0)->step)); break;
      case Role::DstSteps: args.push_back(pointerArg(dstSteps_.data())); break;
      case Role::Size: {
        Arg a;
        a.kind = ArgKind::Size;
        a.size = size_;
        args.push_back(a);
        break;
      }
      case Role::Extra: {
        const Extra& e = d_.extras[s.extra];
        Arg a;
        a.kind = e.kind;
        if (e.kind == ArgKind::Pointer) {
          a.p = extraBuffers_[s.extra].data();
          args.push_back(a);
          break;
        }
        const double v = extraValues ? (*extraValues)[s.extra] : e.good;
        a.f = v;
        a.i = std::isfinite(v) ? int64_t(v) : 0;  // a NaN only a float parameter takes
        args.push_back(a);
        break;
      }
    }
  }
  return args;
}

Status Workspace::call() { return call(arguments()); }

Status Workspace::call(const std::vector<Arg>& args) const { return d_.invoke(args.data(), int(args.size())); }

std::string Workspace::checkGuards() const {
  for (const Buffer& b : buffers_) {
    // The bytes of the rows, wherever the steps put them, belong to the call.
    std::vector<bool> region(b.bytes.size(), false);
    const ptrdiff_t firstAt = b.first - b.bytes.data();
    for (int y = 0; y < b.geometry.rows; ++y) {
      const ptrdiff_t at = firstAt + ptrdiff_t(y) * b.pitch;
      std::fill(region.begin() + at, region.begin() + at + b.geometry.rowBytes, true);
    }
    for (size_t i = 0; i < region.size(); ++i) {
      if (region[i] || b.bytes.data()[i] == kGuardByte) continue;
      std::ostringstream m;
      m << (b.side == 0 ? "source" : b.side == 1 ? "destination" : b.side == 2 ? "in-place image" : "scratch")
        << " plane " << b.plane << ": byte at offset " << (ptrdiff_t(i) - firstAt)
        << " from the region's start changed";
      return m.str();
    }
  }
  return "";
}

std::vector<std::vector<uint8_t>> Workspace::snapshot() const {
  std::vector<std::vector<uint8_t>> out;
  for (const Buffer& b : buffers_) out.emplace_back(b.bytes.begin(), b.bytes.end());
  return out;
}

}  // namespace zel::meta
