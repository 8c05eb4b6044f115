// The choice of the instruction-set level, for the fronts of the family.
#pragma once

#include "pixel/level.h"
#include "statistics/kernels/statistics_table.h"

namespace Qor::Luxar::ZELT {

namespace v1 {
extern const statistics_table statistics;
}
#ifdef ZELT_LEVELS_X86
namespace v3 {
extern const statistics_table statistics;
}
namespace v4 {
extern const statistics_table statistics;
}
#endif

inline const statistics_table& statistics_level() noexcept
{
#ifdef ZELT_LEVELS_X86
    return at_level(v1::statistics, v3::statistics, v4::statistics);
#else
    return v1::statistics;
#endif
}

} // namespace Qor::Luxar::ZELT
