#!/usr/bin/env bash
# Runs every fuzz target of a VEXIL_FUZZ build for a while each, from the corpus kept in
# tests/fuzz/corpus/<target>/. New inputs go to the build's own corpus directory, crashes
# to its artifacts directory; a crash's input belongs in the kept corpus, with a test.
# Usage: run-fuzz.sh BUILD_DIR SECONDS_PER_TARGET
set -euo pipefail

build=$1
seconds=$2
fuzz="$(cd "$(dirname "$0")/.." && pwd)/tests/fuzz"
kept="$fuzz/corpus"
status=0
# Every report ends the run, except the ones the suppressions name (in RapidJSON itself).
export UBSAN_OPTIONS="suppressions=$fuzz/ubsan.supp:halt_on_error=1:print_stacktrace=1"

for program in "$build"/tests/fuzz/fuzz_*; do
  target=$(basename "$program")
  work="$build/fuzz-corpus/$target"
  artifacts="$build/fuzz-artifacts/$target/"
  mkdir -p "$work" "$artifacts"
  echo "fuzz: $target for ${seconds}s"
  if ! "$program" -max_total_time="$seconds" -rss_limit_mb=4096 -timeout=30 -print_final_stats=1 \
      -artifact_prefix="$artifacts" "$work" "$kept/$target" >"$build/fuzz-$target.log" 2>&1; then
    echo "fuzz: $target FAILED; see $build/fuzz-$target.log and $artifacts" >&2
    status=1
  fi
  grep -E '^stat::(number_of_executed_units|peak_rss_mb)|^#[0-9]+ *DONE' "$build/fuzz-$target.log" || true
done
exit $status
