"""The driver's enumerations as Python enumerations, built from its tables.

Each is an `enum.IntEnum` (an `enum.IntFlag` when its values are single bits
meant to be combined) whose values are the driver's own numbers.
"""
import enum

from ._tables import ENUMERATIONS


def _make(name, members):
    values = [v for _, v in members]
    flags = len(values) > 2 and all(v > 0 and v & (v - 1) == 0 for v in values)
    base = enum.IntFlag if flags else enum.IntEnum
    cls = base(name, list(members), module=__name__)
    cls.__doc__ = f"The driver's {name} values."
    return cls


BY_NAME = {name: _make(name, members) for name, members in ENUMERATIONS.items()}
globals().update(BY_NAME)
__all__ = sorted(BY_NAME)
