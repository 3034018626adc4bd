#!/usr/bin/env bash
# The main job on Linux: build, scan the bundled sample Macs (their recorded
# tool outputs stand in for Apple's tools, which Linux lacks) with "-log",
# answering the consent prompt with "y", and print each result file with the
# inspector. With an argument, only that sample: "sample_mac" (Mac OS X 10.6
# on Intel) or "modern_mac" (macOS 15 on Apple Silicon). Each scan runs in a
# temporary folder; its result is kept in build/sample-result/.
set -euo pipefail
cd "$(dirname "$0")/.."
bash scripts/setup.sh --no-test-tools
echo "== building the agent and the inspector"
cmake -S . -B build -DCMAKE_BUILD_TYPE=Release >/dev/null
cmake --build build -j"$(nproc 2>/dev/null || echo 2)" --target cvnmacagent qaxdump

root=$(pwd)
samples=("$@")
[ ${#samples[@]} -gt 0 ] || samples=(sample_mac modern_mac)
mkdir -p "$root/build/sample-result"
kept_files=()
for sample in "${samples[@]}"; do
  case $sample in
    sample_mac | modern_mac) ;;
    *) echo "unknown sample: $sample (sample_mac or modern_mac)" >&2; exit 2 ;;
  esac
  out_dir=$(mktemp -d)
  echo "== scanning tests/$sample"
  (cd "$out_dir" && echo y | FAKE_MAC_DIR="$root/tests/$sample" \
    PATH="$root/tests/fake_bin:$PATH" "$root/build/cvnmacagent" -log)
  result=$(ls "$out_dir"/*.qax)
  kept="build/sample-result/$(basename "$result")"
  cp "$result" "$root/$kept"
  rm -rf "$out_dir"
  kept_files+=("$kept")
  echo
  echo "(the scan ran in a temporary folder that is now removed; the result is kept as $kept)"
  echo "== qaxdump $kept"
  "$root/build/qaxdump" "$root/$kept"
done
echo
for kept in "${kept_files[@]}"; do echo "Result kept: $root/$kept"; done
