#!/usr/bin/env bash
# Installs what is missing, builds and runs every test.
#
#   scripts/test.sh           the plain CMake workflow in build/ (no preset, default options):
#                             cmake -S . -B build && cmake --build build && ctest --test-dir build
#   scripts/test.sh PRESET    the same with a preset (asan, tsan, debug, default) in build/PRESET
#   scripts/test.sh mutate [options]   the mutation check instead (scripts/mutate.py)
# BUILD_JOBS (default 2) sets the parallel build and test jobs.
set -euo pipefail
cd "$(dirname "$0")/.."
if [[ "${1:-}" == mutate ]]; then
  shift
  scripts/setup.sh
  exec scripts/mutate.py "$@"
fi
jobs="${BUILD_JOBS:-2}"
scripts/setup.sh
if [ $# -eq 0 ]; then
  cmake -S . -B build
  cmake --build build -j"$jobs"
  ctest --test-dir build -j"$jobs" --output-on-failure --timeout 600
else
  cmake --preset "$1"
  cmake --build --preset "$1" -j"$jobs"
  ctest --preset "$1" -j"$jobs"
fi
