#include "arithmetic/basic.h"
#include "arithmetic/basic2.h"

namespace Qor::Luxar::ZELT {

HRESULT CBasic2::AddOffset(IPixmat2*, IPixmat2*, ICoordinateFloat*, double, double) noexcept
{
    return E_NOTIMPL;
}

HRESULT CBasic2::AddIntegerOffset(IPixmat2*, IPixmat2*, ICoordinateInt*, double, double, IPixmat2*,
                                  IPixmat2**) noexcept
{
    return E_NOTIMPL;
}

HRESULT CBasic2::Equals(IPixmat2*, IPixmat2*, VARIANT_BOOL*) noexcept { return E_NOTIMPL; }

HRESULT CBasic2::Margins(IPixmat2*, LONG, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CBasic2::Combine(IPixmat2*, IPixmat2*, IPixmat2*, IPixmat2*, IPixmat2**) noexcept
{
    return E_NOTIMPL;
}

HRESULT CBasic2::Modulate(IPixmat2*, IPixmat2*, double, IPixmat2*, IPixmat2**) noexcept { return E_NOTIMPL; }

HRESULT CBasic2::Extend(IPixmat2*, IRectangle*, ZELT_BoundaryCondition, double, IPixmat2*,
                        IPixmat2**) noexcept
{
    return E_NOTIMPL;
}

HRESULT CBasic::AddOffset(IPixmat2*, IPixmat2*, ICoordinateFloat*, ZELT_Offset) noexcept { return E_NOTIMPL; }

} // namespace Qor::Luxar::ZELT
