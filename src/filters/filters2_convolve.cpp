// Convolution and gradients.
#include "filters/filters.h"

namespace Qor::Luxar::ZELT {

HRESULT CFilters2::Convolve(IPixmat2*, VARIANT, LONG, LONG, IPixmat2*, IPixmat2**) noexcept
{
    return E_NOTIMPL;
}

HRESULT CFilters2::Sobel(IPixmat2*, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::Prewitt(IPixmat2*, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::Derivative(IPixmat2*, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters::ConvolveEx(IPixmat2*, SAFEARRAY*, LONG, LONG, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters::SobelEx(IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

} // namespace Qor::Luxar::ZELT
