// Convolution and gradients.
#include "filters/filters.h"
#include "filters/first_generation.h"
#include "filters/kernels/convolve.h"
#include "filters/kernels/gradients.h"
#include "frame/operation.h"

namespace Qor::Luxar::ZELT {
namespace {

/// The values of a two-dimensional array, while it is accessed. Its leftmost dimension, which varies fastest, is x.
class kernel_access {
public:
    explicit kernel_access(SAFEARRAY* array)
        : data_(array), view_{data_.data(), length(array, 1), length(array, 2)}
    {
        if (!view_.values) throw std::invalid_argument("Convolve() can not access its kernel");
    }
    const Filters::kernel_view& view() const noexcept { return view_; }

private:
    static int32_t length(SAFEARRAY* array, uint32_t dimension)
    {
        int32_t low = 0, high = 0;
        CheckHResult(SafeArrayGetLBound(array, dimension, &low));
        CheckHResult(SafeArrayGetUBound(array, dimension, &high));
        return static_cast<int32_t>(int64_t{high} - low + 1);
    }

    safe_array_access<double> data_;
    Filters::kernel_view view_;
};

bool holds_doubles(const VARIANT& v) noexcept
{
    VARTYPE element = VT_EMPTY;
    return v.vt == (VT_ARRAY | VT_R8) &&
           (!v.parray || (succeeded(SafeArrayGetVartype(v.parray, &element)) && element == VT_R8));
}

HRESULT refused(const wchar_t* text) noexcept
{
    return ReportError(CLSID_ZELT2, text, IFilters2::iid, E_INVALIDARG);
}

template <class Kernel>
HRESULT gradient(IPixmat2* image, IPixmat2* out, IPixmat2** result, Kernel&& kernel) noexcept
{
    return image_method<IFilters2>(result, [&] {
        auto dst = ResolveOutput(image, out);
        const ImageReadAccess src(image);
        kernel(src.view(), dst.view());
        return committed(dst);
    });
}

} // namespace

HRESULT CFilters2::Convolve(IPixmat2* pIImage, VARIANT kernel, LONG kx, LONG ky, IPixmat2* pIOut,
                            IPixmat2** ppIPixmat) noexcept
{
    if (!holds_doubles(kernel)) return refused(L"Convolve() needs a 2D double kernel");
    if (SafeArrayGetDim(kernel.parray) != 2) return refused(L"Convolve() needs a 2D kernel");
    return image_method<IFilters2>(ppIPixmat, [&] {
        auto dst = ResolveOutput(pIImage, pIOut);
        const ImageReadAccess src(pIImage);
        const kernel_access values(kernel.parray);
        Filters::convolve(src.view(), values.view(), {kx, ky}, dst.view(), &pool());
        return committed(dst);
    });
}

HRESULT CFilters2::Sobel(IPixmat2* pIImage, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept
{
    return gradient(pIImage, pIOut, ppIPixmat, Filters::sobel);
}

HRESULT CFilters2::Prewitt(IPixmat2* pIImage, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept
{
    return gradient(pIImage, pIOut, ppIPixmat, Filters::prewitt);
}

HRESULT CFilters2::Derivative(IPixmat2* pIImage, IPixmat2* pIOut, IPixmat2** ppIPixmat) noexcept
{
    return gradient(pIImage, pIOut, ppIPixmat, Filters::derivative);
}

HRESULT CFilters::ConvolveEx(IPixmat2* pIImage, SAFEARRAY* kernel, LONG kx, LONG ky,
                             IPixmat2** ppIOut) noexcept
{
    if (!kernel) return E_INVALIDARG;
    VARIANT values = empty_variant(); // borrows the array
    if (const HRESULT hr = SafeArrayGetVartype(kernel, &values.vt); failed(hr)) return hr;
    values.vt |= VT_ARRAY;
    values.parray = kernel;
    return into_new_image(pIImage, ppIOut, [&](IPixmat2* out) {
        return second_->Convolve(pIImage, values, kx, ky, out, ppIOut);
    });
}

HRESULT CFilters::SobelEx(IPixmat2* pIImage, IPixmat2** ppIOut) noexcept
{
    return into_new_image(pIImage, ppIOut,
                          [&](IPixmat2* out) { return second_->Sobel(pIImage, out, ppIOut); });
}

} // namespace Qor::Luxar::ZELT
