"""The Scope: a session with the driver's settings as properties.

The properties are made from the driver's attribute table (`_tables.py`): each
attribute becomes one property of the group its interface belongs to, typed
and documented from its row. Functions are thin calls of the C API.
"""
from __future__ import annotations

import contextlib
import math
import ctypes
from collections.abc import Mapping
from typing import Any, Dict, Iterator, List, Optional, Tuple, Union

import numpy as np

from . import _library
from . import enums
from ._session import AttributeSpec, Session, as_int32, as_real64, as_boolean, as_text, invalid
from ._tables import ATTRIBUTES
from .errors import error_for
from .waveform import MinMaxWaveform, Waveform, capacity, target

_PY_TYPES = {"ViReal64": "float", "ViInt32": "int", "ViBoolean": "bool", "ViString": "str"}

SPECS: Tuple[AttributeSpec, ...] = tuple(
    AttributeSpec(row, enums.BY_NAME.get(row[7])) for row in ATTRIBUTES)
_BY_CONSTANT = {s.constant: s for s in SPECS}
_BY_ID = {s.id: s for s in SPECS}
# Collections whose item count is an attribute: they become mappings.
_COLLECTIONS = ("channels", "measurements", "digital_channels")


def _doc(spec: AttributeSpec) -> str:
    kind = spec.enum.__name__ if spec.enum is not None else _PY_TYPES[spec.ctype]
    access = "read/write" if spec.readable and spec.writable else (
        "read-only" if spec.readable else "write-only")
    return f"{kind}, {access}: {spec.key} ({spec.constant}, {spec.id})."


def _property(spec: AttributeSpec) -> property:
    scope = spec.scope
    fget = spec.getter()

    def fset(self, value):
        spec.set(self._session, self._selectors[scope], value)

    return property(fget if spec.readable else None, fset if spec.writable else None,
                    doc=_doc(spec))


class _Group:
    """Settings of one part of the instrument."""

    __slots__ = ("_session", "_selectors")

    def __init__(self, session: Session, selectors: Dict[str, bytes]):
        self._session = session
        self._selectors = selectors

    def __repr__(self) -> str:
        names = [n for n in dir(type(self)) if isinstance(getattr(type(self), n), property)]
        return f"<{type(self).__name__}: {', '.join(names)}>"


def _group_classes() -> Dict[str, type]:
    """One class per group path ("trigger", "trigger.edge", ...), with a property
    per attribute and one per sub-group."""
    paths: Dict[str, List[AttributeSpec]] = {}
    for spec in SPECS:
        if spec.group in _COLLECTIONS or spec.group in ("channel", "digital_channel"):
            continue
        paths.setdefault(spec.group, []).append(spec)
        parts = spec.group.split(".")
        for i in range(1, len(parts)):
            paths.setdefault(".".join(parts[:i]), [])
    classes: Dict[str, type] = {}
    for path in sorted(paths, key=lambda p: -p.count(".")):
        ns: Dict[str, Any] = {"__slots__": (), "__doc__": f"The {path} settings of the scope."}
        for spec in paths[path]:
            ns[spec.name] = _property(spec)
        for child, cls in classes.items():
            if child.rsplit(".", 1)[0] == path and "." in child:
                ns[child.rsplit(".", 1)[1]] = _child(cls)
        name = "".join(p.title().replace("_", "") for p in path.split(".")) + "Settings"
        classes[path] = type(name, (_Group,), ns)
    return classes


def _child(cls: type) -> property:
    return property(lambda self: cls(self._session, self._selectors), doc=cls.__doc__)


_GROUPS = _group_classes()


