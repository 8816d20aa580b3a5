#!/usr/bin/env python3
"""Python package benchmark, each path measured side by side with its baseline
in one run (built programs only; never run by the tests):

- fetch_waveform(out=buffer) of 1,000,000 and 8,000,000 points from a server
  holding a pre-built record (bench_python_server), against the C API call it
  wraps (Qn731XX_FetchWaveform through ctypes into the same buffer), and
  against pyvisa-py's query_binary_values plus NumPy scaling of the same record;
- the same record read by a bare socket client into a reused buffer and
  converted with NumPy (the limit of the path);
- a simulated property read, against the bare C API getter.

    QN731XX_LIBRARY=build/libquorlen731xx.so python3 bench/bench_python.py \
        [--server build/bench/bench_python_server] [--rounds 3]

Reported: median seconds of each path and the ratios.
"""
import argparse
import ctypes
import os
import statistics
import subprocess
import sys
import time

import numpy as np

ROOT = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
sys.path.insert(0, os.path.join(ROOT, "python"))
import quorlen731xx as qn  # noqa: E402


def timed(fn):
    t = time.perf_counter()
    fn()
    return time.perf_counter() - t


class Server:
    def __init__(self, program, points):
        self.proc = subprocess.Popen([program, str(points)], stdin=subprocess.PIPE,
                                     stdout=subprocess.PIPE, text=True)
        line = self.proc.stdout.readline()
        self.port = int(line.rsplit(":", 1)[1])

    def close(self):
        self.proc.stdin.close()
        self.proc.wait(timeout=30)


def driver_round(port, points, buf, reps):
    """Python fetch and the bare C call, alternating, on one session."""
    py, c = [], []
    with qn.Scope(f"TCPIP0::127.0.0.1::{port}::SOCKET") as scope:
        source = scope.measurements["Channel1"]
        s = scope._session
        fetch = s.lib.FetchWaveform
        n, x0, dx = ctypes.c_int32(), ctypes.c_double(), ctypes.c_double()
        addr = buf.ctypes.data

        def bare():
            status = fetch(s.vi, b"Channel1", len(buf), addr, ctypes.byref(n), ctypes.byref(x0),
                           ctypes.byref(dx))
            assert status >= 0 and n.value == points, (status, n.value)

        def wrapped():
            w = source.fetch_waveform(out=buf)
            assert len(w) == points

        wrapped()
        bare()
        for _ in range(reps):
            py.append(timed(wrapped))
            c.append(timed(bare))
    return py, c


def pyvisa_round(port, reps):
    import pyvisa
    rm = pyvisa.ResourceManager("@py")
    inst = rm.open_resource(f"TCPIP::127.0.0.1::{port}::SOCKET", read_termination="\n",
                            write_termination="\n", timeout=60000)
    pre = [float(v) for v in inst.query(":WAV:PRE?").split(",")]
    yinc, yorigin, yref = pre[7], pre[8], pre[9]
    out = []

    def fetch():
        raw = inst.query_binary_values(":WAV:DATA?", datatype="h", is_big_endian=True,
                                       container=np.array)
        y = (raw.astype(np.float64) - yref) * yinc + yorigin
        assert len(y) > 0

    fetch()
    for _ in range(reps):
        out.append(timed(fetch))
    inst.close()
    rm.close()
    return out


def bare_round(port, points, buf, reps):
    """The limit of the path: one query, the block read into a reused buffer,
    converted with NumPy into the same output array."""
    import socket
    sock = socket.create_connection(("127.0.0.1", port))
    sock.setsockopt(socket.IPPROTO_TCP, socket.TCP_NODELAY, 1)
    raw = bytearray(2 * points + 64)
    view = memoryview(raw)
    out = []

    def fetch():
        sock.sendall(b":WAV:DATA?\n")
        got = 0
        need = None
        while need is None or got < need:
            got += sock.recv_into(view[got:])
            if need is None and got >= 2:
                digits = raw[1] - 48
                if got >= 2 + digits:
                    need = 2 + digits + int(raw[2:2 + digits]) + 1  # block and "\n"
        start = 2 + (raw[1] - 48)
        words = np.frombuffer(raw, dtype=">i2", count=points, offset=start)
        np.multiply(words, 1.25e-4, out=buf)

    fetch()
    for _ in range(reps):
        out.append(timed(fetch))
    sock.close()
    return out


def property_read(n=20000):
    with qn.Scope("", options="Simulate=true") as scope:
        acq = scope.acquisition
        s = scope._session
        get = s.lib.GetAttributeViReal64
        out = ctypes.c_double()
        ident = qn.scope._BY_CONSTANT["IVISCOPE_ATTR_HORZ_TIME_PER_RECORD"].id
        py, c = [], []
        for _ in range(7):
            t = time.perf_counter()
            for _ in range(n):
                acq.time_per_record
            py.append((time.perf_counter() - t) / n)
            vi = s.vi
            t = time.perf_counter()
            for _ in range(n):
                get(vi, b"", ident, ctypes.byref(out))
            c.append((time.perf_counter() - t) / n)
    return min(py), min(c)


def main():
    ap = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    ap.add_argument("--server", default=os.path.join(ROOT, "build", "bench",
                                                     "bench_python_server"))
    ap.add_argument("--rounds", type=int, default=3)
    ap.add_argument("--reps", type=int, default=5)
    args = ap.parse_args()
    for points in (1_000_000, 8_000_000):
        server = Server(args.server, points)
        buf = np.empty(points)
        py, c, visa, bare = [], [], [], []
        try:
            for _ in range(args.rounds):
                p, b = driver_round(server.port, points, buf, args.reps)
                py += p
                c += b
                visa += pyvisa_round(server.port, max(1, args.reps // 2))
                bare += bare_round(server.port, points, buf, args.reps)
        finally:
            server.close()
        mp, mc, mv, mb = (statistics.median(x) for x in (py, c, visa, bare))
        print(f"{points:>9} points: fetch_waveform(out=) {mp * 1e3:8.2f} ms | C API {mc * 1e3:8.2f} ms"
              f" | pyvisa-py query_binary_values+scaling {mv * 1e3:8.2f} ms"
              f" | bare socket+numpy {mb * 1e3:8.2f} ms"
              f" || python/C {mp / mc:5.2f} (goal <= 1.2) | pyvisa/python {mv / mp:6.1f}"
              f" (goal >= 20) | python/bare {mp / mb:5.2f}")
    py, c = property_read()
    print(f"simulated property read: python {py * 1e6:.2f} us | C API {c * 1e6:.2f} us"
          f" || python/C {py / c:.2f} (goal: python under 5 us)")


if __name__ == "__main__":
    main()
