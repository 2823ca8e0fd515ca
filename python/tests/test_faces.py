"""What the functions compute, beside SciPy and NumPy."""

import dataclasses
import json
import subprocess

import numpy as np
import pytest
import scipy.interpolate
import scipy.ndimage
import scipy.optimize
import scipy.signal
import scipy.stats
import wavkit
from wavkit.__main__ import program

RATE = 1000.0
T = np.arange(3000) / RATE
RNG = np.random.default_rng(3)
NOISE = RNG.normal(size=3000)
TONES = 2 * np.sin(2 * np.pi * 50.3 * T + 0.4) + 0.01 * np.sin(2 * np.pi * 220.7 * T)
COMPLEX = NOISE + 1j * RNG.normal(size=3000)


def close(actual, expected, tolerance=1e-10):
    scale = np.max(np.abs(expected), initial=1e-300)
    assert np.shape(actual) == np.shape(expected)
    np.testing.assert_allclose(actual, expected, atol=tolerance * scale, rtol=0)


@pytest.mark.parametrize("window", ["hann", "Blackman_Harris4", "flattop", "kaiser90", "uniform"])
def test_spectrum_at_any_length(window):
    w = wavkit.window(window, 3000, scale="mean")
    expected = 2 * np.fft.rfft(NOISE * w) / 3000
    found = wavkit.spectrum(NOISE, RATE, window, any_length=True)
    close(found.frequency, np.fft.rfftfreq(3000, 1 / RATE))
    expected[[0, -1]] /= 2
    close(found.amplitude, np.abs(expected))
    phase = np.exp(1j * found.phase)
    centre = 0 if window == "uniform" else 1500
    turned = expected * np.exp(2j * np.pi * centre * np.arange(1501) / 3000)
    close(phase * np.abs(expected), turned)


@pytest.mark.parametrize("window", ["hann", "kaiser70"])
@pytest.mark.parametrize("x", [NOISE, COMPLEX], ids=["real", "complex"])
def test_spectrum_with_zeros(x, window):
    found = wavkit.spectrum(x, RATE, window, points=4096, detrend=True)
    w = wavkit.window(window, 3000, scale="mean")
    expected = np.abs(np.fft.fft((x - x.mean()) * w, 4096)) / 3000 * 2
    frequency = np.fft.fftfreq(4096, 1 / RATE)
    if np.iscomplexobj(x):
        close(found.amplitude, np.fft.fftshift(expected) / 2), close(
            found.frequency, np.fft.fftshift(frequency)
        )
    else:
        close(found.amplitude, expected[:2049] * np.where(np.arange(2049) % 2048, 1, 0.5))
        close(found.frequency, np.abs(frequency[:2049]))


@pytest.mark.parametrize("window", wavkit.windows())
def test_peaks_lie_between_bins(window):
    spectrum = wavkit.spectrum(TONES, RATE, window, any_length=True)
    (first, amplitude), *others = spectrum.peaks(2)
    bins = abs(first - 50.3) * 3
    assert bins < 0.25 and amplitude == pytest.approx(2, rel=0.33 if window == "Uniform" else 0.16)
    if window in ("Blackman_Harris4", "Gausstop", "Flattop", "Kaiser90", "Gauss80"):
        assert bins < (0.17 if window == "Flattop" else 0.01)
        assert others[0] == (pytest.approx(220.7, abs=0.06), pytest.approx(0.01, rel=0.01))


def test_side_lobes_are_no_peaks():
    for window in ("uniform", "hann", "flattop"):
        assert (
            len(
                wavkit.spectrum(TONES - TONES + np.sin(0.7 * np.arange(3000)), RATE, window).peaks(
                    9
                )
            )
            == 1
        )
    whole = np.sin(2 * np.pi * 50 * T) + 1e-4 * np.sin(2 * np.pi * 60 * T)
    found = wavkit.spectrum(whole, RATE, "uniform", any_length=True).peaks(9)
    close(found.frequency, [50.0, 60.0], 1e-6)
    assert len(wavkit.spectrum(whole, RATE, "hann").peaks(9, band=(55, 70))) == 1


@pytest.mark.parametrize("window", wavkit.windows()[::3])
@pytest.mark.parametrize("points", [500, 4096, 40_000])
def test_peaks_are_those_of_the_program(window, points, tmp_path):
    """Which lists neither side lobes nor what hides in them, near and far out."""
    t, path = np.arange(points) / RATE, tmp_path / "tones.dsp"
    tones = zip(10 ** RNG.uniform(-4, 0, 4), RNG.uniform(5, 495, 4), RNG.uniform(0, 6, 4))
    x = sum(a * np.sin(2 * np.pi * f * t + p) for a, f, p in tones) + RNG.choice([0, 0.3])
    wavkit.write(path, x, RATE)
    command = [program(), "spectrum", path, "--peaks", "6", "--window", window, "--json"]
    told = json.loads(subprocess.run(command, capture_output=True, check=True).stdout)
    theirs = [(p["frequency"], p["amplitude"]) for p in told["signals"][0]["peaks"]]
    np.testing.assert_allclose(list(wavkit.spectrum(x, RATE, window).peaks(6)), theirs, rtol=1e-6)


def welch(x, window, length, **options):
    w = wavkit.window(window, length)
    return scipy.signal.welch(x, RATE, w, nperseg=length, **{"detrend": False, **options})


@pytest.mark.parametrize("detrend", [False, True])
def test_average_is_that_of_welch(detrend):
    x = NOISE + 1
    _, power = welch(x, "hann", 256, detrend="constant" if detrend else False)
    close(wavkit.average(x, RATE, 256, detrend=detrend).density ** 2, power, 1e-9)
    _, power = welch(COMPLEX, "blackman", 250, noverlap=200, return_onesided=False)
    found = wavkit.average(COMPLEX, RATE, 250, "blackman", overlap=80, any_length=True).density
    close(found**2, np.fft.fftshift(power), 1e-9)


