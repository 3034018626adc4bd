#!/usr/bin/env bash
# The whole test suite: formatting, a release build and an AddressSanitizer +
# UndefinedBehaviorSanitizer build, both with warnings as errors, then the
# fuzz targets for a bounded time, then the macOS cross-build. Every stage
# goes on after a failure and reports into one tally; the last line is the
# verdict "N passed, N failed" and the exit status is non-zero when anything
# failed.
set -uo pipefail
cd "$(dirname "$0")/.."

passed=0
failed=0
# Any stage adds what it counted: report PASSED FAILED. A stage that is one
# check (formatting, a fuzz target, a build that breaks, a platform's
# cross-build) counts as one: `if stage; then report 1 0; else report 0 1; fi`.
report() {
  passed=$((passed + $1))
  failed=$((failed + $2))
}
finish() {
  echo "$passed passed, $failed failed"
  [ "$failed" -eq 0 ]
  exit
}

# Counts one build's tests from ctest's own tally line
# ("97% tests passed, 2 tests failed out of 64"); no tally is one failure.
run_ctest() {
  local dir=$1
  shift
  local log="$dir/ctest.log"
  (cd "$dir" && env "$@" ctest --output-on-failure -j"$jobs") 2>&1 | tee "$log"
  local tally
  tally=$(grep -E '[0-9]+ tests failed out of [0-9]+' "$log" | tail -n 1)
  if [ -z "$tally" ]; then
    report 0 1
    return
  fi
  local failures total
  failures=$(sed -E 's/.* ([0-9]+) tests failed out of ([0-9]+).*/\1/' <<<"$tally")
  total=$(sed -E 's/.* tests failed out of ([0-9]+).*/\1/' <<<"$tally")
  report $((total - failures)) "$failures"
}

# Configures and builds one tree; a broken build counts as one failure.
build() {
  local dir=$1
  shift
  if cmake -S . -B "$dir" "$@" >/dev/null && cmake --build "$dir" -j"$jobs"; then
    return 0
  fi
  echo "-- the build in $dir failed"
  report 0 1
  return 1
}

if ! bash scripts/setup.sh tests; then
  report 0 1
  finish
fi
jobs=$(nproc 2>/dev/null || echo 2)

echo "== formatting"
if git rev-parse --is-inside-work-tree >/dev/null 2>&1; then
  if git ls-files -z '*.cc' '*.h' | xargs -0 clang-format --dry-run --Werror; then
    report 1 0
  else
    report 0 1
  fi
fi

echo "== release build"
if build build -DCMAKE_BUILD_TYPE=Release; then
  run_ctest build
fi

echo "== address and undefined-behaviour sanitizer build"
if build build-asan -DCMAKE_BUILD_TYPE=RelWithDebInfo -DCVN_SANITIZE=ON -DCVN_BENCH=OFF; then
  run_ctest build-asan ASAN_OPTIONS=detect_leaks=1 UBSAN_OPTIONS=print_stacktrace=1
fi

echo "== fuzz targets (bounded)"
# Recorded outputs of real Macs seed the whole-scan target when they exist.
corpus_dir="${CVN_CORPUS_DIR:-../shared/corpus}"
if CXX=clang++ build build-fuzz -DCMAKE_BUILD_TYPE=RelWithDebInfo -DCVN_FUZZ=ON \
  -DCVN_SANITIZE=ON -DCVN_TESTS=OFF -DCVN_BENCH=OFF; then
  seconds="${CVN_FUZZ_SECONDS:-30}"
  for target in build-fuzz/*_fuzz; do
    [ -x "$target" ] || continue
    name=$(basename "$target")
    seeds="fuzz/corpus/${name%_fuzz}"
    work=$(mktemp -d)
    [ -d "$seeds" ] && cp -r "$seeds"/. "$work"/
    if [ "$name" = scan_fuzz ]; then
      cp tests/sample_mac/profiler/*.xml "$work"/
      if [ -d "$corpus_dir" ]; then
        find "$corpus_dir" -name '*.xml' -type f | while read -r f; do
          cp "$f" "$work/corpus-$(printf '%s' "$f" | cksum | cut -d' ' -f1).xml"
        done
      fi
    fi
    log="build-fuzz/$name.log"
    echo "-- $name for ${seconds}s"
    if "$target" -max_total_time="$seconds" -rss_limit_mb=2048 -print_final_stats=1 \
      -artifact_prefix=build-fuzz/ "$work" >"$log" 2>&1; then
      report 1 0
    else
      report 0 1
      echo "-- $name failed; its output is in $log"
    fi
    grep -aE '^#[0-9]+ +(DONE|INITED)|stat::number_of_executed_units|deadly|ERROR' "$log" | tail -n 4
    rm -rf "$work"
  done
fi

# The macOS cross-build, after the Linux builds: it compiles and links the
# *_darwin.cc files no Linux build sees. A stage of its own, with its own
# verdict line, counted as one in the tally. It alone needs the cross compiler
# from the npm registry; when npm cannot fetch it, build-macos.sh says why in
# one line and this stage fails on its own.
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
if macos_stage; then
  report 1 0
else
  report 0 1
fi

finish
