"""What the pages of the documentation say in code is run as it stands there."""

import os
import pathlib
import sys

from conftest import BUILD
import numpy as np
import pytest

SOURCE = pathlib.Path(__file__).parents[2]
sys.path.insert(0, str(SOURCE / "docs/site"))
import links
import pages
import reference
import zelt

PAGES = [SOURCE / "README.md", SOURCE / "docs/start.md"]


@pytest.fixture(scope="module")
def camera(tmp_path_factory):
    """A folder with the frames that the pages work on."""
    folder = tmp_path_factory.mktemp("pages")
    pages.simulate_camera(BUILD, folder)
    return folder


@pytest.mark.parametrize("page", PAGES, ids=lambda p: p.stem)
def test_code_runs(page, camera):
    """In the order of a reader who tries the shell first."""
    shell, python, cpp = (pages.code(page, language) for language in ("sh", "python", "cpp"))
    assert shell and python and cpp
    for text in shell:
        pages.run_shell(text, BUILD, camera)
    pages.run_python("\n".join(python), BUILD, camera)
    for text in cpp:
        pages.run_cpp(text, BUILD, camera)


def test_the_first_program_prints_what_its_page_says(camera):
    assert pages.run_cpp(pages.code(SOURCE / "docs/start.md", "cpp")[0], BUILD, camera) == "1000\n"


def test_examples_print_what_the_page_shows():
    attempted, report = pages.check_examples(SOURCE / "docs/pixels.md")
    assert not report, report
    assert attempted > 40


@pytest.mark.parametrize("script", sorted((SOURCE / "docs/gallery").glob("*.py")), ids=lambda p: p.stem)
def test_gallery_makes_pictures(script, camera):
    before = set(camera.glob("*.png"))
    for picture in before:
        os.remove(picture)
    pages.run([sys.executable, "-W", "error", "-B", str(script)], BUILD, camera)
    made = list(camera.glob("*.png"))
    assert made
    root = zelt.create("ZELT.Main2")
    for picture in made:
        image = zelt.imread(picture)
        assert root.Statistics.Maximum(image) > root.Statistics.Minimum(image), f"{picture.name} shows nothing"


def test_reference_tells_all_methods_and_which_are_missing(tmp_path):
    folder = tmp_path / "reference"
    reference.write_reference(folder, SOURCE / "include/zelt/interfaces")
    page = (folder / "Filters.md").read_text()
    filters = zelt.create("ZELT.Main2").Filters
    described, _, missing = page.partition("## Not implemented yet")
    for name in (n for n in vars(type(filters)) if not n.startswith("_")):
        assert (f"\n## {name}\n" in described) != (f"| {name} |" in missing), name

    gauss = described.split("\n## Gauss\n")[1].split("\n## ")[0]
    assert "| **Border** | from 0.5 on the image continues" in gauss          # from the header
    assert "Filters.Gauss(pIImage, sigma, [pIOut]) -> Image" in gauss          # from the table

    frame = np.zeros((8, 8), np.uint8)
    for name, arguments in {"Sobel": (), "Gauss": (1.0,), "Median": (3, 3), "Kuwahara": (3, 3), "LowPass": (0.1, 0.1)}.items():
        try:
            getattr(filters, name)(frame, *arguments)
            answers = True
        except zelt.Error as error:
            answers = error.hresult != reference.E_NOTIMPL
        assert answers == (f"\n## {name}\n" in described), name


def test_links_that_lead_nowhere_are_found(tmp_path):
    (tmp_path / "a.html").write_text('<a href="b.html#x">1</a><a href="c.html">2</a><img src="https://elsewhere/p.png">')
    (tmp_path / "b.html").write_text('<h1 id="y"><a href="a.html">3</a><a href="#y">4</a><a href="https://elsewhere">5</a></h1>')
    assert sorted(links.faults(tmp_path)) == [
        "a.html: b.html#x: no such place", "a.html: c.html is not there",
        "a.html: https://elsewhere/p.png is loaded from a network"]


def test_a_block_that_fails_is_noticed(camera):
    with pytest.raises(AssertionError, match="exit status 3"):
        pages.run_shell("exit 3", BUILD, camera)
    with pytest.raises(AssertionError, match="null IPixmat2"):
        pages.run_python("import zelt\nzelt.create('ZELT.Main2').Filters.Sobel(None)", BUILD, camera)
