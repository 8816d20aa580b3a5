#!/usr/bin/env bash
# example_check.sh PYTHON EXAMPLE PNG: runs the capture example against the
# emulator and checks that it printed both channels and wrote a PNG file.
set -euo pipefail
python=$1 example=$2 png=$3
rm -f "$png"
out=$("$python" "$example" --output "$png")
echo "$out"
grep -q "^Channel1: .* frequency" <<<"$out"
grep -q "^Channel2: .* peak-to-peak" <<<"$out"
[ "$(head -c 8 "$png" | od -An -tx1 | tr -d ' \n')" = "89504e470d0a1a0a" ]