class _WaveformSource(_Group):
    """Waveform and measurement functions of a named source (channel or measurement)."""

    __slots__ = ()

    @property
    def name(self) -> str:
        return self._selectors["channel"].decode()

    def _record_length(self) -> int:
        n = ctypes.c_int32()
        s = self._session
        status = s.function("ActualRecordLength")(s.vi, ctypes.byref(n))
        if status:
            s.check(status)
        return n.value

    def _analog(self, fn: str, max_time: Optional[float], out: Optional[np.ndarray]) -> Waveform:
        s = self._session
        call = s.function(fn)
        arr = target(out, self._record_length() if out is None else 0, np.float64)
        n, x0, dx = ctypes.c_int32(), ctypes.c_double(), ctypes.c_double()
        vi = s.vi
        if max_time is None:
            status = call(vi, self._selectors["channel"], capacity(arr), arr.ctypes.data,
                          ctypes.byref(n), ctypes.byref(x0), ctypes.byref(dx))
        else:
            status = call(vi, self._selectors["channel"], capacity(arr), _milliseconds(max_time),
                          arr.ctypes.data, ctypes.byref(n), ctypes.byref(x0), ctypes.byref(dx))
        if status:
            s.check(status, vi)
        return Waveform(_head(arr, n.value), x0.value, dx.value)

    def fetch_waveform(self, out: Optional[np.ndarray] = None) -> Waveform:
        """The record of the last acquisition, converted to volts (float64).

        With `out` (a writable, contiguous float64 array) the points are written
        into it without any copy and the result's `y` is a view of its first
        points; otherwise a new array of the record length is made.
        """
        return self._analog("FetchWaveform", None, out)

    def read_waveform(self, max_time: float = 5.0,
                      out: Optional[np.ndarray] = None) -> Waveform:
        """Starts an acquisition, waits for it at most `max_time` seconds and
        fetches the record (as fetch_waveform). DriverTimeoutError when it does
        not complete in time; `math.inf` waits without limit."""
        return self._analog("ReadWaveform", max_time, out)

    def _min_max(self, fn: str, max_time: Optional[float], out_min, out_max) -> MinMaxWaveform:
        s = self._session
        call = s.function(fn)
        size = self._record_length() if out_min is None or out_max is None else 0
        lo = target(out_min, size, np.float64, "out_min")
        hi = target(out_max, size, np.float64, "out_max")
        count = min(capacity(lo), capacity(hi))
        n, x0, dx = ctypes.c_int32(), ctypes.c_double(), ctypes.c_double()
        vi = s.vi
        tail = (lo.ctypes.data, hi.ctypes.data, ctypes.byref(n), ctypes.byref(x0),
                ctypes.byref(dx))
        if max_time is None:
            status = call(vi, self._selectors["channel"], count, *tail)
        else:
            status = call(vi, self._selectors["channel"], _milliseconds(max_time), count, *tail)
        if status:
            s.check(status, vi)
        return MinMaxWaveform(_head(lo, n.value), _head(hi, n.value), x0.value, dx.value)

    def fetch_min_max_waveform(self, out_min: Optional[np.ndarray] = None,
                               out_max: Optional[np.ndarray] = None) -> MinMaxWaveform:
        """The min/max record of the last acquisition (peak-detect or envelope)."""
        return self._min_max("FetchMinMaxWaveform", None, out_min, out_max)

    def read_min_max_waveform(self, max_time: float = 5.0, out_min: Optional[np.ndarray] = None,
                              out_max: Optional[np.ndarray] = None) -> MinMaxWaveform:
        """Acquires and fetches a min/max record, waiting at most `max_time` seconds."""
        return self._min_max("ReadMinMaxWaveform", max_time, out_min, out_max)

    def fetch_measurement(self, function: Union[enums.Measurement, int]) -> float:
        """One automatic measurement (`Measurement.FREQUENCY`, ...) of the last acquisition."""
        s = self._session
        value = ctypes.c_double()
        vi = s.vi
        status = s.function("FetchWaveformMeasurement")(
            vi, self._selectors["channel"], as_int32(function, "function"), ctypes.byref(value))
        if status:
            s.check(status, vi)
        return value.value

    def read_measurement(self, function: Union[enums.Measurement, int],
                         max_time: float = 5.0) -> float:
        """Acquires and measures, waiting at most `max_time` seconds."""
        s = self._session
        value = ctypes.c_double()
        vi = s.vi
        status = s.function("ReadWaveformMeasurement")(
            vi, self._selectors["channel"], as_int32(function, "function"),
            _milliseconds(max_time), ctypes.byref(value))
        if status:
            s.check(status, vi)
        return value.value


