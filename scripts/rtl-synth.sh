#!/usr/bin/env bash
# Synthesis checks and the synthesis and timing report of the RTL.
#
#   scripts/rtl-synth.sh [--quick] [WORKDIR]
#
# Checks (both modes): yosys elaborates every top with `check -assert` (no multiple drivers, no
# undriven or conflicting signals), no latch is inferred, and no yosys warning names the
# project's RTL. Report: LUT and flip-flop counts of the hub with one core of 8/8/8/8 and of
# 64/64/64/64 ports for iCE40, ECP5 and generic Xilinx (--quick: 8/8/8/8 for iCE40 only), then
# place and route of 8/8/8/8 on an iCE40 HX8K (user-chain signals and ports on pins) with the
# maximum frequency of TCK (goal 30 MHz) and of the design clock (goal 100 MHz).
set -euo pipefail
root="$(cd "$(dirname "$0")/.." && pwd)"
quick=0
if [ "${1:-}" = "--quick" ]; then quick=1; shift; fi
work="${1:-$root/build/rtl-synth}"
mkdir -p "$work"
cd "$work"
rtl=("$root"/rtl/zinmox_*.v)
vendor=("$root"/rtl/vendor/zinmox_*.v "$root"/rtl/vendor/stubs/*.v)
failed=0
fail() { echo "rtl-synth: FAIL: $*" >&2; failed=1; }

# Runs yosys with a script; fails on warnings that name the project's sources or on a latch.
run_yosys() {
  local name="$1" script="$2"
  if ! nice -n 5 yosys -q -l "$name.log" -p "$script" >/dev/null 2>&1; then
    fail "$name: yosys failed (see $work/$name.log)"
    return
  fi
  if grep -i "warning" "$name.log" | grep -v "ABC: Warning: The network is combinational" \
      | grep -q .; then
    grep -i "warning" "$name.log" >&2
    fail "$name: yosys warnings"
  fi
}

# Elaboration checks on every top; the vendor wrappers with their primitives as black boxes.
check_top() {
  local top="$1" files="$2"
  run_yosys "check_$top" "read_verilog $files; hierarchy -check -top $top; proc; \
    check -assert; select -assert-none t:\$dlatch t:\$adlatch t:\$dlatchsr t:\$_DLATCH_*"
}
for file in "${rtl[@]}"; do check_top "$(basename "$file" .v)" "${rtl[*]}"; done
for file in "$root"/rtl/vendor/zinmox_*.v; do check_top "$(basename "$file" .v)" "${vendor[*]}"; done

# The vendor wrappers through their family's synthesis, the primitive kept as a black box.
run_yosys synth_bscane2 "read_verilog ${vendor[*]}; synth_xilinx -flatten -top zinmox_bscane2; \
  select -assert-count 1 t:BSCANE2"
run_yosys synth_jtagg "read_verilog ${vendor[*]}; synth_ecp5 -top zinmox_jtagg; \
  select -assert-count 1 t:JTAGG"

# Sums the cells of a stat report whose names match a pattern.
count() { awk -v re="$2" '$1 ~ re { n += $2 } END { print n + 0 }' "$1"; }

synth() {
  local family="$1" width="$2" name="${1}_${2}"
  run_yosys "$name" "read_verilog ${rtl[*]}; \
    chparam -set ASYNC_OUT_W $width -set SYNC_OUT_W $width -set ASYNC_IN_W $width \
      -set SYNC_IN_W $width zinmox_chain_top; \
    hierarchy -check -top zinmox_chain_top; check -assert; \
    synth_$family -flatten -top zinmox_chain_top $([ "$family" = ice40 ] && echo "-json $name.json"); \
    select -assert-none t:\$_DLATCH_* t:*LATCH*; tee -q -o $name.stat stat"
  [ -f "$name.stat" ] || return 0
  local luts ffs
  case "$family" in
    ice40) luts=$(count "$name.stat" '^SB_LUT4$'); ffs=$(count "$name.stat" '^SB_DFF') ;;
    ecp5) luts=$(( $(count "$name.stat" '^LUT4$') + 2 * $(count "$name.stat" '^CCU2C$') ))
          ffs=$(count "$name.stat" '^TRELLIS_FF$') ;;
    xilinx) luts=$(count "$name.stat" '^LUT[1-6]$'); ffs=$(count "$name.stat" '^FD[CPRSE]*$') ;;
  esac
  printf "%-7s %2s/%2s/%2s/%2s  LUTs %6s  FFs %6s\n" "$family" "$width" "$width" "$width" \
    "$width" "$luts" "$ffs"
}

echo "hub + one MOX core (async out/sync out/async in/sync in):"
if [ $quick -eq 1 ]; then
  synth ice40 8
else
  for family in ice40 ecp5 xilinx; do
    for width in 8 64; do synth "$family" "$width"; done
  done
fi

# Flip-flops per port bit of each kind: generic synthesis of 1/1/1/1 against 16 more bits of one
# kind, next to the state that a bit of that kind must hold (docs/rtl.md).
generic_ffs() {
  local name="generic_$1_$2_$3_$4"
  run_yosys "$name" "read_verilog ${rtl[*]}; chparam -set ASYNC_OUT_W $1 -set SYNC_OUT_W $2 \
    -set ASYNC_IN_W $3 -set SYNC_IN_W $4 zinmox_chain_top; hierarchy -check -top zinmox_chain_top; \
    synth -flatten -top zinmox_chain_top; tee -q -o $name.stat stat"
  count "$name.stat" 'DFF'
}
if [ $quick -eq 0 ]; then
  base=$(generic_ffs 1 1 1 1)
  echo "flip-flops per port bit (state it must hold):"
  for kind in "async_out 17 1 1 1 3" "sync_out 1 17 1 1 34" "async_in 1 1 17 1 8" \
      "sync_in 1 1 1 17 6"; do
    set -- $kind
    ffs=$(generic_ffs "$2" "$3" "$4" "$5")
    awk -v k="$1" -v d="$((ffs - base))" -v s="$6" \
      'BEGIN { printf "  %-9s %5.2f  (%d)  ratio %.2f\n", k, d / 16, s, d / 16 / s }'
  done
fi

# Place and route on the HX8K with both clocks constrained to their goals.
if [ -f ice40_8.json ]; then
  printf 'ctx.addClock("tck_i", 30)\nctx.addClock("clk_i", 100)\n' > clocks.py
  if nice -n 5 nextpnr-ice40 --hx8k --package ct256 --json ice40_8.json --pre-pack clocks.py \
      --pcf-allow-unconstrained --timing-allow-fail --seed 1 -q -l pnr.log >/dev/null 2>&1; then
    for clock in tck_i:30 clk_i:100; do
      name="${clock%%:*}" goal="${clock##*:}"
      mhz=$(grep "Max frequency for clock '$name" pnr.log | tail -1 | sed -E 's/.*: ([0-9.]+) MHz.*/\1/')
      printf "iCE40 HX8K %-5s Fmax %7s MHz (goal %s MHz)\n" "$name" "${mhz:-?}" "$goal"
      awk -v m="${mhz:-0}" -v g="$goal" 'BEGIN { exit !(m >= g) }' || fail "$name below $goal MHz"
    done
    # TDO is taken on the falling TCK edge: the path from TCK to the TDO pin gets half a period.
    ns=$(grep -E "Max delay posedge tck_i.* -> <async>" pnr.log | tail -1 | sed -E 's/.*: ([0-9.]+) ns.*/\1/')
    printf "iCE40 HX8K TCK to TDO pin %6s ns (at most 16.6 ns, half a period at 30 MHz)\n" "${ns:-?}"
    awk -v n="${ns:-99}" 'BEGIN { exit !(n <= 16.6) }' || fail "TCK to TDO too slow"
  else
    fail "nextpnr-ice40 failed (see $work/pnr.log)"
  fi
fi
[ $failed -eq 0 ] && echo "rtl-synth: all checks passed"
exit $failed
