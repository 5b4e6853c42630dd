#!/usr/bin/env bash
# Builds the libFuzzer targets with clang and runs each for a bounded time on its committed corpus.
#
# usage: scripts/fuzz.sh [SECONDS_PER_TARGET]   (default 5)
set -euo pipefail
. "$(dirname "$0")/lib.sh"

seconds=${1:-5}
configure_and_build fuzz tvx_fuzz_targets
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
count=0
for target in "$root"/build/fuzz/bin/fuzz_*; do
  [ -x "$target" ] || continue
  name=$(basename "$target")
  mkdir -p "$work/$name"
  corpus="$root/fuzz/corpus/${name#fuzz_}"
  echo "$name: ${seconds} s"
  if ! (cd "$work" && "$target" -max_total_time="$seconds" -artifact_prefix="$work/" -print_final_stats=1 \
        "$work/$name" ${corpus:+"$corpus"}) >"$work/$name.log" 2>&1; then
    tail -n 40 "$work/$name.log" >&2
    echo "$name found a failure (above)" >&2
    exit 1
  fi
  grep -E 'number_of_executed_units' "$work/$name.log" || true
  count=$((count + 1))
done
[ "$count" -gt 0 ] || { echo "no fuzz target was built" >&2; exit 1; }
echo "$count fuzz targets ran without a finding"
