#!/usr/bin/env bash
# Installs what a fresh Debian 12 machine lacks to build and test the agent,
# one line per step; apt's own output goes to build/setup.log. Does nothing
# on a machine that has it all (or that is not Debian).
set -euo pipefail
cd "$(dirname "$0")/.."

packages=(cmake g++ make zlib1g-dev libexpat1-dev libgtest-dev libbenchmark-dev
          clang libclang-rt-14-dev clang-format git procps)
need=()
have_pkg() { dpkg-query -W -f='${Status}' "$1" 2>/dev/null | grep -q 'install ok installed'; }
for pkg in "${packages[@]}"; do
  have_pkg "$pkg" || need+=("$pkg")
done

if [ "${#need[@]}" -eq 0 ]; then
  echo "setup: all ${#packages[@]} packages are installed"
  exit 0
fi
if ! command -v apt-get >/dev/null 2>&1; then
  echo "setup: missing ${need[*]} and no apt-get here; install them by hand" >&2
  exit 1
fi
sudo=""
[ "$(id -u)" -eq 0 ] || sudo="sudo"
mkdir -p build
log=build/setup.log
: >"$log"

step() {
  local what=$1
  shift
  printf 'setup: %s... ' "$what"
  if "$@" >>"$log" 2>&1; then
    echo "done"
  else
    echo "failed; apt's output is in $log"
    exit 1
  fi
}
step "updating the package lists" $sudo apt-get update
step "installing ${need[*]}" $sudo env DEBIAN_FRONTEND=noninteractive \
  apt-get install -y --no-install-recommends "${need[@]}"
