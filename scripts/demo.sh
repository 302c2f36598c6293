#!/bin/sh
# Main job: builds the server, runs "vss_requestor.exe -Embedding" in a fresh
# Wine prefix, waits for its idle exit and prints the log file it wrote.
set -eu
ROOT=$(cd "$(dirname "$0")/.." && pwd)
BUILD=${1:-$ROOT/build}
"$ROOT/scripts/setup.sh"
cmake -S "$ROOT" -B "$BUILD" -DCMAKE_TOOLCHAIN_FILE="$ROOT/cmake/mingw-w64-x86_64.cmake" -DCMAKE_BUILD_TYPE=Release >/dev/null
cmake --build "$BUILD" --target vss_requestor -j"$(nproc)"
WINEPREFIX=$(mktemp -d)/prefix
WINEDEBUG=-all
export WINEPREFIX WINEDEBUG
wineboot -i >/dev/null 2>&1 || true
set +e
wine "$BUILD/bin/vss_requestor.exe" -Embedding
echo "exit code: $?"
set -e
for f in "$WINEPREFIX"/drive_c/ProgramData/Veltris/VssRequestorLogs/*.log; do
    echo "== $f"
    iconv -f UTF-16 -t UTF-8 "$f"
done
wineserver -k 2>/dev/null || true
