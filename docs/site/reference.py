"""The reference pages: a page for each facet, from the interface tables and the comments of the public headers.

The tables give names, arguments, types, defaults and one line of help; the headers tell pixels, values, borders, in-place
rules and failures. Whether a method is there yet, the library itself is asked.
"""

import enum
import re

import zelt
from zelt import _describe

E_NOTIMPL = 0x80004001

# How the paragraphs of a header comment begin: "/// Border     clamped."
LABEL = re.compile(r"([A-Z][A-Za-z]*(?: [a-z]+)?)\s{2,}(.*)")


def escaped(text):
    return re.sub(r"([\\*_`<|\[\]])", r"\\\1", text)


def paragraphs(comment):
    """[(label, text)] of a header comment; the description at its beginning has an empty label."""
    parts = [["", []]]
    for line in comment:
        found = LABEL.fullmatch(line)
        if found:
            parts.append([found[1], [found[2]]])
        else:
            parts[-1][1].append(line.strip())
    return [(label, " ".join(lines).strip()) for label, lines in parts if any(lines)]


def header_comments(folder):
    """{interface: (comment, {method: comment})} of every header in a folder."""
    comments = {}
    for header in sorted(folder.glob("*.h")):
        block, methods = [], {}
        for line in header.read_text().splitlines():
            text = line.strip()
            if text.startswith("///"):
                block.append(text[3:].removeprefix(" "))
                continue
            if found := re.match(r"struct (\w+) : \w+ {", text):
                methods = {}
                comments[found[1]] = (block, methods)
            elif found := re.match(r"virtual HRESULT (?:[gp][eu]t_)?(\w+)\(", text):
                methods.setdefault(found[1], block)
            block = []
    return comments


def is_there(facet, name, row):
    """False if the method answers "not implemented" to arguments that any other method refuses first."""
    values = []
    for a in _describe.inputs_of(row):
        nothing = {_describe.OBJECT: None, _describe.VT_VARIANT: None, _describe.VT_BSTR: ""}
        values.append([0.0] if a["vartype"] & _describe.VT_ARRAY else nothing.get(a["vartype"], 0))
    try:
        getattr(facet, name)(*values)
    except zelt.Error as error:
        return error.hresult & 0xFFFFFFFF != E_NOTIMPL
    return True


def table_of(parts):
    rows = [f"| **{escaped(label)}** | {escaped(text)} |" for label, text in parts]
    return ["| | |", "|---|---|", *rows, ""] if rows else []


def type_text(argument):
    if argument["enumeration"] is not None:
        return f"[{escaped(argument['type'])}](enumerations.md#{argument['type'].lower()})"
    return escaped(argument["type"])


def default_text(argument):
    if not argument["optional"]:
        return ""
    default = _describe.default_of(argument)
    return escaped(str(getattr(default, "name", default)))


def arguments_table(row):
    rows = []
    for a in row["arguments"]:
        given = a["way"] == "in"
        python = escaped(_describe.type_of(a))
        note = default_text(a) if given else "(result)"
        rows.append(f"| `{a['name']}` | {type_text(a)} | {python} | {note} |")
    return ["| Argument | Type | In Python | If left out |", "|---|---|---|---|", *rows, ""] if rows else []


def call_text(facet_name, name, row):
    arguments = [f"[{a['name']}]" if a["optional"] else a["name"] for a in _describe.inputs_of(row)]
    result = _describe.result_of(row)
    return f"{facet_name}.{name}({', '.join(arguments)})" + ("" if result == "None" else f" -> {result}")


def method_section(facet_name, name, row, comment, writable):
    parts = paragraphs(comment)
    described = parts.pop(0)[1] if parts and not parts[0][0] else row["help"][0].upper() + row["help"][1:] + "."
    lines = [f"## {name}", "", escaped(described), ""]
    if row["kind"] == _describe.PROPERTY_GET:
        lines += [f"A property, {_describe.result_of(row)}" + ("; can be set." if writable else "; can only be read."), ""]
    else:
        lines += ["```text", call_text(facet_name, name, row), "```", ""]
    if row["pixels"] and not any(label == "Pixels" for label, _ in parts):
        parts.insert(0, ("Pixels", row["pixels"]))
    return lines + table_of(parts) + (arguments_table(row) if row["kind"] != _describe.PROPERTY_GET else [])


