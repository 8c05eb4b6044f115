// The loops of the statistics family that gain from an instruction set: built once for each level.
#include "pixel/level.h"
#include "statistics/kernels/statistics_table.h"

#include "statistics/kernels/scalar_scan.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL {

extern const statistics_table statistics;
const statistics_table statistics{
    .scan_u8 = scalar_statistics::scan<uint8_t>,
    .scan_u16 = scalar_statistics::scan<uint16_t>,
    .scan_u32 = scalar_statistics::scan<uint32_t>,
    .scan_i8 = scalar_statistics::scan<int8_t>,
    .scan_i16 = scalar_statistics::scan<int16_t>,
    .scan_i32 = scalar_statistics::scan<int32_t>,
    .scan_f32 = scalar_statistics::scan<float>,
    .scan_f64 = scalar_statistics::scan<double>,
};

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL
