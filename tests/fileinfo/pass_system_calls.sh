#!/bin/sh
# SPDX-License-Identifier: MIT
# Counts the system calls of one collection pass: at most five on a file, and none that opens it.
# Usage: pass_system_calls.sh PROBE
set -eu
probe=$1
command -v strace >/dev/null || { echo "strace is missing"; exit 77; }
folder=$(mktemp -d)
trap 'rm -rf "$folder"' EXIT
strace -o "$folder/try" true 2>/dev/null || { echo "strace is not allowed here"; exit 77; }

failed=0
check() { # NAME MOST
  strace -o "$folder/trace" "$probe" "$folder/$1"
  awk '/^getppid/ { inside = !inside; next } inside' "$folder/trace" >"$folder/calls"
  count=$(wc -l <"$folder/calls")
  echo "$1: $count calls"
  cat "$folder/calls"
  if [ "$count" -eq 0 ] || [ "$count" -gt "$2" ] || grep -q '^open' "$folder/calls"; then
    failed=1
  fi
}

touch "$folder/usual.jpg" "$folder/read-only.jpg" "$folder/locked.jpg"
chmod 444 "$folder/read-only.jpg"
setfattr -n user.orb.locked -v 1 "$folder/locked.jpg" 2>/dev/null || true
mkfifo "$folder/fifo"
mkdir "$folder/folder"
ln -s usual.jpg "$folder/link.jpg"
check usual.jpg 4
check read-only.jpg 5
check locked.jpg 5
check fifo 5
check folder 5
check link.jpg 5
exit $failed
