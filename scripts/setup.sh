#!/usr/bin/env bash
# Installs, from Debian packages, whatever the build and the tests need and the machine lacks
# (help2man writes the tool's manual page, dpkg-dev makes and checks the Debian packages, the
# openssl command makes the TLS tests' throwaway certificate).
set -euo pipefail
packages=(cmake g++ make pkg-config googletest libgtest-dev libgmock-dev libbenchmark-dev
  libcli11-dev nlohmann-json3-dev libasio-dev python3 python3-dev python3-pybind11 pybind11-dev
  python3-pytest clang-format help2man dpkg-dev libcpp-httplib-dev libssl-dev openssl
  chromium chromium-driver python3-selenium gtkwave
  verilator yosys nextpnr-ice40 fpga-icestorm openocd)
# The libFuzzer targets (scripts/fuzz.sh) also need clang and its fuzzing runtime.
if [ "${1:-}" = "fuzz" ]; then
  packages+=(clang libclang-rt-14-dev)
fi
missing=()
for p in "${packages[@]}"; do
  dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed" || missing+=("$p")
done
if [ ${#missing[@]} -gt 0 ]; then
  echo "setup: installing ${missing[*]}"
  SUDO=""
  [ "$(id -u)" -eq 0 ] || SUDO="sudo"
  $SUDO apt-get update -qq
  DEBIAN_FRONTEND=noninteractive $SUDO apt-get install -y -qq "${missing[@]}"
fi
