#!/usr/bin/env bash
# Builds the tool if needed (the plain build in build/) and runs the guided tour on the built-in
# simulated demo design.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh
if [ ! -x build/bin/zinmox ]; then
  cmake -S . -B build >/dev/null
  cmake --build build -j2 --target zinmox
fi
exec build/bin/zinmox demo "$@"
