#include "arithmetic/basic2.h"

namespace Qor::Luxar::ZELT {

HRESULT CBasic2::Exp(IPixmat2*, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CBasic2::Log(IPixmat2*, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CBasic2::Power(IPixmat2*, double, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

} // namespace Qor::Luxar::ZELT
