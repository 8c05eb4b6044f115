"""What the pages of the documentation say in code is run as it stands there."""

import os
import pathlib
import sys

from conftest import BUILD
import pytest

SOURCE = pathlib.Path(__file__).parents[2]
sys.path.insert(0, str(SOURCE / "docs/site"))
import pages

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
    import zelt

    root = zelt.create("ZELT.Main2")
    for picture in made:
        image = zelt.imread(picture)
        assert root.Statistics.Maximum(image) > root.Statistics.Minimum(image), f"{picture.name} shows nothing"


def test_a_block_that_fails_is_noticed(camera):
    with pytest.raises(AssertionError, match="exit status 3"):
        pages.run_shell("exit 3", BUILD, camera)
    with pytest.raises(AssertionError, match="null IPixmat2"):
        pages.run_python("import zelt\nzelt.create('ZELT.Main2').Filters.Sobel(None)", BUILD, camera)
