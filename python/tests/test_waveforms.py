"""Waveforms into new and preallocated arrays, against simulation and the emulator."""
import numpy as np
import pytest

import quorlen731xx as qn


@pytest.fixture(params=["sim", "live"])
def scope(request):
    return request.getfixturevalue(request.param)


def test_fetch_into_new_and_preallocated_arrays(scope):
    source = scope.measurements["Channel1"]
    simulated = scope.driver_operation.simulate  # simulated records differ on every fetch
    if not simulated:
        scope.initiate()
    fresh = source.fetch_waveform()
    assert fresh.y.dtype == np.float64 and len(fresh) > 0
    # A larger array: filled in place, the result a view of its first points.
    out = np.full(len(fresh) + 7, -123.0)
    wave = source.fetch_waveform(out=out)
    assert wave.y.base is out or wave.y is out
    assert np.shares_memory(wave.y, out)
    assert len(wave) == len(fresh)
    if not simulated:
        np.testing.assert_array_equal(wave.y, fresh.y)
    assert (out[len(fresh):] == -123.0).all()           # nothing written past the record
    assert (wave.initial_x, wave.x_increment) == (fresh.initial_x, fresh.x_increment)
    # A smaller array: the first points, never more.
    small = np.empty(5)
    head = source.fetch_waveform(out=small)
    assert head.y is small
    if not simulated:
        np.testing.assert_array_equal(head.y, fresh.y[:5])
    np.testing.assert_array_equal(np.asarray(fresh), fresh.y)


def test_time_axis_from_the_instrument(live):
    wave = live.measurements["Channel1"].read_waveform(max_time=5)
    t = wave.time
    assert t[0] == wave.initial_x and wave.initial_x < 0      # a negative start time
    assert t[-1] == pytest.approx(wave.initial_x + (len(wave) - 1) * wave.x_increment)
    assert live.measurements["Channel1"].fetch_measurement(qn.Measurement.FREQUENCY) > 0
    pk = live.measurements["Channel1"].fetch_measurement(qn.Measurement.VOLTAGE_PEAK_TO_PEAK)
    assert pk == pytest.approx(wave.y.max() - wave.y.min(), rel=0.05)


@pytest.mark.parametrize("out, text", [
    (np.empty(10, dtype=np.float32), "dtype float64"),
    (np.empty((2, 5)), "one-dimensional"),
    (np.empty(20)[::2], "contiguous"),
    ([0.0] * 10, "numpy.ndarray"),
])
def test_unusable_out_arrays_are_refused(sim, out, text):
    with pytest.raises(qn.InvalidValueError, match=text):
        sim.measurements["Channel1"].fetch_waveform(out=out)


def test_read_only_out_is_refused_untouched(sim):
    out = np.zeros(10)
    out.flags.writeable = False
    with pytest.raises(qn.InvalidValueError, match="read-only"):
        sim.measurements["Channel1"].fetch_waveform(out=out)
    assert (out == 0).all()


def test_digital_pod_bytes(sim):
    pod = sim.digital_channels["UserDigitalChannel0"]
    wave = pod.fetch_digital_waveform()
    assert wave.y.dtype == np.uint8 and len(wave) > 0
    out = np.full(len(wave) + 3, 0xAA, dtype=np.uint8)
    into = pod.fetch_digital_waveform(out=out)
    assert np.shares_memory(into.y, out) and (out[len(wave):] == 0xAA).all()
    with pytest.raises(qn.InvalidValueError, match="uint8"):
        pod.fetch_digital_waveform(out=np.empty(4))


def test_min_max_waveform_needs_its_acquisition_type(live):
    source = live.measurements["Channel1"]
    live.acquisition.type = qn.AcquisitionType.NORMAL
    with pytest.raises(qn.DriverError) as info:
        source.fetch_min_max_waveform()
    assert info.value.status_name == "IVISCOPE_ERROR_INVALID_ACQ_TYPE"
    live.acquisition.type = qn.AcquisitionType.PEAK_DETECT
    mm = source.read_min_max_waveform(max_time=5)
    assert len(mm.min) == len(mm.max) > 0 and (mm.min <= mm.max).all()
