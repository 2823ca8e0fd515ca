"""Records, ownership, errors and threads of `wavkit.lib`."""

import gc
import pickle
import re
import subprocess
import sys
import threading
from concurrent.futures import ThreadPoolExecutor

import numpy as np
import pytest
import wavkit
from wavkit import lib

MASKED = np.ma.masked_equal([1.0, 2.0], 2.0)
DTYPES = ["f4", "f8", "c8", "c16"]


def test_every_exported_name_is_there():
    from wavkit._native import find

    symbols = subprocess.run(
        ["nm", "-D", "--defined-only", find()], capture_output=True, text=True, check=True
    )
    exported = set(re.findall(r" T (\w+)", symbols.stdout))
    assert len(exported) > 300 and exported == {
        name for name in lib.__all__ if name.startswith("dsp")
    }


def test_a_function_is_documented_and_typed():
    assert (
        "arithmetic mean" in lib.dsps_mean.__doc__.lower() and "empty" not in lib.dsps_mean.__doc__
    )
    assert lib.dspfs_mean.__doc__ == lib.dsps_mean.__doc__
    assert lib.dspd_fir.__annotations__["state"] == "_Record | None"
    assert lib.dspb_cspline_2d.__annotations__["y2"] == "_Record"
    assert (
        lib.DSP_SPLINE_NATURAL == 3
        and lib.DSP_EDGE_FALLING == -1
        and lib.DSP_PEAK_SMALLEST == 0x2000
    )


@pytest.mark.parametrize("dtype", DTYPES)
def test_records_borrow_arrays(dtype):
    x = np.arange(5).astype(dtype)
    with lib.Record(x, delta=0.5) as record:
        scale = lib.dspfi_scale if record.single else lib.dspi_scale
        scale(record, 2.0)
        assert (record.points, record.delta, record.dtype) == (5, 0.5, x.dtype)
        assert np.shares_memory(record.take(), x)
    assert x.tolist() == [0, 2, 4, 6, 8]


@pytest.mark.parametrize(
    "change",
    [
        lambda x: np.repeat(x, 2)[::2],
        lambda x: x[::-1][::-1].astype(x.dtype.newbyteorder(">")),
        lambda x: np.frombuffer(x.tobytes(), x.dtype),
        lambda x: np.frombuffer(b"." + x.tobytes(), np.uint8)[1:].view(x.dtype),
        lambda x: x.tolist(),
    ],
    ids=["strided", "foreign", "read-only", "unaligned", "list"],
)
@pytest.mark.parametrize("dtype", DTYPES)
def test_what_cannot_be_borrowed_is_copied(dtype, change):
    given = change(np.array([1, 2, 4, 8], dtype))
    with lib.Record(given) as record:
        (lib.dspfi_neg if record.single else lib.dspi_neg)(record)
        assert record.take().tolist() == [-1, -2, -4, -8]
    assert np.asarray(given).tolist() == [1, 2, 4, 8]


@pytest.mark.parametrize(
    ("samples", "error"),
    [(np.zeros((2, 2)), ValueError), (["a"], TypeError), (3.0, ValueError), (MASKED, ValueError)],
)
def test_what_is_no_signal_is_refused(samples, error):
    with pytest.raises(error):
        lib.Record(samples)


def test_growing_leaves_the_array_alone():
    x = np.ones(3)
    with lib.Record(x) as record:
        lib.dspi_zpad(record, 5)
        assert record.take().tolist() == [1, 1, 1, 0, 0] and x.tolist() == [1, 1, 1]
        assert len(record) == 0 and record.take().size == 0


def test_results_own_their_memory():
    with lib.Record(np.arange(1000.0)) as x, lib.Record() as out:
        lib.dsp_copy(out, x)
        result = out.take()
        lib.dsp_copy(out, x)
    gc.collect()
    blocks = [np.ones(1000) for _ in range(100)]
    assert result.flags.writeable and np.array_equal(result, np.arange(1000.0)) and blocks


def test_a_lent_array_is_held_and_let_go():
    x = np.ones(4)
    before = sys.getrefcount(x)
    record = lib.Record(x)
    assert sys.getrefcount(x) > before
    record.release()
    assert sys.getrefcount(x) == before
    with lib.Record(x):
        pass
    lib.Record(x)
    wavkit.stats(x), wavkit.spectrum(x), wavkit.Filter([1.0])(x)
    gc.collect()
    assert sys.getrefcount(x) == before


def resident():
    with open("/proc/self/statm") as file:
        return int(file.read().split()[1]) * 4096


