"""Every layout of arrays, and the coordinates of xarray and pandas."""

import dataclasses

import numpy as np
import pandas
import pytest
import wavkit
import xarray

RNG = np.random.default_rng(5)
FUNCTIONS = {
    "spectrum": lambda x, axis=-1: wavkit.spectrum(x, 8, axis=axis).amplitude,
    "average": lambda x, axis=-1: wavkit.average(x, 8, 16, axis=axis, detrend=True).density,
    "filter": lambda x, axis=-1: wavkit.filter(x, 8, bandpass=(1, 2), axis=axis),
    "resample": lambda x, axis=-1: wavkit.resample(x, 8, 11, "fast", axis=axis),
    "envelope": lambda x, axis=-1: wavkit.envelope(x, axis=axis),
    "derive": lambda x, axis=-1: wavkit.derive(x, 8, axis=axis),
    "integrate": lambda x, axis=-1: wavkit.integrate(x, 8, axis=axis, detrend=True),
    "rms": lambda x, axis=-1: wavkit.stats(x, axis=axis).rms,
    "median": lambda x, axis=-1: wavkit.stats(x, axis=axis).median,
}


def random_layout(array):
    """The same values, lying otherwise in memory."""
    kind = RNG.integers(5)
    if kind == 0:
        return np.asfortranarray(array)
    if kind == 1:
        return np.repeat(array, 2, axis=-1)[..., ::2]
    if kind == 2:
        return array[..., ::-1].copy()[..., ::-1]
    if kind == 3:
        array = array.copy()
        array.flags.writeable = False
        return array
    return array.astype(array.dtype.newbyteorder(">"))


@pytest.mark.parametrize("name", FUNCTIONS)
@pytest.mark.parametrize("seed", range(6))
def test_any_shape_is_run_by_run(name, seed):
    rng, function = np.random.default_rng(seed), FUNCTIONS[name]
    shape = [int(rng.integers(0 if seed == 5 else 1, 4)) for _ in range(rng.integers(0, 4))]
    axis = int(rng.integers(-len(shape) - 1, len(shape) + 1))
    shape.insert(axis if axis >= 0 else len(shape) + 1 + axis, int(rng.integers(20, 60)))
    dtype = ["f4", "f8", "c8", "c16", "i2", "f2"][seed]
    x = (
        100 * rng.normal(size=shape) + (100j * rng.normal(size=shape) if dtype[0] == "c" else 0)
    ).astype(dtype)
    before = x.copy()
    found = function(random_layout(x), axis)
    expected = np.apply_along_axis(function, axis, x) if x.size else None
    assert np.array_equal(x, before)
    if expected is None:
        assert found.size == 0
        return
    assert np.shape(found) == expected.shape
    np.testing.assert_array_equal(found, expected)
    single = dtype in ("f4", "c8", "f2")
    assert np.asarray(found).dtype.itemsize * (1 if np.iscomplexobj(found) else 2) == (
        8 if single else 16
    )


def test_empty_and_senseless_input():
    for call in (wavkit.spectrum, wavkit.stats, wavkit.average):
        with pytest.raises(ValueError):
            call(np.empty(0))
    assert wavkit.filter(np.empty(0), taps=[1.0]).size == 0 and wavkit.envelope([]).size == 0
    with pytest.raises(ValueError, match="one axis"):
        wavkit.Goertzel(0.1)(np.ones((2, 5)))
    for rate in (0, -1, np.nan, np.inf):
        with pytest.raises(ValueError, match="rate"):
            wavkit.spectrum([1.0, 2.0], rate)
    for senseless in (
        lambda: wavkit.design("lowpass", 0.1, transition=0),
        lambda: wavkit.design_iir("notch", 0.1, q=0),
        lambda: wavkit.decimate([1.0, 2.0], 0),
        lambda: wavkit.over_angle(np.ones(99), np.arange(5) * 20.0, per_revolution=np.inf),
        lambda: wavkit.response([1.0], rate=0),
        lambda: wavkit.response_iir([[1.0, 0, 0, 1, 0, 0]], rate=0),
    ):
        with pytest.raises(ValueError):
            senseless()
    for wrong in ({"points": 0}, {"overlap": 100}, {"type": "mean"}, {"points": 99}):
        with pytest.raises(ValueError):
            wavkit.average(np.ones(50), **{"points": 10, **wrong})


