"""Signal processing for measurement software, over NumPy arrays.

    import wavkit
    wavkit.spectrum(samples, rate, window="flattop").plot()

Arrays of any shape work: signals lie along `axis`, the last one unless said otherwise. float32 and
complex64 are computed in single precision, everything else in double. Objects of xarray and pandas
keep their coordinates, and tell the rate by them. Any number of threads work at once.

`wavkit.lib` has every function of the library by its own name. `python -m wavkit` is the program.
"""

from __future__ import annotations

from . import lib as lib
from ._files import Signal, read, signals, write
from ._filters import Filter, Response, design, filter, response
from ._fits import Line, Polynomial, fit, fit_polynomial
from ._levels import Levels, levels, octave_bands, weighting
from ._orders import orders, over_angle
from ._rates import Resampler, decimate, resample
from ._record import Error
from ._sections import SectionResponse, ZerosPoles, design_iir, design_zpk, response_iir, zero_phase
from ._signals import Correlation, analytic, correlate, derive, edges, envelope, integrate, interp
from ._smooth import replace_outliers, smooth
from ._spectra import (
    Frames,
    Peaks,
    Spectrogram,
    Spectrum,
    average,
    istft,
    spectrogram,
    spectrum,
    stft,
)
from ._statistics import Histogram, Stats, from_roots, hist, roots, stats
from ._tones import Distortion, SignalPeaks, Sine, distortion, fit_sine, peaks
from ._transfer import Transfer, TransferMeter, transfer
from ._version import version as __version__
from ._windows import coherent_gain, noise_bandwidth, window, windows
from ._zoom import Goertzel, Zoom, czt, goertzel, zoom

__all__ = [
    "Correlation",
    "Distortion",
    "Error",
    "Filter",
    "Frames",
    "Goertzel",
    "Histogram",
    "Levels",
    "Line",
    "Peaks",
    "Polynomial",
    "Resampler",
    "Response",
    "SectionResponse",
    "Signal",
    "SignalPeaks",
    "Sine",
    "Spectrogram",
    "Spectrum",
    "Stats",
    "Transfer",
    "TransferMeter",
    "ZerosPoles",
    "Zoom",
    "analytic",
    "average",
    "coherent_gain",
    "correlate",
    "czt",
    "decimate",
    "derive",
    "design",
    "design_iir",
    "design_zpk",
    "distortion",
    "edges",
    "envelope",
    "filter",
    "fit",
    "fit_polynomial",
    "fit_sine",
    "from_roots",
    "goertzel",
    "hist",
    "integrate",
    "interp",
    "istft",
    "levels",
    "lib",
    "noise_bandwidth",
    "octave_bands",
    "orders",
    "over_angle",
    "peaks",
    "read",
    "replace_outliers",
    "resample",
    "response",
    "response_iir",
    "roots",
    "signals",
    "smooth",
    "spectrogram",
    "spectrum",
    "stats",
    "stft",
    "transfer",
    "weighting",
    "window",
    "windows",
    "write",
    "zero_phase",
    "zoom",
]
