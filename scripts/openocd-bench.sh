#!/usr/bin/env bash
# Calls per second through OpenOCD and the RTL model beside the same scans sent as raw Tcl
# requests, and the hub protocol's overhead against the wire-time formula. A benchmark, not a
# test: the figures depend on the machine.
#
#   scripts/openocd-bench.sh [--build-dir DIR] [SECONDS]
set -euo pipefail
cd "$(dirname "$0")/.."
build_dir=build/default
if [ "${1:-}" = "--build-dir" ]; then build_dir="$2"; shift 2; fi
seconds="${1:-2}"
[ -x "$build_dir/bin/zin_openocd_bench" ] || cmake --build "$build_dir" --target zin_openocd_bench
exec scripts/rtl-demo.sh --build-dir "$build_dir" -- \
  sh -c "\"$build_dir/bin/zin_openocd_bench\" \"\${ZINMOX_OPENOCD_TARGET##*:}\" $seconds"
