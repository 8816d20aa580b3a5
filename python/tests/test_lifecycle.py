"""Opening, closing, closed scopes and use from other threads."""
import threading

import pytest

import quorlen731xx as qn


def test_with_block_closes_even_on_error():
    with pytest.raises(RuntimeError):
        with qn.Scope("", options="Simulate=true") as scope:
            raise RuntimeError("inside")
    assert scope.closed
    scope.close()  # a second close does nothing


@pytest.mark.parametrize("use", [
    lambda s: s.acquisition.time_per_record,
    lambda s: setattr(s.acquisition, "time_per_record", 1e-3),
    lambda s: s.initiate(),
    lambda s: s.measurements["Channel1"].fetch_waveform(),
    lambda s: s.get_attribute("IVISCOPE_ATTR_VERTICAL_RANGE", "Channel1"),
])
def test_closed_scope_raises_instead_of_touching_the_session(use):
    scope = qn.Scope("", options="Simulate=true")
    channel_names = list(scope.channels)
    scope.close()
    with pytest.raises(qn.SessionClosedError, match="closed"):
        use(scope)
    assert channel_names


def test_session_used_from_a_second_thread(sim):
    sim.channels["Channel1"].range = 2.0
    seen, errors = [], []

    def work():
        try:
            with sim.lock():
                sim.channels["Channel1"].range = 8.0
                seen.append(sim.channels["Channel1"].range)
        except Exception as e:  # pragma: no cover - reported below
            errors.append(e)

    t = threading.Thread(target=work)
    t.start()
    t.join()
    assert not errors and seen == [8.0]
    assert sim.channels["Channel1"].range == 8.0


def test_close_while_another_thread_reads():
    scope = qn.Scope("", options="Simulate=true")
    stop = threading.Event()
    failures = []

    def reader():
        while not stop.is_set():
            try:
                scope.measurements["Channel1"].fetch_waveform()
            except qn.SessionClosedError:
                return
            except qn.DriverError as e:
                failures.append(e)
                return

    t = threading.Thread(target=reader)
    t.start()
    scope.measurements["Channel1"].fetch_waveform()
    scope.close()
    t.join(timeout=30)
    stop.set()
    assert not t.is_alive() and not failures


def test_missing_library_names_the_way_to_fix_it(tmp_path):
    with pytest.raises(OSError, match="QN731XX_LIBRARY"):
        qn.Scope("", options="Simulate=true", library=str(tmp_path / "libnothing.so"))
