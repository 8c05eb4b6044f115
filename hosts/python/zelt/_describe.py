"""Signatures and documentation from the rows of the interface tables."""

import inspect
import textwrap

VT_R4, VT_R8, VT_BSTR, VT_BOOL, VT_VARIANT, VT_ARRAY = 4, 5, 8, 11, 12, 0x2000
PROPERTY_GET = 2

# What a caller may give for an argument, and what a result comes as.
TAKEN = {
    "IPixmat2": "Image | ArrayLike", "IRectangle": "tuple[int, int, int, int]", "ICoordinateInt": "tuple[int, int]",
    "ICoordinateFloat": "tuple[float, float]", "IFloatVector2D": "tuple[float, float]", "ISizeInt": "tuple[int, int]",
    "IRangeFloat": "tuple[float, float]", "IComplex": "complex",
    "IPixmatDescriptor": "IPixmatDescriptor | Image | tuple[int, int, int, int | str]",
    "IDispatch": "Object | Image", "IUnknown": "Object | Image",
}
GIVEN = {
    "IPixmat2": "Image", "IRectangle": "Rectangle", "ICoordinateInt": "CoordinateInt",
    "ICoordinateFloat": "CoordinateFloat", "IFloatVector2D": "FloatVector2D", "ISizeInt": "SizeInt",
    "IRangeFloat": "RangeFloat", "IComplex": "complex", "IDispatch": "Object", "IUnknown": "Object",
}
OBJECT = 9


def type_of(argument):
    """The annotation of an argument or result."""
    vartype, name = argument["vartype"], argument["type"]
    given = argument["way"] == "in"
    if argument["enumeration"] is not None:
        return f"{name} | int | str" if given else name
    if vartype == OBJECT:
        return (TAKEN if given else GIVEN).get(name, name)
    if vartype & VT_ARRAY:
        return "ArrayLike" if given else "NDArray[Any]"
    simple = {VT_R4: "float", VT_R8: "float", VT_BSTR: "str", VT_BOOL: "bool", VT_VARIANT: "Any"}
    return simple.get(vartype, "int")


def inputs_of(row):
    return [a for a in row["arguments"] if a["way"] == "in"]


def result_of(row):
    results = [type_of(a) for a in row["arguments"] if a["way"] == "out"]
    if len(results) > 1:
        return f"tuple[{', '.join(results)}]"
    return results[0] if results else "None"


def default_of(argument):
    """None for an object or a value that is left out."""
    number = argument["default"]
    if number is None:
        return None
    if argument["enumeration"] is not None:
        members = {int(m): m for m in argument["enumeration"]}
        return members.get(int(number), int(number))
    if argument["vartype"] == VT_BOOL:
        return number != 0
    return number if argument["vartype"] in (VT_R4, VT_R8) else int(number)


def signature(row):
    kind = inspect.Parameter.POSITIONAL_OR_KEYWORD
    parameters = [inspect.Parameter("self", inspect.Parameter.POSITIONAL_ONLY)]
    for a in inputs_of(row):
        default = default_of(a) if a["optional"] else inspect.Parameter.empty
        parameters.append(inspect.Parameter(a["name"], kind, default=default, annotation=type_of(a)))
    # Unchecked: an argument that must be given may follow one that may be left out.
    return inspect.Signature(parameters, return_annotation=result_of(row), __validate_parameters__=False)


def documentation(row):
    lines = [row["help"]]
    if row["pixels"]:
        lines += ["", "Pixels:"] + textwrap.wrap(row["pixels"], 96, initial_indent="    ", subsequent_indent="    ")
    described = [a for a in row["arguments"] if not (row["kind"] == PROPERTY_GET and a["way"] == "out")]
    for title, way in (("Arguments", "in"), ("Results", "out")):
        chosen = [a for a in described if a["way"] == way]
        if not chosen:
            continue
        lines += ["", title + ":"]
        for a in chosen:
            line = f"    {a['name']}: {type_of(a)}"
            if way == "in" and a["optional"]:
                default = default_of(a)
                line += f", {default.name if hasattr(default, 'name') else default} if left out"
            lines.append(line)
            if a["enumeration"] is not None:
                lines.append("        " + ", ".join(f"{m.name} = {int(m)}" for m in a["enumeration"]))
    return "\n".join(lines)


def object_text(value):
    """The repr of an object: its properties where it has nothing else."""
    kind = type(value)
    names = [n for n in vars(kind) if not n.startswith("_")]
    if names and all(isinstance(vars(kind)[n], property) for n in names) and not hasattr(kind, "Basic"):
        return f"zelt.{kind.__name__}({', '.join(f'{n}={getattr(value, n)!r}' for n in names)})"
    return f"<zelt.{kind.__name__}>"
