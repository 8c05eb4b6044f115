// The loops of the convolution: built once for each level.
#include "filters/kernels/convolve_table.h"
#include "pixel/level.h"

#include "filters/kernels/convolve.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters {

extern const Filters::convolve_table convolve;
const Filters::convolve_table convolve{
    .u8 = convolve_loops_of<uint8_t, double>,
    .u16 = convolve_loops_of<uint16_t, double>,
    .u32 = convolve_loops_of<uint32_t, double>,
    .i8 = convolve_loops_of<int8_t, double>,
    .i16 = convolve_loops_of<int16_t, double>,
    .i32 = convolve_loops_of<int32_t, double>,
    .f32 = convolve_loops_of<float, double>,
    .f64 = convolve_loops_of<double, double>,
    .small_u8 = convolve_loops_of<uint8_t, float>,
    .small_u16 = convolve_loops_of<uint16_t, float>,
    .small_i8 = convolve_loops_of<int8_t, float>,
    .small_i16 = convolve_loops_of<int16_t, float>,
    .small_f32 = convolve_loops_of<float, float>,
};

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters
