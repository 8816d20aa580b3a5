#!/usr/bin/env bash
# build.sh DIR [cmake options...]: configure (once) and build into DIR with Ninja.
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
dir=$1; shift
if [ ! -f "$root/$dir/build.ninja" ]; then
  cmake -S "$root" -B "$root/$dir" -G Ninja "$@" >/dev/null
fi
cmake --build "$root/$dir" -- -j"$(nproc)"
