"""No file, however damaged, does more than stop the program with a message that names it."""

import concurrent.futures
import struct
import subprocess

import numpy as np
import pytest
import tifffile
from PIL import Image

from conftest import PROGRAM, pixels, write_fits


def make_tiff(path):
    tifffile.imwrite(path, pixels((9, 11), "u2"))
    return path.stat().st_size


def make_compressed_tiff(path):
    Image.fromarray(pixels((9, 11, 3), "u1")).save(path, "TIFF", compression="tiff_adobe_deflate")
    return path.stat().st_size


def make_png(path):
    Image.fromarray(pixels((9, 11), "u1")).save(path, "PNG")
    return path.stat().st_size


def make_fits(path):
    write_fits(path, pixels((9, 11), "f4"))
    return 2880 + 9 * 11 * 4  # what follows is only filling


@pytest.mark.parametrize("make", [make_tiff, make_compressed_tiff, make_png, make_fits])
def test_truncated_files_are_refused(tmp_path, make):
    whole = tmp_path / "whole"
    needed = make(whole)
    content = whole.read_bytes()

    def attempt(length):
        path = tmp_path / f"cut{length}"
        path.write_bytes(content[:length])
        done = subprocess.run([PROGRAM, "copy", path, "-o", tmp_path / f"out{length}.tif"], capture_output=True, text=True)
        return length, path, done

    # The structures at both ends, byte by byte, and places between.
    lengths = {*range(0, 24), *range(needed - 12, needed), *range(24, needed, max(1, needed // 24))}
    with concurrent.futures.ThreadPoolExecutor(2) as pool:
        for length, path, done in pool.map(attempt, sorted(lengths)):
            assert done.returncode == 1, (length, done)
            assert done.stderr.startswith(f"zelt: {path}: ") and done.stderr.count("\n") == 1, (length, done)
    assert not [p for p in tmp_path.iterdir() if p.name.startswith(("out", ".zelt"))]


def tiff(entries, tail=b"", order="<"):
    """A classic TIFF of one page with the given (tag, type, count, value)."""
    body = b"".join(struct.pack(order + "HHII", *entry) for entry in entries)
    return struct.pack(order + "2sHIH", b"II", 42, 8, len(entries)) + body + struct.pack(order + "I", 0) + tail


def grey(width, height, offset=200, size=1, **more):
    tags = {256: (4, 1, width), 257: (4, 1, height), 258: (3, 1, 8), 259: (3, 1, 1), 262: (3, 1, 1),
            273: (4, 1, offset), 278: (4, 1, height), 279: (4, 1, size), **{int(k[1:]): v for k, v in more.items()}}
    return tiff([(tag, *value) for tag, value in sorted(tags.items())], b"\0" * 300)


def test_lying_files_are_refused_before_memory_is_taken(zelt):
    png = b"\x89PNG\r\n\x1a\n" + struct.pack(">I4sIIBBBBBI", 13, b"IHDR", 30000, 30000, 8, 0, 0, 0, 0, 0)
    png += struct.pack(">I4sI", 0, b"IEND", 0xAE426082)
    cards = ["SIMPLE  =                    T", "BITPIX  =                   16", "NAXIS   =                    3",
             "NAXIS1  =                30000", "NAXIS2  =                30000", "NAXIS3  =                 1000", "END"]
    fits = "".join(f"{c:80s}" for c in cards).encode().ljust(2880) + b"\0" * 2880
    loop = bytearray(grey(2, 2, size=4))
    loop[8 + 2 + 8 * 12:8 + 2 + 8 * 12 + 4] = struct.pack("<I", 8)
    cases = {
        "huge.tif": (grey(1 << 30, 1 << 30), "rows are missing"),
        "packed.tif": (grey(60000, 60000, t259=(3, 1, 8)), "too small for 60000 x 60000 pixels"),
        "strips.tif": (grey(2, 2, t273=(4, 1 << 31, 200)), "truncated or damaged"),
        "outside.tif": (grey(2, 2, offset=1 << 20, size=4), "truncated or damaged"),
        "none.tif": (grey(0, 2), "no usable width and height"),
        "loop.tif": (bytes(loop), "chain of pages never ends"),
        "codec.tif": (grey(2, 2, size=4, t259=(3, 1, 33333)), "codec.tif: "),
        "huge.png": (png, "too small for 30000 x 30000 pixels"),
        "huge.fits": (fits, "too small for 30000 x 30000 pixels in 1000 frames"),
        "text.tif": (b"this is no image\n", "is not a TIFF, PNG or FITS file"),
        "empty.png": (b"", "is empty"),
    }
    for name, (content, message) in cases.items():
        (zelt.folder / name).write_bytes(content)
        said = zelt("stats", name, status=1)
        assert said.startswith(f"{name}: ") and message in said, name


def test_what_is_no_file_is_refused(zelt):
    (zelt.folder / "folder").mkdir()
    assert zelt("stats", "nothing.tif", status=1) == "nothing.tif: No such file or directory"
    assert zelt("stats", "folder", status=1) == "folder: is not a regular file"
    assert zelt("stats", "/dev/zero", status=1) == "/dev/zero: is not a regular file"


def test_noise_in_good_files_never_crashes(tmp_path):
    random = np.random.RandomState(3)
    for make in (make_tiff, make_compressed_tiff, make_png, make_fits):
        path = tmp_path / "noise"
        make(path)
        content = bytearray(path.read_bytes())
        for _ in range(12):
            noisy = bytearray(content)
            for place in random.randint(0, len(noisy), 6):
                noisy[place] = random.randint(256)
            path.write_bytes(noisy)
            done = subprocess.run([PROGRAM, "copy", path, "-o", tmp_path / "out.tif"], capture_output=True, text=True)
            assert done.returncode in (0, 1) and (done.returncode == 0) == (done.stderr == ""), done
