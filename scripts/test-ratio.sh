#!/usr/bin/env bash
# Prints the test lines (tests/unit, tests/e2e, tests/support, tests/wine) as a
# share of the program lines (app, base, notes, cleanup, actions, presence,
# version), both counted with wc -l. The rule: at most 35%.
set -euo pipefail
cd "$(dirname "$0")/.."
# Files of the named folders that exist, as `wc -l folder/*` counts them.
count() {
  local folder
  for folder in "$@"; do
    if [ -d "$folder" ]; then find "$folder" -maxdepth 1 -type f -exec cat {} +; fi
  done | wc -l
}
program=$(count app base notes cleanup actions presence version)
tests=$(count tests/unit tests/e2e tests/support tests/wine)
echo "program lines: $program"
echo "test lines:    $tests"
echo "ratio:         $((100 * tests / program))% (limit 35%, at most $((35 * program / 100)) test lines)"
