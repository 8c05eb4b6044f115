// The choice of the instruction-set level, for the fronts of the Gaussian family.
#pragma once

#include "filters/kernels/gauss_table.h"
#include "pixel/level.h"

namespace Qor::Luxar::ZELT {

namespace v1 {
extern const Filters::gauss_table gauss_loops;
}
#ifdef ZELT_LEVELS_X86
namespace v3 {
extern const Filters::gauss_table gauss_loops;
}
namespace v4 {
extern const Filters::gauss_table gauss_loops;
}
#endif

inline const Filters::gauss_table& gauss_level() noexcept
{
#ifdef ZELT_LEVELS_X86
    return at_level(v1::gauss_loops, v3::gauss_loops, v4::gauss_loops);
#else
    return v1::gauss_loops;
#endif
}

} // namespace Qor::Luxar::ZELT