def test_senseless_axes():
    x, table = np.ones((20, 2)), pandas.DataFrame(np.ones((20, 2)))
    room = xarray.DataArray(x, dims=["time", "room"])
    for given, axis in ((x, 2), (x[:, 0], 7), (x[:, 0], -2), (room, 2), (table, 2)):
        with pytest.raises(IndexError):  # NumPy's AxisError
            wavkit.envelope(given, axis=axis)
    for given, axis in ((table, 1), (table, "index"), (x, "time"), (room, "channel")):
        with pytest.raises(ValueError, match="columns|dimension"):
            wavkit.envelope(given, axis=axis)
    for axis in (None, 1.5, 0.0):
        with pytest.raises(TypeError):
            wavkit.envelope(x[:, 0], axis=axis)


TIME = 5 + np.arange(64) / 8


def test_xarray_keeps_coordinates():
    values = RNG.normal(size=(64, 2))
    x = xarray.DataArray(
        values, dims=["time", "channel"], coords={"time": TIME, "channel": ["a", "b"]}, name="u"
    )
    spectrum = wavkit.spectrum(x, axis="time")
    assert spectrum.amplitude.dims == ("frequency", "channel") and spectrum.frequency[-1] == 4
    plain = wavkit.spectrum(values, 8, axis=0).amplitude
    np.testing.assert_array_equal(spectrum.amplitude.sel(channel="b").values, plain[:, 1])
    assert wavkit.envelope(x, axis="time").coords.to_dataset().equals(x.coords.to_dataset())
    assert wavkit.stats(x, axis=0).max.sel(channel="a") == values[:, 0].max()
    half = wavkit.decimate(x, 2, axis="time")
    assert half.time.values.tolist() == TIME[::2].tolist() and half.name == "u"
    assert wavkit.fit(x[:, 0]).intercept == pytest.approx(np.polyfit(TIME, values[:, 0], 1)[1])
    single = wavkit.goertzel(x, [1.0, 2.5], axis="time")
    assert single.dims == ("frequency", "channel") and single.frequency[1] == 2.5
    np.testing.assert_array_equal(single[:, 1], wavkit.goertzel(values[:, 1], [1.0, 2.5], 8))
    between = wavkit.transfer(x, x[:, ::-1], points=16, axis="time")
    assert between.h1.dims == ("frequency", "channel") and between.delay.dims == ("channel",)
    plain = wavkit.transfer(values[:, 1], values[:, 0], 8, 16)
    np.testing.assert_array_equal(between.h1[:, 1], plain.h1)
    np.testing.assert_array_equal(between.db[:, 1], plain.db)
    # 1 / (1 / 98) is more than 98, and the steps of such places are no thousandths.
    long = xarray.DataArray(np.ones(4000), {"time": 5 + np.arange(4000) / 1000}, ["time"])
    assert len(wavkit.resample(long, None, 500)) == 2000
    assert wavkit.stft(long.assign_coords(time=long.time.astype("f4"))).rate == 1000
    assert wavkit.filter(long, bandpass=(100, 500)).shape == (4000,)
    assert wavkit.filter(np.ones(2000), 98, bandpass=(5, 49)).shape == (2000,)
    daily = pandas.Series(np.arange(30.0), np.arange(30) * 49.0)
    assert wavkit.edges(daily, 28.0).tolist() == [28 * 49]
    for function in (wavkit.correlate, wavkit.transfer):
        with pytest.raises(ValueError, match="different rates: 8 and 4"):
            function(x[:, 0], x[:, 1].assign_coords(time=2 * TIME))
    uneven = x.assign_coords(time=TIME**2)
    with pytest.raises(ValueError, match="equally spaced"):
        wavkit.spectrum(uneven, axis="time")


