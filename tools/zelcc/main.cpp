// zelcc: lists the library's exports, tells what each takes, writes the
// table of them all, and runs one on a picture or the built-in test card,
// writing the results as PNG.
#include <chrono>
#include <cstdio>
#include <fstream>
#include <iostream>
#include <new>

#include "buffers.h"
#include "frame/descriptor.h"
#include "image_io.h"
#include "info.h"
#include "options.h"
#include "test_card.h"

namespace {

using namespace zel::tool;
using zel::meta::Descriptor;

const Descriptor& exportNamed(const std::string& name) {
  const Descriptor* d = zel::meta::findDescriptor(name);
  if (!d) throw ToolError("unknown export '" + name + "' (zelcc list shows the names)");
  return *d;
}

int listExports(const std::string& pattern) {
  int shown = 0;
  for (const Descriptor& d : zel::meta::allDescriptors())
    if (pattern.empty() || matchesPattern(d.name, pattern)) {
      std::cout << d.name << "\n";
      ++shown;
    }
  if (shown == 0) throw ToolError("no export matches '" + pattern + "'");
  return 0;
}

const char* channelText(int channels) {
  static const char* names[] = {"", "gray", "gray and alpha", "RGB", "RGBA"};
  return names[channels];
}

int runExport(const RunOptions& o) {
  const Descriptor& d = exportNamed(o.name);
  if (!d.isImageFunction()) throw ToolError(d.name + " converts no images; zelcc info " + d.name + " shows it");
  const FamilyArguments family = resolveFamilyArguments(d, o.args);

  Picture picture;
  if (!o.input.empty()) {
    picture = readImage(o.input);
    if (o.sizeGiven) picture = resized(picture, o.width, o.height);
  } else {
    picture = makeTestCard(o.width, o.height);
  }
  const ImageSize size{picture.width, picture.height};

  zel::meta::Workspace ws(d, size);
  fillSources(ws, picture, readsMosaic(d) ? mosaicGrid(d, family.values) : -1);
  ws.fillDestinations(0);
  std::vector<zel::meta::Arg> args = ws.arguments(&family.values);
  for (size_t i = 0; i < d.slots.size() && i < args.size(); ++i)
    if (d.slots[i].role == zel::meta::Role::Extra) {
      auto it = family.arrays.find(d.slots[i].extra);
      if (it != family.arrays.end()) args[i].p = it->second.data();
    }

  const auto start = std::chrono::steady_clock::now();
  const Status status = ws.call(args);
  const double ms = std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - start).count();
  std::printf("%s %dx%d: %s in %.3f ms\n", d.name.c_str(), size.width, size.height, statusName(status).c_str(), ms);
  std::fflush(stdout);

  const std::string damage = ws.checkGuards();
  if (!damage.empty()) throw ToolError(d.name + " wrote outside its images: " + damage);
  if (status < 0)
    throw ToolError(d.name + " returned " + statusName(status) + " (" + std::to_string(int(status)) + ") at " +
                    std::to_string(size.width) + "x" + std::to_string(size.height) + "; nothing written");

  const Outputs outputs = destinationImages(ws, family.values);
  for (const OutputImage& img : outputs.images) {
    const std::string path = o.outPrefix + img.suffix + ".png";
    writePng(path, img.picture);
    std::printf("wrote %s (%dx%d %s, %d-bit)\n", path.c_str(), img.picture.width, img.picture.height,
                channelText(img.picture.channels), img.picture.depth);
  }
  if (!outputs.note.empty()) std::printf("note: %s\n", outputs.note.c_str());
  return 0;
}

int writeDoc(const std::string& path) {
  const std::string text = exportsMarkdown();
  if (path.empty()) {
    std::cout << text;
    return 0;
  }
  std::ofstream out(path, std::ios::binary);
  out << text;
  out.close();
  if (!out) throw ToolError("cannot write " + path);
  return 0;
}

int run(const std::vector<std::string>& args) {
  const CommandLine c = parseCommandLine(args);
  switch (c.command) {
    case Command::Usage: std::fputs(kUsage, stdout); return 2;
    case Command::Help: std::fputs(kUsage, stdout); return 0;
    case Command::Version: std::fputs(describeVersion().c_str() + 2, stdout); return 0;
    case Command::List: return listExports(c.pattern);
    case Command::Info: std::cout << describeExport(exportNamed(c.name)); return 0;
    case Command::Doc: return writeDoc(c.docFile);
    case Command::Run: return runExport(c.run);
  }
  return 2;
}

void fail(const std::string& message, const char* hint = "") {
  std::string line = message;
  for (char& ch : line)
    if (ch == '\n' || ch == '\r') ch = ' ';
  std::fprintf(stderr, "zelcc: %s%s\n", line.c_str(), hint);
}

}  // namespace

int main(int argc, char** argv) {
  try {
    return run(std::vector<std::string>(argv + 1, argv + argc));
  } catch (const UsageError& e) {
    fail(e.what(), " (zelcc --help shows the usage)");
    return 2;
  } catch (const ToolError& e) {
    fail(e.what());
  } catch (const std::bad_alloc&) {
    fail("out of memory");
  } catch (const std::exception& e) {
    fail(e.what());
  }
  return 1;
}
