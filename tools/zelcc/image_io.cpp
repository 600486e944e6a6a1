#include "image_io.h"

#include <png.h>

#include <cerrno>
#include <csetjmp>
#include <cstdio>
#include <cstring>
#include <memory>

namespace zel::tool {

void checkDimensions(int64_t width, int64_t height, const std::string& what) {
  if (width < 1 || height < 1 || width > kMaxSide || height > kMaxSide || width * height > kMaxPixels)
    throw ToolError(what + " has size " + std::to_string(width) + "x" + std::to_string(height) +
                    "; sizes from 1x1 up to " + std::to_string(kMaxSide) + " a side and " +
                    std::to_string(kMaxPixels) + " pixels are supported");
}

Picture resized(const Picture& p, int width, int height) {
  if (width == p.width && height == p.height) return p;
  Picture out(width, height, p.channels, p.depth);
  for (int y = 0; y < height; ++y) {
    const int sy = int(int64_t(y) * p.height / height);
    for (int x = 0; x < width; ++x) {
      const int sx = int(int64_t(x) * p.width / width);
      for (int c = 0; c < p.channels; ++c) out.at(x, y, c) = p.at(sx, sy, c);
    }
  }
  return out;
}

namespace {

struct FileCloser {
  void operator()(std::FILE* f) const {
    if (f) std::fclose(f);
  }
};
using File = std::unique_ptr<std::FILE, FileCloser>;

File openFile(const std::string& path, const char* mode, const char* verb) {
  std::FILE* f = std::fopen(path.c_str(), mode);
  if (!f) throw ToolError(std::string("cannot ") + verb + " " + path + ": " + std::strerror(errno));
  return File(f);
}

// ---- PNM ----

// Reads the next header number, skipping white space and comments.
bool pnmNumber(std::FILE* f, long& value) {
  int c = std::fgetc(f);
  for (;;) {
    if (c == '#') {
      while (c != '\n' && c != '\r' && c != EOF) c = std::fgetc(f);
    } else if (c == ' ' || c == '\t' || c == '\n' || c == '\r' || c == '\v' || c == '\f') {
      c = std::fgetc(f);
    } else {
      break;
    }
  }
  if (c < '0' || c > '9') return false;
  value = 0;
  while (c >= '0' && c <= '9') {
    value = value * 10 + (c - '0');
    if (value > 1000000000L) return false;
    c = std::fgetc(f);
  }
  // Exactly one white-space byte ends the number; for maxval it is the last
  // header byte before the samples.
  return c == ' ' || c == '\t' || c == '\n' || c == '\r' || c == '\v' || c == '\f';
}

Picture readPnm(std::FILE* f, const std::string& path) {
  char magic[2];
  if (std::fread(magic, 1, 2, f) != 2 || magic[0] != 'P') throw ToolError(path + ": not a PNG or PNM file");
  if (magic[1] != '5' && magic[1] != '6') {
    if (magic[1] >= '1' && magic[1] <= '7')
      throw ToolError(path + ": only binary PGM and PPM (P5, P6) are read, not P" + std::string(1, magic[1]));
    throw ToolError(path + ": not a PNG or PNM file");
  }
  const int channels = magic[1] == '5' ? 1 : 3;
  long width = 0, height = 0, maxval = 0;
  if (!pnmNumber(f, width) || !pnmNumber(f, height) || !pnmNumber(f, maxval))
    throw ToolError(path + ": damaged PNM header");
  if (maxval < 1 || maxval > 65535) throw ToolError(path + ": PNM maxval " + std::to_string(maxval) + " is not in 1..65535");
  checkDimensions(width, height, path);

  const int bytes = maxval > 255 ? 2 : 1;
  const size_t count = size_t(width) * height * channels;
  std::vector<uint8_t> raw(count * bytes);
  if (std::fread(raw.data(), 1, raw.size(), f) != raw.size()) throw ToolError(path + ": PNM data is truncated");

  const int depth = maxval > 255 ? 16 : 8;
  const uint32_t target = depth == 16 ? 65535 : 255;
  Picture p(int(width), int(height), channels, depth);
  for (size_t i = 0; i < count; ++i) {
    uint32_t v = bytes == 2 ? (uint32_t(raw[2 * i]) << 8 | raw[2 * i + 1]) : raw[i];
    if (v > uint32_t(maxval)) throw ToolError(path + ": PNM sample above its maxval " + std::to_string(maxval));
    if (uint32_t(maxval) != target) v = (v * target + uint32_t(maxval) / 2) / uint32_t(maxval);
    p.samples[i] = uint16_t(v);
  }
  return p;
}

// ---- PNG ----

struct PngErrors {
  std::jmp_buf jump;
  char message[256] = {0};
};

void pngError(png_structp png, png_const_charp message) {
  PngErrors* e = static_cast<PngErrors*>(png_get_error_ptr(png));
  std::snprintf(e->message, sizeof e->message, "%s", message ? message : "libpng error");
  std::longjmp(e->jump, 1);
}

void pngWarning(png_structp, png_const_charp) {}

// libpng reports errors by a long jump back here; nothing with a destructor
// is made between the setjmp and the calls that may jump.
Picture readPng(std::FILE* f, const std::string& path) {
  PngErrors errors;
  png_structp png = png_create_read_struct(PNG_LIBPNG_VER_STRING, &errors, pngError, pngWarning);
  if (!png) throw ToolError(path + ": cannot start the PNG reader");
  png_infop info = png_create_info_struct(png);
  if (!info) {
    png_destroy_read_struct(&png, nullptr, nullptr);
    throw ToolError(path + ": cannot start the PNG reader");
  }
  Picture p;
  std::vector<png_bytep> rows;
  std::vector<uint8_t> raw;
  if (setjmp(errors.jump)) {
    png_destroy_read_struct(&png, &info, nullptr);
    throw ToolError(path + ": unreadable PNG (" + errors.message + ")");
  }
  png_set_user_limits(png, kMaxSide, kMaxSide);
  png_init_io(png, f);
  png_read_info(png, info);
  png_set_expand(png);  // palettes to RGB, low depths to 8 bits, transparency to alpha
  png_set_interlace_handling(png);
  png_read_update_info(png, info);
  const png_uint_32 width = png_get_image_width(png, info), height = png_get_image_height(png, info);
  const int depth = png_get_bit_depth(png, info), channels = png_get_channels(png, info);
  if (int64_t(width) * height > kMaxPixels || (depth != 8 && depth != 16) || channels < 1 || channels > 4) {
    std::snprintf(errors.message, sizeof errors.message, "%ux%u pixels, %d channels of %d bits are not supported",
                  unsigned(width), unsigned(height), channels, depth);
    png_destroy_read_struct(&png, &info, nullptr);
    throw ToolError(path + ": " + errors.message);
  }
  const size_t rowBytes = png_get_rowbytes(png, info);
  raw.resize(rowBytes * height);
  rows.resize(height);
  for (png_uint_32 y = 0; y < height; ++y) rows[y] = raw.data() + y * rowBytes;
  png_read_image(png, rows.data());
  png_read_end(png, nullptr);
  png_destroy_read_struct(&png, &info, nullptr);

  p = Picture(int(width), int(height), channels, depth);
  const size_t count = p.samples.size();
  for (size_t i = 0; i < count; ++i)
    p.samples[i] = depth == 16 ? uint16_t(raw[2 * i] << 8 | raw[2 * i + 1]) : raw[i];
  return p;
}

void checkPicture(const Picture& p, const std::string& path) {
  if (p.channels < 1 || p.channels > 4 || (p.depth != 8 && p.depth != 16) ||
      p.samples.size() != size_t(p.width) * p.height * p.channels)
    throw ToolError("cannot write " + path + ": malformed picture");
  checkDimensions(p.width, p.height, "picture for " + path);
}

}  // namespace

Picture readImage(const std::string& path) {
  File f = openFile(path, "rb", "read");
  unsigned char head[8];
  const size_t n = std::fread(head, 1, 8, f.get());
  if (n == 0) throw ToolError(path + ": empty file");
  std::rewind(f.get());
  if (n == 8 && png_sig_cmp(head, 0, 8) == 0) return readPng(f.get(), path);
  return readPnm(f.get(), path);
}

void writePng(const std::string& path, const Picture& picture) {
  checkPicture(picture, path);
  static const int kTypes[] = {0, PNG_COLOR_TYPE_GRAY, PNG_COLOR_TYPE_GRAY_ALPHA, PNG_COLOR_TYPE_RGB,
                               PNG_COLOR_TYPE_RGB_ALPHA};
  const int bytes = picture.depth / 8;
  const size_t rowBytes = size_t(picture.width) * picture.channels * bytes;
  std::vector<uint8_t> raw(rowBytes * picture.height);
  for (size_t i = 0; i < picture.samples.size(); ++i) {
    if (bytes == 2) {
      raw[2 * i] = uint8_t(picture.samples[i] >> 8);
      raw[2 * i + 1] = uint8_t(picture.samples[i]);
    } else {
      raw[i] = uint8_t(picture.samples[i]);
    }
  }
  std::vector<png_bytep> rows(picture.height);
  for (int y = 0; y < picture.height; ++y) rows[y] = raw.data() + y * rowBytes;

  File f = openFile(path, "wb", "write");
  PngErrors errors;
  png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, &errors, pngError, pngWarning);
  if (!png) throw ToolError("cannot write " + path + ": cannot start the PNG writer");
  png_infop info = png_create_info_struct(png);
  if (!info) {
    png_destroy_write_struct(&png, nullptr);
    throw ToolError("cannot write " + path + ": cannot start the PNG writer");
  }
  if (setjmp(errors.jump)) {
    png_destroy_write_struct(&png, &info);
    throw ToolError("cannot write " + path + ": " + errors.message);
  }
  png_init_io(png, f.get());
  png_set_IHDR(png, info, png_uint_32(picture.width), png_uint_32(picture.height), picture.depth,
               kTypes[picture.channels], PNG_INTERLACE_NONE, PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
  png_write_info(png, info);
  png_write_image(png, rows.data());
  png_write_end(png, nullptr);
  png_destroy_write_struct(&png, &info);
  if (std::fflush(f.get()) != 0 || std::ferror(f.get()))
    throw ToolError("cannot write " + path + ": " + std::strerror(errno));
}

void writePnm(const std::string& path, const Picture& picture) {
  checkPicture(picture, path);
  if (picture.channels != 1 && picture.channels != 3)
    throw ToolError("cannot write " + path + ": PGM and PPM hold one or three channels, not " +
                    std::to_string(picture.channels));
  File f = openFile(path, "wb", "write");
  std::fprintf(f.get(), "P%c\n%d %d\n%d\n", picture.channels == 1 ? '5' : '6', picture.width, picture.height,
               int(picture.maxValue()));
  std::vector<uint8_t> raw;
  raw.reserve(picture.samples.size() * 2);
  for (uint16_t v : picture.samples) {
    if (picture.depth == 16) raw.push_back(uint8_t(v >> 8));
    raw.push_back(uint8_t(v));
  }
  if (std::fwrite(raw.data(), 1, raw.size(), f.get()) != raw.size() || std::fflush(f.get()) != 0)
    throw ToolError("cannot write " + path + ": " + std::strerror(errno));
}

}  // namespace zel::tool
