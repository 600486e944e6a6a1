// Images for kernel tests: rows with a chosen misalignment and padding,
// guard bytes around them, random content from a seed.
#pragma once

#include <cstdint>
#include <cstring>
#include <random>
#include <vector>

namespace zel::test {

template <typename T>
class TestImage {
 public:
  static constexpr uint8_t kGuard = 0xC5;
  // `rowSamples` samples of T per row; the first sample sits `offset` bytes
  // past a 64-byte boundary; `pad` bytes follow every row.
  TestImage(int rowSamples, int rows, int offset = 0, int pad = 0)
      : rowSamples_(rowSamples), rows_(rows), step_(rowSamples * int(sizeof(T)) + pad) {
    storage_.assign(size_t(step_) * (rows > 0 ? rows : 1) + 256 + offset, kGuard);
    uint8_t* base = storage_.data() + 64;
    base += (64 - (reinterpret_cast<uintptr_t>(base) & 63u)) & 63u;
    first_ = base + offset;
  }
  T* data() { return reinterpret_cast<T*>(first_); }
  const T* data() const { return reinterpret_cast<const T*>(first_); }
  int step() const { return step_; }
  T* row(int y) { return reinterpret_cast<T*>(first_ + ptrdiff_t(y) * step_); }
  const T* row(int y) const { return reinterpret_cast<const T*>(first_ + ptrdiff_t(y) * step_); }
  T get(int x, int y) const {
    T v;
    std::memcpy(&v, first_ + ptrdiff_t(y) * step_ + ptrdiff_t(x) * ptrdiff_t(sizeof(T)), sizeof(T));
    return v;
  }
  void set(int x, int y, T v) { std::memcpy(first_ + ptrdiff_t(y) * step_ + ptrdiff_t(x) * ptrdiff_t(sizeof(T)), &v, sizeof(T)); }
  // Random samples; floats uniform in [lo, hi].
  void fillRandom(uint32_t seed, double lo = 0, double hi = 1) {
    std::mt19937 rng(seed);
    for (int y = 0; y < rows_; ++y)
      for (int x = 0; x < rowSamples_; ++x) {
        if constexpr (std::is_floating_point_v<T>) {
          std::uniform_real_distribution<double> dist(lo, hi);
          set(x, y, T(dist(rng)));
        } else {
          T v;
          const uint64_t r = (uint64_t(rng()) << 32) | rng();
          std::memcpy(&v, &r, sizeof(T));
          set(x, y, v);
        }
      }
  }
  void fill(T v) {
    for (int y = 0; y < rows_; ++y)
      for (int x = 0; x < rowSamples_; ++x) set(x, y, v);
  }
  // True when no byte outside the rows' samples changed.
  bool guardsIntact() const {
    const uint8_t* p = storage_.data();
    const size_t rowBytes = size_t(rowSamples_) * sizeof(T);
    for (size_t i = 0; i < storage_.size(); ++i) {
      const uint8_t* at = p + i;
      if (at >= first_ && at < first_ + size_t(rows_ > 0 ? rows_ : 0) * step_) {
        const size_t inRow = size_t(at - first_) % size_t(step_);
        if (inRow < rowBytes) continue;
      }
      if (*at != kGuard) return false;
    }
    return true;
  }
  int rowSamples() const { return rowSamples_; }
  int rows() const { return rows_; }

 private:
  int rowSamples_, rows_, step_;
  std::vector<uint8_t> storage_;
  uint8_t* first_;
};

}  // namespace zel::test
