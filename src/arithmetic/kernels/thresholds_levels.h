// The choice between the tables of the instruction-set levels.
#pragma once

#include "arithmetic/kernels/thresholds_table.h"
#include "pixel/level.h"

namespace Qor::Luxar::ZELT {

namespace v1 {
extern const Arithmetic::threshold_table threshold_loops;
}
namespace v3 {
extern const Arithmetic::threshold_table threshold_loops;
}
namespace v4 {
extern const Arithmetic::threshold_table threshold_loops;
}

namespace Arithmetic {

/// The loops at the level in use.
inline const threshold_table& threshold_level() noexcept
{
#ifdef ZELT_LEVELS_X86
    return at_level(v1::threshold_loops, v3::threshold_loops, v4::threshold_loops);
#else
    return v1::threshold_loops;
#endif
}

} // namespace Arithmetic
} // namespace Qor::Luxar::ZELT
