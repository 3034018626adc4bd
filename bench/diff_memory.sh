#!/usr/bin/env bash
# Time and peak memory of `qaxdump --diff` between two results of a Mac with
# N generated applications, the second with a few of them upgraded, removed
# and added, beside `qaxdump --check` of one of them (the cost of reading a
# result alone). The diff pairs records through hash maps, so it should cost
# about the reading of both files and stay linear in N.
#
#   bash bench/diff_memory.sh [BUILD_DIR] [APPLICATIONS...]
#
# The default sizes are 40,000 and 160,000 applications. CVN_KEEP_WORK=1
# keeps the results.
set -euo pipefail
cd "$(dirname "$0")/.."
root=$(pwd)
build=${1:-build}
shift || true
sizes=("$@")
[ "${#sizes[@]}" -gt 0 ] || sizes=(40000 160000)
agent=$(cd "$build" && pwd)/cvnmacagent
qaxdump=$(cd "$build" && pwd)/qaxdump
if [ ! -x "$agent" ] || [ ! -x "$qaxdump" ] || [ ! -x /usr/bin/time ]; then
  echo "diff_memory: needs $agent and $qaxdump (cmake --build $build) and /usr/bin/time" >&2
  exit 2
fi

work=$(mktemp -d)
trap '[ -n "${CVN_KEEP_WORK:-}" ] || rm -rf "$work"' EXIT

# result APPS CHANGED NAME: a scan of the sample Mac with APPS generated
# applications; with CHANGED, every 20,000th is upgraded, every 40,000th
# removed, and three are new.
result() {
  rm -rf "$work/mac" "$work/scan"
  cp -r tests/sample_mac "$work/mac"
  mkdir "$work/scan"
  local list=$work/mac/profiler/SPApplicationsDataType.xml
  awk -v n="$1" -v changed="$2" '
    function app(name, version) {
      printf "\t\t\t<dict>\n\t\t\t\t<key>_name</key>\n\t\t\t\t<string>%s</string>\n", name
      printf "\t\t\t\t<key>has64BitIntelCode</key>\n\t\t\t\t<string>yes</string>\n"
      printf "\t\t\t\t<key>info</key>\n\t\t\t\t<string>%s, Copyright 2013 Example Inc.</string>\n", name
      printf "\t\t\t\t<key>lastModified</key>\n\t\t\t\t<date>2013-11-15T20:30:00Z</date>\n"
      printf "\t\t\t\t<key>path</key>\n\t\t\t\t<string>/Applications/%s.app</string>\n", name
      printf "\t\t\t\t<key>runtime_environment</key>\n\t\t\t\t<string>arch_i386</string>\n"
      printf "\t\t\t\t<key>version</key>\n\t\t\t\t<string>%s</string>\n\t\t\t</dict>\n", version
    }
    { print }
    /<key>_items<\/key>/ { items = 1 }
    items && /<array>/ {
      for (i = 0; i < n; i++) {
        if (changed && i % 40000 == 2) continue
        app("Application " i, (i % 7 + (changed && i % 20000 == 1)) ".0." (i % 13))
      }
      for (i = 0; changed && i < 3; i++) app("New Application " i, "1.0")
      items = 0
    }' "$list" >"$work/list" && mv "$work/list" "$list"
  (cd "$work/scan" && PATH="$root/tests/fake_bin:$PATH" FAKE_MAC_DIR="$work/mac" \
    FAKE_STATE_DIR="$work/scan" "$agent" -silent </dev/null >/dev/null)
  mv "$work"/scan/*.qax "$work/$3"
}

# measure COMMAND...: prints "peak_KiB wall" of one run.
measure() {
  /usr/bin/time -v -o "$work/time" "$@" >"$work/out" 2>/dev/null || true
  printf '%s %s' "$(sed -n 's/.*Maximum resident set size (kbytes): *//p' "$work/time")" \
    "$(sed -n 's/.*Elapsed (wall clock) time.*: *//p' "$work/time")"
}

printf '%-13s %-11s %-14s %-9s %-14s %-9s %s\n' applications result_KiB check_peak_KiB \
  check_wall diff_peak_KiB diff_wall changes
for apps in "${sizes[@]}"; do
  result "$apps" 0 old.qax
  result "$apps" 1 new.qax
  read -r check_peak check_wall <<<"$(measure "$qaxdump" --check "$work/old.qax")"
  read -r diff_peak diff_wall <<<"$(measure "$qaxdump" --diff "$work/old.qax" "$work/new.qax")"
  printf '%-13s %-11s %-14s %-9s %-14s %-9s %s\n' "$apps" "$(($(wc -c <"$work/old.qax") / 1024))" \
    "$check_peak" "$check_wall" "$diff_peak" "$diff_wall" "$(grep -c '^  [-+~]' "$work/out")"
done
