"""The page about a correction, and the demo that ends with one."""

import base64
import io
import os
import re
import subprocess
import xml.etree.ElementTree

import numpy as np
import tifffile
from PIL import Image

from conftest import PROGRAM


def parse(path):
    """A page that a strict parser accepts, and that asks nobody else for anything."""
    page = path.read_bytes().decode()
    tree = xml.etree.ElementTree.fromstring(page)
    sources = [e.get("src") for e in tree.iter("img")]
    assert sources and all(s.startswith("data:image/png;base64,") for s in sources)
    rest = re.sub(r'"data:image/png;base64,[A-Za-z0-9+/=]*"', "", page)
    assert not re.search(r"https?:|//|href|<script|<link|@import|url\(|src=[^/>]", rest)
    return tree


def pictures(tree):
    found = {}
    for image in tree.iter("img"):
        png = Image.open(io.BytesIO(base64.b64decode(image.get("src").split(",")[1], validate=True)))
        assert png.size == (int(image.get("width")), int(image.get("height")))
        found.setdefault(image.get("alt"), []).append(np.asarray(png))
    return found


def test_report_shows_every_picture_and_number(zelt):
    random = np.random.RandomState(6)
    ramp = np.tile(np.arange(1500), (900, 1))
    tifffile.imwrite(zelt.folder / "dark.tif", random.randint(90, 110, ramp.shape).astype("u2"))
    tifffile.imwrite(zelt.folder / "flat.tif", (10000 + ramp + random.randint(0, 50, ramp.shape)).astype("u2"))
    for i in range(6):
        tifffile.imwrite(zelt.folder / f"r{i}.tif", (200 + i + ramp).astype("u2"))
    said = zelt("correct", *[f"r{i}.tif" for i in range(6)], "--dark", "dark.tif", "--flat", "flat.tif", "-o", "out",
                "--report", "page/deep")
    assert said.endswith("report: page/deep/report.html\n")
    assert [p.name for p in (zelt.folder / "page/deep").iterdir()] == ["report.html"]
    tree = parse(zelt.folder / "page/deep/report.html")
    shown = pictures(tree)
    assert {k: len(v) for k, v in shown.items()} == {
        "Raw": 4, "Corrected": 4, "Dark reference": 1, "Light": 1, "Gain reference": 1}
    raw = shown["Raw"][0].astype(int)
    assert raw.shape == (300, 500) and raw[0, 0] == 0 and raw[0, -1] == 255 and (np.diff(raw[0]) >= 0).all()
    assert len(list(tree.iter("svg"))) == 8
    rows = [[cell.text for cell in row.iter("td")] for row in tree.iter("tr")][1:]
    assert [r[0] for r in rows] == [n for i in range(6) for n in (f"r{i}.tif", f"out/r{i}.tif")]
    for i in range(6):
        corrected = tifffile.imread(zelt.folder / f"out/r{i}.tif")
        assert rows[2 * i][2:5] == ["949.50" if i == 0 else f"{949.5 + i:.2f}", str(200 + i), str(1699 + i)]
        assert float(rows[2 * i + 1][2]) == round(corrected.mean(), 2)


def test_any_file_name_is_harmless_in_the_page(zelt):
    tifffile.imwrite(zelt.folder / "dark.tif", np.full((8, 9), 10, "u2"))
    names = [b"a<script>alert(1)&'\".tif", b"bad\xff\xc3(\xed\xa0\x80\x01.tif", "\u00fc \u0001\u65e5.tif".encode()]
    for name in names:
        tifffile.imwrite(os.fsdecode(os.path.join(os.fsencode(zelt.folder), name)), np.arange(72, dtype="u2").reshape(8, 9))
    done = subprocess.run([PROGRAM, "correct", *names, "nothing<b>.tif", "--dark", "dark.tif", "--no-gain", "-o", "out",
                           "--report", "page"], cwd=zelt.folder, capture_output=True, timeout=60)
    assert done.returncode == 1 and done.stderr.count(b"\n") == 2
    text = "".join(parse(zelt.folder / "page/report.html").itertext())
    assert "a<script>alert(1)&'\".tif" in text and "nothing<b>.tif" in text and "\u00fc \ufffd\u65e5.tif" in text
    assert "bad\ufffd\ufffd(" in text and "\x01" not in text


def test_extreme_and_missing_pixels_do_not_upset_the_report(zelt):
    image = np.full((8, 9), 1, "f8")
    tifffile.imwrite(zelt.folder / "dark.tif", image * 0)
    for name, values in (("nan", [np.nan]), ("far", [1e308, -1e308, np.inf, -np.inf]), ("part", [np.nan, 0, 1, 2])):
        tifffile.imwrite(zelt.folder / f"{name}.tif", np.resize(np.array(values, "f8"), image.shape))
    zelt("correct", "nan.tif", "far.tif", "part.tif", "--dark", "dark.tif", "--no-gain", "-o", "out", "--report", "page")
    shown = pictures(parse(zelt.folder / "page/report.html"))
    assert (shown["Raw"][0] == 0).all() and set(shown["Raw"][1].flat) == {0, 255} == set(shown["Raw"][2].flat) - {128}
    assert np.array_equal(tifffile.imread(zelt.folder / "out/far.tif"), tifffile.imread(zelt.folder / "far.tif"))


def rms(folder, name, pixels, offset=0):
    truth = tifffile.imread(folder / "truth.tif").astype(float)
    return np.sqrt(np.mean((tifffile.imread(folder / name).astype(float) - offset - truth)[pixels] ** 2))


def test_demo_reaches_the_noise_limit(zelt):
    said = zelt("demo", "-o", "d")
    folder = zelt.folder / "d"
    darks = np.mean([tifffile.imread(folder / f"dark_{i}.tif") for i in range(1, 9)], axis=0)
    flats = np.mean([tifffile.imread(folder / f"flat_{i}.tif") for i in range(1, 9)], axis=0)
    raw = tifffile.imread(folder / "raw.tif")
    works = (flats - darks > 100) & (flats < 16000) & (raw < 16383)
    assert works.mean() > 0.999 and raw.max() < 2**14
    before, after = rms(folder, "raw.tif", works, darks.mean()), rms(folder, "corrected.tif", works)
    told = [float(x) for x in re.search(r"raw +([\d.]+) counts[^%]*%[^%]*?corrected +([\d.]+) counts", said).groups()]
    assert np.allclose(told, [before, after], rtol=0.01)  # its own idea of working pixels differs by a few
    limit = re.search(r"corrected .* ([\d.]+) % \(noise alone makes ([\d.]+) %\)", said).groups()
    assert abs(float(limit[0]) - float(limit[1])) <= 0.02 and before > 10 * after
    tree = parse(folder / "report.html")
    assert len(pictures(tree)["Truth"]) == 1 and "Error against the truth" in "".join(tree.itertext())


def test_demo_repeats_itself_for_a_seed(zelt):
    for folder, seed in (("a", 3), ("b", 3), ("c", 4)):
        zelt("demo", "-o", folder, "--seed", seed, "--stars")
    contents = [{p.name: p.read_bytes() for p in (zelt.folder / n).iterdir() if p.suffix == ".tif"} for n in "abc"]
    assert len(contents[0]) == 19 and contents[0] == contents[1]
    assert all(contents[0][name] != contents[2][name] for name in contents[0])
    page = "".join(parse(zelt.folder / "a" / "report.html").itertext())
    assert "a made-up star field" in page
