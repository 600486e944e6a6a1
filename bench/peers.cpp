#include "peers.h"

#include <cstring>
#include <map>
#include <memory>

#ifdef ZELCC_BENCH_OPENCV
#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>
#endif
#ifdef ZELCC_BENCH_LIBYUV
#include <libyuv.h>
#endif

namespace zel::bench {

namespace {

std::vector<uint8_t> frameBytes(size_t n) {
  std::vector<uint8_t> v(n);
  for (size_t i = 0; i < n; ++i) v[i] = uint8_t(i * 2654435761u >> 24);
  return v;
}

// A copy of the destination's bytes: the floor any conversion pays.
Peer memcpyPeer(size_t srcBytes, size_t dstBytes) {
  auto src = std::make_shared<std::vector<uint8_t>>(frameBytes(std::max(srcBytes, dstBytes)));
  auto dst = std::make_shared<std::vector<uint8_t>>(dstBytes);
  return {"memcpy of the output bytes", [src, dst] { std::memcpy(dst->data(), src->data(), dst->size()); }};
}

#ifdef ZELCC_BENCH_OPENCV
Peer cvtColorPeer(const char* label, int srcType, int dstType, int code) {
  auto src = std::make_shared<cv::Mat>(kHeight, kWidth, srcType);
  cv::randu(*src, 0, 255);
  auto dst = std::make_shared<cv::Mat>(kHeight, kWidth, dstType);
  return {label, [src, dst, code] { cv::cvtColor(*src, *dst, code); }};
}
#endif

using PeerFactory = std::function<std::vector<Peer>()>;

const std::map<std::string, PeerFactory>& table() {
  static const std::map<std::string, PeerFactory> t = {
      {"zeliGrayToRGB_8u_C1C3R",
       [] {
         std::vector<Peer> p;
#ifdef ZELCC_BENCH_OPENCV
         p.push_back(cvtColorPeer("OpenCV cvtColor GRAY2RGB", CV_8UC1, CV_8UC3, cv::COLOR_GRAY2RGB));
#endif
         p.push_back(memcpyPeer(size_t(kWidth) * kHeight, size_t(kWidth) * kHeight * 3));
         return p;
       }},
      {"zeliGrayToRGB_8u_C1C4R",
       [] {
         std::vector<Peer> p;
#ifdef ZELCC_BENCH_OPENCV
         p.push_back(cvtColorPeer("OpenCV cvtColor GRAY2RGBA", CV_8UC1, CV_8UC4, cv::COLOR_GRAY2RGBA));
#endif
#ifdef ZELCC_BENCH_LIBYUV
         auto src = std::make_shared<std::vector<uint8_t>>(frameBytes(size_t(kWidth) * kHeight));
         auto dst = std::make_shared<std::vector<uint8_t>>(size_t(kWidth) * kHeight * 4);
         p.push_back({"libyuv J400ToARGB", [src, dst] {
                        libyuv::J400ToARGB(src->data(), kWidth, dst->data(), kWidth * 4, kWidth, kHeight);
                      }});
#endif
         return p;
       }},
      {"zeliGrayToRGB_16u_C1C3R",
       [] {
         std::vector<Peer> p;
#ifdef ZELCC_BENCH_OPENCV
         p.push_back(cvtColorPeer("OpenCV cvtColor GRAY2RGB 16u", CV_16UC1, CV_16UC3, cv::COLOR_GRAY2RGB));
#endif
         return p;
       }},
      {"zeliGrayToRGB_32f_C1C3R",
       [] {
         std::vector<Peer> p;
#ifdef ZELCC_BENCH_OPENCV
         p.push_back(cvtColorPeer("OpenCV cvtColor GRAY2RGB 32f", CV_32FC1, CV_32FC3, cv::COLOR_GRAY2RGB));
#endif
         return p;
       }},
  };
  return t;
}

}  // namespace

std::vector<Peer> peersOf(const std::string& exportName) {
  auto it = table().find(exportName);
  return it == table().end() ? std::vector<Peer>{} : it->second();
}

std::vector<std::string> exportsWithPeers() {
  std::vector<std::string> out;
  for (const auto& [name, factory] : table()) out.push_back(name);
  return out;
}

}  // namespace zel::bench
