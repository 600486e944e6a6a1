#include "peers.h"

#include <algorithm>
#include <cstring>
#include <iterator>

#include <immintrin.h>
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
  // Float colours live in 0..1, integer ones over their range.
  const double top = CV_MAT_DEPTH(srcType) == CV_32F ? 1.0 : CV_MAT_DEPTH(srcType) == CV_16U ? 65535.0 : 255.0;
  cv::randu(*src, 0, top);
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

#ifdef ZELCC_BENCH_OPENCV
// Exports whose nearest peer is one cvtColor call on whole frames.
struct CvtRow {
  const char* exportName;
  const char* label;
  int srcType, dstType, code;
};
const CvtRow kCvtRows[] = {
    {"zeliRGBToGray_8u_C3C1R", "OpenCV cvtColor RGB2GRAY", CV_8UC3, CV_8UC1, cv::COLOR_RGB2GRAY},
    {"zeliRGBToGray_8u_AC4C1R", "OpenCV cvtColor RGBA2GRAY", CV_8UC4, CV_8UC1, cv::COLOR_RGBA2GRAY},
    {"zeliRGBToGray_16u_C3C1R", "OpenCV cvtColor RGB2GRAY 16u", CV_16UC3, CV_16UC1, cv::COLOR_RGB2GRAY},
    {"zeliRGBToGray_32f_C3C1R", "OpenCV cvtColor RGB2GRAY 32f", CV_32FC3, CV_32FC1, cv::COLOR_RGB2GRAY},
    {"zeliRGBToHLS_8u_C3R", "OpenCV cvtColor RGB2HLS_FULL", CV_8UC3, CV_8UC3, cv::COLOR_RGB2HLS_FULL},
    {"zeliHLSToRGB_8u_C3R", "OpenCV cvtColor HLS2RGB_FULL", CV_8UC3, CV_8UC3, cv::COLOR_HLS2RGB_FULL},
    {"zeliRGBToHLS_32f_C3R", "OpenCV cvtColor RGB2HLS 32f", CV_32FC3, CV_32FC3, cv::COLOR_RGB2HLS},
    {"zeliHLSToRGB_32f_C3R", "OpenCV cvtColor HLS2RGB 32f", CV_32FC3, CV_32FC3, cv::COLOR_HLS2RGB},
    {"zeliRGBToHSV_8u_C3R", "OpenCV cvtColor RGB2HSV_FULL", CV_8UC3, CV_8UC3, cv::COLOR_RGB2HSV_FULL},
    {"zeliHSVToRGB_8u_C3R", "OpenCV cvtColor HSV2RGB_FULL", CV_8UC3, CV_8UC3, cv::COLOR_HSV2RGB_FULL},
    {"zeliRGBToXYZ_8u_C3R", "OpenCV cvtColor RGB2XYZ", CV_8UC3, CV_8UC3, cv::COLOR_RGB2XYZ},
    {"zeliXYZToRGB_8u_C3R", "OpenCV cvtColor XYZ2RGB", CV_8UC3, CV_8UC3, cv::COLOR_XYZ2RGB},
    {"zeliRGBToXYZ_16u_C3R", "OpenCV cvtColor RGB2XYZ 16u", CV_16UC3, CV_16UC3, cv::COLOR_RGB2XYZ},
    {"zeliRGBToXYZ_32f_C3R", "OpenCV cvtColor RGB2XYZ 32f", CV_32FC3, CV_32FC3, cv::COLOR_RGB2XYZ},
    {"zeliXYZToRGB_32f_C3R", "OpenCV cvtColor XYZ2RGB 32f", CV_32FC3, CV_32FC3, cv::COLOR_XYZ2RGB},
    {"zeliBGRToLab_8u_C3R", "OpenCV cvtColor LBGR2Lab", CV_8UC3, CV_8UC3, cv::COLOR_LBGR2Lab},
    {"zeliLabToBGR_8u_C3R", "OpenCV cvtColor Lab2LBGR", CV_8UC3, CV_8UC3, cv::COLOR_Lab2LBGR},
    {"zeliBGRToLab_32f_C3R", "OpenCV cvtColor LBGR2Lab 32f", CV_32FC3, CV_32FC3, cv::COLOR_LBGR2Lab},
    {"zeliLabToBGR_32f_C3R", "OpenCV cvtColor Lab2LBGR 32f", CV_32FC3, CV_32FC3, cv::COLOR_Lab2LBGR},
    {"zeliRGBToLUV_8u_C3R", "OpenCV cvtColor LRGB2Luv", CV_8UC3, CV_8UC3, cv::COLOR_LRGB2Luv},
    {"zeliLUVToRGB_8u_C3R", "OpenCV cvtColor Luv2LRGB", CV_8UC3, CV_8UC3, cv::COLOR_Luv2LRGB},
    {"zeliRGBToLUV_32f_C3R", "OpenCV cvtColor LRGB2Luv 32f", CV_32FC3, CV_32FC3, cv::COLOR_LRGB2Luv},
    {"zeliLUVToRGB_32f_C3R", "OpenCV cvtColor Luv2LRGB 32f", CV_32FC3, CV_32FC3, cv::COLOR_Luv2LRGB},
    {"zeliRGBToYUV_8u_C3R", "OpenCV cvtColor RGB2YUV", CV_8UC3, CV_8UC3, cv::COLOR_RGB2YUV},
    {"zeliYUVToRGB_8u_C3R", "OpenCV cvtColor YUV2RGB", CV_8UC3, CV_8UC3, cv::COLOR_YUV2RGB},
    {"zeliRGBToYCC_8u_C3R", "OpenCV cvtColor RGB2YCrCb", CV_8UC3, CV_8UC3, cv::COLOR_RGB2YCrCb},
    {"zeliYCCToRGB_8u_C3R", "OpenCV cvtColor YCrCb2RGB", CV_8UC3, CV_8UC3, cv::COLOR_YCrCb2RGB},
    {"zeliRGBToYCC_16u_C3R", "OpenCV cvtColor RGB2YCrCb 16u", CV_16UC3, CV_16UC3, cv::COLOR_RGB2YCrCb},
    {"zeliYCCToRGB_16u_C3R", "OpenCV cvtColor YCrCb2RGB 16u", CV_16UC3, CV_16UC3, cv::COLOR_YCrCb2RGB},
    {"zeliRGBToYCC_16s_C3R", "OpenCV cvtColor RGB2YCrCb 16u", CV_16UC3, CV_16UC3, cv::COLOR_RGB2YCrCb},
    {"zeliYCCToRGB_16s_C3R", "OpenCV cvtColor YCrCb2RGB 16u", CV_16UC3, CV_16UC3, cv::COLOR_YCrCb2RGB},
    // The 16-bit Photo YCC bodies work in single precision: the float rows too.
    {"zeliRGBToYCC_16u_C3R", "OpenCV cvtColor RGB2YCrCb 32f", CV_32FC3, CV_32FC3, cv::COLOR_RGB2YCrCb},
    {"zeliYCCToRGB_16u_C3R", "OpenCV cvtColor YCrCb2RGB 32f", CV_32FC3, CV_32FC3, cv::COLOR_YCrCb2RGB},
    {"zeliRGBToYCC_16s_C3R", "OpenCV cvtColor RGB2YCrCb 32f", CV_32FC3, CV_32FC3, cv::COLOR_RGB2YCrCb},
    {"zeliYCCToRGB_16s_C3R", "OpenCV cvtColor YCrCb2RGB 32f", CV_32FC3, CV_32FC3, cv::COLOR_YCrCb2RGB},
    {"zeliRGBToYCC_32f_C3R", "OpenCV cvtColor RGB2YCrCb 32f", CV_32FC3, CV_32FC3, cv::COLOR_RGB2YCrCb},
    {"zeliYCCToRGB_32f_C3R", "OpenCV cvtColor YCrCb2RGB 32f", CV_32FC3, CV_32FC3, cv::COLOR_YCrCb2RGB},
};