def facet_page(root, facet_name, comments):
    """The lines of a page, and how many methods are there and are missing."""
    facet = getattr(root, facet_name)
    interface = type(facet).__name__
    about, methods = comments.get(interface, ([], {}))
    rows, missing = [], []
    for name, attribute in vars(type(facet)).items():
        if name.startswith("_"):
            continue
        is_property = isinstance(attribute, property)
        row = attribute.fget._row if is_property else attribute._row
        if is_property or is_there(facet, name, row):
            rows.append((name, row, is_property and attribute.fset is not None))
        else:
            missing.append((name, row))

    parts = paragraphs(about)
    lines = [f"# {facet_name}", "", f"`root.{facet_name}` in Python, `IZELT2::get_{facet_name}` in C++ (`{interface}`), "
              f"`zelt call {facet_name}.METHOD` in the shell.", ""]
    if parts and not parts[0][0]:
        lines += [escaped(parts.pop(0)[1]), ""]
    lines += table_of(parts)
    if missing:
        lines += [f"{len(rows)} of {len(rows) + len(missing)} methods are there; "
                  "[the others](#not-implemented-yet) answer \"not implemented\" (E_NOTIMPL).", ""]
    for name, row, writable in rows:
        lines += method_section(facet_name, name, row, methods.get(name, []), writable)
    if missing:
        lines += ["## Not implemented yet", "", "These names are taken; a call answers E_NOTIMPL.", "",
                  "| Method | What it will be |", "|---|---|"]
        lines += [f"| {escaped(name)} | {escaped(row['help'])} |" for name, row in missing]
    return lines, len(rows), len(missing)


def enumerations_page():
    lines = ["# Enumerations", "", "In Python a value may be given as a member (`zelt.PixmatEncoding.Float`), a number or a "
             "name (`\"Float\"`).", ""]
    kinds = [k for k in map(zelt.__getattr__, zelt._zelt.known_names()) if issubclass(k, enum.Enum)]
    for kind in sorted(kinds, key=lambda k: k.__name__):
        lines += [f"## {kind.__name__}", "", "| Name | Value |", "|---|---|"]
        lines += [f"| {escaped(m.name)} | {int(m)} |" for m in kind] + [""]
    return lines


def write_reference(folder, headers):
    """Writes the pages into a folder; returns [(title, file name)] in the order of the navigation."""
    folder.mkdir(parents=True)
    comments = header_comments(headers)
    zelt._make_classes()
    root = zelt.create("ZELT.Main2")
    pages, overview = [], ["# Reference", "", "Facets of the root object `ZELT.Main2`, made from the library's own tables.", "",
                           "| Facet | For | Methods | Not implemented yet |", "|---|---|---|---|"]
    for name, attribute in vars(type(root)).items():
        if not isinstance(attribute, property) or not isinstance(getattr(root, name), zelt.Object):
            continue
        text, present, missing = facet_page(root, name, comments)
        title = name
        if present or missing:
            (folder / f"{name}.md").write_text("\n".join(text) + "\n")
            pages.append((name, f"{name}.md"))
            title = f"[{name}]({name}.md)"
        overview.append(f"| {title} | {escaped(attribute.fget._row['help'])} | {present} | {missing or ''} |")
    overview += ["", "A facet with 0 methods has none yet."]
    (folder / "index.md").write_text("\n".join(overview) + "\n")
    (folder / "enumerations.md").write_text("\n".join(enumerations_page()) + "\n")
    return [("Overview", "index.md"), *pages, ("Enumerations", "enumerations.md")]
