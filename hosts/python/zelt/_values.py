"""Small values that calls give and take, as tuples; enumerations; collections."""

import collections.abc
import enum
import keyword
from typing import NamedTuple

CoordinateInt = NamedTuple("CoordinateInt", [("X", int), ("Y", int)])
CoordinateInt.__doc__ = "A pixel's place."
CoordinateFloat = NamedTuple("CoordinateFloat", [("X", float), ("Y", float)])
CoordinateFloat.__doc__ = "A place between pixels."
Rectangle = NamedTuple("Rectangle", [("Left", int), ("Top", int), ("Right", int), ("Bottom", int)])
Rectangle.__doc__ = "A part of an image; right and bottom are exclusive."
FloatVector2D = NamedTuple("FloatVector2D", [("X", float), ("Y", float)])
FloatVector2D.__doc__ = "A direction with a length."
SizeInt = NamedTuple("SizeInt", [("Width", int), ("Height", int)])
SizeInt.__doc__ = "Width and height in pixels."
RangeFloat = NamedTuple("RangeFloat", [("Low", float), ("High", float)])
RangeFloat.__doc__ = "Two bounds."

for _tuple in (CoordinateInt, CoordinateFloat, Rectangle, FloatVector2D, SizeInt, RangeFloat):
    _tuple.__module__ = "zelt"


class Collection(collections.abc.Sequence):
    """Objects of the library that count and hand out items: sequences."""

    __slots__ = ()

    def __len__(self):
        return self.Count

    def __getitem__(self, index):
        if isinstance(index, slice):
            return [self.Item(i) for i in range(*index.indices(len(self)))]
        count = len(self)
        if not -count <= index < count:
            raise IndexError("there are only %d items" % count)
        return self.Item(index + count if index < 0 else index)


def make_enumeration(name, values):
    """ZELT_Rounding.Saturate from ("ZELT_Rounding_Saturate", 3); names without the prefix stay, None becomes None_."""
    prefix = name + "_"
    short = [(n[len(prefix):] if n.startswith(prefix) else n, v) for n, v in values]
    members = [(n + "_" if keyword.iskeyword(n) else n, v) for n, v in short]
    return enum.IntEnum(name, members, module="zelt", qualname=name)


def enumeration_value(enumeration, value):
    """A member, or the number where there is none."""
    try:
        return enumeration(value)
    except ValueError:
        return value
