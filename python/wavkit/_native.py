"""The shared library, looked for and opened."""

from __future__ import annotations

import os
from pathlib import Path
from typing import Any

from ._declarations import ffi as _ffi

NAME = "libwavkit.so.2"

#: Where the wheel keeps the library and the program.
FOLDER = Path(__file__).parent / "_native"


def find() -> str:
    """The file or folder that WAVKIT_LIBRARY names, else what the wheel brought, else whatever the
    system's loader finds."""
    named = os.environ.get("WAVKIT_LIBRARY")
    if named:
        return str(Path(named) / NAME) if Path(named).is_dir() else named
    ours = FOLDER / "lib" / NAME
    return str(ours) if ours.exists() else NAME


ffi: Any = _ffi
library: Any = ffi.dlopen(find())
