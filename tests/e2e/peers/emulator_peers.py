"""Drives qn731xx-emulator with independent SCPI clients: pyvisa (pyvisa-py backend) and
lxi-tools, over the raw socket and over VXI-11. Usage: emulator_peers.py <path to
qn731xx-emulator>

The VXI-11 clients find the core channel through the portmapper on port 111, so the emulator
serves one there when this runs as root and the port is free; otherwise the VXI-11 checks are
skipped, and the output says so and why."""
import os
import shutil
import socket
import subprocess
import sys

import pyvisa

failures = []
passed = [0]


def check(what, got, expected):
    if got != expected:
        failures.append(f"{what}: got {got!r}, expected {expected!r}")
    else:
        passed[0] += 1


def start(emulator, *extra):
    proc = subprocess.Popen([emulator, "--model", "QDS2014A", "--port", "0", *extra],
                            stdout=subprocess.PIPE, text=True)
    ports = {}
    expected = ["listening"]
    if "--vxi11" in extra:
        expected.append("vxi11 listening")
    if "--portmapper" in extra:
        expected.append("portmapper listening")
    for name in expected:
        line = proc.stdout.readline().strip()
        prefix = name + " on 127.0.0.1:"
        if not line.startswith(prefix):
            proc.kill()
            sys.exit(f"unexpected line {line!r}, expected {prefix!r}...")
        ports[name.split()[0]] = int(line[len(prefix):])
    return proc, ports


def portmapper_port_free():
    """Why port 111 cannot be served here, or None when it can."""
    if os.geteuid() != 0:
        return "not running as root"
    for kind in (socket.SOCK_STREAM, socket.SOCK_DGRAM):
        with socket.socket(socket.AF_INET, kind) as s:
            s.setsockopt(socket.SOL_SOCKET, socket.SO_REUSEADDR, 1)
            try:
                s.bind(("127.0.0.1", 111))
            except OSError as e:
                return f"port 111 is in use ({e.strerror})"
    return None


def drive_with_pyvisa(resource):
    rm = pyvisa.ResourceManager("@py")
    inst = rm.open_resource(resource, read_termination="\n", write_termination="\n",
                            timeout=10000)
    idn = inst.query("*IDN?").split(",")
    check("IDN maker/model", idn[:2], ["QUORLEN TECHNOLOGIES", "QDS2014A"])
    inst.write("*CLS")
    inst.write(":BOGus:COMMand 1")
    check("error after bad command", inst.query("SYST:ERR?"), '-113,"Undefined header"')
    check("queue empty", inst.query(":SYSTem:ERRor?"), '+0,"No error"')
    check("channel count key", inst.query(':SYST:DATA:VAL? "COUN:CHAN"'), "4")

    inst.write(":CHAN1:DISP 1;:CHAN1:RANG 8;OFFS 0")
    inst.write(":TIM:RANG 1e-3;:WAV:POIN 500")
    check("digitize completes", inst.query(":DIG;*OPC?"), "1")
    inst.write(":WAV:SOUR CHAN1;:WAV:FORM WORD;UNS 0;BYT MSBF")
    preamble = inst.query(":WAV:PRE?").split(",")
    check("preamble points", preamble[2], "500")
    data = inst.query_binary_values(":WAV:DATA?", datatype="h", is_big_endian=True)
    check("block length", len(data), 500)
    yinc = float(preamble[7])
    peak = max(abs(v) for v in data) * yinc
    check("waveform peak near the synthesised 2.4 V", 2.0 < peak < 2.8, True)
    check("no errors after transfer", inst.query("SYST:ERR?"), '+0,"No error"')
    inst.close()
    rm.close()


def drive_with_lxi(port=None):
    """lxi scpi over the raw socket on port, or over VXI-11 when port is None."""
    lxi = shutil.which("lxi")
    if lxi is None:
        failures.append("lxi not installed")
        return
    raw = ["-p", str(port), "-r"] if port else []
    out = subprocess.run([lxi, "scpi", "-a", "127.0.0.1", *raw, "-t", "10", "*IDN?"],
                         capture_output=True, text=True, timeout=60)
    check("lxi exit status", out.returncode, 0)
    check("lxi IDN", out.stdout.strip().split(",")[:2], ["QUORLEN TECHNOLOGIES", "QDS2014A"])


def main():
    proc, ports = start(sys.argv[1])
    try:
        drive_with_pyvisa(f"TCPIP0::127.0.0.1::{ports['listening']}::SOCKET")
        drive_with_lxi(ports["listening"])
    finally:
        proc.terminate()
        proc.wait(timeout=30)
    check("emulator exit status", proc.returncode, 0)

    why_not = portmapper_port_free()
    if why_not:
        print(f"SKIPPED: the VXI-11 checks with pyvisa-py and lxi need the portmapper on port "
              f"111, and {why_not}")
    else:
        proc, ports = start(sys.argv[1], "--vxi11", "--portmapper")
        try:
            check("portmapper port", ports["portmapper"], 111)
            drive_with_pyvisa("TCPIP0::127.0.0.1::inst0::INSTR")
            drive_with_lxi()
        finally:
            proc.terminate()
            proc.wait(timeout=30)
        check("emulator exit status (VXI-11)", proc.returncode, 0)

    for f in failures:
        print("FAIL:", f)
    print(f"{passed[0]} passed, {len(failures)} failed")
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main())
