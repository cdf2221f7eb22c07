#!/usr/bin/env bash
# The guided tour on the RTL model behind OpenOCD: builds zinmox-rtlsim and zinmox if needed,
# starts zinmox-rtlsim and OpenOCD on free loopback ports, runs the tour, and stops both.
#
#   scripts/rtl-demo.sh [--build-dir DIR] [-- COMMAND ARGS...]
#
# With a COMMAND, it runs that instead of the tour, with ZINMOX_OPENOCD_TARGET set to
# openocd://127.0.0.1:PORT (the tests run the Python suite this way). Exits with the status of
# the tour or of COMMAND.
set -euo pipefail
cd "$(dirname "$0")/.."
root=$PWD
build_dir=build/default
while [ $# -gt 0 ]; do
  case "$1" in
    --build-dir) build_dir="$2"; shift 2 ;;
    --) shift; break ;;
    -h|--help) sed -n '2,10p' "$0" | sed 's/^# \{0,1\}//'; exit 0 ;;
    *) echo "rtl-demo: unknown argument $1 (see --help)" >&2; exit 2 ;;
  esac
done
bin="$build_dir/bin"
if [ ! -x "$bin/zinmox-rtlsim" ] || [ ! -x "$bin/zinmox" ]; then
  scripts/setup.sh
  [ -f "$build_dir/CMakeCache.txt" ] || cmake --preset default
  cmake --build "$build_dir" --target zinmox-rtlsim zinmox -j2
fi

work=$(mktemp -d)
rtlsim_pid="" openocd_pid=""
stop() {
  local status=$?
  set +e
  [ -n "$openocd_pid" ] && kill "$openocd_pid" 2>/dev/null && wait "$openocd_pid" 2>/dev/null
  [ -n "$rtlsim_pid" ] && kill "$rtlsim_pid" 2>/dev/null && wait "$rtlsim_pid" 2>/dev/null
  rm -rf "$work"
  exit "$status"
}
trap stop EXIT
trap 'exit 130' INT TERM

# Waits up to 10 s for a pattern in a log file.
wait_for() {
  for _ in $(seq 100); do
    grep -q "$2" "$1" 2>/dev/null && return 0
    sleep 0.1
  done
  echo "rtl-demo: gave up waiting for '$2'; log:" >&2
  cat "$1" >&2
  return 1
}

"$bin/zinmox-rtlsim" --port 0 > "$work/rtlsim.log" 2>&1 &
rtlsim_pid=$!
wait_for "$work/rtlsim.log" "serving remote_bitbang on"
rtlsim_port=$(grep -o '127\.0\.0\.1:[0-9]*' "$work/rtlsim.log" | head -1 | cut -d: -f2)

tcl_port=$(python3 -c 'import socket; s=socket.socket(); s.bind(("127.0.0.1", 0)); print(s.getsockname()[1])')
openocd -c "set ZINMOX_RTLSIM_PORT $rtlsim_port" -f "$root/openocd/zinmox-rtlsim.cfg" \
  -c "bindto 127.0.0.1; tcl_port $tcl_port; telnet_port disabled; gdb_port disabled" \
  > "$work/openocd.log" 2>&1 &
openocd_pid=$!
wait_for "$work/openocd.log" "Listening on port $tcl_port"
wait_for "$work/openocd.log" "tap/device found"

export ZINMOX_OPENOCD_TARGET="openocd://127.0.0.1:$tcl_port"
echo "rtl-demo: zinmox-rtlsim on port $rtlsim_port, OpenOCD's Tcl port $tcl_port"
if [ $# -gt 0 ]; then
  "$@"
else
  "$bin/zinmox" --target "$ZINMOX_OPENOCD_TARGET" demo
fi
