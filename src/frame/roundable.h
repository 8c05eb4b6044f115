// The rounding mode that a root hands to those of its facets whose arithmetic depends on it.
#pragma once

#include "zelt/interfaces/enums.h"

namespace Qor::Luxar::ZELT {

/// Plain reads and writes: changing the mode during a call is the caller's affair.
class ZeltRoundable {
public:
    ZELT_Rounding get() const noexcept { return rounding_; }
    void set(ZELT_Rounding mode) noexcept { rounding_ = mode; }

private:
    ZELT_Rounding rounding_ = ZELT_Rounding_Wrap;
};

} // namespace Qor::Luxar::ZELT
