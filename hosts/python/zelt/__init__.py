"""Image processing for instruments.

    import numpy, zelt
    root = zelt.create("ZELT.Main2")
    frame = numpy.zeros((480, 640), numpy.uint16)
    root.Statistics.Mean(frame)                      # an array is an image, without a copy
    image = zelt.image(frame, bits=12)               # the same with what the array does not say
    total = root.Basic.Add(image, 100)               # a zelt.Image; numpy.asarray(total) is its memory

Facets are attributes of the root, methods have the names and arguments of their interfaces: help(root.Statistics.Mean).
A call that fails raises zelt.Error.
"""

import os as _os

from . import _zelt
from ._errors import Error
from ._values import CoordinateFloat, CoordinateInt, FloatVector2D, RangeFloat, Rectangle, SizeInt
from ._zelt import Image, Object, Variant

__all__ = [
    "create", "image", "descriptor", "lookup_table", "imread", "imwrite", "imcount", "Error", "Image", "Object",
    "Variant", "CoordinateFloat", "CoordinateInt", "FloatVector2D", "RangeFloat", "Rectangle", "SizeInt",
]


def create(name):
    """A new object of a class by its name: "ZELT.Main2" is the root of the library, "ZELT.Main" that of its first
    generation."""
    return _zelt.create(name)


def image(array, bits=None, encoding=None):
    """An image over the memory of an array, without copying, whatever its strides. The array stays alive; what is
    written to one is in the other.

    bits      nominal depth: 12 for 12-bit data in 16-bit words
    encoding  what the array does not tell, such as "BGR" or "Complex_Float_Half_Even", as a name or a number

    Arrays of shape (height, width) are grey or complex, uint8 ones of shape (height, width, 3 or 4) colour. A read-only
    array makes a read-only image.
    """
    return _zelt.image(array, bits, encoding)


def descriptor(width, height, bits, encoding="Unsigned"):
    """What an image is to be like, for methods that make one."""
    return _zelt.descriptor(width, height, bits, encoding)


def lookup_table(entries, range):
    """A colour for each of so many equal steps of the pixel values from range[0] to range[1]. Entries are colour numbers
    (red + 256 green + 65536 blue) or rows of red, green and blue from 0 to 255."""
    import numpy

    colours = numpy.asarray(entries)
    if colours.ndim == 2 and colours.shape[1] == 3:
        colours = colours.astype(numpy.int64) @ [1, 256, 65536]
    if colours.ndim != 1 or colours.size == 0:
        raise ValueError("entries must be colour numbers, or rows of three")
    low, high = range
    return _zelt.lookup_table(colours.astype(float).tolist(), (float(low), float(high)))


def imread(path, bits=None, page=None):
    """An image from a TIFF, PNG or FITS file. bits: nominal depth of 16-bit data, where the file does not say;
    page: which one of several, from 1."""
    _os.stat(path)  # a missing file fails as for every other function
    return _zelt.read_image(_os.fspath(path), bits or 0, page or 0)


def imcount(path):
    """How many images a file holds."""
    _os.stat(path)
    return _zelt.count_images(_os.fspath(path))


def imwrite(path, image):
    """Writes an image or an array to a file; the format follows the extension (.tif, .png, .fits). The file appears whole
    or not at all."""
    _zelt.write_image(_os.fspath(path), image)


def __getattr__(name):
    """Enumerations and the classes of facets, which are made when they are first asked for."""
    if not name.startswith("_"):
        known = _zelt.known_names()
        if name not in known:
            _make_classes()
            known = _zelt.known_names()
        if name in known:
            return known[name]
    raise AttributeError(f"module 'zelt' has no attribute '{name}'")


def __dir__():
    _make_classes()
    return sorted({*globals(), *_zelt.known_names()})


def _make_classes():
    """Reads every facet once: their classes come with them."""
    for name in ("ZELT.Main", "ZELT.Main2"):
        root = create(name)
        for attribute in [n for n, a in vars(type(root)).items() if isinstance(a, property)]:
            getattr(root, attribute)
    _zelt.descriptor(0, 0, 8, 0)
