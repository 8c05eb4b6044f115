// Filters and correlations through spectra.
#include "filters/filters.h"

namespace Qor::Luxar::ZELT {

HRESULT CFilters2::LowPass(IPixmat2*, double, double, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::HighPass(IPixmat2*, double, double, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::BandPass(IPixmat2*, double, double, double, double, IPixmat2*, IPixmat2**) noexcept
{
    return E_NOTIMPL;
}

HRESULT CFilters2::BandStop(IPixmat2*, double, double, double, double, IPixmat2*, IPixmat2**) noexcept
{
    return E_NOTIMPL;
}

HRESULT CFilters2::CrossCorrelate(IPixmat2*, IPixmat2*, ULONG, ZELT_BoundaryCondition, IPixmat2*,
                                  IPixmat2**) noexcept
{
    return E_NOTIMPL;
}

HRESULT CFilters2::AutoCorrelate(IPixmat2*, ULONG, ZELT_BoundaryCondition, IPixmat2*, IPixmat2**) noexcept
{
    return E_NOTIMPL;
}

} // namespace Qor::Luxar::ZELT
