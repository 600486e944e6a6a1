// A downstream program: version query and one conversion.
#include <zelcc/zelcc.h>

#include <cstdio>
#include <cstring>

int main() {
  const LibraryVersion* v = zelccGetLibVersion();
  if (!v || v->major != 8 || std::strcmp(v->version, "8.2.1 (r44077)") != 0) return 1;
  const uint8_t gray[2] = {10, 20};
  uint8_t rgb[6] = {};
  if (zeliGrayToRGB_8u_C1C3R(gray, 2, rgb, 6, ImageSize{2, 1}) != StatusOk) return 2;
  if (rgb[0] != 10 || rgb[5] != 20) return 3;
  std::puts("ok");
  return 0;
}
