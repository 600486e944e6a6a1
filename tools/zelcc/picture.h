// An image as the tool reads, generates and writes it: gray, gray with
// alpha, RGB or RGBA, with 8 or 16 bits a sample.
#pragma once

#include <cstdint>
#include <stdexcept>
#include <string>
#include <vector>

namespace zel::tool {

// Every failure the tool reports: one line, shown after "zelcc: ".
class ToolError : public std::runtime_error {
 public:
  explicit ToolError(const std::string& message) : std::runtime_error(message) {}
};

// Images the tool accepts or makes: no side above kMaxSide, no more than
// kMaxPixels pixels.
constexpr int kMaxSide = 16384;
constexpr int64_t kMaxPixels = int64_t(1) << 24;

struct Picture {
  int width = 0;
  int height = 0;
  int channels = 0;  // 1 gray, 2 gray and alpha, 3 RGB, 4 RGBA
  int depth = 8;     // bits a sample, 8 or 16
  std::vector<uint16_t> samples;  // rows top down, channels interleaved

  Picture() = default;
  Picture(int w, int h, int c, int d) : width(w), height(h), channels(c), depth(d), samples(size_t(w) * h * c, 0) {}

  uint16_t maxValue() const { return depth == 16 ? 65535 : 255; }
  uint16_t& at(int x, int y, int c) { return samples[(size_t(y) * width + x) * channels + c]; }
  uint16_t at(int x, int y, int c) const { return samples[(size_t(y) * width + x) * channels + c]; }
  bool hasColour() const { return channels >= 3; }
  bool hasAlpha() const { return channels == 2 || channels == 4; }

  // A sample on the 16-bit scale (8-bit samples times 257), by meaning:
  // 0 red, 1 green, 2 blue, 3 alpha; a gray picture answers its gray for
  // all three colours and full alpha where it has none.
  uint16_t wide(int x, int y, int meaning) const {
    int c;
    if (meaning == 3) {
      if (!hasAlpha()) return 65535;
      c = channels - 1;
    } else {
      c = hasColour() ? meaning : 0;
    }
    const uint16_t v = at(x, y, c);
    return depth == 16 ? v : uint16_t(v * 257);
  }
  // Luma on the 16-bit scale, weights 0.299, 0.587, 0.114.
  uint16_t luma(int x, int y) const {
    if (!hasColour()) return wide(x, y, 0);
    const uint32_t sum = 19595u * wide(x, y, 0) + 38470u * wide(x, y, 1) + 7471u * wide(x, y, 2);
    return uint16_t((sum + 32768u) >> 16);
  }
};

// Throws unless width and height are within the tool's limits.
void checkDimensions(int64_t width, int64_t height, const std::string& what);

// Nearest-neighbour resampling to another size.
Picture resized(const Picture& p, int width, int height);

}  // namespace zel::tool
