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

# True if the leak checker itself broke down in every test that failed, which it does now and then while a process
# ends: such a run says nothing, so it is repeated. A test that failed for another reason stays failed.
only_leak_checker_failed() {
  local results="$root/build/$1/Testing/Temporary" others
  [ -f "$results/LastTestsFailed.log" ] || return 1
  others=$(comm -23 <(cut -d: -f2 "$results/LastTestsFailed.log" | sort -u) \
    <(awk '/^[0-9]+\/[0-9]+ Testing: /{ name = $3 }
           /LeakSanitizer has encountered a fatal error/{ print name }' "$results/LastTest.log" | sort -u))
  [ -z "$others" ]
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
      run_ctest asan || { only_leak_checker_failed asan && run_ctest asan --rerun-failed; } ;;
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
