#!/usr/bin/env bash
# SPDX-License-Identifier: MIT
# Installs a build and uses it as applications do: by find_package, by pkg-config and, from the
# sources, by add_subdirectory.
#   check.sh SOURCE_DIR BUILD_DIR COMPILER
set -euo pipefail
source=$1
build=$2
compiler=$3
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT

run() { # a step that says what it printed only when it fails
  "$@" >"$work/log" 2>&1 || { echo "failed: $*"; cat "$work/log"; exit 1; }
}
configure=(cmake -G Ninja "-DCMAKE_CXX_COMPILER=$compiler" -DCMAKE_BUILD_TYPE=Debug)

run cmake --install "$build" --prefix "$work/prefix"

run "${configure[@]}" -S "$source/tests/package/installed" -B "$work/installed" \
  "-DCMAKE_PREFIX_PATH=$work/prefix"
run cmake --build "$work/installed"
echo "find_package: $("$work/installed/consumer")"

# Moved away from where it was installed, so that nothing in it may depend on that place.
mv "$work/prefix" "$work/moved"
pc=$(dirname "$(find "$work/moved" -name OrbRTL.pc)")
read -ra flags <<<"$(PKG_CONFIG_PATH=$pc pkg-config --cflags --libs OrbRTL)"
run "$compiler" -std=c++20 "$source/tests/package/consumer.cpp" -o "$work/consumer" "${flags[@]}"
echo "pkg-config: $(LD_LIBRARY_PATH=$(dirname "$pc") "$work/consumer")"

run "${configure[@]}" -S "$source/tests/package/subdirectory" -B "$work/subdirectory" \
  "-DORB_SOURCE_DIR=$source"
run cmake --build "$work/subdirectory"
echo "add_subdirectory: $("$work/subdirectory/consumer")"
