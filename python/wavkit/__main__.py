"""The program: python -m wavkit spectrum recording.wav --plot -"""

from __future__ import annotations

import os
import shutil
import sys

from ._native import FOLDER


def program() -> str:
    """The program in the wheel, or the one that is installed."""
    ours = FOLDER / "bin" / "wavkit"
    found = str(ours) if ours.exists() else shutil.which("wavkit")
    if not found:
        raise FileNotFoundError("the program is neither in the package nor on the PATH")
    return found


def main() -> None:
    path = program()
    os.execv(path, [path, *sys.argv[1:]])


if __name__ == "__main__":
    main()
