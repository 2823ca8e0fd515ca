"""Reads the public headers and writes what the package knows of the library.

    python3 interface.py INCLUDE_DIRECTORY PACKAGE_DIRECTORY

Two modules come of it, neither written by hand: `_declarations.py`, which cffi reads without a
parser, and `_functions.py`, a Python function for every exported one, with its type hints and its
documentation.
"""

from __future__ import annotations

import keyword
import re
import sys
from dataclasses import dataclass
from pathlib import Path

from cffi import FFI

RECORDS = {"dsp *", "dspf *"}
PYTHON_TYPES = {
    "int": "int",
    "unsigned": "int",
    "uint64_t": "int",
    "double": "float",
    "float": "float",
}


@dataclass
class Parameter:
    name: str
    type: str
    may_be_null: bool = False

    @property
    def is_record(self) -> bool:
        return self.type in RECORDS

    def hint(self) -> str:
        if self.is_record:
            return "_Record | None" if self.may_be_null else "_Record"
        return "_Text" if self.type == "char *" else PYTHON_TYPES.get(self.type, "_Any")

    def passed(self) -> str:
        if self.is_record:
            pointer = f"{self.name}.pointer"
            return f"_NULL if {self.name} is None else {pointer}" if self.may_be_null else pointer
        return f"_encoded({self.name})" if self.type == "char *" else self.name


@dataclass
class Function:
    name: str
    result: str
    parameters: list[Parameter]
    documentation: str

    def documented(self, parameter: str) -> str | None:
        """What the documentation of this function says of a parameter."""
        for names, text in re.findall(
            r"^@param +(\S+) +((?:.|\n(?!@))*)", self.documentation, re.M
        ):
            if parameter in names.split(","):
                return str(text)
        return None


def in_order(directory: Path, name: str, seen: set[str]) -> str:
    """A header behind the ones that it includes, each of them once."""
    if name in seen:
        return ""
    seen.add(name)
    text = (directory / name).read_text(encoding="utf-8")
    before = [
        in_order(directory, other, seen)
        for other in re.findall(r'^#include "(\w+\.h)"', text, re.M)
    ]
    return "".join(before) + text


def without_preprocessor(text: str) -> str:
    text = re.sub(r"^#ifdef __cplusplus$.*?^#endif$", "", text, flags=re.M | re.S)
    text = re.sub(r"^#(?:.*\\\n)*.*$", "", text, flags=re.M)
    return re.sub(r"^WAVKIT_ASSERT_LAYOUT\([^;]*;", "", text, flags=re.M)


def prose(comment: str) -> str:
    """The text of a documentation comment."""
    text = re.sub(r"^ ?\*(?: {2}|/| )?", "", comment[3:-2], flags=re.M).strip()
    return re.sub(r"^@[{}]$", "", text, flags=re.M).strip()


def parameters_of(text: str) -> list[Parameter]:
    if text.strip() == "void":
        return []
    found = []
    for part in text.split(","):
        match = re.fullmatch(r"(?:const )?(\w+) ?(\*?)(\w+)", " ".join(part.split()))
        assert match, part
        kind, star, name = match.groups()
        constant_text = kind == "char" and "const" in part
        name += "_" if keyword.iskeyword(name) else ""
        found.append(
            Parameter(
                name,
                f"{kind} *"
                if star and (kind != "char" or constant_text)
                else f"{kind}[]"
                if star
                else kind,
            )
        )
    return found


def functions_of(text: str) -> list[Function]:
    """Every exported function, with the comment above it or above its twin."""
    functions, documentation = [], ""
    text = re.sub(r"/\*\*<.*?\*/", "", text, flags=re.S)
    for comment, statement in re.findall(r"(/\*.*?\*/)|WAVKIT_API\s([^;]*);", text, re.S):
        if comment:
            documentation = prose(comment)
            continue
        match = re.fullmatch(r"(\w+ \*?)\s*(\w+)\((.*)\)", " ".join(statement.split()))
        assert match, statement
        functions.append(
            Function(match[2], match[1].strip(), parameters_of(match[3]), documentation)
        )
    mark_null(functions)
    return functions


