#!/usr/bin/env bash
# The library and its tests as 32-bit x86 programs (-m32), in build-m32/.
# Installs the multilib compiler if it is missing (Debian: g++-multilib) and
# builds GoogleTest from the sources Debian's libgtest-dev ships, as the
# installed test libraries are 64-bit. The tool and the benchmarks need
# 32-bit libpng and Google Benchmark and are left out; so is the downstream
# install test. The tests are built for SSE4.1 with SSE float arithmetic,
# like the library (the x87 unit would round scalar floats differently).
#
#   tools/build-m32.sh
set -euo pipefail
cd "$(dirname "$0")/.."
SUDO=""
if [ "$(id -u)" != 0 ]; then SUDO=sudo; fi
if ! echo 'int main(){}' | g++ -m32 -x c++ - -o /dev/null 2>/dev/null || [ ! -d /usr/src/googletest ]; then
  $SUDO apt-get update -qq
  $SUDO env DEBIAN_FRONTEND=noninteractive apt-get install -y -qq cmake g++-multilib make libgtest-dev >/dev/null
fi
cmake -S . -B build-m32 -DCMAKE_BUILD_TYPE=Release "-DCMAKE_C_FLAGS=-m32 -msse4.1 -mfpmath=sse" "-DCMAKE_CXX_FLAGS=-m32 -msse4.1 -mfpmath=sse" \
  -DCMAKE_EXE_LINKER_FLAGS=-m32 -DCMAKE_SHARED_LINKER_FLAGS=-m32 -DZELCC_BUILD_TOOLS=OFF \
  -DZELCC_BUILD_BENCH=OFF -DZELCC_INSTALL_TEST=OFF -DZELCC_GTEST_SOURCE=/usr/src/googletest >/dev/null
cmake --build build-m32 -j"${JOBS:-2}"
ctest --test-dir build-m32 --output-on-failure -j"${JOBS:-2}"
