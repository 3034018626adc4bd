#!/usr/bin/env bash
# Installs what a fresh Debian 12 machine lacks to build and test the agent.
# Does nothing on a machine that has it all (or that is not Debian).
set -euo pipefail

need=()
have_pkg() { dpkg-query -W -f='${Status}' "$1" 2>/dev/null | grep -q 'install ok installed'; }
for pkg in cmake g++ make zlib1g-dev libexpat1-dev libgtest-dev libbenchmark-dev \
           clang libclang-rt-14-dev clang-format git procps strace time; do
  have_pkg "$pkg" || need+=("$pkg")
done

if [ "${#need[@]}" -gt 0 ]; then
  if ! command -v apt-get >/dev/null 2>&1; then
    echo "setup: missing ${need[*]} and no apt-get here; install them by hand" >&2
    exit 1
  fi
  sudo=""
  [ "$(id -u)" -eq 0 ] || sudo="sudo"
  echo "setup: installing ${need[*]}"
  $sudo apt-get update -qq
  DEBIAN_FRONTEND=noninteractive $sudo apt-get install -y -qq --no-install-recommends "${need[@]}"
fi
