"""Drives qn731xx-emulator with independent SCPI clients: pyvisa (pyvisa-py raw socket
backend) and lxi-tools. Usage: emulator_peers.py <path to qn731xx-emulator>"""
import shutil
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


def start(emulator):
    proc = subprocess.Popen([emulator, "--model", "QDS2014A", "--port", "0"],
                            stdout=subprocess.PIPE, text=True)
    line = proc.stdout.readline().strip()
    prefix = "listening on 127.0.0.1:"
    if not line.startswith(prefix):
        proc.kill()
        sys.exit(f"unexpected first line {line!r}")
    return proc, int(line[len(prefix):])


def drive_with_pyvisa(port):
    rm = pyvisa.ResourceManager("@py")
    inst = rm.open_resource(f"TCPIP0::127.0.0.1::{port}::SOCKET",
                            read_termination="\n", write_termination="\n", timeout=10000)
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


def drive_with_lxi(port):
    lxi = shutil.which("lxi")
    if lxi is None:
        failures.append("lxi not installed")
        return
    out = subprocess.run([lxi, "scpi", "-a", "127.0.0.1", "-p", str(port), "-r", "-t", "10",
                          "*IDN?"], capture_output=True, text=True, timeout=60)
    check("lxi exit status", out.returncode, 0)
    check("lxi IDN", out.stdout.strip().split(",")[:2], ["QUORLEN TECHNOLOGIES", "QDS2014A"])


def main():
    proc, port = start(sys.argv[1])
    try:
        drive_with_pyvisa(port)
        drive_with_lxi(port)
    finally:
        proc.terminate()
        proc.wait(timeout=30)
    check("emulator exit status", proc.returncode, 0)
    for f in failures:
        print("FAIL:", f)
    print(f"{passed[0]} passed, {len(failures)} failed")
    return 1 if failures else 0


if __name__ == "__main__":
    sys.exit(main())
