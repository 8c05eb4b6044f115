#include "arithmetic/basic.h"

#include "frame/image_access.h"
#include "frame/report.h"
#include "zelt/interfaces/zelt.h"

namespace Qor::Luxar::ZELT {
namespace {

using second_method = HRESULT (CBasic2::*)(IPixmat2*, VARIANT, IPixmat2*, IPixmat2**) noexcept;

/// A mode other than 0 holds on the facet as long as this lives. Without one the facet is not written, so that such
/// calls may run at once.
class rounding_override {
public:
    rounding_override(ZeltRoundable& facet, ZELT_Rounding r) noexcept
        : facet_(facet), overrides_(r != ZELT_Rounding_Default), before_(facet.get())
    {
        if (overrides_) facet_.set(r);
    }
    ~rounding_override()
    {
        if (overrides_) facet_.set(before_);
    }
    rounding_override(const rounding_override&) = delete;
    rounding_override& operator=(const rounding_override&) = delete;

private:
    ZeltRoundable& facet_;
    bool overrides_;
    ZELT_Rounding before_;
};

/// Makes the output of an Ex method and calls method(output).
template <class Method>
HRESULT into_new_image(IPixmat2* input, IPixmatDescriptor* descriptor, IPixmat2** result,
                       const wchar_t* other_size, Method&& method) noexcept
{
    if (!input) return E_INVALIDARG;
    if (!result) return E_POINTER;
    com_ptr<IPixmat2> output;
    const HRESULT hr = CreateFromDescriptor(input, descriptor, output.put());
    if (hr == E_SIZE_MISMATCH) return ReportError(CLSID_ZELT, other_size, IBasicOps::iid, E_INVALIDARG);
    return failed(hr) ? hr : method(output.get());
}

HRESULT in_place(CBasic2& second, second_method method, IPixmat2* image, const VARIANT& b,
                 ZELT_Rounding r) noexcept
{
    const rounding_override mode(second.roundable(), r);
    return (second.*method)(image, b, image, nullptr);
}

struct ex_arguments {
    IPixmat2* image;
    const VARIANT& b;
    ZELT_Rounding r;
    IPixmatDescriptor* descriptor;
    IPixmat2** result;
};

HRESULT ex(CBasic2& second, second_method method, const ex_arguments& given,
           const wchar_t* other_size) noexcept
{
    return into_new_image(given.image, given.descriptor, given.result, other_size, [&](IPixmat2* output) {
        const rounding_override mode(second.roundable(), given.r);
        return (second.*method)(given.image, given.b, output, given.result);
    });
}

constexpr auto no_override = ZELT_Rounding_Default;

} // namespace

HRESULT CBasic::Add(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept
{
    return in_place(*second_, &CBasic2::Add, pIA, b, r);
}

HRESULT CBasic::AddEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                      IPixmat2** ppIOut) noexcept
{
    return ex(*second_, &CBasic2::Add, {pIA, b, r, pIOutDescr, ppIOut},
              L"Requested output image of addition has different size");
}

HRESULT CBasic::Subtract(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept
{
    return in_place(*second_, &CBasic2::Subtract, pIA, b, r);
}

HRESULT CBasic::SubtractEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                           IPixmat2** ppIOut) noexcept
{
    return ex(*second_, &CBasic2::Subtract, {pIA, b, r, pIOutDescr, ppIOut},
              L"Requested output image of subtraction has different size");
}

HRESULT CBasic::ReverseSubtract(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept
{
    return in_place(*second_, &CBasic2::ReverseSubtract, pIA, b, r);
}

HRESULT CBasic::ReverseSubtractEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                                  IPixmat2** ppIOut) noexcept
{
    return ex(*second_, &CBasic2::ReverseSubtract, {pIA, b, r, pIOutDescr, ppIOut},
              L"Requested output image of subtraction has different size");
}

HRESULT CBasic::Multiply(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept
{
    return in_place(*second_, &CBasic2::Multiply, pIA, b, r);
}

HRESULT CBasic::MultiplyEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                           IPixmat2** ppIOut) noexcept
{
    return ex(*second_, &CBasic2::Multiply, {pIA, b, r, pIOutDescr, ppIOut},
              L"Requested output image of multiplication has different size");
}

HRESULT CBasic::Divide(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept
{
    return in_place(*second_, &CBasic2::Divide, pIA, b, r);
}

HRESULT CBasic::DivideEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                         IPixmat2** ppIOut) noexcept
{
    return ex(*second_, &CBasic2::Divide, {pIA, b, r, pIOutDescr, ppIOut},
              L"Requested output image of division has different size");
}

HRESULT CBasic::ReverseDivide(IPixmat2* pIA, VARIANT b, ZELT_Rounding r) noexcept
{
    return in_place(*second_, &CBasic2::ReverseDivide, pIA, b, r);
}

HRESULT CBasic::ReverseDivideEx(IPixmat2* pIA, VARIANT b, ZELT_Rounding r, IPixmatDescriptor* pIOutDescr,
                                IPixmat2** ppIOut) noexcept
{
    return ex(*second_, &CBasic2::ReverseDivide, {pIA, b, r, pIOutDescr, ppIOut},
              L"Requested output image of division has different size");
}

HRESULT CBasic::SetTo(IPixmat2* pIImg, VARIANT b, IRectangle* pIRect) noexcept
{
    return second_->SetTo(pIImg, b, pIRect);
}

HRESULT CBasic::Min(IPixmat2* pIA, VARIANT b) noexcept
{
    return in_place(*second_, &CBasic2::Min, pIA, b, no_override);
}

HRESULT CBasic::MinEx(IPixmat2* pIA, VARIANT b, IPixmatDescriptor* pIOutDescr, IPixmat2** ppIOut) noexcept
{
    return ex(*second_, &CBasic2::Min, {pIA, b, no_override, pIOutDescr, ppIOut},
              L"Requested output image of min has different size");
}

HRESULT CBasic::Max(IPixmat2* pIA, VARIANT b) noexcept
{
    return in_place(*second_, &CBasic2::Max, pIA, b, no_override);
}

HRESULT CBasic::MaxEx(IPixmat2* pIA, VARIANT b, IPixmatDescriptor* pIOutDescr, IPixmat2** ppIOut) noexcept
{
    return ex(*second_, &CBasic2::Max, {pIA, b, no_override, pIOutDescr, ppIOut},
              L"Requested output image of max has different size");
}

HRESULT CBasic::Abs(IPixmat2* pIImage) noexcept { return second_->Abs(pIImage, pIImage, nullptr); }

HRESULT CBasic::AbsEx(IPixmat2* pIImage, IPixmatDescriptor* pIOutDescr, IPixmat2** ppIOut) noexcept
{
    return into_new_image(pIImage, pIOutDescr, ppIOut, L"Requested output image of abs has different size",
                          [&](IPixmat2* output) { return second_->Abs(pIImage, output, ppIOut); });
}

HRESULT CBasic::Threshold(IPixmat2* pIImage, VARIANT lowLimit, VARIANT lowValue, VARIANT highLimit,
                          VARIANT highValue) noexcept
{
    return second_->Threshold(pIImage, lowLimit, lowValue, highLimit, highValue, pIImage, nullptr);
}

HRESULT CBasic::ThresholdEx(IPixmat2* pIImage, VARIANT lowLimit, VARIANT lowValue, VARIANT highLimit,
                            VARIANT highValue, IPixmatDescriptor* pIOutDescr, IPixmat2** ppIOut) noexcept
{
    return into_new_image(pIImage, pIOutDescr, ppIOut,
                          L"Requested output image of ThresholdEx has different size", [&](IPixmat2* output) {
                              return second_->Threshold(pIImage, lowLimit, lowValue, highLimit, highValue,
                                                        output, ppIOut);
                          });
}

} // namespace Qor::Luxar::ZELT
