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


#ifdef ZELCC_BENCH_OPENCV
Peer cvtColorPeer(const char* label, int srcType, int dstType, int code) {
  auto src = std::make_shared<cv::Mat>(kHeight, kWidth, srcType);
  cv::randu(*src, 0, 255);
  auto dst = std::make_shared<cv::Mat>(kHeight, kWidth, dstType);
  return {label, [src, dst, code] { cv::cvtColor(*src, *dst, code); }};
}
#endif

#ifdef ZELCC_BENCH_LIBYUV
// A frame's planes for libyuv: luma, two chroma planes (or one pair plane)
// and a packed 4:2:2 stream, all of the frame size.
struct YuvFrame {
  std::vector<uint8_t> y = frameBytes(size_t(kWidth) * kHeight);
  std::vector<uint8_t> u = frameBytes(size_t(kWidth / 2) * kHeight);
  std::vector<uint8_t> v = frameBytes(size_t(kWidth / 2) * kHeight);
  std::vector<uint8_t> uv = frameBytes(size_t(kWidth) * kHeight);
  std::vector<uint8_t> packed = frameBytes(size_t(kWidth) * 2 * kHeight);
  std::vector<uint8_t> y2 = std::vector<uint8_t>(size_t(kWidth) * kHeight);
  std::vector<uint8_t> u2 = std::vector<uint8_t>(size_t(kWidth / 2) * kHeight);
  std::vector<uint8_t> v2 = std::vector<uint8_t>(size_t(kWidth / 2) * kHeight);
  std::vector<uint8_t> uv2 = std::vector<uint8_t>(size_t(kWidth) * kHeight);
  std::vector<uint8_t> packed2 = std::vector<uint8_t>(size_t(kWidth) * 2 * kHeight);
  std::vector<uint8_t> u444 = frameBytes(size_t(kWidth) * kHeight);
  std::vector<uint8_t> v444 = frameBytes(size_t(kWidth) * kHeight);
  std::vector<uint8_t> argb = frameBytes(size_t(kWidth) * 4 * kHeight);
};

template <typename Call>
std::vector<Peer> yuvPeer(const char* label, Call call) {
  auto f = std::make_shared<YuvFrame>();
  return {Peer{label, [f, call] { call(*f); }}};
}
#endif

using PeerFactory = std::function<std::vector<Peer>()>;

