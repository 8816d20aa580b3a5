#!/bin/sh
# check_exports.sh LIBRARY: fails when the library's dynamic symbol table
# defines anything but the Qn731XX_ functions and the four module entry points.
set -eu
symbols=$(nm -D --defined-only "$1" | awk '{print $3}')
extra=$(printf '%s\n' "$symbols" | grep -v -E '^(Qn731XX_[A-Za-z0-9_]+|DllGetClassObject|DllCanUnloadNow|DllRegisterServer|DllUnregisterServer)$' || true)
if [ -n "$extra" ]; then
  echo "exported beyond the C API:"; printf '%s\n' "$extra"; exit 1
fi
count=$(printf '%s\n' "$symbols" | grep -c '^Qn731XX_' || true)
if [ "$count" -lt 60 ]; then echo "only $count C API functions exported"; exit 1; fi
echo "$count C API functions and the module entry points exported"
