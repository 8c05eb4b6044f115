#!/usr/bin/python3
"""Makes the site: build.py BUILD_FOLDER OUTPUT_FOLDER

Pages come from docs/, the reference from the interface tables, the gallery's pictures from running its scripts.
"""

import ast
import json
import pathlib
import re
import shutil
import subprocess
import sys

import links
import pages
from pages import SOURCE

TITLES = {"start.md": "Five minutes", "pixels.md": "Pixels", "architecture.md": "Architecture", "accuracy.md": "Accuracy",
          "CONTRIBUTING.md": "Contributing"}
FIRST = ["start.md", "pixels.md"]


def copied(folder):
    """Copies the written pages; returns their names."""
    written = sorted(SOURCE.glob("docs/*.md"))
    for page in [*written, SOURCE / "CONTRIBUTING.md"]:
        shutil.copy(page, folder)
    return [page.name for page in written]


def gallery(build, folder):
    """Runs each script in a folder of its own and writes the page with its pictures."""
    folder.mkdir()
    lines = ["# Gallery", "", "Each picture was made by the code below it when this page was built. The photographs are those of "
             "Debian's `python3-skimage`.", ""]
    work = folder.parent.with_name(folder.parent.name + ".work")
    shutil.rmtree(work, ignore_errors=True)
    work.mkdir()
    pages.simulate_camera(build, work)
    known = set()
    for script in sorted((SOURCE / "docs/gallery").glob("*.py")):
        text = script.read_text()
        description = ast.get_docstring(ast.parse(text))
        title, about = description.split("\n\n", 1)
        pages.run([sys.executable, "-W", "error", "-B", str(script)], build, work)
        pictures = sorted((p for p in work.glob("*.png") if p not in known), key=lambda p: p.stat().st_mtime_ns)
        if not pictures:
            raise SystemExit(f"{script.name} made no picture")
        known.update(pictures)
        lines += [f"## {title}", "", about, "", '<div class="pictures" markdown>', ""]
        for picture in pictures:
            shutil.copy(picture, folder)
            lines.append(f"![{picture.stem.replace('_', ' ')}]({picture.name})")
        code = text.split('"""', 2)[2].lstrip("\n")
        lines += ["", "</div>", "", "```python", *code.splitlines(), "```", ""]
    (folder / "index.md").write_text("\n".join(lines))
    shutil.rmtree(work)


def shell_page(build):
    """What each command says of itself."""
    overview = pages.run(["zelt", "--help"], build, SOURCE)
    commands = re.findall(r"^  ([a-z]+) {2,}", overview.split("Subcommands:")[1].split("Examples:")[0], re.MULTILINE)
    lines = ["# Command line", "", "```output", overview.rstrip(), "```", ""]
    for command in commands:
        lines += [f"## zelt {command}", "", "```output", pages.run(["zelt", command, "--help"], build, SOURCE).rstrip(), "```", ""]
    return lines


def navigation(written, reference):
    known = [name for name in FIRST if name in written]
    others = [name for name in written if name not in [*FIRST, "index.md", "architecture.md"]]
    project = ["architecture.md", *others, "CONTRIBUTING.md"]

    def titled(name):
        return {TITLES.get(name, pathlib.Path(name).stem.capitalize()): name}

    return [{"Home": "index.md"}, *map(titled, known), {"Gallery": "gallery/index.md"},
            {"Reference": reference}, {"Project": list(map(titled, project))}]


def main():
    build, site = (pathlib.Path(p).resolve() for p in sys.argv[1:3])
    sys.path.insert(0, str(build / "python"))
    from reference import write_reference

    folder = site.with_name(site.name + ".pages")
    shutil.rmtree(folder, ignore_errors=True)
    folder.mkdir(parents=True)
    written = copied(folder)
    shutil.copy(SOURCE / "docs/site/style.css", folder)
    reference = write_reference(folder / "reference", SOURCE / "include/zelt/interfaces")
    (folder / "reference/shell.md").write_text("\n".join(shell_page(build)))
    reference.append({"Command line": "reference/shell.md"})
    gallery(build, folder / "gallery")

    settings = folder.with_suffix(".yml")
    settings.write_text(json.dumps({"INHERIT": str(SOURCE / "docs/site/mkdocs.yml"), "docs_dir": str(folder),
                                    "site_dir": str(site), "nav": navigation(written, reference)}))
    done = subprocess.run(["mkdocs", "build", "--strict", "--clean", "-f", str(settings)])
    problems = list(links.faults(site)) if done.returncode == 0 else ["mkdocs failed"]
    if problems:
        raise SystemExit("\n".join(problems))
    print(f"docs: {site}/index.html; with search: python3 -m http.server -d {site}")


if __name__ == "__main__":
    main()
