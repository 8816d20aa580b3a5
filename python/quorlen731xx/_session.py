"""One C API session: status checking, error texts and typed attribute access."""
from __future__ import annotations

import ctypes
import enum
import operator
import threading
import warnings
from typing import Any, Optional

from . import _library
from ._tables import STATUSES
from .errors import DriverWarning, InvalidValueError, NotSupportedError, SessionClosedError
from .errors import error_for

INT32_MIN, INT32_MAX = -(1 << 31), (1 << 31) - 1
TEXT_LIMIT = 1 << 24  # no text result is this long; warning statuses are larger
_INVALID_VALUE = STATUSES["IVI_ERROR_INVALID_VALUE"]
_INVALID_SESSION = STATUSES["QN731XX_ERROR_INVALID_SESSION"]
_FUNCTION_NOT_SUPPORTED = STATUSES["IVI_ERROR_FUNCTION_NOT_SUPPORTED"]


class Session:
    """A session handle and the library it belongs to."""

    def __init__(self, lib: _library.Library, vi: int):
        self.lib = lib
        self._vi: Optional[int] = vi
        self._close_lock = threading.Lock()

    # -- handles and statuses ------------------------------------------------

    @property
    def vi(self) -> int:
        vi = self._vi
        if vi is None:
            raise SessionClosedError(_INVALID_SESSION, "Quorlen731XX: the scope is closed.")
        return vi

    @property
    def closed(self) -> bool:
        return self._vi is None

    def close(self) -> None:
        with self._close_lock:
            vi, self._vi = self._vi, None
        if vi is not None:
            self.check(self.lib.close(vi), vi)

    def function(self, name: str):
        fn = getattr(self.lib, name, None)
        if fn is None:
            raise NotSupportedError(_FUNCTION_NOT_SUPPORTED,
                                    f"Quorlen731XX: this library has no Qn731XX_{name}.")
        return fn

    def error_text(self, vi: int, status: int) -> str:
        """The description recorded with the failure, else the status's text."""
        # Reading the record clears it, so one generous buffer is used; a longer
        # description is cut to its size.
        code = ctypes.c_int32()
        buf = ctypes.create_string_buffer(4096)
        self.lib.GetError(vi, ctypes.byref(code), 4096, buf)
        text = buf.value.decode("utf-8", "replace")
        if not text or code.value != status:
            msg = ctypes.create_string_buffer(256)
            self.lib.error_message(vi, status, msg)
            text = msg.value.decode("utf-8", "replace") or text
        return text or f"Quorlen731XX: status 0x{status & 0xFFFFFFFF:08X}."

    def check(self, status: int, vi: Optional[int] = None) -> int:
        """Raises the driver's error for a negative status; warns for a positive one."""
        if status < 0:
            if self._vi is None:
                # Closed by another thread while this call ran: whatever the
                # driver answered, the reason is the close.
                raise SessionClosedError(status, "Quorlen731XX: the scope was closed during "
                                         "the call.")
            raise error_for(status, self.error_text(self.vi if vi is None else vi, status))
        if status > 0:
            msg = ctypes.create_string_buffer(256)
            self.lib.error_message(self.vi if vi is None else vi, status, msg)
            warnings.warn(DriverWarning(status, msg.value.decode("utf-8", "replace")),
                          stacklevel=3)
        return status

    def read_text(self, fn, *args) -> str:
        """Calls a function that fills a text buffer, growing it when it is too small."""
        size = 256
        while True:
            buf = ctypes.create_string_buffer(size)
            status = fn(self.vi, *args, size, buf)
            # A positive return is the size needed, unless it is a warning status
            # (those are far larger than any text).
            if status <= size or status >= TEXT_LIMIT:
                self.check(status)
                return buf.value.decode("utf-8", "replace")
            size = status


def invalid(detail: str) -> InvalidValueError:
    return InvalidValueError(_INVALID_VALUE, f"Quorlen731XX: Invalid value: {detail}")


def as_int32(value: Any, what: str) -> int:
    """An integral value within ViInt32; floats are refused rather than truncated."""
    if isinstance(value, enum.Enum) and not isinstance(value, int):
        raise invalid(f"{what} needs an integer, not {value!r}")
    try:
        number = operator.index(value)
    except TypeError:
        raise invalid(f"{what} needs an integer, not {type(value).__name__} {value!r}") from None
    if not INT32_MIN <= number <= INT32_MAX:
        raise invalid(f"{what} = {number} is outside the 32-bit integer range")
    return number


