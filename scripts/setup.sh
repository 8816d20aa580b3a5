#!/usr/bin/env bash
# Installs the Debian packages the build and the tests need, only when missing.
set -euo pipefail
packages=(
  build-essential cmake ninja-build pkg-config clang ccache dpkg-dev file
  libgtest-dev libgmock-dev libbenchmark-dev
  libpugixml-dev libtirpc-dev rpcsvc-proto libcli11-dev nlohmann-json3-dev
  python3 python3-pyvisa python3-pyvisa-py lxi-tools
  python3-numpy python3-pytest python3-matplotlib python3-venv python3-pip python3-setuptools
)
missing=()
for p in "${packages[@]}"; do
  dpkg-query -W -f='${Status}' "$p" 2>/dev/null | grep -q "install ok installed" || missing+=("$p")
done
if ((${#missing[@]})); then
  echo "setup: installing ${missing[*]}"
  sudo_cmd=()
  [ "$(id -u)" -eq 0 ] || sudo_cmd=(sudo)
  export DEBIAN_FRONTEND=noninteractive
  "${sudo_cmd[@]}" apt-get update -qq
  "${sudo_cmd[@]}" apt-get install -y -qq --no-install-recommends "${missing[@]}"
fi
