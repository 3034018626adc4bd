#!/usr/bin/env bash
# The main job on Linux: build, scan the bundled sample Mac (its recorded
# tool outputs stand in for Apple's tools, which Linux lacks) with "-log",
# answering the consent prompt with "y", and print the result file with the
# inspector.
set -euo pipefail
cd "$(dirname "$0")/.."
bash scripts/setup.sh
cmake -S . -B build -DCMAKE_BUILD_TYPE=Release >/dev/null
cmake --build build -j"$(nproc 2>/dev/null || echo 2)" --target cvnmacagent qaxdump

out_dir=$(mktemp -d)
trap 'rm -rf "$out_dir"' EXIT
root=$(pwd)
(cd "$out_dir" && echo y | PATH="$root/tests/fake_bin:$PATH" "$root/build/cvnmacagent" -log)
result=$(ls "$out_dir"/*.qax)
mkdir -p "$root/build/sample-result"
cp "$result" "$root/build/sample-result/"
echo
echo "== qaxdump $(basename "$result") (a copy is in build/sample-result/)"
"$root/build/qaxdump" "$result"
