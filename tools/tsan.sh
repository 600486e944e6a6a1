#!/usr/bin/env bash
# The 8-thread stress test (Threads.* of the contract tests) under the
# thread sanitizer, in build-tsan/: every export called concurrently on
# separate images, each result compared with its single-threaded bytes.
#
#   tools/tsan.sh
set -euo pipefail
cd "$(dirname "$0")/.."
BUILD=${BUILD:-build-tsan}
cmake -S . -B "$BUILD" -DCMAKE_BUILD_TYPE=RelWithDebInfo "-DCMAKE_CXX_FLAGS_RELWITHDEBINFO=-O1 -g1 -DNDEBUG" \
  -DZELCC_SANITIZE=thread -DZELCC_BUILD_TOOLS=OFF -DZELCC_BUILD_BENCH=OFF -DZELCC_INSTALL_TEST=OFF >/dev/null
cmake --build "$BUILD" -j"${JOBS:-2}" --target zelcc_contract_tests
TSAN_OPTIONS=${TSAN_OPTIONS:-halt_on_error=1:second_deadlock_stack=1} \
  "$BUILD/tests/zelcc_contract_tests" --gtest_filter='Threads.*'
