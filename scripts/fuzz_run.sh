#!/usr/bin/env bash
# Runs every libFuzzer target of a fuzz build in turn, each for SECONDS (or
# RUNS executions, whichever ends first), with its seed corpus and a memory
# cap. New inputs go to fuzz/work-<target>/, faults to fuzz/work-<target>/crash-*;
# the committed corpus is only read. Usage: fuzz_run.sh BUILD SECONDS [RUNS] [TARGET...]
set -uo pipefail
cd "$(dirname "$0")/.."
build=${1:?build directory}
seconds=${2:?seconds per target}
runs=${3:--1}
shift $(( $# < 3 ? $# : 3 ))
targets=("$@")
if [ ${#targets[@]} -eq 0 ]; then
  for source in fuzz/fuzz_*.cpp; do targets+=("$(basename "$source" .cpp)"); done
fi
status=0
for target in "${targets[@]}"; do
  binary="$build/$target"
  [ -x "$binary" ] || { echo "$target: not built in $build" >&2; status=1; continue; }
  work="fuzz/work-$target"
  mkdir -p "$work" "fuzz/corpus/$target"
  log="$work/run.log"
  "$binary" -max_total_time="$seconds" -runs="$runs" -rss_limit_mb=2048 -malloc_limit_mb=1024 \
    -artifact_prefix="$work/" -print_final_stats=1 "$work" "fuzz/corpus/$target" >"$log" 2>&1
  code=$?
  execs=$(grep -o 'stat::number_of_executed_units: *[0-9]*' "$log" | grep -o '[0-9]*$')
  cov=$(grep -o 'cov: [0-9]*' "$log" | tail -n 1 | grep -o '[0-9]*$')
  echo "$target: exit $code, ${execs:-?} executions, cov ${cov:-?}, $(ls "$work" | grep -c '^crash-\|^leak-\|^timeout-\|^oom-') faults"
  [ "$code" -eq 0 ] || status=1
done
exit $status
