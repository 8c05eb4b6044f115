// Enumerations that several facets share.
#pragma once

#include "zelt/com/interface_table.h"

namespace Qor::Luxar::ZELT {

/// How arithmetic turns a computed value into a stored one.
enum ZELT_Rounding : int32_t {
    ZELT_Rounding_Default = 0,  ///< per call: the facet's own mode; refused as the library's mode
    ZELT_Rounding_Fastest = 1,  ///< computes as Wrap does
    ZELT_Rounding_Wrap = 2,     ///< low bits kept; a new root starts with it
    ZELT_Rounding_Saturate = 3, ///< limited to the nominal range
};

/// What lies outside an image. IBasicOps2::Extend knows the first, the correlations of IFilters2 also know the
/// periodic one.
enum ZELT_BoundaryCondition : int32_t {
    ZELT_BoundaryCondition_ConstantValue = 0,
    ZELT_BoundaryCondition_RepeatBorderPixels = 1,
    ZELT_BoundaryCondition_Reflective = 2,
    ZELT_BoundaryCondition_Periodic = 3,
    ZELT_BoundaryCondition_Taper = 4,
};

} // namespace Qor::Luxar::ZELT

template <>
struct Qor::enumeration_of<Qor::Luxar::ZELT::ZELT_Rounding> {
    static constexpr enumeration_value values[] = {
        {"ZELT_Rounding_Default", 0},
        {"ZELT_Rounding_Fastest", 1},
        {"ZELT_Rounding_Wrap", 2},
        {"ZELT_Rounding_Saturate", 3},
    };
    static constexpr enumeration_info info{"ZELT_Rounding", values};
};

template <>
struct Qor::enumeration_of<Qor::Luxar::ZELT::ZELT_BoundaryCondition> {
    static constexpr enumeration_value values[] = {
        {"ZELT_BoundaryCondition_ConstantValue", 0}, {"ZELT_BoundaryCondition_RepeatBorderPixels", 1},
        {"ZELT_BoundaryCondition_Reflective", 2},    {"ZELT_BoundaryCondition_Periodic", 3},
        {"ZELT_BoundaryCondition_Taper", 4},
    };
    static constexpr enumeration_info info{"ZELT_BoundaryCondition", values};
};
