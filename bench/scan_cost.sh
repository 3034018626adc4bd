#!/usr/bin/env bash
# Scan cost against machine size. The whole agent scans the sample Mac (the
# fake Apple tools of tests/fake_bin first on PATH; ps, env and the process
# table are the real ones) while 0, 500 and 2,000 extra idle processes
# exist. For each size it prints the median wall time and the median CPU
# time of the agent itself (its tools' time apart) over several runs, and
# how many processes the agent started, counted in one more run under
# strace. On a Mac the agent's time should be the tools' time: the wall time
# with 2,000 extra processes should stay within 1.3 times the time with
# none, and the count of children should not move. The last column times
# the process listing the agent asks ps for, alone, at the same size: on
# Linux that tool's cost grows with the table whatever the agent does.
#
#   bash bench/scan_cost.sh [BUILD_DIR]        (default: build)
#
# Environment:
#   CVN_AGENT              the agent to measure (default BUILD_DIR/cvnmacagent)
#   CVN_SCAN_COST_SIZES    extra process counts (default "0 500 2000")
#   CVN_SCAN_COST_RUNS     timed runs per size (default 5)
#   CVN_SCAN_COST_RUN_LIMIT  seconds one scan may take (default 300)
#   CVN_SCAN_COST_LIMIT    seconds for the whole script (default 1800)
#   CVN_SCAN_COST_COUNT    0 skips the strace run that counts children
#
# Every process the script starts is stopped on the way out, on failure and
# on interruption too; the idle processes also end by themselves when the
# whole limit has passed.
set -euo pipefail
cd "$(dirname "$0")/.."
root=$(pwd)
build=${1:-build}
agent=${CVN_AGENT:-$build/cvnmacagent}
timer=$build/run_measured
sizes=${CVN_SCAN_COST_SIZES:-0 500 2000}
runs=${CVN_SCAN_COST_RUNS:-5}
run_limit=${CVN_SCAN_COST_RUN_LIMIT:-300}
limit=${CVN_SCAN_COST_LIMIT:-1800}
count=${CVN_SCAN_COST_COUNT:-1}

for tool in "$agent" "$timer"; do
  if [ ! -x "$tool" ]; then
    echo "scan_cost: $tool is missing; build with: cmake --build $build --target cvnmacagent run_measured" >&2
    exit 2
  fi
done
agent=$(cd "$(dirname "$agent")" && pwd)/$(basename "$agent")
timer=$(cd "$(dirname "$timer")" && pwd)/$(basename "$timer")

work=$(mktemp -d)
idle=()
measuring=
stop_idle() {
  if [ "${#idle[@]}" -gt 0 ]; then
    kill "${idle[@]}" 2>/dev/null || true
    wait "${idle[@]}" 2>/dev/null || true
  fi
  idle=()
}
cleanup() {
  # The timer kills the scan's whole process group when told to stop.
  if [ -n "$measuring" ]; then
    kill "$measuring" 2>/dev/null || true
    wait "$measuring" 2>/dev/null || true
  fi
  stop_idle
  rm -rf "$work"
}
trap cleanup EXIT
trap 'exit 130' INT TERM HUP

start=$SECONDS
check_time() {
  if [ $((SECONDS - start)) -ge "$limit" ]; then
    echo "scan_cost: stopped after ${limit}s (CVN_SCAN_COST_LIMIT)" >&2
    exit 3
  fi
}

start_idle() {
  local count=$1 i
  for ((i = 0; i < count; i++)); do
    sleep "$limit" &
    idle+=("$!")
  done
}

# The middle value (the mean of the two middle ones for an even count),
# printed as it was read.
median() { sort -n | awk '{v[NR] = $1} END {if (NR == 0) print "-"; else if (NR % 2) print v[(NR + 1) / 2]; else print (v[NR / 2] + v[NR / 2 + 1]) / 2}'; }

field() { sed -n "s/.*$1=\([^ ]*\).*/\1/p" "$2"; }

# One scan in a fresh directory, under the timer; the report line lands in
# $work/report. Run in the background and waited for, so that a signal to
# this script is handled at once and reaches the scan through cleanup.
scan() {
  local dir=$work/scan
  rm -rf "$dir"
  mkdir -p "$dir"
  (cd "$dir" && PATH="$root/tests/fake_bin:$PATH" FAKE_MAC_DIR="$root/tests/sample_mac" \
    FAKE_STATE_DIR="$dir" exec "$timer" "$run_limit" "$work/report" "$@" \
    </dev/null >"$work/out" 2>"$work/err") &
  measuring=$!
  wait "$measuring" || true
  measuring=
}

