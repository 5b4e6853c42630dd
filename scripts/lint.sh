#!/usr/bin/env bash
# clang-format, clang-tidy and cppcheck over hand-written code.
#
# usage: scripts/lint.sh [format|tidy|tidy-all|cppcheck]...   (default: format, tidy and cppcheck)
# tidy looks at the provider (src), tidy-all at the simulator and the host programs too.
# clang-tidy reads the compile commands of the release build, which scripts/test.sh makes.
set -euo pipefail
. "$(dirname "$0")/lib.sh"
cd "$root"

checks=("$@")
[ ${#checks[@]} -gt 0 ] || checks=(format tidy cppcheck)
mapfile -t sources < <(git ls-files '*.cpp' '*.c' '*.h')
[ ${#sources[@]} -gt 0 ] || { echo "lint: no sources found" >&2; exit 1; }

for check in "${checks[@]}"; do
  case "$check" in
    format)
      clang-format --dry-run --Werror "${sources[@]}"
      echo "format: ${#sources[@]} files" ;;
    tidy|tidy-all)
      [ -f build/release/compile_commands.json ] || configure_and_build release
      folders=('src/*.cpp')
      [ "$check" = tidy ] || folders+=('host/*.cpp' 'sim/*.cpp')
      mapfile -t units < <(git ls-files "${folders[@]}")
      printf '%s\0' "${units[@]}" |
        xargs -0 -n 4 -P "$jobs" clang-tidy -p build/release --quiet 2>/dev/null
      echo "tidy: ${#units[@]} units" ;;
    cppcheck)
      cppcheck --quiet --error-exitcode=1 --std=c++20 --language=c++ --inline-suppr -j "$jobs" \
        --enable=warning,performance,portability --suppressions-list=.cppcheck-suppressions \
        -I src -I include src host sim
      echo "cppcheck: src host sim" ;;
    *) echo "lint: unknown check '$check'" >&2; exit 2 ;;
  esac
done
