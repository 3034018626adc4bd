#!/usr/bin/env bash
# Wall time of a whole scan against the profiler's own slowness. The agent
# scans the sample Mac with the fake tools of tests/fake_bin, behind a
# system_profiler that first sleeps each data type's time as recorded on a
# real Mac mini, divided by 10 (applications 13.0 s, AirPort 3.3 s, disc
# burning 1.9 s, Serial-ATA 0.5 s, Bluetooth 0.36 s, every other type the
# rest of the 19.7 s shared out, 0.04 s). The same scan without the sleeps is
# the base. The extra wall time is set against the slowest type's delay and
# against the sum of the delays: run one at a time, a scan costs the sum;
# side by side, not much more than the slowest.
#
#   bash bench/profiler_wall.sh [BUILD_DIR]     (default: build)
#
# Environment:
#   CVN_AGENT              the agent to measure (default BUILD_DIR/cvnmacagent)
#   CVN_PROFILER_WALL_RUNS timed runs of each kind; the median is kept (default 5)
set -euo pipefail
cd "$(dirname "$0")/.."
root=$(pwd)
build=${1:-build}
agent=${CVN_AGENT:-$build/cvnmacagent}
runs=${CVN_PROFILER_WALL_RUNS:-5}
if [ ! -x "$agent" ]; then
  echo "profiler_wall: $agent is missing; build with: cmake --build $build --target cvnmacagent" >&2
  exit 2
fi
agent=$(cd "$(dirname "$agent")" && pwd)/$(basename "$agent")

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
mkdir -p "$work/slow_bin" "$work/scan"

# Delays in seconds, already divided by 10.
cat >"$work/delays" <<'EOF'
SPApplicationsDataType 1.30
SPAirPortDataType 0.33
SPDiscBurningDataType 0.19
SPSerialATADataType 0.05
SPBluetoothDataType 0.036
EOF
other_delay=0.004
cat >"$work/slow_bin/system_profiler" <<EOF
#!/bin/sh
delay=$other_delay
for arg in "\$@"; do
  found=\$(awk -v t="\$arg" '\$1 == t { print \$2 }' "$work/delays")
  [ -n "\$found" ] && delay=\$found
done
sleep "\$delay"
exec "$root/tests/fake_bin/system_profiler" "\$@"
EOF
chmod +x "$work/slow_bin/system_profiler"

# The median wall time in seconds of `runs` scans with PATH_HEAD first on PATH.
median_wall() {
  local path_head=$1 i start end
  local times=()
  for ((i = 0; i < runs; i++)); do
    rm -f "$work/scan"/*.qax
    start=$(date +%s.%N)
    (cd "$work/scan" && PATH="$path_head:$root/tests/fake_bin:$PATH" "$agent" -silent >/dev/null)
    end=$(date +%s.%N)
    times+=("$(awk -v a="$start" -v b="$end" 'BEGIN { printf "%.4f", b - a }')")
  done
  printf '%s\n' "${times[@]}" | sort -n | awk '{ a[NR] = $1 } END { print a[int((NR + 1) / 2)] }'
}

base=$(median_wall "$root/tests/fake_bin")
slow=$(median_wall "$work/slow_bin")
slowest=$(sort -k2 -g "$work/delays" | tail -n 1 | awk '{ print $2 }')
# The 21 main types and the three of today's Macs.
types=24
sum=$(awk -v other="$other_delay" -v n="$types" '{ s += $2; k++ } END { printf "%.3f", s + (n - k) * other }' "$work/delays")
extra=$(awk -v a="$base" -v b="$slow" 'BEGIN { printf "%.4f", b - a }')
ratio() { awk -v a="$1" -v b="$2" 'BEGIN { printf "%.2f", a / b }'; }
printf 'scan without delays     %.3f s (median of %d)\n' "$base" "$runs"
printf 'scan with delays        %.3f s\n' "$slow"
printf 'extra wall time         %.3f s\n' "$extra"
printf 'slowest type delay      %.3f s   extra / slowest = %.2f (target at most 1.15)\n' \
  "$slowest" "$(ratio "$extra" "$slowest")"
printf 'sum of the delays       %.3f s   extra / sum     = %.2f\n' \
  "$sum" "$(ratio "$extra" "$sum")"
