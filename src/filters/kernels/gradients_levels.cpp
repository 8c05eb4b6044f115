// The loops of the gradients: built once for each level.
#include "filters/kernels/gradients_table.h"
#include "pixel/level.h"

#include "filters/kernels/gradients.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters {

extern const Filters::gradients_table gradients;
const Filters::gradients_table gradients{
    .u8 = gradient_loops_of<uint8_t, int16_t>,
    .i8 = gradient_loops_of<int8_t, int16_t>,
    .u16 = gradient_loops_of<uint16_t, int32_t>,
    .i16 = gradient_loops_of<int16_t, int32_t>,
    .u32 = gradient_loops_of<uint32_t, double>,
    .i32 = gradient_loops_of<int32_t, double>,
    .f64 = gradient_loops_of<double, double>,
    .f32 = gradient_loops_of<float, float>,
};

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters
