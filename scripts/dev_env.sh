# A running, uninstalled stack in one step: builds what is needed, puts tvxcim on the PATH, and starts a CIM-XML
# listener over the provider on simulated adapters.
#
#   source scripts/dev_env.sh [SCENARIO]     dev_env_stop   ends the listener and takes everything back
#
# TVX_DEV_PORT names the listener's port (default 5988). Bash only.
if [ -z "${BASH_SOURCE[0]:-}" ] || [ "${BASH_SOURCE[0]}" = "$0" ]; then
  echo "dev_env: source it: source scripts/dev_env.sh" >&2
  exit 2
fi

dev_env_stop() {
  [ -z "${TVX_DEV_LISTENER:-}" ] || { kill "$TVX_DEV_LISTENER" && wait "$TVX_DEV_LISTENER"; } 2>/dev/null
  [ -z "${TVX_DEV_OLD_PATH:-}" ] || PATH=$TVX_DEV_OLD_PATH
  [ -z "${TVX_DEV_LOG:-}" ] || rm -f "$TVX_DEV_LOG"
  unset TVX_DEV_LISTENER TVX_DEV_OLD_PATH TVX_DEV_LOG
  return 0
}

# Waits until the listener answers; fails with its output when it has ended.
dev_env_wait() {
  local tries
  for ((tries = 0; tries < 100; tries++)); do
    if (exec 3<>"/dev/tcp/127.0.0.1/$1") 2>/dev/null; then return 0; fi
    kill -0 "$TVX_DEV_LISTENER" 2>/dev/null || break
    sleep 0.1
  done
  cat "$TVX_DEV_LOG" >&2
  return 1
}

dev_env_start() {
  local root port=${TVX_DEV_PORT:-5988} scenario=${1:-everything}
  root=$(cd "$(dirname "${BASH_SOURCE[0]}")/.." && pwd)
  dev_env_stop
  "$root/scripts/setup.sh" demo || return 1
  if ! (cd "$root" && cmake --preset dev && cmake --build --preset dev --target \
        tvxcim torvex_fc_provider lrmapi HBAAPI tvsdm) >"${TMPDIR:-/tmp}/dev_env_build.$$" 2>&1; then
    tail -n 40 "${TMPDIR:-/tmp}/dev_env_build.$$" >&2
    rm -f "${TMPDIR:-/tmp}/dev_env_build.$$"
    return 1
  fi
  rm -f "${TMPDIR:-/tmp}/dev_env_build.$$"
  TVX_DEV_OLD_PATH=$PATH
  PATH="$root/build/dev/bin:$PATH"
  TVX_DEV_LOG=$(mktemp)
  tvxcim "--sim=$scenario" serve --port "$port" >"$TVX_DEV_LOG" 2>&1 &
  TVX_DEV_LISTENER=$!
  disown "$TVX_DEV_LISTENER"
  dev_env_wait "$port" || { dev_env_stop; return 1; }
  cat <<TEXT
The provider listens at http://127.0.0.1:$port on the simulated host '$scenario'. Try:
  tvxcim --sim=$scenario ports
  wbemcli ein 'http://127.0.0.1:$port/root/torvex:TVXHBA_FCPort'
dev_env_stop ends it.
TEXT
}

dev_env_start "$@"
