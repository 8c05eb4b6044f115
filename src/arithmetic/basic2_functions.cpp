#include "arithmetic/basic2.h"

#include "arithmetic/kernels/functions.h"
#include "frame/operation.h"
#include "zelt/interfaces/zelt.h"

namespace Qor::Luxar::ZELT {
namespace {

bool same_format(const image_layout& a, const image_layout& b)
{
    return a.encoding == b.encoding && a.bits == b.bits && a.width == b.width && a.height == b.height;
}

/// A function of Float pixels that keeps their type. What is given is looked at before anything is opened.
HRESULT map(void (*kernel)(const memory_2d&, const memory_2d&), IPixmat2* image, IPixmat2* out,
            IPixmat2** result, const wchar_t* other_format) noexcept
{
    return run_frame(IBasicOps2::iid, [&]() -> HRESULT {
        if (!image) throw std::invalid_argument("null IPixmat2");
        image_layout layout, given;
        CheckHResult(ReadLayout(image, &layout));
        if (out) {
            CheckHResult(ReadLayout(out, &given));
            if (!same_format(layout, given))
                return ReportError(CLSID_ZELT, other_format, IBasicOps::iid, E_INVALIDARG);
        }
        if (layout.encoding != PixmatEncoding_Float || (layout.bits != 32 && layout.bits != 64))
            return E_NOTIMPL;
        return image_method<IBasicOps2>(result, [&] {
            auto dst = ResolveOutput(image, out);
            const ImageReadAccess src(image);
            kernel(src.view(), dst.view());
            return committed(dst);
        });
    });
}

} // namespace

HRESULT CBasic2::Exp(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return map(Arithmetic::exponential, pIImage, pIOutImg, ppIOut,
               L"Exp(): Output image must have same format as input image");
}

HRESULT CBasic2::Log(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return map(Arithmetic::logarithm, pIImage, pIOutImg, ppIOut,
               L"Log(): Output image must have same format as input image");
}

HRESULT CBasic2::Power(IPixmat2* pIA, double exponent, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return image_method<IBasicOps2>(ppIOut, [&] {
        auto dst = ResolveOutput(pIA, pIOutImg);
        const ImageReadAccess src(pIA);
        Arithmetic::power(src.view(), exponent, dst.view());
        return committed(dst);
    });
}

} // namespace Qor::Luxar::ZELT
