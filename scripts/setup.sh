#!/usr/bin/env bash
# Installs the Debian packages that building, the demo or the tests need, and only those that are missing.
#
# usage: scripts/setup.sh [demo|package|test]   demo: build and run (default); package: that and Debian packages;
#                                               test: that and everything the tests use
set -euo pipefail

case "${1:-demo}" in
  -h|--help) sed -n '2,6p' "$0" | sed 's/^# \{0,1\}//'; exit 0 ;;
  demo|package|test) what=${1:-demo} ;;
  *) echo "setup: unknown argument '$1'; use 'demo', 'package' or 'test'" >&2; exit 2 ;;
esac

packages=(g++ cmake ninja-build ccache python3 nlohmann-json3-dev libcli11-dev libfmt-dev
          libpugixml-dev libmicrohttpd-dev librapidxml-dev sblim-wbemcli)
[ "$what" != package ] || packages+=(dpkg-dev file gzip lintian)
if [ "$what" = test ]; then
  packages+=(libgtest-dev libgmock-dev libbenchmark-dev
             libhbaapi-dev libhbaapi2 libcurl4 binutils util-linux
             clang clang-format clang-tidy cppcheck libclang-rt-14-dev)
fi

missing=()
for package in "${packages[@]}"; do
  status=$(dpkg-query -W -f='${Status}' "$package" 2>/dev/null || true)
  [ "$status" = "install ok installed" ] || missing+=("$package")
done
if [ ${#missing[@]} -eq 0 ]; then
  echo "setup: all ${#packages[@]} packages are there"
  exit 0
fi

echo "setup: installing ${#missing[@]} of ${#packages[@]} packages: ${missing[*]}"
as_root=()
if [ "$(id -u)" -ne 0 ]; then
  command -v sudo >/dev/null || {
    echo "setup: not root and no sudo; as root run: apt-get install --no-install-recommends ${missing[*]}" >&2
    exit 1
  }
  as_root=(sudo)
fi
export DEBIAN_FRONTEND=noninteractive
"${as_root[@]}" apt-get update -q
"${as_root[@]}" apt-get install -q -y --no-install-recommends "${missing[@]}"
echo "setup: done"
