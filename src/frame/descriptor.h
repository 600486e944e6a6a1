// What a name says about its function: layouts, sample types, chroma
// subsampling, steps and trailing arguments, plus what the family adds.
// Tests, the command-line tool and the benchmarks drive every export
// through these descriptors; nothing here is part of the library itself.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "zelcc/zelcc.h"

namespace zel::meta {

enum class Layout { C1, C2, C3, C4, AC4, P2, P3, P4, AP4 };
enum class Sample { U8, S8, U16, S16, S32, F32, F64, U1 };
enum class Chroma { Full, S422, S420, S411, S1620 };

// Kinds of argument values, as a prototype takes them.
enum class ArgKind { Pointer, Int32, UInt8, UInt16, Int16, Float32, Float64, Size, Region };

struct Side {
  std::string format;  // "RGB", "YCbCr420", "BGR565", "Gray" ...
  Layout layout = Layout::C1;
  Sample sample = Sample::U8;
  Chroma chroma = Chroma::Full;
  bool packedWord = false;  // one 16-bit word a pixel
  bool planeSteps = false;  // full-resolution planes that still take a step each
  int planes() const;
  int channels() const;  // samples a pixel in an interleaved layout
  bool isPlanar() const { return layout == Layout::P2 || layout == Layout::P3 || layout == Layout::P4 || layout == Layout::AP4; }
  bool stepPerPlane() const { return layout == Layout::P3 && (chroma != Chroma::Full || planeSteps); }
};

struct PlaneGeometry {
  int rowBytes;  // bytes of the region in one row
  int rows;
  int sampleBytes;
};

int sampleBytes(Sample s);
const char* sampleName(Sample s);
const char* layoutName(Layout l);
PlaneGeometry planeGeometry(const Side& side, int plane, int width, int height);

// A trailing argument of a family, with a value that works and values that
// must be rejected (with their status).
struct BadValue {
  double value;
  Status status;
};
struct Extra {
  std::string name;
  ArgKind kind;
  double good;
  std::vector<BadValue> bad;
  int stage = -1;  // where its check stands in the order (index into Descriptor::order)
  bool optional = false;  // a pointer whose null is valid (it selects a default)
  bool beforeSize = false;  // stands before `size` in the prototype
};

// Steps of the argument checks, in the order a member runs them.
// SizePositive: a test of width and height >= 1 standing before a later
// test of the minima (Size then covers only what lies between).
enum class Check { NullTop, NullPlanes, SizePositive, Size, Step, Extra };
struct CheckStage {
  Check check;
  int extra = -1;  // for Check::Extra
  int side = -1;   // for Check::NullPlanes: 0 source, 1 destination, -1 every plane array
};

// Argument roles in prototype order.
// A colour filter array source is a frame: its pointer, the region to
// convert (SrcRegion), the frame's size and its step. Scratch and
// ScratchStep are a caller-owned work area that nobody checks.
enum class Role { SrcPtr, SrcPlanes, SrcStep, SrcSteps, DstPtr, DstPlanes, DstStep, DstSteps, SrcDstPtr,
                  SrcDstPlanes, SrcDstStep, Size, Extra, SrcRegion, Scratch, ScratchStep };
struct ArgSlot {
  Role role;
  int plane = 0;   // for P2: 0 luma, 1 chroma
  int extra = -1;  // for Role::Extra
};

struct Arg {
  ArgKind kind = ArgKind::Pointer;
  const void* p = nullptr;
  int64_t i = 0;
  double f = 0;
  ImageSize size{0, 0};
  CfaRegion region{0, 0, 0, 0};
};

using Invoker = Status (*)(const Arg* args, int count);

struct Descriptor {
  std::string name;
  std::string operation, qualifier;
  Side src, dst;
  bool region = true;   // has steps
  bool inPlace = false;
  std::vector<Extra> extras;
  std::vector<CheckStage> order;
  std::vector<ArgSlot> slots;
  int minWidth = 1, minHeight = 1;  // a minimum of 0: that dimension is not checked
  int multWidth = 1, multHeight = 1;  // required multiples
  int roomWidth = 0, roomHeight = 0;  // buffers cover at least this size: members that write past a tiny region
  bool warnsOdd = false;        // may return StatusOddSizeWarning
  bool writesAlpha = false;     // an AC4 destination's fourth channel is written
  bool streams = false;         // large frames write past the caches (streaming stores)
  bool checksSteps = false;
  int testedPlanes = 0;       // plane entries tested for null per array; 0: all
  bool stepsInSamples = false;  // byte steps are cut down to whole samples
  bool srcStepInBytes = false;  // ... except the source's
  // At width 1 the destination takes three bytes a row, rows half the step
  // apart (the one-column path of the interleaved 4:2:2 packed writers).
  bool oneColumnBytes = false;
  // A 4:2:2 stream read as whole pixel pairs: at an odd width the last
  // pixel takes its chroma at its pair's place, the two bytes (or one) past
  // the row's pixels. The decoders of such streams to RGB or BGR.
  bool srcWholePairs = false;
  // The source is a frame given with a region (the whole frame in a
  // workspace); the size argument is the frame's.
  bool frameSource = false;
  // Caller scratch after the family values: scratchRows rows, each of
  // (width + scratchPad) source samples.
  int scratchRows = 0, scratchPad = 0;
  void (*impl)() = nullptr;
  Invoker invoke = nullptr;
  std::vector<ArgKind> prototype;  // kinds of the prototype's parameters
  bool isImageFunction() const { return invoke != nullptr; }
  // The smallest valid size at least w x h.
  ImageSize validSize(int w, int h) const {
    w = std::max(w, std::max(minWidth, 1));
    h = std::max(h, std::max(minHeight, 1));
    return ImageSize{(w + multWidth - 1) / multWidth * multWidth, (h + multHeight - 1) / multHeight * multHeight};
  }
  const Extra* extra(const std::string& name) const {
    for (const Extra& e : extras)
      if (e.name == name) return &e;
    return nullptr;
  }
};

// Builds a descriptor from a name and its family extras; an error message
// goes to `error` when the name or extras do not parse.
bool describe(const std::string& name, const std::string& extras, Descriptor& out, std::string& error);

// All exports the library has, in table order.
const std::vector<Descriptor>& allDescriptors();
const Descriptor* findDescriptor(const std::string& name);

// Where the bytes of a workspace's buffers lie. None: on the heap, with
// guard bytes on both sides. After, Before: each buffer in a mapping of its
// own whose page right after the last byte a call may touch (After) or right
// before the first (Before) is inaccessible, so that a read or write past
// that end faults at once.
enum class Fence { None, After, Before };

// The bytes of one buffer, owned: heap memory or a fenced mapping.
class Memory {
 public:
  Memory() = default;
  Memory(size_t length, uint8_t fill, Fence fence);
  Memory(Memory&& other) noexcept { *this = std::move(other); }
  Memory& operator=(Memory&& other) noexcept;
  Memory(const Memory&) = delete;
  Memory& operator=(const Memory&) = delete;
  ~Memory() { release(); }

