"""Ctrl-C during transfers leaves the session usable."""
import os
import signal
import subprocess
import sys

CHILD = r"""
import sys
sys.path.insert(0, sys.argv[2])
import quorlen731xx as qn
with qn.Scope(sys.argv[1], id_query=True) as scope:
    source = scope.measurements["Channel1"]
    reference = source.read_waveform(max_time=5).y.copy()
    try:
        source.fetch_waveform()
        print("ready", flush=True)  # inside the try: the signal may come at once
        while True:
            source.fetch_waveform()
    except KeyboardInterrupt:
        pass
    again = source.fetch_waveform().y
    assert (again == reference).all(), "a later fetch got other data"
    print("usable", scope.identity.instrument_model, flush=True)
"""


def test_ctrl_c_during_fetches_leaves_the_session_usable(emulator):
    package = os.path.join(os.path.dirname(__file__), "..")
    child = subprocess.Popen([sys.executable, "-c", CHILD, emulator.resource, package],
                             stdout=subprocess.PIPE, stderr=subprocess.PIPE, text=True)
    assert child.stdout.readline().strip() == "ready"
    child.send_signal(signal.SIGINT)
    out, err = child.communicate(timeout=60)
    assert child.returncode == 0, err
    assert out.strip() == "usable QDS4032A"
