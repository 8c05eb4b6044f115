// The choice between the tables of the instruction-set levels.
#pragma once

#include "arithmetic/kernels/compositing_table.h"
#include "pixel/level.h"

namespace Qor::Luxar::ZELT {

namespace v1 {
extern const Arithmetic::compositing_table compositing_loops;
}
namespace v3 {
extern const Arithmetic::compositing_table compositing_loops;
}
namespace v4 {
extern const Arithmetic::compositing_table compositing_loops;
}

namespace Arithmetic {

/// The loops at the level in use.
inline const compositing_table& compositing_level() noexcept
{
#ifdef ZELT_LEVELS_X86
    return at_level(v1::compositing_loops, v3::compositing_loops, v4::compositing_loops);
#else
    return v1::compositing_loops;
#endif
}

} // namespace Arithmetic
} // namespace Qor::Luxar::ZELT
