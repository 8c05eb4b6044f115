#include "arithmetic/math.h"

#include "arithmetic/kernels/functions.h"
#include "frame/operation.h"

namespace Qor::Luxar::ZELT {
namespace {

using Arithmetic::angle_function;

size size_of(const ImageReadAccess& i) { return {i.view().width, i.view().height}; }

/// The input opens first: it tells the size of a new output.
HRESULT map(angle_function f, IPixmat2* image, IPixmat2* out, IPixmat2** result) noexcept
{
    return image_method<IMath>(result, [&] {
        const ImageReadAccess src(image);
        auto dst = ResolveOutputTyped(out, size_of(src), pixel_type::float_32);
        Arithmetic::map(f, src.view(), dst.view());
        return committed(dst);
    });
}

} // namespace

HRESULT CMath::Sin(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return map(angle_function::sine, pIImage, pIOutImg, ppIOut);
}

HRESULT CMath::Cos(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return map(angle_function::cosine, pIImage, pIOutImg, ppIOut);
}

HRESULT CMath::Tan(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return map(angle_function::tangent, pIImage, pIOutImg, ppIOut);
}

HRESULT CMath::Asin(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return map(angle_function::arc_sine, pIImage, pIOutImg, ppIOut);
}

HRESULT CMath::Acos(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return map(angle_function::arc_cosine, pIImage, pIOutImg, ppIOut);
}

HRESULT CMath::Atan(IPixmat2* pIImage, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return map(angle_function::arc_tangent, pIImage, pIOutImg, ppIOut);
}

HRESULT CMath::Atan2(IPixmat2* pIImageA, IPixmat2* pIImageB, IPixmat2* pIOutImg, IPixmat2** ppIOut) noexcept
{
    return image_method<IMath>(ppIOut, [&] {
        const ImageReadAccess a(pIImageA), b(pIImageB);
        auto dst = ResolveOutputTyped(pIOutImg, size_of(a), pixel_type::float_32);
        Arithmetic::arc_tangent_2(a.view(), b.view(), dst.view());
        return committed(dst);
    });
}

} // namespace Qor::Luxar::ZELT
