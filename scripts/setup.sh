#!/usr/bin/env bash
# Installs what a fresh Debian 12 machine lacks, one line per step; apt's own
# output is appended to build/setup.log. Does nothing on a machine that has it
# all (or that is not Debian).
#
#   scripts/setup.sh               what the main job needs (scripts/run-sample.sh)
#   scripts/setup.sh tests         and what only the tests need (scripts/test.sh)
#   scripts/setup.sh macos         and what only the macOS cross-build needs
#
# Each package is listed once, in the group of the first command that needs
# it; a package for a new test goes into test_packages.
set -euo pipefail
cd "$(dirname "$0")/.."

# The main job: the build (whose default configuration also finds the test and
# benchmark libraries, so the tests share its build tree) and the real ps the
# scan runs.
main_packages=(
  cmake
  g++
  make
  zlib1g-dev
  libexpat1-dev
  libgtest-dev
  libbenchmark-dev
  procps
)
# Only the tests, and the benchmark scripts beside them.
test_packages=(
  clang              # the fuzz targets
  libclang-rt-14-dev # libFuzzer
  clang-format       # the formatting check
  git                # the formatting check's list of files
  groff-base         # the manual pages' test
  strace             # bench/scan_cost.sh
  time               # bench/scan_memory.sh
  chromium-headless-shell # the inspector's pages, rendered
)
# Only the macOS cross-build (scripts/build-macos.sh, also the tests' last
# stage). Its compiler comes from the npm registry, so npm too, unless a
# Node.js of the machine's own already brought one.
macos_packages=(
  llvm-14 # llvm-nm and llvm-lipo
  file
)
command -v npm >/dev/null 2>&1 || macos_packages+=(npm)

packages=("${main_packages[@]}")
for group in "$@"; do
  case $group in
    tests) packages+=("${test_packages[@]}") ;;
    macos) packages+=("${macos_packages[@]}") ;;
    *)
      echo "setup: unknown group $group (tests or macos)" >&2
      exit 2
      ;;
  esac
done

need=()
have_pkg() { dpkg-query -W -f='${Status}' "$1" 2>/dev/null | grep -q 'install ok installed'; }
for pkg in "${packages[@]}"; do
  have_pkg "$pkg" || need+=("$pkg")
done

mkdir -p build
log=build/setup.log
echo "== $(date '+%F %T') scripts/setup.sh${*:+ $*}" >>"$log"

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
  exit 0
fi
if ! command -v apt-get >/dev/null 2>&1; then
  echo "setup: missing ${need[*]} and no apt-get here; install them by hand" >&2
  exit 1
fi
sudo=""
[ "$(id -u)" -eq 0 ] || sudo="sudo"
step "updating the package lists" $sudo apt-get update
step "installing ${#need[@]} of ${#packages[@]} packages: ${need[*]}" \
  $sudo env DEBIAN_FRONTEND=noninteractive apt-get install -y --no-install-recommends "${need[@]}"
