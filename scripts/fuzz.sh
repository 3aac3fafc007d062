#!/usr/bin/env bash
# scripts/fuzz.sh <target> <seconds> [libFuzzer options...]
# Configures build/fuzz with clang, ASan+UBSan and libFuzzer (once), builds <target>, and runs it
# for <seconds> on one process. Seeds come from fuzz/corpus/<target>/ (read only); new inputs go to
# build/fuzz/corpus/<target>/ and crashes to build/fuzz/artifacts/<target>/. The target's own
# standard error (the platform log) is closed so that log lines do not flood the output; libFuzzer
# and sanitizer reports still appear.
set -euo pipefail
if [[ $# -lt 2 ]]; then
  echo "usage: scripts/fuzz.sh <target> <seconds> [libFuzzer options...]" >&2
  exit 2
fi
target=$1
seconds=$2
shift 2
top=$(cd "$(dirname "$0")/.." && pwd)
dir="$top/build/fuzz"
if [[ ! -f "$dir/build.ninja" ]]; then
  CC=clang CXX=clang++ cmake -S "$top" -B "$dir" -G Ninja \
    -DCMAKE_BUILD_TYPE=RelWithDebInfo \
    -DCMAKE_C_FLAGS=-fsanitize=fuzzer-no-link -DCMAKE_CXX_FLAGS=-fsanitize=fuzzer-no-link \
    -DLUMERIS_SANITIZE=ON -DLUMERIS_BUILD_FUZZ=ON \
    -DLUMERIS_BUILD_TESTS=OFF -DLUMERIS_BUILD_BENCH=OFF >/dev/null
fi
cmake --build "$dir" -j2 --target "$target"
binary=$(find "$dir/fuzz" -maxdepth 1 -type f -name "$target" -perm -u+x | head -n 1)
seeds="$top/fuzz/corpus/$target"
work="$dir/corpus/$target"
artifacts="$dir/artifacts/$target/"
mkdir -p "$work" "$artifacts"
options=(-max_total_time="$seconds" -artifact_prefix="$artifacts" -print_final_stats=1 -close_fd_mask=2)
dict="$top/fuzz/$(basename "$target" _fuzz | sed 's/^lumeris_//').dict"
[[ -f "$dict" ]] && options+=(-dict="$dict")
inputs=("$work")
[[ -d "$seeds" ]] && inputs+=("$seeds")
exec "$binary" "${options[@]}" "$@" "${inputs[@]}"
