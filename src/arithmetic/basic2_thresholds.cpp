#include "arithmetic/basic2.h"

namespace Qor::Luxar::ZELT {

HRESULT CBasic2::Abs(IPixmat2*, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CBasic2::Threshold(IPixmat2*, VARIANT, VARIANT, VARIANT, VARIANT, IPixmat2*, IPixmat2**) noexcept
{
    return E_NOTIMPL;
}

HRESULT CBasic2::Normalize(IPixmat2*, double, double, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CBasic2::AutoThreshold(IPixmat2*, VARIANT, VARIANT, ZELT_AutoThreshold_Method, IPixmat2*,
                               IPixmat2**) noexcept
{
    return E_NOTIMPL;
}

} // namespace Qor::Luxar::ZELT
