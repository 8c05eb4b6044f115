// What the row loops of the family are told, as plain data shared by all instruction-set levels.
#pragma once

#include <cstdint>

namespace Qor::Luxar::ZELT::FlatField {

/// The pixels of one operand; null when there is none.
struct plane {
    uint8_t* first; ///< pixel (0, 0)
    int64_t x_stride;
    int64_t y_stride;
};

struct row_job {
    plane dst, src, dark, gain;
    plane brief; ///< the short exposure, when two are merged
    int32_t width;
    uint32_t shift; ///< of a fixed-point gain: to the right, 0 to 31

    // For two exposures only.
    uint32_t saturated;  ///< the level from which on the long exposure is not trusted
    double ratio;        ///< of the exposure times
    uint32_t left_shift; ///< of the eight-lane arithmetic
    uint16_t lane_ratio; ///< the ratio as that arithmetic uses it
};

/// Computes one row.
using row_function = void (*)(const row_job& job, int64_t y);

/// Which dark reference and which gain a row is for.
enum dark_kind { dark_unsigned, dark_signed, dark_kinds };
enum gain_kind { gain_absent, gain_fixed, gain_float, gain_kinds };

struct flatten_table {
    row_function same[2][8];                       ///< [with gain][number]: all images of one kind
    row_function mixed[dark_kinds][gain_kinds][8]; ///< [..][..][number of the destination]: a u16 source
};

/// The destinations of two exposures.
enum merge_destination { merge_i16, merge_i32, merge_destinations };

struct merge_table {
    row_function single[dark_kinds][gain_kinds][merge_destinations]; ///< no short exposure
    row_function raw[merge_destinations];                            ///< no references
    row_function references[dark_kinds][gain_kinds][merge_destinations];
    row_function lanes; ///< eight at a time: i16 dark, fixed-point gain, i16 destination
};

/// The loops over contiguous rows that gain from an instruction-set level.
struct flatfield_table {
    flatten_table flatten;
    merge_table merge;
};

} // namespace Qor::Luxar::ZELT::FlatField
