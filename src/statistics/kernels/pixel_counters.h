// Small measurements of single passes: counting, bounds, moments, NaN.
#pragma once

#include "pixel/memory_2d.h"

namespace Qor::Luxar::ZELT::Statistics {

/// How the pixels of a view compare with a value, in double. A NaN pixel counts as less.
struct comparison {
    int64_t less = 0;
    int64_t equal = 0;
    int64_t more = 0;
};

/// Throws std::invalid_argument "Count: unsupported pixel type".
comparison compare_pixels(const memory_2d& src, double value);

/// Both ends included; a NaN pixel is outside. Throws "CountRange: unsupported pixel type".
int64_t count_range(const memory_2d& src, double low, double high);

/// See IStatistics::BoundingBox. Throws "BoundingBox: unsupported pixel type".
rectangle bounding_box(const memory_2d& src);

/// See IStatistics::Moment. Throws "Moment: unsupported pixel type", std::bad_alloc.
double moment(const memory_2d& src, int32_t i, int32_t j);

/// Throws "IsNaN: unsupported pixel type".
bool has_nan(const memory_2d& src);

/// Throws "IsFinite: unsupported pixel type".
bool is_finite(const memory_2d& src);

} // namespace Qor::Luxar::ZELT::Statistics