// Subsampled frames: a 4:2:0 frame is one plane of height times 3 / 2 rows
// (luma, then the two chroma planes), a 4:2:2 stream has two channels.
struct SubCvtRow {
  const char* exportName;
  const char* label;
  bool i420Source;
  int srcType, dstType, code;
};
const SubCvtRow kSubCvtRows[] = {
    {"zeliBGRToYCbCr420_8u_C3P3R", "OpenCV cvtColor BGR2YUV_I420", false, CV_8UC3, CV_8UC1, cv::COLOR_BGR2YUV_I420},
    {"zeliBGRToYCbCr420_8u_AC4P3R", "OpenCV cvtColor BGRA2YUV_I420", false, CV_8UC4, CV_8UC1,
     cv::COLOR_BGRA2YUV_I420},
    {"zeliYCbCr420ToRGB_8u_P3C3R", "OpenCV cvtColor YUV2RGB_I420", true, CV_8UC1, CV_8UC3, cv::COLOR_YUV2RGB_I420},
    {"zeliYCbCr420ToBGR_8u_P3C3R", "OpenCV cvtColor YUV2BGR_I420", true, CV_8UC1, CV_8UC3, cv::COLOR_YUV2BGR_I420},
    {"zeliYCbCr420ToBGR_8u_P3C4R", "OpenCV cvtColor YUV2BGRA_I420", true, CV_8UC1, CV_8UC4, cv::COLOR_YUV2BGRA_I420},
    {"zeliYCbCr422ToRGB_8u_C2C3R", "OpenCV cvtColor YUV2RGB_YUY2", false, CV_8UC2, CV_8UC3, cv::COLOR_YUV2RGB_YUY2},
    {"zeliYCbCr422ToBGR_8u_C2C4R", "OpenCV cvtColor YUV2BGRA_YUY2", false, CV_8UC2, CV_8UC4,
     cv::COLOR_YUV2BGRA_YUY2},
};