def test_new_axes_have_names_of_their_own():
    course = xarray.DataArray(TONES.T, {"time": TIME}, ["frequency", "time"])
    assert wavkit.spectrum(course).amplitude.dims == ("frequency", "frequency_2")
    frames = wavkit.stft(course, size=16)
    assert frames.bins.dims == ("frequency", "frequency_2", "time")
    xarray.testing.assert_allclose(wavkit.istft(frames), course)
    line = wavkit.fit(course.rename(frequency="at"))
    assert line([1.0]).dims == line(xarray.DataArray([1.0], dims=["at"])).dims == ("at", "at_2")


def test_pandas_keeps_coordinates():
    index = pandas.date_range("2026-03-01", periods=64, freq="125ms", name="when")
    table = pandas.DataFrame(RNG.normal(size=(64, 2)), index, ["a", "b"])
    spectrum = wavkit.spectrum(table["a"]).amplitude
    assert spectrum.index.name == "frequency" and spectrum.index[-1] == 4
    assert wavkit.filter(table, lowpass=1).index.equals(index)
    assert wavkit.stats(table).mean["b"] == pytest.approx(table["b"].mean())
    assert wavkit.stats(table["a"]).median == table["a"].median()
    assert list(wavkit.average(table, points=16).density.columns) == ["a", "b"]
    both = wavkit.transfer(table, table["a"].to_frame().to_numpy() * [[2, 3]], points=16, axis=0)
    assert list(both.coherence.columns) == ["a", "b"] and both.frequency[-1] == 4
    assert both.h1["a"].to_numpy() == pytest.approx(2)
    assert wavkit.edges(pandas.Series([0.0, 1.0], [3.0, 4.0]), 0.5).tolist() == [3.5]


# What is measured of signals x whose first sample is at `start`, and along which axes.
MEASURED = {
    "spectrogram": (
        lambda x, start, **how: wavkit.spectrogram(x, points=16, **how).amplitude,
        {"frequency": np.arange(9) / 2, "time": np.arange(6, 13)},
    ),
    "stft": (
        lambda x, start, **how: wavkit.stft(x, size=16, **how).bins,
        {"frequency": np.arange(9) / 2, "time": 5 + np.arange(17) / 2},
    ),
    "istft": (lambda x, start, **how: wavkit.istft(wavkit.stft(x, size=16, **how)), {"time": TIME}),
    "peaks": (
        lambda x, start, **how: wavkit.spectrum(x, **how).peaks(2).frequency,
        {"peak": [0, 1]},
    ),
    "orders": (
        lambda x, start, **how: wavkit.orders(
            x, start + np.arange(8.0), revolutions=2, **how
        ).amplitude,
        {"frequency": np.arange(9) / 2},
    ),
    "correlate": (
        lambda x, start, **how: wavkit.correlate(x, x, **how).coefficient,
        {"lag": np.arange(-63, 64) / 8},
    ),
    "best": (lambda x, start, **how: wavkit.correlate(x, x, **how).best, {}),
    "hist": (
        lambda x, start, rate=None, axis=-1: wavkit.hist(x, 4, (-4, 4), axis).counts,
        {"bin": [-3, -1, 1, 3]},
    ),
    "below": (lambda x, start, rate=None, axis=-1: wavkit.hist(x, 4, (-1, 1), axis).below, {}),
    "fit": (lambda x, start, **how: wavkit.fit(x, **how).slope, {}),
    "line": (lambda x, start, **how: wavkit.fit(x, **how)([start, start + 2]), {"at": [5, 7]}),
    "fit_polynomial": (
        lambda x, start, **how: wavkit.fit_polynomial(x, centre=True, **how).coefficients,
        {"power": [0, 1, 2]},
    ),
    "polynomial": (lambda x, start, **how: wavkit.fit_polynomial(x, **how)(start), {}),
    "sine": (lambda x, start, **how: wavkit.fit_sine(x, **how)([0.5, 1.0]), {"at": [0.5, 1]}),
    "distortion": (
        lambda x, start, **how: wavkit.distortion(x, harmonics=2, window="hann", **how).harmonics,
        {"harmonic": [0, 1, 2]},
    ),
    "levels": (
        lambda x, start, rate=None, axis=-1: wavkit.levels(x, 8000, octaves=1, axis=axis).bands,
        {"centre": wavkit.octave_bands(1, rate=8000)[0]},
    ),
    "czt": (
        lambda x, start, rate=None, axis=-1: wavkit.czt(x, 3, 0.25, 0.125, axis=axis),
        {"frequency": [0.25, 0.375, 0.5]},
    ),
    "interp": (lambda x, start, **how: wavkit.interp(None, x, start + 1.3, **how), {}),
    "outliers": (
        lambda x, start, rate=None, axis=-1: wavkit.replace_outliers(x, 9, 1, axis=axis)[1],
        {"time": TIME},
    ),
}
TONES = np.sin(2 * np.pi * 1.3 * TIME[:, None]) * [1, 3] + 0.1 * RNG.normal(size=(64, 2))


