"""The components of a spectrum: maxima that are neither side lobes nor within a stronger one's
lobe, placed between bins by the rule that fits the window."""

from __future__ import annotations

import math
from dataclasses import dataclass
from functools import cached_property

import numpy as np

from . import _functions as lib
from ._native import ffi
from ._record import Array, Error, Record, lend


@dataclass(frozen=True)
class Layout:
    """What the bins of a spectrum stand for."""

    samples: int  # measured
    length: int  # of the transform: samples and zeros
    width: float  # of the window in samples, which need not be whole
    window: int
    two_sided: bool
    delta: float  # between bins

    @property
    def origin(self) -> int:
        """The bin of frequency 0."""
        return self.length // 2 if self.two_sided else 0

    @property
    def bins(self) -> int:
        return self.length if self.two_sided else self.length // 2 + 1

    def without_mirror(self) -> list[int]:
        """The bins of a one-sided spectrum that were doubled without standing for a negative
        frequency."""
        if self.two_sided:
            return []
        return [0, self.length // 2] if self.length % 2 == 0 and self.length > 1 else [0]


# By identifier: from the top of the main lobe to its first zero or to -100 dB, in bins.
_HALF_WIDTHS = (
    1,
    2,
    2,
    2,
    3,
    3,
    4,
    5,
    4,
    5,
    6,
    7,
    6,
    7,
    3.2,
    3.6,
    4,
    4.4,
    4.8,
    5.1,
    4,
    4.4,
    4.8,
    2,
)
_FLAT = range(lib.DSP_WINDOW_FLAT4, lib.DSP_WINDOW_P601 + 1)
_NOISE_FLOOR = 1e-11  # rounding noise, beside the strongest bin
_MARGIN = 1.25  # by which a component stands out of what others leak
_MOST_LEAKING = 64


def _vertex(three: Array) -> tuple[float, float]:
    """Height and place, from its middle, of the parabola through three points."""
    with lend(np.ascontiguousarray(three)) as y, Record() as peak:
        lib.dsps_peak(y, peak, lib.DSP_PEAK_PARABOLIC | lib.DSP_PEAK_AT_INDEX, 1)
        height, place = peak.take()
    return float(height), float(place) - 1


def _log_vertex(three: Array) -> tuple[float, float]:
    height, place = _vertex(np.log(np.maximum(three, np.finfo(float).tiny)))
    return math.exp(height), place


def _gauss_pair(bins: Array, magnitudes: Array, at: int) -> tuple[float, float]:
    with lend(np.ascontiguousarray(bins[at - 1 : at + 2])) as y, Record() as peak:
        try:
            lib.dsps_peak(y, peak, lib.DSP_PEAK_GAUSSIAN_CORRECTED | lib.DSP_PEAK_AT_INDEX, 1)
        except Error:
            pass  # the place had to be limited, and is still the best that there is
        height, place = peak.take()
    lower = magnitudes[at - 1] if magnitudes[at - 1] > magnitudes[at + 1] else magnitudes[at]
    return float(height / lower), float(place) - 1


def _refined(layout: Layout, bins: Array, m: Array, at: int) -> tuple[float, float]:
    if at == 0 or at == len(m) - 1:
        return float(m[at]), 0.0
    three = m[at - 1 : at + 2]
    if layout.window == lib.DSP_WINDOW_UNIFORM:
        peak = _vertex(three)
    elif (
        layout.window == lib.DSP_WINDOW_GAUSSTOP
        and layout.length == layout.samples
        and bins.dtype.kind == "c"
    ):
        peak = _gauss_pair(bins.astype("D"), m, at)
    elif layout.window in _FLAT:
        peak = float(m[at]), _log_vertex(three)[1]
    else:
        peak = _log_vertex(three)
    return peak if all(map(math.isfinite, peak)) else (float(m[at]), 0.0)


class _Leakage:
    """What components show in the bins of other maxima, by the transform of the window."""

    FINENESS = 32  # values a bin
    LONGEST = 1 << 14  # longer windows have the same lobes

    def __init__(self, layout: Layout, tops: Array) -> None:
        self.layout = layout
        self.scale = layout.samples / layout.length
        self.components = 0
        self.total: Array = np.zeros(len(tops))
        self._places = tops - layout.origin
        self._highest: dict[int, Array] = {}

    @cached_property
    def lobes(self) -> Array:
        """The magnitude of the transform of the window, by the fraction of a bin."""
        layout = self.layout
        points = min(layout.samples, self.LONGEST)
        width = points - (layout.samples - layout.width)
        flags = lib.DSP_SCALE_NO_ROTATION | (lib.DSP_SCALE_WIDTH if width < points else 0)
        with Record(np.ones(points)) as x:
            lib.dspi_window2(x, layout.window, flags, width)
            lib.dspi_zpad(x, self.FINENESS * points)
            lib.dspi_rdft(x)
            lib.dspi_mag(x)
            lobes: Array = x.take()
        lobes /= lobes[0]
        # The half next to the middle of a shortened window is like that of the whole one.
        return lobes if points == layout.samples else lobes[: len(lobes) // 2]

    @cached_property
    def reach(self) -> float:
        """How far the table goes, in bins."""
        return (len(self.lobes) - 1) / self.FINENESS

    @cached_property
    def decay(self) -> float:
        """The power by which lobes fall beyond the table."""
        ends = np.array([self.reach / 2, self.reach - 1])
        inner, outer = self._within(ends, 1.0)
        return float(np.clip(np.log2(inner / outer), 0, 6)) if outer > 0 else 0.0

    def response(self, bins: Array) -> Array:
        """Between the values of the table."""
        at = np.minimum(bins * self.FINENESS, len(self.lobes) - 1)
        whole = at.astype(int)
        following = self.lobes[np.minimum(whole + 1, len(self.lobes) - 1)]
        result: Array = self.lobes[whole] + (at - whole) * (following - self.lobes[whole])
        return result

    def highest(self, count: int) -> Array:
        """The highest of so many values, from each of the table on."""
        if count not in self._highest:
            points, width = len(self.lobes), 1
            highest: Array = np.pad(self.lobes, (0, count - 1), mode="edge")
            while 2 * width <= count:
                highest = np.maximum(highest[:-width], highest[width:])
                width *= 2
            self._highest[count] = np.maximum(highest[:points], highest[count - width :][:points])
        return self._highest[count]

    def near(self, bins: Array, blur: float) -> Array:
        """The highest response about places. Far out, lobes repeat from bin to bin, those of a
        triangle every other bin, and fall."""
        beyond = bins > self.reach
        if not beyond.any():
            return self._within(bins, blur)
        same = math.floor(self.reach / 2 - 1) * 2 + bins % 2
        fall = np.where(beyond, (self.reach / np.maximum(bins, 1)) ** self.decay, 1)
        result: Array = self._within(np.where(beyond, same, bins), blur) * fall
        return result

    def _within(self, bins: Array, blur: float) -> Array:
        low, high = np.maximum(bins - blur, 0), bins + blur
        first = np.ceil(low * self.FINENESS).astype(int)
        counts = np.ceil(high * self.FINENESS).astype(int) - first
        first = np.minimum(first, len(self.lobes) - 1)
        result: Array = np.maximum(self.response(low), self.response(high))
        for count in np.unique(counts[counts > 0]):
            here = counts == count
            result[here] = np.maximum(result[here], self.highest(int(count))[first[here]])
        result[bins <= blur] = 1
        return result

    def add(self, m: Array, at: int) -> None:
        """Places a component by the bins on either side: as the higher one grows beside the top,
        the top comes near."""
        length = self.layout.length

        def value(i: int) -> float:
            i %= length
            return float(m[i] if i < len(m) else m[length - i])

        aside = max(1, int(1 / self.scale))
        top, left, right = value(at), value(at - aside), value(at + aside)
        offsets = np.linspace(0, 0.5, 257)
        tops = self.response(offsets * self.scale)
        nearer = self.response((aside - offsets) * self.scale) / tops
        farther = self.response((aside + offsets) * self.scale) / tops
        offset = float(np.interp(max(left, right) / top, nearer, offsets))
        doubt = abs(float(np.interp(offset, offsets, nearer)) - max(left, right) / top)
        doubt += abs(float(np.interp(offset, offsets, farther)) - min(left, right) / top)
        # The lobe of a flat window does not tell the place at all.
        flat = self.lobes[self.FINENESS // 2] > 0.9
        blur = 0.5 if flat else min(2 * doubt + 1e-4, 0.5)
        place = at - self.layout.origin + (offset if right >= left else -offset)
        height = top / float(np.interp(offset, offsets, tops))
        mirrored = not self.layout.two_sided and at not in self.layout.without_mirror()
        for source in (place, -place) if mirrored else (place,):
            apart = np.abs(self._places - source)
            apart = np.minimum(apart, length - apart) * self.scale
            self.total += height * self.near(apart, blur)
        self.components += 1


def find_peaks(
    layout: Layout, bins: Array, magnitudes: Array, count: int, band: tuple[float, float]
) -> list[tuple[float, float]]:
    """Frequency and amplitude of the strongest components, the strongest first."""
    m = np.asarray(magnitudes, float)
    padded: Array = np.pad(m, 1, constant_values=-1.0)
    is_top = (m > padded[:-2]) & (m >= padded[2:]) & (m > 0) & np.isfinite(m)
    if not layout.two_sided:
        is_top[0] = False
    tops = np.flatnonzero(is_top)
    tops = tops[np.argsort(-m[tops], kind="stable")]
    tops = tops[m[tops] >= _NOISE_FLOOR * m[tops[:1]]]
    frequencies = (tops - layout.origin) * layout.delta
    wanted = (band[0] <= frequencies) & (frequencies <= band[1])
    lobe = _HALF_WIDTHS[layout.window] * layout.length / layout.samples
    reach = max(math.ceil(lobe) - 1, 0)
    leakage = _Leakage(layout, tops)
    if not layout.two_sided and len(m) > 1 and m[0] > 0.95 * m[1]:
        leakage.add(m, 0)
    found: list[tuple[float, float]] = []
    free = np.ones(len(tops), bool)  # neither looked at nor in the lobe of a stronger one
    while len(found) < count:
        leaks = leakage.components < _MOST_LEAKING
        candidates = free & (leaks | wanted) & (m[tops] > _MARGIN * leakage.total)
        if not candidates.any():
            break
        at = int(candidates.argmax())
        top = int(tops[at])
        if wanted[at]:
            height, offset = _refined(layout, bins, m, top)
            share = 0.5 if top in layout.without_mirror() else 1.0
            found.append((float(frequencies[at]) + offset * layout.delta, height * share))
        if leaks and len(found) < count:
            leakage.add(m, top)
        free &= np.abs(tops - top) > reach
        free[: at + 1] = False
    return sorted(found, key=lambda peak: -peak[1])


def noise_bandwidth_of(layout: Layout) -> float:
    """That of the window, in units of the frequency."""
    value = ffi.new("double *")
    lib.dsp_window_enbw(value, layout.window, layout.samples)
    return float(value[0]) * layout.delta * layout.length / layout.width
