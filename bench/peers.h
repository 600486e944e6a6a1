// Conversions of other libraries that do what one of our exports does, run
// on the same frame size.
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace zel::bench {

constexpr int kWidth = 1920;
constexpr int kHeight = 1080;

struct Peer {
  std::string label;          // "OpenCV cvtColor GRAY2RGB"
  std::function<void()> run;  // converts one frame; buffers live in the closure
};

// The peers of one export (none when no other library does the same).
std::vector<Peer> peersOf(const std::string& exportName);
// A copy of `bytes` bytes: the floor any conversion writing them pays (or,
// for a conversion that reads more than it writes, reading them).
Peer memcpyPeer(size_t bytes, const char* label = "memcpy of the output bytes");
// The same copy with streaming stores, the floor of the exports whose large
// frames stream their output past the cache.
Peer streamingMemcpyPeer(size_t bytes);
// Exports that have at least one peer.
std::vector<std::string> exportsWithPeers();

}  // namespace zel::bench
