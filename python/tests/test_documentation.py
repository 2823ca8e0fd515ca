"""Every example in the documentation, with its numbers."""

import doctest
import importlib
import pkgutil
from pathlib import Path

import numpy as np
import pytest
import wavkit
from wavkit import lib

DOCS = Path(__file__).parents[2] / "docs"
PAGE = DOCS / "python.md"
MODULES = sorted(
    {"wavkit"}
    | {f"wavkit.{m.name}" for m in pkgutil.iter_modules(wavkit.__path__)} - {"wavkit.__main__"}
)
NAMES = {"np": np, "wavkit": wavkit, "lib": lib}
FLAGS = doctest.NORMALIZE_WHITESPACE | doctest.ELLIPSIS


@pytest.mark.parametrize("name", MODULES)
def test_examples_of_a_module(name, tmp_path, monkeypatch):
    monkeypatch.chdir(tmp_path)
    result = doctest.testmod(importlib.import_module(name), extraglobs=NAMES, optionflags=FLAGS)
    assert result.failed == 0


@pytest.mark.parametrize(("page", "least"), [("python.md", 40), ("many.md", 6)])
def test_examples_of_a_page(page, least, tmp_path, monkeypatch):
    monkeypatch.chdir(tmp_path)
    result = doctest.testfile(
        str(DOCS / page), module_relative=False, globs=dict(NAMES), optionflags=FLAGS
    )
    assert result.attempted >= least and result.failed == 0


def test_every_name_has_an_example():
    """Functions and classes that are called; what they return is shown by them."""
    returned = {
        "Correlation",
        "Distortion",
        "SignalPeaks",
        "Sine",
        "Error",
        "Frames",
        "Histogram",
        "Levels",
        "Line",
        "Peaks",
        "Polynomial",
        "Response",
        "SectionResponse",
        "Signal",
        "Spectrogram",
        "Spectrum",
        "Stats",
        "Transfer",
        "ZerosPoles",
        "Zoom",
        "lib",
    }
    for name in set(wavkit.__all__) - returned:
        assert ">>>" in getattr(wavkit, name).__doc__, name
    page = PAGE.read_text()
    assert [
        name for name in wavkit.__all__ if f"`{name}" not in page and f"wavkit.{name}" not in page
    ] == []