def _milliseconds(seconds: float) -> int:
    """Seconds to the C API's milliseconds; math.inf waits without limit (-1)."""
    if seconds == math.inf:
        return -1
    return as_int32(round(as_real64(seconds, "max_time") * 1000.0), "max_time in milliseconds")


def _head(arr: np.ndarray, n: int) -> np.ndarray:
    n = max(0, min(n, arr.shape[0]))
    return arr if n == arr.shape[0] else arr[:n]


def _item_class(name: str, group: str, base: type, doc: str) -> type:
    ns: Dict[str, Any] = {"__slots__": (), "__doc__": doc}
    for spec in SPECS:
        if spec.group == group and spec.scope != "session":
            ns[spec.name] = _property(spec)
    return type(name, (base,), ns)


class _ChannelBase(_WaveformSource):
    __slots__ = ()

    def configure(self, range: float, offset: float, coupling: Union[enums.VerticalCoupling, int],
                  probe_attenuation: float, enabled: bool) -> None:
        """Sets range, offset, coupling, probe attenuation and enabled in one call."""
        s = self._session
        status = s.function("ConfigureChannel")(
            s.vi, self._selectors["channel"], as_real64(range, "range"),
            as_real64(offset, "offset"), as_int32(coupling, "coupling"),
            as_real64(probe_attenuation, "probe_attenuation"), as_boolean(enabled, "enabled"))
        if status:
            s.check(status)


class _DigitalBase(_Group):
    __slots__ = ()

    @property
    def name(self) -> str:
        return self._selectors["digital_channel"].decode()

    def _digital(self, fn: str, max_time: Optional[float], out: Optional[np.ndarray]) -> Waveform:
        s = self._session
        call = s.function(fn)
        size = 0
        if out is None:
            n = ctypes.c_int32()
            status = s.function("ActualRecordLength")(s.vi, ctypes.byref(n))
            if status:
                s.check(status)
            size = n.value
        arr = target(out, size, np.uint8)
        n, x0, dx = ctypes.c_int32(), ctypes.c_double(), ctypes.c_double()
        vi = s.vi
        name = self._selectors["digital_channel"]
        tail = (arr.ctypes.data, ctypes.byref(n), ctypes.byref(x0), ctypes.byref(dx))
        if max_time is None:
            status = call(vi, name, capacity(arr), *tail)
        else:
            status = call(vi, name, capacity(arr), _milliseconds(max_time), *tail)
        if status:
            s.check(status, vi)
        return Waveform(_head(arr, n.value), x0.value, dx.value)

    def fetch_digital_waveform(self, out: Optional[np.ndarray] = None) -> Waveform:
        """The pod bytes of the last acquisition, one uint8 per point (`out`: a
        writable contiguous uint8 array filled in place)."""
        return self._digital("DigitalChannelFetchDigitalWaveform", None, out)

    def read_digital_waveform(self, max_time: float = 5.0,
                              out: Optional[np.ndarray] = None) -> Waveform:
        """Acquires and fetches the pod bytes, waiting at most `max_time` seconds."""
        return self._digital("DigitalChannelReadDigitalWaveform", max_time, out)


Channel = _item_class("Channel", "channel", _ChannelBase,
                      "An analog channel: its settings, configure() and its waveforms.")
DigitalChannel = _item_class("DigitalChannel", "digital_channel", _DigitalBase,
                             "A digital channel: its settings and its pod bytes.")


class Measurement(_WaveformSource):
    """A source of waveforms and automatic measurements."""

    __slots__ = ()


