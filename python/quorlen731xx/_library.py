"""Loading libquorlen731xx.so and declaring the C functions the package calls."""
from __future__ import annotations

import ctypes
import ctypes.util
import os
import threading
from ctypes import POINTER, c_char_p, c_double, c_int16, c_int32, c_uint16, c_uint32, c_void_p
from typing import Optional

ViSession = c_uint32
ViStatus = c_int32
ViInt32 = c_int32
ViReal64 = c_double
ViBoolean = c_uint16
ViAttr = c_uint32
_S = c_char_p      # ViConstString / ViChar[]
_P = c_void_p      # arrays, passed as addresses
_I = POINTER(c_int32)
_D = POINTER(c_double)
_B = POINTER(c_uint16)

# name -> argument types; every function returns a ViStatus. A function the
# loaded library lacks is left out and raises NotSupportedError when called.
PROTOTYPES = {
    "Qn731XX_InitWithOptions": (_S, ViBoolean, ViBoolean, _S, POINTER(ViSession)),
    "Qn731XX_close": (ViSession,),
    "Qn731XX_LockSession": (ViSession, _B),
    "Qn731XX_UnlockSession": (ViSession, _B),
    "Qn731XX_GetError": (ViSession, _I, ViInt32, _S),
    "Qn731XX_error_message": (ViSession, ViStatus, _S),
    "Qn731XX_GetAttributeViInt32": (ViSession, _S, ViAttr, _I),
    "Qn731XX_GetAttributeViReal64": (ViSession, _S, ViAttr, _D),
    "Qn731XX_GetAttributeViBoolean": (ViSession, _S, ViAttr, _B),
    "Qn731XX_GetAttributeViString": (ViSession, _S, ViAttr, ViInt32, _S),
    "Qn731XX_SetAttributeViInt32": (ViSession, _S, ViAttr, ViInt32),
    "Qn731XX_SetAttributeViReal64": (ViSession, _S, ViAttr, ViReal64),
    "Qn731XX_SetAttributeViBoolean": (ViSession, _S, ViAttr, ViBoolean),
    "Qn731XX_SetAttributeViString": (ViSession, _S, ViAttr, _S),
    "Qn731XX_GetChannelName": (ViSession, ViInt32, ViInt32, _S),
    "Qn731XX_GetMeasurementName": (ViSession, ViInt32, ViInt32, _S),
    "Qn731XX_GetDigitalChannelName": (ViSession, ViInt32, ViInt32, _S),
    "Qn731XX_ActualRecordLength": (ViSession, _I),
    "Qn731XX_reset": (ViSession,),
    "Qn731XX_self_test": (ViSession, POINTER(c_int16), _S),
    "Qn731XX_error_query": (ViSession, _I, _S),
    "Qn731XX_revision_query": (ViSession, _S, _S),
    "Qn731XX_InitiateAcquisition": (ViSession,),
    "Qn731XX_Abort": (ViSession,),
    "Qn731XX_AutoSetup": (ViSession,),
    "Qn731XX_AcquisitionStatus": (ViSession, _I),
    "Qn731XX_ConfigureAcquisitionRecord": (ViSession, ViReal64, ViInt32, ViReal64),
    "Qn731XX_ConfigureChannel": (ViSession, _S, ViReal64, ViReal64, ViInt32, ViReal64,
                                 ViBoolean),
    "Qn731XX_FetchWaveform": (ViSession, _S, ViInt32, _P, _I, _D, _D),
    "Qn731XX_ReadWaveform": (ViSession, _S, ViInt32, ViInt32, _P, _I, _D, _D),
    "Qn731XX_FetchMinMaxWaveform": (ViSession, _S, ViInt32, _P, _P, _I, _D, _D),
    "Qn731XX_ReadMinMaxWaveform": (ViSession, _S, ViInt32, ViInt32, _P, _P, _I, _D, _D),
    "Qn731XX_DigitalChannelFetchDigitalWaveform": (ViSession, _S, ViInt32, _P, _I, _D, _D),
    "Qn731XX_DigitalChannelReadDigitalWaveform": (ViSession, _S, ViInt32, ViInt32, _P, _I, _D,
                                                  _D),
    "Qn731XX_FetchWaveformMeasurement": (ViSession, _S, ViInt32, _D),
    "Qn731XX_ReadWaveformMeasurement": (ViSession, _S, ViInt32, ViInt32, _D),
    "Qn731XX_ConfigureRefLevels": (ViSession, ViReal64, ViReal64, ViReal64),
}

_loaded: dict = {}
_lock = threading.Lock()


def library_path(path: Optional[str] = None) -> str:
    """The library to load: `path`, else $QN731XX_LIBRARY, else the system's."""
    if path:
        return os.fspath(path)
    env = os.environ.get("QN731XX_LIBRARY")
    if env:
        return env
    return ctypes.util.find_library("quorlen731xx") or "libquorlen731xx.so"


class Library:
    """The C functions of one loaded driver library (shared by every Scope using it)."""

    def __init__(self, path: str):
        self.path = path
        try:
            self.dll = ctypes.CDLL(path)  # CDLL: the GIL is released during each call
        except OSError as e:
            raise OSError(f"cannot load the driver library {path!r} ({e}); pass library= "
                          "or set QN731XX_LIBRARY to the path of libquorlen731xx.so") from e
        self.missing = set()
        for name, argtypes in PROTOTYPES.items():
            try:
                fn = getattr(self.dll, name)
            except AttributeError:
                self.missing.add(name)
                continue
            fn.argtypes = argtypes
            fn.restype = ViStatus
            setattr(self, name[len("Qn731XX_"):], fn)
        # The typed attribute getters once more without argument conversion, for
        # property reads (every argument is already an int, bytes or a pointer).
        self.fast = {}
        for ctype in ("ViInt32", "ViReal64", "ViBoolean"):
            name = f"Qn731XX_GetAttribute{ctype}"
            if name not in self.missing:
                fn = self.dll[name]  # a new function object, its own argtypes
                fn.restype = ViStatus
                self.fast[ctype] = fn


def load(path: Optional[str] = None) -> Library:
    """Loads the driver library once per path."""
    resolved = library_path(path)
    with _lock:
        lib = _loaded.get(resolved)
        if lib is None:
            lib = _loaded[resolved] = Library(resolved)
        return lib
