# Shared by the scripts that try things in a Debian 12 of their own; needs root and debootstrap.
# TVX_MIRROR names the Debian mirror.

# make_root FOLDER: a minimal Debian 12, unless there is one.
make_root() {
  local target=$1
  [ ! -x "$target/usr/bin/apt-get" ] || return 0
  step "a minimal Debian 12 in $target"
  mkdir -p "$target"
  debootstrap --variant=minbase bookworm "$target" "${TVX_MIRROR:-http://deb.debian.org/debian}" >"$target.log" 2>&1 ||
    { tail "$target.log" >&2; return 1; }
}

# run_in_root FOLDER COMMANDS: with this machine's network settings, and processes of its own.
run_in_root() {
  local target=$1 file
  for file in /etc/resolv.conf /etc/apt/apt.conf.d/*proxy*; do
    if [ -e "$file" ]; then install -D -m 644 "$file" "$target$file"; fi
  done
  unshare --mount --pid --fork --root="$target" --mount-proc --wd=/ /bin/sh -c "$2"
}