const std::map<std::string, PeerFactory>& table() {
  static const std::map<std::string, PeerFactory> t = {
      {"zeliCFAToRGB_8u_C1C3R",
       [] {
         std::vector<Peer> p;
#ifdef ZELCC_BENCH_OPENCV
         p.push_back(cvtColorPeer("OpenCV cvtColor BayerBG2RGB", CV_8UC1, CV_8UC3, cv::COLOR_BayerBG2RGB));
#endif
         return p;
       }},
      {"zeliCFAToRGB_16u_C1C3R",
       [] {
         std::vector<Peer> p;
#ifdef ZELCC_BENCH_OPENCV
         p.push_back(cvtColorPeer("OpenCV cvtColor BayerBG2RGB", CV_16UC1, CV_16UC3, cv::COLOR_BayerBG2RGB));
#endif
         return p;
       }},
      {"zeliDemosaicAHD_8u_C1C3R",
       [] {
         std::vector<Peer> p;
#ifdef ZELCC_BENCH_OPENCV
         p.push_back(cvtColorPeer("OpenCV cvtColor BayerBG2RGB_EA", CV_8UC1, CV_8UC3, cv::COLOR_BayerBG2RGB_EA));
         p.push_back(cvtColorPeer("OpenCV cvtColor BayerBG2RGB_VNG", CV_8UC1, CV_8UC3, cv::COLOR_BayerBG2RGB_VNG));
#endif
         return p;
       }},
      {"zeliDemosaicAHD_16u_C1C3R",
       [] {
         std::vector<Peer> p;
#ifdef ZELCC_BENCH_OPENCV
         p.push_back(cvtColorPeer("OpenCV cvtColor BayerBG2RGB_EA", CV_16UC1, CV_16UC3, cv::COLOR_BayerBG2RGB_EA));
#endif
         return p;
       }},
      {"zeliGrayToRGB_8u_C1C3R",
       [] {
         std::vector<Peer> p;
#ifdef ZELCC_BENCH_OPENCV
         p.push_back(cvtColorPeer("OpenCV cvtColor GRAY2RGB", CV_8UC1, CV_8UC3, cv::COLOR_GRAY2RGB));
#endif
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
#ifdef ZELCC_BENCH_OPENCV
      {"zeliRGBToYCbCr_8u_C3R",
       [] { return std::vector<Peer>{cvtColorPeer("OpenCV cvtColor RGB2YCrCb", CV_8UC3, CV_8UC3, cv::COLOR_RGB2YCrCb)}; }},
      {"zeliRGBToYCbCr_8u_AC4R",
       [] { return std::vector<Peer>{cvtColorPeer("OpenCV cvtColor RGBA2YCrCb", CV_8UC4, CV_8UC3, cv::COLOR_RGB2YCrCb)}; }},
      {"zeliRGBToYUV420_8u_C3P3R",
       [] { return std::vector<Peer>{cvtColorPeer("OpenCV cvtColor RGB2YUV_I420", CV_8UC3, CV_8UC1, cv::COLOR_RGB2YUV_I420)}; }},
      {"zeliYCbCrToRGB_8u_C3R",
       [] { return std::vector<Peer>{cvtColorPeer("OpenCV cvtColor YCrCb2RGB", CV_8UC3, CV_8UC3, cv::COLOR_YCrCb2RGB)}; }},
      {"zeliYCbCrToRGB_8u_AC4R",
       [] { return std::vector<Peer>{cvtColorPeer("OpenCV cvtColor YCrCb2RGB", CV_8UC3, CV_8UC3, cv::COLOR_YCrCb2RGB)}; }},
#endif
#ifdef ZELCC_BENCH_LIBYUV
      {"zeliRGBToYCbCr_8u_AC4P3R",
       [] {
         return yuvPeer("libyuv ARGBToI444", [](YuvFrame& f) {
           libyuv::ARGBToI444(f.argb.data(), kWidth * 4, f.y2.data(), kWidth, f.u444.data(), kWidth, f.v444.data(),
                              kWidth, kWidth, kHeight);
         });
       }},
      {"zeliYCbCrToBGR_8u_P3C4R",
       [] {
         return yuvPeer("libyuv I444ToARGB", [](YuvFrame& f) {
           libyuv::I444ToARGB(f.y.data(), kWidth, f.u444.data(), kWidth, f.v444.data(), kWidth, f.argb.data(),
                              kWidth * 4, kWidth, kHeight);
         });
       }},
      {"zeliYCbCrToBGR_709CSC_8u_P3C4R",
       [] {
         return yuvPeer("libyuv H444ToARGB", [](YuvFrame& f) {
           libyuv::H444ToARGB(f.y.data(), kWidth, f.u444.data(), kWidth, f.v444.data(), kWidth, f.argb.data(),
                              kWidth * 4, kWidth, kHeight);
         });
       }},
      {"zeliYCbCrToBGR_8u_P3C3R",
       [] {
         return yuvPeer("libyuv I444ToRGB24", [](YuvFrame& f) {
           libyuv::I444ToRGB24(f.y.data(), kWidth, f.u444.data(), kWidth, f.v444.data(), kWidth, f.argb.data(),
                               kWidth * 3, kWidth, kHeight);
         });
       }},
      {"zeliYCbCrToRGB_8u_P3C3R",
       [] {
         return yuvPeer("libyuv I444ToRAW", [](YuvFrame& f) {
           libyuv::I444ToRAW(f.y.data(), kWidth, f.u444.data(), kWidth, f.v444.data(), kWidth, f.argb.data(),
                             kWidth * 3, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr422ToYCbCr420_8u_C2P3R",
       [] {
         return yuvPeer("libyuv YUY2ToI420", [](YuvFrame& f) {
           libyuv::YUY2ToI420(f.packed.data(), kWidth * 2, f.y2.data(), kWidth, f.u2.data(), kWidth / 2, f.v2.data(),
                              kWidth / 2, kWidth, kHeight);
         });
       }},
      {"zeliCbYCr422ToYCbCr420_8u_C2P3R",
       [] {
         return yuvPeer("libyuv UYVYToI420", [](YuvFrame& f) {
           libyuv::UYVYToI420(f.packed.data(), kWidth * 2, f.y2.data(), kWidth, f.u2.data(), kWidth / 2, f.v2.data(),
                              kWidth / 2, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr422_8u_C2P3R",
       [] {
         return yuvPeer("libyuv YUY2ToI422", [](YuvFrame& f) {
           libyuv::YUY2ToI422(f.packed.data(), kWidth * 2, f.y2.data(), kWidth, f.u2.data(), kWidth / 2, f.v2.data(),
                              kWidth / 2, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr422_8u_P3C2R",
       [] {
         return yuvPeer("libyuv I422ToYUY2", [](YuvFrame& f) {
           libyuv::I422ToYUY2(f.y.data(), kWidth, f.u.data(), kWidth / 2, f.v.data(), kWidth / 2, f.packed2.data(),
                              kWidth * 2, kWidth, kHeight);
         });
       }},
      {"zeliYCrCb420ToYCbCr422_8u_P3C2R",
       [] {
         return yuvPeer("libyuv I420ToYUY2", [](YuvFrame& f) {
           libyuv::I420ToYUY2(f.y.data(), kWidth, f.u.data(), kWidth / 2, f.v.data(), kWidth / 2, f.packed2.data(),
                              kWidth * 2, kWidth, kHeight);
         });
       }},
      {"zeliYCrCb420ToCbYCr422_8u_P3C2R",
       [] {
         return yuvPeer("libyuv I420ToUYVY", [](YuvFrame& f) {
           libyuv::I420ToUYVY(f.y.data(), kWidth, f.u.data(), kWidth / 2, f.v.data(), kWidth / 2, f.packed2.data(),
                              kWidth * 2, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr420ToYCbCr422_8u_P3R",
       [] {
         return yuvPeer("libyuv I420ToI422", [](YuvFrame& f) {
           libyuv::I420ToI422(f.y.data(), kWidth, f.u.data(), kWidth / 2, f.v.data(), kWidth / 2, f.y2.data(), kWidth,
                              f.u2.data(), kWidth / 2, f.v2.data(), kWidth / 2, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr420_8u_P2P3R",
       [] {
         return yuvPeer("libyuv NV12ToI420", [](YuvFrame& f) {
           libyuv::NV12ToI420(f.y.data(), kWidth, f.uv.data(), kWidth, f.y2.data(), kWidth, f.u2.data(), kWidth / 2,
                              f.v2.data(), kWidth / 2, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr420_8u_P3P2R",
       [] {
         return yuvPeer("libyuv I420ToNV12", [](YuvFrame& f) {
           libyuv::I420ToNV12(f.y.data(), kWidth, f.u.data(), kWidth / 2, f.v.data(), kWidth / 2, f.y2.data(), kWidth,
                              f.uv2.data(), kWidth, kWidth, kHeight);
         });
       }},
      // RGB or BGR to subsampled YCbCr: libyuv's RGB24 holds B, G, R bytes,
      // its RAW R, G, B; ARGB holds B, G, R, A.
      {"zeliBGRToYCbCr420_8u_C3P3R",
       [] {
         return yuvPeer("libyuv RGB24ToI420", [](YuvFrame& f) {
           libyuv::RGB24ToI420(f.argb.data(), kWidth * 3, f.y2.data(), kWidth, f.u2.data(), kWidth / 2, f.v2.data(),
                               kWidth / 2, kWidth, kHeight);
         });
       }},
      {"zeliRGBToYCbCr420_8u_C3P3R",
       [] {
         auto p = yuvPeer("libyuv RAWToI420", [](YuvFrame& f) {
           libyuv::RAWToI420(f.argb.data(), kWidth * 3, f.y2.data(), kWidth, f.u2.data(), kWidth / 2, f.v2.data(),
                             kWidth / 2, kWidth, kHeight);
         });
#ifdef ZELCC_BENCH_OPENCV
         p.push_back(cvtColorPeer("OpenCV cvtColor RGB2YUV_I420", CV_8UC3, CV_8UC1, cv::COLOR_RGB2YUV_I420));
#endif
         return p;
       }},
      {"zeliBGRToYCbCr420_8u_AC4P3R",
       [] {
         return yuvPeer("libyuv ARGBToI420", [](YuvFrame& f) {
           libyuv::ARGBToI420(f.argb.data(), kWidth * 4, f.y2.data(), kWidth, f.u2.data(), kWidth / 2, f.v2.data(),
                              kWidth / 2, kWidth, kHeight);
         });
       }},
      {"zeliRGBToYCbCr420_8u_C4P2R",
       [] {
         return yuvPeer("libyuv ABGRToNV12", [](YuvFrame& f) {
           libyuv::ABGRToNV12(f.argb.data(), kWidth * 4, f.y2.data(), kWidth, f.uv2.data(), kWidth, kWidth, kHeight);
         });
       }},
      {"zeliBGRToYCbCr422_8u_AC4P3R",
       [] {
         return yuvPeer("libyuv ARGBToI422", [](YuvFrame& f) {
           libyuv::ARGBToI422(f.argb.data(), kWidth * 4, f.y2.data(), kWidth, f.u2.data(), kWidth / 2, f.v2.data(),
                              kWidth / 2, kWidth, kHeight);
         });
       }},
      {"zeliBGRToYCbCr422_8u_AC4C2R",
       [] {
         return yuvPeer("libyuv ARGBToYUY2", [](YuvFrame& f) {
           libyuv::ARGBToYUY2(f.argb.data(), kWidth * 4, f.packed2.data(), kWidth * 2, kWidth, kHeight);
         });
       }},
      {"zeliBGRToCbYCr422_8u_AC4C2R",
       [] {
         return yuvPeer("libyuv ARGBToUYVY", [](YuvFrame& f) {
           libyuv::ARGBToUYVY(f.argb.data(), kWidth * 4, f.packed2.data(), kWidth * 2, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr422ToGray_8u_C2C1R",
       [] {
         return yuvPeer("libyuv YUY2ToY", [](YuvFrame& f) {
           libyuv::YUY2ToY(f.packed.data(), kWidth * 2, f.y2.data(), kWidth, kWidth, kHeight);
         });
       }},
#endif
  };
  return t;
}

}  // namespace

Peer memcpyPeer(size_t bytes) {
  auto src = std::make_shared<std::vector<uint8_t>>(frameBytes(bytes));
  auto dst = std::make_shared<std::vector<uint8_t>>(bytes);
  return {"memcpy of the output bytes", [src, dst] { std::memcpy(dst->data(), src->data(), dst->size()); }};
}

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
