"""'*IDN?' over VXI-11: this project's client beside pyvisa-py, against one qn731xx-emulator.

Usage: vxi11_pyvisa.py <qn731xx-emulator> <bench_vxi11>

pyvisa-py finds the core channel through the portmapper on port 111, so this needs root and a
free port 111. Prints the wall and CPU time per round trip of both clients and their ratios
(this client / pyvisa-py)."""
import json
import os
import subprocess
import sys
import tempfile
import time

import pyvisa

ROUNDS = 3000


def start(emulator):
    proc = subprocess.Popen([emulator, "--model", "QDS4032A", "--port", "0", "--vxi11",
                             "--portmapper"], stdout=subprocess.PIPE, text=True)
    for _ in range(3):
        line = proc.stdout.readline()
        if not line:
            sys.exit("the emulator did not start (root and a free port 111 are needed)")
    return proc


def pyvisa_round_trip():
    rm = pyvisa.ResourceManager("@py")
    inst = rm.open_resource("TCPIP0::127.0.0.1::inst0::INSTR", timeout=5000)
    inst.query("*IDN?")
    wall, cpu = time.perf_counter(), time.process_time()
    for _ in range(ROUNDS):
        inst.query("*IDN?")
    wall, cpu = time.perf_counter() - wall, time.process_time() - cpu
    inst.close()
    return wall / ROUNDS * 1e9, cpu / ROUNDS * 1e9


def our_round_trip(bench):
    env = dict(os.environ, QN_BENCH_VXI11_RESOURCE="TCPIP0::127.0.0.1::inst0::INSTR")
    with tempfile.NamedTemporaryFile(suffix=".json") as out:
        subprocess.run([bench, "--benchmark_filter=BM_Idn_Vxi11", f"--benchmark_out={out.name}",
                        "--benchmark_out_format=json", "--benchmark_repetitions=5",
                        "--benchmark_report_aggregates_only=true"],
                       env=env, capture_output=True, text=True, check=True)
        results = json.load(out)
    for b in results["benchmarks"]:
        if b.get("aggregate_name") == "median":
            return b["real_time"], b["cpu_time"]
    sys.exit("no median in the benchmark output")


def main():
    proc = start(sys.argv[1])
    try:
        theirs = pyvisa_round_trip()
        ours = our_round_trip(sys.argv[2])
    finally:
        proc.terminate()
        proc.wait(timeout=30)
    print(f"pyvisa-py: {theirs[0] / 1e3:.1f} us wall, {theirs[1] / 1e3:.1f} us CPU per *IDN?")
    print(f"qn client: {ours[0] / 1e3:.1f} us wall, {ours[1] / 1e3:.1f} us CPU per *IDN?")
    print(f"ratio (qn / pyvisa-py): wall {ours[0] / theirs[0]:.2f} (goal 1.3), "
          f"CPU {ours[1] / theirs[1]:.2f} (goal 1.0)")


if __name__ == "__main__":
    main()
