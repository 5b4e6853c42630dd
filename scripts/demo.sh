#!/usr/bin/env bash
# Builds the provider, the simulated adapter libraries and tvxcim, and lists the FC ports of a simulated host
# the way a CIM client would. Installs what is missing; a second run only runs. Touches nothing outside the tree.
set -euo pipefail
. "$(dirname "$0")/lib.sh"

case "${1:-}" in
  -h|--help) sed -n '2,3p' "$0" | sed 's/^# \{0,1\}//'; exit 0 ;;
  "") ;;
  *) echo "demo: takes no arguments" >&2; exit 2 ;;
esac

step "packages"
"$root/scripts/setup.sh" demo
step "build (release; the first time takes a few minutes)"
configure_and_build demo
echo "built: build/demo"

tvxcim="$root/build/demo/bin/tvxcim"
step "the classes of the provider: tvxcim --sim classes"
"$tvxcim" --sim classes | tail -n 1
step "one chip through CMPI: tvxcim --sim --property-list ElementName,Tag,BoardTemperature,TemperatureUnit ei TVXHBA_Chip"
"$tvxcim" --sim --property-list ElementName,Tag,BoardTemperature,TemperatureUnit ei TVXHBA_Chip
step "the FC ports of the host: tvxcim --sim ports"
"$tvxcim" --sim ports
