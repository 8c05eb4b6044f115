"""Methods called by name: arguments as they are typed, results as they are printed, pixels as they are written."""

import json

import numpy as np
import pytest
import tifffile
from PIL import Image

from conftest import pixels, write_fits


@pytest.fixture
def images(zelt):
    """a and b: 16 bits, 12 used; f: real; s: a stack of three."""
    made = {"a": pixels((5, 7), "u2") & 4095, "b": pixels((5, 7), "u2", seed=9) & 4095 | 1, "f": pixels((5, 7), "f4") / 2,
            "s": pixels((3, 5, 7), "u2") & 4095}
    made["f"].flat[0] = 0.25
    for name, image in made.items():
        tifffile.imwrite(zelt.folder / f"{name}.tif", image, photometric="minisblack")
    return made


def written(zelt, name="o.tif"):
    return tifffile.imread(zelt.folder / name)


def test_operands_are_images_numbers_and_forced_types(zelt, images):
    a, b, f = images["a"], images["b"], images["f"]
    cases = [
        (("Basic.Add", "a.tif", "b.tif"), a + b),
        (("basic.SUBTRACT", "a.tif", "b.tif"), a - b),
        (("Basic.Add", "a.tif", "-5"), (a.astype(int) - 5).astype("u2")),
        (("Basic.Multiply", "a.tif", "0x10"), a * np.uint16(16)),
        (("Basic.Divide", "a.tif", "b.tif"), a // b),
        (("Basic.Multiply", "f.tif", "0.5:VT_R4"), f * np.float32(0.5)),
        (("Basic.Multiply", "f.tif", "1e-3"), (f.astype(float) * 1e-3).astype("f4")),
    ]
    for arguments, expected in cases:
        assert zelt("call", *arguments, "-o", "o.tif") == ""
        assert written(zelt).dtype == expected.dtype and np.array_equal(written(zelt), expected), arguments


def test_rounding_and_nominal_depth_reach_the_arithmetic(zelt, images):
    total = images["a"].astype(int) + images["b"]
    for mode, bits, expected in [("saturate", 12, np.minimum(total, 4095)), ("ZELT_Rounding_Saturate", 13, np.minimum(total, 8191)),
                                 ("wrap", 12, total), ("3", 12, np.minimum(total, 4095))]:
        zelt("call", "Basic.Add", "a.tif", "b.tif", "-o", "o.tif", "--rounding", mode, "--bits", bits)
        assert np.array_equal(written(zelt), expected), mode
    assert f"Unsigned 12" in zelt("stats", "o.tif")  # the nominal depth went on into the result


def test_complex_operands_and_images(zelt):
    image = pixels((4, 6), "c8")
    tifffile.imwrite(zelt.folder / "c.tif", image)
    for text in "1.5,-2", "1.5-2i":
        zelt("call", "Basic.Add", "c.tif", text, "-o", "o.tif")
        np.testing.assert_allclose(written(zelt), image + np.complex64(1.5 - 2j), rtol=1e-6)


def test_arguments_may_be_named_and_left_out(zelt, images):
    part = images["a"][1:4, 2:6].astype(float)
    for arguments in (["2,1,6,4"], ["--pIArea", "2,1,6,4"], ["--area=2,1,6,4"], ["--arg", "area=2,1,6,4"]):
        assert float(zelt("call", "Statistics.Mean", "a.tif", *arguments)) == part.mean(), arguments
    assert float(zelt("call", "Statistics.Mean", "a.tif", "-")) == pytest.approx(images["a"].mean(), rel=1e-12)
    left_out = zelt("call", "Statistics.Count", "a.tif", "100", "-", "2,1,6,4")
    assert int(left_out) == (part == 100).sum()


def test_results_are_printed_so_that_they_read_back(zelt, images):
    a, f = images["a"], images["f"]
    y, x = np.unravel_index(a.argmax(), a.shape)
    assert zelt("call", "Statistics.MaximumPosition", "a.tif") == f"{x},{y}\n"
    assert json.loads(zelt("call", "Statistics.MaximumPosition", "a.tif", "--json")) == [x, y]
    assert zelt("call", "Statistics.BoundingBox", "b.tif") == "0,0,7,5\n"
    assert zelt("call", "Statistics.IsNaN", "f.tif") == "false\n"
    assert float(zelt("call", "Statistics.Maximum", "f.tif")) == f.max()
    image = np.zeros((2, 2), "f4")
    tifffile.imwrite(zelt.folder / "z.tif", image)
    assert zelt("call", "Statistics.CenterOfGravity", "z.tif") == "nan,nan\n"
    assert json.loads(zelt("call", "Statistics.CenterOfGravity", "z.tif", "--json")) == [None, None]


def test_stacks_are_called_page_by_page(zelt, images):
    s = images["s"]
    means = [float(line) for line in zelt("call", "Statistics.Mean", "s.tif").split()]
    np.testing.assert_allclose(means, s.mean((1, 2)), rtol=1e-12)
    assert json.loads(zelt("call", "Statistics.Mean", "s.tif", "--json")) == means
    zelt("call", "Basic.Add", "s.tif", "a.tif", "-o", "o.tif")
    assert np.array_equal(written(zelt), s + images["a"])
    zelt("call", "Basic.Add", "s.tif:2", "1", "-o", "o.tif")
    assert np.array_equal(written(zelt), s[1] + 1)
    tifffile.imwrite(zelt.folder / "two.tif", s[:2], photometric="minisblack")
    assert "stacks have 3 and 2 pages" in zelt("call", "Basic.Add", "s.tif", "two.tif", "-o", "o2.tif", status=1)


def test_methods_that_write_into_an_image(zelt, images):
    a, s = images["a"], images["s"]
    zelt("call", "Conversions.Recode", "new:7x5:Unsigned:8", "a.tif", "-o", "o.png")
    assert np.array_equal(np.array(Image.open(zelt.folder / "o.png")), np.minimum(a, 255))
    zelt("call", "Conversions.Recode", "new:7x5:float:32", "s.tif", "-o", "o.tif")
    assert np.array_equal(written(zelt), s.astype("f4"))
    zelt("call", "Conversions.Recode", "copy:b.tif", "a.tif", "1,1,3,3", "4,2", "-o", "o.tif")
    expected = images["b"].copy()
    expected[2:4, 4:6] = a[1:3, 1:3]
    assert np.array_equal(written(zelt), expected)
    # An optional output of another type.
    zelt("call", "Basic.Add", "a.tif", "f.tif", "new:7x5:Float:32", "-o", "o.tif")
    assert np.array_equal(written(zelt), a + images["f"])
    assert np.array_equal(written(zelt, "b.tif"), images["b"])


def test_flat_field_from_files(zelt, images):
    image = np.array([[100, 200], [300, 400]], "u2")
    write_fits(zelt.folder / "raw.fits", image)
    zelt("call", "FlatFielding.ToDarkRefEx", "raw.fits", "Signed", "5", "-o", "dark.fits")
    zelt("copy", "dark.fits", "-o", "dark.tif")
    assert written(zelt, "dark.tif").dtype == "i2" and np.array_equal(written(zelt, "dark.tif"), image.astype("i2") - 5)


def test_failures_of_methods_tell_text_and_code(zelt, images):
    cases = [
        (("Basic.Add", "a.tif", "small.tif"), "Can't operate on images of different size (code 0x80070057)"),
        (("Basic.Divide", "a.tif", "zero.tif"), "integer division by zero"),
        (("Statistics.Mean", "a.tif", "0,0,8,5"), "(code 0x80070057)"),
        (("Statistics.Count", "c.tif", "1"), "Count: unsupported pixel type (code 0x80070057)"),
    ]
    tifffile.imwrite(zelt.folder / "small.tif", images["a"][:3])
    tifffile.imwrite(zelt.folder / "zero.tif", images["a"] * 0)
    tifffile.imwrite(zelt.folder / "c.tif", pixels((4, 5), "c8"))
    for arguments, message in cases:
        output = ["-o", "o.tif"] if arguments[0].startswith("Basic") else []
        assert message in zelt("call", *arguments, *output, status=1), arguments
        assert not (zelt.folder / "o.tif").exists()
    assert "page 1: " in zelt("call", "Basic.Add", "s.tif", "small.tif", "-o", "o.tif", status=1)


def test_what_was_not_understood_is_a_usage_error(zelt, images):
    cases = {
        ("Statistics.Mean",): "Statistics.Mean needs pIImage (IPixmat2)",
        ("Statistics.Mean", "a.tif", "0,0,1,1", "7"): "takes 2 arguments, '7' is one more",
        ("Statistics.Mean", "a.tif", "--aria", "0,0,1,1"): "has no argument 'aria': did you mean Area?",
        ("Statistics.Mean", "a.tif", "0,0,1,1", "--area", "0,0,1,1"): "pIArea is given twice",
        ("Statistics.Mean", "a.tif", "0,0,1"): "pIArea '0,0,1' is not left,top,right,bottom",
        ("Statistics.Mean", "a.tif", "0,0,1,1.5"): "is not left,top,right,bottom",
        ("Statistics.Count", "a.tif", "x"): "Value 'x' is not a number",
        ("Statistics.Moment", "a.tif", "1", "2.5"): "j '2.5' is not a whole number",
        ("Statistics.Moment", "a.tif", "1", "99999999999"): "j '99999999999' is out of range",
        ("Statistics.FindPeaks", "a.tif", "1", "1", "Best"): "'Best' is none of ZELT_Peak_Algorithm_Absolute",
        ("Basic.Add", "a.tif", "1"): "Basic.Add makes an image: give it a file with -o",
        ("Statistics.Mean", "a.tif", "-o", "x.tif"): "makes no image",
        ("Basic.Add", "a.tif", "300:VT_UI1", "-o", "x.tif"): "'300:VT_UI1' does not fit its type",
        ("Basic.Add", "a.tif", "[1,2;3]", "-o", "x.tif"): "has rows of different length",
        ("Basic.Add", "a.tif", "[1 2; 3, 4 5]", "-o", "x.tif"): "has rows of different length",
        ("Basic.Add", "a.tif", "[1,,2]", "-o", "x.tif"): "'' is not a number",
        ("Basic.Add", "new:7x5", "1", "-o", "x.tif"): "is not WIDTHxHEIGHT:ENCODING:BITS",
        ("Basic.Add", "new:7x5:Grey:8", "1", "-o", "x.tif"): "has no encoding 'Grey'",
        ("Basic.Add", "a.tif", "1", "-o", "x.tif", "--rounding", "up"): "'up' is none of",
        ("Basic.Add", "a.tif", "1", "-o", "x.tif", "--set", "Mode=1"): "has no method 'Mode'",
        ("Statistics.Mean", "a.tif", "--set", "SubsampleFactor"): "is not NAME=VALUE",
        ("Statistics.Mean", "a.tif", "--area"): "--area needs a value",
    }
    for arguments, message in cases.items():
        assert message in zelt("call", *arguments, status=2), arguments
    assert not list(zelt.folder.glob("x.*"))


def test_properties_are_set_first(zelt, images):
    assert zelt("call", "Statistics.SubsampleFactor") == "1\n"
    assert zelt("call", "Statistics.SubsampleFactor", "--set", "SubsampleFactor=3") == "3\n"
    sampled = images["a"][::2, ::2].astype(float)
    assert float(zelt("call", "Statistics.Minimum", "a.tif", "--set", "subsamplefactor=2")) == sampled.min()
    assert "(code 0x80070057)" in zelt("call", "Statistics.Mean", "a.tif", "--set", "SubsampleFactor=0", status=1)
