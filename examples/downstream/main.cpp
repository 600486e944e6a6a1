// A downstream program built against an installed zelcc: converts a PPM
// picture (or a generated gradient) to YCbCr planes and back, writes the
// result as a PPM and reports the largest difference from the input.
//
//   downstream [in.ppm [out.ppm]]
#include <zelcc/zelcc.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <vector>

namespace {

bool readPpm(const char* path, int& w, int& h, std::vector<uint8_t>& rgb) {
  FILE* f = std::fopen(path, "rb");
  if (!f) return false;
  int maxval = 0;
  const bool ok = std::fscanf(f, "P6 %d %d %d", &w, &h, &maxval) == 3 && maxval == 255 && w > 0 && h > 0 &&
                  w <= 16384 && h <= 16384 && std::fgetc(f) != EOF;
  if (ok) {
    rgb.resize(size_t(w) * h * 3);
    if (std::fread(rgb.data(), 1, rgb.size(), f) != rgb.size()) rgb.clear();
  }
  std::fclose(f);
  return ok && !rgb.empty();
}

}  // namespace

int main(int argc, char** argv) {
  const LibraryVersion* v = zelccGetLibVersion();
  if (!v || v->major != 8 || std::strcmp(v->version, "8.2.1 (r44077)") != 0) return 1;
  int w = 64, h = 48;
  std::vector<uint8_t> rgb;
  if (argc > 1) {
    if (!readPpm(argv[1], w, h, rgb)) {
      std::fprintf(stderr, "downstream: cannot read %s as a binary 8-bit PPM\n", argv[1]);
      return 2;
    }
  } else {
    rgb.resize(size_t(w) * h * 3);
    for (int y = 0; y < h; ++y)
      for (int x = 0; x < w; ++x) {
        uint8_t* p = &rgb[(size_t(y) * w + x) * 3];
        p[0] = uint8_t(x * 255 / (w - 1));
        p[1] = uint8_t(y * 255 / (h - 1));
        p[2] = uint8_t(255 - p[0]);
      }
  }
  std::vector<uint8_t> y(size_t(w) * h), cb(y.size()), cr(y.size()), back(rgb.size());
  uint8_t* planes[3] = {y.data(), cb.data(), cr.data()};
  const ImageSize size{w, h};
  if (zeliRGBToYCbCr_8u_C3P3R(rgb.data(), w * 3, planes, w, size) != StatusOk) return 3;
  const uint8_t* in[3] = {y.data(), cb.data(), cr.data()};
  if (zeliYCbCrToRGB_8u_P3C3R(in, w, back.data(), w * 3, size) != StatusOk) return 4;
  int worst = 0;
  for (size_t i = 0; i < rgb.size(); ++i) worst = std::max(worst, std::abs(int(rgb[i]) - int(back[i])));
  if (argc > 2) {
    FILE* f = std::fopen(argv[2], "wb");
    if (!f) return 5;
    std::fprintf(f, "P6\n%d %d\n255\n", w, h);
    std::fwrite(back.data(), 1, back.size(), f);
    std::fclose(f);
  }
  std::printf("%dx%d through YCbCr and back: largest difference %d\n", w, h, worst);
  return worst <= 4 ? 0 : 6;
}
