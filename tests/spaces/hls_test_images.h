// Images for the HLS tests: one interleaved image or a set of planes with
// a shared step, addressed by pixel and channel alike, and colour content
// that hits the cases the formulas branch on (grey pixels, ties of the
// largest channel) as well as random colours.
#pragma once

#include <cstdint>
#include <memory>
#include <random>
#include <vector>

#include "support/test_image.h"
#include "zelcc/zelcc.h"

namespace zel::test {

template <typename T>
class ChannelImage {
 public:
  // channels 3 or 4; planar: one image a channel.
  ChannelImage(bool planar, int channels, int width, int height, int offset, int pad)
      : planar_(planar), channels_(channels), width_(width), height_(height) {
    if (planar)
      for (int c = 0; c < channels; ++c) planes_.push_back(std::make_unique<TestImage<T>>(width, height, offset, pad));
    else
      planes_.push_back(std::make_unique<TestImage<T>>(width * channels, height, offset, pad));
  }
  T get(int x, int y, int c) const {
    return planar_ ? planes_[c]->get(x, y) : planes_[0]->get(x * channels_ + c, y);
  }
  void set(int x, int y, int c, T v) {
    if (planar_) planes_[c]->set(x, y, v);
    else planes_[0]->set(x * channels_ + c, y, v);
  }
  T* data() { return planes_[0]->data(); }
  int step() const { return planes_[0]->step(); }
  // Plane pointers (four entries; unused ones null).
  T* const* planes() {
    for (size_t c = 0; c < 4; ++c) pointers_[c] = c < planes_.size() ? planes_[c]->data() : nullptr;
    return pointers_;
  }
  bool guardsIntact() const {
    for (const auto& p : planes_)
      if (!p->guardsIntact()) return false;
    return true;
  }
  int channels() const { return channels_; }
  int width() const { return width_; }
  int height() const { return height_; }

 private:
  bool planar_;
  int channels_, width_, height_;
  std::vector<std::unique_ptr<TestImage<T>>> planes_;
  T* pointers_[4] = {};
};

// A sample of the type's full range, or a float in 0..1.
template <typename T>
T randomSample(std::mt19937& rng) {
  if constexpr (std::is_same_v<T, float>) return std::uniform_real_distribution<float>(0.0f, 1.0f)(rng);
  else return T(rng());
}

// Colour pixels: one in eight grey, one in eight with two channels tied
// at the top, the rest random; the fourth channel random.
template <typename T>
void fillColours(ChannelImage<T>& img, uint32_t seed) {
  std::mt19937 rng(seed);
  for (int y = 0; y < img.height(); ++y)
    for (int x = 0; x < img.width(); ++x) {
      T v[4];
      for (T& s : v) s = randomSample<T>(rng);
      const uint32_t kind = rng() % 8;
      if (kind == 0) v[1] = v[2] = v[0];
      if (kind == 1) v[(rng() % 3 + 1) % 3] = v[rng() % 3];  // ties in any order
      for (int c = 0; c < img.channels(); ++c) img.set(x, y, c, v[c]);
    }
}

// HLS pixels: one in eight with zero saturation, some hues at the ends of
// the range; for floats a few values past 0..1 as well.
template <typename T>
void fillHls(ChannelImage<T>& img, uint32_t seed) {
  std::mt19937 rng(seed);
  for (int y = 0; y < img.height(); ++y)
    for (int x = 0; x < img.width(); ++x) {
      T v[4];
      for (T& s : v) s = randomSample<T>(rng);
      const uint32_t kind = rng() % 16;
      if constexpr (std::is_same_v<T, float>) {
        if (kind < 2) v[2] = 0.0f;
        if (kind == 2) v[0] = 1.0f;
        if (kind == 3) v[0] = 0.0f;
        if (kind == 4) v[0] = 1.25f;
        if (kind == 5) v[1] = -0.125f;
      } else {
        const T zero = std::is_signed_v<T> ? T(-32768) : T(0);
        const T top = T(std::is_signed_v<T> ? 32767 : (sizeof(T) == 1 ? 255 : 65535));
        if (kind < 2) v[2] = zero;
        if (kind == 2) v[0] = top;
        if (kind == 3) v[0] = zero;
        if (kind == 4) v[1] = top;
      }
      for (int c = 0; c < img.channels(); ++c) img.set(x, y, c, v[c]);
    }
}

}  // namespace zel::test
