#!/usr/bin/env bash
# scripts/build.sh [release|asan] [TARGET...] — configures (once) and builds one build tree under
# build/: everything, or only the targets named (./run names the programs, the library and the
# bundle). The full build also runs the resource builder, which writes the bundles under
# build/<kind>/root.
set -euo pipefail
top=$(cd "$(dirname "$0")/.." && pwd)
kind=${1:-release}
shift || true
dir="$top/build/$kind"
case "$kind" in
  release) flags=(-DCMAKE_BUILD_TYPE=RelWithDebInfo) ;;
  asan) flags=(-DCMAKE_BUILD_TYPE=Debug -DLUMERIS_SANITIZE=ON -DLUMERIS_BUILD_BENCH=OFF) ;;
  *) echo "build.sh: unknown build kind '$kind'" >&2; exit 2 ;;
esac
if [[ ! -f "$dir/build.ninja" ]]; then
  cmake -S "$top" -B "$dir" -G Ninja "${flags[@]}" >/dev/null
fi
if [[ $# -gt 0 ]]; then
  cmake --build "$dir" --target "$@"
else
  cmake --build "$dir"
fi
