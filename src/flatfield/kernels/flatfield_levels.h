// The choice between the tables of the instruction-set levels.
#pragma once

#include "flatfield/kernels/row_job.h"
#include "pixel/level.h"

namespace Qor::Luxar::ZELT {

namespace v1 {
extern const FlatField::flatfield_table flatfield_loops;
}
namespace v3 {
extern const FlatField::flatfield_table flatfield_loops;
}
namespace v4 {
extern const FlatField::flatfield_table flatfield_loops;
}

namespace FlatField {

/// The loops over contiguous rows at the level in use.
inline const flatfield_table& flatfield_level() noexcept
{
#ifdef ZELT_LEVELS_X86
    return at_level(v1::flatfield_loops, v3::flatfield_loops, v4::flatfield_loops);
#else
    return v1::flatfield_loops;
#endif
}

} // namespace FlatField
} // namespace Qor::Luxar::ZELT
