"""The reference pages: a page for each facet, from the interface tables and the comments of the public headers.

The tables give names, arguments, types, defaults and one line of help; the headers tell pixels, values, borders, in-place
rules and failures. Whether a method is there yet, the library itself is asked.
"""

import enum
import inspect
import re

import zelt
from zelt import _describe

E_NOTIMPL = 0x80004001

# How the paragraphs of a header comment begin: "/// Border     clamped."
LABEL = re.compile(r"([A-Z][A-Za-z]*(?: [a-z]+)?)\s{2,}(.*)")


def escaped(text):
    """Text as Markdown that shows it as it is; names between backticks are code."""
    parts = text.split("`") if text.count("`") % 2 == 0 else [text]
    plain = [re.sub(r"([\\*_`<|\[\]])", r"\\\1", part) for part in parts[::2]]
    code = [f"`{part}`" for part in parts[1::2]]
    return "".join(a + b for a, b in zip(plain, [*code, ""]))


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
        lines += ["```output", call_text(facet_name, name, row), "```", ""]
    if row["pixels"] and not any(label == "Pixels" for label, _ in parts):
        parts.insert(0, ("Pixels", row["pixels"]))
    return lines + table_of(parts) + (arguments_table(row) if row["kind"] != _describe.PROPERTY_GET else [])


def page_of(title, access, kind, comments, there):
    """The lines of a page about an interface, and how many methods are there and are missing. A name must be described in the
    headers: KeyError otherwise."""
    about, methods = comments[kind.__name__]
    rows, missing = [], []
    for name, attribute in vars(kind).items():
        if name.startswith("_"):
            continue
        is_property = isinstance(attribute, property)
        row = attribute.fget._row if is_property else attribute._row
        if is_property and _describe.result_of(row).startswith("I") and _describe.result_of(row) != "Image":
            continue  # a facet of a root
        if is_property or there(name, row):
            rows.append((name, row, is_property and attribute.fset is not None))
        else:
            missing.append((name, row))

    parts = paragraphs(about)
    lines = [f"# {title}", "", access, ""]
    if parts and not parts[0][0]:
        lines += [escaped(parts.pop(0)[1]), ""]
    lines += table_of(parts)
    if missing:
        lines += [f"{len(rows)} of {len(rows) + len(missing)} methods are there; "
                  "[the others](#not-implemented-yet) answer \"not implemented\" (E_NOTIMPL).", ""]
    for name, row, writable in rows:
        lines += method_section(title.split(" ")[0], name, row, methods[name], writable)
    if missing:
        lines += ["## Not implemented yet", "", "These names are taken; a call answers E_NOTIMPL.", "",
                  "| Method | What it will be |", "|---|---|"]
        lines += [f"| {escaped(name)} | {escaped(row['help'])} |" for name, row in missing]
    return lines, len(rows), len(missing)


def facets_of(root):
    """[(name, facet, what it is for)]"""
    properties = [(name, a) for name, a in vars(type(root)).items() if isinstance(a, property)]
    return [(name, getattr(root, name), a.fget._row["help"]) for name, a in properties
            if isinstance(getattr(root, name), zelt.Object)]


def enumerations_page():
    lines = ["# Enumerations", "", "In Python a value may be given as a member (`zelt.PixmatEncoding.Float`), a number or a "
             "name (`\"Float\"`).", ""]
    kinds = [k for k in map(zelt.__getattr__, zelt._zelt.known_names()) if issubclass(k, enum.Enum)]
    for kind in sorted(kinds, key=lambda k: k.__name__):
        lines += [f"## {kind.__name__}", "", "| Name | Value |", "|---|---|"]
        lines += [f"| {escaped(m.name)} | {int(m)} |" for m in kind] + [""]
    return lines


def python_page():
    """What the package has beside the interfaces."""
    lines = ["# Python module", "", *inspect.getdoc(zelt).splitlines()[:1], ""]
    for name in zelt.__all__:
        thing = getattr(zelt, name)
        lines += [f"## {name}", ""]
        try:
            shown = f"zelt.{name}{inspect.signature(thing)}"
        except ValueError:
            shown = f"zelt.{name}"
        lines += ["```output", shown, "```", ""]
        for paragraph in (inspect.getdoc(thing) or "").split("\n\n"):
            in_columns = re.search(r"\S {2,}\S|\n ", paragraph)
            lines += ["```output", paragraph, "```", ""] if in_columns else [escaped(paragraph), ""]
        if isinstance(thing, type):
            members = [(n, inspect.getdoc(m)) for n, m in vars(thing).items() if not n.startswith("_") and inspect.getdoc(m)]
            if members and not hasattr(thing, "_fields"):
                lines += ["| | |", "|---|---|", *[f"| `{n}` | {escaped(' '.join(d.split()))} |" for n, d in members], ""]
    return lines


def write_reference(folder, headers):
    """Writes the pages into a folder; returns their navigation: {title: page or a list of the same}."""
    folder.mkdir(parents=True)
    comments = header_comments(headers)
    zelt._make_classes()
    navigation, known = [{"Overview": f"{folder.name}/index.md"}], set()
    overview = ["# Reference", "", "Made from the library's own tables and headers.", ""]

    def page(title, file, lines):
        (folder / file).write_text("\n".join(lines) + "\n")
        return {title: f"{folder.name}/{file}"}

    for program, heading in (("ZELT.Main2", "Facets"), ("ZELT.Main", "First generation")):
        first = program == "ZELT.Main"
        root = zelt.create(program)
        interface = type(root).__name__
        overview += [f"## {heading}", "", f"The object `{program}`, [{interface}]({interface}.md), and its facets:", "",
                     "| Facet | For | Methods | Not implemented yet |", "|---|---|---|---|"]
        access = f'`zelt.create("{program}")` in Python, `zelt::create<zelt::{interface}>("{program}")` in C++.'
        lines, _, _ = page_of(interface, access, type(root), comments, lambda *_: True)
        pages = [page("Root", f"{interface}.md", lines)]
        for name, facet, purpose in facets_of(root):
            kind = type(facet).__name__
            if kind in known:
                continue
            known.add(kind)
            access = f"`root.{name}` in Python, `{interface}::get_{name}` in C++ (`{kind}`)"
            access += f", `zelt call {name}.METHOD` in the shell." if not first else "."
            lines, present, missing = page_of(f"{name} (first generation)" if first else name, access, type(facet), comments,
                                              lambda method, row, facet=facet: is_there(facet, method, row))
            title = name
            if present or missing:
                file = f"{kind if first else name}.md"
                pages.append(page(name, file, lines))
                title = f"[{name}]({file})"
            overview.append(f"| {title} | {escaped(purpose)} | {present} | {missing or ''} |")
        overview += ["", "The other facets are those of the second generation." if first else
                     "A facet with 0 methods has none yet.", ""]
        navigation += [{heading: pages}] if first else pages
    page("Overview", "index.md", overview)
    return [*navigation, page("Enumerations", "enumerations.md", enumerations_page()),
            page("Python module", "python.md", python_page())]