  uint8_t* data() { return data_; }
  const uint8_t* data() const { return data_; }
  size_t size() const { return size_; }
  uint8_t* begin() { return data_; }
  uint8_t* end() { return data_ + size_; }
  const uint8_t* begin() const { return data_; }
  const uint8_t* end() const { return data_ + size_; }
  // The whole mapping, inaccessible page included (the bytes alone on the
  // heap): tells whose fence a faulting address hit.
  bool mapped(const void* p) const {
    auto* q = static_cast<const uint8_t*>(p);
    return q >= base_ && q < base_ + baseSize_;
  }

 private:
  void release();
  uint8_t* base_ = nullptr;
  size_t baseSize_ = 0;
  bool heap_ = true;
  uint8_t* data_ = nullptr;
  size_t size_ = 0;
};

// Image arguments of one call, with guard bytes around every buffer.
class Workspace {
 public:
  static constexpr int kGuard = 64;
  static constexpr uint8_t kGuardByte = 0xA7;

  // padBytes: bytes between one row's region and the next row; offset: how
  // far each buffer's first row starts past a 64-byte boundary (heap only).
  // fence: where the buffers lie; the bytes past the fenced end are exactly
  // those the call may touch (rows of the region, or of the descriptor's
  // room; the whole rows of a scratch area; the bytes of a record).
  // stepSign: 1 rows go down in memory; -1 the first row lies highest and
  // the steps are negative; 0 every row lies in the same place and the
  // steps are 0. Scratch steps stay positive; names without steps take 1.
  Workspace(const Descriptor& d, ImageSize size, int padBytes = 0, int offset = 0, Fence fence = Fence::None,
            int stepSign = 1);

  struct Buffer {
    Memory bytes;                // guard + rows + guard
    uint8_t* first = nullptr;    // first byte of the region
    int step = 0;   // the step argument
    int pitch = 0;  // where the rows lie: the step, or its whole samples (signed)
    PlaneGeometry geometry{};
    bool isSource = false;
    bool isDestination = false;
    int side = 0;    // 0 source, 1 destination, 2 in place, 3 scratch
    int plane = 0;
  };

  std::vector<Buffer>& buffers() { return buffers_; }
  Buffer* bufferOf(int side, int plane);
  // Fills sources (and in-place images) from a seed, destinations with a byte.
  void fillRandom(uint32_t seed);
  void fillDestinations(uint8_t value);
  // Arguments in prototype order; `extraValues` replaces the good values.
  // A frame source passes the whole frame as its region.
  std::vector<Arg> arguments(const std::vector<double>* extraValues = nullptr);
  // The plane-pointer array of a side (0 source, 1 destination, 2 in place),
  // which `arguments` passes by address.
  std::vector<const void*>& planeArray(int side);
  Status call();
  Status call(const std::vector<Arg>& args) const;
  // Guard bytes and step padding unchanged; returns a message or "".
  std::string checkGuards() const;
  std::vector<std::vector<uint8_t>> snapshot() const;
  // The record behind a pointer argument of the family.
  Memory& record(int extra) { return extraBuffers_[extra]; }
  const Descriptor& descriptor() const { return d_; }
  ImageSize size() const { return size_; }

 private:
  const Descriptor& d_;
  ImageSize size_;
  int pad_;
  std::vector<Buffer> buffers_;
  std::vector<const void*> srcPlanes_, dstPlanes_, srcDstPlanes_;
  std::vector<int> srcSteps_, dstSteps_;
  std::vector<Memory> extraBuffers_;  // behind pointer arguments of the family
};

}  // namespace zel::meta
