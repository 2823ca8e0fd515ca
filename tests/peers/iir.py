"""Recursive filters beside SciPy's: designs, sosfilt(), sosfiltfilt(), responses and delays.

Called with the library; the exit status is 77 where there is no SciPy."""
import ctypes
import itertools
import sys

try:
    import numpy
    from scipy import signal
except ImportError as missing:
    print(f"no comparison with SciPy: {missing}")
    sys.exit(77)

BANDS = ["bandpass", "bandstop", "highpass", "lowpass"]
BESSEL = {4: "mag", 5: "phase", 6: "delay"}
DESIGNS = ["butter", "cheby1", "cheby2", "elliptic", *BESSEL.values()]


class Record(ctypes.Structure):
    _fields_ = [("delta", ctypes.c_double), ("data", ctypes.POINTER(ctypes.c_double)),
                ("alloc", ctypes.c_int), ("points", ctypes.c_int), ("complex", ctypes.c_int),
                ("extra", ctypes.c_uint64)]

    def take(self):
        """The samples, copied; the record is released."""
        values = numpy.array(self.data[:self.points * (2 if self.complex else 1)])
        is_complex = self.complex
        library.dsp_destroy(self)
        return values.view(complex) if is_complex else values


library = ctypes.CDLL(sys.argv[1])
pointer = ctypes.POINTER(Record)
for name in ("dspc_iir", "dspc_iir_zpk"):
    getattr(library, name).argtypes = [pointer] + 3 * [ctypes.c_int] + 4 * [ctypes.c_double]
library.dspd_iir.argtypes = 4 * [pointer]
library.dspd_iir_zero_phase.argtypes = 3 * [pointer] + [ctypes.c_int]
library.dspc_iir_response.argtypes = library.dspc_iir_delay.argtypes = 3 * [pointer]
library.dspc_iir_state.argtypes = 2 * [pointer]
library.dsp_destroy.argtypes = [pointer]


def lend(x):
    data = x.ctypes.data_as(ctypes.POINTER(ctypes.c_double))
    return Record(1, data, 0, x.shape[0], x.dtype.kind == "c", 0)


def designed(function, *parameters):
    out = Record(delta=1)
    assert function(out, *parameters) == 0, parameters
    return out.take()


def scipy_design(design, band, order, edges, ripple, attenuation, output):
    wn = 2 * numpy.array(edges if len(edges) > 1 else edges[0])
    if design in BESSEL:
        return signal.bessel(order, wn, BANDS[band], output=output, norm=BESSEL[design])
    if design == 0:
        return signal.butter(order, wn, BANDS[band], output=output)
    if design == 1:
        return signal.cheby1(order, ripple, wn, BANDS[band], output=output)
    if design == 2:
        return signal.cheby2(order, attenuation, wn, BANDS[band], output=output)
    return signal.ellip(order, ripple, attenuation, wn, BANDS[band], output=output)


def farthest(found, wanted):
    """Of sets of roots, the greatest distance from one to the nearest of the others."""
    assert len(found) == len(wanted)
    apart = abs(numpy.subtract.outer(found, wanted))
    return max(apart.min(0).max(), apart.min(1).max())


def normalised(sections):
    """Sections that begin with 1, in an order that does not go by the last digits."""
    rows = sections.reshape(-1, 6) / 1
    rows[:, :3] /= rows[:, :1]
    return rows[numpy.lexsort(rows[:, 4:].T.round(6))]


