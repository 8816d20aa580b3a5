#!/usr/bin/env bash
# check-build-types.sh [TYPE...]: builds the library, the programs and the C
# example (no tests, no benchmarks) in every CMake build type with g++ and
# with clang, warnings as errors, each in build-types/<compiler>-<type>.
# Prints one line per build and exits non-zero when any failed.
set -uo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
types=("$@")
[ ${#types[@]} -gt 0 ] || types=(Debug Release RelWithDebInfo MinSizeRel)
failed=0
mkdir -p "$root/build-types"
for compiler in gcc clang; do
  if [ $compiler = gcc ]; then cc=gcc; cxx=g++; else cc=clang; cxx=clang++; fi
  for type in "${types[@]}"; do
    dir=build-types/$compiler-$type
    if "$root/scripts/build.sh" "$dir" -DCMAKE_BUILD_TYPE="$type" -DCMAKE_C_COMPILER=$cc \
         -DCMAKE_CXX_COMPILER=$cxx -DQN_BUILD_TESTS=OFF -DQN_BUILD_BENCH=OFF \
         >"$root/$dir.log" 2>&1; then
      echo "ok      $compiler $type"
    else
      echo "FAILED  $compiler $type (see $dir.log)"
      failed=1
    fi
  done
done
exit $failed
