#!/usr/bin/env bash
# Installs what is missing, builds, and runs every test: the regular build
# with g++ (which also builds the benchmarks, never runs them, and checks the
# installed tree and the Debian package), then the whole suite again built with
# clang under AddressSanitizer + UndefinedBehaviorSanitizer, then the thread
# tests with g++ under ThreadSanitizer. Warnings are errors in every build.
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
"$root/scripts/setup.sh"
jobs=$(nproc)
"$root/scripts/build.sh" build
(cd "$root/build" && ctest --output-on-failure -j"$jobs" --timeout 300)
"$root/scripts/build.sh" build-asan -DQN_SANITIZE=ON -DCMAKE_BUILD_TYPE=Debug \
  -DCMAKE_C_COMPILER=clang -DCMAKE_CXX_COMPILER=clang++
(cd "$root/build-asan" && ASAN_OPTIONS=detect_leaks=1 UBSAN_OPTIONS=print_stacktrace=1 \
   ctest --output-on-failure -j"$jobs" --timeout 300)
"$root/scripts/build.sh" build-tsan -DQN_TSAN=ON -DCMAKE_BUILD_TYPE=Debug -DQN_BUILD_BENCH=OFF \
  --target-only thread_tests
(cd "$root/build-tsan" && ctest --output-on-failure -j"$jobs" --timeout 300 -L thread)
echo "all tests passed"
