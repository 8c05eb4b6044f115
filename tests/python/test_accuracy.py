"""How near the Gaussian family is to a Gaussian: what docs/accuracy.md promises is kept, and no more is promised."""

import pathlib

import numpy as np
import pytest

PAGE = pathlib.Path(__file__).parents[2] / "docs" / "accuracy.md"
ROWS = [[float(cell) for cell in line.strip("|").split("|")]
        for line in PAGE.read_text().splitlines() if line.startswith("| ") and line[2].isdigit()]


def gradient(image):
    wide = np.pad(image, 1, mode="edge")
    return np.hypot(wide[1:-1, 2:] - wide[1:-1, :-2], wide[2:, 1:-1] - wide[:-2, 1:-1])


def test_the_page_has_its_table():
    assert [row[0] for row in ROWS] == [0.6, 0.8, 1, 1.5, 2, 3, 5, 10, 20, 50]


@pytest.mark.parametrize("row", ROWS, ids=lambda row: f"sigma {row[0]:g}")
def test_differences_from_a_gaussian_are_those_of_the_page(root, row):
    scipy_filters = pytest.importorskip("scipy.ndimage")
    picture = pytest.importorskip("skimage.data").camera().astype("float32")
    sigma, *promised = row
    smooth = scipy_filters.gaussian_filter(picture.astype("float64"), sigma, mode="nearest", truncate=8)
    apart = abs(np.asarray(root.Filters.Gauss(picture, sigma)) - smooth)
    border = int(min(100, np.ceil(4 * sigma)))
    steepness = gradient(smooth)
    gradient_apart = abs(np.asarray(root.Filters.GaussDerivative(picture, sigma)) - steepness)
    found = [apart.mean(), apart[border:-border, border:-border].max(), apart.max(),
             gradient_apart.mean(), gradient_apart.max(), steepness.max()]
    units = [0.01, 0.1, 0.1, 0.01, 0.1, 1]  # of the last digit on the page
    for value, figure, unit in zip(found, promised, units, strict=True):
        assert value == pytest.approx(figure, abs=0.51 * unit)