@pytest.mark.parametrize("name", MEASURED)
def test_what_is_measured_has_coordinates(name):
    function, axes = MEASURED[name]
    plain = function(TONES[:, 1].copy(), 0.0, rate=8)
    coords = {"time": TIME, "channel": ["a", "b"], "place": ("channel", ["bow", "stern"])}
    found = function(xarray.DataArray(TONES, coords, ["time", "channel"]), 5.0, axis="time")
    assert sorted(found.dims) == sorted(["channel", *axes])
    assert found.place.values.tolist() == ["bow", "stern"]
    for axis, places in axes.items():
        np.testing.assert_allclose(found[axis], places)
    np.testing.assert_allclose(found.sel(channel="b"), plain, 1e-9, 1e-9)

    table = pandas.DataFrame(TONES, pandas.Index(TIME, name="time"), ["a", "b"])
    for part in (function(table, 5.0)["b"], function(table["b"], 5.0)):
        np.testing.assert_allclose(part, plain, 1e-9, 1e-9)
        # A line that is called gives an array for one Series: its slope is a number.
        labels = [getattr(part, side, None) for side in ("index", "columns")]
        for index, (axis, places) in zip(labels, axes.items()):
            if index is not None:
                assert index.name == axis
                np.testing.assert_allclose(index, places)


def test_changed_frames_give_signals_of_what_is_left():
    x = xarray.DataArray(TONES, {"time": TIME, "channel": ["a", "b"]}, ["time", "channel"])
    frames = wavkit.stft(x, size=16, axis=0)
    for bins in (frames.bins.sel(channel="b"), frames.bins.transpose("time", ...)):
        again = wavkit.istft(dataclasses.replace(frames, bins=2 * bins))
        xarray.testing.assert_allclose(again, 2 * x.sel(channel=bins.channel).T)
    table = x.to_pandas()
    frames = wavkit.stft(table, size=16)
    again = wavkit.istft(dataclasses.replace(frames, bins=frames.bins["a"]))
    pandas.testing.assert_series_equal(again, table["a"], check_names=False)
    plain = wavkit.istft(dataclasses.replace(frames, bins=frames.bins["a"].to_numpy()))
    assert type(plain) is np.ndarray and plain == pytest.approx(TONES[:, 0])


@pytest.mark.parametrize("dtype", ["Int64", "Float32", "boolean"])
def test_other_types_of_pandas(dtype):
    values = TONES[:, 0] > 0 if dtype == "boolean" else TONES[:, 0].round()
    x = pandas.Series(values, TIME).astype(dtype)
    plain = x.to_numpy("f4" if dtype == "Float32" else "f8")
    expected = wavkit.spectrum(plain, 8).amplitude
    table = pandas.DataFrame({"a": x, "b": x})
    named = x.set_axis([f"sample {i}" for i in range(64)])
    for found in (
        wavkit.spectrum(x).amplitude,
        wavkit.spectrum(table).amplitude["b"],
        wavkit.spectrum(x.array, 8).amplitude,
        wavkit.spectrum(pandas.Index(x), 8).amplitude,
        wavkit.spectrum(named).amplitude,
    ):
        np.testing.assert_array_equal(found, expected)
    assert wavkit.spectrum(named).frequency[-1] == 0.5  # names tell no rate
    x.iloc[3] = pandas.NA
    assert wavkit.hist(x, 2, (-1, 1)).nan == 1
    assert wavkit.fit(x.index.astype("float"), plain).slope == wavkit.fit(TIME, plain).slope


