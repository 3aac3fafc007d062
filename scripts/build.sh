#!/usr/bin/env bash
# scripts/build.sh [release|asan] — configures (once) and builds one build tree under build/.
# The build also runs the resource builder, which writes the bundles under build/<kind>/root.
set -euo pipefail
top=$(cd "$(dirname "$0")/.." && pwd)
kind=${1:-release}
dir="$top/build/$kind"
case "$kind" in
  release) flags=(-DCMAKE_BUILD_TYPE=RelWithDebInfo) ;;
  asan) flags=(-DCMAKE_BUILD_TYPE=Debug -DLUMERIS_SANITIZE=ON -DLUMERIS_BUILD_BENCH=OFF) ;;
  *) echo "build.sh: unknown build kind '$kind'" >&2; exit 2 ;;
esac
if [[ ! -f "$dir/build.ninja" ]]; then
  cmake -S "$top" -B "$dir" -G Ninja "${flags[@]}" >/dev/null
fi
cmake --build "$dir"
