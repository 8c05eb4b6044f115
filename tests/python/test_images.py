"""Arrays as images and images as arrays: the same memory, or a refusal that says why."""

import ctypes
import gc
import io
import pickle
import weakref
import zlib

import numpy as np
import pytest
from conftest import views

import zelt


def place(array):
    array = np.asarray(array)
    return array.__array_interface__["data"][0], array.shape, array.strides, array.dtype


@pytest.mark.parametrize("dtype", ["uint8", "int16", "float32", "complex128"])
def test_any_layout_is_the_same_memory_both_ways(root, dtype):
    for name, whole, view in views(dtype):
        before, expected = whole.copy(), view + 1
        image = zelt.image(view)
        assert place(image) == place(view), name
        root.Basic.Add(image, np.float32(1) if dtype == "complex128" else 1, image)
        assert np.array_equal(view, expected), name
        np.asarray(image)[...] -= 1
        assert np.array_equal(whole, before), f"{name}: pixels outside the view were written"


def test_what_an_array_says_is_what_the_image_is():
    for dtype, encoding, bits in [("uint8", 0, 8), ("uint16", 0, 16), ("uint32", 0, 32), ("uint64", 0, 64), ("int8", 1, 8),
                                  ("int16", 1, 16), ("int32", 1, 32), ("int64", 1, 64), ("float32", 2, 32),
                                  ("float64", 2, 64), ("complex64", 10, 64), ("complex128", 10, 128)]:
        image = zelt.image(np.zeros((3, 5), dtype))
        assert (image.width, image.height, image.shape, image.dtype) == (5, 3, (3, 5), np.dtype(dtype))
        assert (image.encoding, image.bits, image.readonly) == (encoding, bits, False)
    for channels, default, other in [(3, "RGB", "BGR"), (4, "RGBA", "BGRA")]:
        pixels = np.zeros((3, 5, channels), "uint8")
        assert zelt.image(pixels).encoding.name == default
        image = zelt.image(pixels, encoding=other)
        assert (image.encoding.name, image.bits, image.shape) == (other, 8 * channels, pixels.shape)
        assert place(image) == place(pixels)
    half = zelt.image(np.zeros((4, 3), "complex64"), encoding=zelt.PixmatEncoding.Complex_Float_Half_Odd)
    assert half.encoding == 17 and half.dtype == "complex64"


def test_twelve_bits_stay_twelve(root):
    frame = np.full((4, 4), 4000, "uint16")
    image = zelt.image(frame, bits=12)
    assert image.bits == 12 and place(image) == place(frame)
    root.Rounding = zelt.ZELT_Rounding.Saturate
    assert np.asarray(root.Basic.Add(image, 1000)).max() == 4095
    assert zelt.image(image) is image
    assert zelt.image(image, bits=10).bits == 10


@pytest.mark.parametrize("array, type, text", [
    (np.zeros((2, 2), ">u2"), TypeError, "other order"),
    (np.zeros((2, 2), ">f8"), TypeError, "newbyteorder"),
    (np.zeros((2, 2), "float16"), TypeError, "astype('float32')"),
    (np.zeros((2, 2), "longdouble"), TypeError, "astype('float64')"),
    (np.zeros((2, 2), bool), TypeError, "view('uint8')"),
    (np.zeros((2, 2), object), TypeError, "no pixels; array.astype('float64')"),
    (np.zeros((2, 2), "datetime64[s]"), TypeError, "not known"),
    (np.zeros(4, "uint8"), ValueError, r"(4,)"),
    (np.uint8(4).reshape(()), ValueError, "shape ()"),
    (np.zeros((2, 2, 2), "uint8"), ValueError, "(2, 2, 2)"),
    (np.zeros((2, 2, 3), "uint16"), TypeError, "colours are uint8"),
    (np.zeros((2, 2, 3), "uint8")[..., ::-1], ValueError, "beside each other"),
    (np.ma.zeros((2, 2), "uint8"), TypeError, "no mask"),
    ([[1, 2], [3, 4]], TypeError, "numpy.array"),
    ("pixels", TypeError, "not str"),
    (np.frombuffer(b"\0" * 9, "u1")[1:].view("u2").reshape(2, 2), ValueError, "aligned"),
], ids=lambda v: None)
def test_what_is_no_image_is_refused_with_the_reason(root, array, type, text):
    with pytest.raises(type) as raised:
        zelt.image(array)
    assert text in str(raised.value)
    with pytest.raises(TypeError if isinstance(array, (list, str)) else type):
        root.Statistics.Mean(array)


@pytest.mark.parametrize("options, text", [
    ({"bits": 12}, "do not have 12 bits"), ({"encoding": "Signed"}, "Signed"), ({"encoding": "RGB"}, "RGB"),
    ({"encoding": "Purple"}, "no encoding 'Purple'"), ({"encoding": "Complex_Float"}, "Complex_Float"),
])
def test_a_depth_or_encoding_that_does_not_fit_is_refused(options, text):
    with pytest.raises(ValueError, match=text):
        zelt.image(np.zeros((2, 2), "uint8"), **options)


