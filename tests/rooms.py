#!/usr/bin/python3
"""Checks that includes follow the arrows between the rooms: hosts -> host -> facets -> kernels -> pixel model."""

import pathlib
import re
import sys

INCLUDE = re.compile(r'^\s*#\s*include\s*([<"])([^>"]+)[>"]')
SOURCES = {".h", ".cpp", ".inl"}

# What each lower room may include besides itself; every other folder of src/ is a family. "zelt/" stands for
# the small headers directly in include/zelt. The names of pixel layouts are public and known everywhere.
LAYOUT = "zelt/pixmat/layout.h"
LOWER = {
    "com": {"zelt/com", "zelt/"},
    "pixel": {"com/held_over_fork.h", LAYOUT, "zelt/"},
    "pixmat": {"com", "pixel", "zelt/com", "zelt/pixmat", "zelt/"},
    "threads": {"com", "pixel", "frame/debug_stream.h", "zelt/com", "zelt/pixmat", "zelt/interfaces", "zelt/"},
    "frame": {"com", "pixel", "pixmat", "threads", "zelt/com", "zelt/pixmat", "zelt/interfaces", "zelt/"},
}
KERNEL = {"pixel", "threads", "kernels", LAYOUT, "zelt/"}
FACET = {*LOWER, "kernels", "own", "zelt/com", "zelt/pixmat", "zelt/interfaces", "zelt/"}
PUBLIC = {
    "com": {"zelt/com", "zelt/"},
    "pixmat": {"zelt/com", "zelt/pixmat", "zelt/"},
    "interfaces": {"zelt/com", "zelt/pixmat", "zelt/interfaces", "zelt/"},
    "": {"zelt/com", "zelt/pixmat", "zelt/interfaces", "zelt/", "zelt/zelt.h"},
}


def target_of(name, file, root):
    """The names under which an include may be allowed; empty for headers from outside the project."""
    parts = name.split("/")
    if parts[0] == "zelt":
        if len(parts) > 2:
            return {"zelt/" + parts[1], name}
        return {"zelt/zelt.h"} if parts[1] == "zelt.h" else {"zelt/"}
    path = root / "src" / name
    if not path.is_file():
        path = (file.parent / name).resolve()
        if not path.is_relative_to(root / "src"):
            return set()
    parts = path.relative_to(root / "src").parts
    in_kernels = len(parts) > 2 and parts[1] == "kernels"
    return {parts[0], "/".join(parts)} | ({"kernels"} if in_kernels else set())


def allowed_for(file, root):
    """What a file may include, and the name of its room; None for a file that may include everything."""
    parts = file.relative_to(root).parts
    if parts[0] == "include":
        folder = parts[2] if len(parts) > 3 else ""
        return PUBLIC.get(folder, set()), "zelt/" + folder
    if parts[0] == "hosts":
        return {"zelt/com", "zelt/pixmat", "zelt/interfaces", "zelt/", "zelt/zelt.h"}, "hosts"
    room = parts[1]
    if room == "host":
        return None, room
    if room in LOWER:
        return LOWER[room], room
    if len(parts) > 3 and parts[2] == "kernels":
        return KERNEL, room + "/kernels"
    return FACET, room


def violations(root):
    for folder in ("include", "src", "hosts"):
        for file in sorted((root / folder).rglob("*")):
            if file.suffix not in SOURCES:
                continue
            allowed, room = allowed_for(file, root)
            if allowed is None:
                continue
            for number, line in enumerate(file.read_text().splitlines(), 1):
                match = INCLUDE.match(line)
                if not match:
                    continue
                target = target_of(match[2], file, root)
                own = {room} & target if room in LOWER or "own" in allowed else set()
                if target and not own and not target & allowed:
                    yield f"{file.relative_to(root)}:{number}: {room} must not include {match[2]}"


def main():
    root = pathlib.Path(sys.argv[1]).resolve()
    found = list(violations(root))
    for line in found:
        print(line)
    checked = sum(1 for folder in ("include", "src") for f in (root / folder).rglob("*") if f.suffix in SOURCES)
    if checked == 0:
        sys.exit("rooms: no sources found below " + str(root))
    print(f"rooms: {checked} files, {len(found)} forbidden includes")
    sys.exit(1 if found else 0)


if __name__ == "__main__":
    main()
