// Rank and box filters.
#include "filters/filters.h"

namespace Qor::Luxar::ZELT {

HRESULT CFilters2::Median(IPixmat2*, LONG, LONG, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::Min(IPixmat2*, LONG, LONG, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::Max(IPixmat2*, LONG, LONG, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::Average(IPixmat2*, LONG, LONG, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::Kuwahara(IPixmat2*, LONG, LONG, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters::MedianEx(IPixmat2*, LONG, LONG, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters::MinEx(IPixmat2*, LONG, LONG, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters::MaxEx(IPixmat2*, LONG, LONG, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters::AverageEx(IPixmat2*, LONG, LONG, IPixmat2**) noexcept { return E_NOTIMPL; }

} // namespace Qor::Luxar::ZELT
