// The choice of the instruction-set level, for the front.
#pragma once

#include "filters/kernels/gradients_table.h"
#include "pixel/level.h"

namespace Qor::Luxar::ZELT {

namespace v1::filters {
extern const Filters::gradients_table gradients;
}
#ifdef ZELT_LEVELS_X86
namespace v3::filters {
extern const Filters::gradients_table gradients;
}
namespace v4::filters {
extern const Filters::gradients_table gradients;
}
#endif

namespace Filters {

inline const gradients_table& gradients_level() noexcept
{
#ifdef ZELT_LEVELS_X86
    return at_level(v1::filters::gradients, v3::filters::gradients, v4::filters::gradients);
#else
    return v1::filters::gradients;
#endif
}

} // namespace Filters
} // namespace Qor::Luxar::ZELT
