#!/usr/bin/env bash
# Installs what is missing, builds with the given preset (default: default) and runs the tests.
# "scripts/test.sh mutate [options]" runs the mutation check instead (scripts/mutate.py).
set -euo pipefail
cd "$(dirname "$0")/.."
if [[ "${1:-}" == mutate ]]; then
  shift
  scripts/setup.sh
  exec scripts/mutate.py "$@"
fi
preset="${1:-default}"
scripts/setup.sh
cmake --preset "$preset"
cmake --build --preset "$preset"
ctest --preset "$preset"
