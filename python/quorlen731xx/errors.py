"""Exceptions carrying the driver's status and message text."""
from __future__ import annotations

from ._tables import STATUSES

STATUS_NAMES = {value: name for name, value in STATUSES.items()}


class DriverError(Exception):
    """A call the driver refused or that failed.

    `status` is the C API's ViStatus (negative), `message` the driver's own
    description of the failure and `status_name` the status's constant name
    (or None for a status the header does not name).
    """

    def __init__(self, status: int, message: str):
        super().__init__(status, message)
        self.status = status
        self.message = message
        self.status_name = STATUS_NAMES.get(status)

    def __str__(self) -> str:
        code = f"0x{self.status & 0xFFFFFFFF:08X}"
        name = f" {self.status_name}" if self.status_name else ""
        return f"{self.message} [{code}{name}]"


class DriverTimeoutError(DriverError, TimeoutError):
    """The instrument did not answer in time, or an acquisition did not end
    within the maximum time."""


class InvalidValueError(DriverError, ValueError, TypeError):
    """A value the driver refuses, or one that cannot be converted to the
    attribute's or parameter's C type."""


class NotSupportedError(DriverError):
    """A function, attribute or value this instrument or driver does not support."""


class SessionClosedError(DriverError):
    """The scope was closed (or its session is no longer valid)."""


class DriverWarning(UserWarning):
    """A call succeeded with a warning status; `status` and `message` as for DriverError."""

    def __init__(self, status: int, message: str):
        super().__init__(message)
        self.status = status
        self.message = message


_CLASSES = {
    DriverTimeoutError: ("QN731XX_ERROR_IO_TIMEOUT", "QN731XX_ERROR_MAX_TIME_EXCEEDED",
                         "IVISCOPE_ERROR_MAX_TIME_EXCEEDED"),
    InvalidValueError: ("IVI_ERROR_INVALID_VALUE", "IVI_ERROR_BAD_OPTION_NAME",
                        "IVI_ERROR_BAD_OPTION_VALUE", "IVI_ERROR_MISSING_OPTION_NAME",
                        "IVI_ERROR_MISSING_OPTION_VALUE", "IVI_ERROR_TYPES_DO_NOT_MATCH"),
    NotSupportedError: ("IVI_ERROR_FUNCTION_NOT_SUPPORTED", "IVI_ERROR_ATTRIBUTE_NOT_SUPPORTED",
                        "IVI_ERROR_VALUE_NOT_SUPPORTED", "QN731XX_ERROR_PROPERTY_NOT_SUPPORTED",
                        "QN731XX_ERROR_MODEL_NOT_SUPPORTED"),
    SessionClosedError: ("QN731XX_ERROR_INVALID_SESSION",),
}
ERROR_CLASS = {STATUSES[name]: cls for cls, names in _CLASSES.items()
               for name in names if name in STATUSES}


def error_for(status: int, message: str) -> DriverError:
    """The exception of a failing status."""
    return ERROR_CLASS.get(status, DriverError)(status, message)
