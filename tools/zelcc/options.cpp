#include "options.h"

#include <fnmatch.h>

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <cmath>
#include <cstdlib>

namespace zel::tool {

using meta::ArgKind;

const char* const kUsage =
    "usage: zelcc list [PATTERN]\n"
    "       zelcc info NAME\n"
    "       zelcc doc [FILE]\n"
    "       zelcc run NAME [--in FILE | --sample] --out PREFIX [--size WxH] [--arg NAME=VALUE ...]\n"
    "       zelcc --version | --help\n"
    "\n"
    "  list   names of the exports, all or those matching PATTERN (a glob with * ? [...],\n"
    "         or else a part of the name; case is ignored)\n"
    "  info   an export's arguments, layouts, sample types, chroma subsampling, steps,\n"
    "         family arguments with their defaults, and size minima\n"
    "  doc    every export as one Markdown table (docs/exports.md), to FILE or stdout\n"
    "  run    converts a picture through the export and writes every destination image\n"
    "         or plane as PNG: PREFIX.png for one interleaved image, PREFIX_<plane>.png\n"
    "         for planes; prints the status and the time the call took\n"
    "\n"
    "  --in FILE      PNG (8 or 16 bits, gray, RGB or RGBA) or binary PGM/PPM (P5/P6)\n"
    "  --sample       the built-in test card (the default when --in is not given)\n"
    "  --out PREFIX   where the results go\n"
    "  --size WxH     size of the card (default 640x480), or the size --in is scaled to\n"
    "  --arg N=V      a family argument (see info); a pointer argument takes V1,V2,...\n"
    "\n"
    "Exit status: 0 done (warnings included), 1 failed, 2 bad command line.\n";

namespace {

// "--opt value" or "--opt=value".
bool takeValue(const std::vector<std::string>& args, size_t& i, const std::string& option, std::string& value) {
  const std::string& a = args[i];
  if (a == option) {
    if (i + 1 >= args.size()) throw UsageError(option + " needs a value");
    value = args[++i];
    return true;
  }
  if (a.rfind(option + "=", 0) == 0) {
    value = a.substr(option.size() + 1);
    return true;
  }
  return false;
}

RunOptions parseRun(const std::vector<std::string>& args) {
  RunOptions r;
  bool sample = false;
  for (size_t i = 1; i < args.size(); ++i) {
    std::string value;
    const std::string& a = args[i];
    if (takeValue(args, i, "--in", value)) {
      if (value.empty()) throw UsageError("--in needs a file name");
      r.input = value;
    } else if (takeValue(args, i, "--out", value)) {
      if (value.empty()) throw UsageError("--out needs a prefix");
      r.outPrefix = value;
    } else if (takeValue(args, i, "--size", value)) {
      parseSize(value, r.width, r.height);
      r.sizeGiven = true;
    } else if (takeValue(args, i, "--arg", value)) {
      const size_t eq = value.find('=');
      if (eq == std::string::npos || eq == 0) throw UsageError("--arg takes NAME=VALUE, not '" + value + "'");
      r.args.emplace_back(value.substr(0, eq), value.substr(eq + 1));
    } else if (a == "--sample") {
      sample = true;
    } else if (!a.empty() && a[0] == '-') {
      throw UsageError("unknown option '" + a + "' for run");
    } else if (r.name.empty()) {
      r.name = a;
    } else {
      throw UsageError("run takes one export name; '" + a + "' is a second");
    }
  }
  if (r.name.empty()) throw UsageError("run needs an export name");
  if (sample && !r.input.empty()) throw UsageError("--in and --sample exclude each other");
  if (r.outPrefix.empty()) throw UsageError("run needs --out PREFIX");
  return r;
}

bool parseNumber(const std::string& text, double& out) {
  if (text.empty() || std::isspace(static_cast<unsigned char>(text[0]))) return false;
  char* end = nullptr;
  errno = 0;
  out = std::strtod(text.c_str(), &end);
  return end && *end == '\0' && errno != ERANGE;
}

double checkedValue(const meta::Descriptor& d, const meta::Extra& e, const std::string& text) {
  double v;
  const std::string where = "argument " + e.name + " of " + d.name;
  if (!parseNumber(text, v)) throw ToolError(where + " takes a number, not '" + text + "'");
  double lo = 0, hi = 0;
  switch (e.kind) {
    case ArgKind::UInt8: lo = 0, hi = 255; break;
    case ArgKind::UInt16: lo = 0, hi = 65535; break;
    case ArgKind::Int16: lo = -32768, hi = 32767; break;
    case ArgKind::Int32: lo = -2147483648.0, hi = 2147483647.0; break;
    default: return v;  // float kinds take any value, infinities and NaN included
  }
  if (v != std::floor(v) || v < lo || v > hi)
    throw ToolError(where + " is " + argKindName(e.kind) + ", an integer from " + std::to_string(int64_t(lo)) +
                    " to " + std::to_string(int64_t(hi)) + ", not '" + text + "'");
  return v;
}

}  // namespace

void parseSize(const std::string& text, int& width, int& height) {
  const size_t x = text.find_first_of("xX");
  auto digits = [](const std::string& s) {
    return !s.empty() && s.size() <= 9 && std::all_of(s.begin(), s.end(), [](char c) { return c >= '0' && c <= '9'; });
  };
  if (x == std::string::npos || !digits(text.substr(0, x)) || !digits(text.substr(x + 1)))
    throw UsageError("--size takes WIDTHxHEIGHT, not '" + text + "'");
  const long w = std::atol(text.substr(0, x).c_str()), h = std::atol(text.c_str() + x + 1);
  checkDimensions(w, h, "--size " + text);
  width = int(w);
  height = int(h);
}

CommandLine parseCommandLine(const std::vector<std::string>& args) {
  CommandLine c;
  if (args.empty()) return c;
  const std::string& first = args[0];
  if (first == "--help" || first == "-h" || first == "help") {
    c.command = Command::Help;
  } else if (first == "--version") {
    c.command = Command::Version;
  } else if (first == "list") {
    if (args.size() > 2) throw UsageError("list takes at most one pattern");
    c.command = Command::List;
    if (args.size() == 2) c.pattern = args[1];
    return c;
  } else if (first == "info") {
    if (args.size() != 2) throw UsageError("info takes one export name");
    c.command = Command::Info;
    c.name = args[1];
    return c;
  } else if (first == "doc") {
    if (args.size() > 2) throw UsageError("doc takes at most one file name");
    c.command = Command::Doc;
    if (args.size() == 2) c.docFile = args[1];
    return c;
  } else if (first == "run") {
    c.command = Command::Run;
    c.run = parseRun(args);
    return c;
  } else {
    throw UsageError("unknown command '" + first + "'");
  }
  if (args.size() > 1) throw UsageError(first + " takes no further arguments");
  return c;
}

bool matchesPattern(const std::string& name, const std::string& pattern) {
  if (pattern.find_first_of("*?[") != std::string::npos)
    return fnmatch(pattern.c_str(), name.c_str(), FNM_CASEFOLD) == 0;
  auto lower = [](std::string s) {
    for (char& ch : s) ch = char(std::tolower(static_cast<unsigned char>(ch)));
    return s;
  };
  return lower(name).find(lower(pattern)) != std::string::npos;
}

const char* argKindName(ArgKind kind) {
  switch (kind) {
    case ArgKind::Pointer: return "pointer";
    case ArgKind::Int32: return "32-bit integer";
    case ArgKind::UInt8: return "8-bit unsigned";
    case ArgKind::UInt16: return "16-bit unsigned";
    case ArgKind::Int16: return "16-bit signed";
    case ArgKind::Float32: return "32-bit float";
    case ArgKind::Float64: return "64-bit float";
    case ArgKind::Size: return "ImageSize";
    case ArgKind::Region: return "CfaRegion";
  }
  return "value";
}

FamilyArguments resolveFamilyArguments(const meta::Descriptor& d,
                                       const std::vector<std::pair<std::string, std::string>>& given) {
  FamilyArguments out;
  for (const meta::Extra& e : d.extras) out.values.push_back(e.good);
  for (const auto& [name, text] : given) {
    int index = -1;
    for (size_t i = 0; i < d.extras.size(); ++i)
      if (d.extras[i].name == name) index = int(i);
    if (index < 0) {
      std::string known;
      for (const meta::Extra& e : d.extras) known += (known.empty() ? "" : ", ") + e.name;
      throw ToolError(d.name + " has no argument '" + name + "' (" +
                      (known.empty() ? std::string("it takes no family arguments") : "its family arguments: " + known) +
                      ")");
    }
    const meta::Extra& e = d.extras[index];
    if (e.kind != ArgKind::Pointer) {
      out.values[index] = checkedValue(d, e, text);
      continue;
    }
    // The floats behind a pointer: as many as the default holds at least,
    // the ones not given keep the default's 0.25.
    std::vector<float> floats(size_t(std::max(e.good, 4.0)) / 4 + 1, 0.25f);
    size_t count = 0, start = 0;
    for (;;) {
      const size_t comma = text.find(',', start);
      const std::string piece = text.substr(start, comma == std::string::npos ? std::string::npos : comma - start);
      double v;
      if (!parseNumber(piece, v))
        throw ToolError("argument " + e.name + " of " + d.name + " takes numbers separated by commas, not '" + text + "'");
      if (count >= floats.size()) floats.push_back(0.25f);
      floats[count++] = float(v);
      if (comma == std::string::npos) break;
      start = comma + 1;
    }
    out.arrays[index] = std::move(floats);
  }
  return out;
}

}  // namespace zel::tool
