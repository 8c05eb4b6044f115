#!/usr/bin/python3
"""Writes the type stubs of the package from the interface tables: write_stubs.py FILE"""

import enum
import sys

import zelt
from zelt import _describe, _zelt

HEAD = '''# Written from the interface tables by write_stubs.py.
import enum
import os
from collections.abc import Sequence
from typing import Any, NamedTuple

import numpy as np
from numpy.typing import ArrayLike, NDArray

class Error(RuntimeError):
    hresult: int
    description: str
    source: str
    def __init__(self, hresult: int, description: str, source: str = ...) -> None: ...

class Object: ...

class Variant:
    def __init__(self, type: str | int, value: Any) -> None: ...
    @property
    def type(self) -> str: ...
    @property
    def value(self) -> Any: ...

class Image:
    @property
    def width(self) -> int: ...
    @property
    def height(self) -> int: ...
    @property
    def bits(self) -> int: ...
    @property
    def encoding(self) -> PixmatEncoding: ...
    @property
    def shape(self) -> tuple[int, ...]: ...
    @property
    def dtype(self) -> np.dtype[Any]: ...
    @property
    def readonly(self) -> bool: ...
    @property
    def __array_interface__(self) -> dict[str, Any]: ...
    def __array__(self, dtype: Any = ..., copy: bool | None = ...) -> NDArray[Any]: ...
    def __dlpack__(self, *, stream: Any = ..., max_version: tuple[int, int] | None = ...,
                   dl_device: tuple[int, int] | None = ..., copy: bool | None = ...) -> Any: ...
    def __dlpack_device__(self) -> tuple[int, int]: ...
    def copy(self) -> Image: ...
    def changed(self) -> None: ...

def create(name: str) -> Any: ...
def image(array: ArrayLike, bits: int | None = ..., encoding: PixmatEncoding | int | str | None = ...) -> Image: ...
def descriptor(width: int, height: int, bits: int,
               encoding: PixmatEncoding | int | str = ...) -> IPixmatDescriptor: ...
def lookup_table(entries: ArrayLike, range: tuple[float, float]) -> Object: ...
def imread(path: str | os.PathLike[str], bits: int | None = ..., page: int | None = ...) -> Image: ...
def imcount(path: str | os.PathLike[str]) -> int: ...
def imwrite(path: str | os.PathLike[str], image: Image | ArrayLike) -> None: ...
'''


def value_class(kind):
    fields = "".join(f"    {name}: {type.__name__}\n" for name, type in kind.__annotations__.items())
    return f"class {kind.__name__}(NamedTuple):\n{fields}"


def method(name, row):
    arguments = ["self"]
    for a in _describe.inputs_of(row):
        optional = " | None = ..." if a["optional"] else ""
        arguments.append(f"{a['name']}: {_describe.type_of(a)}{optional}")
    return f"    def {name}({', '.join(arguments)}) -> {_describe.result_of(row)}: ...\n"


def interface(kind):
    body = ""
    bases = [b.__name__ for b in kind.__bases__ if b is zelt.Object]
    for name, attribute in vars(kind).items():
        if name.startswith("_"):
            continue
        if not isinstance(attribute, property):
            body += method(name, attribute._row)
            continue
        body += f"    @property\n    def {name}(self) -> {_describe.result_of(attribute.fget._row)}: ...\n"
        if attribute.fset:
            value = _describe.inputs_of(attribute.fset._row)[0]
            body += f"    @{name}.setter\n    def {name}(self, value: {_describe.type_of(value)}) -> None: ...\n"
    return f"class {kind.__name__}({', '.join(bases)}):\n{body or '    ...' + chr(10)}"


def enumeration(kind):
    return f"class {kind.__name__}(enum.IntEnum):\n" + "".join(f"    {m.name} = {int(m)}\n" for m in kind)


def names_in(kinds):
    """Interfaces that signatures name."""
    for kind in kinds:
        for attribute in vars(kind).values():
            row = getattr(getattr(attribute, "fget", attribute), "_row", None)
            for a in row["arguments"] if row else []:
                if a["vartype"] == _describe.OBJECT:
                    yield from (n for n in _describe.type_of(a).replace("|", " ").split() if n.startswith("I"))


def main():
    zelt._make_classes()
    known = _zelt.known_names()
    enumerations = [k for k in known.values() if issubclass(k, enum.Enum)]
    interfaces = [k for k in known.values() if issubclass(k, zelt.Object)]
    values = [getattr(zelt, n) for n in zelt.__all__ if hasattr(getattr(zelt, n), "_fields")]
    parts = [HEAD]
    parts += map(value_class, values)
    parts += map(enumeration, sorted(enumerations, key=lambda k: k.__name__))
    parts += map(interface, sorted(interfaces, key=lambda k: k.__name__))
    # What only comes as a result has no object to be described by here.
    others = sorted(set(names_in(interfaces)) - set(known) - {"Image"})
    parts += [f"class {name}(Object):\n    def __getattr__(self, name: str) -> Any: ...\n" for name in others]
    with open(sys.argv[1], "w") as file:
        file.write("\n".join(parts))


main()
