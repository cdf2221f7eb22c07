#!/usr/bin/env bash
# Builds the project if needed and runs the guided tour on the built-in simulated demo design.
set -euo pipefail
cd "$(dirname "$0")/.."
scripts/setup.sh
if [ ! -x build/default/bin/zinmox ]; then
  cmake --preset default >/dev/null
  cmake --build --preset default --target zinmox
fi
exec build/default/bin/zinmox demo "$@"
