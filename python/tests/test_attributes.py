"""The attribute table against the driver, and properties of each kind."""
import ctypes

import pytest

import quorlen731xx as qn
from quorlen731xx import _tables
from quorlen731xx.scope import SPECS

SELECTORS = {"session": b"", "channel": b"Channel1", "user_channel": b"UserChannel1",
             "digital_channel": b"UserDigitalChannel0"}
GETTERS = {"ViInt32": ("GetAttributeViInt32", ctypes.c_int32),
           "ViReal64": ("GetAttributeViReal64", ctypes.c_double),
           "ViBoolean": ("GetAttributeViBoolean", ctypes.c_uint16)}
MISMATCH = _tables.STATUSES["IVI_ERROR_TYPES_DO_NOT_MATCH"]


def _get(sim, ctype, spec):
    lib, vi = sim._session.lib, sim._session.vi
    sel = SELECTORS[spec.scope]
    if ctype == "ViString":
        return lib.GetAttributeViString(vi, sel, spec.id, 0, None)
    name, cls = GETTERS[ctype]
    out = cls()
    return getattr(lib, name)(vi, sel, spec.id, ctypes.byref(out))


@pytest.mark.parametrize("spec", SPECS, ids=lambda s: s.constant)
def test_table_type_is_the_drivers(sim, spec):
    # Only the getter of the table's type is accepted by the driver.
    for ctype in ("ViInt32", "ViReal64", "ViBoolean", "ViString"):
        status = _get(sim, ctype, spec)
        if ctype == spec.ctype:
            assert status != MISMATCH
        else:
            assert status == MISMATCH, ctype


def test_generated_tables_are_current():
    import os
    import subprocess
    import sys
    # The Python tables and the attribute table of docs/c-api.md.
    tool = os.path.join(os.path.dirname(__file__), "..", "..", "tools", "gen_python_tables.py")
    result = subprocess.run([sys.executable, tool, "--check"], capture_output=True, text=True)
    assert result.returncode == 0, result.stderr


FULL = 1.2345678901234567e-3


@pytest.mark.parametrize("path, value", [
    ("acquisition.time_per_record", FULL),                  # float, 17 significant digits
    ("acquisition.start_time", -4.9999999999999996e-05),    # negative
    ("acquisition.number_of_points_min", 2**31 - 1),        # int at its limit
    ("acquisition.number_of_averages", 3),
    ("acquisition.type", qn.AcquisitionType.PEAK_DETECT),   # enumeration
    ("driver_operation.range_check", False),                # bool
    ("reference_level.mid", 37.5),
])
def test_simulated_settings_round_trip(sim, path, value):
    group, name = path.rsplit(".", 1)
    target = sim
    for part in group.split("."):
        target = getattr(target, part)
    setattr(target, name, value)
    got = getattr(target, name)
    assert got == value and type(got) is type(value)


@pytest.mark.parametrize("item, name, value, before", [
    ("Channel2", "range", 4.0, 40.0),
    ("UserChannel2", "offset", -0.25, 0.0),
    ("Channel2", "coupling", qn.VerticalCoupling.DC, qn.VerticalCoupling.AC),
    ("Channel2", "enabled", False, True),
])
def test_channel_settings_reach_the_instrument(live, emulator, item, name, value, before):
    ch = live.channels[item]
    setattr(ch, name, before)
    setattr(ch, name, value)
    assert getattr(ch, name) == value
    assert type(getattr(ch, name)) is type(value)
    assert any(line.startswith(":CHAN2:") for line in emulator.received())


def test_channel_names_alias_the_same_channel(sim):
    sim.channels["Channel3"].range = 8.0
    assert sim.channels["UserChannel3"].range == 8.0
    assert list(sim.channels) == [f"Channel{i}" for i in range(1, len(sim.channels) + 1)]
    with pytest.raises(KeyError, match="Channel9"):
        sim.channels["Channel9"]


def test_attribute_by_constant_and_id(sim):
    sim.set_attribute("IVISCOPE_ATTR_VERTICAL_RANGE", 2.0, channel="Channel1")
    assert sim.get_attribute(1250001, channel="Channel1") == 2.0
    assert sim.channels["Channel1"].range == 2.0


def test_every_header_enumeration_value_has_a_python_member():
    import os
    import re
    header = open(os.path.join(os.path.dirname(__file__), "..", "..", "include",
                               "Qn731XX.h")).read()
    consts = re.findall(r"#define QN731XX_VAL_(\w+) (-?\d+)L", header)
    assert consts
    members = [(m.name, int(m)) for e in qn.enums.BY_NAME.values() for m in e]
    for name, value in consts:
        assert any((name == m or name.endswith("_" + m)) and v == int(value)
                   for m, v in members), name


def test_enumerated_value_outside_the_table_reads_as_int(sim):
    ch = sim.channels["Channel1"]
    try:
        ch.coupling = 7          # the simulation keeps what it is given
    except qn.DriverError:
        pytest.skip("the driver refuses the value")
    assert ch.coupling == 7 and type(ch.coupling) is int
    ch.coupling = qn.VerticalCoupling.GND
    assert ch.coupling is qn.VerticalCoupling.GND


@pytest.mark.parametrize("length", [255, 256, 257, 1000])
def test_text_longer_than_the_first_buffer(sim, length):
    # The first read uses 256 bytes (255 characters and the terminator).
    text = "".join(chr(ord("a") + i % 26) for i in range(length))
    sim.channels["Channel1"].label = text
    assert sim.channels["UserChannel1"].label == text