class Collection(Mapping):
    """A repeated capability: item names in the driver's order, `len()`, iteration
    and lookup by name."""

    def __init__(self, scope: "Scope", count_attr: str, name_fn: str, make):
        self._scope = scope
        self._count = _BY_CONSTANT.get(count_attr)
        self._name_fn = name_fn
        self._make = make
        self._names: Optional[List[str]] = None
        self._aliases: Dict[str, int] = {}

    def _load(self) -> List[str]:
        if self._names is None:
            s = self._scope._session
            count = self._count.get(s, b"") if self._count is not None else 0
            fn = s.function(self._name_fn)
            names = [s.read_text(fn, i) for i in range(1, count + 1)]
            self._aliases = {n: i for i, n in enumerate(names)}
            self._names = names
        return self._names

    def __getitem__(self, key: str):
        names = self._load()
        if not isinstance(key, str):
            raise KeyError(key)
        index = self._aliases.get(key)
        if index is None:
            index = self._alias(key)
        if index is None:
            raise KeyError(f"{key!r} is not one of {', '.join(names)}")
        return self._make(self._scope._session, names[index], index)

    def _alias(self, key: str) -> Optional[int]:
        return None

    def __iter__(self) -> Iterator[str]:
        return iter(self._load())

    def __len__(self) -> int:
        return len(self._load())

    def __repr__(self) -> str:
        return f"<{type(self).__name__} {self._load()!r}>"


class Channels(Collection):
    """The analog channels, by name ("Channel1"; "UserChannel1" names the same channel)."""

    def _alias(self, key: str) -> Optional[int]:
        if key.startswith("UserChannel"):
            return self._aliases.get(key[len("User"):])
        return None


def _channel(session: Session, name: str, index: int) -> Channel:
    return Channel(session, {"channel": name.encode(),
                             "user_channel": f"UserChannel{index + 1}".encode()})


def _measurement(session: Session, name: str, index: int) -> Measurement:
    return Measurement(session, {"channel": name.encode()})


def _digital(session: Session, name: str, index: int) -> DigitalChannel:
    return DigitalChannel(session, {"digital_channel": name.encode()})