Peer subCvtPeer(const SubCvtRow& row) {
  auto src = std::make_shared<cv::Mat>(row.i420Source ? kHeight * 3 / 2 : kHeight, kWidth, row.srcType);
  cv::randu(*src, 0, 255);
  auto dst = std::make_shared<cv::Mat>();
  const int code = row.code;
  cv::cvtColor(*src, *dst, code);  // sizes the destination once
  return {row.label, [src, dst, code] { cv::cvtColor(*src, *dst, code); }};
}

// Gamma of 8-bit samples: one table lookup per sample.
Peer lutPeer() {
  auto src = std::make_shared<cv::Mat>(kHeight, kWidth, CV_8UC3);
  cv::randu(*src, 0, 255);
  auto dst = std::make_shared<cv::Mat>(kHeight, kWidth, CV_8UC3);
  auto table = std::make_shared<cv::Mat>(1, 256, CV_8U);
  for (int i = 0; i < 256; ++i) table->at<uint8_t>(i) = uint8_t(255 - i);
  return {"OpenCV LUT", [src, dst, table] { cv::LUT(*src, *table, *dst); }};
}

// A 3x4 matrix on every pixel.
Peer transformPeer(int type) {
  auto src = std::make_shared<cv::Mat>(kHeight, kWidth, type);
  cv::randu(*src, 0, 255);
  auto dst = std::make_shared<cv::Mat>(kHeight, kWidth, type);
  auto m = std::make_shared<cv::Mat>(3, 4, CV_32F, cv::Scalar(0.25));
  return {"OpenCV transform 3x4", [src, dst, m] { cv::transform(*src, *dst, *m); }};
}

