"""Many recordings on a cluster of several processes, and long ones in pieces."""

import os

import dask.array as da
import numpy as np
import pandas
import pytest
import wavkit
import wavkit.dask
from distributed import Client, LocalCluster

RNG = np.random.default_rng(11)


@pytest.fixture(scope="module")
def client():
    with LocalCluster(n_workers=2, threads_per_worker=1, dashboard_address=":0") as cluster:
        with Client(cluster) as client:
            client.wait_for_workers(2, timeout=60)
            yield client


@pytest.fixture
def files(tmp_path):
    paths = [tmp_path / f"{i:02}.dsp" for i in range(20)]
    for i, path in enumerate(paths):
        wavkit.write(path, np.full(100, float(i)), 50)
    return [str(path) for path in paths]


def test_every_file_is_measured(client, files):
    found = wavkit.dask.measure(
        files, lambda s: (s.rate, float(wavkit.stats(s.samples).rms)), client
    )
    assert list(found.results.items()) == [(path, (50, i)) for i, path in enumerate(files)]
    assert found.errors == {}


def test_a_worker_that_dies_loses_nothing(client, files, tmp_path):
    marker, at_work = str(tmp_path / "died"), client.run(os.getpid)

    def what(signal):
        if signal.samples[0] == 7 and not os.path.exists(marker):
            open(marker, "w").close()
            os._exit(1)
        return float(signal.samples.sum())

    found = wavkit.dask.measure(files, what, client)
    assert found.results == {path: 100.0 * i for i, path in enumerate(files)} and not found.errors
    client.wait_for_workers(2, timeout=60)
    assert set(client.run(os.getpid).values()) != set(at_work.values())


def test_damaged_files_are_told_beside_the_results(client, files):
    with open(files[3], "r+b") as file:
        file.truncate(400)
    os.remove(files[4])

    def what(signal):
        return 1 / (signal.samples[0] - 5)

    found = wavkit.dask.measure(files, lambda s: what(s) if s.samples[0] != 9 else 1 // 0, client)
    assert list(found.errors) == [files[3], files[4], files[9]] and len(found.results) == 17
    assert isinstance(found.errors[files[3]], wavkit.Error)
    assert "cut short" in found.errors[files[3]].reason
    assert isinstance(found.errors[files[9]], ZeroDivisionError)


@pytest.mark.parametrize("type", ["linear", "max", "min", "harmonic", "log", "last"])
def test_merged_averages_are_those_of_one_pass(client, type):
    x = RNG.normal(size=20_011)
    for pieces, overlap, data in ((1, 50, x), (7, 75, da.from_array(x, chunks=3000)), (99, 0, x)):
        options = {"overlap": overlap, "type": type, "detrend": True}
        once = wavkit.average(x, 100, 500, "blackman", **options)
        merged = wavkit.dask.average(data, 100, 500, "blackman", pieces=pieces, **options)
        np.testing.assert_allclose(merged.density, once.density, rtol=1e-12, atol=0)
        assert np.array_equal(merged.frequency, once.frequency)


def test_merged_averages_keep_coordinates():
    x = pandas.Series(RNG.normal(size=5000), 3 + np.arange(5000) / 98)
    once, merged = (f(x, points=500).density for f in (wavkit.average, wavkit.dask.average))
    pandas.testing.assert_series_equal(merged, once)


@pytest.mark.parametrize("options", [{"type": "every"}, {"forget": 5}, {"type": "mean"}])
def test_averages_that_cannot_be_merged_are_refused(options):
    with pytest.raises(ValueError, match="merged"):
        wavkit.dask.average(np.ones(5000), **options)


def random_chunks(points):
    cuts = np.sort(RNG.integers(1, points, 9))
    return tuple(int(n) for n in np.diff([0, *cuts, points]) if n)


@pytest.mark.parametrize(
    "options",
    [
        {"lowpass": 5},
        {"bandstop": (20, 30), "highpass": 2, "hold": True},
        {"taps": RNG.normal(size=40)},
        {"taps": [1, 2j], "delay": 1},
    ],
)
def test_filtered_chunks_are_those_of_one_pass(client, options):
    x = RNG.normal(size=(2, 4000))
    chunks = wavkit.dask.filter(da.from_array(x, chunks=(1, random_chunks(4000))), 100, **options)
    found = chunks.compute()
    expected = wavkit.filter(x, 100, **options)
    assert found.dtype == chunks.dtype == expected.dtype and chunks.shape == expected.shape
    np.testing.assert_allclose(found, expected, atol=1e-12)


@pytest.mark.parametrize("hold", [False, True])
def test_arrays_shorter_than_the_taps_are_filtered(hold):
    x = RNG.normal(size=(3, 9))
    found = wavkit.dask.filter(da.from_array(x, chunks=(2, 4)), 100, lowpass=5, hold=hold)
    np.testing.assert_allclose(found.compute(), wavkit.filter(x, 100, lowpass=5, hold=hold))


@pytest.mark.parametrize(("rate", "new_rate"), [(3, 2), (2, 3), (44100, 48000), (10, 1), (1, 1)])
def test_resampled_chunks_are_those_of_one_pass(client, rate, new_rate):
    x = RNG.normal(size=(9001, 2)).astype("f4")
    chunks = da.from_array(x, chunks=(random_chunks(9001), 2))
    found = wavkit.dask.resample(chunks, rate, new_rate, "fast", axis=0)
    expected = wavkit.resample(x, rate, new_rate, "fast", axis=0)
    assert found.shape == expected.shape
    np.testing.assert_allclose(found.compute(), expected, atol=2e-6)


def test_chunks_too_short_for_a_ratio_are_refused():
    with pytest.raises(ValueError, match="shorter than 8820"):
        wavkit.dask.resample(da.ones(10_000, chunks=500), 44100, 44105)
