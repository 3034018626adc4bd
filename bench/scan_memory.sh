#!/usr/bin/env bash
# Peak memory of a whole scan against the size of the profiler's document.
# For each size, a copy of the sample Mac gets an application list of N
# generated items, the agent scans it once under /usr/bin/time -v, and the
# script prints the document's size, the agent's peak resident size and
# their ratio (target: at most 4, and flat as the document grows).
#
#   bash bench/scan_memory.sh [BUILD_DIR] [APPLICATIONS...]
#
# The default sizes are 10,000, 40,000 and 160,000 applications.
set -euo pipefail
cd "$(dirname "$0")/.."
root=$(pwd)
build=${1:-build}
shift || true
sizes=("$@")
[ "${#sizes[@]}" -gt 0 ] || sizes=(10000 40000 160000)
agent=${CVN_AGENT:-$build/cvnmacagent}
if [ ! -x "$agent" ] || [ ! -x /usr/bin/time ]; then
  echo "scan_memory: needs $agent (cmake --build $build --target cvnmacagent) and /usr/bin/time (scripts/setup.sh tests)" >&2
  exit 2
fi
agent=$(cd "$(dirname "$agent")" && pwd)/$(basename "$agent")

work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

# One scan of the sample Mac with `apps` generated applications; prints a
# row of the table.
measure() {
  local apps=$1
  rm -rf "$work/mac" "$work/scan"
  cp -r tests/sample_mac "$work/mac"
  mkdir -p "$work/scan"
  # The generated items go in front of the recorded ones, shaped as the
  # profiler prints them.
  local list=$work/mac/profiler/SPApplicationsDataType.xml
  awk -v n="$apps" '
    { print }
    /<key>_items<\/key>/ { items = 1 }
    items && /<array>/ {
      for (i = 0; i < n; i++) {
        printf "\t\t\t<dict>\n\t\t\t\t<key>_name</key>\n\t\t\t\t<string>Application %d</string>\n", i
        printf "\t\t\t\t<key>has64BitIntelCode</key>\n\t\t\t\t<string>%s</string>\n", (i % 3 ? "yes" : "no")
        printf "\t\t\t\t<key>info</key>\n\t\t\t\t<string>Application %d, Copyright 2013 Example Inc.</string>\n", i
        printf "\t\t\t\t<key>lastModified</key>\n\t\t\t\t<date>2013-11-15T20:30:00Z</date>\n"
        printf "\t\t\t\t<key>path</key>\n\t\t\t\t<string>/Applications/Application %d.app</string>\n", i
        printf "\t\t\t\t<key>runtime_environment</key>\n\t\t\t\t<string>arch_i386</string>\n"
        printf "\t\t\t\t<key>version</key>\n\t\t\t\t<string>%d.0.%d</string>\n\t\t\t</dict>\n", i % 7, i % 13
      }
      items = 0
    }' "$list" >"$work/list" && mv "$work/list" "$list"

  # The document the agent splices: every data type it asks for.
  local document=0 f
  for f in "$work"/mac/profiler/SP*.xml; do
    case $(basename "$f") in SPLogsDataType.xml | SPFontsDataType.xml) continue ;; esac
    document=$((document + $(wc -c <"$f")))
  done

  (cd "$work/scan" && PATH="$root/tests/fake_bin:$PATH" FAKE_MAC_DIR="$work/mac" \
    FAKE_STATE_DIR="$work/scan" /usr/bin/time -v -o "$work/time" "$agent" -silent \
    </dev/null >/dev/null 2>"$work/err")
  local peak_kb wall
  peak_kb=$(sed -n 's/.*Maximum resident set size (kbytes): *//p' "$work/time")
  wall=$(sed -n 's/.*Elapsed (wall clock) time.*: *//p' "$work/time")
  awk -v a="$apps" -v d="$document" -v p="$peak_kb" -v w="$wall" \
    'BEGIN {printf "%-13s %-14d %-17d %-9s %.2f\n", a, d / 1024, p, w, p * 1024 / d}'
}

printf '%-13s %-14s %-17s %-9s %s\n' applications document_KiB peak_resident_KiB wall peak/document
for apps in "${sizes[@]}"; do measure "$apps"; done
echo "(target: peak/document at most 4)"