// Maximum, then a scale to 8 bits.
Peer toneMapPeer() {
  auto src = std::make_shared<cv::Mat>(kHeight, kWidth, CV_32FC1);
  cv::randu(*src, 0, 100);
  auto dst = std::make_shared<cv::Mat>(kHeight, kWidth, CV_8UC1);
  return {"OpenCV minMaxLoc + convertTo", [src, dst] {
            double lo, hi;
            cv::minMaxLoc(*src, &lo, &hi);
            src->convertTo(*dst, CV_8U, 255.0 / hi);
          }};
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
         p.push_back(cvtColorPeer("OpenCV cvtColor BayerBG2RGB_EA", CV_8UC1, CV_8UC3, cv::COLOR_BayerBG2RGB_EA));
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
      {"zeliYCbCr420ToBGR_8u_P3C3R",
       [] {
         return yuvPeer("libyuv I420ToRGB24", [](YuvFrame& f) {
           libyuv::I420ToRGB24(f.y.data(), kWidth, f.u.data(), kWidth / 2, f.v.data(), kWidth / 2, f.argb.data(),
                               kWidth * 3, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr420ToRGB_8u_P3C3R",
       [] {
         return yuvPeer("libyuv I420ToRAW", [](YuvFrame& f) {
           libyuv::I420ToRAW(f.y.data(), kWidth, f.u.data(), kWidth / 2, f.v.data(), kWidth / 2, f.argb.data(),
                             kWidth * 3, kWidth, kHeight);
         });
       }},
      // No three-byte peer of a 4:2:2 stream: the four-byte one writes more.
      {"zeliYCbCr422ToRGB_8u_C2C3R",
       [] {
         return yuvPeer("libyuv YUY2ToARGB", [](YuvFrame& f) {
           libyuv::YUY2ToARGB(f.packed.data(), kWidth * 2, f.argb.data(), kWidth * 4, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr420ToBGR_8u_P3C4R",
       [] {
         return yuvPeer("libyuv I420ToARGB", [](YuvFrame& f) {
           libyuv::I420ToARGB(f.y.data(), kWidth, f.u.data(), kWidth / 2, f.v.data(), kWidth / 2, f.argb.data(),
                              kWidth * 4, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr420ToBGR_8u_P2C4R",
       [] {
         return yuvPeer("libyuv NV12ToARGB", [](YuvFrame& f) {
           libyuv::NV12ToARGB(f.y.data(), kWidth, f.uv.data(), kWidth, f.argb.data(), kWidth * 4, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr422ToBGR_8u_C2C4R",
       [] {
         return yuvPeer("libyuv YUY2ToARGB", [](YuvFrame& f) {
           libyuv::YUY2ToARGB(f.packed.data(), kWidth * 2, f.argb.data(), kWidth * 4, kWidth, kHeight);
         });
       }},
      {"zeliCbYCr422ToBGR_8u_C2C4R",
       [] {
         return yuvPeer("libyuv UYVYToARGB", [](YuvFrame& f) {
           libyuv::UYVYToARGB(f.packed.data(), kWidth * 2, f.argb.data(), kWidth * 4, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr422ToBGR_8u_P3C3R",
       [] {
         return yuvPeer("libyuv I422ToRGB24", [](YuvFrame& f) {
           libyuv::I422ToRGB24(f.y.data(), kWidth, f.u.data(), kWidth / 2, f.v.data(), kWidth / 2, f.argb.data(),
                               kWidth * 3, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr420ToBGR565_8u16u_P3C3R",
       [] {
         return yuvPeer("libyuv I420ToRGB565", [](YuvFrame& f) {
           libyuv::I420ToRGB565(f.y.data(), kWidth, f.u.data(), kWidth / 2, f.v.data(), kWidth / 2, f.argb.data(),
                                kWidth * 2, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr420ToBGR565Dither_8u16u_P3C3R",
       [] {
         return yuvPeer("libyuv I420ToRGB565Dither", [](YuvFrame& f) {
           static const uint8_t kDither[16] = {0, 4, 1, 5, 6, 2, 7, 3, 1, 5, 0, 4, 7, 3, 6, 2};
           libyuv::I420ToRGB565Dither(f.y.data(), kWidth, f.u.data(), kWidth / 2, f.v.data(), kWidth / 2,
                                      f.argb.data(), kWidth * 2, kDither, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr420ToBGR555_8u16u_P3C3R",
       [] {
         return yuvPeer("libyuv I420ToARGB1555", [](YuvFrame& f) {
           libyuv::I420ToARGB1555(f.y.data(), kWidth, f.u.data(), kWidth / 2, f.v.data(), kWidth / 2, f.argb.data(),
                                  kWidth * 2, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr420ToBGR444_8u16u_P3C3R",
       [] {
         return yuvPeer("libyuv I420ToARGB4444", [](YuvFrame& f) {
           libyuv::I420ToARGB4444(f.y.data(), kWidth, f.u.data(), kWidth / 2, f.v.data(), kWidth / 2, f.argb.data(),
                                  kWidth * 2, kWidth, kHeight);
         });
       }},
      {"zeliYCbCr422ToBGR565_8u16u_P3C3R",
       [] {
         return yuvPeer("libyuv I422ToRGB565", [](YuvFrame& f) {
           libyuv::I422ToRGB565(f.y.data(), kWidth, f.u.data(), kWidth / 2, f.v.data(), kWidth / 2, f.argb.data(),
                                kWidth * 2, kWidth, kHeight);
         });
       }},
      {"zeliBGR565ToYCbCr420_16u8u_C3P3R",
       [] {
         return yuvPeer("libyuv RGB565ToI420", [](YuvFrame& f) {
           libyuv::RGB565ToI420(f.packed.data(), kWidth * 2, f.y2.data(), kWidth, f.u2.data(), kWidth / 2,
                                f.v2.data(), kWidth / 2, kWidth, kHeight);
         });
       }},
      {"zeliBGR555ToYCbCr420_16u8u_C3P3R",
       [] {
         return yuvPeer("libyuv ARGB1555ToI420", [](YuvFrame& f) {
           libyuv::ARGB1555ToI420(f.packed.data(), kWidth * 2, f.y2.data(), kWidth, f.u2.data(), kWidth / 2,
                                  f.v2.data(), kWidth / 2, kWidth, kHeight);
         });
       }},
      {"zeliBGRToBGR565_8u16u_C3R",
       [] {
         return yuvPeer("libyuv ARGBToRGB565", [](YuvFrame& f) {
           libyuv::ARGBToRGB565(f.argb.data(), kWidth * 4, f.packed2.data(), kWidth * 2, kWidth, kHeight);
         });
       }},
      {"zeliBGR565ToBGR_16u8u_C3R",
       [] {
         return yuvPeer("libyuv RGB565ToARGB", [](YuvFrame& f) {
           libyuv::RGB565ToARGB(f.packed.data(), kWidth * 2, f.argb.data(), kWidth * 4, kWidth, kHeight);
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
      // Both three-byte readers run the same arithmetic on the two byte
      // orders: both are listed.
      {"zeliRGBToYCbCr420_8u_C3P3R",
       [] {
         auto p = yuvPeer("libyuv RGB24ToI420", [](YuvFrame& f) {
           libyuv::RGB24ToI420(f.argb.data(), kWidth * 3, f.y2.data(), kWidth, f.u2.data(), kWidth / 2, f.v2.data(),
                               kWidth / 2, kWidth, kHeight);
         });
         auto raw = yuvPeer("libyuv RAWToI420", [](YuvFrame& f) {
           libyuv::RAWToI420(f.argb.data(), kWidth * 3, f.y2.data(), kWidth, f.u2.data(), kWidth / 2, f.v2.data(),
                             kWidth / 2, kWidth, kHeight);
         });
         p.insert(p.end(), raw.begin(), raw.end());
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

Peer memcpyPeer(size_t bytes, const char* label) {
  auto src = std::make_shared<std::vector<uint8_t>>(frameBytes(bytes));
  auto dst = std::make_shared<std::vector<uint8_t>>(bytes);
  return {label, [src, dst] { std::memcpy(dst->data(), src->data(), dst->size()); }};
}

Peer streamingMemcpyPeer(size_t bytes) {
  auto src = std::make_shared<std::vector<uint8_t>>(frameBytes(bytes + 64));
  auto dst = std::make_shared<std::vector<uint8_t>>(bytes + 64);
  return {"memcpy with streaming stores", [src, dst, bytes] {
            // From the first 16-byte boundary of both buffers, like the exports' aligned rows.
            auto align = [](uint8_t* p) { return p + ((16 - reinterpret_cast<uintptr_t>(p) % 16) % 16); };
            const uint8_t* s = align(src->data());
            uint8_t* d = align(dst->data());
            size_t i = 0;
            for (; i + 64 <= bytes; i += 64)
              for (int k = 0; k < 64; k += 16)
                _mm_stream_si128(reinterpret_cast<__m128i*>(d + i + k),
                                 _mm_load_si128(reinterpret_cast<const __m128i*>(s + i + k)));
            std::memcpy(d + i, s + i, bytes - i);
            _mm_sfence();
          }};
}

std::vector<Peer> peersOf(const std::string& exportName) {
  auto it = table().find(exportName);
  std::vector<Peer> out = it == table().end() ? std::vector<Peer>{} : it->second();
#ifdef ZELCC_BENCH_OPENCV
  for (const CvtRow& row : kCvtRows)
    if (exportName == row.exportName) out.push_back(cvtColorPeer(row.label, row.srcType, row.dstType, row.code));
  for (const SubCvtRow& row : kSubCvtRows)
    if (exportName == row.exportName) out.push_back(subCvtPeer(row));
  if (exportName == "zeliGammaFwd_8u_C3R" || exportName == "zeliGammaInv_8u_C3R") out.push_back(lutPeer());
  if (exportName == "zeliColorTwist32f_8u_C3R") out.push_back(transformPeer(CV_8UC3));
  if (exportName == "zeliColorTwist_32f_C3R") out.push_back(transformPeer(CV_32FC3));
  if (exportName == "zeliToneMapLinear_32f8u_C1R") out.push_back(toneMapPeer());
#endif
  return out;
}

std::vector<std::string> exportsWithPeers() {
  std::vector<std::string> out;
  for (const auto& [name, factory] : table()) out.push_back(name);
#ifdef ZELCC_BENCH_OPENCV
  for (const CvtRow& row : kCvtRows) out.push_back(row.exportName);
  for (const SubCvtRow& row : kSubCvtRows) out.push_back(row.exportName);
  for (const char* n : {"zeliGammaFwd_8u_C3R", "zeliGammaInv_8u_C3R", "zeliColorTwist32f_8u_C3R",
                        "zeliColorTwist_32f_C3R", "zeliToneMapLinear_32f8u_C1R"})
    out.push_back(n);
#endif
  std::sort(out.begin(), out.end());
  out.erase(std::unique(out.begin(), out.end()), out.end());
  return out;
}

}  // namespace zel::bench
