// The choice between the tables of the instruction-set levels.
#pragma once

#include "arithmetic/kernels/arithmetic_table.h"
#include "pixel/level.h"

namespace Qor::Luxar::ZELT {

namespace v1 {
extern const Arithmetic::arithmetic_table arithmetic_loops;
}
namespace v3 {
extern const Arithmetic::arithmetic_table arithmetic_loops;
}
namespace v4 {
extern const Arithmetic::arithmetic_table arithmetic_loops;
}

namespace Arithmetic {

/// The loops at the level in use.
inline const arithmetic_table& arithmetic_level() noexcept
{
#ifdef ZELT_LEVELS_X86
    return at_level(v1::arithmetic_loops, v3::arithmetic_loops, v4::arithmetic_loops);
#else
    return v1::arithmetic_loops;
#endif
}

} // namespace Arithmetic
} // namespace Qor::Luxar::ZELT
