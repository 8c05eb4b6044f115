// The Gaussian family.
#include "filters/filters.h"

namespace Qor::Luxar::ZELT {

HRESULT CFilters2::Gauss(IPixmat2*, double, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::GaussDerivative(IPixmat2*, double, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::LaplacianGaussian(IPixmat2*, double, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters2::SDGDGaussian(IPixmat2*, double, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CFilters::Gauss(IPixmat2*, double) noexcept { return E_NOTIMPL; }

HRESULT CFilters::GaussEx(IPixmat2*, double, IPixmat2**) noexcept { return E_NOTIMPL; }

} // namespace Qor::Luxar::ZELT
