#!/usr/bin/env bash
# The main job on Linux: build, scan the bundled sample Mac (its recorded
# tool outputs stand in for Apple's tools, which Linux lacks) with "-log",
# answering the consent prompt with "y", and print the result file with the
# inspector. The scan runs in a temporary folder; the result is kept in
# build/sample-result/.
set -euo pipefail
cd "$(dirname "$0")/.."
bash scripts/setup.sh
echo "== building the agent and the inspector"
cmake -S . -B build -DCMAKE_BUILD_TYPE=Release >/dev/null
cmake --build build -j"$(nproc 2>/dev/null || echo 2)" --target cvnmacagent qaxdump

out_dir=$(mktemp -d)
trap 'rm -rf "$out_dir"' EXIT
root=$(pwd)
echo "== scanning the sample Mac"
(cd "$out_dir" && echo y | PATH="$root/tests/fake_bin:$PATH" "$root/build/cvnmacagent" -log)
result=$(ls "$out_dir"/*.qax)
kept="build/sample-result/$(basename "$result")"
mkdir -p build/sample-result
cp "$result" "$kept"
echo
echo "(the scan ran in a temporary folder that is now removed; the result is kept as $kept)"
echo "== qaxdump $kept"
build/qaxdump "$kept"
echo
echo "Result: $root/$kept"
