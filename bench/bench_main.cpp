// Times our exports on 1920x1080 frames, single thread, against the
// conversions of other libraries, and prints megapixels per second with the
// ratio ours / peer.
//
//   zelcc_bench                 every export that has a peer
//   zelcc_bench --all           every export
//   zelcc_bench --only=REGEX    exports whose name matches
//   zelcc_bench --wall          wall-clock time instead of the thread's CPU time
// Times are the benchmarking thread's CPU time by default: on a shared
// machine wall time also counts the time others hold the processor. Every
// call runs on this one thread (OpenCV is set to one thread), so on an idle
// machine the two agree.
// Google Benchmark's own flags (--benchmark_min_time=...) pass through; with
// --benchmark_repetitions=N --benchmark_enable_random_interleaving=true the
// runs of ours and the peers alternate, and the table keeps the best of N.
#include <benchmark/benchmark.h>

#include <cstdio>
#include <algorithm>
#include <cstring>
#include <map>
#include <memory>
#include <regex>
#include <string>
#include <utility>

#include "frame/descriptor.h"
#include "peers.h"

#ifdef ZELCC_BENCH_OPENCV
#include <opencv2/core.hpp>
#endif

namespace {

using namespace zel::meta;
using zel::bench::kHeight;
using zel::bench::kWidth;

constexpr double kMegapixels = double(kWidth) * kHeight / 1e6;

struct Result {
  double seconds = 0;  // per frame
};

// Collects the time of every run while printing nothing of its own.
class Collector : public benchmark::BenchmarkReporter {
 public:
  bool ReportContext(const Context&) override { return true; }
  void ReportRuns(const std::vector<Run>& runs) override {
    for (const Run& r : runs) {
      if (r.iterations <= 0 || r.error_occurred || r.run_type != Run::RT_Iteration) continue;
      // With --benchmark_repetitions=N the best of the N runs is kept: on a
      // shared machine the fastest run is the one least disturbed.
      const double seconds = (wall ? r.real_accumulated_time : r.cpu_accumulated_time) / double(r.iterations);
      Result& kept = results[r.run_name.function_name];
      if (kept.seconds == 0 || seconds < kept.seconds) kept.seconds = seconds;
    }
  }
  std::map<std::string, Result> results;
  bool wall = false;
};

struct Row {
  std::string exportName;
  std::vector<std::string> peerLabels;
};

// Named extra rows of one export: the same call with some family arguments
// set otherwise, for members whose speed depends on them (a dither kind).
struct Variant {
  std::string label;                                  // "fs"
  std::vector<std::pair<std::string, double>> values;  // family argument, value
};

std::vector<Variant> variantsOf(const Descriptor& d) {
  if (d.name.rfind("zeliReduceBits_8u1u", 0) == 0)
    return {{"threshold", {{"ditherKind", 0}}}, {"stucki", {{"ditherKind", 3}}}};
  if (d.name.rfind("zeliReduceBits_", 0) == 0)
    return {{"plain", {{"noise", 0}, {"ditherKind", 0}}},
            {"fs", {{"noise", 0}, {"ditherKind", 1}}},
            {"jjn", {{"noise", 0}, {"ditherKind", 2}}},
            {"stucki", {{"noise", 0}, {"ditherKind", 3}}},
            {"ordered", {{"noise", 0}, {"ditherKind", 4}}},
            {"fs noise", {{"noise", 30}, {"ditherKind", 1}}}};
  return {};
}

}  // namespace

