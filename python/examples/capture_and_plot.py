#!/usr/bin/env python3
"""Captures two channels, prints their frequency and peak-to-peak voltage, and
saves a plot of both as a PNG.

    capture_and_plot.py [--resource RESOURCE] [--output capture.png]

Without --resource the example starts the instrument emulator (the program
qn731xx-emulator, found through --emulator, $QN731XX_EMULATOR or the build
tree) on a loopback port and captures from it. The driver library is found
through --library, $QN731XX_LIBRARY or the system's library path.
"""
import argparse
import contextlib
import os
import subprocess
import sys

import matplotlib
matplotlib.use("Agg")  # files only, no display needed
import matplotlib.pyplot as plt  # noqa: E402

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), ".."))
import quorlen731xx as qn  # noqa: E402

CHANNELS = ("Channel1", "Channel2")


@contextlib.contextmanager
def emulator(program, model):
    """Runs the emulator on a free loopback port; yields its resource string."""
    proc = subprocess.Popen([program, "--model", model, "--port", "0"],
                            stdout=subprocess.PIPE, text=True)
    try:
        line = proc.stdout.readline()
        if not line.startswith("listening on "):
            raise RuntimeError(f"the emulator did not start: {line!r}")
        port = line.rsplit(":", 1)[1].strip()
        yield f"TCPIP0::127.0.0.1::{port}::SOCKET"
    finally:
        proc.terminate()
        proc.wait(timeout=10)


def default_emulator():
    env = os.environ.get("QN731XX_EMULATOR")
    if env:
        return env
    here = os.path.dirname(os.path.abspath(__file__))
    return os.path.join(here, "..", "..", "build", "emulator", "qn731xx-emulator")


def capture(resource, library, output):
    with qn.Scope(resource, id_query=True, library=library) as scope:
        print(f"{scope.identity.instrument_manufacturer} {scope.identity.instrument_model}")
        scope.acquisition.time_per_record = 1e-3
        for name in CHANNELS:
            ch = scope.channels[name]
            ch.enabled = True
            ch.coupling = qn.VerticalCoupling.DC
        fig, ax = plt.subplots(figsize=(8, 4.5))
        for i, name in enumerate(CHANNELS):
            source = scope.measurements[name]
            # One acquisition for the first channel; the second is fetched from it.
            wave = source.read_waveform(max_time=5.0) if i == 0 else source.fetch_waveform()
            freq = source.fetch_measurement(qn.Measurement.FREQUENCY)
            vpp = source.fetch_measurement(qn.Measurement.VOLTAGE_PEAK_TO_PEAK)
            print(f"{name}: {len(wave)} points, frequency {freq:.6g} Hz, "
                  f"peak-to-peak {vpp:.6g} V")
            ax.plot(wave.time * 1e3, wave.y, label=f"{name} ({freq:.4g} Hz, {vpp:.3g} Vpp)")
        ax.set_xlabel("time (ms)")
        ax.set_ylabel("voltage (V)")
        ax.set_title(f"{scope.identity.instrument_model}: {', '.join(CHANNELS)}")
        ax.grid(True, alpha=0.3)
        ax.legend(loc="upper right")
        fig.tight_layout()
        fig.savefig(output, dpi=100)
        plt.close(fig)
    print(f"saved {output}")


def main(argv=None):
    ap = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    ap.add_argument("--resource", help="instrument resource string (default: the emulator)")
    ap.add_argument("--library", help="path of libquorlen731xx.so")
    ap.add_argument("--emulator", default=default_emulator(), help="emulator program")
    ap.add_argument("--model", default="QDS4032A", help="model the emulator plays")
    ap.add_argument("--output", default="capture.png", help="PNG file to write")
    args = ap.parse_args(argv)
    try:
        if args.resource:
            capture(args.resource, args.library, args.output)
        else:
            with emulator(args.emulator, args.model) as resource:
                capture(resource, args.library, args.output)
    except qn.DriverError as e:
        print(f"error: {e}", file=sys.stderr)
        return 1
    return 0


if __name__ == "__main__":
    sys.exit(main())
