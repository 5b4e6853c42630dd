#!/usr/bin/env bash
# Makes the Debian packages torvex-fc-provider and torvex-fc-tools in build/package, and has lintian look at
# them where it is installed.
#
# usage: scripts/package.sh
set -euo pipefail
. "$(dirname "$0")/lib.sh"

case "${1:-}" in
  -h|--help) sed -n '2,5p' "$0" | sed 's/^# \{0,1\}//'; exit 0 ;;
  "") ;;
  *) echo "package: takes no arguments" >&2; exit 2 ;;
esac

"$root/scripts/setup.sh" package
step "build (release, for /usr)"
configure_and_build package
step "packages"
cd "$root/build/package"
rm -f ./*.deb
cpack -G DEB >cpack.log 2>&1 || { cat cpack.log >&2; exit 1; }
ls -1 "$PWD"/*.deb
if command -v lintian >/dev/null; then
  step "lintian"
  lintian --allow-root --fail-on error ./*.deb
fi
