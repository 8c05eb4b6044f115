"""Methods by name: how arguments go in, results come out and failures are told."""

import inspect

import numpy as np
import pytest

import zelt

FRAME = np.arange(48, dtype="uint16").reshape(6, 8)


def facets():
    for name in ("ZELT.Main", "ZELT.Main2"):
        root = zelt.create(name)
        for attribute, kind in vars(type(root)).items():
            if isinstance(kind, property) and isinstance(getattr(root, attribute), zelt.Object):
                yield getattr(root, attribute)


def test_arguments_by_place_by_name_and_left_out(root):
    mean = root.Statistics.Mean
    part = FRAME[1:3, 2:6].mean()
    for call in (lambda: mean(FRAME, (2, 1, 6, 3)), lambda: mean(FRAME, pIArea=(2, 1, 6, 3)),
                 lambda: mean(pIArea=[2, 1, 6, 3], pIImage=FRAME), lambda: mean(FRAME, area=np.array([2, 1, 6, 3]))):
        assert call() == part
    assert mean(FRAME) == mean(FRAME, None) == mean(FRAME, pIArea=None) == FRAME.mean()


@pytest.mark.parametrize("arguments, names, text", [
    ((), {}, "needs the argument 'pIImage'"), ((FRAME, None, 3), {}, "takes 2 arguments but 3"),
    ((FRAME,), {"pIImage": FRAME}, "two values for 'pIImage'"), ((FRAME,), {"pArea": None}, "no argument 'pArea'"),
    ((3,), {}, "pIImage must be an image or a NumPy array, not int"), ((FRAME, 5), {}, "(left, top, right, bottom), not int"),
    ((FRAME, (1, 2, 3)), {}, "(left, top, right, bottom), not tuple"), ((FRAME, "0123"), {}, "not str"),
])
def test_arguments_that_do_not_fit_are_type_errors(root, arguments, names, text):
    with pytest.raises(TypeError) as raised:
        root.Statistics.Mean(*arguments, **names)
    assert text in str(raised.value)


def test_numbers_are_checked_for_kind_and_range(root):
    with pytest.raises(ValueError, match="whole numbers"):
        root.Statistics.Mean(FRAME, (0.5, 0, 4, 4))
    with pytest.raises(TypeError, match="i must be a whole number, not float"):
        root.Statistics.Moment(FRAME, 1.0, 0)
    with pytest.raises(OverflowError, match="out of range"):
        root.Statistics.Moment(FRAME, 2**40, 0)
    for whole in (True, np.True_, float("nan"), "1"):
        with pytest.raises(TypeError, match="i must be a whole number, not "):
            root.Statistics.Moment(FRAME, whole, 0)
    with pytest.raises(OverflowError, match="sigma is out of range"):
        root.Filters.Gauss(FRAME, 10**400)
    with pytest.raises(TypeError, match="facet|IStatistics"):
        type(root.Statistics).Mean(root.Basic, FRAME)


def test_results_are_python_values(root):
    s = root.Statistics
    peak = s.MaximumPosition(FRAME)
    assert peak == (7, 5) and peak.X == 7 and type(peak) is zelt.CoordinateInt
    assert isinstance(s.CenterOfGravity(FRAME), zelt.CoordinateFloat)
    assert s.IsFinite(np.array([[np.inf]])) is False
    assert root.Rounding is zelt.ZELT_Rounding.Wrap
    root.Rounding = 7
    assert root.Rounding == 7


def test_enumerations_by_member_number_and_name(root):
    for mode in (zelt.ZELT_Rounding.Saturate, 3, "Saturate", "ZELT_Rounding_Saturate"):
        root.Rounding = 2
        root.Rounding = mode
        assert np.asarray(root.Basic.Add(np.full((1, 1), 200, "uint8"), 100)) == 255
    with pytest.raises(ValueError, match="'Sideways' is none of ZELT_Rounding_Default"):
        root.Rounding = "Sideways"


