"""Python access to the Quorlen731XX oscilloscope driver.

    import quorlen731xx as qn
    with qn.Scope("TCPIP0::192.0.2.10::5025::SOCKET", id_query=True) as scope:
        scope.channels["Channel1"].range = 4.0
        scope.acquisition.time_per_record = 1e-3
        wave = scope.measurements["Channel1"].read_waveform(max_time=2.0)
        print(wave.y.mean(), scope.measurements["Channel1"].fetch_measurement(
            qn.Measurement.FREQUENCY))

The package calls the driver's C API (libquorlen731xx.so, found through the
argument `library`, the environment variable QN731XX_LIBRARY or the system's
library path) with ctypes; waveforms are numpy arrays.
"""
from .enums import *  # noqa: F401,F403  (the driver's enumerations)
from .enums import __all__ as _enum_names
from .errors import (DriverError, DriverTimeoutError, DriverWarning, InvalidValueError,
                     NotSupportedError, SessionClosedError)
from .scope import Channel, Collection, DigitalChannel, Measurement as MeasurementSource, Scope
from .waveform import MinMaxWaveform, Waveform

__version__ = "0.1.0"
__all__ = ["Scope", "Channel", "DigitalChannel", "MeasurementSource", "Collection", "Waveform",
           "MinMaxWaveform", "DriverError", "DriverTimeoutError", "InvalidValueError",
           "NotSupportedError", "SessionClosedError", "DriverWarning"] + list(_enum_names)
