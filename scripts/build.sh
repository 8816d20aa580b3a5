#!/usr/bin/env bash
# build.sh DIR [cmake options...] [--target-only TARGET]: configure and build
# into DIR with Ninja (everything, or only TARGET). Warnings are errors here
# (-DQN_WERROR=OFF turns that off). DIR is configured again only when the
# options differ from those it was configured with.
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
dir=$1; shift
target=()
args=()
while [ $# -gt 0 ]; do
  if [ "$1" = "--target-only" ]; then target=(--target "$2"); shift 2; else args+=("$1"); shift; fi
done
launcher=()
if command -v ccache >/dev/null 2>&1; then
  # Rebuilds of a fresh clone reuse earlier compilations.
  launcher=(-DCMAKE_CXX_COMPILER_LAUNCHER=ccache -DCMAKE_C_COMPILER_LAUNCHER=ccache)
fi
options=("${launcher[@]}" -DQN_WERROR=ON "${args[@]}")
stamp=$root/$dir/.build-sh-options
if [ ! -f "$root/$dir/build.ninja" ] || [ "$(cat "$stamp" 2>/dev/null)" != "${options[*]}" ]; then
  cmake -S "$root" -B "$root/$dir" -G Ninja "${options[@]}" >/dev/null
  echo "${options[*]}" >"$stamp"
fi
cmake --build "$root/$dir" "${target[@]}" -- -j"$(nproc)"
