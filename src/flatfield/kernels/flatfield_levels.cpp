// The loops of the family that gain from an instruction-set level, compiled once for each.
#include "flatfield/kernels/flatten.inl"
#include "flatfield/kernels/flatten_double.inl"

namespace Qor::Luxar::ZELT::ZELT_LEVEL {

extern const FlatField::flatfield_table flatfield_loops;
const FlatField::flatfield_table flatfield_loops{
    .flatten = flatfield::flatten_rows<contiguous_row>,
    .merge = flatfield::merge_rows<contiguous_row, uint16_t>,
};

} // namespace Qor::Luxar::ZELT::ZELT_LEVEL