int main(int argc, char** argv) {
  bool all = false, wall = false;
  std::string only;
  std::vector<char*> rest;
  for (int i = 0; i < argc; ++i) {
    if (std::strcmp(argv[i], "--all") == 0) all = true;
    else if (std::strcmp(argv[i], "--wall") == 0) wall = true;
    else if (std::strncmp(argv[i], "--only=", 7) == 0) only = argv[i] + 7;
    else rest.push_back(argv[i]);
  }
  int restCount = int(rest.size());
  benchmark::Initialize(&restCount, rest.data());
#ifdef ZELCC_BENCH_OPENCV
  cv::setNumThreads(1);
#endif

  std::vector<std::string> names;
  if (all || !only.empty()) {
    for (const Descriptor& d : allDescriptors())
      if (d.isImageFunction()) names.push_back(d.name);
  } else {
    names = zel::bench::exportsWithPeers();
  }
  if (!only.empty()) {
    const std::regex re(only);
    std::vector<std::string> kept;
    for (const auto& n : names)
      if (std::regex_search(n, re)) kept.push_back(n);
    names = kept;
  }

  std::vector<Row> rows;
  for (const std::string& name : names) {
    const Descriptor* d = findDescriptor(name);
    if (!d || !d->isImageFunction()) continue;
    Row row{name, {}};
    // Ours, through the generic argument list of the descriptor.
    auto ws = std::make_shared<Workspace>(*d, ImageSize{kWidth, kHeight});
    ws->fillRandom(1);
    auto args = std::make_shared<std::vector<Arg>>(ws->arguments());
    // A first call outside the timing: buffers a conversion touches for the
    // first time cost page faults that a caller's hot loop never pays.
    benchmark::RegisterBenchmark(name.c_str(), [ws, args](benchmark::State& state) {
      ws->call(*args);
      for (auto _ : state) {
        const Status s = ws->call(*args);
        if (s < 0) state.SkipWithError("the export returned an error");
      }
    })->Unit(benchmark::kMillisecond);
    std::vector<zel::bench::Peer> peers = zel::bench::peersOf(name);
    // Every export is also set against a copy of the bytes it writes.
    size_t outBytes = 0, inBytes = 0;
    for (Workspace::Buffer& b : ws->buffers()) {
      const size_t bytes = size_t(b.geometry.rowBytes) * b.geometry.rows;
      if (b.isDestination) outBytes += bytes;
      else if (b.isSource) inBytes += bytes;
    }
    if (std::none_of(peers.begin(), peers.end(), [](const zel::bench::Peer& p) { return p.label.rfind("memcpy", 0) == 0; })) {
      peers.push_back(zel::bench::memcpyPeer(outBytes));
      // A conversion that reads twice what it writes or more is also set
      // against a copy of what it reads.
      if (inBytes >= 2 * outBytes) peers.push_back(zel::bench::memcpyPeer(inBytes, "memcpy of the input bytes"));
    }
    if (d->streams) peers.push_back(zel::bench::streamingMemcpyPeer(outBytes));
    for (zel::bench::Peer& peer : peers) {
      const std::string id = name + " | " + peer.label;
      row.peerLabels.push_back(peer.label);
      auto run = std::make_shared<std::function<void()>>(peer.run);
      benchmark::RegisterBenchmark(id.c_str(), [run](benchmark::State& state) {
        (*run)();
        for (auto _ : state) (*run)();
      })->Unit(benchmark::kMillisecond);
    }
    rows.push_back(row);
    for (const Variant& v : variantsOf(*d)) {
      std::vector<double> values;
      for (const Extra& e : d->extras) values.push_back(e.good);
      for (const auto& [argName, value] : v.values)
        for (size_t k = 0; k < d->extras.size(); ++k)
          if (d->extras[k].name == argName) values[k] = value;
      auto vargs = std::make_shared<std::vector<Arg>>(ws->arguments(&values));
      const std::string id = name + " [" + v.label + "]";
      benchmark::RegisterBenchmark(id.c_str(), [ws, vargs](benchmark::State& state) {
        ws->call(*vargs);
        for (auto _ : state) {
          const Status s = ws->call(*vargs);
          if (s < 0) state.SkipWithError("the export returned an error");
        }
      })->Unit(benchmark::kMillisecond)->UseRealTime();
      rows.push_back(Row{id, {}});
    }
  }

  Collector collector;
  collector.wall = wall;
  benchmark::RunSpecifiedBenchmarks(&collector);

  std::printf("\n%dx%d, single thread, megapixels per second (%s)\n\n", kWidth, kHeight,
              wall ? "wall-clock time" : "the thread's CPU time");
  std::printf("| export | ours MP/s | peer | peer MP/s | ours/peer |\n|---|---:|---|---:|---:|\n");
  for (const Row& row : rows) {
    auto ours = collector.results.find(row.exportName);
    if (ours == collector.results.end()) continue;
    const double oursMps = kMegapixels / ours->second.seconds;
    if (row.peerLabels.empty()) {
      std::printf("| %s | %.1f | - | - | - |\n", row.exportName.c_str(), oursMps);
      continue;
    }
    for (const std::string& label : row.peerLabels) {
      auto peer = collector.results.find(row.exportName + " | " + label);
      if (peer == collector.results.end()) continue;
      const double peerMps = kMegapixels / peer->second.seconds;
      std::printf("| %s | %.1f | %s | %.1f | %.2f |\n", row.exportName.c_str(), oursMps, label.c_str(), peerMps,
                  oursMps / peerMps);
    }
  }
  return 0;
}