def test_dates_stay_dates_in_blocks_too():
    index = pandas.date_range("2026-03-01", periods=64, freq="125ms", tz="Europe/Berlin")
    table = pandas.DataFrame(TONES, index, ["a", "b"])
    half = wavkit.decimate(table, 2)
    assert half.index.equals(index[::2])
    assert wavkit.spectrogram(table["a"], points=16).amplitude.columns.equals(index[8:57:8])
    assert wavkit.correlate(table["a"][8:], table["a"]).best == 0
    assert wavkit.correlate(TONES[:8, 0], table["a"]).lag[1] == -6 / 8
    assert wavkit.correlate(np.empty((0, 8)), TONES[:, 0]).best.size == 0
    blocks = [table[:20], table[20:]]
    again = pandas.concat(wavkit.Resampler(8, 4).blocks(blocks))
    pandas.testing.assert_frame_equal(again, half, check_freq=False, check_names=False)
    mean = pandas.concat(wavkit.Filter([0.5, 0.5]).blocks(blocks))
    pandas.testing.assert_frame_equal(mean[1:], table.rolling(2).mean()[1:], check_freq=False)


def test_plots(tmp_path):
    matplotlib = pytest.importorskip("matplotlib")
    matplotlib.use("Agg")
    x = np.sin(np.arange(512))
    axes = wavkit.spectrum(x, 512).plot(db=True)
    (line,) = axes.get_lines()
    assert line.get_xdata()[-1] == 256 and line.get_ydata().max() > -2
    assert len(wavkit.average(np.stack([x, x]), 512, 64).plot().get_lines()) == 2
    assert wavkit.spectrogram(x, 512, 64).plot().get_ylabel() == "frequency"
    axes.figure.savefig(tmp_path / "spectrum.png")


@pytest.mark.parametrize("zone", [None, "Europe/Berlin"])
def test_dates_are_places(zone):
    index = pandas.date_range("2026-03-01", periods=64, freq="125ms", tz=zone)
    x, plain = pandas.Series(TONES[:, 0], index), TONES[:, 0].copy()
    some, seconds = index[[9, 4]], [9 / 8, 4 / 8]
    found = wavkit.interp(None, x, some)
    assert found.index.equals(some) and found.tolist() == plain[[9, 4]].tolist()
    assert wavkit.interp(index, plain, list(some)).tolist() == plain[[9, 4]].tolist()
    fits = [
        (wavkit.fit(x), wavkit.fit(plain, rate=8)),
        (wavkit.fit(index, plain), wavkit.fit(plain, rate=8)),
        (wavkit.fit_polynomial(index, plain), wavkit.fit_polynomial(plain, rate=8)),
        (wavkit.fit_sine(x), wavkit.fit_sine(plain, 8)),
    ]
    for ours, theirs in fits:
        np.testing.assert_allclose(ours(some), theirs(seconds), 1e-9)
        np.testing.assert_allclose(ours(some[1]), theirs(seconds[1]), 1e-9)
    later = pandas.Series(plain, index - index[0])
    assert wavkit.interp(None, later, [pandas.Timedelta("500ms")]).iloc[0] == plain[4]
    turned = wavkit.over_angle(x, index[::8] + pandas.Timedelta("10ms"), angles=8)
    expected = wavkit.over_angle(plain, np.arange(8) + 0.01, 8, angles=8)
    np.testing.assert_allclose(turned, expected, 1e-9)
    for refused in (
        lambda: wavkit.interp(None, plain, some, rate=8),
        lambda: wavkit.over_angle(plain, index[::8], 8),
        lambda: wavkit.fit(plain)(some),
    ):
        with pytest.raises(ValueError, match="the places are"):
            refused()
