#include "info.h"

#include <algorithm>
#include <cstring>
#include <iomanip>
#include <sstream>

#include "buffers.h"
#include "options.h"

namespace zel::tool {

using meta::ArgKind;
using meta::Chroma;
using meta::Descriptor;
using meta::Layout;
using meta::Role;
using meta::Side;

std::string statusName(int status) {
  switch (status) {
    case StatusOk: return "StatusOk";
    case StatusNothingDoneWarning: return "StatusNothingDoneWarning";
    case StatusOddSizeWarning: return "StatusOddSizeWarning";
    case StatusBadArgumentError: return "StatusBadArgumentError";
    case StatusSizeError: return "StatusSizeError";
    case StatusNullPointerError: return "StatusNullPointerError";
    case StatusOutOfMemoryError: return "StatusOutOfMemoryError";
    case StatusStepError: return "StatusStepError";
    case StatusStateIdentityError: return "StatusStateIdentityError";
    case StatusEmptyRangeError: return "StatusEmptyRangeError";
    case StatusLevelsError: return "StatusLevelsError";
    case StatusNoiseError: return "StatusNoiseError";
    case StatusDitherKindError: return "StatusDitherKindError";
  }
  return "Status(" + std::to_string(status) + ")";
}

namespace {

const char* layoutText(const Side& s) {
  if (s.packedWord) return "one 16-bit packed word a pixel";
  switch (s.layout) {
    case Layout::C1: return "one channel";
    case Layout::C2: return "4:2:2 stream, two pixels in four samples";
    case Layout::C3: return "three interleaved channels";
    case Layout::C4: return "four interleaved channels";
    case Layout::AC4: return "three channels and alpha, interleaved";
    case Layout::P2: return "luma plane and a plane of chroma pairs";
    case Layout::P3: return "three planes";
    case Layout::P4: return "four planes";
    case Layout::AP4: return "three planes and an alpha plane";
  }
  return "";
}

const char* chromaText(Chroma c) {
  switch (c) {
    case Chroma::Full: return "full-resolution chroma";
    case Chroma::S422: return "chroma 4:2:2 (halved across)";
    case Chroma::S420: return "chroma 4:2:0 (halved across and down)";
    case Chroma::S411: return "chroma 4:1:1 (quartered across)";
    case Chroma::S1620: return "chroma quartered across and down";
  }
  return "";
}

std::string sideText(const Side& s) {
  std::ostringstream o;
  o << (s.format.empty() ? "-" : s.format) << ", " << meta::layoutName(s.layout) << " (" << layoutText(s) << "), "
    << meta::sampleName(s.sample) << ", " << chromaText(s.chroma);
  return o.str();
}

std::string number(double v) {
  std::ostringstream o;
  o << std::setprecision(9) << v;
  return o.str();
}

std::string argumentName(const Descriptor& d, const meta::ArgSlot& s, size_t index) {
  const Side& src = d.src;
  const Side& dst = d.dst;
  auto pairName = [](const char* base, const Side& side, int plane, const char* tail) {
    if (side.layout == Layout::P2) return std::string(base) + (plane == 0 ? "Y" : "CbCr") + tail;
    return std::string(base) + tail;
  };
  auto planes = [](const Side& side) { return "[" + std::to_string(side.planes()) + "]"; };
  switch (s.role) {
    case Role::SrcPtr: return pairName("src", src, s.plane, "");
    case Role::SrcPlanes: return "srcPlanes" + planes(src);
    case Role::SrcStep: return pairName("src", src, s.plane, "Step");
    case Role::SrcSteps: return "srcSteps" + planes(src);
    case Role::DstPtr: return pairName("dst", dst, s.plane, "");
    case Role::DstPlanes: return "dstPlanes" + planes(dst);
    case Role::DstStep: return pairName("dst", dst, s.plane, "Step");
    case Role::DstSteps: return "dstSteps" + planes(dst);
    case Role::SrcDstPtr: return "srcDst";
    case Role::SrcDstPlanes: return "srcDstPlanes" + planes(src);
    case Role::SrcDstStep: return "srcDstStep";
    case Role::Scratch: return "tmp";
    case Role::ScratchStep: return "tmpStep";
    case Role::Size: return "size";
    case Role::Extra: return d.extras[s.extra].name;
    default:
      if (index < d.prototype.size() && d.prototype[index] == ArgKind::Region) return "srcRegion";
      return "argument" + std::to_string(index + 1);
  }
}

std::string argumentRole(const Descriptor& d, const meta::ArgSlot& s) {
  switch (s.role) {
    case Role::SrcPtr:
    case Role::SrcPlanes: return "source";
    case Role::DstPtr:
    case Role::DstPlanes: return "destination";
    case Role::SrcDstPtr:
    case Role::SrcDstPlanes: return "image converted in place";
    case Role::SrcStep:
    case Role::SrcSteps:
    case Role::DstStep:
    case Role::DstSteps:
    case Role::SrcDstStep:
      return d.checksSteps ? "row step in bytes, checked: at least 1" : "row step in bytes, used unchecked";
    case Role::Size: return "width and height in pixels";
    case Role::Scratch: return "caller's scratch, not checked";
    case Role::ScratchStep: return "row step of the scratch in bytes, not checked";
    case Role::Extra: {
      const meta::Extra& e = d.extras[s.extra];
      if (e.kind == ArgKind::Pointer) return "family argument, default: " + number(e.good) + " bytes of floats 0.25";
      return "family argument, default " + number(e.good);
    }
    default: return "";
  }
}

std::string checkText(const Descriptor& d, const meta::CheckStage& c) {
  switch (c.check) {
    case meta::Check::NullTop: return "null pointers";
    case meta::Check::NullPlanes: return "null plane entries";
    case meta::Check::SizePositive: return "size at least 1x1";
    case meta::Check::Size: return "size";
    case meta::Check::Step: return "steps";
    case meta::Check::Extra: return d.extras[c.extra].name;
    default: return "check " + std::to_string(int(c.check));
  }
}

}  // namespace

std::string describeExport(const Descriptor& d) {
  std::ostringstream o;
  if (!d.isImageFunction()) {
    o << d.name << "\n  the version query: no arguments, returns a pointer to the constant version record\n"
      << describeVersion();
    return o.str();
  }
  o << d.name << "\n";
  o << "  operation     " << d.operation << (d.qualifier.empty() ? "" : ", qualifier " + d.qualifier) << "\n";
  if (d.inPlace) {
    o << "  image         " << sideText(d.src) << ", converted in place\n";
  } else {
    o << "  source        " << sideText(d.src) << "\n";
    o << "  destination   " << sideText(d.dst) << "\n";
  }
  o << "  steps         "
    << (!d.region ? "none: whole images, rows tightly packed"
                  : d.checksSteps ? "one per image or plane, each at least 1 (else StatusStepError)"
                                  : "one per image or plane, used unchecked")
    << "\n";
  o << "  minimum size  " << d.minWidth << "x" << d.minHeight << "\n";
  o << "  odd sizes     " << (d.warnsOdd ? "may return StatusOddSizeWarning after the work" : "no warning") << "\n";
  if (d.writesAlpha) o << "  alpha         the destination's fourth channel is written\n";
  if (d.streams) o << "  stores        large frames are written with streaming stores, past the caches\n";
  if (readsMosaic(d)) o << "  run input     a Bayer mosaic of the picture, laid out as the grid argument says\n";

  o << "  arguments\n";
  for (size_t i = 0; i < d.slots.size(); ++i) {
    const std::string kind = i < d.prototype.size() ? argKindName(d.prototype[i]) : "";
    o << "    " << std::left << std::setw(16) << argumentName(d, d.slots[i], i) << std::setw(17) << kind
      << argumentRole(d, d.slots[i]) << "\n";
  }
  o << "  family arguments";
  if (d.extras.empty()) o << "  none";
  o << "\n";
  for (const meta::Extra& e : d.extras) {
    o << "    " << std::left << std::setw(16) << e.name << argKindName(e.kind) << ", default ";
    if (e.kind == ArgKind::Pointer) o << number(e.good) << " bytes of floats 0.25 (give V1,V2,... to replace)";
    else o << number(e.good);
    for (const meta::BadValue& b : e.bad) o << "; " << number(b.value) << " gives " << statusName(b.status);
    o << "\n";
  }
  o << "  checks        ";
  for (size_t i = 0; i < d.order.size(); ++i) o << (i ? ", " : "") << checkText(d, d.order[i]);
  o << "\n";

  o << "  buffers at 640x480\n";
  auto planesOf = [&](const Side& s, const char* what) {
    for (int p = 0; p < s.planes(); ++p) {
      const meta::PlaneGeometry g = meta::planeGeometry(s, p, 640, 480);
      o << "    " << what << " plane " << p << ": " << g.rows << " rows of " << g.rowBytes << " bytes\n";
    }
  };
  planesOf(d.src, d.inPlace ? "image" : "source");
  if (!d.inPlace) planesOf(d.dst, "destination");
  return o.str();
}

namespace {

// One side in a table cell: format (operators have none), layout, sample
// type, subsampling.
std::string sideCell(const Descriptor& d, const Side& s) {
  std::ostringstream o;
  if (!s.format.empty() && s.format != d.operation) o << s.format << " ";
  o << meta::layoutName(s.layout) << " " << meta::sampleName(s.sample);
  switch (s.chroma) {
    case Chroma::S422: o << " 4:2:2"; break;
    case Chroma::S420: o << " 4:2:0"; break;
    case Chroma::S411: o << " 4:1:1"; break;
    case Chroma::S1620: o << " quarter"; break;
    default: break;
  }
  if (s.packedWord) o << " packed";
  return o.str();
}

std::string familyCell(const Descriptor& d) {
  std::ostringstream o;
  for (size_t i = 0; i < d.extras.size(); ++i) {
    const meta::Extra& e = d.extras[i];
    o << (i ? "; " : "") << "`" << e.name << "` " << argKindName(e.kind) << " ";
    if (e.kind == ArgKind::Pointer) o << number(e.good) << " bytes" << (e.optional ? ", may be null" : "");
    else o << number(e.good);
    if (!e.bad.empty()) {
      o << " (rejects";
      for (const meta::BadValue& b : e.bad) o << " " << number(b.value) << ": " << statusName(b.status);
      o << ")";
    }
  }
  return o.str();
}

bool hasPlaneArrays(const Descriptor& d) {
  return std::any_of(d.slots.begin(), d.slots.end(), [](const meta::ArgSlot& s) {
    return s.role == Role::SrcPlanes || s.role == Role::DstPlanes || s.role == Role::SrcDstPlanes;
  });
}

}  // namespace

std::vector<const meta::CheckStage*> shownChecks(const Descriptor& d) {
  std::vector<const meta::CheckStage*> out;
  for (const meta::CheckStage& c : d.order)
    if (c.check != meta::Check::NullPlanes || hasPlaneArrays(d)) out.push_back(&c);
  return out;
}

std::string exportsMarkdown() {
  const auto& all = meta::allDescriptors();
  int images = 0;
  for (const Descriptor& d : all) images += d.isImageFunction() ? 1 : 0;
  std::ostringstream o;
  o << "# Exports\n\n"
    << "Generated from the export table by `zelcc doc` (the build writes it to `docs/exports.md` in the build\n"
    << "tree; `tools/refresh-exports-doc.sh` copies it here). " << all.size() << " exports in table order: "
    << images << " image functions and the version query.\n\n"
    << "Arguments are in prototype order. Steps are in bytes: *checked* ones must be at least 1, *unchecked* ones\n"
    << "may be zero or negative, *none*: whole images with tightly packed rows. Minimum is width x height, and a\n"
    << "dimension of 0 there is not checked. Checks run in the order listed; the first that fails gives its\n"
    << "status and nothing is written.\n\n"
    << "| # | Export | Arguments | Source | Destination | Steps | Minimum | Family arguments | Checks |\n"
    << "|---|---|---|---|---|---|---|---|---|\n";
  int slot = 0;
  for (const Descriptor& d : all) {
    o << "| " << ++slot << " | `" << d.name << "` | ";
    if (!d.isImageFunction()) {
      o << "none | | | | | | returns the version record |\n";
      continue;
    }
    for (size_t i = 0; i < d.slots.size(); ++i) o << (i ? ", " : "") << argumentName(d, d.slots[i], i);
    const bool sizeChecked = std::any_of(d.order.begin(), d.order.end(), [](const meta::CheckStage& c) {
      return c.check == meta::Check::Size || c.check == meta::Check::SizePositive;
    });
    o << " | " << sideCell(d, d.src) << (d.inPlace ? ", in place" : "") << " | "
      << (d.inPlace ? "" : sideCell(d, d.dst)) << (d.writesAlpha ? ", alpha written" : "") << " | "
      << (!d.region ? "none" : d.checksSteps ? "checked" : "unchecked") << " | ";
    if (sizeChecked) o << d.minWidth << "x" << d.minHeight;
    else o << "not checked";
    if (d.multWidth > 1 || d.multHeight > 1) o << ", multiples of " << d.multWidth << "x" << d.multHeight;
    if (d.warnsOdd) o << ", odd sizes warn";
    o << " | " << familyCell(d) << " | ";
    const auto checks = shownChecks(d);
    for (size_t i = 0; i < checks.size(); ++i) o << (i ? ", " : "") << checkText(d, *checks[i]);
    o << " |\n";
  }
  return o.str();
}

std::string describeVersion() {
  const LibraryVersion* v = zelccGetLibVersion();
  std::ostringstream o;
  o << "  zelcc " << v->version << ", " << v->name << ", variant "
    << std::string(v->variantCode, strnlen(v->variantCode, 4)) << ", version " << v->major << "." << v->minor << "."
    << v->revision << " build " << v->build << " of " << v->buildDate << "\n";
  return o.str();
}

}  // namespace zel::tool
