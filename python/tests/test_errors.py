"""Bad input and driver errors: the exception, its status and its text."""
import numpy as np
import pytest

import quorlen731xx as qn

# (setting, bad value, exception, text in the message)
BAD_VALUES = [
    ("range", "4.0", qn.InvalidValueError, "needs a number"),
    ("range", None, qn.InvalidValueError, "needs a number"),
    ("coupling", 1.5, qn.InvalidValueError, "needs an integer"),
    ("coupling", qn.AcquisitionType.AVERAGE, qn.InvalidValueError, "needs a VerticalCoupling"),
    ("enabled", "yes", qn.InvalidValueError, "True or False"),
    ("enabled", 2, qn.InvalidValueError, "True or False"),
    ("label", b"bytes", qn.InvalidValueError, "needs a str"),
    ("label", "a\0b", qn.InvalidValueError, "NUL"),
]


@pytest.mark.parametrize("name, value, exc, text", BAD_VALUES)
def test_bad_values_are_refused_and_change_nothing(sim, name, value, exc, text):
    ch = sim.channels["Channel1"]
    before = getattr(ch, name)
    with pytest.raises(exc, match=text) as info:
        setattr(ch, name, value)
    assert info.value.status_name == "IVI_ERROR_INVALID_VALUE"
    assert getattr(ch, name) == before


@pytest.mark.parametrize("value, ok", [
    (2**31 - 1, True), (2**31, False), (-2**31, True), (-2**31 - 1, False), (np.int64(7), True)])
def test_int32_limits(sim, value, ok):
    acq = sim.acquisition
    acq.number_of_averages = 5
    if ok:
        try:
            acq.number_of_averages = value
        except qn.DriverError as e:  # the driver may refuse it, Python must not
            assert "32-bit" not in e.message
    else:
        with pytest.raises(qn.InvalidValueError, match="outside the 32-bit"):
            acq.number_of_averages = value
        assert acq.number_of_averages == 5


def test_driver_errors_carry_status_and_text(sim):
    with pytest.raises(qn.DriverError) as info:
        sim.set_attribute("IVISCOPE_ATTR_HORZ_RECORD_LENGTH", 5)
    assert info.value.status_name == "IVI_ERROR_ATTR_NOT_WRITABLE"
    assert "read only" in str(info.value) and "0xBFFA000D" in str(info.value)
    with pytest.raises(qn.DriverError, match="selector") as info:
        sim.measurements["UserChannel1"].fetch_waveform()
    assert info.value.status < 0
    with pytest.raises(AttributeError):
        sim.acquisition.record_length = 10      # read-only property
    with pytest.raises(AttributeError):
        sim.acquisition.time_per_recrod = 1.0   # misspelt setting
    with pytest.raises(qn.InvalidValueError, match="not an attribute"):
        sim.get_attribute("IVI_ATTR_NO_SUCH_THING")


def test_failed_open_raises_with_text():
    with pytest.raises(qn.DriverError) as info:
        qn.Scope("", options="Simulate=maybe")
    assert info.value.message and info.value.status < 0
    with pytest.raises(qn.InvalidValueError):
        qn.Scope(42)


def test_timeout_raises_and_leaves_the_session_usable(live):
    source = live.measurements["Channel1"]
    for _ in range(5):  # a reply already waiting may beat even a zero limit
        try:
            source.read_waveform(max_time=0)
        except qn.DriverTimeoutError as e:
            assert isinstance(e, TimeoutError) and "timeout" in e.message
            break
    else:
        pytest.skip("no read timed out")
    wave = source.read_waveform(max_time=5)
    assert len(wave) == live.acquisition.record_length
    assert live.identity.instrument_model == "QDS4032A"
