"""What images of the library show and give to others."""

import numpy as np

from . import _zelt

MOST_PIXELS_SHOWN = 1024  # of a side


def as_array(image, dtype=None, copy=None):
    """The image's own memory as an array; a copy where another type is wanted."""
    array = np.asarray(memoryview(image))
    if dtype is not None and array.dtype != dtype:
        if copy is False:
            raise ValueError(f"pixels of {array.dtype} cannot be seen as {dtype} without a copy")
        return array.astype(dtype)
    return array.copy() if copy else array


def text(image):
    name = getattr(image.encoding, "name", image.encoding)
    return f"<zelt.Image {image.width} x {image.height}, {name} {image.bits}{', read-only' if image.readonly else ''}>"


def _picture(image):
    """The pixels in eight bits, grey or colour, no larger than a screen."""
    step = max(1, -(-max(image.width, image.height) // MOST_PIXELS_SHOWN))
    pixels = np.asarray(image)[::step, ::step]
    if pixels.ndim == 3:
        name = getattr(image.encoding, "name", "")
        if name in ("BGR", "BGRA"):
            pixels = pixels[..., [2, 1, 0, *range(3, pixels.shape[2])]]
        return np.ascontiguousarray(pixels) if name in ("RGB", "RGBA", "BGR", "BGRA") else None
    if pixels.dtype == np.uint8:
        return np.ascontiguousarray(pixels)
    if pixels.dtype.kind == "c":
        pixels = np.log1p(np.abs(pixels))
    pixels = pixels.astype(np.float64)
    known = pixels[np.isfinite(pixels)]
    low, high = (known.min(), known.max()) if known.size else (0, 0)
    scaled = (pixels - low) * (255 / (high - low)) if high > low else np.zeros_like(pixels)
    return np.rint(np.nan_to_num(scaled, nan=0, posinf=255, neginf=0)).astype(np.uint8)


def png(image):
    """The picture that notebooks show: values from the least to the greatest. None when there is nothing to see."""
    if image.width == 0 or image.height == 0:
        return None
    picture = _picture(image)
    return None if picture is None else _zelt.png_of(_zelt.image(picture, None, None))


def reduce(image):
    from . import image as make

    return make, (np.array(image), image.bits, int(image.encoding))
