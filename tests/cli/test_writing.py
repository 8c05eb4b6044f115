"""A file appears whole or not at all, whatever happens."""

import os
import resource
import signal
import subprocess
import time

import numpy as np
import pytest
import tifffile

from conftest import PROGRAM, pixels


def names(folder):
    return sorted(p.name for p in folder.iterdir())


@pytest.mark.parametrize("number", [signal.SIGINT, signal.SIGTERM, signal.SIGHUP])
@pytest.mark.parametrize("output", ["old.tif", "old.fits"])
def test_an_interrupted_run_leaves_what_was_there(tmp_path, number, output):
    tifffile.imwrite(tmp_path / "stack.tif", pixels((20, 64, 64), "u2"), photometric="minisblack")
    (tmp_path / output).write_text("the old file")
    before = names(tmp_path)
    running = subprocess.Popen([PROGRAM, "copy", *["stack.tif"] * 400, "-o", output], cwd=tmp_path)
    deadline = time.monotonic() + 60
    while names(tmp_path) == before and running.poll() is None and time.monotonic() < deadline:
        time.sleep(0.001)
    assert len(names(tmp_path)) == len(before) + 1, "the run was over before it could be interrupted"
    running.send_signal(number)
    assert running.wait(60) == -number
    assert names(tmp_path) == before and (tmp_path / output).read_text() == "the old file"


def test_a_full_disk_is_told_and_leaves_nothing(zelt):
    tifffile.imwrite(zelt.folder / "in.tif", pixels((200, 200), "u2"))
    limit = lambda: resource.setrlimit(resource.RLIMIT_FSIZE, (20000, 20000))
    for output in "out.tif", "out.png", "out.fits":
        said = zelt("copy", "in.tif", "-o", output, status=1, preexec_fn=limit)
        assert said.startswith(f"{output}: "), said
    assert names(zelt.folder) == ["in.tif"]


def test_a_failed_frame_leaves_nothing(zelt):
    tifffile.imwrite(zelt.folder / "good.tif", pixels((5, 7), "f4"))
    tifffile.imwrite(zelt.folder / "bad.tif", pixels((5, 7), "f4"))
    with open(zelt.folder / "bad.tif", "r+b") as file:
        file.truncate(300)
    zelt("copy", "good.tif", "bad.tif", "-o", "out.tif", status=1)
    assert names(zelt.folder) == ["bad.tif", "good.tif"]


def test_an_image_may_replace_its_own_file(zelt):
    image = pixels((50, 70), "u2")
    path = zelt.folder / "in.tif"
    tifffile.imwrite(path, image)
    path.chmod(0o640)
    (zelt.folder / "link.tif").symlink_to("in.tif")
    zelt("copy", "in.tif", "in.tif", "-o", "link.tif")
    assert np.array_equal(tifffile.imread(path), [image, image])
    assert (zelt.folder / "link.tif").is_symlink() and path.stat().st_mode & 0o777 == 0o640


def test_only_files_are_written_to(zelt):
    tifffile.imwrite(zelt.folder / "in.tif", pixels((5, 7), "u1"))
    (zelt.folder / "pipe.tif").symlink_to("/dev/null")
    os.mkfifo(zelt.folder / "fifo.png")
    for name in "pipe.tif", "fifo.png":
        assert zelt("copy", "in.tif", "-o", name, status=1) == f"{name}: is not a regular file"
    assert zelt("copy", "in.tif", "-o", "no/such.tif", status=1) == "no/such.tif: No such file or directory"
    assert "is not the name of a file" in zelt("copy", "in.tif", "-o", "no/", status=2)


def test_a_closed_output_stream_is_told(tmp_path):
    with open("/dev/full", "w") as full:
        done = subprocess.run([PROGRAM, "list"], stdout=full, stderr=subprocess.PIPE, text=True)
    assert (done.returncode, done.stderr) == (1, "zelt: the output cannot be written\n")
