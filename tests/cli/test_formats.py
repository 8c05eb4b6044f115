"""Every format and depth goes through the program and comes out as it was."""

import numpy as np
import pytest
import tifffile
from PIL import Image

from conftest import pixels, read_fits, write_fits

REAL = ["u1", "u2", "u4", "u8", "i1", "i2", "i4", "i8", "f4", "f8"]


@pytest.mark.parametrize("order", "<>")
@pytest.mark.parametrize("big", [False, True])
def test_tiff_keeps_every_pixel_type(zelt, order, big):
    for dtype in [*REAL, "c8", "c16"]:
        image = pixels((5, 7), dtype)
        tifffile.imwrite(zelt.folder / "in.tif", image, byteorder=order, bigtiff=big, rowsperstrip=2)
        zelt("copy", "in.tif", "-o", "out.tif")
        result = tifffile.imread(zelt.folder / "out.tif")
        assert result.dtype == image.dtype and np.array_equal(result, image), dtype


def test_fits_keeps_every_real_type(zelt):
    for dtype in REAL:
        image = pixels((5, 7), dtype)
        write_fits(zelt.folder / "in.fits", image)
        zelt("copy", "in.fits", "-o", "out.fits")
        zelt("copy", "out.fits", "-o", "out.tif")
        for result in read_fits(zelt.folder / "out.fits"), tifffile.imread(zelt.folder / "out.tif"):
            assert result.dtype == image.dtype and np.array_equal(result, image), dtype


def test_scaled_fits_is_read_as_real_numbers(zelt):
    stored = pixels((4, 3), "i2")
    write_fits(zelt.folder / "in.fits", stored, ["BSCALE  =                  0.5", "BZERO   =                 10.0"])
    zelt("copy", "in.fits", "-o", "out.tif")
    assert np.array_equal(tifffile.imread(zelt.folder / "out.tif"), stored * 0.5 + 10)


@pytest.mark.parametrize("shape, dtype", [((5, 7), "u1"), ((5, 7), "u2"), ((5, 7, 3), "u1"), ((5, 7, 4), "u1")])
def test_png_and_tiff_hold_grey_and_colour(zelt, shape, dtype):
    image = pixels(shape, dtype)
    Image.fromarray(image).save(zelt.folder / "in.png")
    zelt("copy", "in.png", "-o", "out.tif")
    zelt("copy", "out.tif", "-o", "out.png")
    assert np.array_equal(tifffile.imread(zelt.folder / "out.tif"), image)
    assert np.array_equal(np.array(Image.open(zelt.folder / "out.png")), image)


def test_compressed_and_unusual_tiff_is_decoded(zelt):
    grey, real = pixels((50, 70), "u2"), pixels((50, 70), "f4")
    colour = pixels((50, 70, 3), "u1")
    path = zelt.folder / "in.tif"
    cases = [(image, lambda i, c=c: Image.fromarray(i).save(path, compression=c), image)
             for image in (grey, real, colour) for c in ("tiff_lzw", "packbits", "tiff_adobe_deflate")]
    cases.append((grey, lambda i: tifffile.imwrite(path, i, tile=(16, 16)), grey))
    cases.append((colour, lambda i: tifffile.imwrite(path, i.transpose(2, 0, 1), photometric="rgb", planarconfig="separate"), colour))
    bits = grey > 32767
    cases.append((bits, lambda i: Image.fromarray(i).save(path), bits * 255))
    palette = Image.fromarray(colour).quantize(16)
    cases.append((palette, lambda i: i.save(path), np.array(palette.convert("RGB"))))
    for image, write, expected in cases:
        write(image)
        zelt("copy", "in.tif", "-o", "out.tif")
        assert np.array_equal(tifffile.imread(zelt.folder / "out.tif"), expected)


def test_stacks_keep_their_frames_in_order(zelt):
    stack = pixels((4, 5, 7), "u2")
    tifffile.imwrite(zelt.folder / "s.tif", stack, photometric="minisblack")
    zelt("copy", "s.tif", "-o", "s.fits")
    zelt("copy", "s.fits", "-o", "back.tif")
    assert np.array_equal(read_fits(zelt.folder / "s.fits"), stack)
    assert np.array_equal(tifffile.imread(zelt.folder / "back.tif"), stack)


