#include "results.h"

#include "arrays.h"
#include "common/interfaces.h"
#include "image.h"
#include "object.h"

#include <complex>

namespace python {
namespace {

/// Objects that are no more than their few numbers come as a tuple of those.
template <class Interface, class... Numbers>
py::object values_of(IUnknown* object, const char* type, HRESULT (Interface::*... gets)(Numbers*) noexcept)
{
    const com_ptr<Interface> values = query<Interface>(object);
    if (!values) throw zelt::error(E_NOINTERFACE);
    const auto read = [&](auto get, auto number) {
        zelt::check((values.get()->*get)(&number));
        return number;
    };
    return python_part("_values", type)(read(gets, Numbers{})...);
}

struct tuple_form {
    const char* interface_name;
    py::object (*make)(IUnknown*);
};

const tuple_form tuple_forms[] = {
    {"ICoordinateInt",
     [](IUnknown* o) {
         return values_of(o, "CoordinateInt", &ICoordinateInt::get_X, &ICoordinateInt::get_Y);
     }},
    {"ICoordinateFloat",
     [](IUnknown* o) {
         return values_of(o, "CoordinateFloat", &ICoordinateFloat::get_X, &ICoordinateFloat::get_Y);
     }},
    {"IRectangle",
     [](IUnknown* o) {
         return values_of(o, "Rectangle", &IRectangle::get_Left, &IRectangle::get_Top, &IRectangle::get_Right,
                          &IRectangle::get_Bottom);
     }},
    {"IFloatVector2D",
     [](IUnknown* o) {
         return values_of(o, "FloatVector2D", &IFloatVector2D::get_X, &IFloatVector2D::get_Y);
     }},
    {"ISizeInt",
     [](IUnknown* o) { return values_of(o, "SizeInt", &ISizeInt::get_Width, &ISizeInt::get_Height); }},
    {"IRangeFloat",
     [](IUnknown* o) { return values_of(o, "RangeFloat", &IRangeFloat::get_Low, &IRangeFloat::get_High); }},
    {"IComplex",
     [](IUnknown* o) -> py::object {
         const com_ptr<ZELT::IComplex> c = query<ZELT::IComplex>(o);
         double re = 0, im = 0;
         zelt::check(c ? c->get_Real(&re) : E_NOINTERFACE);
         zelt::check(c->get_Imaginary(&im));
         return py::cast(std::complex(re, im));
     }},
};

py::object object_to_python(IUnknown* object)
{
    if (!object) return py::none();
    if (const com_ptr<IPixmat2> image = query<IPixmat2>(object)) return wrap_image(image.get());
    const com_ptr<IDispatch> dispatch = query<IDispatch>(object);
    if (const interface_info* table = host::table_of(dispatch.get()))
        for (const tuple_form& form : tuple_forms)
            if (std::string_view(table->name) == form.interface_name) return form.make(object);
    return wrap_object(object);
}

py::object integer(const VARIANT& v, int64_t number, const argument_info* a)
{
    if (a && a->enumeration && v.vt == VT_I4)
        return python_part("_values", "enumeration_value")(enumeration_class(*a->enumeration), number);
    return py::int_(number);
}

} // namespace

py::object to_python(VARIANT& v, const argument_info* a)
{
    if (v.vt & VT_ARRAY) {
        v.vt = VT_EMPTY;
        return from_safe_array(safe_array::attach(v.parray));
    }
    switch (v.vt) {
    case VT_I1: return integer(v, v.cVal, a);
    case VT_UI1: return integer(v, v.bVal, a);
    case VT_I2: return integer(v, v.iVal, a);
    case VT_UI2: return integer(v, v.uiVal, a);
    case VT_I4:
    case VT_INT: return integer(v, v.lVal, a);
    case VT_UI4:
    case VT_UINT: return integer(v, v.ulVal, a);
    case VT_I8: return integer(v, v.llVal, a);
    case VT_UI8: return py::int_(v.ullVal);
    case VT_R4: return py::float_(v.fltVal);
    case VT_R8: return py::float_(v.dblVal);
    case VT_BOOL: return py::bool_(v.boolVal != VARIANT_FALSE);
    case VT_BSTR: return text_of({v.bstrVal ? v.bstrVal : L"", SysStringLen(v.bstrVal)});
    case VT_DISPATCH:
    case VT_UNKNOWN: return object_to_python(v.punkVal);
    default: return py::none();
    }
}

} // namespace python
