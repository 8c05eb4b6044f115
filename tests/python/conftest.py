"""The package as the build tree has it."""

import os
import pathlib
import sys

BUILD = pathlib.Path(os.environ.get("ZELT_BUILD", pathlib.Path(__file__).parents[2] / "build/release"))
sys.path.insert(0, str(BUILD / "python"))

import numpy as np
import pytest

import zelt


@pytest.fixture
def root():
    return zelt.create("ZELT.Main2")


def views(dtype="uint8"):
    """Arrays of every layout that NumPy makes without a copy, each with what it is a view of."""
    base = (np.arange(24 * 36) % 120).reshape(24, 36).astype(dtype)
    yield "packed", base, base
    for name, key in {
        "window": np.s_[3:20, 5:30], "rows": np.s_[::3], "pixels": np.s_[:, ::2], "upside_down": np.s_[::-1],
        "mirrored": np.s_[:, ::-1], "turned": np.s_[::-2, ::-3], "one_row": np.s_[4:5], "one_column": np.s_[:, 7:8],
    }.items():
        whole = base.copy()
        yield name, whole, whole[key]
    whole = base.copy()
    yield "transposed", whole, whole.T
    whole = np.asfortranarray(base)
    yield "fortran", whole, whole
    whole = np.zeros((24, 36, 4), dtype)
    whole[..., 2] = base
    yield "plane", whole, whole[..., 2]
    whole = np.zeros(24 * 36, [("x", "u1"), ("v", dtype)] if np.dtype(dtype).itemsize == 1 else [("v", dtype), ("x", dtype)])
    whole["v"] = base.ravel()
    yield "field", whole, whole.reshape(24, 36)["v"]
