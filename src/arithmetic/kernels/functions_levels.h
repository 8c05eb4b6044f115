// The choice between the tables of the instruction-set levels.
#pragma once

#include "arithmetic/kernels/functions_table.h"
#include "pixel/level.h"

namespace Qor::Luxar::ZELT {

namespace v1 {
extern const Arithmetic::functions_table function_loops;
}
namespace v3 {
extern const Arithmetic::functions_table function_loops;
}
namespace v4 {
extern const Arithmetic::functions_table function_loops;
}

namespace Arithmetic {

/// The loops at the level in use.
inline const functions_table& functions_level() noexcept
{
#ifdef ZELT_LEVELS_X86
    return at_level(v1::function_loops, v3::function_loops, v4::function_loops);
#else
    return v1::function_loops;
#endif
}

} // namespace Arithmetic
} // namespace Qor::Luxar::ZELT
