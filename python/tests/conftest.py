"""Fixtures: the driver library (QN731XX_LIBRARY), a simulated scope, and the
emulator (QN731XX_EMULATOR, the qn731xx-emulator program) on a loopback port."""
import os
import subprocess
import sys

import pytest

sys.path.insert(0, os.path.join(os.path.dirname(__file__), ".."))
import quorlen731xx as qn  # noqa: E402


def pytest_configure(config):
    if not os.environ.get("QN731XX_LIBRARY"):
        raise pytest.UsageError("set QN731XX_LIBRARY to the path of libquorlen731xx.so")


@pytest.fixture
def sim():
    with qn.Scope("", id_query=True, options="Simulate=true") as scope:
        yield scope


class Emulator:
    def __init__(self, tmp_path):
        program = os.environ.get("QN731XX_EMULATOR")
        if not program:
            pytest.skip("QN731XX_EMULATOR is not set")
        self.log = tmp_path / "received.log"
        self.proc = subprocess.Popen([program, "--model", "QDS4032A", "--port", "0",
                                      "--log", str(self.log)],
                                     stdout=subprocess.PIPE, text=True)
        line = self.proc.stdout.readline()
        if not line.startswith("listening on 127.0.0.1:"):
            self.proc.kill()
            raise RuntimeError(f"emulator did not start: {line!r}")
        self.resource = f"TCPIP0::127.0.0.1::{line.rsplit(':', 1)[1].strip()}::SOCKET"

    def received(self):
        return self.log.read_text().splitlines() if self.log.exists() else []

    def stop(self):
        self.proc.terminate()
        try:
            self.proc.wait(timeout=10)
        except subprocess.TimeoutExpired:
            self.proc.kill()
            self.proc.wait()


@pytest.fixture(scope="module")
def emulator(tmp_path_factory):
    emu = Emulator(tmp_path_factory.mktemp("emulator"))
    yield emu
    emu.stop()


@pytest.fixture
def live(emulator):
    """A scope connected to the emulator (it serves one client at a time)."""
    with qn.Scope(emulator.resource, id_query=True) as scope:
        yield scope
