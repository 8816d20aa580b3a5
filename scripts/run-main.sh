#!/usr/bin/env bash
# Installs what is missing, builds, and runs the command-line program with the
# given arguments (default: the demonstration flow).
set -euo pipefail
root=$(cd "$(dirname "$0")/.." && pwd)
"$root/scripts/setup.sh"
"$root/scripts/build.sh" build >/dev/null
if [ $# -eq 0 ]; then set -- demo; fi
exec "$root/build/tools/qn731xx" "$@"
