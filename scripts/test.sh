#!/bin/sh
# Builds everything and runs the test suite under Wine.
#   scripts/test.sh [build-dir]
set -eu

ROOT=$(cd "$(dirname "$0")/.." && pwd)
BUILD=${1:-$ROOT/build}

"$ROOT/scripts/setup.sh"

cmake -S "$ROOT" -B "$BUILD" -DCMAKE_TOOLCHAIN_FILE="$ROOT/cmake/mingw-w64-x86_64.cmake" \
      -DCMAKE_BUILD_TYPE=Release >/dev/null
cmake --build "$BUILD" -j"$(nproc)"

WINEPREFIX="$BUILD/wineprefix"
WINEDEBUG=-all
export WINEPREFIX WINEDEBUG
mkdir -p "$WINEPREFIX"

# One wineserver for the whole run: each test process attaches to it instead of
# starting (and tearing down) its own.
wineserver -p
trap 'wineserver -k 2>/dev/null || true' EXIT INT TERM
wineboot -i >/dev/null 2>&1 || true

cd "$BUILD"
ctest --output-on-failure --timeout 600
