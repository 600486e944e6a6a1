// Eight threads call a random mix of exports, each on images of its own, for
// a short while; every call must give the bytes that the same call gives on
// one thread. ZELCC_STRESS_SECONDS sets the duration (default 2).
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <mutex>
#include <random>
#include <thread>

#include "frame/descriptor.h"

namespace {

using namespace zel::meta;

struct Job {
  const Descriptor* d;
  ImageSize size;
  int pad, offset;
  uint32_t seed;
};

struct Result {
  Status status;
  std::vector<uint8_t> bytes;  // the rows of every buffer, one after another
  std::string stray;           // a byte changed outside the rows
};

Result run(const Job& j) {
  Workspace w(*j.d, j.size, j.pad, j.offset);
  w.fillRandom(j.seed);
  w.fillDestinations(uint8_t(j.seed >> 3));
  Result r;
  r.status = w.call();
  for (const Workspace::Buffer& b : w.buffers())
    for (int y = 0; y < b.geometry.rows; ++y) {
      const uint8_t* row = b.first + ptrdiff_t(y) * b.pitch;
      r.bytes.insert(r.bytes.end(), row, row + b.geometry.rowBytes);
    }
  r.stray = w.checkGuards();
  return r;
}

// Two calls of every export: one small, one a few blocks wide and high
// enough for row pairs and buffered rows.
std::vector<Job> jobs() {
  std::vector<Job> out;
  std::mt19937 rng(2024);
  for (const Descriptor& d : allDescriptors()) {
    if (!d.isImageFunction()) continue;
    const int small = 1 + int(rng() % 40), wide = 64 + int(rng() % 200);
    out.push_back({&d, d.validSize(small, 1 + int(rng() % 4)), 0, 0, uint32_t(rng())});
    out.push_back({&d, d.validSize(wide, 6 + int(rng() % 12)), int(rng() % 2) * 7, int(rng() % 2) * 3, uint32_t(rng())});
  }
  return out;
}

double stressSeconds() {
  const char* s = std::getenv("ZELCC_STRESS_SECONDS");
  return s ? std::atof(s) : 2.0;
}

TEST(Threads, ConcurrentCallsGiveTheSingleThreadedBytes) {
  const std::vector<Job> all = jobs();
  std::vector<Result> expected;
  for (const Job& j : all) expected.push_back(run(j));

  constexpr int kThreads = 8;
  const auto deadline = std::chrono::steady_clock::now() + std::chrono::duration<double>(stressSeconds());
  std::atomic<long> calls{0};
  std::atomic<int> mismatches{0};
  std::mutex lock;
  std::vector<std::string> reports;
  std::vector<long> perThread(kThreads, 0);
  std::vector<std::thread> threads;
  for (int t = 0; t < kThreads; ++t)
    threads.emplace_back([&, t] {
      std::mt19937 rng(uint32_t(t) * 7919u + 1);
      long mine = 0;
      while (std::chrono::steady_clock::now() < deadline) {
        const size_t k = rng() % all.size();
        const Result r = run(all[k]);
        ++mine;
        if (r.status == expected[k].status && r.bytes == expected[k].bytes && r.stray.empty()) continue;
        if (mismatches.fetch_add(1) < 10) {
          std::lock_guard<std::mutex> g(lock);
          reports.push_back(all[k].d->name + " " + std::to_string(all[k].size.width) + "x" +
                            std::to_string(all[k].size.height) + ": status " + std::to_string(r.status) + " vs " +
                            std::to_string(expected[k].status) + ", bytes " +
                            (r.bytes == expected[k].bytes ? "equal" : "differ") + " " + r.stray);
        }
      }
      perThread[t] = mine;
      calls += mine;
    });
  for (std::thread& th : threads) th.join();

  for (const std::string& r : reports) ADD_FAILURE() << r;
  EXPECT_EQ(mismatches.load(), 0);
  for (int t = 0; t < kThreads; ++t) EXPECT_GT(perThread[t], 0) << "thread " << t << " made no call";
  std::printf("%d threads made %ld calls\n", kThreads, calls.load());
}

}  // namespace
