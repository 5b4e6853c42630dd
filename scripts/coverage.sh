#!/usr/bin/env bash
# Builds with gcov's counters, runs all tests, and tells how much of the provider's own code they reach: lines and
# branches of src/, generated code apart. The table by folder goes to docs/reliability.md and to
# build/coverage/coverage.md, pages with every line to build/coverage/html/.
#
# usage: scripts/coverage.sh [--no-run]     --no-run: report on what an earlier run counted
set -euo pipefail
. "$(dirname "$0")/lib.sh"

case "${1:-}" in
  -h|--help) sed -n '2,6p' "$0" | sed 's/^# \{0,1\}//'; exit 0 ;;
  ""|--no-run) ;;
  *) echo "coverage: unknown argument '$1'" >&2; exit 2 ;;
esac
command -v gcovr >/dev/null || { echo "coverage: gcovr is missing; apt-get install gcovr" >&2; exit 1; }

build="$root/build/coverage"
if [ "${1:-}" != --no-run ]; then
  step "build with counters"
  configure_and_build coverage
  find "$build" -name '*.gcda' -delete
  step "all tests"
  (cd "$root" && ctest --preset coverage -j "$jobs") || echo "coverage: some tests failed; the figures are of what ran" >&2
fi

step "figures"
mkdir -p "$build/html"
gcovr --root "$root" --object-directory "$build" --filter "$root/src/" --exclude-throw-branches \
  --exclude-unreachable-branches --gcov-ignore-parse-errors -j "$jobs" \
  --json-summary "$build/coverage.json" --html-details "$build/html/index.html" >/dev/null
python3 - "$build/coverage.json" "$build/coverage.md" "$root/docs/reliability.md" <<'PY'
import json, sys, collections, pathlib, re
files = json.load(open(sys.argv[1]))["files"]
sums = collections.defaultdict(lambda: [0, 0, 0, 0])
for f in files:
    folder = "/".join(f["filename"].split("/")[:2])
    for key in (folder, "all"):
        s = sums[key]
        s[0] += f["line_covered"]; s[1] += f["line_total"]
        s[2] += f["branch_covered"]; s[3] += f["branch_total"]
def percent(a, b): return "%.1f %%" % (100.0 * a / b) if b else "-"
lines = ["| Folder | Lines | of | | Branches | of | |", "|---|---|---|---|---|---|---|"]
for name in sorted(sums, key=lambda n: (n == "all", n)):
    a, b, c, d = sums[name]
    lines.append("| `%s` | %d | %d | %s | %d | %d | %s |" % (name, a, b, percent(a, b), c, d, percent(c, d)))
open(sys.argv[2], "w").write("\n".join(lines) + "\n")
print("\n".join(lines))
page = pathlib.Path(sys.argv[3])
text, count = re.subn(r"(<!-- coverage -->\n).*?(<!-- end -->)",
                      lambda m: m.group(1) + "\n".join(lines) + "\n" + m.group(2), page.read_text(), flags=re.S)
if count != 1:
    sys.exit("docs/reliability.md has no place for the coverage")
page.write_text(text)
PY