def test_operands_of_every_kind(root):
    add = root.Basic.Add
    floats = FRAME.astype("float32")
    for b in (2, 2.0, np.uint8(2), np.float32(2), np.array(2, "int16"), zelt.Variant("VT_UI1", 2)):
        assert np.array_equal(add(floats, b), floats + 2), b
    assert np.array_equal(add(FRAME, FRAME[::-1]), FRAME + FRAME[::-1])
    spectrum = FRAME.astype("complex128")
    for b in (1 + 2j, np.complex64(1 + 2j), [1.0, 2.0], np.array([1.0, 2.0])):
        assert np.array_equal(add(spectrum, b), spectrum + (1 + 2j)), b
    with pytest.raises(zelt.Error):
        add(FRAME, "2")
    with pytest.raises(TypeError, match="b must be an image or a number, not dict"):
        add(FRAME, {})


def test_the_type_of_an_operand_decides_the_arithmetic(root):
    # In whole numbers 5 - 10 is huge and saturates above; in real ones it is below zero.
    root.Rounding = "Saturate"
    five = np.full((1, 1), 5, "uint8")
    for b, expected in [(10, 255), (zelt.Variant("VT_I4", 10), 255), (np.uint8(10), 255), (10.0, 0), (np.float32(10), 0),
                        (zelt.Variant("VT_R4", 10), 0)]:
        assert np.asarray(root.Basic.Subtract(five, b)).item() == expected, b


def test_forced_types():
    half = zelt.Variant("VT_R4", 0.5)
    assert (half.type, half.value, repr(half)) == ("VT_R4", 0.5, "Variant('VT_R4', 0.5)")
    assert zelt.Variant(17, 255).type == "VT_UI1"
    assert np.array_equal(zelt.Variant("VT_ARRAY|VT_R8", [[1, 2], [3, 4]]).value, [[1.0, 2.0], [3.0, 4.0]])
    with pytest.raises(OverflowError, match="VT_UI1"):
        zelt.Variant("VT_UI1", 256)
    with pytest.raises(ValueError, match="VT_PEAR"):
        zelt.Variant("VT_PEAR", 1)
    with pytest.raises(TypeError):
        zelt.Variant("VT_R4", object())


def test_arrays_keep_type_shape_and_order():
    for values in (np.arange(6, dtype="int32").reshape(2, 3), np.arange(24.0).reshape(2, 3, 4)[:, ::-1],
                   np.asfortranarray(np.arange(6, dtype="uint8").reshape(2, 3)), np.array([True, False])):
        code = {"i": "VT_I4", "f": "VT_R8", "u": "VT_UI1", "b": "VT_BOOL"}[values.dtype.kind]
        back = zelt.Variant("VT_ARRAY|" + code, values).value
        assert back.dtype == values.dtype and np.array_equal(back, values)


@pytest.mark.parametrize("type, values, error, text", [
    ("VT_I4", np.array([2**31]), OverflowError, "out of the range of int32"),
    ("VT_UI8", np.array([-1]), OverflowError, "out of the range of uint64"),
    ("VT_I8", np.array([2**63], "uint64"), OverflowError, "out of the range of int64"),
    ("VT_I8", np.array([2.0**63]), OverflowError, "out of the range of int64"),
    ("VT_I4", np.array([np.inf]), OverflowError, "out of the range of int32"),
    ("VT_I4", np.array([np.nan]), ValueError, "fractions or NaN"), ("VT_UI1", [[0.5]], ValueError, "fractions or NaN"),
    ("VT_R8", np.array([1j]), TypeError, "complex128 where real"), ("VT_R8", np.array(["1"]), TypeError, "<U1 where real"),
    ("VT_R8", np.array([1, None], object), TypeError, "not all numbers"),
])
def test_arrays_never_change_their_numbers(type, values, error, text):
    with pytest.raises(error, match=text):
        zelt.Variant("VT_ARRAY|" + type, values)


def test_arrays_of_numbers_of_another_type_are_converted():
    for type, values in [("VT_I4", np.array([3.0, -2.0])), ("VT_UI8", np.array([2**64 - 1], object)),
                         ("VT_R8", np.array([1, 2.5], object)), ("VT_UI1", np.array([True])), ("VT_I2", [])]:
        assert zelt.Variant("VT_ARRAY|" + type, values).value.tolist() == list(values)


