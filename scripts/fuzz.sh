#!/usr/bin/env bash
# Builds the libFuzzer targets (clang, "fuzz" preset) and runs each for a set time.
#
#   scripts/fuzz.sh SECONDS [FUZZER...]     default: every fuzzer, one after the other
#
# Each fuzzer starts from its corpus in fuzz/corpus/<name> and keeps what it finds new in
# build/fuzz-work/<name>/corpus; crashes and other findings land in build/fuzz-work/<name>/ as
# crash-*, leak-*, timeout-* files, and the script exits non-zero when there is one.
# FUZZ_BUILD_DIR (default build/fuzz) selects the build folder, FUZZ_JOBS the build jobs (2).
# To fold the new inputs back into the repository's corpus afterwards:
#   build/fuzz/bin/NAME -merge=1 fuzz/corpus/NAME build/fuzz-work/NAME/corpus
set -euo pipefail
cd "$(dirname "$0")/.."
seconds="${1:?usage: scripts/fuzz.sh SECONDS [FUZZER...]}"
shift
build="${FUZZ_BUILD_DIR:-build/fuzz}"
fuzzers=("$@")
if [ ${#fuzzers[@]} -eq 0 ]; then
  fuzzers=(value_map_fuzzer call_sequence_fuzzer sim_command_fuzzer sim_description_fuzzer
    server_frame_fuzzer)
fi

scripts/setup.sh fuzz
if [ ! -f "$build/CMakeCache.txt" ]; then
  cmake --preset fuzz -B "$build"
fi
cmake --build "$build" -j"${FUZZ_JOBS:-2}" --target "${fuzzers[@]}"

status=0
for name in "${fuzzers[@]}"; do
  work="build/fuzz-work/$name"
  mkdir -p "$work/corpus"
  echo "== $name: ${seconds}s"
  # The fuzzer's own exit code tells whether it found something; its log is kept.
  if ! "$build/bin/$name" -max_total_time="$seconds" -timeout=10 -rss_limit_mb=2048 \
      -artifact_prefix="$work/" -print_final_stats=1 "$work/corpus" "fuzz/corpus/$name" \
      >"$work/log.txt" 2>&1; then
    echo "$name: FINDING (see $work/log.txt)"
    status=1
  fi
  grep -E '^(stat::number_of_executed_units|stat::new_units_added|Done)' "$work/log.txt" || true
done
exit $status
