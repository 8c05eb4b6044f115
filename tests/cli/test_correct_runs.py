"""Batches of zelt correct: names of files, bad files among them, interruptions, messages."""

import json
import os
import pty
import signal
import subprocess
import time

import numpy as np
import pytest
import tifffile

from conftest import PROGRAM

REFERENCES = ["--dark", "dark.tif", "--flat", "flat.tif"]


@pytest.fixture
def batch(zelt):
    """Five exposures a.tif to e.tif with dark.tif and flat.tif."""
    random = np.random.RandomState(2)
    tifffile.imwrite(zelt.folder / "dark.tif", random.randint(90, 110, (40, 50)).astype("u2"))
    tifffile.imwrite(zelt.folder / "flat.tif", random.randint(8000, 12000, (40, 50)).astype("u2"))
    for name in "abcde":
        tifffile.imwrite(zelt.folder / f"{name}.tif", random.randint(100, 9000, (40, 50)).astype("u2"))
    zelt("correct", *[f"{n}.tif" for n in "abcde"], *REFERENCES, "-o", "good/")
    return zelt


def run(zelt, *arguments, **options):
    return subprocess.run([PROGRAM, "correct", *map(str, arguments)], cwd=zelt.folder, capture_output=True, text=True,
                          timeout=120, **options)


def images(folder):
    return {p.name: tifffile.imread(p) for p in sorted(folder.iterdir())}


def same(a, b):
    return a.keys() == b.keys() and all(np.array_equal(a[k], b[k]) for k in a)


def test_bad_files_are_left_out_and_told(batch):
    folder = batch.folder
    (folder / "b.tif").write_bytes((folder / "b.tif").read_bytes()[:2000])
    tifffile.imwrite(folder / "d.tif", np.zeros((40, 51), "u2"))
    (folder / "out").mkdir()
    (folder / "out" / "b.tif").write_text("from yesterday")
    names = ["a.tif", "b.tif", "c.tif", "d.tif", "missing.tif", "e.tif"]
    done = run(batch, *names, *REFERENCES, "-o", "out", "--report", "page")
    assert done.returncode == 1
    told = done.stderr.splitlines()
    assert len(told) == 4 and told[-1] == "zelt: 3 of 6 exposures were not corrected"
    assert told[0].startswith("zelt: b.tif: ") and told[2].startswith("zelt: missing.tif: ")
    assert told[1] == "zelt: d.tif: is 51 x 40 Unsigned 16, but dark.tif is 50 x 40 Unsigned 16"
    assert (folder / "out" / "b.tif").read_text() == "from yesterday"
    (folder / "out" / "b.tif").unlink()
    good = images(folder / "good")
    assert same(images(folder / "out"), {k: good[k] for k in ("a.tif", "c.tif", "e.tif")})
    page = (folder / "page" / "report.html").read_text()
    assert all(text in page for text in ("missing.tif", "51 x 40", "3 exposures corrected"))

    done = run(batch, *names, *REFERENCES, "-o", "out", "--json")
    exposures = json.loads(done.stdout)["exposures"]
    assert done.returncode == 1 and [e["file"] for e in exposures] == names
    assert ["error" in e for e in exposures] == [False, True, False, True, True, False]


def test_outputs_get_their_names(batch):
    folder, good = batch.folder, images(batch.folder / "good")
    stack = np.array([tifffile.imread(folder / "a.tif"), tifffile.imread(folder / "b.tif")])
    tifffile.imwrite(folder / "stack.tif", stack)
    for arguments, expected in (
            (["a.tif", "-o", "x1/y/one.fits"], ["x1/y/one.fits"]),
            (["a.tif", "-o", "x2"], ["x2/a.tif"]),
            (["a.tif", "b.tif", "-o", "x3/{}_{n}.png"], ["x3/a_1.png", "x3/b_2.png"]),
            (["stack.tif:2", "-o", "x4/"], ["x4/stack_2.tif"]),
            (["x3/a_1.png", "-o", "x5", "--float"], ["x5/a_1.tif"])):
        batch("correct", *arguments, *REFERENCES)
        top = expected[0].split("/")[0]
        assert sorted(str(p.relative_to(folder)) for p in (folder / top).rglob("*.*")) == expected, arguments
    assert np.array_equal(tifffile.imread(folder / "x4/stack_2.tif"), good["b.tif"])
    batch("correct", "stack.tif", *REFERENCES, "-o", "x6")
    assert np.array_equal(tifffile.imread(folder / "x6/stack.tif"), [good["a.tif"], good["b.tif"]])