def compare_designs():
    """Zeros, poles and gain to 1e-12, but for elliptic filters of order 20: SciPy's own are off by
    more, since so many digits cancel in what it solves."""
    count = 0
    cases = itertools.product(range(len(DESIGNS)), range(4), (1, 2, 3, 4, 5, 8, 13, 20),
                              ((0.1, 0.2), (0.001, 0.003), (0.3, 0.45)), ((0.1, 40), (2, 50)))
    for design, band, order, edges, ripples in cases:
        if design == 3 and order == 20:
            continue
        edges = edges if band < 2 else edges[:1]
        asked = (design, band, order, edges[0], edges[-1], *ripples)
        count += 1
        z, p, k = scipy_design(design, band, order, edges, *ripples, "zpk")
        zpk = designed(library.dspc_iir_zpk, *asked)
        n = (len(zpk) - 1) // 2
        assert farthest(zpk[1:n + 1], z) < 1e-12, asked
        assert farthest(zpk[n + 1:], p) < 1e-12, asked
        assert abs(zpk[0] / k - 1) < 1e-12, asked
        # (Of an odd number SciPy pairs the zero at 0 that it has added, too.)
        if n % 2:
            continue
        ours = normalised(designed(library.dspc_iir, *asked))
        theirs = normalised(signal.zpk2sos(z, p, k).ravel())
        assert numpy.allclose(ours, theirs, rtol=0, atol=4e-12), asked
    for f, q in ((0.1, 30), (0.01, 5), (0.4, 0.9)):
        for design, made in ((7, signal.iirnotch), (8, signal.iirpeak)):
            b, a = made(2 * f, q)
            row = designed(library.dspc_iir, design, 0, 1, f, f / q, 0, 0)
            assert numpy.allclose(row, [*b, *a], rtol=0, atol=1e-13), (design, f, q)
            count += 1
    print(f"{count} designs are those of SciPy")


def filtered(x, sos, state=None):
    out = Record(delta=1)
    assert library.dspd_iir(lend(x), out, lend(sos), state) == 0
    return out.take()


def compare_filters():
    random = numpy.random.default_rng(7)
    cases = itertools.product((1, 2, 3, 4, 6, 9, 16, 20), range(4), (1, 7, 4000))
    for order, band, n in cases:
        edges = (0.11, 0.23) if band < 2 else (0.11,)
        table = scipy_design(3, band, order, edges, 0.5, 60, "sos")
        sos = numpy.ascontiguousarray(table.ravel())
        real = random.normal(size=n) + 3
        settled = Record(delta=1)
        assert library.dspc_iir_state(settled, lend(sos)) == 0
        for x in (real, real + 1j * random.normal(size=n)):
            size = abs(x).max()
            assert numpy.allclose(filtered(x, sos), signal.sosfilt(table, x), rtol=0,
                                  atol=1e-11 * size)
            started, _ = signal.sosfilt(table, x, zi=x[0] * signal.sosfilt_zi(table))
            start = lend(x[0] * numpy.array(settled.data[:settled.points]))
            assert numpy.allclose(filtered(x, sos, start), started, rtol=0, atol=1e-11 * size)
            extension = -1 if n == 4000 else n - 1
            out = Record(delta=1)
            assert library.dspd_iir_zero_phase(lend(x), out, lend(sos), extension) == 0
            wanted = signal.sosfiltfilt(table, x, padlen=None if extension < 0 else extension)
            assert numpy.allclose(out.take(), wanted, rtol=0, atol=1e-11 * size), (order, band, n)
        library.dsp_destroy(settled)
        at = numpy.linspace(0.001, 0.499, 300)
        _, gain = signal.sosfreqz(table, 2 * numpy.pi * at)
        out = Record(delta=1)
        assert library.dspc_iir_response(out, lend(sos), lend(at)) == 0
        assert numpy.allclose(out.take(), gain, rtol=0, atol=1e-11)
        out = Record(delta=1)
        assert library.dspc_iir_delay(out, lend(sos), lend(at)) == 0
        wanted = sum(signal.group_delay((row[:3], row[3:]), 2 * numpy.pi * at)[1] for row in table)
        # Beside a zero both delays are those of the rounding that has moved it off the circle.
        apart = abs(out.take() - wanted)[abs(gain) > 1e-3]
        assert apart.max() < 1e-9 * wanted.max(), (order, band)
    print("filters, states, responses and delays are those of SciPy")


compare_designs()
compare_filters()
