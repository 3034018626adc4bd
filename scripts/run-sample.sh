#!/usr/bin/env bash
# The main job on Linux: build, scan the bundled sample Macs (their recorded
# tool outputs stand in for Apple's tools, which Linux lacks) with "-log",
# answering the consent prompt with "y", print each result file with the
# inspector and check it. With an argument, only that sample: "sample_mac"
# (Mac OS X 10.6 on Intel) or "modern_mac" (macOS 15 on Apple Silicon). Each
# scan runs in a temporary folder; its result is kept in build/sample-result/.
# The last line is the verdict, and the exit status is non-zero when a scan
# or a check failed.
set -euo pipefail
cd "$(dirname "$0")/.."

samples=("$@")
[ ${#samples[@]} -gt 0 ] || samples=(sample_mac modern_mac)
for sample in "${samples[@]}"; do
  case $sample in
    sample_mac | modern_mac) ;;
    *) echo "unknown sample: $sample (sample_mac or modern_mac)" >&2; exit 2 ;;
  esac
done

bash scripts/setup.sh
echo "== building the agent and the inspector"
cmake -S . -B build -DCMAKE_BUILD_TYPE=Release >/dev/null
cmake --build build -j"$(nproc 2>/dev/null || echo 2)" --target cvnmacagent qaxdump

root=$(pwd)

# The computer name the sample Mac's profiler recorded (its local_host_name).
computer_name_of() {
  sed -n '/<key>local_host_name<\/key>/{n;s/.*<string>\(.*\)<\/string>.*/\1/p;q}' \
    "$1/profiler/SPSoftwareDataType.xml" |
    sed -e 's/&lt;/</g; s/&gt;/>/g; s/&quot;/"/g; s/&apos;/'"'"'/g; s/&amp;/\&/g'
}

# On Linux the agent takes the computer name from the kernel's host name, so
# a sample scanned as it is would be named after this machine. Where we may
# (as root), each scan runs in a UTS namespace of its own whose host name is
# the sample Mac's; elsewhere it runs as it is.
as_host() {
  local name=$1
  shift
  unshare --uts sh -c 'printf %s "$1" >/proc/sys/kernel/hostname && shift && exec "$@"' \
    sh "$name" "$@"
}
can_rename_host() { as_host "$1" true 2>/dev/null; }

mkdir -p "$root/build/sample-result"
summaries=()
failures=0
for sample in "${samples[@]}"; do
  fixture="$root/tests/$sample"
  name=$(computer_name_of "$fixture")
  scan=("$root/build/cvnmacagent" -log)
  if [ -n "$name" ] && can_rename_host "$name"; then
    echo "== scanning tests/$sample as the host \"$name\""
    scan=(as_host "$name" "${scan[@]}")
  else
    echo "== scanning tests/$sample (no UTS namespace here, so under this machine's name $(uname -n))"
  fi
  out_dir=$(mktemp -d)
  status=0
  (cd "$out_dir" && echo y | FAKE_MAC_DIR="$fixture" PATH="$root/tests/fake_bin:$PATH" \
    "${scan[@]}") || status=$?
  results=("$out_dir"/*.qax)
  if [ "$status" -ne 0 ] || [ ! -f "${results[0]}" ]; then
    rm -rf "$out_dir"
    summaries+=("tests/$sample: no result file (the agent exited with status $status)")
    failures=$((failures + 1))
    continue
  fi
  kept="build/sample-result/$(basename "${results[0]}")"
  cp "${results[0]}" "$root/$kept"
  rm -rf "$out_dir"
  echo
  echo "(the scan ran in a temporary folder that is now removed; the result is kept as $kept)"
  echo "== qaxdump $kept"
  "$root/build/qaxdump" "$root/$kept"
  echo "== qaxdump --check $kept"
  check_status=0
  check_output=$("$root/build/qaxdump" --check "$root/$kept" 2>&1) || check_status=$?
  echo "$check_output"
  if [ "$check_status" -eq 0 ]; then
    warnings=$(grep -c ': warning: ' <<<"$check_output" || true)
    verdict="ok"
    [ "$warnings" -eq 0 ] || verdict="ok, $warnings warning$([ "$warnings" -eq 1 ] || echo s)"
  else
    failures=$((failures + 1))
    verdict="FAILED: $(tail -n 1 <<<"$check_output")"
    verdict=${verdict/"qaxdump: $root/$kept: "/}
  fi
  summaries+=("Result kept: $root/$kept (qaxdump --check: $verdict)")
done

echo
printf '%s\n' "${summaries[@]}"
if [ "$failures" -eq 0 ]; then
  echo "${#samples[@]} sample scan$([ ${#samples[@]} -eq 1 ] || echo s) written and checked: ok"
else
  echo "${#samples[@]} sample scan$([ ${#samples[@]} -eq 1 ] || echo s) written and checked: $failures FAILED"
  exit 1
fi
