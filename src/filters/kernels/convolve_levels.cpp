// The loops of the convolution: built once for each level.
#include "filters/kernels/convolve_table.h"
#include "pixel/level.h"

#include "filters/kernels/convolve.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters {

extern const Filters::convolve_table convolve;
const Filters::convolve_table convolve{
    .load = {load_padded_row<uint8_t, double>, load_padded_row<uint16_t, double>,
             load_padded_row<uint32_t, double>, load_padded_row<int8_t, double>,
             load_padded_row<int16_t, double>, load_padded_row<int32_t, double>,
             load_padded_row<float, double>, load_padded_row<double, double>},
    .sum = sum,
    .store = {store_row<uint8_t>, store_row<uint16_t>, store_row<uint32_t>, store_row<int8_t>,
              store_row<int16_t>, store_row<int32_t>, store_row<float>, store_row<double>},
};

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL::filters
