#!/usr/bin/env bash
# Fuzzes every export through the descriptor table (tests/fuzz): builds the
# libFuzzer target with clang and the address and undefined-behaviour
# sanitizers in build-fuzz/, then runs it for SECONDS seconds (default 60).
#
#   tools/fuzz.sh [SECONDS] [libFuzzer options...]
#   tools/fuzz.sh replay FILE...   runs single inputs and tells what they chose
#
# Needs clang and its runtime (Debian: clang, libclang-rt-14-dev). Clang
# refuses the 256-bit helpers of some kernels in functions compiled without
# AVX, so this tree compiles everything for AVX2 (the kernels the run-time
# choice takes on an AVX2 machine anyway); it needs an AVX2 processor.
#
# The run starts from the regression inputs in tests/fuzz/corpus and keeps
# what it finds in build-fuzz/corpus. A failing input lands in
# build-fuzz/crash-*: copy it into tests/fuzz/corpus (after the fix) so that
# every test run replays it. To shrink the committed corpus:
#   build-fuzz/tests/zelcc_fuzz_exports -merge=1 NEW_DIR tests/fuzz/corpus build-fuzz/corpus
set -euo pipefail
cd "$(dirname "$0")/.."
BUILD=${BUILD:-build-fuzz}

if [ ! -f "$BUILD/CMakeCache.txt" ]; then
  # Clang builds the whole tree for the widest vector tier, which the
  # processor running the fuzzer needs to have.
  CC=clang CXX=clang++ CXXFLAGS="-mavx2 -mavx512f -mavx512bw -mavx512vl -mavx512dq -mavx512vbmi" cmake -S . -B "$BUILD" -DCMAKE_BUILD_TYPE=RelWithDebInfo \
    -DZELCC_FUZZ=ON -DZELCC_SANITIZE=address,undefined -DZELCC_BUILD_TOOLS=OFF -DZELCC_BUILD_BENCH=OFF >/dev/null
fi
cmake --build "$BUILD" -j"${JOBS:-2}" --target zelcc_fuzz_exports
FUZZER="$BUILD/tests/zelcc_fuzz_exports"

# Known family reports stand in .ci/ubsan.supp, as in the sanitizer pass of CI.
export UBSAN_OPTIONS=${UBSAN_OPTIONS:-halt_on_error=1:print_stacktrace=1:suppressions=$PWD/.ci/ubsan.supp}
export ASAN_OPTIONS=${ASAN_OPTIONS:-detect_leaks=1}

if [ "${1:-}" = replay ]; then
  shift
  ZELCC_FUZZ_TELL=1 exec "$FUZZER" "$@"
fi

SECONDS_TO_RUN=${1:-60}
[ $# -gt 0 ] && shift
mkdir -p "$BUILD/corpus"
"$FUZZER" -max_total_time="$SECONDS_TO_RUN" -print_final_stats=1 -artifact_prefix="$BUILD/" \
  "$@" "$BUILD/corpus" tests/fuzz/corpus
