#!/usr/bin/env bash
# run_install_test.sh BUILD_DIR WORK_DIR C_COMPILER CXX_COMPILER: installs the
# build into a fresh prefix, then configures, builds and runs the consumer
# project against it, once through the CMake package and once through pkg-config.
set -euo pipefail
build=$1 work=$2 cc=$3 cxx=$4
here=$(cd "$(dirname "$0")" && pwd)
rm -rf "$work"
mkdir -p "$work"
prefix=$work/prefix
cmake --install "$build" --prefix "$prefix" >"$work/install.log"

# The installed programs run from the prefix without any library path set.
"$prefix/bin/qn731xx" --help >/dev/null

for mode in cmake pkg-config; do
  out=$work/consumer-$mode
  opts=(-DCMAKE_C_COMPILER="$cc" -DCMAKE_CXX_COMPILER="$cxx")
  if [ "$mode" = cmake ]; then opts+=(-DCMAKE_PREFIX_PATH="$prefix"); else opts+=(-DUSE_PKG_CONFIG=ON); fi
  # Only the installed tree may be seen: no pkg-config path of the host's other packages.
  PKG_CONFIG_PATH= PKG_CONFIG_LIBDIR=$(dirname "$(find "$prefix" -name quorlen731xx.pc)") \
    cmake -S "$here/consumer" -B "$out" "${opts[@]}" >"$out.log"
  cmake --build "$out" >>"$out.log"
  model=$(env -u LD_LIBRARY_PATH "$out/c_consumer")
  echo "$mode: $model"
  case $model in "model: "?*) ;; *) echo "unexpected model line: $model" >&2; exit 1 ;; esac
  env -u LD_LIBRARY_PATH "$out/cxx_consumer"
done
