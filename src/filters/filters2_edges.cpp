// Filters that keep edges.
#include "filters/filters.h"

namespace Qor::Luxar::ZELT {

HRESULT CFilters2::Bilateral(IPixmat2*, double, double, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::NonLocalMeans(IPixmat2*, LONG, LONG, double, IPixmat2*, IPixmat2**) noexcept
{
    return E_NOTIMPL;
}

HRESULT CFilters2::ThresholdCorrection(IPixmat2*, LONG, double, IPixmat2*, IPixmat2**) noexcept
{
    return E_NOTIMPL;
}

} // namespace Qor::Luxar::ZELT
