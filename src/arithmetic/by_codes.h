// The frame of methods that report by codes alone.
#pragma once

#include "zelt/com/types.h"

#include <new>

namespace Qor::Luxar::ZELT {

/// Runs a body that answers a code. Nothing in such bodies throws on its own; what still does becomes a code.
template <class Body>
HRESULT by_codes(Body&& body) noexcept
{
    try {
        return body();
    } catch (const std::bad_alloc&) {
        return E_OUTOFMEMORY;
    } catch (...) {
        return E_UNEXPECTED;
    }
}

} // namespace Qor::Luxar::ZELT
