"""Makes a wheel of the Python package with CMake: the build backend that pyproject.toml names.

The wheel carries the library beside the module, so that it works wherever Debian's run-time libraries are.
"""

import base64
import hashlib
import os
import pathlib
import re
import subprocess
import sys
import sysconfig
import tempfile
import zipfile

ROOT = pathlib.Path(__file__).resolve().parents[3]
STABLE_DATE = (1980, 1, 1, 0, 0, 0)


def _project():
    """Name, version and summary, from where CMake has them."""
    text = (ROOT / "CMakeLists.txt").read_text()
    return re.search(r'project\((\w+) VERSION (\S+) DESCRIPTION "([^"]*)"', text).groups()


def _metadata():
    name, version, summary = _project()
    return (f"Metadata-Version: 2.1\nName: {name}\nVersion: {version}\nSummary: {summary}\n"
            f"Requires-Python: >={sys.version_info[0]}.{sys.version_info[1]}\nRequires-Dist: numpy\n")


def _tag():
    version = f"cp{sys.version_info[0]}{sys.version_info[1]}"
    return f"{version}-{version}-{sysconfig.get_platform().replace('-', '_').replace('.', '_')}"


def _build(folder):
    """Builds without tests and installs what the wheel holds below folder/stage."""
    build, stage = folder / "build", folder / "stage"
    options = ["-DCMAKE_BUILD_TYPE=Release", f"-DPython_EXECUTABLE={sys.executable}", f"-DCMAKE_INSTALL_PREFIX={stage}",
               "-DZELT_PYTHON_PACKAGE=ON", "-DZELT_PYTHON_INSTALL_DIR=.", "-DZELT_TESTS=OFF", "-DZELT_BENCH=OFF"]
    for command in (["cmake", "-G", "Ninja", "-S", ROOT, "-B", build, *options],
                    ["cmake", "--build", build, "-j", str(os.cpu_count()), "--target", "zelt_python_package"],
                    ["cmake", "--install", build, "--component", "python"],
                    ["cmake", "--install", build, "--component", "python_libraries"]):
        subprocess.run(command, check=True)
    return stage


def _files(stage):
    """What goes into the wheel, by name there."""
    name, version, _ = _project()
    info = f"{name}-{version}.dist-info"
    files = {p.relative_to(stage).as_posix(): p.read_bytes() for p in sorted(stage.rglob("*")) if p.is_file()}
    files[f"{info}/METADATA"] = _metadata().encode()
    files[f"{info}/WHEEL"] = f"Wheel-Version: 1.0\nGenerator: {name}\nRoot-Is-Purelib: false\nTag: {_tag()}\n".encode()
    record = ""
    for path, content in files.items():
        digest = base64.urlsafe_b64encode(hashlib.sha256(content).digest()).rstrip(b"=").decode()
        record += f"{path},sha256={digest},{len(content)}\n"
    files[f"{info}/RECORD"] = (record + f"{info}/RECORD,,\n").encode()
    return files


def build_wheel(wheel_directory, config_settings=None, metadata_directory=None):
    name, version, _ = _project()
    wheel = f"{name}-{version}-{_tag()}.whl"
    with tempfile.TemporaryDirectory() as folder:
        files = _files(_build(pathlib.Path(folder)))
    with zipfile.ZipFile(pathlib.Path(wheel_directory) / wheel, "w", zipfile.ZIP_DEFLATED) as archive:
        for path, content in files.items():
            entry = zipfile.ZipInfo(path, STABLE_DATE)
            entry.compress_type = zipfile.ZIP_DEFLATED
            entry.external_attr = 0o100644 << 16
            archive.writestr(entry, content)
    return wheel


def build_sdist(sdist_directory, config_settings=None):
    raise NotImplementedError("install from a checkout: pip install --no-build-isolation .")