def test_failures_carry_code_text_and_source(root):
    with pytest.raises(zelt.Error) as raised:
        root.Basic.Add(FRAME, FRAME[:2])
    e = raised.value
    assert (e.hresult, e.description) == (0x80070057, "Can't operate on images of different size")
    assert str(e) == e.description + " (0x80070057)" and isinstance(e.source, str)
    with pytest.raises(zelt.Error) as raised:
        root.Statistics.Mean(None)
    assert raised.value.hresult == 0x80070057
    with pytest.raises(zelt.Error) as raised:
        zelt.create("ZELT.Nothing")
    assert raised.value.hresult == 0x800401F3
    with pytest.raises(zelt.Error, match="should be specific rounding mode"):
        root.Rounding = 0
    with pytest.raises(AttributeError):
        root.Statistics.Meen
    with pytest.raises(TypeError, match="zelt.create"):
        zelt.Object()


@pytest.mark.parametrize("version", ["ZELT.Main", "ZELT.Main2"])
@pytest.mark.parametrize("dtype", ["uint8", "int8", "uint16", "int16", "uint32", "int32"])
def test_whole_numbers_are_not_divided_by_zero(version, dtype):
    basic = zelt.create(version).Basic
    ones = np.ones((40, 70), dtype)
    holed = np.ones((80, 140), dtype)[::-2, ::2]
    holed[33, 61] = 0
    for call in (lambda: basic.Divide(ones, holed), lambda: basic.ReverseDivide(holed, ones),
                 lambda: basic.ReverseDivide(holed, 7)):
        with pytest.raises(zelt.Error, match=r"integer division by zero: .* is 0 at \(61, 33\)") as raised:
            call()
        assert raised.value.hresult == 0x80070057
    with pytest.raises(zelt.Error, match="integer division by zero: b is 0"):
        basic.Divide(ones, 0)
    assert np.all(ones == 1)
    basic.Divide(ones, 2.0 - 1)
    basic.ReverseDivide(ones, holed)
    basic.Divide(np.ones((40, 70)), holed)
    with pytest.raises(zelt.Error, match="different size"):
        basic.Divide(ones, holed[:2])


def test_every_method_of_every_facet_is_there_and_described():
    seen = 0
    for facet in facets():
        for name, kind in vars(type(facet)).items():
            if name.startswith("_"):
                continue
            seen += 1
            if isinstance(kind, property):
                assert kind.__doc__
                continue
            method = getattr(facet, name)
            row = kind._row
            inputs = [a for a in row["arguments"] if a["way"] == "in"]
            assert method.__name__ == name and row["help"] in method.__doc__
            signature = inspect.signature(method)
            assert list(signature.parameters) == [a["name"] for a in inputs]
            for a, p in zip(inputs, signature.parameters.values()):
                assert (p.default is not p.empty) == a["optional"]
                assert a["name"] in method.__doc__
    assert seen >= 100


def test_signatures_show_what_goes_in_and_out(root):
    signature = inspect.signature(root.Statistics.Moment)
    assert str(signature.parameters["i"]) == "i: 'int'"
    assert inspect.signature(root.Basic.Add).return_annotation == "Image"
    assert inspect.signature(zelt.create("ZELT.Main").Basic.Add).parameters["r"].default is zelt.ZELT_Rounding.Default
    assert "stop" in root.Cancel.__doc__


def test_the_same_facet_is_equal_and_classes_are_shared(root):
    assert root.Basic == root.Basic and hash(root.Basic) == hash(root.Basic)
    assert root.Basic != root.Statistics
    assert type(root.Basic) is type(zelt.create("ZELT.Main2").Basic) is zelt.IBasicOps2
    with pytest.raises(AttributeError):
        zelt.Nothing


def test_descriptors_and_tables(root):
    d = zelt.descriptor(5, 4, 12, "Unsigned")
    assert (d.Width, d.Height, d.Bits, d.Encoding, d.XStride, d.YStride) == (5, 4, 12, 0, 2, 10)
    d.Bits = 10
    assert "Bits=10" in repr(d)
    colours = zelt.lookup_table([[255, 0, 0], [0, 0, 255]], (0, 100))
    assert isinstance(colours, zelt.Object)
    for bad in ([], [[1, 2]], [-1], [2**24]):
        with pytest.raises(ValueError):
            zelt.lookup_table(bad, (0, 1))
    converted = root.Conversions.RecodeEx(FRAME, (8, 6, 32, "Float"))
    assert converted.dtype == "float32" and np.array_equal(converted, FRAME)
    assert root.Conversions.RecodeEx(FRAME, converted).dtype == "float32"
