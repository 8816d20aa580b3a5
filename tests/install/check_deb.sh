#!/usr/bin/env bash
# check_deb.sh BUILD_DIR WORK_DIR: builds the Debian package of the build with
# cpack and checks that it holds the libraries, headers, pkg-config file, CMake
# package and programs, and that its Depends line was computed.
set -euo pipefail
build=$1 work=$2
rm -rf "$work"
mkdir -p "$work"
cpack -G DEB --config "$build/CPackConfig.cmake" -B "$work" >"$work/cpack.log" 2>&1 ||
  { cat "$work/cpack.log" >&2; exit 1; }
deb=$(ls "$work"/*.deb)
dpkg-deb -c "$deb" >"$work/listing"
awk '{print $6}' "$work/listing" | sed 's|^\./|/|' >"$work/contents"
dpkg-deb -I "$deb" >"$work/info"

missing=0
for want in \
    '/usr/lib/.*libquorlen731xx\.so\.[0-9]+\.[0-9]+\.[0-9]+$' \
    '/usr/lib/.*libqnplatform\.so\.[0-9]+\.[0-9]+\.[0-9]+$' \
    '/usr/include/quorlen731xx/Qn731XX\.h$' \
    '/usr/include/quorlen731xx/visatype\.h$' \
    '/usr/include/quorlen731xx/Quorlen731XX\.h$' \
    '/usr/include/quorlen731xx/platform/com/com\.h$' \
    '/usr/lib/.*pkgconfig/quorlen731xx\.pc$' \
    '/usr/lib/.*cmake/Quorlen731XX/Quorlen731XXConfig\.cmake$' \
    '/usr/lib/.*cmake/Quorlen731XX/Quorlen731XXConfigVersion\.cmake$' \
    '/usr/bin/qn731xx$' \
    '/usr/bin/qn731xx-emulator$' \
    '/usr/share/doc/quorlen731xx/README\.md$'; do
  grep -Eq "$want" "$work/contents" || { echo "not in the package: $want" >&2; missing=1; }
done
# Symbolic links (the SONAME and the development name) are listed with their target.
for link in libquorlen731xx.so.1 libquorlen731xx.so; do
  grep -q "/$link -> " "$work/listing" || { echo "no link $link" >&2; missing=1; }
done
# The computed dependencies name at least the C and C++ runtimes.
depends=$(sed -n 's/^ Depends: //p' "$work/info")
for lib in libc6 libstdc++6 libpugixml; do
  case $depends in *"$lib"*) ;; *) echo "Depends lacks $lib: '$depends'" >&2; missing=1 ;; esac
done
[ $missing -eq 0 ] || { cat "$work/contents" "$work/info" >&2; exit 1; }
echo "$(basename "$deb"): Depends: $depends"
