#!/usr/bin/env bash
# Configures and builds everything into build/ (the program is
# build/bin/qmMrvONI.exe, the test stand-ins build/bin/fakes/).
set -euo pipefail
here=$(cd "$(dirname "$0")/.." && pwd)
cmake -S "$here" -B "$here/build" -DCMAKE_TOOLCHAIN_FILE="$here/cmake/mingw-i686.cmake" >/dev/null
cmake --build "$here/build" -j"$(nproc)" "$@"
