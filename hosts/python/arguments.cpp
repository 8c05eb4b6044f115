#include "arguments.h"

#include "arrays.h"
#include "common/interfaces.h"
#include "common/value_objects.h"
#include "common/variant_types.h"
#include "image.h"
#include "object.h"
#include "variant_object.h"

namespace python {
namespace {

using kind = enum parameter::kind;

struct object_form {
    const char* interface_name;
    enum parameter::kind kind;
};

constexpr object_form object_forms[] = {
    {"IRectangle", kind::rectangle},
    {"ICoordinateInt", kind::point},
    {"ICoordinateFloat", kind::float_point},
    {"IFloatVector2D", kind::vector},
    {"ISizeInt", kind::size},
    {"IRangeFloat", kind::range},
    {"IComplex", kind::complex},
    {"IPixmatDescriptor", kind::descriptor},
};

enum parameter::kind kind_of(const argument_info& a)
{
    if (host::is_image(a)) return kind::image;
    if (a.interface_id) {
        for (const object_form& form : object_forms)
            if (std::string_view(a.type_name) == form.interface_name) return form.kind;
        return kind::object;
    }
    if (a.enumeration) return kind::enumeration;
    if (a.type & VT_ARRAY) return kind::array;
    switch (a.type) {
    case VT_VARIANT: return kind::value;
    case VT_BSTR: return kind::text;
    case VT_BOOL: return kind::boolean;
    case VT_R4:
    case VT_R8: return kind::real;
    default: return kind::whole;
    }
}

/// The tables do not say what an array's elements are; these are the arguments that want one type only.
VARTYPE element_of(const argument_info& a)
{
    const std::string_view name = a.name;
    if (name == "kernel" || name == "pTmpProfile") return VT_R8;
    return name == "structuringElement" ? VT_I4 : VT_EMPTY;
}

bool is_operand(const argument_info& a)
{
    const std::string_view name = a.name;
    return name == "b" || name == "re" || name == "im";
}

VARIANT dispatch_variant(IDispatch* object)
{
    VARIANT v = empty_variant();
    v.vt = VT_DISPATCH;
    v.pdispVal = object;
    return v;
}

template <class T>
VARIANT owned_object(com_ptr<T> object)
{
    return dispatch_variant(object.detach());
}

} // namespace

parameter::parameter(const argument_info& argument)
    : info(&argument), name(PyUnicode_InternFromString(argument.name)), kind(kind_of(argument)),
      may_be_image(is_operand(argument)), element(element_of(argument))
{
    if (!name) throw py::error_already_set();
}

call_values::~call_values()
{
    for (size_t i = first_; i < most_arguments; ++i)
        if (!(borrowed_ >> i & 1)) VariantClear(&values_[i]);
}

void call_values::out_of_range(const parameter& p) const
{
    throw raised(PyExc_OverflowError, std::string(method_.name) + "(): " + p.info->name + " is out of range");
}

void call_values::refuse(const parameter& p, PyObject* value, const char* wanted) const
{
    throw raised(PyExc_TypeError, std::string(method_.name) + "(): " + p.info->name + " must be " + wanted +
                                      ", not " + type_of(value));
}

void call_values::leave_out(const parameter& p)
{
    if (!p.info->optional)
        throw raised(PyExc_TypeError,
                     std::string(method_.name) + "() needs the argument '" + p.info->name + "'");
    // An object that is left out is none; facets that are not made for scripts want it said.
    values_[--first_] = p.info->interface_id ? dispatch_variant(nullptr) : missing_argument();
}

void call_values::receive(VARIANT* place)
{
    VARIANT& v = values_[--first_];
    v = empty_variant();
    v.vt = VT_BYREF | VT_VARIANT;
    v.byref = place;
    borrowed_ |= 1u << first_;
}

void call_values::give(const parameter& p, PyObject* value)
{
    if (value == Py_None && p.info->optional) return leave_out(p);
    VARIANT& v = values_[--first_];
    v = empty_variant();
    if (p.info->interface_id && value == Py_None) {
        v.vt = VT_DISPATCH; // the method says what it thinks of none
        return;
    }
    switch (p.kind) {
    case kind::image: return set_image(p, v, value);
    case kind::enumeration: return set_enumeration(p, v, value);
    case kind::real: return set_real(p, v, value);
    case kind::whole: return set_whole(p, v, value);
    case kind::value: return set_value(p, v, value);
    case kind::boolean: {
        const bool known = PyBool_Check(value) || PyIndex_Check(value) || type_of(value) == "numpy.bool_";
        const int truth = known ? PyObject_IsTrue(value) : -1;
        if (truth < 0) refuse(p, value, "true or false");
        v.vt = VT_BOOL;
        v.boolVal = truth ? VARIANT_TRUE : VARIANT_FALSE;
        return;
    }
    case kind::text: {
        if (!PyUnicode_Check(value)) refuse(p, value, "a string");
        v = variant(py::handle(value).cast<std::wstring>().c_str()).detach();
        return;
    }
    case kind::array: {
        SAFEARRAY* const array = to_safe_array(value, p.element).detach();
        VARTYPE element = VT_EMPTY;
        SafeArrayGetVartype(array, &element);
        v.vt = static_cast<VARTYPE>(VT_ARRAY | element);
        v.parray = array;
        return;
    }
    default: return set_object(p, v, value);
    }
}

void call_values::set_image(const parameter& p, VARIANT& v, PyObject* value)
{
    if (is_image_object(value)) {
        v = dispatch_variant(image_for_call(value));
        borrowed_ |= 1u << first_;
        return;
    }
    for (size_t i = 0; i < wrapped_count_; ++i)
        if (wrapped_[i].first == value) {
            v = owned_object(com_ptr<IPixmat2>(wrapped_[i].second));
            return;
        }
    if (!has_pixels(value)) refuse(p, value, "an image or a NumPy array");
    v = owned_object(image_over_array(value, py::none(), py::none()));
    if (wrapped_count_ < wrapped_.size())
        wrapped_[wrapped_count_++] = {value, static_cast<IPixmat2*>(v.pdispVal)};
}

void call_values::set_real(const parameter& p, VARIANT& v, PyObject* value)
{
    const double number = PyFloat_AsDouble(value);
    if (number == -1 && PyErr_Occurred()) {
        const bool too_large = PyErr_ExceptionMatches(PyExc_OverflowError);
        PyErr_Clear();
        if (too_large) out_of_range(p);
        refuse(p, value, "a number");
    }
    v.vt = VT_R8;
    v.dblVal = number;
}

void call_values::set_whole(const parameter& p, VARIANT& v, PyObject* value)
{
    if (PyUnicode_Check(value))
        if (const auto type = host::find_type(py::handle(value).cast<std::string>())) {
            v = variant(static_cast<int32_t>(*type)).detach(); // "VT_R4" as the number that it stands for
            return;
        }
    // True and False count as whole numbers to Python; in the place of a size or a position they are a mistake.
    const bool truth = PyBool_Check(value) || Py_TYPE(value)->tp_name == std::string_view("numpy.bool_");
    if (truth || !PyIndex_Check(value)) refuse(p, value, "a whole number");
    const py::object number = py::reinterpret_steal<py::object>(PyNumber_Index(value));
    if (!number) throw py::error_already_set();
    VARIANT wide = empty_variant();
    wide.vt = VT_I8;
    wide.llVal = PyLong_AsLongLong(number.ptr());
    const bool beyond = PyErr_Occurred();
    if (beyond) PyErr_Clear();
    if (beyond || failed(VariantChangeType(&v, &wide, 0, p.info->type))) out_of_range(p);
}

void call_values::set_enumeration(const parameter& p, VARIANT& v, PyObject* value)
{
    if (!PyUnicode_Check(value)) return set_whole(p, v, value);
    const auto text = py::handle(value).cast<std::string>();
    std::string known;
    for (const enumeration_value& e : p.info->enumeration->values) {
        const std::string name = e.name;
        const std::string suffix = "_" + text;
        if (name == text || name.ends_with(suffix)) {
            v = variant(e.value).detach();
            return;
        }
        known += (known.empty() ? "" : ", ") + name;
    }
    throw raised(PyExc_ValueError,
                 std::string(method_.name) + "(): " + p.info->name + " '" + text + "' is none of " + known);
}

void call_values::set_value(const parameter& p, VARIANT& v, PyObject* value)
{
    if (PyFloat_CheckExact(value)) {
        v.vt = VT_R8;
        v.dblVal = PyFloat_AS_DOUBLE(value);
        return;
    }
    if (is_image_object(value)) return set_image(p, v, value);
    const bool array = py::isinstance<py::array>(value);
    if (array && p.may_be_image && py::reinterpret_borrow<py::array>(value).ndim() >= 2)
        return set_image(p, v, value);
    if (number_to_variant(value, v)) return;
    if (value == Py_None) return; // an empty value
    if (const variant* forced = forced_value(value)) {
        v = variant(*forced).detach();
        return;
    }
    if (PyComplex_Check(value) || type_of(value).starts_with("numpy.complex")) {
        const Py_complex c = PyComplex_AsCComplex(value);
        v = owned_object(host::make_complex({c.real, c.imag}));
        return;
    }
    if (is_object(value)) {
        const auto* const body = reinterpret_cast<object_body*>(value);
        v = body->dispatch ? variant(body->dispatch).detach() : variant(body->unknown).detach();
        return;
    }
    if (PyUnicode_Check(value)) {
        v = variant(py::handle(value).cast<std::wstring>().c_str()).detach();
        return;
    }
    if (!array && !PyList_Check(value) && !PyTuple_Check(value))
        refuse(p, value,
               p.may_be_image ? "an image or a number" : "a number, a string, an array or an object");
    SAFEARRAY* const made = to_safe_array(value, p.element).detach();
    VARTYPE element = VT_EMPTY;
    SafeArrayGetVartype(made, &element);
    v.vt = static_cast<VARTYPE>(VT_ARRAY | element);
    v.parray = made;
}

std::array<double, 4> call_values::reals(const parameter& p, PyObject* value, size_t count,
                                         const char* wanted) const
{
    std::array<double, 4> numbers{};
    const auto items = py::reinterpret_steal<py::object>(
        PyUnicode_Check(value) ? nullptr : PySequence_Fast(value, "no sequence"));
    if (!items || static_cast<size_t>(PySequence_Fast_GET_SIZE(items.ptr())) != count) {
        PyErr_Clear();
        refuse(p, value, wanted);
    }
    for (size_t i = 0; i < count; ++i) {
        numbers[i] = PyFloat_AsDouble(PySequence_Fast_GET_ITEM(items.ptr(), static_cast<Py_ssize_t>(i)));
        if (numbers[i] == -1 && PyErr_Occurred()) {
            PyErr_Clear();
            refuse(p, value, wanted);
        }
    }
    return numbers;
}

std::array<int32_t, 4> call_values::integers(const parameter& p, PyObject* value, size_t count,
                                             const char* wanted) const
{
    const std::array<double, 4> numbers = reals(p, value, count, wanted);
    std::array<int32_t, 4> whole{};
    for (size_t i = 0; i < count; ++i) {
        if (!(numbers[i] >= INT32_MIN && numbers[i] <= INT32_MAX) ||
            numbers[i] != static_cast<double>(static_cast<int32_t>(numbers[i])))
            throw raised(PyExc_ValueError, std::string(method_.name) + "(): " + p.info->name + " must be " +
                                               wanted + " of whole numbers within 32 bits");
        whole[i] = static_cast<int32_t>(numbers[i]);
    }
    return whole;
}

void call_values::set_object(const parameter& p, VARIANT& v, PyObject* value)
{
    if (is_object(value)) {
        const auto* const body = reinterpret_cast<object_body*>(value);
        v = body->dispatch ? variant(body->dispatch).detach() : variant(body->unknown).detach();
        return;
    }
    const auto make = [&]<class I>(com_ptr<I> object) { v = owned_object(std::move(object)); };
    switch (p.kind) {
    case kind::rectangle: {
        const auto n = integers(p, value, 4, "(left, top, right, bottom)");
        com_ptr<IRectangle> object;
        zelt::check(Common::MakeRectangle(n[0], n[1], n[2], n[3], object.put()));
        return make(std::move(object));
    }
    case kind::point: {
        const auto n = integers(p, value, 2, "(x, y)");
        return make(zelt::make_point(n[0], n[1]));
    }
    case kind::float_point: {
        const auto n = reals(p, value, 2, "(x, y)");
        return make(zelt::make_float_point(n[0], n[1]));
    }
    case kind::vector: {
        const auto n = reals(p, value, 2, "(x, y)");
        com_ptr<IFloatVector2D> object;
        zelt::check(Common::MakeFloatVector2D(n[0], n[1], object.put()));
        return make(std::move(object));
    }
    case kind::size: {
        const auto n = integers(p, value, 2, "(width, height)");
        return make(host::make_size(n[0], n[1]));
    }
    case kind::range: {
        const auto n = reals(p, value, 2, "(low, high)");
        return make(host::make_range(n[0], n[1]));
    }
    case kind::complex: {
        if (PySequence_Check(value)) {
            const auto n = reals(p, value, 2, "a complex number");
            return make(host::make_complex({n[0], n[1]}));
        }
        const Py_complex c = PyComplex_AsCComplex(value);
        if (PyErr_Occurred()) {
            PyErr_Clear();
            refuse(p, value, "a complex number");
        }
        return make(host::make_complex({c.real, c.imag}));
    }
    case kind::descriptor: {
        com_ptr<IPixmatDescriptor> object;
        if (is_image_object(value)) {
            check(reinterpret_cast<image_body*>(value)->image->GetDescriptor(object.put()));
            return make(std::move(object));
        }
        if (!PyTuple_Check(value) || PyTuple_GET_SIZE(value) != 4)
            refuse(p, value, "(width, height, bits, encoding), a descriptor or an image");
        const py::tuple t = py::reinterpret_borrow<py::tuple>(value);
        const PixmatEncoding encoding = to_encoding(t[3]);
        return make(host::make_descriptor(
            packed_layout(t[0].cast<int32_t>(), t[1].cast<int32_t>(), t[2].cast<int32_t>(), encoding)));
    }
    default:
        if (is_image_object(value)) return set_image(p, v, value);
        refuse(p, value, (std::string("an ") + p.info->type_name).c_str());
    }
}

} // namespace python
