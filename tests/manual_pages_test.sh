#!/usr/bin/env bash
# Every manual page must format without a single warning from groff.
set -uo pipefail
man_dir=$1
if ! command -v groff >/dev/null 2>&1; then
  echo "groff is not installed; skipping" >&2
  exit 77
fi
status=0
for page in "$man_dir"/*.[0-9]; do
  messages=$(groff -man -ww -z "$page" 2>&1)
  if [ -n "$messages" ]; then
    printf '%s:\n%s\n' "$page" "$messages" >&2
    status=1
  fi
  # A page that renders to nothing would also be silent.
  rendered=$(groff -man -Tascii -P-bcou "$page" 2>/dev/null)
  if ! grep -q '^NAME' <<<"$rendered"; then
    echo "$page: renders no NAME section" >&2
    status=1
  fi
done
exit "$status"
