#!/usr/bin/env bash
# Runs every benchmark program (build/bin/bench/*_bench.exe) under Wine in a
# scratch prefix and prints their measurements. Build first (scripts/test.sh
# or cmake --build build). Usage: bench/run.sh [build-dir] [name-filter]
set -euo pipefail
here=$(cd "$(dirname "$0")/.." && pwd)
build=$(cd "${1:-$here/build}" && pwd)
filter=${2:-}
prefixes="$build/wine"
"$here/tests/wine/prefix.sh" template "$prefixes/template"
prefix="$prefixes/bench-$$"
"$here/tests/wine/prefix.sh" clone "$prefixes/template" "$prefix"
trap '"$here/tests/wine/prefix.sh" remove "$prefix"' EXIT
export WINEPREFIX="$prefix" WINEDEBUG=-all WINEDLLOVERRIDES="mscoree,mshtml="
wineserver -p 60
for bench in "$build"/bin/bench/*_bench.exe; do
  name=$(basename "$bench" .exe)
  [[ -n "$filter" && "$name" != *"$filter"* ]] && continue
  echo "== $name"
  wine "$bench" > "$prefix/bench.out" 2>&1 || echo "($name exited with $?)"
  tr -d '\r' < "$prefix/bench.out"
  echo
done