class Scope:
    """A session with an oscilloscope (or its simulation).

    `Scope(resource, id_query=True, reset=False, options="Simulate=true")`
    opens the session; use it in a `with` block or call close(). `library` (or
    the environment variable QN731XX_LIBRARY) names libquorlen731xx.so.

    Settings are properties of groups (`scope.acquisition.time_per_record`,
    `scope.channels["Channel1"].range`, ...); enumerated settings take and give
    the enumerations of `quorlen731xx.enums`. A failing call raises DriverError
    (or a subclass) with the driver's message text.

    A Scope may be used from several threads: each call is one C API call, and
    the driver serialises calls on a session. Use `with scope.lock():` to keep
    a sequence of calls together.
    """

    def __init__(self, resource: str, id_query: bool = False, reset: bool = False,
                 options: str = "", library: Optional[str] = None):
        lib = _library.load(library)
        vi = ctypes.c_uint32()
        status = lib.InitWithOptions(as_text(resource, "resource"), as_boolean(id_query, "id_query"),
                                     as_boolean(reset, "reset"), as_text(options, "options"),
                                     ctypes.byref(vi))
        self._session = Session(lib, vi.value)
        self._selectors = {"session": b""}
        if status < 0:
            self._session._vi = None
            raise error_for(status, Session(lib, 0).error_text(0, status))
        self.channels = Channels(self, "IVI_ATTR_CHANNEL_COUNT", "GetChannelName", _channel)
        self.measurements = Collection(self, "QN731XX_ATTR_MEASUREMENT_COUNT",
                                       "GetMeasurementName", _measurement)
        self.digital_channels = Collection(self, "QN731XX_ATTR_DIGITALCHANNEL_COUNT",
                                           "GetDigitalChannelName", _digital)

    # -- lifetime -------------------------------------------------------------

    def close(self) -> None:
        """Closes the session; further calls raise SessionClosedError. Closing twice
        does nothing."""
        self._session.close()

    @property
    def closed(self) -> bool:
        return self._session.closed

    def __enter__(self) -> "Scope":
        return self

    def __exit__(self, *exc) -> None:
        self.close()

    def __del__(self):
        session = getattr(self, "_session", None)
        if session is not None and not session.closed:
            try:
                session.close()
            except Exception:
                pass

    @contextlib.contextmanager
    def lock(self):
        """Holds the session's lock (re-entrant, per thread) for a block of calls."""
        s = self._session
        has = ctypes.c_uint16()
        s.check(s.function("LockSession")(s.vi, ctypes.byref(has)))
        try:
            yield self
        finally:
            s.check(s.function("UnlockSession")(s.vi, ctypes.byref(has)))

    # -- attributes by ID ------------------------------------------------------

    def get_attribute(self, attribute: Union[str, int], channel: str = "") -> Any:
        """Any attribute by its constant name or ID, for the item `channel` names."""
        spec = _spec(attribute)
        return spec.get(self._session, as_text(channel, "channel"))

    def set_attribute(self, attribute: Union[str, int], value: Any, channel: str = "") -> None:
        """Sets any attribute by its constant name or ID."""
        spec = _spec(attribute)
        spec.set(self._session, as_text(channel, "channel"), value)

    # -- functions ---------------------------------------------------------------

    def _call(self, name: str, *args) -> None:
        s = self._session
        status = s.function(name)(s.vi, *args)
        if status:
            s.check(status)

    def reset(self) -> None:
        """Puts the instrument in its reset state."""
        self._call("reset")

    def initiate(self) -> None:
        """Starts an acquisition."""
        self._call("InitiateAcquisition")

    def abort(self) -> None:
        """Stops an acquisition in progress."""
        self._call("Abort")

    def auto_setup(self) -> None:
        """Lets the instrument choose its settings for the signals present."""
        self._call("AutoSetup")

    def acquisition_status(self) -> enums.AcquisitionStatus:
        """Whether the acquisition is complete."""
        value = ctypes.c_int32()
        self._call("AcquisitionStatus", ctypes.byref(value))
        return enums.AcquisitionStatus(value.value)

    def configure_acquisition_record(self, time_per_record: float, min_num_points: int,
                                     start_time: float) -> None:
        """Sets time per record (s), minimum points and start time (s) in one call."""
        self._call("ConfigureAcquisitionRecord", as_real64(time_per_record, "time_per_record"),
                   as_int32(min_num_points, "min_num_points"), as_real64(start_time, "start_time"))

    def configure_reference_levels(self, low: float, mid: float, high: float) -> None:
        """Sets the measurement reference levels."""
        self._call("ConfigureRefLevels", as_real64(low, "low"), as_real64(mid, "mid"),
                   as_real64(high, "high"))

    def self_test(self) -> Tuple[int, str]:
        """The instrument's self-test: (result code, message)."""
        code = ctypes.c_int16()
        msg = ctypes.create_string_buffer(1024)
        self._call("self_test", ctypes.byref(code), msg)
        return code.value, msg.value.decode("utf-8", "replace")

    def error_query(self) -> Tuple[int, str]:
        """The instrument's next error: (code, message)."""
        code = ctypes.c_int32()
        msg = ctypes.create_string_buffer(1024)
        self._call("error_query", ctypes.byref(code), msg)
        return code.value, msg.value.decode("utf-8", "replace")

    def revision_query(self) -> Tuple[str, str]:
        """(driver revision, instrument firmware revision)."""
        driver = ctypes.create_string_buffer(256)
        instr = ctypes.create_string_buffer(256)
        self._call("revision_query", driver, instr)
        return driver.value.decode("utf-8", "replace"), instr.value.decode("utf-8", "replace")

    def __repr__(self) -> str:
        return f"<Scope {'closed' if self.closed else 'session %d' % self._session._vi}>"


def _spec(attribute: Union[str, int]) -> AttributeSpec:
    spec = _BY_CONSTANT.get(attribute) if isinstance(attribute, str) else _BY_ID.get(attribute)
    if spec is None:
        raise invalid(f"{attribute!r} is not an attribute of this driver")
    return spec


# The groups of settings become properties of Scope; root-level attributes too.
# A name Scope already has (a method) keeps its meaning; the attribute stays
# reachable through get_attribute/set_attribute.
for _path, _cls in _GROUPS.items():
    if _path and "." not in _path and not hasattr(Scope, _path):
        setattr(Scope, _path, _child(_cls))
for _s in SPECS:
    if _s.group == "" and _s.scope == "session" and not hasattr(Scope, _s.name):
        setattr(Scope, _s.name, _property(_s))
