"""Runs the built program; writes and reads the file formats without it."""

import os
import pathlib
import subprocess

import numpy as np
import pytest

BUILD = pathlib.Path(os.environ.get("ZELT_BUILD", pathlib.Path(__file__).parents[2] / "build/release"))
PROGRAM = BUILD / "bin/zelt"


@pytest.fixture
def zelt(tmp_path):
    """zelt(ARGUMENT...) runs in the test's folder and must succeed; status=1 is for calls that must fail."""

    def run(*arguments, status=0, **options):
        done = subprocess.run([PROGRAM, *map(str, arguments)], cwd=tmp_path, capture_output=True, text=True, timeout=120,
                              **options)
        said = f"zelt {' '.join(map(str, arguments))}: {done.returncode}\n{done.stdout}{done.stderr}"
        assert done.returncode == status, said
        # Results or a message, never both; one line says what is wrong.
        if status == 0:
            assert done.stderr == "", said
            return done.stdout
        assert done.stdout == "" and done.stderr.startswith("zelt: ") and done.stderr.count("\n") == 1, said
        return done.stderr[len("zelt: "):-1]

    run.folder = tmp_path
    return run


def write_fits(path, array, cards=()):
    """The array's last axis is the first of the file. Unsigned words and signed bytes go with the usual offsets."""
    offset = {"u2": 2**15, "u4": 2**31, "u8": 2**63, "i1": -128}.get(array.dtype.str[1:], 0)
    stored = np.dtype({"u2": ">i2", "u4": ">i4", "u8": ">i8", "i1": "u1"}.get(array.dtype.str[1:], array.dtype.newbyteorder(">")))
    bits = stored.itemsize * (-8 if stored.kind == "f" else 8)
    header = ["SIMPLE  =                    T", f"BITPIX  = {bits:20d}", f"NAXIS   = {array.ndim:20d}"]
    header += [f"NAXIS{i + 1}  = {n:20d}" for i, n in enumerate(reversed(array.shape))]
    header += [f"BZERO   = {offset:20d}"] if offset else []
    text = "".join(f"{card:80s}" for card in [*header, *cards, "END"])
    values = array.astype(object) - offset if offset else array
    data = np.array(values, dtype=object if offset else array.dtype).astype(stored).tobytes()
    pad = lambda b, filler: b + filler * (-len(b) % 2880)
    path.write_bytes(pad(text.encode(), b" ") + pad(data, b"\0"))


def read_fits(path):
    raw = path.read_bytes()
    cards = {}
    for at in range(0, len(raw), 80):
        card = raw[at:at + 80].decode()
        if card.startswith("END "):
            break
        if card[8] == "=":
            cards[card[:8].strip()] = card[10:].split("/")[0].strip()
    stored = {"8": "u1", "16": ">i2", "32": ">i4", "64": ">i8", "-32": ">f4", "-64": ">f8"}[cards["BITPIX"]]
    shape = [int(cards[f"NAXIS{i}"]) for i in range(int(cards["NAXIS"]), 0, -1)]
    start = at // 2880 * 2880 + 2880
    assert len(raw) % 2880 == 0
    data = np.frombuffer(raw, stored, int(np.prod(shape)), start).reshape(shape)
    offset = int(cards.get("BZERO", 0))
    wide = {2**15: "u2", 2**31: "u4", 2**63: "u8", -128: "i1"}
    return (data.astype(object) + offset).astype(wide[offset]) if offset else data.astype(data.dtype.newbyteorder("="))


def pixels(shape, dtype, seed=7):
    """Values over the whole range of a type, its limits among them."""
    random = np.random.RandomState(seed)
    dtype = np.dtype(dtype)
    if dtype.kind == "c":
        return (random.standard_normal(shape) + 1j * random.standard_normal(shape)).astype(dtype)
    if dtype.kind == "f":
        values = random.standard_normal(shape).astype(dtype)
        values.flat[0] = np.finfo(dtype).max
        return values
    limits = np.iinfo(dtype)
    values = np.frombuffer(random.bytes(int(np.prod(shape)) * dtype.itemsize), dtype).reshape(shape).copy()
    values.flat[0], values.flat[1] = limits.min, limits.max
    return values
