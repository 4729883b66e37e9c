# What the scripts share. Sourced, with bash; leaves the caller in the top folder of the project.

set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")/.."

build_packages=(g++ cmake ninja-build pkg-config libsystemd-dev libutf8proc-dev libreadline-dev)
run_packages=(dbus-daemon systemd-journal-remote)
# Of the compilers and checkers, those of the release: clang is 14 on Debian 12, 19 on Debian 13.
check_packages=(libgtest-dev clang clang-format clang-tidy git libclang-rt-dev mandoc python3-dbusmock
  tmux zsh)

say() {
  printf '\n== %s\n' "$*"
}

as_root() {
  if [ "$(id -u)" -eq 0 ]; then
    "$@"
  elif command -v sudo >/dev/null; then
    sudo "$@"
  else
    echo "$0: cannot run '$*': not root, and there is no sudo" >&2
    return 1
  fi
}

# Installs those of the named packages that are missing.
ensure_packages() {
  local missing=() package
  for package in "$@"; do
    if ! dpkg-query -W -f='${Status}' "$package" 2>/dev/null | grep -q 'ok installed'; then
      missing+=("$package")
    fi
  done
  if [ "${#missing[@]}" -gt 0 ]; then
    say "Installing ${missing[*]}"
    as_root apt-get update -qq
    as_root env DEBIAN_FRONTEND=noninteractive \
      apt-get install -y -qq --no-install-recommends "${missing[@]}" >/dev/null
  fi
}

# Configures and builds into a folder; further arguments go to cmake.
build_into() {
  local folder=$1
  shift
  cmake -S . -B "$folder" -G Ninja "$@" >/dev/null
  cmake --build "$folder" -- --quiet
}
