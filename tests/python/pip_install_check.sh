#!/usr/bin/env bash
# pip_install_check.sh PYTHON PACKAGE_DIR VENV_DIR: installs the package without
# network access into a fresh virtual environment and opens a simulated scope
# with the installed copy.
set -euo pipefail
python=$1 package=$2 venv=$3
rm -rf "$venv"
"$python" -m venv --system-site-packages "$venv"
# Build in a copy so that the source tree gets no build output.
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
cp -r "$package" "$work/pkg"
rm -rf "$work/pkg/build" "$work/pkg"/*.egg-info
"$venv/bin/python" -m pip install -q --no-cache-dir --no-index --no-build-isolation --no-deps "$work/pkg"
cd "$work"
"$venv/bin/python" - <<'PY'
import quorlen731xx as qn
assert "site-packages" in qn.__file__, qn.__file__
with qn.Scope("", options="Simulate=true") as scope:
    assert scope.identity.instrument_model
    assert len(scope.channels) > 0
print("installed and opened a simulated scope")
PY