# Processes the agent started itself (its clone, fork and vfork calls), and
# every process below it, from one run under strace; into $direct and $all.
# Run in this shell, not a subshell, so that cleanup can stop its scan.
count_children() {
  local log=$work/strace.log
  direct=- all=-
  command -v strace >/dev/null 2>&1 || return 0
  local filter=
  strace --seccomp-bpf -f -o /dev/null true 2>/dev/null && filter=--seccomp-bpf
  scan strace $filter -f -qq -e trace=process -o "$log" "$agent" -silent
  local first
  first=$(awk 'NR == 1 {print $1}' "$log")
  direct=$(awk -v p="$first" '$1 == p && /(clone3?|v?fork)/ && /= [0-9]+$/' "$log" | wc -l)
  all=$(($(awk '{print $1}' "$log" | sort -u | wc -l) - 1))
}

echo "scan cost of $agent"
echo "median of $runs runs per size; CPU is the agent's own, without its tools"
# The median wall time of the agent's process listing run alone.
listing_time() {
  local r start end
  : >"$work/listing"
  for ((r = 0; r < runs; r++)); do
    start=$(date +%s%N)
    ps -axww -o pid= -o user= -o command= >/dev/null 2>&1 || true
    end=$(date +%s%N)
    awk -v a="$start" -v b="$end" 'BEGIN {printf "%.3f\n", (b - a) / 1e9}' >>"$work/listing"
  done
  median <"$work/listing"
}

printf '%-7s %-7s %-10s %-13s %-12s %-9s %-11s %-8s %s\n' extra table wall_s agent_cpu_s tools_cpu_s children descendants rss_kb ps_alone_s
base_wall=
base_listing=
listing=
for size in $sizes; do
  check_time
  stop_idle
  start_idle "$size"
  # Counted by the shell's own glob: a process may end while it is listed.
  procs=(/proc/[0-9]*)
  table=${#procs[@]}
  : >"$work/walls"
  : >"$work/cpus"
  : >"$work/tools"
  : >"$work/rss"
  for ((r = 0; r < runs; r++)); do
    check_time
    scan "$agent" -silent
    status=$(field status "$work/report")
    if [ "$status" = killed ]; then
      # Too slow to measure: the row says so instead of giving up on the rest.
      echo ">$run_limit" >>"$work/walls"
      echo "scan_cost: a scan with $size extra processes took over ${run_limit}s and was stopped" >&2
      break
    fi
    if [ "$status" != 0 ]; then
      echo "scan_cost: the scan with $size extra processes failed: $(cat "$work/report")" >&2
      sed -n 1,5p "$work/err" >&2
      exit 1
    fi
    field wall_s "$work/report" >>"$work/walls"
    field own_cpu_s "$work/report" >>"$work/cpus"
    field children_cpu_s "$work/report" >>"$work/tools"
    field max_rss_kb "$work/report" >>"$work/rss"
  done
  check_time
  direct=- all=-
  if [ "$count" = 1 ] && ! grep -q '>' "$work/walls"; then count_children; fi
  if grep -q '>' "$work/walls"; then wall=$(head -n 1 "$work/walls"); else wall=$(median <"$work/walls"); fi
  printf '%-7s %-7s %-10s %-13s %-12s %-9s %-11s %-8s %s\n' "$size" "$table" "$wall" \
    "$(median <"$work/cpus")" "$(median <"$work/tools")" "$direct" "$all" "$(median <"$work/rss")" \
    "$(listing_time)"
  listing=$(median <"$work/listing")
  [ -n "$base_wall" ] || base_listing=$listing
  [ -n "$base_wall" ] || base_wall=$wall
done
stop_idle
case $wall$base_wall in
  *'>'*) ;;
  *)
    echo "wall time at the largest size / with no extra processes: $(awk -v a="$wall" -v b="$base_wall" 'BEGIN {printf "%.2f", a / b}') (target: at most 1.3)"
    echo "the same without the growth of the ps listing alone: $(awk -v a="$wall" -v b="$base_wall" -v l="$listing" -v m="$base_listing" 'BEGIN {printf "%.2f", (a - (l - m)) / b}')"
    ;;
esac
