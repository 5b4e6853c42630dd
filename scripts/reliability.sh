#!/usr/bin/env bash
# Tries to break the provider, and writes what came of it into docs/reliability.md: every failure of every library
# call under AddressSanitizer and UBSan, then many clients at once under ThreadSanitizer and in a release build.
#
# usage: scripts/reliability.sh [EVERY] [SECONDS]   EVERY: one of so many cells of the fault matrix (default 1: all,
#                                                   an hour and more on two processors); SECONDS: of each soak (default 120)
set -euo pipefail
. "$(dirname "$0")/lib.sh"

case "${1:-}" in
  -h|--help) sed -n '2,6p' "$0" | sed 's/^# \{0,1\}//'; exit 0 ;;
esac
every=${1:-1}
seconds=${2:-120}
reports="$root/build/reliability"
mkdir -p "$reports"
# In the reports' folder: the provider fetches files into the working directory.
run() { (cd "$reports" && LD_LIBRARY_PATH="$root/build/$1/lib" "$root/build/$1/bin/$2" "${@:3}"); }

step "fault matrix, one of $every cells (asan)"
configure_and_build asan fault_matrix
run asan fault_matrix --every "$every" --jobs "$(nproc)" --report "$reports/matrix.md"
step "soak for $seconds s (tsan)"
configure_and_build tsan soak
run tsan soak --seconds "$seconds" --strict --report "$reports/soak_tsan.md"
step "soak for $seconds s (release)"
configure_and_build release soak
run release soak --seconds "$seconds" --report "$reports/soak_release.md"

python3 - "$root/docs/reliability.md" "$reports" "$every" <<'PY'
import pathlib, re, sys
page = pathlib.Path(sys.argv[1])
text = page.read_text()
for name in ("matrix", "soak_tsan", "soak_release"):
    table = (pathlib.Path(sys.argv[2]) / (name + ".md")).read_text()
    if name == "matrix":
        table = "One of %s cells.\n\n" % sys.argv[3] + table if sys.argv[3] != "1" else table
    text, count = re.subn(r"(<!-- %s -->\n).*?(<!-- end -->)" % name, lambda m: m.group(1) + table + m.group(2), text,
                          flags=re.S)
    if count != 1:
        sys.exit("docs/reliability.md has no place for " + name)
page.write_text(text)
PY
echo "docs/reliability.md is written"
