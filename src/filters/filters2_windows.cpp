// Windows and tapers.
#include "filters/filters.h"

namespace Qor::Luxar::ZELT {

HRESULT CFilters2::HanningWindow(IPixmat2*, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::HammingWindow(IPixmat2*, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::Taper(IPixmat2*, IPixmat2*, ICoordinateInt*, double, LONG) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::TaperEx(IPixmat2*, LONG, LONG, ICoordinateInt*, double, LONG, IPixmat2**) noexcept
{
    return E_NOTIMPL;
}

} // namespace Qor::Luxar::ZELT
