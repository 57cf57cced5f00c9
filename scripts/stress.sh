#!/usr/bin/env bash
# Runs a built suite RUNS times with `ctest -j JOBS` and tells how many runs failed and which
# tests failed how often: a test that fails one run in fifteen shows up here, not in CI.
# Usage: stress.sh BUILD_DIR RUNS [JOBS]   (each failing run's log stays in BUILD_DIR/stress/)
set -uo pipefail

build=$1
runs=$2
jobs=${3:-4}
logs="$build/stress"
failedList="$build/Testing/Temporary/LastTestsFailed.log"
rm -rf "$logs"
mkdir -p "$logs"
declare -A failures=()
failedRuns=0

for ((run = 1; run <= runs; run++)); do
  rm -f "$failedList"
  log="$logs/run-$run.log"
  if ctest --test-dir "$build" --output-on-failure --timeout 300 -j "$jobs" >"$log" 2>&1; then
    echo "run $run/$runs: passed"
    rm -f "$log"
    continue
  fi
  failedRuns=$((failedRuns + 1))
  # Lines of "number:name"; a run that failed without naming a test still counts.
  names=$(cut -d: -f2- "$failedList" 2>/dev/null)
  [[ -n "$names" ]] || names="(no test named: see the log)"
  while IFS= read -r name; do failures[$name]=$((${failures[$name]:-0} + 1)); done <<<"$names"
  echo "run $run/$runs: FAILED ($(paste -sd' ' <<<"$names")), log in $log"
done

echo "$failedRuns of $runs runs failed"
for name in "${!failures[@]}"; do echo "  ${failures[$name]}x $name"; done | sort -rn
((failedRuns == 0))
