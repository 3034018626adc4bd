#!/usr/bin/env bash
# The whole test suite: a release build and an AddressSanitizer +
# UndefinedBehaviorSanitizer build, both with warnings as errors, then the
# fuzz targets for a bounded time, then the macOS cross-build.
set -euo pipefail
cd "$(dirname "$0")/.."
bash scripts/setup.sh

jobs=$(nproc 2>/dev/null || echo 2)

echo "== formatting"
if git rev-parse --is-inside-work-tree >/dev/null 2>&1; then
  git ls-files -z '*.cc' '*.h' | xargs -0 clang-format --dry-run --Werror
fi

echo "== release build"
cmake -S . -B build -DCMAKE_BUILD_TYPE=Release >/dev/null
cmake --build build -j"$jobs"
(cd build && ctest --output-on-failure -j"$jobs")

echo "== address and undefined-behaviour sanitizer build"
cmake -S . -B build-asan -DCMAKE_BUILD_TYPE=RelWithDebInfo -DCVN_SANITIZE=ON -DCVN_BENCH=OFF >/dev/null
cmake --build build-asan -j"$jobs"
(cd build-asan && ASAN_OPTIONS=detect_leaks=1 UBSAN_OPTIONS=print_stacktrace=1 \
   ctest --output-on-failure -j"$jobs")

echo "== fuzz targets (bounded)"
CXX=clang++ cmake -S . -B build-fuzz -DCMAKE_BUILD_TYPE=RelWithDebInfo -DCVN_FUZZ=ON \
  -DCVN_SANITIZE=ON -DCVN_TESTS=OFF -DCVN_BENCH=OFF >/dev/null
cmake --build build-fuzz -j"$jobs"
seconds="${CVN_FUZZ_SECONDS:-30}"
for target in build-fuzz/*_fuzz; do
  [ -x "$target" ] || continue
  name=$(basename "$target")
  seeds="fuzz/corpus/${name%_fuzz}"
  work=$(mktemp -d)
  [ -d "$seeds" ] && cp -r "$seeds"/. "$work"/
  echo "-- $name for ${seconds}s"
  "$target" -max_total_time="$seconds" -rss_limit_mb=2048 -print_final_stats=0 "$work" 2>&1 | tail -n 3
  rm -rf "$work"
done

# The macOS cross-build, after the Linux builds: it compiles and links the
# *_darwin.cc files no Linux build sees. A stage of its own, with its own
# verdict line.
macos_stage() {
  echo "== macOS cross-build (x86_64 and arm64)"
  local start=$SECONDS
  if bash scripts/build-macos.sh; then
    echo "macOS stage: passed in $((SECONDS - start)) s"
  else
    echo "macOS stage: FAILED after $((SECONDS - start)) s"
    return 1
  fi
}
macos_stage || exit 1

echo "all builds and tests passed"