@pytest.mark.parametrize(
    ("type", "mean"),
    [
        ("max", lambda p: p.max(0)),
        ("min", lambda p: p.min(0)),
        ("last", lambda p: p[-1]),
        ("harmonic", scipy.stats.hmean),
        ("log", scipy.stats.gmean),
        ("every", lambda p: p[(len(p) - 1) // 3 * 3]),
    ],
)
def test_other_averages(type, mean):
    course = wavkit.spectrogram(NOISE, RATE, 256)
    found = wavkit.average(NOISE, RATE, 256, type=type, every=3).amplitude
    power = course.amplitude.T**2
    power[:, [0, -1]] *= 4  # averaged as the transform left them
    expected = np.sqrt(mean(power))
    expected[[0, -1]] /= 2
    close(found, expected, 1e-9)


def test_spectrogram():
    frequency, time, expected = scipy.signal.spectrogram(
        NOISE,
        RATE,
        wavkit.window("hann", 128),
        noverlap=96,
        detrend=False,
        scaling="spectrum",
        mode="magnitude",
    )
    found = wavkit.spectrogram(NOISE, RATE, 128, overlap=75)
    close(found.frequency, frequency), close(found.time, time)
    expected[1:-1] *= 2
    close(found.amplitude, expected, 1e-9)


def test_windows():
    for name in ("hann", "bartlett"):
        close(wavkit.window(name, 64), scipy.signal.get_window(name, 64))
    close(wavkit.window("kaiser70", 65, symmetric=True), np.kaiser(65, 9.473960131326246))
    for name in wavkit.windows():
        w = wavkit.window(name, 512)
        assert wavkit.noise_bandwidth(name, 512) == pytest.approx(
            512 * (w**2).sum() / w.sum() ** 2, rel=2e-3
        )
        assert wavkit.coherent_gain(name, 512) == pytest.approx(w.mean(), rel=1e-3)
        assert wavkit.window(name, 512, scale="rms", dtype="f4").dtype == np.float32
        assert (wavkit.window(name, 512, scale="rms") ** 2).mean() == pytest.approx(1, rel=2e-3)
    with pytest.raises(ValueError, match="no window is called 'han'; there are Uniform, "):
        wavkit.window("han", 8)


@pytest.mark.parametrize("points", [1, 2, 15, 64])
@pytest.mark.parametrize(("dtype", "tolerance"), [("f4", 1e-6), ("f8", 1e-13)])
def test_windows_by_formula(points, dtype, tolerance):
    t = np.arange(points) - points // 2
    u = 2 * 2.5 * t / points
    cosines = 0.4 + 0.35 * np.cos(2 * np.pi * t / points) + 0.25 * np.cos(4 * np.pi * t / points)
    shapes = {
        ("kaiser", 8.6): np.i0(8.6 * np.sqrt(1 - (2 * t / points) ** 2)) / np.i0(8.6),
        ("gauss", 0.15): np.exp(-((t / (0.15 * points)) ** 2) / 2),
        ("sinc", 2.5, 1.5): np.sinc(u / np.pi) ** 1.5,
        ("cosines", 0.4, 0.35, 0.25): cosines,
    }
    for name, expected in shapes.items():
        found = wavkit.window(name, points, dtype=dtype)
        assert found.dtype == dtype
        np.testing.assert_allclose(found, expected, atol=tolerance)
    symmetric = wavkit.window(("kaiser", 8.6), points, scale="mean", symmetric=True, dtype=dtype)
    whole = scipy.signal.windows.kaiser(points, 8.6)
    np.testing.assert_allclose(symmetric, whole / whole.mean(), rtol=10 * tolerance, atol=tolerance)
    for wrong in (("kaiser",), ("welch", 1.0), ("sinc", 1.0)):
        with pytest.raises(ValueError):
            wavkit.window(wrong, points)


@pytest.mark.parametrize(
    ("kind", "edges", "cutoff", "passes"),
    [
        ("lowpass", (100,), 100, True),
        ("highpass", (100,), 100, False),
        ("bandpass", (100, 200), [100, 200], False),
        ("bandstop", (100, 200), [100, 200], True),
    ],
)
def test_designs(kind, edges, cutoff, passes):
    ours = wavkit.design(kind, *edges, rate=RATE, transition=40, attenuation=70)
    expected = scipy.signal.firwin(
        len(ours),
        cutoff,
        window=("kaiser", 0.1102 * (70 - 8.7)),
        fs=RATE,
        pass_zero=passes,
        scale=False,
    )
    close(ours, expected, 2e-3)  # Kaiser's estimates of beta differ by the rounding of N
    gain = wavkit.response(ours, RATE, 500)
    w, theirs = scipy.signal.freqz(ours, worN=501, include_nyquist=True)
    close(np.abs(gain.gain), np.abs(theirs)), close(gain.frequency, w * RATE / 2 / np.pi)
    assert np.abs(gain.gain.imag).max() < 1e-12


def test_other_designs():
    assert len(wavkit.design("fixed20")) == 39 and np.array_equal(
        wavkit.design("fixed12"), wavkit.design("fixed12")[::-1]
    )
    slope = wavkit.design("differentiator", 0.4, transition=0.1)
    t = np.arange(400)
    close(wavkit.filter(np.sin(0.5 * t), taps=slope)[100:300], 0.5 * np.cos(0.5 * t)[100:300], 2e-3)
    assert wavkit.design("delay", 0.4, 0.25).sum() == pytest.approx(1)
    for wrong in (
        ("lowpass",),
        ("lowpass", 0.6),
        ("bandpass", 0.2, 0.1),
        ("notch", 0.1),
        ("highpass", 0.0),
    ):
        with pytest.raises(ValueError):
            wavkit.design(*wrong)


@pytest.mark.parametrize(
    "x", [NOISE, COMPLEX, NOISE.astype("f4")], ids=["real", "complex", "single"]
)
def test_filtering_at_once_and_by_blocks(x):
    taps = RNG.normal(size=101)
    expected = scipy.signal.lfilter(taps, 1, x)
    tolerance = 1e-5 if x.dtype == "f4" else 1e-12
    close(wavkit.filter(x, taps=taps, delay=0), expected, tolerance)
    stream = wavkit.Filter(taps)
    pieces = [stream(block) for block in np.split(x, [1, 2, 50, 700, 705, 2999])]
    close(np.concatenate(pieces), expected, tolerance)
    both = wavkit.Filter(taps)
    pieces = [both(block) for block in np.split(np.stack([x, x[::-1]]), [900], axis=1)]
    close(np.concatenate(pieces, axis=1)[0], expected, tolerance)
    stream.reset()
    assert stream(x[:0]).shape == (0,)
    with pytest.raises(ValueError, match="reset"):
        stream(np.ones((2, 3)))


@pytest.mark.parametrize(
    ("prototype", "theirs"),
    [
        ("butter", lambda band, wn: scipy.signal.butter(5, wn, band, output="sos", fs=RATE)),
        ("cheby1", lambda band, wn: scipy.signal.cheby1(5, 1, wn, band, output="sos", fs=RATE)),
        ("cheby2", lambda band, wn: scipy.signal.cheby2(5, 50, wn, band, output="sos", fs=RATE)),
        ("elliptic", lambda band, wn: scipy.signal.ellip(5, 1, 50, wn, band, False, "sos", RATE)),
        ("bessel", lambda band, wn: scipy.signal.bessel(5, wn, band, False, "sos", "mag", RATE)),
    ],
)
def test_sections(prototype, theirs):
    noise = NOISE[:2000]
    for band, edges in (("lowpass", (100,)), ("highpass", (200,)), ("bandstop", (100, 300))):
        ours = wavkit.design_iir(
            band, *edges, rate=RATE, prototype=prototype, order=5, attenuation=50
        )
        sos = theirs(band, edges if len(edges) > 1 else edges[0])
        w, gain = scipy.signal.sosfreqz(sos, worN=501)
        answer = wavkit.response_iir(ours, RATE, 501)
        close(answer.gain[:501], gain, 1e-9), close(answer.frequency[:501], w * RATE / 2 / np.pi)
        expected = scipy.signal.sosfilt(sos, noise)
        stream = wavkit.Filter(ours)
        parts = [stream(block) for block in np.split(noise, [1, 50, 700])]
        close(np.concatenate(parts), expected, 1e-9)
        close(wavkit.Filter(ours)(noise.astype("f4")), expected, 1e-5)
        both = np.stack([noise, noise[::-1]])
        close(wavkit.zero_phase(both, sos), scipy.signal.sosfiltfilt(sos, both), 1e-9)
    for wrong in (("lowpass",), ("lowpass", 0.6), ("hilbert", 0.1), ("bandpass", 0.2, 0.1)):
        with pytest.raises(ValueError):
            wavkit.design_iir(*wrong)
    with pytest.raises(ValueError, match="rows of six"):
        wavkit.zero_phase(noise, [1.0, 0.5])


def test_filters_delay_nothing():
    taps = wavkit.design("lowpass", 60, rate=RATE)
    expected = np.convolve(TONES, taps)[len(taps) // 2 :][:3000]
    close(wavkit.filter(TONES, RATE, lowpass=60), expected)
    close(wavkit.filter(np.ones(50), RATE, lowpass=60, hold=True), np.full(50, taps.sum()))
    twice = wavkit.filter(wavkit.filter(TONES, RATE, lowpass=60), RATE, highpass=10)
    close(wavkit.filter(TONES, RATE, lowpass=60, highpass=10), twice)
    with pytest.raises(ValueError):
        wavkit.filter(TONES, RATE)


@pytest.mark.parametrize("dtype", ["f4", "f8", "c8", "c16"])
@pytest.mark.parametrize("recursive", [False, True], ids=["taps", "sections"])
def test_streams_that_begin_at_rest(recursive, dtype):
    x = (NOISE + 5 - (2j * TONES if dtype[0] == "c" else 0)).astype(dtype)
    if recursive:
        taps = wavkit.design_iir("highpass", 0.05, prototype="cheby1", order=5)
        start = scipy.signal.sosfilt_zi(taps) * x[0]
        expected, _ = scipy.signal.sosfilt(taps, x, zi=start)
    else:
        taps = wavkit.design("lowpass", 0.1, length=31)
        start = scipy.signal.lfilter_zi(taps, [1.0]) * x[0]
        expected, _ = scipy.signal.lfilter(taps, [1.0], x, zi=start)
    stream = wavkit.Filter(taps, hold=True)
    for _ in range(2):
        blocks = [stream(block) for block in (x[:0], x[:7], x[7:7], x[7:100], x[100:])]
        found = np.concatenate(blocks)
        assert found.dtype == dtype
        np.testing.assert_allclose(
            found, expected, atol=1e-11 if x.itemsize > 8 or dtype == "f8" else 1e-5
        )
        stream.reset()


@pytest.mark.parametrize("taps", [RNG.normal(size=9), wavkit.design_iir("lowpass", 0.1)])
@pytest.mark.parametrize("hold", [False, True])
def test_real_and_complex_blocks(taps, hold):
    parts = [NOISE[:50], COMPLEX[50:90], NOISE[90:130], NOISE[130:]]
    streams = wavkit.Filter(taps, hold=hold), wavkit.Filter(taps, hold=hold)
    close(np.concatenate([streams[0](p) for p in parts]), streams[1](np.concatenate(parts)))
    streams[0].reset()
    assert streams[0](parts[0]).dtype == float


@pytest.mark.parametrize("kind", ["lowpass", "bandstop", "notch"])
def test_zeros_and_poles(kind):
    edges = (100, 200) if kind == "bandstop" else (100,)
    if kind == "notch":
        theirs = scipy.signal.tf2zpk(*scipy.signal.iirnotch(100, 30, 1000))
    else:
        theirs = scipy.signal.ellip(5, 1, 60, edges, kind, fs=1000, output="zpk")
    found = wavkit.design_zpk(kind, *edges, rate=1000, prototype="elliptic", order=5)
    for ours, other in zip((found.zeros, found.poles), theirs):
        close(
            ours[np.lexsort((ours.imag, ours.real.round(9)))],
            other[np.lexsort((other.imag, other.real.round(9)))],
        )
    assert found.gain == pytest.approx(theirs[2])


@pytest.mark.parametrize("new_rate", [44100, 16000, 96000, 48000, 12345.678, 47999.9, 3000])
@pytest.mark.parametrize("quality", ["fast", "best"])
def test_resampling_is_exact_and_streams(new_rate, quality):
    def tone(rate):
        t = np.arange(int(np.ceil(rate * 0.25 - 1e-6))) / rate
        return np.sin(2 * np.pi * 600.3 * t) * np.sin(np.pi * t / 0.25) ** 4

    x, expected = tone(48000), tone(new_rate)
    at_once = wavkit.resample(x, 48000, new_rate, quality)
    assert len(at_once) == int(np.ceil(len(x) * new_rate / 48000 - 1e-9))
    close(at_once, expected[: len(at_once)], 2e-5 if quality == "fast" else 1e-8)
    stream = wavkit.Resampler(48000, new_rate, quality)
    blocks = stream.blocks(np.split(x, np.cumsum(RNG.integers(1, 2500, 6))))
    close(np.concatenate(list(blocks)), at_once, 1e-9)


def test_resampling_keeps_the_band_alone():
    t = np.arange(20000) / 20000
    x = np.cos(2 * np.pi * 900.5 * t) + np.cos(2 * np.pi * 1100 * t)
    ours = wavkit.decimate(x, 10, 20000, "best")[300:-300]
    close(ours, np.cos(2 * np.pi * 900.5 * t)[::10][300:-300], 1e-8)
    close(
        wavkit.resample(np.stack([x, 2 * x], 1), 1, 3, axis=0)[:, 1], 2 * wavkit.resample(x, 1, 3)
    )
    close(wavkit.resample(x + 1j * x, 2, 1).imag, wavkit.resample(x, 2, 1))


def test_envelope_and_slopes():
    close(wavkit.envelope(NOISE), np.abs(scipy.signal.hilbert(NOISE)))
    close(
        wavkit.envelope(NOISE + 5, detrend=True), np.abs(scipy.signal.hilbert(NOISE - NOISE.mean()))
    )
    close(wavkit.derive(NOISE, RATE)[1:], np.diff(NOISE) * RATE)
    close(wavkit.integrate(NOISE, RATE), np.cumsum(NOISE) / RATE)
    x = np.sin(2 * np.pi * 3 * T + 0.1)
    close(
        wavkit.edges(x, 0.0, RATE, "falling"),
        (np.arange(1, 18, 2) * np.pi - 0.1) / (6 * np.pi),
        1e-4,
    )


@pytest.mark.parametrize(("dtype", "tolerance"), [("f4", 1e-5), ("f8", 1e-12)])
@pytest.mark.parametrize("points", [1, 2, 777, 1024])
def test_analytic_signals(points, dtype, tolerance):
    x = np.stack([NOISE, TONES])[:, :points].astype(dtype)
    found = wavkit.analytic(x)
    assert found.dtype == np.result_type(dtype, "F")
    np.testing.assert_allclose(found, scipy.signal.hilbert(x), atol=tolerance)
    ours = wavkit.analytic(x + 1, detrend=True)
    mean = x.mean(axis=-1, keepdims=True, dtype=float)
    np.testing.assert_allclose(ours, scipy.signal.hilbert(x - mean), atol=tolerance)


@pytest.mark.parametrize("other", [NOISE[:777], COMPLEX[:777]], ids=["real", "complex"])
def test_correlation(other):
    found = wavkit.correlate(NOISE[500:700], other, RATE)
    close(found.value, np.correlate(other, NOISE[500:700], "full") / 200)
    assert found.lag[0] == -0.199
    same = wavkit.correlate(other, -other)
    assert same.best == 0 and same.coefficient.real.min() == pytest.approx(-1)


@pytest.mark.parametrize("x", [NOISE, np.exp(NOISE), COMPLEX], ids=["noise", "positive", "complex"])
def test_statistics(x):
    s = wavkit.stats(x)
    pairs = [
        (s.mean, x.mean()),
        (s.sum, x.sum()),
        (s.rms, np.sqrt(np.mean(np.abs(x) ** 2))),
        (s.energy, np.sum(np.abs(x) ** 2)),
        (s.population_variance, x.var()),
        (s.sample_deviation, x.std(ddof=1)),
        (s.min_sample, np.argmin(np.abs(x) if x.dtype == complex else x)),
        (s.max, x[np.argmax(np.abs(x) if x.dtype == complex else x)]),
        (s.harmonic_mean, 1 / np.mean(1 / x)),
    ]
    if x.dtype != complex:
        pairs += [
            (s.median, np.median(x)),
            (s.skewness, scipy.stats.skew(x)),
            (s.excess_kurtosis, scipy.stats.kurtosis(x)),
        ]
        pairs += [(s.geometric_mean, scipy.stats.gmean(x))] if x.min() > 0 else []
    for ours, theirs in pairs:
        assert ours == pytest.approx(theirs, rel=1e-9, abs=1e-12)
    assert wavkit.stats(np.full(9, 0.1)).sample_deviation < 1e-15
    nothing = wavkit.stats([x[:2], x[:2] * np.nan])
    assert np.isnan([nothing.min[1], nothing.max[1]]).all() and nothing.max[0] in x[:2]


def test_histograms():
    x = np.concatenate((NOISE, [np.nan, 9.0, -9.0]))
    found = wavkit.hist(x, 20, (-3, 3))
    counts, edges = np.histogram(x[~np.isnan(x)], 20, (-3, 3))
    assert np.array_equal(found.counts, counts) and np.allclose(found.edges, edges)
    assert (found.nan, found.below, found.above) == (1, np.sum(x < -3), np.sum(x > 3))
    assert wavkit.hist(np.abs(COMPLEX)).counts.tolist() == wavkit.hist(COMPLEX).counts.tolist()
    assert wavkit.hist(np.ones(5)).counts.sum() == 5


def test_lines():
    x = RNG.normal(size=500) + 7
    y = 3 * x - 2 + RNG.normal(size=500)
    ours, theirs = wavkit.fit(x, y), scipy.stats.linregress(x, y)
    for name in ("slope", "intercept"):
        assert getattr(ours, name) == pytest.approx(getattr(theirs, name))
    assert ours.slope_error == pytest.approx(theirs.stderr)
    assert ours.intercept_error == pytest.approx(theirs.intercept_stderr)
    assert ours.r_squared == pytest.approx(theirs.rvalue**2)
    close(ours(x), theirs.slope * x + theirs.intercept)
    drift = wavkit.fit(np.stack([T, 2 * T + 1]), rate=10)
    close(drift.slope, [0.01, 0.02]), close(drift([0.0, 1.0])[1], [1.0, 1.02])
    assert wavkit.fit(np.empty((0, 5))).slope.shape == (0,)
    with pytest.raises(ValueError, match=r"x has the shape \(2,\) and y \(3,\)"):
        wavkit.fit([1.0, 2.0], [1.0, 2.0, 3.0])
    for places in ([], [2.0], [1.0, 1.0, 1.0]):
        with pytest.raises(ValueError, match="2 points with different x"):
            wavkit.fit(places, np.arange(len(places)))


@pytest.mark.parametrize("dtype", ["f4", "f8"])
@pytest.mark.parametrize("degree", [0, 1, 3, 6])
def test_polynomials(degree, dtype):
    x = 2 + 3 * np.sort(np.random.default_rng(degree).random(200))
    y = (np.sin(x) + 0.1 * NOISE[:200]).astype(dtype)
    for centre, about in ((False, 0), (True, x.mean())):
        found = wavkit.fit_polynomial(x, y, degree, centre=centre)
        powers = np.vander(x - about, degree + 1, increasing=True)
        inverse = np.linalg.pinv(powers)
        theirs, rest = inverse @ y, y - powers @ (inverse @ y)
        variance = np.sum(rest**2) / (199 - degree)
        close(found.coefficients, theirs, 1e-7)
        close(found.errors, np.sqrt(variance * np.sum(inverse**2, axis=1)), 1e-7)
        assert found.residual_variance == pytest.approx(variance)
        assert found.r_squared == pytest.approx(1 - rest.var() / np.var(y, dtype=float), abs=1e-9)
        close(found(x), powers @ theirs, 1e-9)
    two = wavkit.fit_polynomial(np.stack([y, 2 * y], 1), degree=degree, rate=10, axis=0)
    close(two([[0.0, 1.0]])[1], 2 * wavkit.fit_polynomial(y, degree=degree, rate=10)([[0.0, 1.0]]))


def test_polynomials_of_any_degree_and_place():
    x = np.linspace(-1, 1, 1000)
    theirs = np.polynomial.Chebyshev.fit(x, np.exp(3 * x) + NOISE[:1000], 60)
    close(wavkit.fit_polynomial(x, np.exp(3 * x) + NOISE[:1000], 60)(x), theirs(x), 1e-10)
    exact = wavkit.fit_polynomial(1e6 + np.arange(3), [1.0, 4.0, 9.0], centre=True)
    close(exact.coefficients, [4, 4, 1], 1e-12)
    assert exact.r_squared == 1 and np.isnan(exact.errors).all() and exact.about == 1e6 + 1
    for places in ([1.0, 2.0, 1.0], [1.0, 2.0]):
        with pytest.raises(ValueError, match="3 points with different x"):
            wavkit.fit_polynomial(places, np.ones(len(places)), 2)


@pytest.mark.parametrize(
    "conditions",
    [
        {},
        {"height": 0.5, "distance": 9.5},
        {"prominence": 1.5, "width": 3, "width_at": 70},
        {"threshold": 0.3},
    ],
)
def test_peaks_of_signals(conditions):
    found = wavkit.peaks(NOISE, **conditions)
    theirs = {"prominence": 0, "width": 0, **conditions}
    theirs["rel_height"] = theirs.pop("width_at", 50) / 100
    samples, values = scipy.signal.find_peaks(NOISE, **theirs)
    assert len(found) == len(samples) and np.array_equal(found.sample, samples)
    pairs = {
        "prominence": "prominences",
        "width": "widths",
        "left": "left_ips",
        "left_base": "left_bases",
    }
    for ours, name in pairs.items():
        close(getattr(found, ours), values[name])
    close(wavkit.peaks(NOISE, RATE).right, wavkit.peaks(NOISE).right / RATE)
    fifth = np.arange(30) % 5 == 2
    assert len(wavkit.peaks(fifth, 48000, distance=5 / 48000)) == len(wavkit.peaks(fifth)) == 6


@pytest.mark.parametrize("dtype", ["f4", "f8"])
def test_valleys_of_signals(dtype):
    x = NOISE.astype(dtype)
    found = wavkit.peaks(x, valleys=True, height=-0.5, prominence=1)
    samples, values = scipy.signal.find_peaks(-x, height=0.5, prominence=1)
    assert np.array_equal(found.sample, samples) and np.array_equal(found.height, x[samples])
    close(found.prominence, values["prominences"], 1e-6)
    assert (found.top <= found.height).all() and found.top.dtype == dtype


def test_sines():
    x = 0.7 * np.cos(2 * np.pi * 21.37 * T + 0.3) - 0.2 + 0.01 * NOISE

    def model(t, frequency, amplitude, phase, offset):
        return offset + amplitude * np.cos(2 * np.pi * frequency * t + phase)

    theirs, covariance = scipy.optimize.curve_fit(model, T, x, (21.4, 0.7, 0.3, -0.2))
    ours = wavkit.fit_sine(x, RATE)
    names = ("frequency", "amplitude", "phase", "offset")
    close([getattr(ours, name) for name in names], theirs, 1e-7)
    close([getattr(ours, name + "_error") for name in names], np.sqrt(np.diag(covariance)), 1e-3)
    close(ours(T), model(T, *theirs), 1e-6)
    assert ours.residual_rms == pytest.approx(np.sqrt(np.mean((x - ours(T)) ** 2)))
    two = wavkit.fit_sine(np.stack([x, 2 * x], 1), RATE, at=21.37, axis=0)
    close(
        two([0.0, 0.1]),
        model(
            np.array([[0.0, 0.1]]),
            21.37,
            two.amplitude[:, None],
            two.phase[:, None],
            two.offset[:, None],
        ),
    )


@pytest.mark.parametrize("single", [False, True], ids=["double", "single"])
def test_distortion(single):
    t = np.arange(1 << 15) / 48000
    parts = {1: (1.0, 0.4), 2: (1e-2, 1.0), 3: (3e-3, -2.0), 7: (1e-3, 0.0)}
    x = sum(a * np.cos(2 * np.pi * 997.3 * h * t + p) for h, (a, p) in parts.items())
    x = x + 0.25 + 1e-4 * np.cos(2 * np.pi * 5432.1 * t) + 1e-4 * RNG.normal(size=len(t))
    found = wavkit.distortion(x.astype("f4") if single else x, 48000)
    for h, (a, p) in parts.items():
        assert abs(found.harmonics[h] - a * np.exp(1j * p)) < (1e-4 if single else 2e-5)
    assert found.thd == pytest.approx(np.sqrt(1e-4 + 9e-6 + 1e-6), rel=1e-3)
    rms = np.hypot(1e-4, 1e-4 / np.sqrt(2))
    assert found.noise == pytest.approx(rms, rel=0.02)
    assert found.snr == pytest.approx(20 * np.log10(np.sqrt(0.5) / rms), abs=0.2)
    # The strongest other component is the second harmonic.
    assert found.spur_frequency == pytest.approx(1994.6, abs=0.1)
    assert found.sfdr == pytest.approx(40, abs=0.01)
    assert found.offset == pytest.approx(0.25, abs=1e-4)
    assert found.enob == pytest.approx((found.sinad - 1.7609) / 6.0206, abs=1e-3)


@pytest.mark.parametrize("detrend", [False, True])
@pytest.mark.parametrize(
    ("window", "points", "overlap"),
    [("hann", 256, 50), ("uniform", 100, 0), ("blackman_harris4", 75, 75)],
)
def test_transfer(window, points, overlap, detrend):
    x = RNG.normal(size=5000) + 1
    y = scipy.signal.lfilter([0.2, 0.5, -0.3], [1, -0.4], x) + 0.3 * RNG.normal(size=5000)
    given = {
        "fs": RATE,
        "window": wavkit.window(window, points),
        "noverlap": points - wavkit._spectra.step_of(points, overlap),
        "detrend": "constant" if detrend else False,
    }
    found = wavkit.transfer(x, y, RATE, points, window, overlap=overlap, detrend=detrend)
    f, cross = scipy.signal.csd(x, y, **given)
    power = scipy.signal.welch(x, **given)[1]
    skip = slice(2 if detrend else 0, None)  # where the mean was there is rounding alone
    close(found.frequency, f)
    close(found.cross[skip], cross[skip], 1e-11)
    close(found.input[skip], power[skip], 1e-11)
    close(found.output[skip], scipy.signal.welch(y, **given)[1][skip], 1e-11)
    close(found.coherence[skip], scipy.signal.coherence(x, y, **given)[1][skip], 1e-9)
    close(found.h1[skip], (cross / power)[skip], 1e-9)
    several = wavkit.transfer(x, np.stack([y, x]), RATE, points, window, overlap=overlap)
    assert several.h1.shape == (2, points // 2 + 1) and several.delay.shape == (2,)
    single = wavkit.transfer(x.astype("f4"), y.astype("f4"), RATE, points, window, overlap=overlap)
    assert single.h1.dtype == np.complex64
    close(single.h1, several.h1[0], 1e-3)
    for inputs, outputs in ((50, 50), (1, 5000)):
        with pytest.raises(ValueError, match="samples"):
            wavkit.transfer(x[:inputs], y[:outputs], RATE, points)


@pytest.mark.parametrize("x", [NOISE, COMPLEX], ids=["real", "complex"])
def test_zoom(x):
    n = len(x)
    for points, start, step in ((700, 0.1, 1e-4), (5, -0.3, 0.21), (1000, 0.0, 1 / 1000)):
        ours = n * wavkit.czt(x, points, start, step)
        turn, begin = np.exp(-2j * np.pi * step), np.exp(2j * np.pi * start)
        close(ours, scipy.signal.czt(x, points, turn, begin), 1e-8)
    near = n * wavkit.czt(x, 9, 0.1, 0.02, 0.999)
    close(near, scipy.signal.czt(x, 9, np.exp(-0.04j * np.pi), 0.999 * np.exp(0.2j * np.pi)), 1e-9)
    seen = wavkit.zoom(np.stack([x, 2 * x], 1), RATE, 10, 20, 77, "uniform", axis=0)
    want = scipy.signal.zoom_fft(x, [10, 20], 77, fs=RATE, endpoint=True)
    scale = (1 if x.dtype.kind == "c" else 2) / n
    close(seen.bins[:, 1], 2 * scale * want, 1e-9)
    close(seen.amplitude[:, 0], np.abs(scale * want), 1e-9)
    close(seen.frequency, np.linspace(10, 20, 77))
    at = np.array([12.34, 17.0])
    sums = np.exp(-2j * np.pi * np.outer(at, np.arange(n)) / RATE) @ x
    close(wavkit.goertzel(x, at, RATE), 2 / n * sums, 1e-12)
    assert wavkit.goertzel(x.astype("c8"), at, RATE).dtype == np.complex64
    meter = wavkit.Goertzel(at, RATE)
    for block in np.array_split(x, 7):
        last = meter(block)
    assert np.array_equal(last, wavkit.goertzel(x, at, RATE))


@pytest.mark.parametrize("degree", [1, 2, 3, 4, 5, 9, 20])
def test_roots(degree):
    wanted = RNG.normal(size=degree)
    c = np.polynomial.polynomial.polyfromroots(wanted)
    close(np.sort(wavkit.roots(c).real), np.sort(wanted), 1e-4 if degree == 20 else 1e-9)
    close(wavkit.roots(c[::-1], descending=True), wavkit.roots(c), 1e-6)
    close(wavkit.from_roots(wanted), c)
    assert wavkit.from_roots([1 + 2j, 1 - 2j]).tolist() == [5, -2, 1]


@pytest.mark.parametrize(
    ("method", "kind"), [("linear", "linear"), ("hold", "previous"), ("spline", "cubic")]
)
def test_interpolation(method, kind):
    x = np.cumsum(RNG.random(30) + 0.1)
    y = np.stack([np.sin(x), x**3])
    at = RNG.uniform(x[0], x[-1], 200)
    close(wavkit.interp(x, y, at, method), scipy.interpolate.interp1d(x, y, kind)(at), 1e-9)
    assert wavkit.interp(x, y[0], [[0.0], [99.0]], method).tolist() == [[y[0, 0]], [y[0, -1]]]
    close(wavkit.interp(None, T, [0.5, 0.25], rate=RATE), [0.5, 0.25])
    for wrong in ([0.0, 1.0, 1.0], [0.0, 2.0, 1.0], [0.0, np.nan, 2.0], [0.0, 1.0], [0, 1, 2j], []):
        with pytest.raises(ValueError, match="plac"):
            wavkit.interp(wrong, np.arange(3.0) if wrong else [], [1.5], method)
    found = wavkit.interp(x, y, [[np.nan, x[5]], [x[7], np.nan]], method)
    np.testing.assert_array_equal(np.isnan(found), [[[True, False], [False, True]]] * 2)
    close(found[:, [0, 1], [1, 0]], y[:, [5, 7]])


def test_places_in_single_precision():
    """Beyond 2^24 samples float32 has no number for each of them."""
    x, last = np.zeros((1 << 24) + 4, "f4"), (1 << 24) + 1
    x[last] = 7
    figures = wavkit.stats(x)
    assert figures.max_sample == wavkit.peaks(x, height=7).sample[0] == last
    assert figures.max.dtype == wavkit.peaks(x[-99:]).height.dtype == np.float32
    clean, outlier = wavkit.replace_outliers(x, 3)
    assert np.flatnonzero(outlier).tolist() == [last] and clean.dtype == np.float32
    ramp = np.arange(2_000_000, dtype="f4") % 2
    close(wavkit.edges(ramp, 0.25)[-1], 1_999_998.25, 1e-15)
    assert wavkit.interp(None, ramp, [1_900_000.25 / 48000], rate=48000)[0] == pytest.approx(0.25)
    assert wavkit.interp(np.arange(4) + 1.7e9, ramp[:4], [1.7e9 + 0.5]).tolist() == [0.5]
    assert wavkit.peaks(np.float32([0, 0.7, 0]), height=0.7).sample.tolist() == [1]
    assert wavkit.hist(np.float32([0.1]), 2, (0.1, 1.0)).below == 0


@pytest.mark.parametrize(("dtype", "tolerance"), [("f4", 1e-5), ("f8", 1e-11)])
@pytest.mark.parametrize(
    ("known", "theirs"),
    [
        ({"curvatures": (0, 0)}, "natural"),
        ({"slopes": (0.5, -2)}, ((1, 0.5), (1, -2))),
        ({"slopes": (None, 1), "curvatures": (3, None)}, ((2, 3), (1, 1))),
    ],
)
def test_ends_of_splines(known, theirs, dtype, tolerance):
    x, at = np.arange(30) + 0.3 * np.sin(np.arange(30)), np.linspace(-1, 31, 100)
    y = NOISE[:30].astype(dtype)
    found = wavkit.interp(x, y, at, "spline", extrapolate=True, **known)
    expected = scipy.interpolate.CubicSpline(x.astype(dtype), y, bc_type=theirs)(at.astype(dtype))
    np.testing.assert_allclose(found, expected, rtol=tolerance, atol=10 * tolerance)
    with pytest.raises(ValueError, match="spline"):
        wavkit.interp(x, y, at, "linear", **known)


@pytest.mark.parametrize("suffix", [".dsp", ".txt", ".wav", ".csv"])
def test_files(tmp_path, suffix):
    path = tmp_path / f"signal{suffix}"
    wavkit.write(path, NOISE / 8, 8000)
    samples, rate = wavkit.read(path)
    assert rate == 8000
    close(samples, NOISE / 8, 1e-7 if suffix == ".wav" else 1e-15)
    wavkit.write(tmp_path / "two.dsp", np.stack([COMPLEX, -COMPLEX]), 10)
    assert np.array_equal(wavkit.read(tmp_path / "two.dsp").samples, np.stack([COMPLEX, -COMPLEX]))


@pytest.mark.parametrize("suffix", [".dsp", ".txt", ".mat", ".csv"])
@pytest.mark.parametrize("dtype", ["f4", "f8", "c8"])
def test_files_keep_rates(tmp_path, suffix, dtype):
    for rate in (48000, 98, 12345.678, 1 / 3600):
        wavkit.write(tmp_path / f"x{suffix}", np.array([0.5, 0.1], dtype), rate)
        samples, again = wavkit.read(tmp_path / f"x{suffix}")
        assert again == rate and samples.tolist() == pytest.approx([0.5, 0.1], rel=1e-7)


def test_what_files_do_not_hold_is_told(tmp_path, monkeypatch):
    monkeypatch.chdir(tmp_path)
    with pytest.warns(UserWarning, match="10 samples beyond -1 to 1 clipped"):
        wavkit.write("x.flac", np.arange(12.0).reshape(4, 3), 8000)
    with pytest.warns(UserWarning, match="holds no rate"):
        wavkit.write("x.npy", np.float32([[0, 1], [2, 3], [4, 5]]), 8000)
    assert (
        wavkit.read("x.npy").samples.tolist()
        == np.load("x.npy").tolist()
        == [[0, 1], [2, 3], [4, 5]]
    )
    wavkit.write("-x.wav", [0.5, 0.25], 8000)
    assert wavkit.read("-x.wav").samples.tolist() == [0.5, 0.25]
    for name in ("none/x.dsp", "none/x.npy", "none/x.csv"):
        with pytest.raises(OSError, match=name):
            wavkit.write(name, [1.0])


def test_files_that_cannot_be_read(tmp_path):
    (tmp_path / "bad.dsp").write_bytes(b"\xbe\x30\x03\xeb" + bytes(12))
    (tmp_path / "bad.wav").write_text("no sound")
    for name in ("empty.txt", "empty.npy"):
        (tmp_path / name).write_text("")
    for name, error in (
        ("bad.dsp", wavkit.Error),
        ("bad.wav", OSError),
        ("none.dsp", OSError),
        ("empty.txt", OSError),
        ("empty.npy", OSError),
    ):
        with pytest.raises(error):
            wavkit.read(tmp_path / name)


@pytest.mark.parametrize(
    "window, order, derivative", [(5, 2, 0), (21, 3, 1), (15, 4, 0), (9, 4, 2), (3, 1, 2)]
)
@pytest.mark.parametrize("x", [NOISE, np.stack((TONES, NOISE))])
def test_local_polynomials(x, window, order, derivative):
    found = wavkit.smooth(x, RATE, window, order=order, derivative=derivative)
    expected = scipy.signal.savgol_filter(x, window, order, derivative, 1 / RATE)
    close(found, expected, 1e-12)


@pytest.mark.parametrize("window", [1, 2, 3, 8, 9, 15, 16, 31, 100, 257])
def test_moving_medians(window):
    for ends, mode in (("mirror", "reflect"), ("hold", "nearest"), ("zero", "constant")):
        ranks = [
            scipy.ndimage.rank_filter(NOISE, rank, window, mode=mode)
            for rank in ((window - 1) // 2, window // 2)
        ]
        found = wavkit.smooth(NOISE, window=window, method="median", ends=ends)
        np.testing.assert_array_equal(found, (ranks[0] + ranks[1]) * 0.5)
    with pytest.raises(ValueError):
        wavkit.smooth(NOISE[:window], window=window + 1, method="median")


def test_outliers_along_an_axis():
    x = np.stack((TONES, NOISE), axis=1)
    clean, outlier = wavkit.replace_outliers(x, 7, 2, axis=0, ends="mirror")
    median = scipy.ndimage.median_filter(x, (7, 1))
    windows = np.lib.stride_tricks.sliding_window_view(
        np.pad(x, ((3, 3), (0, 0)), "symmetric"), 7, 0
    )
    spread = np.median(np.abs(windows - median[..., None]), axis=-1)
    expected = np.abs(x - median) > 2 * 1.4826 * spread
    np.testing.assert_array_equal(outlier, expected)
    np.testing.assert_array_equal(clean, np.where(expected, median, x))


@pytest.mark.parametrize("size, hop", [(256, 64), (100, 50), (128, 16)])
@pytest.mark.parametrize("x", [NOISE, COMPLEX, np.stack((TONES, NOISE))])
def test_frames_and_back(x, size, hop):
    frames = wavkit.stft(x, RATE, size, hop=hop)
    settings = dict(window="hann", nperseg=size, noverlap=size - hop)
    two_sided = np.iscomplexobj(x)
    f, t, bins = scipy.signal.stft(x, RATE, return_onesided=not two_sided, **settings)
    turns = np.exp(1j * np.pi * np.arange(len(f)))[:, None]  # from the begin to the centre
    bins = bins * turns * (1 if two_sided else 2)
    if two_sided:
        f, bins = np.fft.fftshift(f), np.fft.fftshift(bins, axes=-2)
    count = min(bins.shape[-1], frames.bins.shape[-1])
    close(frames.bins[..., :count], bins[..., :count])
    close(frames.frequency, f), close(frames.time[:count], t[:count])
    close(wavkit.istft(frames), x, 1e-13)
    louder = dataclasses.replace(frames, bins=2 * frames.bins)
    close(wavkit.istft(louder), 2 * x, 1e-13)
    with pytest.raises(wavkit.Error):
        wavkit.istft(wavkit.stft(x, RATE, size, hop=size))  # Hann is 0 where frames meet


def test_levels_of_weighted_noise():
    noise = np.stack((NOISE, 3 * NOISE[::-1]))
    rate = 8000.0
    found = wavkit.levels(noise, rate, "C", response=50, reference=0.5, octaves=1)
    passed = scipy.signal.sosfilt(wavkit.weighting("C", rate), noise)
    close(found.equivalent, 10 * np.log10((passed**2).mean(-1) / 0.25))
    close(found.peak, 20 * np.log10(np.abs(passed).max(-1) / 0.5))
    share = 1 - np.exp(-1 / rate / 0.05)
    course = scipy.signal.lfilter([share], [1, share - 1], passed**2)
    close(found.greatest, 10 * np.log10(course.max(-1) / 0.25))
    close(found.least, 10 * np.log10(course[:, 1999:].min(-1) / 0.25))
    centres, bands = wavkit.octave_bands(1, rate=rate)
    assert found.bands.shape == (2, len(centres)) and len(bands) == 7
    in_band = scipy.signal.sosfilt(bands[5], noise)
    close(found.bands[:, 5], 10 * np.log10((in_band**2).mean(-1) / 0.25), 1e-8)
    with pytest.raises(ValueError, match="a weighting is A, C or Z"):
        wavkit.levels(NOISE, rate, "B")


def test_signals_over_the_angle():
    turned = 20 * T + 5 * T**2
    pulses = (-20 + np.sqrt(400 + 20 * np.arange(100))) / 10
    x = np.stack((np.cos(2 * np.pi * 3 * turned), np.sin(2 * np.pi * turned)))
    y = wavkit.over_angle(x, pulses, RATE, angles=64)
    angle = np.arange(y.shape[-1]) / 64
    close(y[0, 64:-64], np.cos(2 * np.pi * 3 * angle)[64:-64], 1e-4)
    assert wavkit.over_angle(x, pulses, RATE).shape == (2, 99 * 64 + 1)
    spectrum = wavkit.orders(x, pulses, RATE, angles=64)
    close(spectrum.peaks(1).frequency[:, 0], [3, 1], 1e-4)
    with pytest.raises(ValueError, match="ascending"):
        wavkit.orders(x, pulses[::-1], RATE)
