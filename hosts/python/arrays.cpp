#include "arrays.h"

#include "arguments.h"
#include "common/value_objects.h"
#include "object.h"
#include "results.h"

#include <complex>

namespace python {
namespace {

struct element_type {
    VARTYPE type;
    const char* dtype;
};

constexpr element_type element_types[] = {
    {VT_UI1, "u1"}, {VT_I1, "i1"}, {VT_UI2, "u2"}, {VT_I2, "i2"}, {VT_UI4, "u4"}, {VT_I4, "i4"},
    {VT_UI8, "u8"}, {VT_I8, "i8"}, {VT_R4, "f4"},  {VT_R8, "f8"}, {VT_INT, "i4"}, {VT_UINT, "u4"},
};

const char* dtype_of(VARTYPE type)
{
    for (const element_type& e : element_types)
        if (e.type == type) return e.dtype;
    return nullptr;
}

VARTYPE type_of(const py::dtype& dtype)
{
    const std::string name = std::string(1, dtype.kind()) + std::to_string(dtype.itemsize());
    for (const element_type& e : element_types)
        if (name == e.dtype) return e.type;
    if (dtype.kind() == 'b') return VT_BOOL;
    if (dtype.kind() == 'c') return VT_DISPATCH;
    if (dtype.kind() == 'O') return VT_VARIANT;
    throw raised(PyExc_TypeError, "an array of " + printed(dtype) + " has no form for the library");
}

/// What stands for a list of numbers when nothing else is wanted: whole numbers of 32 bits where they fit.
VARTYPE natural_type(const py::array& a, bool from_array)
{
    const VARTYPE type = type_of(a.dtype());
    if (from_array || type != VT_I8 || a.size() == 0) return type;
    const bool fits =
        a.attr("min")().cast<int64_t>() >= INT32_MIN && a.attr("max")().cast<int64_t>() <= INT32_MAX;
    return fits ? VT_I4 : VT_I8;
}

safe_array create(VARTYPE type, const py::array& a)
{
    std::vector<SAFEARRAYBOUND> bounds;
    for (py::ssize_t axis = a.ndim(); axis-- > 0;)
        bounds.push_back({static_cast<uint32_t>(a.shape(axis)), 0});
    safe_array made =
        safe_array::attach(SafeArrayCreate(type, static_cast<uint32_t>(bounds.size()), bounds.data()));
    if (!made) throw raised(PyExc_ValueError, "an array of this size has no form for the library");
    return made;
}

/// Elements that are objects or values: each is put by its indices, the last axis first.
template <class Put>
void put_each(SAFEARRAY* target, const py::array& a, Put&& put)
{
    const py::array flat = a.attr("ravel")().cast<py::array>();
    const auto axes = static_cast<size_t>(a.ndim());
    for (py::ssize_t n = 0; n < flat.size(); ++n) {
        std::vector<int32_t> place(axes);
        py::ssize_t rest = n;
        for (size_t d = 0; d < axes; ++d) {
            const py::ssize_t length = a.shape(static_cast<py::ssize_t>(axes - 1 - d));
            place[d] = static_cast<int32_t>(rest % length);
            rest /= length;
        }
        const py::object element = flat.attr("item")(n);
        put(element, [&](const void* value) { check(SafeArrayPutElement(target, place.data(), value)); });
    }
}

com_ptr<IDispatch> object_of(const py::object& element)
{
    if (is_object(element.ptr()))
        if (IDispatch* d = reinterpret_cast<object_body*>(element.ptr())->dispatch) return com_ptr(d);
    const Py_complex c = PyComplex_AsCComplex(element.ptr());
    if (PyErr_Occurred()) throw py::error_already_set();
    return host::make_complex({c.real, c.imag});
}

/// Numbers as elements of another type, none of them changed but in the last digits of real ones.
py::array numbers_as(py::array a, const char* dtype)
{
    using namespace py::literals;
    const py::object numpy = py::module_::import("numpy");
    if (a.dtype().kind() == 'O') a = numpy.attr("asarray")(a.attr("tolist")()).cast<py::array>();
    const char from = a.dtype().kind(), to = py::dtype(dtype).kind();
    if (std::string_view("biuf").find(from) == std::string_view::npos)
        throw raised(PyExc_TypeError,
                     from == 'O' ? "an array of Python objects that are not all numbers"
                                 : "an array of " + printed(a.dtype()) + " where real numbers are wanted");
    if (to != 'f' && a.size() > 0 && !a.dtype().is(py::dtype(dtype)) && from != 'b') {
        if (from == 'f' && !numpy.attr("equal")(a, numpy.attr("rint")(a)).attr("all")().cast<bool>())
            throw raised(PyExc_ValueError, "an array with fractions or NaN where whole numbers are wanted");
        const py::object limits = numpy.attr("iinfo")(dtype);
        if (a.attr("min")().attr("item")() < limits.attr("min") ||
            a.attr("max")().attr("item")() > limits.attr("max"))
            throw raised(PyExc_OverflowError,
                         "an array with numbers out of the range of " + printed(py::dtype(dtype)));
    }
    return numpy.attr("ascontiguousarray")(a, "dtype"_a = dtype).cast<py::array>();
}

py::array array_of(SAFEARRAY* array, const char* dtype, std::vector<py::ssize_t> shape)
{
    void* data = nullptr;
    check(SafeArrayAccessData(array, &data));
    const py::capsule owner(array, [](void* p) {
        SafeArrayUnaccessData(static_cast<SAFEARRAY*>(p));
        SafeArrayDestroy(static_cast<SAFEARRAY*>(p));
    });
    return py::array(py::dtype(dtype), std::move(shape), data, owner);
}

/// Elements one by one. Complex objects give an array of complex numbers, anything else one of Python objects.
py::object array_of_elements(SAFEARRAY* array, VARTYPE type, const std::vector<py::ssize_t>& shape)
{
    py::list elements;
    void* data = nullptr;
    check(SafeArrayAccessData(array, &data));
    const size_t bytes = SafeArrayGetElemsize(array);
    size_t count = 1;
    for (const py::ssize_t n : shape) count *= static_cast<size_t>(n);
    bool complex = type != VT_BOOL && count > 0;
    for (size_t i = 0; i < count; ++i) {
        VARIANT borrowed = empty_variant();
        const char* const at = static_cast<const char*>(data) + i * bytes;
        if (type == VT_VARIANT) {
            variant copy;
            check(VariantCopy(copy.get(), reinterpret_cast<const VARIANT*>(at)));
            elements.append(to_python(*copy.get(), nullptr));
        } else {
            borrowed.vt = type;
            std::memcpy(&borrowed.llVal, at, bytes);
            elements.append(to_python(borrowed, nullptr));
        }
        complex = complex && PyComplex_Check(py::object(elements[i]).ptr());
    }
    SafeArrayUnaccessData(array);
    const py::object numpy = py::module_::import("numpy");
    const char* const dtype = type == VT_BOOL ? "?" : complex ? "c16" : "O";
    py::object flat = numpy.attr("empty")(count, dtype);
    for (size_t i = 0; i < count; ++i) flat[py::int_(i)] = elements[i];
    return flat.attr("reshape")(py::cast(shape));
}

} // namespace

safe_array to_safe_array(py::handle values, VARTYPE element)
{
    const bool from_array = py::isinstance<py::array>(values);
    const py::object numpy = py::module_::import("numpy");
    py::array a = numpy.attr("asarray")(values).cast<py::array>();
    if (a.ndim() == 0) throw raised(PyExc_TypeError, "a single value is no array");
    const VARTYPE type = element == VT_EMPTY ? natural_type(a, from_array) : element;
    if (const char* dtype = dtype_of(type)) {
        a = numbers_as(std::move(a), dtype);
        safe_array made = create(type, a);
        const safe_array_access<char> target(made.get());
        if (a.nbytes() > 0) std::memcpy(target.data(), a.data(), static_cast<size_t>(a.nbytes()));
        return made;
    }
    safe_array made = create(type, a);
    put_each(made.get(), a, [&](const py::object& value, auto&& put) {
        if (type == VT_BOOL) {
            const VARIANT_BOOL flag = value.cast<bool>() ? VARIANT_TRUE : VARIANT_FALSE;
            put(&flag);
        } else if (type == VT_DISPATCH) {
            put(object_of(value).get());
        } else {
            VARIANT number = empty_variant();
            if (number_to_variant(value.ptr(), number)) return put(&number);
            const variant object(object_of(value).get());
            put(object.get());
        }
    });
    return made;
}

py::object from_safe_array(safe_array array)
{
    VARTYPE type = VT_EMPTY;
    check(SafeArrayGetVartype(array.get(), &type));
    std::vector<py::ssize_t> shape;
    for (uint32_t d = SafeArrayGetDim(array.get()); d >= 1; --d) {
        int32_t low = 0, high = -1;
        check(SafeArrayGetLBound(array.get(), d, &low));
        check(SafeArrayGetUBound(array.get(), d, &high));
        shape.push_back(py::ssize_t{high} - low + 1);
    }
    if (const char* dtype = dtype_of(type)) return array_of(array.detach(), dtype, std::move(shape));
    return array_of_elements(array.get(), type, shape);
}

} // namespace python