def as_real64(value: Any, what: str) -> float:
    if isinstance(value, (str, bytes, bytearray)) or value is None:
        raise invalid(f"{what} needs a number, not {type(value).__name__} {value!r}")
    try:
        return float(value)
    except (TypeError, ValueError):
        raise invalid(f"{what} needs a number, not {type(value).__name__} {value!r}") from None


def as_boolean(value: Any, what: str) -> int:
    if isinstance(value, bool) or type(value).__name__ == "bool_":
        return 1 if value else 0
    if isinstance(value, int) and not isinstance(value, enum.Enum) and value in (0, 1):
        return value
    raise invalid(f"{what} needs True or False, not {type(value).__name__} {value!r}")


def as_text(value: Any, what: str) -> bytes:
    if not isinstance(value, str):
        raise invalid(f"{what} needs a str, not {type(value).__name__} {value!r}")
    data = value.encode("utf-8")
    if b"\0" in data:
        raise invalid(f"{what} contains a NUL character")
    return data


class AttributeSpec:
    """One attribute of the driver: its ID, C type, access and enumeration."""

    __slots__ = ("constant", "id", "key", "scope", "ctype", "readable", "writable", "enum",
                 "group", "name")

    def __init__(self, row, enum_class):
        (self.constant, self.id, self.key, self.scope, self.ctype, self.readable,
         self.writable, _enum_name, self.group, self.name) = row
        self.enum = enum_class

    def getter(self):
        """A property getter for objects with `_session` and `_selectors`: the hot
        path of a property read, with as little Python as possible."""
        if self.ctype == "ViString":
            return lambda obj: self.get(obj._session, obj._selectors[self.scope])
        ident, scope, enum_class = self.id, self.scope, self.enum
        out_type = {"ViInt32": ctypes.c_int32, "ViReal64": ctypes.c_double,
                    "ViBoolean": ctypes.c_uint16}[self.ctype]
        boolean = self.ctype == "ViBoolean"
        byref = ctypes.byref
        slow = self.get
        # value -> member; a value the table does not name stays an int
        members = {int(m): m for m in enum_class} if enum_class is not None else None

        def fget(obj):
            session = obj._session
            vi = session._vi
            fn = session.lib.fast.get(self.ctype)
            if vi is None or fn is None:
                return slow(session, obj._selectors[scope])
            out = out_type()
            status = fn(vi, obj._selectors[scope], ident, byref(out))
            if status:
                session.check(status, vi)
            if boolean:
                return bool(out.value)
            if members is not None:
                return members.get(out.value, out.value)
            return out.value

        return fget

    def get(self, session: Session, selector: bytes) -> Any:
        vi = session.vi
        lib = session.lib
        t = self.ctype
        if t == "ViReal64":
            out = ctypes.c_double()
            status = lib.GetAttributeViReal64(vi, selector, self.id, ctypes.byref(out))
        elif t == "ViInt32":
            out = ctypes.c_int32()
            status = lib.GetAttributeViInt32(vi, selector, self.id, ctypes.byref(out))
        elif t == "ViBoolean":
            out = ctypes.c_uint16()
            status = lib.GetAttributeViBoolean(vi, selector, self.id, ctypes.byref(out))
        else:
            return session.read_text(lib.GetAttributeViString, selector, self.id)
        if status:
            session.check(status, vi)
        value = out.value
        if t == "ViBoolean":
            return bool(value)
        if self.enum is not None:
            try:
                return self.enum(value)
            except ValueError:
                return value  # a value this package's table does not name
        return value

    def set(self, session: Session, selector: bytes, value: Any) -> None:
        what = self.name
        t = self.ctype
        lib = session.lib
        if t == "ViReal64":
            status = lib.SetAttributeViReal64(session.vi, selector, self.id, as_real64(value, what))
        elif t == "ViInt32":
            if self.enum is not None and isinstance(value, enum.Enum) and \
                    not isinstance(value, self.enum):
                raise invalid(f"{what} needs a {self.enum.__name__}, not {value!r}")
            status = lib.SetAttributeViInt32(session.vi, selector, self.id, as_int32(value, what))
        elif t == "ViBoolean":
            status = lib.SetAttributeViBoolean(session.vi, selector, self.id,
                                               as_boolean(value, what))
        else:
            status = lib.SetAttributeViString(session.vi, selector, self.id, as_text(value, what))
        if status:
            session.check(status)
