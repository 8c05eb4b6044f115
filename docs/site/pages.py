"""The code on the pages, and how it is run: Python blocks of a page share their names, examples with >>> are compared with what
they print, each C++ block is a program, shell blocks are scripts. A shell block that begins with "# NAME" is only shown: it
installs or compiles."""

import doctest
import os
import pathlib
import re
import subprocess
import sys
import textwrap

SOURCE = pathlib.Path(__file__).resolve().parents[2]
FENCE = re.compile(r"^( *)```(\w+)\n(.*?)^\1```$", re.DOTALL | re.MULTILINE)
LIMIT = 120  # seconds for a block


def blocks(page):
    """[(language, code)] of a page in order, whatever the indentation of its blocks."""
    return [(found[2], textwrap.dedent(found[3])) for found in FENCE.finditer(page.read_text())]


def code(page, language):
    return [text for kind, text in blocks(page) if kind == language]


def environment(build):
    """With the programs and the package of a build, and no window for plots."""
    path = f"{build / 'bin'}{os.pathsep}{os.environ['PATH']}"
    return {**os.environ, "PATH": path, "PYTHONPATH": str(build / "python"), "MPLBACKEND": "template",
            "PYTHONDONTWRITEBYTECODE": "1", "MPLCONFIGDIR": "."}


def run(command, build, folder):
    """What a command prints; fails with all that it printed."""
    done = subprocess.run(command, cwd=folder, env=environment(build), timeout=LIMIT, text=True,
                          stdout=subprocess.PIPE, stderr=subprocess.STDOUT)
    if done.returncode:
        raise AssertionError(f"{command[0]}: exit status {done.returncode}\n{done.stdout}")
    return done.stdout


def simulate_camera(build, folder):
    run(["zelt", "demo"], build, folder)


def run_python(text, build, folder):
    return run([sys.executable, "-W", "error", "-c", text], build, folder)


def run_shell(text, build, folder):
    return "" if text.startswith("# ") else run(["sh", "-euc", text], build, folder)


def run_cpp(text, build, folder):
    (folder / "program.cpp").write_text(text)
    compiler = os.environ.get("CXX", "c++")
    run([compiler, "-std=c++20", "-Wall", "-Werror", "program.cpp", "-o", "program", f"-I{SOURCE / 'include'}",
         f"-L{build / 'lib'}", "-lzelt", f"-Wl,-rpath,{build / 'lib'}"], build, folder)
    return run(["./program"], build, folder)


def check_examples(page):
    """Runs the >>> examples of a page in this process; the number of failures and their description."""
    report = []
    test = doctest.DocTestParser().get_doctest("".join(code(page, "pycon")), {}, page.name, str(page), 0)
    result = doctest.DocTestRunner().run(test, out=report.append)
    return result.attempted, "".join(report)