def least_growth(work):
    """Of three times: a leak comes each time, what the rest of the process keeps does not."""
    places = [resident()]
    for _ in range(3):
        work()
        places.append(resident())
    return np.diff(places).min()


def test_a_million_calls_take_no_memory():
    """Of 16 points and more each: a leak of a block in every call would show 60 times over."""
    x = np.ones(16)

    def work(times):
        for _ in range(times):
            with lib.Record(x) as record, lib.Record() as out:
                for _ in range(12):
                    lib.dspu_mag(record, out), lib.dsp_destroy(out)
                lib.dspu_mag(record, out)
                out.take()

    work(1000)
    assert least_growth(lambda: work(40_000)) < 4 << 20


def test_faces_take_no_memory():
    x = np.ones((2, 64), np.float32)
    calls = [
        lambda: wavkit.spectrum(x, 1.0).peaks(2),
        lambda: wavkit.filter(x, taps=[0.5, 0.5]),
        lambda: wavkit.resample(x, 1, 2, "fast"),
        lambda: wavkit.stats(x),
        lambda: pytest.raises(wavkit.Error, wavkit.roots, [1j, 1]),
    ]
    for call in calls * 30:
        call()

    def work():
        for call in calls * 300:
            call()

    assert least_growth(work) < 4 << 20


def test_failures_say_which_call_and_why():
    with pytest.raises(
        wavkit.Error,
        match=r"dspb_mul\(<dsp: 3 real .*<dsp: 2 real.* failed: when the lengths differ",
    ):
        lib.dspb_mul(lib.Record(np.ones(3)), lib.Record(np.ones(2)), lib.Record())
    with pytest.raises(wavkit.Error) as caught:
        lib.dspfi_window(lib.Record(np.ones(4, "f4")), 99, 0)
    assert caught.value.function == "dspfi_window"
    again = pickle.loads(pickle.dumps(caught.value))
    assert str(again) == str(caught.value) and again.reason == caught.value.reason
    with pytest.raises(wavkit.Error, match=r"see help\(wavkit.lib.dspc_iir_zpk\)"):
        wavkit.design_zpk("lowpass", 0.1, order=0)
    for wrong in (lib.Record(np.ones(3, "f4")), None, np.ones(3)):
        with pytest.raises((TypeError, AttributeError)):
            lib.dspi_neg(wrong)


def test_pointers_and_hooks():
    verdict = lib.ffi.new("int *")
    lib.dsp_cmp(lib.Record([1.0, 3.0]), lib.Record([1.0, 2.0]), 0.0, verdict)
    assert verdict[0] == 1
    before = lib.ffi.new("dsp_free_hook *")
    lib.dsp_lib_free(lib.ffi.NULL, before)
    assert before[0] == lib.ffi.NULL


def test_threads_get_the_results_of_one():
    rng = np.random.default_rng(7)
    signals = [rng.normal(size=1000 + 37 * i).astype(DTYPES[i % 2]) for i in range(24)]

    def measure(x):
        return (
            wavkit.spectrum(x, 8, "flattop").bins,
            wavkit.filter(x, 8, lowpass=1),
            wavkit.stats(x).rms,
        )

    with ThreadPoolExecutor(8) as pool:
        many = list(pool.map(measure, signals * 4))
    for (bins, filtered, rms), x in zip(many, signals * 4):
        expected = measure(x)
        assert np.array_equal(bins, expected[0]) and rms == expected[2]
        # Filters use the spectrum of the taps that their thread has, of whatever length.
        np.testing.assert_allclose(filtered, expected[1], atol=8 * np.finfo(x.dtype).eps)


def test_the_interpreter_is_free_while_the_library_works():
    x = lib.Record(np.ones(1 << 22, complex))
    started, turns = threading.Event(), 0

    def work():
        started.set()
        lib.dspi_fft(x, 0)

    thread = threading.Thread(target=work)
    before = sys.getswitchinterval()
    sys.setswitchinterval(1e-5)
    thread.start()
    started.wait()
    while thread.is_alive():
        turns += 1
    sys.setswitchinterval(before)
    assert turns > 1000


def test_the_program():
    told = subprocess.run(
        [sys.executable, "-m", "wavkit", "roots", "6", "-5", "1", "--json"],
        capture_output=True,
        text=True,
    )
    assert told.returncode == 0 and '"roots"' in told.stdout
    assert (
        subprocess.run([sys.executable, "-m", "wavkit", "nonsense"], capture_output=True).returncode
        == 2
    )
