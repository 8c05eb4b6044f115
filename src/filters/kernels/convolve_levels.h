// The choice of the instruction-set level, for the front.
#pragma once

#include "filters/kernels/convolve_table.h"
#include "pixel/level.h"

namespace Qor::Luxar::ZELT {

namespace v1::filters {
extern const Filters::convolve_table convolve;
}
#ifdef ZELT_LEVELS_X86
namespace v3::filters {
extern const Filters::convolve_table convolve;
}
namespace v4::filters {
extern const Filters::convolve_table convolve;
}
#endif

namespace Filters {

inline const convolve_table& convolve_level() noexcept
{
#ifdef ZELT_LEVELS_X86
    return at_level(v1::filters::convolve, v3::filters::convolve, v4::filters::convolve);
#else
    return v1::filters::convolve;
#endif
}

} // namespace Filters
} // namespace Qor::Luxar::ZELT