def test_what_cannot_be_meant_is_refused_before_any_work(batch):
    (batch.folder / "sub").mkdir()
    (batch.folder / "sub" / "a.tif").write_bytes((batch.folder / "a.tif").read_bytes())
    before = sorted(batch.folder.rglob("*"))
    gain, short = REFERENCES, ["--short", "b.tif"]
    for arguments, message in (
            (["a.tif", "b.tif", *gain, "-o", "out.tif"], "is one file for 2 exposures"),
            (["a.tif", "sub/a.tif", *gain, "-o", "out"], "would both go to out/a.tif"),
            (["a.tif", *gain, "-o", "."], "./a.tif is an input"),
            (["a.tif", *gain, "-o", "sub/../flat.tif"], "is an input"),
            (["a.tif", *gain, "-o", "out.jpg"], "files end in .tif, .png or .fits"),
            (["a.tif", "--dark", "dark.tif", "-o", "out"], "--flat is needed"),
            (["a.tif", *gain, *short, "-o", "out"], "--short needs --ratio"),
            (["a.tif", "c.tif", *gain, *short, "--ratio", "4", "-o", "out"], "there are 1 for 2"),
            (["a.tif", *gain, *short, "--ratio", "4", "--gain", "fixed", "-o", "out"], "needs a float gain"),
            (["a.tif", *gain, "--norm", "-1", "-o", "out"], "--norm is mean, lit or a number above 0")):
        assert message in batch("correct", *arguments, status=2), arguments
    assert sorted(batch.folder.rglob("*")) == before


def test_references_that_do_not_fit_stop_the_batch(batch):
    folder = batch.folder
    tifffile.imwrite(folder / "small.tif", np.zeros((4, 4), "u2"))
    tifffile.imwrite(folder / "bytes.tif", np.zeros((40, 50), "u1"))
    tifffile.imwrite(folder / "colour.tif", np.zeros((40, 50, 3), "u1"))
    tifffile.imwrite(folder / "float.tif", np.ones((40, 50), "f4"))
    for arguments, message in (
            (["--dark", "dark.tif", "small.tif", "--flat", "flat.tif"],
             "small.tif: is 4 x 4 Unsigned 16, but dark.tif is 50 x 40 Unsigned 16"),
            (["--dark", "dark.tif", "--flat", "bytes.tif"],
             "bytes.tif: is 50 x 40 Unsigned 8, but dark.tif is 50 x 40 Unsigned 16"),
            (["--dark", "colour.tif", "--flat", "flat.tif"], "colour.tif: grey frames are wanted, not BGR 24"),
            (["--dark", "dark.tif", "--flat", "dark.tif"], "the flat frames are not brighter than the dark ones"),
            (["--dark", "float.tif", "--flat", "float.tif", "--gain", "fixed"],
             "a fixed-point gain needs Unsigned frames of at most 16 bits")):
        assert batch("correct", "a.tif", *arguments, "-o", "none/", status=1) == message
    assert not (folder / "none").exists()
    message = batch("correct", "a.tif", "--dark", "dark.tif", "--flat", "flat.tif", "-o", "dark.tif/", status=1)
    assert "dark.tif" in message


@pytest.mark.parametrize("number", [signal.SIGINT, signal.SIGTERM])
def test_an_interrupted_batch_leaves_whole_files_only(batch, number):
    folder = batch.folder
    frame = np.random.RandomState(4).randint(100, 9000, (1000, 1200)).astype("u2")
    names = [f"big{i}.tif" for i in range(60)]
    for name in ["bigdark.tif", *names[:1]]:
        tifffile.imwrite(folder / name, frame if name == "big0.tif" else frame // 100)
    for name in names[1:]:
        os.link(folder / "big0.tif", folder / name)
    command = ["correct", *names, "--dark", "bigdark.tif", "--no-gain", "-o", "out"]
    process = subprocess.Popen([PROGRAM, *command], cwd=folder, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
    deadline = time.monotonic() + 60
    while not (folder / "out" / "big2.tif").exists() and time.monotonic() < deadline:
        time.sleep(0.002)
    process.send_signal(number)
    assert process.wait(timeout=60) == -number
    whole = images(folder / "out")
    assert 3 <= len(whole) < len(names) and all(k.startswith("big") for k in whole)
    assert all(np.array_equal(image, frame - frame // 100) for image in whole.values())


def test_progress_is_for_terminals_only(batch):
    arguments = ["a.tif", "b.tif", *REFERENCES, "-o", "out"]
    assert run(batch, *arguments).stderr == ""
    master, slave = pty.openpty()
    done = subprocess.run([PROGRAM, "correct", *arguments], cwd=batch.folder, stdout=subprocess.PIPE, stderr=slave,
                          text=True, timeout=120)
    os.close(slave)
    shown = b""
    try:
        while piece := os.read(master, 65536):  # comes in pieces
            shown += piece
    except OSError:  # the end of a terminal that nobody holds
        pass
    os.close(master)
    shown = shown.decode()
    assert "1/4 dark dark.tif" in shown and "4/4 b.tif" in shown and shown.endswith("\r\x1b[K")
    assert "\x1b" not in done.stdout and "\r" not in done.stdout
