#!/usr/bin/env bash
# install_sdk_test.sh <build dir> <example source dir>
# Installs the build's panel-sdk component (liblumeris, its headers, lumeris.pc, the CMake
# package) into a fresh prefix and builds the panel example against it twice: with
# find_package(Lumeris) and with pkg-config. Both programs must run and fit "A" into its cell.
set -euo pipefail
build=$1
example=$2
work=$(mktemp -d "${TMPDIR:-/tmp}/lumeris-sdk.XXXXXX")
trap 'rm -rf "$work"' EXIT
prefix=$work/prefix

cmake --install "$build" --prefix "$prefix" --component panel-sdk >/dev/null

# Only the installed prefix may be found: no compiler cache, no package registry, no system copy.
cmake -S "$example" -B "$work/cmake" -G Ninja -DCMAKE_PREFIX_PATH="$prefix" \
  -DCMAKE_FIND_USE_PACKAGE_REGISTRY=OFF -DCMAKE_BUILD_TYPE=Release >/dev/null
cmake --build "$work/cmake" >/dev/null
"$work/cmake/panel_example" | tee "$work/cmake.out"
grep -q '^fitted size [1-9][0-9]*, glyph' "$work/cmake.out"

libdir=$(dirname "$(find "$prefix" -name lumeris.pc)")/..
export PKG_CONFIG_PATH="$libdir/pkgconfig"
# shellcheck disable=SC2046
c++ -std=c++20 "$example/panel_example.cc" $(pkg-config --cflags --libs lumeris) -o "$work/pkg_example"
LD_LIBRARY_PATH="$libdir" "$work/pkg_example" | tee "$work/pkg.out"
cmp "$work/cmake.out" "$work/pkg.out"
