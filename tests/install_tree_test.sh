#!/usr/bin/env bash
# Installs the build into a scratch prefix and checks the whole tree: the agent
# in sbin, the inspector in bin, each with its manual page, and nothing else.
set -euo pipefail
build_dir=$1
prefix=$(mktemp -d)
trap 'rm -rf "$prefix"' EXIT

cmake --install "$build_dir" --prefix "$prefix" >/dev/null

expected="bin/qaxdump
sbin/cvnmacagent
share/man/man1/qaxdump.1
share/man/man8/cvnmacagent.8"
actual=$(cd "$prefix" && find . -type f -o -type l | sed 's|^\./||' | LC_ALL=C sort)
if [ "$actual" != "$expected" ]; then
  printf 'install tree differs.\nexpected:\n%s\nactual:\n%s\n' "$expected" "$actual" >&2
  exit 1
fi

status=0
# The installed programs must still run from there.
"$prefix/sbin/cvnmacagent" --help | grep -q '^Usage: cvnmacagent ' ||
  { echo "installed cvnmacagent --help printed no usage" >&2; status=1; }
if "$prefix/bin/qaxdump" >/dev/null 2>&1; then
  echo "installed qaxdump accepted no arguments" >&2
  status=1
elif [ $? -ne 2 ]; then
  echo "installed qaxdump without arguments did not exit with 2" >&2
  status=1
fi
exit "$status"
