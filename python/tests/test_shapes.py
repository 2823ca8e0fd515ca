"""Every layout of arrays, and the coordinates of xarray and pandas."""

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
    for wrong in ({"points": 0}, {"overlap": 100}, {"type": "mean"}, {"points": 99}):
        with pytest.raises(ValueError):
            wavkit.average(np.ones(50), **{"points": 10, **wrong})


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
    uneven = x.assign_coords(time=TIME**2)
    with pytest.raises(ValueError, match="equally spaced"):
        wavkit.spectrum(uneven, axis="time")


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
