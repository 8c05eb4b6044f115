#include "arithmetic/basic2.h"

#include "arithmetic/by_codes.h"
#include "arithmetic/combine.h"
#include "frame/operation.h"
#include "frame/value_objects.h"

namespace Qor::Luxar::ZELT {

using Arithmetic::method;

HRESULT CBasic2::Add(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return by_codes([&] { return combine(method::add, roundable().get(), pIA, b, pIOutImg, ppIOut); });
}

HRESULT CBasic2::Subtract(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return by_codes([&] { return combine(method::subtract, roundable().get(), pIA, b, pIOutImg, ppIOut); });
}

HRESULT CBasic2::ReverseSubtract(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return by_codes(
        [&] { return combine(method::reverse_subtract, roundable().get(), pIA, b, pIOutImg, ppIOut); });
}

HRESULT CBasic2::Multiply(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return by_codes([&] { return combine(method::multiply, roundable().get(), pIA, b, pIOutImg, ppIOut); });
}

HRESULT CBasic2::Divide(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return run_frame(IBasicOps2::iid,
                     [&] { return combine(method::divide, roundable().get(), pIA, b, pIOutImg, ppIOut); });
}

HRESULT CBasic2::ReverseDivide(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return run_frame(IBasicOps2::iid, [&] {
        return combine(method::reverse_divide, roundable().get(), pIA, b, pIOutImg, ppIOut);
    });
}

HRESULT CBasic2::Min(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return by_codes([&] { return combine(method::min, ZELT_Rounding_Fastest, pIA, b, pIOutImg, ppIOut); });
}

HRESULT CBasic2::Max(IPixmat2* pIA, VARIANT b, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return by_codes([&] { return combine(method::max, ZELT_Rounding_Fastest, pIA, b, pIOutImg, ppIOut); });
}

HRESULT CBasic2::SetTo(IPixmat2* pIImg, VARIANT b, IRectangle* pIRect) noexcept
{
    if (!pIImg) return E_POINTER;
    return by_codes([&] {
        image_part part;
        if (const HRESULT hr = ReadLayout(pIImg, &part.layout); failed(hr)) return hr;
        if (pIRect) {
            rectangle r;
            if (const HRESULT hr = Common::ReadValue(pIRect, &r); failed(hr)) return hr;
            if (!fits(r, {part.layout.width, part.layout.height})) return E_INVALIDARG;
            part.first = int64_t{r.top} * part.layout.y_stride + int64_t{r.left} * part.layout.x_stride;
            part.layout.width = r.right - r.left;
            part.layout.height = r.bottom - r.top;
        }
        return combine(method::assign, ZELT_Rounding_Fastest, pIImg, b, pIImg, nullptr, &part);
    });
}

} // namespace Qor::Luxar::ZELT
