#!/usr/bin/env bash
# Installs the Debian packages in a fresh Debian 12 root made with debootstrap, uses them, removes them again and
# looks at what stays behind. Needs root, debootstrap and a Debian mirror; run by hand, behind scripts/package.sh.
#
# usage: scripts/package_trial.sh [ROOT]   (ROOT: an existing or new folder, default build/fresh-debian)
set -euo pipefail
. "$(dirname "$0")/lib.sh"
. "$(dirname "$0")/fresh_root.sh"

case "${1:-}" in
  -h|--help) sed -n '2,5p' "$0" | sed 's/^# \{0,1\}//'; exit 0 ;;
esac
target=${1:-$root/build/fresh-debian}
[ "$(id -u)" -eq 0 ] || { echo "package_trial: run as root (it uses debootstrap and chroot)" >&2; exit 1; }
debs=("$root"/build/package/*.deb)
[ -e "${debs[0]}" ] || { echo "package_trial: there are no packages; run scripts/package.sh first" >&2; exit 1; }

make_root "$target"
rm -rf "$target/opt/packages"
install -D -m 644 -t "$target/opt/packages" "${debs[@]}"

step "install, use, remove"
run_in_root "$target" '
set -e
export DEBIAN_FRONTEND=noninteractive
export TMPDIR=$(mktemp -d)
names="torvex-fc-provider torvex-fc-tools"
apt-get update -q >/dev/null
apt-get install -q -y --reinstall --no-install-recommends /opt/packages/*.deb >/tmp/install.log 2>&1 || { cat /tmp/install.log; exit 1; }
echo "installed: $names"
python3 -c "import ctypes; ctypes.CDLL(\"HBAAPI.so.2\")"
echo "HBAAPI.so.2 is found: $(readlink -f /usr/lib/*/HBAAPI.so.2)"
test "$(tvxcim --sim classes | tail -n +2 | wc -l)" -ge 152
tvxcim --sim ports
test "$(tvxcim --sim ports | wc -l)" -eq 5
tvxcim ports
python3 /usr/share/torvex-fc-provider/simulator/make_firmware.py --version 2.02a1 --model TVX16 /tmp/new.fw
! tvxcim --sim firmware show | grep -q " 2.02a1 "
tvxcim --sim firmware install 10:00:02:54:56:0C:41:10 /tmp/new.fw --reset 2>/dev/null
tvxcim --sim firmware show | grep -q " 2.02a1 "
echo "firmware was installed on a simulated adapter"

# Commands of CIM servers that look at the files that they are given and tell what they were asked.
status=0
torvex-fc-register --dry-run 2>/dev/null || status=$?
test "$status" -eq 3
rm -f /tmp/asked
mkdir -p /tmp/server
for name in cimmof cimprovider sfcbstage sfcbrepos sfcbunstage; do
  cat >/tmp/server/$name <<"STAND_IN"
#!/bin/sh
for word in "$@"; do
  case $word in /*) test -s "$word" || { echo "no file $word" >&2; exit 1; } ;; esac
done
echo "${0##*/}" >>/tmp/asked
STAND_IN
  chmod 755 /tmp/server/$name
done
for server in pegasus sfcb; do
  for action in register unregister; do
    PATH=/tmp/server:$PATH torvex-fc-register $action --server $server >/dev/null
  done
done
test "$(wc -l </tmp/asked)" -eq 13
echo "registered and unregistered with commands of both kinds of servers"
for page in man1/tvxcim.1 man8/torvex-fc-register.8; do
  test -e /usr/share/man/$page.gz || { grep -rq "path-exclude.*/man" /etc/dpkg && echo "no manual pages wanted here"; }
done
dpkg -L $names | sort -u | while read -r path; do [ -d "$path" ] || echo "$path"; done >/tmp/files
apt-get purge -q -y $names >/dev/null 2>&1
while read -r path; do [ ! -e "$path" ] || { echo "left behind: $path"; exit 1; }; done </tmp/files
rm -rf "$TMPDIR" /tmp/server /tmp/asked
echo "removed: none of $(wc -l </tmp/files) files is left"
'
