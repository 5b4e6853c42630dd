#!/usr/bin/env bash
# Builds the provider, the simulated adapter libraries and tvxcim, and shows a simulated host the way CIM clients
# see it: ports, tree, units, counters, a diagnostic, a firmware update, and wbemcli over HTTP. Installs what is
# missing; a second run only runs. Touches nothing outside the tree.
set -euo pipefail
. "$(dirname "$0")/lib.sh"

case "${1:-}" in
  -h|--help) sed -n '2,4p' "$0" | sed 's/^# \{0,1\}//'; exit 0 ;;
  "") ;;
  *) echo "demo: takes no arguments" >&2; exit 2 ;;
esac

# What the commands change in the simulated host lives here, and every run starts with a new one.
TMPDIR=$(mktemp -d)
export TMPDIR
listener=
finish() {
  [ -z "$listener" ] || { kill "$listener" && wait "$listener"; } 2>/dev/null || true
  rm -rf "$TMPDIR"
}
trap finish EXIT

step "packages"
"$root/scripts/setup.sh" demo
step "build (release; the first time takes a few minutes)"
configure_and_build demo
echo "built: build/demo"

# show WORDS...: what is run, and what it answers.
show() {
  step "tvxcim $*"
  "$root/build/demo/bin/tvxcim" "$@"
}
port=10:00:02:54:56:0C:41:10

step "tvxcim --sim classes | tail -n 1"
"$root/build/demo/bin/tvxcim" --sim classes | tail -n 1
show --sim ports
show --sim=single tree
step "tvxcim --sim luns | head -n 4"
"$root/build/demo/bin/tvxcim" --sim luns >"$TMPDIR/luns"
head -n 4 "$TMPDIR/luns"
show --sim stats
show --sim diag run internal-loopback $port
step "a firmware file for the simulated adapters: sim/make_firmware.py --version 2.02a1 --model TVX16 new.fw"
(cd "$TMPDIR" && python3 "$root/sim/make_firmware.py" --version 2.02a1 --model TVX16 new.fw)
show --sim firmware show $port
(cd "$TMPDIR" && show --sim firmware install $port new.fw --reset)
show --sim firmware show $port

step "tvxcim --sim serve, asked by another program: wbemcli"
"$root/build/demo/bin/tvxcim" --sim serve --port 0 >"$TMPDIR/listener" 2>&1 &
listener=$!
url=
for ((tries = 0; tries < 100; tries++)); do
  url=$(sed -n 's|^serving \(http://[^/]*\)/.*|\1|p' "$TMPDIR/listener")
  [ -z "$url" ] || break
  kill -0 "$listener" 2>/dev/null || break
  sleep 0.1
done
[ -n "$url" ] || { cat "$TMPDIR/listener" >&2; exit 1; }
name=$(wbemcli ein "$url/root/torvex:TVXHBA_FCPort" | grep "DeviceID=\"${port//:/}\"")
echo "wbemcli -nl gi 'http://$name' PortType,PermanentAddress,Speed,MaxSpeed"
wbemcli -nl gi "http://$name" PortType,PermanentAddress,Speed,MaxSpeed

printf '\nThe demo is over: all of it worked. Try build/demo/bin/tvxcim --help, and docs/user-guide.md.\n'
