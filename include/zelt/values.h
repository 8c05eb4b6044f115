// Makers of value objects for clients and scripts.
#pragma once

#include "zelt/pixmat/values.h"

namespace Qor::Luxar::Common {

// A null out pointer is E_POINTER, no memory E_OUTOFMEMORY.
ZELT_API HRESULT MakeCoordinateInt(LONG x, LONG y, ICoordinateInt** out) noexcept;
ZELT_API HRESULT MakeCoordinateFloat(double x, double y, ICoordinateFloat** out) noexcept;
ZELT_API HRESULT MakeRectangle(LONG left, LONG top, LONG right, LONG bottom, IRectangle** out) noexcept;
ZELT_API HRESULT MakeFloatVector2D(double x, double y, IFloatVector2D** out) noexcept;

} // namespace Qor::Luxar::Common