def test_pages_are_picked_and_joined(zelt):
    stack = pixels((4, 5, 7), "u1")
    tifffile.imwrite(zelt.folder / "s.tif", stack, photometric="minisblack")
    zelt("copy", "s.tif:3", "s.tif:1", "-o", "two.tif")
    assert np.array_equal(tifffile.imread(zelt.folder / "two.tif"), stack[[2, 0]])
    zelt("copy", "two.tif", "s.tif:4", "--page", "2", "-o", "more.fits")
    assert np.array_equal(read_fits(zelt.folder / "more.fits"), stack[[0, 3]])
    tifffile.imwrite(zelt.folder / "odd:2", stack[0])  # a file that is called so comes first
    zelt("copy", "odd:2", "-o", "one.png")
    assert np.array_equal(np.array(Image.open(zelt.folder / "one.png")), stack[0])
    assert "there is no page 9, the last is 4" in zelt("copy", "s.tif:9", "-o", "x.tif", status=1)
    assert "pages count from 1" in zelt("copy", "s.tif:0", "-o", "x.tif", status=1)


def test_pages_may_differ_where_the_format_allows(zelt):
    tifffile.imwrite(zelt.folder / "a.tif", pixels((2, 3), "u1"))
    tifffile.imwrite(zelt.folder / "b.tif", pixels((4, 5), "f4"))
    zelt("copy", "a.tif", "b.tif", "-o", "both.tif")
    with tifffile.TiffFile(zelt.folder / "both.tif") as both:
        assert [(p.shape, p.dtype) for p in both.pages] == [((2, 3), "uint8"), ((4, 5), "float32")]
    assert "must have one size and pixel type" in zelt("copy", "both.tif", "-o", "x.fits", status=1)
    assert "holds one image" in zelt("copy", "a.tif", "a.tif", "-o", "x.png", status=1)
    assert sorted(p.name for p in zelt.folder.iterdir()) == ["a.tif", "b.tif", "both.tif"]


def test_nominal_depth_is_checked_and_kept(zelt):
    image = np.array([[0, 4095], [17, 2048]], "u2")
    tifffile.imwrite(zelt.folder / "in.tif", image)
    for name in "deep.tif", "deep.fits":
        zelt("copy", "in.tif", "--bits", "12", "-o", name)
        assert "Unsigned 12" in zelt("stats", name)
    assert np.array_equal(tifffile.imread(zelt.folder / "deep.tif"), image)
    assert "range to 4095" in " ".join(zelt("stats", "deep.fits").split())
    assert "pixel 1,0 is 4095, which does not fit 11 bits" in zelt("stats", "in.tif", "--bits", "11", status=1)
    tifffile.imwrite(zelt.folder / "low.tif", np.array([[2047, -2049]], "i2"))
    assert "pixel 1,0 is -2049" in zelt("stats", "low.tif", "--bits", "12", status=1)


def test_what_a_format_cannot_hold_is_refused(zelt):
    tifffile.imwrite(zelt.folder / "f.tif", pixels((2, 3), "f4"))
    tifffile.imwrite(zelt.folder / "c.tif", pixels((2, 3), "c8"))
    tifffile.imwrite(zelt.folder / "rgb.tif", pixels((2, 3, 3), "u1"), photometric="rgb")
    tifffile.imwrite(zelt.folder / "deep.tif", pixels((2, 3, 3), "u2"), photometric="rgb")
    assert "a PNG file cannot hold Float 32 pixels" in zelt("copy", "f.tif", "-o", "x.png", status=1)
    assert "a FITS file cannot hold Complex_Float 64 pixels" in zelt("copy", "c.tif", "-o", "x.fits", status=1)
    assert "a FITS file cannot hold BGR 24 pixels" in zelt("copy", "rgb.tif", "-o", "x.fits", status=1)
    assert "deep.tif: an image of 3 channels with 16 bits each" in zelt("copy", "deep.tif", "-o", "x.tif", status=1)
    assert "files end in .tif, .png or .fits" in zelt("copy", "f.tif", "-o", "x.bmp", status=2)
