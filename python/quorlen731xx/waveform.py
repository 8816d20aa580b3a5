"""Waveform results and the arrays they are read into."""
from __future__ import annotations

from typing import Optional

import numpy as np

from ._session import INT32_MAX, invalid


class Waveform:
    """A record of points: `y` (a float64 array, or uint8 pod bytes for digital
    channels), the time of the first point `initial_x` and the time between
    points `x_increment`, both in seconds.

    `numpy.asarray(waveform)` and `len(waveform)` work on `y`; `time` gives the
    time of every point.
    """

    __slots__ = ("y", "initial_x", "x_increment")

    def __init__(self, y: np.ndarray, initial_x: float, x_increment: float):
        self.y = y
        self.initial_x = initial_x
        self.x_increment = x_increment

    @property
    def time(self) -> np.ndarray:
        """The time of each point: initial_x + i * x_increment."""
        return self.initial_x + np.arange(len(self.y), dtype=np.float64) * self.x_increment

    def __array__(self, dtype=None, copy=None):
        y = self.y if dtype is None else self.y.astype(dtype, copy=False)
        return y.copy() if copy else y

    def __len__(self) -> int:
        return len(self.y)

    def __repr__(self) -> str:
        return (f"Waveform({len(self.y)} points, initial_x={self.initial_x!r}, "
                f"x_increment={self.x_increment!r})")


class MinMaxWaveform:
    """A min/max record: `min` and `max` arrays of float64 with `initial_x`,
    `x_increment` and `time` as for Waveform."""

    __slots__ = ("min", "max", "initial_x", "x_increment")

    def __init__(self, mins: np.ndarray, maxs: np.ndarray, initial_x: float, x_increment: float):
        self.min = mins
        self.max = maxs
        self.initial_x = initial_x
        self.x_increment = x_increment

    @property
    def time(self) -> np.ndarray:
        return self.initial_x + np.arange(len(self.min), dtype=np.float64) * self.x_increment

    def __len__(self) -> int:
        return len(self.min)

    def __repr__(self) -> str:
        return (f"MinMaxWaveform({len(self.min)} points, initial_x={self.initial_x!r}, "
                f"x_increment={self.x_increment!r})")


def target(out: Optional[np.ndarray], size: int, dtype, name: str = "out") -> np.ndarray:
    """The array a record is converted into: `out` itself after checking it can be
    written in place, else a new array of `size` elements."""
    if out is None:
        return np.empty(max(int(size), 0), dtype=dtype)
    if not isinstance(out, np.ndarray):
        raise invalid(f"{name} must be a numpy.ndarray, not {type(out).__name__}")
    if out.dtype != np.dtype(dtype):
        raise invalid(f"{name} must have dtype {np.dtype(dtype).name}, not {out.dtype.name}")
    if out.ndim != 1 or not out.flags.c_contiguous:
        raise invalid(f"{name} must be a contiguous one-dimensional array")
    if not out.flags.writeable:
        raise invalid(f"{name} is read-only")
    return out


def capacity(array: np.ndarray) -> int:
    """How many points the driver may write into an array (at most ViInt32's maximum)."""
    return min(array.shape[0], INT32_MAX)
