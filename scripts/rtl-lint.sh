#!/usr/bin/env bash
# verilator --lint-only -Wall on every RTL module as its own top (vendor wrappers against the
# black-box stubs of their primitives). Fails on any warning.
set -euo pipefail
root="$(cd "$(dirname "$0")/.." && pwd)"
status=0
for file in "$root"/rtl/zinmox_*.v "$root"/rtl/vendor/zinmox_*.v; do
  top="$(basename "$file" .v)"
  if ! verilator --lint-only -Wall -Wno-DECLFILENAME --top-module "$top" \
      "$root"/rtl/zinmox_*.v "$root"/rtl/vendor/zinmox_*.v "$root"/rtl/vendor/stubs/*.v; then
    echo "rtl-lint: $top has lint warnings" >&2
    status=1
  fi
done
[ $status -eq 0 ] && echo "rtl-lint: every module is clean"
exit $status
