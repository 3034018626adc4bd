#!/usr/bin/env bash
# The main job on Linux: build, scan the bundled sample Macs (their recorded
# tool outputs stand in for Apple's tools, which Linux lacks) with "-log",
# answering the consent prompt with "y", and print each result file with the
# inspector. With an argument, only that sample: "sample_mac" (Mac OS X 10.6
# on Intel) or "modern_mac" (macOS 15 on Apple Silicon).
set -euo pipefail
cd "$(dirname "$0")/.."
bash scripts/setup.sh
cmake -S . -B build -DCMAKE_BUILD_TYPE=Release >/dev/null
cmake --build build -j"$(nproc 2>/dev/null || echo 2)" --target cvnmacagent qaxdump

root=$(pwd)
samples=("$@")
[ ${#samples[@]} -gt 0 ] || samples=(sample_mac modern_mac)
mkdir -p "$root/build/sample-result"
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
  cp "$result" "$root/build/sample-result/"
  echo
  echo "== qaxdump $(basename "$result") (a copy is in build/sample-result/)"
  "$root/build/qaxdump" "$result"
  rm -rf "$out_dir"
done
