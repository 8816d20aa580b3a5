#!/usr/bin/env bash
# build.sh DIR [cmake options...] [--target-only TARGET]: configure (once) and
# build into DIR with Ninja (everything, or only TARGET).
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
dir=$1; shift
target=()
args=()
while [ $# -gt 0 ]; do
  if [ "$1" = "--target-only" ]; then target=(--target "$2"); shift 2; else args+=("$1"); shift; fi
done
set -- "${args[@]}"
launcher=()
if command -v ccache >/dev/null 2>&1; then
  # Rebuilds of a fresh clone reuse earlier compilations.
  launcher=(-DCMAKE_CXX_COMPILER_LAUNCHER=ccache -DCMAKE_C_COMPILER_LAUNCHER=ccache)
fi
if [ ! -f "$root/$dir/build.ninja" ]; then
  cmake -S "$root" -B "$root/$dir" -G Ninja "${launcher[@]}" "$@" >/dev/null
fi
cmake --build "$root/$dir" "${target[@]}" -- -j"$(nproc)"
