#!/usr/bin/env bash
# The inspector's views of real results: scans of the sample Mac, one of
# them after a visit to the repair shop and the App Store.
#   qaxdump_views_test.sh BUILD_DIR SOURCE_DIR diff     the diff and its exit codes
#   qaxdump_views_test.sh BUILD_DIR SOURCE_DIR browser  the pages in a real browser
# The browser part skips (77) where chromium-headless-shell is missing.
# CVN_KEEP_WORK=1 keeps the scans and pages for a look.
set -uo pipefail
build=$1 source=$2 part=$3
qaxdump=$build/qaxdump
browser=$(command -v chromium-headless-shell || true)
if [ "$part" = browser ] && [ -z "$browser" ]; then
  echo "chromium-headless-shell is not installed; skipping" >&2
  exit 77
fi
work=$(mktemp -d)
trap '[ -n "${CVN_KEEP_WORK:-}" ] || rm -rf "$work"' EXIT
failures=0
fail() {
  echo "FAIL: $*" >&2
  failures=$((failures + 1))
}

# scan MAC_DIR NAME: one silent scan of a recorded Mac, kept as $work/NAME.
scan() {
  rm -rf "$work/scan" && mkdir "$work/scan"
  (cd "$work/scan" && PATH="$source/tests/fake_bin:$PATH" FAKE_MAC_DIR="$1" \
    FAKE_STATE_DIR="$work/scan" "$build/cvnmacagent" -silent </dev/null >/dev/null) &&
    mv "$work"/scan/*.qax "$work/$2"
}

# edit FILE FROM TO...: replaces each FROM once, and fails loudly when the
# recording no longer holds it.
edit() {
  python3 - "$@" <<'PY' || fail "cannot edit $1"
import sys
path, pairs = sys.argv[1], sys.argv[2:]
text = open(path, encoding="utf-8").read()
for old, new in zip(pairs[::2], pairs[1::2]):
    assert old in text, old
    text = text.replace(old, new, 1)
open(path, "w", encoding="utf-8").write(text)
PY
}

app() {  # app NAME VERSION: an application item as the profiler prints it
  printf '<dict><key>_name</key><string>%s</string><key>has64BitIntelCode</key><string>yes</string>' "$1"
  printf '<key>path</key><string>/Applications/x.app</string><key>version</key><string>%s</string></dict>' "$2"
}

mac=$work/mac
cp -r "$source/tests/sample_mac" "$mac"
scan "$mac" old.qax
scan "$mac" again.qax
# A module grown from 2 to 4 GB, Firefox upgraded, Grapher removed, Zebra
# Notes added, and Lion installed.
edit "$mac/profiler/SPMemoryDataType.xml" '<string>2 GB</string>' '<string>4 GB</string>'
edit "$mac/profiler/SPHardwareDataType.xml" '<string>4 GB</string>' '<string>6 GB</string>'
edit "$mac/profiler/SPApplicationsDataType.xml" '<string>6.0.1</string>' '<string>7.0.1</string>' \
  '<string>Grapher</string>' '<string>Zebra Notes</string>' '<string>2.1</string>' '<string>3.2</string>'
edit "$mac/profiler/SPSoftwareDataType.xml" 'Darwin 10.8.0' 'Darwin 11.0.0' \
  '10.6.8 (10K549)' '10.7 (11A511)'
scan "$mac" new.qax

if [ "$part" = diff ]; then
  expected='System/Mem-slots
  ~ mem-slot:1
      capacity: "2048" -> "4096"
Memory
  ~ Memory-slot:1
      capacity: "2048" -> "4096"
  ~ General-info
      physical-memory: "4096" -> "6144"
OS
  ~ os:1
      name: "Mac OS X v10.6 (Snow Leopard)" -> "Mac OS X v10.7 (Lion)"
      version: "10.6.8 (10K549)" -> "10.7 (11A511)"
      kernel: "Darwin 10.8.0" -> "Darwin 11.0.0"
      architecture: "32-bit" -> "64-bit"
      update: removed "Update 8"
Software
  ~ Soft:Firefox 7.0.1 (Firefox upgraded from 6.0.1 to 7.0.1)
  + Soft:Zebra Notes 3.2
  - Soft:Grapher 2.1'
  out=$("$qaxdump" --diff "$work/old.qax" "$work/new.qax" 2>"$work/err")
  status=$?
  [ "$status" -eq 1 ] || fail "a changed Mac exits $status, not 1"
  [ "$out" = "$expected" ] || fail "the changes read:"$'\n'"$out"
  [ ! -s "$work/err" ] || fail "the same Mac was taken for another: $(cat "$work/err")"
  "$qaxdump" --diff --json "$work/old.qax" "$work/new.qax" >"$work/json"
  python3 - "$work/json" <<'PY' || fail "the JSON list is wrong"
import json, sys
changes = json.load(open(sys.argv[1]))
assert len(changes) == 12, len(changes)
assert {"section": "Software", "record": "Soft:Firefox 7.0.1", "change": "changed", "field": None,
        "old": "Soft:Firefox 6.0.1", "new": "Soft:Firefox 7.0.1"} in changes
assert {"section": "Software", "record": "Soft:Grapher 2.1", "change": "removed", "field": None,
        "old": "Grapher", "new": None} in changes
PY
  out=$("$qaxdump" --diff "$work/old.qax" "$work/again.qax")
  [ $? -eq 0 ] && [ -z "$out" ] || fail "an unchanged Mac gives: $out"
  out=$("$qaxdump" --diff --all "$work/old.qax" "$work/again.qax")
  grep -qx Processes <<<"$out" || fail "--all leaves out the process list"
  head -c 2000 "$work/new.qax" >"$work/damaged.qax"
  for pair in "missing.qax again.qax" "old.qax damaged.qax"; do
    set -- $pair
    (cd "$work" && "$qaxdump" --diff "$1" "$2" >/dev/null 2>"$work/err")
    status=$?
    [ "$status" -eq 2 ] && [ "$(wc -l <"$work/err")" -eq 1 ] ||
      fail "$1 against $2 exits $status and says: $(cat "$work/err")"
  done
  [ "$failures" -eq 0 ]
  exit
fi

# The browser part: each sample Mac's page, the page of the diff between
# them, and a page whose application name is an attack.
scan "$source/tests/modern_mac" modern.qax
items=$'<key>_items</key>\n\t\t<array>'
edit "$mac/profiler/SPApplicationsDataType.xml" "$items" "$items$(app \
  'Evil&lt;script&gt;document.title="pwned"&lt;/script&gt; "q" '\''q'\''
line two' 1.0)"
scan "$mac" hostile.qax
"$qaxdump" --html "$work/old.qax" >"$work/sample.html"
"$qaxdump" --html "$work/modern.qax" >"$work/modern.html"
"$qaxdump" --html --diff "$work/old.qax" "$work/modern.qax" >"$work/diff.html" 2>/dev/null
"$qaxdump" --html "$work/hostile.qax" >"$work/hostile.html"

chromium() {
  timeout 120 "$browser" --no-sandbox --disable-gpu --hide-scrollbars \
    --user-data-dir="$work/profile" --window-size=1280,2000 "$@" 2>/dev/null
}

# check PAGE VALUES...: the page needs nothing from outside, lays out within
# 1280 pixels, and its screenshot shows something. A copy of it, without the
# page's own ban on scripts, measures its width; whatever else ran in it
# would show in its title.
check() {
  local page=$1
  shift
  if grep -Eiq '<script|src=|url\(|@import|href="[^#]' "$work/$page.html"; then
    fail "$page.html loads or runs something"
  fi
  sed -e '/Content-Security-Policy/d' -e 's#</body>#<script>document.body.dataset.width = document.documentElement.scrollWidth</script></body>#' \
    "$work/$page.html" >"$work/$page-probe.html"
  chromium --dump-dom "file://$work/$page-probe.html" >"$work/$page.dom"
  chromium --screenshot="$work/$page.png" "file://$work/$page.html" >/dev/null
  python3 - "$work/$page.dom" "$work/$page.png" "$@" <<'PY' || fail "$page.html in the browser"
import html, re, struct, sys, zlib
dom, png, values = open(sys.argv[1], encoding="utf-8").read(), open(sys.argv[2], "rb").read(), sys.argv[3:]
width = re.search(r'data-width="(\d+)"', dom)
assert width and int(width.group(1)) <= 1280, "laid out wider than the window: %s" % width
assert "pwned" not in dom.split("</title>")[0] and dom.count("<script") == 1, "something ran"
head = dom.split("</dl>")[0]
for value in values:
    assert ">%s<" % html.escape(value, quote=False) in head, "no %r at the top" % value
assert png[:8] == b"\x89PNG\r\n\x1a\n" and struct.unpack(">I", png[16:20])[0] <= 1280, "screenshot width"
idat, at = b"", 8
while at < len(png):
    length, kind = struct.unpack(">I4s", png[at:at + 8])
    idat += png[at + 8:at + 8 + length] if kind == b"IDAT" else b""
    at += 12 + length
w, h = struct.unpack(">II", png[16:24])
rows = zlib.decompress(idat)
stride = len(rows) // h
assert len({rows[i * stride:(i + 1) * stride] for i in range(h)}) > 100, "blank screenshot"
PY
}

check sample "MacBookPro5,5" W89311JK66E "Intel Core 2 Duo, 2 cores, 2260 MHz" "4096 MB" \
  "Hitachi HTS545050B9SA02, 500 GB, SATA" "Macintosh HD (/), 399.76 GB, 21% used" \
  "Mac OS X v10.6 (Snow Leopard), version 10.6.8 (10K549)" Jane-MBP jane 00-26-BB-5C-3A-91 old.qax
check modern "Mac15,6" K7XQ2N9W4R "Apple M3 Pro, 12 cores" "18432 MB" \
  "APPLE SSD AP1024Z, 1000 GB, NVMe" "Macintosh HD (/), 994.66 GB, 38% used" \
  "macOS 15.3.2 (24D81)" sam F4-D4-88-6A-1C-E2 modern.qax
check diff old.qax modern.qax "20 added, 72 removed, 115 changed"
grep -q 'Safari upgraded from 5.1 to 18.3.1' "$work/diff.dom" || fail "the diff page lacks the upgrade"
check hostile
grep -qF '>Evil&lt;script&gt;document.title="pwned"&lt;/script&gt; "q" '\''q'\''
line two<' "$work/hostile.dom" || fail "the hostile name does not show as text"
if [ -n "${CVN_SCREENSHOT_DIR:-}" ]; then cp "$work"/*.png "$CVN_SCREENSHOT_DIR"/; fi
[ "$failures" -eq 0 ]