def mark_null(functions: list[Function]) -> None:
    """A record may be null where the documentation of the parameter says so, or, in a function that
    refers to another one, where it is said of a parameter of that name."""
    known = {}
    for function in functions:
        for parameter in function.parameters:
            text = function.documented(parameter.name)
            if text and re.search(r"\bnull\b", text):
                known[parameter.name] = True
    for function in functions:
        for parameter in function.parameters:
            text = function.documented(parameter.name)
            null = (
                known.get(parameter.name, False) if text is None else re.search(r"\bnull\b", text)
            )
            parameter.may_be_null = bool(null)


def constants_of(text: str) -> dict[str, int]:
    constants: dict[str, int] = {}
    for body in re.findall(
        r"^enum \{(.*?)\}", re.sub(r"/\*.*?\*/", "", text, flags=re.S), re.M | re.S
    ):
        following = 0
        for item in filter(None, map(str.strip, body.split(","))):
            name, _, value = map(str.strip, item.partition("="))
            constants[name] = int(value, 0) if value else following
            following = constants[name] + 1
    return constants


def docstring(text: str) -> str:
    text = re.sub(r"^@return +", "Returns ", text, flags=re.M)
    text = re.sub(r"^@param +(\S+) +", r"\1: ", text, flags=re.M)
    return text.replace("\\", "\\\\").replace('"""', "'''").replace("\n", "\n    ")


def definition(function: Function) -> str:
    parameters = function.parameters
    declared = ", ".join(f"{p.name}: {p.hint()}" for p in parameters)
    passed = ", ".join(p.passed() for p in parameters)
    named = "".join(f", {p.name}" for p in parameters)
    is_stream = function.result == "FILE *"
    hint, failed = ("_Any", "== _NULL") if is_stream else ("int", "< 0")
    return f'''

def {function.name}({declared}) -> {hint}:
    """{docstring(function.documentation)}
    """
    returned: {hint} = _{function.name}({passed})
    if returned {failed}:
        raise _failed({function.name}{named})
    return returned


_{function.name} = _library.{function.name}
'''


HEAD = '''"""Every exported function and constant. Made from the public headers: do not edit."""

from __future__ import annotations

import os as _os
from typing import Any as _Any

from ._native import ffi as _ffi
from ._native import library as _library
from ._record import Record as _Record
from ._record import failed as _failed

_Text = str | bytes
_NULL = _ffi.NULL
_encoded = _os.fsencode
'''


def declarations(text: str) -> str:
    """What cffi takes: no comments, no preprocessor, no export markers."""
    text = re.sub(r"/\*.*?\*/", "", text, flags=re.S).replace("WAVKIT_API ", "")
    return re.sub(r"\n\s*\n+", "\n", text)


def write(include: Path, package: Path) -> None:
    text = without_preprocessor(in_order(include / "wavkit", "dsp.h", set()))
    builder = FFI()
    builder.cdef(declarations(text))
    builder.set_source("wavkit._declarations", None)
    package.mkdir(parents=True, exist_ok=True)
    builder.emit_python_code(str(package / "_declarations.py"))
    functions, constants = functions_of(text), constants_of(text)
    parts = [HEAD, "\n", *(f"{name} = {value}\n" for name, value in constants.items())]
    parts += [definition(function) for function in functions]
    names = [*constants, *(function.name for function in functions)]
    parts.append("\n__all__ = [\n" + "".join(f'    "{name}",\n' for name in names) + "]\n")
    (package / "_functions.py").write_text("".join(parts), encoding="utf-8")


if __name__ == "__main__":
    write(Path(sys.argv[1]), Path(sys.argv[2]))
