#!/usr/bin/env bash
# SPDX-License-Identifier: MIT
# Each record has one virtual table and one type information, in the library, whose objects and
# those of a program that uses the records are given: the program makes none of its own.
#   virtual_tables.sh HEADERS LIBRARY OBJECT...
set -euo pipefail
headers=$1 library=$2
shift 2
classes=$(sed -nE 's/^ *class ORB_EXPORT (COrb[A-Za-z]+).*/\1/p' "$headers"/*.h |
  sed 's/^COrbGeotagDMS$/COrbGeotagData::&/')
tables() { nm --demangle --defined-only "$@" | grep -E ' (vtable|typeinfo) for COrb'; }
exported=$(tables --dynamic "$library")
made=$(tables "$@")
failures=0
for class in $classes; do
  for what in vtable typeinfo; do
    grep -q " $what for $class\$" <<<"$exported" || { echo "not exported: $what for $class" && failures=1; }
    count=$(grep -c " $what for $class\$" <<<"$made" || true)
    [ "$count" = 1 ] || { echo "made $count times: $what for $class" && failures=1; }
  done
done
[ "$(wc -w <<<"$classes")" -ge 40 ] || { echo "found too few classes: $classes" && failures=1; }
exit $failures
