"""dsps_peaks() beside find_peaks() of SciPy on random signals: equal to the last bit.

Called with the library; the exit status is 77 where there is no SciPy."""
import ctypes
import sys

try:
    import numpy
    from scipy.signal import find_peaks
except ImportError as missing:
    print(f"no comparison with SciPy: {missing}")
    sys.exit(77)

VALUES = 10
INDEX, HEIGHT, PROMINENCE, LEFT_BASE, RIGHT_BASE, WIDTH, LEFT, RIGHT = range(8)


class Record(ctypes.Structure):
    _fields_ = [("delta", ctypes.c_double), ("data", ctypes.POINTER(ctypes.c_double)),
                ("alloc", ctypes.c_int), ("points", ctypes.c_int), ("complex", ctypes.c_int),
                ("extra", ctypes.c_uint64)]


library = ctypes.CDLL(sys.argv[1])
library.dsps_peaks.argtypes = 2 * [ctypes.POINTER(Record)] + 6 * [ctypes.c_double]
library.dsp_destroy.argtypes = [ctypes.POINTER(Record)]


def rows(x, conditions, rel_height):
    data = x.ctypes.data_as(ctypes.POINTER(ctypes.c_double))
    signal, out = Record(1, data, 0, len(x), 0, 0), Record(delta=1)
    given = [conditions.get(name, float("nan"))
             for name in ("height", "threshold", "distance", "prominence", "width")]
    assert library.dsps_peaks(signal, out, *given, rel_height) == 0
    table = numpy.array(out.data[:out.points]).reshape(-1, VALUES)
    library.dsp_destroy(out)
    return table


random = numpy.random.default_rng(5)
compared = 0
for n in (3, 10, 100, 1000, 20000):
    walk = numpy.cumsum(random.normal(size=n))
    ringing = numpy.sin(numpy.arange(n) / 7) + 0.3 * random.normal(size=n)
    for x in (random.normal(size=n), walk, ringing, numpy.round(random.normal(size=n))):
        for rel_height in (0.5, 0.95):
            for conditions in ({}, {"height": 0.2}, {"threshold": 0.4}, {"prominence": 0.8},
                               {"width": 2.5}, {"distance": 4}, {"distance": 55.5},
                               {"height": 0.1, "threshold": 0.05, "distance": 3,
                                "prominence": 0.5, "width": 1.2}):
                # Among equal heights SciPy lets its sort choose which one takes the others away.
                if "distance" in conditions and len(set(x)) < n:
                    continue
                asked = {"prominence": 0, "width": 0, "height": -numpy.inf, **conditions}
                at, of = find_peaks(x, rel_height=rel_height, **asked)
                got = rows(numpy.ascontiguousarray(x, dtype=float), conditions, rel_height)
                want = {INDEX: at, HEIGHT: of["peak_heights"], PROMINENCE: of["prominences"],
                        LEFT_BASE: of["left_bases"], RIGHT_BASE: of["right_bases"],
                        WIDTH: of["widths"], LEFT: of["left_ips"], RIGHT: of["right_ips"]}
                for column, values in want.items():
                    assert numpy.array_equal(got[:, column], values), (n, conditions, column)
                compared += len(at)
print(f"{compared} peaks are those of SciPy")
