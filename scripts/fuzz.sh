#!/usr/bin/env bash
# Builds the fuzz targets and runs each one over its seeds for the given seconds (default 20: the
# smoke run CI makes). Usage: bash scripts/fuzz.sh [seconds] [target...]; FUZZ_JOBS=2 runs two
# targets at a time. Corpora grow in build/fuzz/corpus/<target> and carry over between runs; an
# input that fails is kept in build/fuzz/findings/ and the script exits non-zero.
set -euo pipefail
cd "$(dirname "$0")/.."
root=$PWD  # absolute: a target may change its working folder

seconds=${1:-20}
if [ $# -gt 0 ]; then shift; fi
targets=("$@")
if [ ${#targets[@]} -eq 0 ]; then
  targets=(protected_value ini_file command_line command_file template_conversion
           profile_conversion data_file_merge keyword_merge)
fi
jobs=${FUZZ_JOBS:-1}
# The targets write their inputs into a scratch folder under TMPDIR; in memory that costs a tenth.
if [ -d /dev/shm ] && [ -w /dev/shm ]; then export TMPDIR=/dev/shm; fi

cmake --preset fuzz >/dev/null
cmake --build --preset fuzz --target "${targets[@]/%/_fuzz}"
bash fuzz/seeds.sh build/fuzz/seeds
mkdir -p build/fuzz/findings build/fuzz/logs

run_target() {
  local target=$1 log=build/fuzz/logs/$1.log
  mkdir -p "build/fuzz/corpus/$target"
  if nice -n 10 "build/fuzz/fuzz/${target}_fuzz" -max_total_time="$seconds" -timeout=10 \
       -print_final_stats=1 -artifact_prefix="$root/build/fuzz/findings/$target-" \
       "$root/build/fuzz/corpus/$target" "$root/build/fuzz/seeds/$target" >"$log" 2>&1; then
    echo "$target: $(grep -o 'stat::number_of_executed_units: [0-9]*' "$log" | grep -o '[0-9]*$') executions in ${seconds} s, no finding"
  else
    echo "$target: FINDING, see $log and build/fuzz/findings/"
    return 1
  fi
}

failed=0
pids=()
for target in "${targets[@]}"; do
  run_target "$target" &
  pids+=($!)
  if [ ${#pids[@]} -ge "$jobs" ]; then
    wait "${pids[0]}" || failed=1
    pids=("${pids[@]:1}")
  fi
done
for pid in "${pids[@]}"; do wait "$pid" || failed=1; done
exit $failed
