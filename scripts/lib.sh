# Shared by the scripts: where the tree is, how a step is shown and how a preset is built.
root=$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)
jobs=${TVX_JOBS:-$(nproc)}

# Compiler results are shared between checkouts, whatever folder they lie in.
export CCACHE_BASEDIR="$root" CCACHE_NOHASHDIR=1

step() { printf '\n== %s\n' "$*"; }

# configure_and_build PRESET [TARGET...]: quiet when all is well, the whole output when not. Builds from nothing are
# the rule here: sources that read the same large headers are compiled together.
configure_and_build() {
  local preset=$1 log="$root/build/$1.log"
  shift
  mkdir -p "$root/build"
  if ! (cd "$root" && cmake --preset "$preset" -DTVX_UNITY=ON && cmake --build --preset "$preset" -j "$jobs" ${1:+--target "$@"}) \
      >"$log" 2>&1; then
    tail -n 60 "$log" >&2
    echo "building '$preset' failed; the whole log is $log" >&2
    return 1
  fi
}
