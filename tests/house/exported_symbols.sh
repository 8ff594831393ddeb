#!/usr/bin/env bash
# SPDX-License-Identifier: MIT
# Compares what the library exports with the list beside this script.
#   exported_symbols.sh LIBRARY            says what differs
#   exported_symbols.sh LIBRARY --accept   writes the list anew
set -euo pipefail
list=$(dirname "$0")/exported_symbols.txt
# Inline functions are weak (W) and come and go with the compiler's wishes; they are not compared.
exported() {
  nm --dynamic --demangle --defined-only "$1" | cut -d' ' -f2- | grep -v '^W ' | cut -d' ' -f2- |
    LC_ALL=C sort -u
}

if [ "${2:-}" = --accept ]; then
  exported "$1" >"$list"
else
  diff -u --label "list" "$list" --label "library" <(exported "$1")
fi
