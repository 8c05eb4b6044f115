// Height maps from gradients.
#include "filters/filters.h"

namespace Qor::Luxar::ZELT {

HRESULT CFilters2::FrankotChellappa(IPixmat2*, IPixmat2*, VARIANT_BOOL, float, IPixmat2**) noexcept
{
    return E_NOTIMPL;
}

} // namespace Qor::Luxar::ZELT
