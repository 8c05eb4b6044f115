// The loops of the Gaussian family, which gain from an instruction set: built once for each level.
#include "filters/kernels/gauss_table.h"
#include "pixel/level.h"

#include "filters/kernels/gauss_differences.inl"
#include "filters/kernels/gauss_recursion.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL {

#define ZELT_REAL_TYPES(entry)                                                                               \
    {                                                                                                        \
        entry<uint8_t>, entry<uint16_t>, entry<uint32_t>, entry<int8_t>, entry<int16_t>, entry<int32_t>,     \
            entry<float>, entry<double>                                                                      \
    }

extern const Filters::gauss_table gauss_loops;
const Filters::gauss_table gauss_loops{
    .lines_at_once = gauss::block,
    .rows_and_down = ZELT_REAL_TYPES(gauss::rows_and_down),
    .up = ZELT_REAL_TYPES(gauss::up),
    .up_colour = gauss::up_as<float, gauss::limited<uint8_t>>,
    .up_narrow = gauss::up_as<double, gauss::cut<float>>,
    .gradient = ZELT_REAL_TYPES(gauss::gradient),
    .laplacian = ZELT_REAL_TYPES(gauss::laplacian),
    .sdgd = ZELT_REAL_TYPES(gauss::sdgd),
    .xy_of_floats = gauss::xy<float>,
    .xy_of_doubles = gauss::xy<double>,
};

#undef ZELT_REAL_TYPES

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL
