#!/usr/bin/env bash
# Tries the committed tree as a new user would: in a fresh Debian 12 root made with debootstrap, as root, from
# nothing but the two README commands. Needs root, debootstrap and a Debian mirror; run by hand.
#
# usage: scripts/fresh_debian.sh [demo|test] [ROOT]   (ROOT: an existing or new folder, default build/fresh-debian)
# TVX_MIRROR names the Debian mirror, TVX_REUSE=1 keeps the tree that an earlier run copied in.
set -euo pipefail
. "$(dirname "$0")/lib.sh"

what=${1:-demo}
target=${2:-$root/build/fresh-debian}
case "$what" in
  demo|test) ;;
  *) sed -n '2,6p' "$0" | sed 's/^# \{0,1\}//'; [ "$what" = --help ] && exit 0 || exit 2 ;;
esac
[ "$(id -u)" -eq 0 ] || { echo "fresh_debian: run as root (it uses debootstrap and chroot)" >&2; exit 1; }

. "$(dirname "$0")/fresh_root.sh"
make_root "$target"
if [ -z "${TVX_REUSE:-}" ]; then
  rm -rf "$target/opt/tree"
  mkdir -p "$target/opt/tree"
  git -C "$root" archive HEAD | tar -x -C "$target/opt/tree"
fi

step "scripts/$what.sh there"
run_in_root "$target" "cd /opt/tree && git --version >/dev/null 2>&1; HOME=/root exec scripts/$what.sh"
