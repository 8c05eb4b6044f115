"""zelt stats against NumPy."""

import json

import numpy as np
import tifffile

from conftest import pixels


def expected(image, area=None):
    left, top, right, bottom = area or (0, 0, image.shape[1], image.shape[0])
    part = image[top:bottom, left:right].astype(float)
    y, x = np.mgrid[top:bottom, left:right]
    at = lambda flat: [left + int(flat % part.shape[1]), top + int(flat // part.shape[1])]
    return {
        "width": right - left, "height": bottom - top, "minimum": part.min(), "maximum": part.max(),
        "minimum_position": at(part.argmin()), "maximum_position": at(part.argmax()), "mean": part.mean(),
        "standard_deviation": part.std(), "sum_of_squares": (part**2).sum(),
        "centre_of_gravity": [(part * x).sum() / part.sum(), (part * y).sum() / part.sum()],
    }


def assert_close(found, wanted):
    for key, value in wanted.items():
        # The order of additions is the library's, not NumPy's.
        np.testing.assert_allclose(found[key], value, rtol=1e-12, err_msg=key)


def test_json_tells_every_number(zelt):
    stack = pixels((3, 40, 50), "u2")
    real = np.abs(pixels((40, 50), "f4", seed=1)) / 4
    real.flat[0] = 0.5
    tifffile.imwrite(zelt.folder / "s.tif", stack, photometric="minisblack")
    tifffile.imwrite(zelt.folder / "f.tif", real)
    found = json.loads(zelt("stats", "s.tif", "f.tif", "--json"))
    assert [(f["file"], f.get("page")) for f in found] == [("s.tif", 1), ("s.tif", 2), ("s.tif", 3), ("f.tif", None)]
    for f, image in zip(found, [*stack, real]):
        assert_close(f, expected(image))
    assert [found[0][k] for k in ("type", "range_minimum", "range_maximum", "finite", "nan")] == ["Unsigned 16", 0, 65535, True, False]
    assert [found[3][k] for k in ("type", "range_minimum", "range_maximum")] == ["Float 32", 0, 1]

    area = (5, 6, 31, 22)
    found = json.loads(zelt("stats", "s.tif:2", "--area", ",".join(map(str, area)), "--json"))
    assert_close(found[0], expected(stack[1], area))


def test_counts_and_what_is_not_finite(zelt):
    image = np.full((4, 5), 2, "f4")
    image[1, 2] = image[3, 3] = 7
    tifffile.imwrite(zelt.folder / "a.tif", image)
    image[0, 0] = np.nan
    tifffile.imwrite(zelt.folder / "b.tif", image)
    a, b = json.loads(zelt("stats", "a.tif", "b.tif", "--json"))
    assert (a["minimum_count"], a["maximum_count"]) == (18, 2)  # of pixels, the first one once
    assert (a["maximum"], a["maximum_position"], a["finite"], a["nan"]) == (7, [2, 1], True, False)
    assert (b["finite"], b["nan"], b["mean"]) == (False, True, None)


def test_the_table_has_a_column_for_each_image(zelt):
    tifffile.imwrite(zelt.folder / "a.tif", np.array([[1, 2], [3, 250]], "u1"))
    tifffile.imwrite(zelt.folder / "long name.tif", np.array([[-5, 5]], "i2"))
    lines = zelt("stats", "a.tif", "long name.tif").splitlines()
    assert len({len(line) for line in lines}) == 1  # aligned
    rows = {line[:18].strip(): line[18:].split() for line in lines[1:] if "pixel type" not in line}
    assert rows["minimum"] == ["1", "-5"] and rows["mean"] == ["64", "0"] and rows["width"] == ["2", "2"]
    assert lines[0].split() == ["a.tif", "long", "name.tif"]


def test_what_cannot_be_measured_is_told_with_the_file(zelt):
    tifffile.imwrite(zelt.folder / "c.tif", pixels((4, 5), "c8"))
    tifffile.imwrite(zelt.folder / "a.tif", pixels((4, 5), "u1"))
    assert zelt("stats", "c.tif", status=1).startswith("c.tif: ")
    assert "(code 0x80070057)" in zelt("stats", "a.tif", "--area", "0,0,6,4", status=1)
    assert "is not left,top,right,bottom" in zelt("stats", "a.tif", "--area", "0,0,6", status=2)
