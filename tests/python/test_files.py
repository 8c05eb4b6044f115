"""Image files, pictures in notebooks, and what the package brings along for tools."""

import ast
import io
import pathlib

import numpy as np
import pytest

import zelt


@pytest.mark.parametrize("extension", ["tif", "png", "fits"])
def test_files_come_back_as_they_went(tmp_path, extension):
    frame = np.arange(48, dtype="uint16").reshape(6, 8)
    path = tmp_path / f"frame.{extension}"
    for written in (frame, zelt.image(frame), frame[::-1, ::2]):
        zelt.imwrite(path, written)
        image = zelt.imread(path, bits=12)
        assert image.bits == 12 and np.array_equal(image, np.asarray(written))
    assert zelt.imcount(str(path)) == 1
    assert [p.name for p in tmp_path.iterdir()] == [path.name]


def test_files_that_cannot_be_had(tmp_path):
    with pytest.raises(FileNotFoundError):
        zelt.imread(tmp_path / "none.tif")
    (tmp_path / "damaged.tif").write_bytes(b"II*\0 and no more")
    with pytest.raises(zelt.Error, match="damaged.tif"):
        zelt.imread(tmp_path / "damaged.tif")
    with pytest.raises(zelt.Error, match="jpeg"):
        zelt.imwrite(tmp_path / "frame.jpeg", np.zeros((2, 2), "uint8"))
    with pytest.raises(zelt.Error):
        zelt.imwrite(tmp_path / "frame.png", np.zeros((2, 2), "complex64"))
    with pytest.raises(TypeError):
        zelt.imwrite(tmp_path / "frame.tif", 7)


def shown(array, **options):
    from skimage.io import imread

    return imread(io.BytesIO(zelt.image(array, **options)._repr_png_()), plugin="imageio")


def test_notebooks_show_a_picture():
    grey = np.arange(256, dtype="uint8").reshape(16, 16)
    assert np.array_equal(shown(grey), grey)
    assert np.array_equal(shown(grey.astype("float32") / 7 - 3), grey)
    hole = grey.astype("float64")
    hole[0, 1] = np.nan
    assert shown(hole)[0, 1] == 0 and shown(hole)[15, 15] == 255
    colour = np.stack([grey, grey.T, grey[::-1]], -1)
    assert np.array_equal(shown(colour), colour)
    assert np.array_equal(shown(colour, encoding="BGR"), colour[..., ::-1])
    assert max(shown(np.zeros((3000, 20), "uint16")).shape) <= 1024
    assert shown(np.full((3, 3), np.inf)).shape == (3, 3)
    assert shown(1j * grey).max() == 255
    assert zelt.image(np.zeros((0, 4)))._repr_png_() is None


def test_tools_find_types_for_everything():
    folder = pathlib.Path(zelt.__file__).parent
    assert (folder / "py.typed").exists()
    tree = ast.parse((folder / "__init__.pyi").read_text())
    classes = {node.name: node for node in tree.body if isinstance(node, ast.ClassDef)}
    functions = {node.name for node in tree.body if isinstance(node, ast.FunctionDef)}
    assert set(zelt.__all__) <= set(classes) | functions
    for name in dir(zelt):
        kind = getattr(zelt, name)
        if not (isinstance(kind, type) and issubclass(kind, zelt.Object)):
            continue
        members = {node.name for node in classes[name].body if isinstance(node, ast.FunctionDef)}
        assert {n for n in vars(kind) if not n.startswith("_")} <= members, name
    types = [getattr(node, field) for node in ast.walk(tree) for field in ("annotation", "returns") if getattr(node, field, None)]
    used = {n.id for kind in types for n in ast.walk(kind) if isinstance(n, ast.Name) and n.id[0].isupper()}
    assert used <= set(classes) | {"Any", "ArrayLike", "NDArray", "Sequence"}
