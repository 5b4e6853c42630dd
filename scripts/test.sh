#!/usr/bin/env bash
# Runs every check: formatting and static analysis, the release build with all test tiers, the same under
# AddressSanitizer/UBSan, and the threaded tiers under ThreadSanitizer.
#
# usage: scripts/test.sh [lint|release|asan|tsan|fuzz]...    (default: all of them)
# TVX_JOBS sets the number of parallel jobs.
set -euo pipefail
. "$(dirname "$0")/lib.sh"

stages=("$@")
for stage in "${stages[@]:-}"; do
  case "$stage" in
    -h|--help) sed -n '2,6p' "$0" | sed 's/^# \{0,1\}//'; exit 0 ;;
    ""|lint|release|asan|tsan|fuzz) ;;
    *) echo "test: unknown stage '$stage'; use lint, release, asan, tsan or fuzz" >&2; exit 2 ;;
  esac
done
[ ${#stages[@]} -gt 0 ] || stages=(release asan tsan fuzz lint)

"$root/scripts/setup.sh" test

run_ctest() {
  local preset=$1
  shift
  (cd "$root" && ctest --preset "$preset" -j "$jobs" "$@")
}

for stage in "${stages[@]}"; do
  SECONDS=0
  case "$stage" in
    lint)
      step "formatting and static analysis"
      "$root/scripts/lint.sh" ;;
    release)
      step "release: build without warnings, all test tiers"
      configure_and_build release
      run_ctest release ;;
    asan)
      step "AddressSanitizer, LeakSanitizer, UndefinedBehaviorSanitizer: the provider and the listener"
      configure_and_build asan
      run_ctest asan ;;
    tsan)
      step "ThreadSanitizer: the concurrency tier"
      configure_and_build tsan tvx_concurrency_tests
      run_ctest tsan -L concurrency ;;
    fuzz)
      step "fuzz targets for a bounded time"
      "$root/scripts/fuzz.sh" ;;
  esac
  echo "$stage: passed in ${SECONDS} s"
done
step "all stages passed: ${stages[*]}"
