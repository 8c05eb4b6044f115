#include "variant_object.h"

#include "arguments.h"
#include "arrays.h"
#include "common/variant_types.h"
#include "results.h"

namespace python {
namespace {

struct forced {
    variant value;
};

PyTypeObject* forced_type = nullptr;

std::string name_of(VARTYPE type)
{
    if (type & VT_ARRAY) return name_of(static_cast<VARTYPE>(type & ~VT_ARRAY)).insert(0, "VT_ARRAY|");
    if (const char* name = host::type_name(type)) return name;
    return type == VT_BOOL ? "VT_BOOL" : type == VT_BSTR ? "VT_BSTR" : std::to_string(type);
}

VARTYPE find(std::string name)
{
    std::erase(name, ' ');
    const std::string array = "VT_ARRAY|";
    if (name.starts_with(array)) return static_cast<VARTYPE>(VT_ARRAY | find(name.substr(array.size())));
    if (name == "VT_BOOL") return VT_BOOL;
    if (name == "VT_BSTR") return VT_BSTR;
    if (const auto type = host::find_type(name)) return *type;
    throw raised(PyExc_ValueError, "Variant: '" + name + "' is no type such as VT_R4 or VT_ARRAY|VT_R8");
}

forced make(const py::object& type, const py::object& value)
{
    const VARTYPE wanted =
        py::isinstance<py::str>(type) ? find(type.cast<std::string>()) : type.cast<VARTYPE>();
    forced made;
    VARIANT v = empty_variant();
    if (wanted & VT_ARRAY) {
        v.vt = wanted;
        v.parray = to_safe_array(value, static_cast<VARTYPE>(wanted & ~VT_ARRAY)).detach();
        made.value = variant::attach(v);
        return made;
    }
    if (py::isinstance<py::str>(value))
        made.value = variant(value.cast<std::wstring>().c_str());
    else if (number_to_variant(value.ptr(), v))
        made.value = variant::attach(v);
    else
        throw raised(PyExc_TypeError, "Variant: the value must be a number, a string or an array, not " +
                                          type_of(value.ptr()));
    const HRESULT hr = VariantChangeType(made.value.get(), made.value.get(), 0, wanted);
    if (hr == DISP_E_OVERFLOW)
        throw raised(PyExc_OverflowError, "Variant: the value is out of the range of " + name_of(wanted));
    check(hr);
    return made;
}

py::object value_of(const forced& f)
{
    variant copy = f.value;
    return to_python(*copy.get(), nullptr);
}

VARIANT number(VARTYPE type)
{
    VARIANT v = empty_variant();
    v.vt = type;
    return v;
}

/// Whole numbers take 32 bits where they fit.
VARIANT whole(PyObject* value)
{
    int overflow = 0;
    const int64_t n = PyLong_AsLongLongAndOverflow(value, &overflow);
    if (overflow == 0) {
        VARIANT v = number(n >= INT32_MIN && n <= INT32_MAX ? VT_I4
                           : n >= 0 && n <= UINT32_MAX      ? VT_UI4
                                                            : VT_I8);
        v.llVal = n;
        return v;
    }
    VARIANT v = number(VT_UI8);
    v.ullVal = PyLong_AsUnsignedLongLong(value);
    if (PyErr_Occurred()) throw py::error_already_set();
    return v;
}

VARTYPE scalar_type(char kind, py::ssize_t bytes)
{
    switch (kind) {
    case 'b': return VT_BOOL;
    case 'i': return bytes == 1 ? VT_I1 : bytes == 2 ? VT_I2 : bytes == 4 ? VT_I4 : VT_I8;
    case 'u': return bytes == 1 ? VT_UI1 : bytes == 2 ? VT_UI2 : bytes == 4 ? VT_UI4 : VT_UI8;
    case 'f': return bytes <= 4 ? VT_R4 : VT_R8;
    default: return VT_EMPTY;
    }
}

} // namespace

void add_variant_type(py::module_& module)
{
    const py::class_<forced> type(module, "Variant",
                                  "A value with the type that it is to have: Variant(\"VT_R4\", 0.5).");
    forced_type = reinterpret_cast<PyTypeObject*>(type.ptr());
    py::class_<forced>(type)
        .def(py::init(&make), py::arg("type"), py::arg("value"))
        .def_property_readonly("type", [](const forced& f) { return name_of(f.value.type()); })
        .def_property_readonly("value", &value_of)
        .def("__repr__",
             [](const forced& f) {
                 return py::str("Variant('{}', {!r})").format(name_of(f.value.type()), value_of(f));
             })
        .def("__reduce__", [](const py::object& self) {
            return py::make_tuple(self.attr("__class__"),
                                  py::make_tuple(self.attr("type"), self.attr("value")));
        });
}

const variant* forced_value(PyObject* value)
{
    if (Py_TYPE(value) != forced_type) return nullptr;
    return &py::handle(value).cast<const forced&>().value;
}

bool number_to_variant(PyObject* value, VARIANT& v)
{
    if (PyBool_Check(value)) {
        v = number(VT_BOOL);
        v.boolVal = value == Py_True ? VARIANT_TRUE : VARIANT_FALSE;
        return true;
    }
    if (PyLong_Check(value)) {
        v = whole(value);
        return true;
    }
    if (PyFloat_Check(value)) {
        v = number(VT_R8);
        v.dblVal = PyFloat_AS_DOUBLE(value);
        return true;
    }
    // NumPy's scalars, and arrays without axes, know their type.
    const py::handle h = value;
    if (!py::hasattr(h, "dtype") || !py::hasattr(h, "item") || h.attr("ndim").cast<int>() != 0) return false;
    const py::dtype dtype = h.attr("dtype").cast<py::dtype>();
    const VARTYPE type = scalar_type(dtype.kind(), dtype.itemsize());
    if (type == VT_EMPTY) return false;
    VARIANT plain = empty_variant();
    const py::object item = h.attr("item")();
    if (!PyLong_Check(item.ptr()) && !PyFloat_Check(item.ptr())) return false; // a long double stays one
    number_to_variant(item.ptr(), plain);
    VARIANT exact = empty_variant();
    check(VariantChangeType(&exact, &plain, 0, type));
    v = exact;
    return true;
}

} // namespace python
