#!/usr/bin/env bash
# Refreshes docs/exports.md, the table of every export, from the export
# table of this checkout: builds the zelcc tool in BUILD (default build/)
# and copies the table it writes there. Run it after exports land.
set -euo pipefail
cd "$(dirname "$0")/.."
BUILD=${1:-build}
if [ ! -f "$BUILD/CMakeCache.txt" ]; then
  cmake -S . -B "$BUILD" -DCMAKE_BUILD_TYPE=Release -DZELCC_BUILD_BENCH=OFF -DZELCC_BUILD_TESTS=OFF >/dev/null
fi
cmake --build "$BUILD" -j"${JOBS:-2}" --target zelcc_exports_doc
cp "$BUILD/docs/exports.md" docs/exports.md
echo "docs/exports.md: $(grep -c '^| [0-9]' docs/exports.md) exports"