def test_a_read_only_array_is_read_and_never_written(root):
    frame = np.arange(16, dtype="uint8").reshape(4, 4)
    frame.flags.writeable = False
    wide = np.broadcast_to(np.uint8(3), (4, 4))
    for pixels in (frame, wide):
        image = zelt.image(pixels)
        assert image.readonly and "read-only" in repr(image)
        assert not np.asarray(image).flags.writeable
        assert root.Statistics.Mean(image) == pixels.mean()
        before = pixels.copy()
        for target in (image, pixels):
            with pytest.raises(zelt.Error, match="read-only image .pIOutImg.") as raised:
                root.Basic.Add(np.ones((4, 4), "uint8"), 1, target)
            assert raised.value.hresult == 0x80070005
        assert np.array_equal(pixels, before)
        with pytest.raises((BufferError, TypeError), match="read-write|read-only"):
            io.BytesIO(b"new pixels").readinto(image)


def test_memory_that_is_no_array_is_taken_too():
    frame = np.arange(12, dtype="int16").reshape(3, 4)

    class Interface:
        __array_interface__ = frame.__array_interface__

    class DLPack:
        def __dlpack__(self, **names):
            return frame.__dlpack__()

        def __dlpack_device__(self):
            return frame.__dlpack_device__()

    for lender in (memoryview(frame), Interface(), DLPack(), zelt.image(frame)):
        assert place(zelt.image(lender)) == place(frame)


def test_every_exchange_of_pixels_shows_the_same_memory(root):
    for name, _, view in views("uint16"):
        image = zelt.image(view)
        for way in (np.asarray, np.from_dlpack, memoryview, lambda i: i.__array__()):
            assert place(way(image)) == place(view), name
    colour = np.arange(60, dtype="uint8").reshape(4, 5, 3)
    assert np.array_equal(np.from_dlpack(zelt.image(colour)), colour)
    result = root.Basic.Add(view, 1)
    assert place(np.from_dlpack(result)) == place(result)
    assert result.__dlpack_device__() == (1, 0)
    assert np.asarray(result, dtype="float64").dtype == "float64"


def test_dlpack_says_that_pixels_are_read_only():
    frame = np.zeros((2, 2), "uint8")
    image = zelt.image(frame)
    frame.flags.writeable = False
    locked = zelt.image(frame)
    flags = lambda capsule: ctypes.c_uint64.from_address(address(capsule, b"dltensor_versioned") + 24).value
    assert flags(image.__dlpack__(max_version=(1, 0))) == 0
    assert flags(locked.__dlpack__(max_version=(1, 0))) == 1
    with pytest.raises(BufferError, match="read-only"):
        locked.__dlpack__()
    with pytest.raises(BufferError):
        image.__dlpack__(copy=True)


def address(capsule, name):
    get = ctypes.pythonapi.PyCapsule_GetPointer
    get.restype, get.argtypes = ctypes.c_void_p, [ctypes.py_object, ctypes.c_char_p]
    return get(capsule, name)


def test_flat_buffers_only_of_rows_without_gaps():
    frame = np.arange(24, dtype="uint8").reshape(4, 6)
    assert bytes(zelt.image(frame)) == frame.tobytes()
    assert bytes(zelt.image(frame[:, ::2])) == frame[:, ::2].tobytes()
    ctypes.c_char.from_buffer(zelt.image(frame)).value = b"\x63"
    assert frame[0, 0] == 99
    with pytest.raises(BufferError, match="gap"):
        zlib.crc32(zelt.image(frame[:, ::2]))


def test_each_keeps_alive_what_it_shows(root):
    frame = np.full((64, 64), 7, "uint8")
    gone = weakref.ref(frame)
    image = zelt.image(frame)
    del frame
    gc.collect()
    assert gone() is not None and root.Statistics.Mean(image) == 7
    del image
    assert gone() is None

    result = root.Basic.Add(np.full((64, 64), 7, "uint8"), 1)
    gone = weakref.ref(result)
    lent = [np.asarray(result), np.from_dlpack(result), memoryview(result)]
    del result
    while lent:
        assert np.all(np.asarray(lent[-1]) == 8) and gone() is not None
        lent.pop()
    assert gone() is None


def test_one_image_is_one_object(root):
    out = zelt.image(np.zeros((4, 4), "uint8"))
    assert root.Basic.Add(np.ones((4, 4), "uint8"), 1, out) is out


def test_statistics_follow_pixels_that_python_writes(root):
    mean = root.Statistics.Mean
    frame = np.zeros((4, 4), "uint8")
    image, result = zelt.image(frame), root.Basic.Add(frame, 0)
    shown = np.asarray(result)
    for value in (1, 2):
        frame[...] = shown[...] = value
        assert mean(image) == mean(result) == value
    del shown
    kept = result.__array_interface__["data"][0]
    ctypes.c_uint8.from_address(kept).value = 18
    assert mean(result) == 3


def test_copies_are_packed_and_apart():
    frame = np.arange(24, dtype="uint16").reshape(4, 6)
    image = zelt.image(frame[::-1, ::2], bits=12)
    for copy in (image.copy(), pickle.loads(pickle.dumps(image))):
        assert copy.bits == 12 and np.asarray(copy).flags.c_contiguous
        assert np.array_equal(copy, image)
        np.asarray(copy)[...] = 0
    assert frame.sum() == 276


def test_pixels_without_a_type_are_bytes(root):
    for width, height in ((0, 0), (0, 3), (3, 0)):
        assert np.asarray(zelt.image(np.zeros((height, width)))).shape == (height, width)
