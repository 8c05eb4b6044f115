#include "frame/value_objects.h"

#include "com/describe.h"
#include "pixmat/descriptor.h"

namespace Qor::Luxar::Common {
namespace {

template <class Class, class Interface, class... Values>
HRESULT make_value(Interface** out, Values... values) noexcept
{
    if (!out) return E_POINTER;
    *out = nullptr;
    com_ptr<Class> object = try_make<Class>(values...);
    if (!object) return E_OUTOFMEMORY;
    return object->QueryInterface(Interface::iid, reinterpret_cast<void**>(out));
}

template <class Interface, class Value>
HRESULT read_pair(Interface* object, Value* value) noexcept
{
    if (!object) return E_INVALIDARG;
    const HRESULT hr = object->get_X(&value->x);
    return failed(hr) ? hr : object->get_Y(&value->y);
}

} // namespace

HRESULT MakeCoordinateInt(LONG x, LONG y, ICoordinateInt** out) noexcept
{
    return make_value<CCoordinateIntImpl<ICoordinateInt>>(out, x, y);
}

HRESULT MakeCoordinateFloat(double x, double y, ICoordinateFloat** out) noexcept
{
    return make_value<CCoordinateFloat>(out, x, y);
}

HRESULT MakeFloatVector2D(double x, double y, IFloatVector2D** out) noexcept
{
    return make_value<CFloatVector2D>(out, x, y);
}

HRESULT MakeRectangle(LONG left, LONG top, LONG right, LONG bottom, IRectangle** out) noexcept
{
    return make_value<CRectangleIntImpl<IRectangle>>(out, rectangle{left, top, right, bottom});
}

HRESULT ReadValue(ICoordinateInt* object, coordinate<int32_t>* value) noexcept
{
    return read_pair(object, value);
}

HRESULT ReadValue(ICoordinateFloat* object, coordinate<double>* value) noexcept
{
    return read_pair(object, value);
}

HRESULT ReadValue(IRectangle* object, rectangle* value) noexcept
{
    return object ? read_rectangle(object, *value) : E_INVALIDARG;
}

namespace {
using ZELT::IComplex;
constexpr auto complex_rows =
    std::tuple(get<&IComplex::get_Real>("Real", "real part", result("value")),
               put<&IComplex::put_Real>("Real", "real part", in("value")),
               get<&IComplex::get_Imaginary>("Imaginary", "imaginary part", result("value")),
               put<&IComplex::put_Imaginary>("Imaginary", "imaginary part", in("value")));
} // namespace

} // namespace Qor::Luxar::Common

template <>
const Qor::interface_info& Qor::table_of<Qor::Luxar::ZELT::IComplex>() noexcept
{
    return interface_table<Luxar::ZELT::IComplex, Luxar::Common::complex_rows>::info("a complex number");
}
