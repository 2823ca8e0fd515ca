"""The example notebook, without Jupyter: what it prints and draws is what it shows."""

import contextlib
import io
import json
from pathlib import Path

import matplotlib

EXAMPLES = Path(__file__).parents[2] / "examples"


def shown(cell):
    """The text that is kept with a cell, and the number of its pictures."""
    kinds = [output["output_type"] for output in cell["outputs"]]
    assert set(kinds) <= {"stream", "display_data"}, "only what it prints and draws can be compared"
    text = "".join(
        part for output in cell["outputs"] if "name" in output for part in output["text"]
    )
    return text, kinds.count("display_data")


def test_cells_give_what_is_shown(monkeypatch):
    matplotlib.use("Agg")
    from matplotlib import pyplot

    pyplot.close("all")  # those of other tests
    monkeypatch.chdir(EXAMPLES)
    notebook = json.loads(Path("report.ipynb").read_text(encoding="utf-8"))
    names, pictures = {"__name__": "report"}, 0
    for cell in notebook["cells"]:
        if cell["cell_type"] != "code":
            continue
        with contextlib.redirect_stdout(io.StringIO()) as printed:
            exec("".join(cell["source"]), names)
        figures = [pyplot.figure(number) for number in pyplot.get_fignums()]
        for figure in figures:
            figure.canvas.draw()
        pyplot.close("all")
        assert (printed.getvalue(), len(figures)) == shown(cell)
        pictures += len(figures)
    assert pictures >= 5
