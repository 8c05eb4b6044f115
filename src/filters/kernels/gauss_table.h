// What the loops of the Gaussian family see, and the table of them that each instruction-set level exports. Plain
// data only: shared by code built for different processors.
#pragma once

#include "pixel/memory_2d.h"

namespace Qor::Luxar::ZELT::Filters {

/// y[n] = ((b x[n] + a1 y[n-1]) + a2 y[n-2]) + a3 y[n-3]
struct recursion {
    double b, a1, a2, a3;
};

/// One channel of an image, with any strides in bytes.
struct gauss_plane {
    uint8_t* first;
    int64_t x_stride;
    int64_t y_stride;
};

/// A smoothing. The scratch holds floats, or doubles for double images, next to each other in a row; rows start with
/// a line of the cache. It may be the destination. History and lanes are working memory of the sizes that the table tells.
struct gauss_job {
    int32_t width;
    int32_t height;
    recursion filter;
    gauss_plane src;
    gauss_plane scratch;
    gauss_plane dst;
    double* history;
    void* lanes;
    bool beyond_cache; ///< no cache holds the scratch until the last pass
};
using smooth_function = void (*)(const gauss_job&);

/// Differences within a smoothed image whose rows have two clamped pixels before and behind them.
struct gauss_differences {
    int32_t width;
    int32_t height;
    gauss_plane smooth;
    gauss_plane dst;
    gauss_plane dst_y; ///< for the differences in y alone
};
using difference_function = void (*)(const gauss_differences&);

/// Arrays are by type: unsigned 8, 16, 32 bit, signed 8, 16, 32 bit, float, double.
struct gauss_table {
    /// Lines that go through the recursion side by side. For each column, in whole blocks of as many, `lanes` has
    /// as many elements as well and `history` three numbers.
    int64_t lines_at_once;

    smooth_function rows_and_down[8]; ///< from the source into the scratch, all but the last pass
    smooth_function up[8];            ///< from the scratch into the destination: cut, and not limited
    smooth_function up_colour;        ///< into a channel of a colour: limited
    smooth_function up_narrow;        ///< from doubles into floats

    difference_function gradient[8]; ///< from the scratch of that type into the type, limited
    difference_function laplacian[8];
    difference_function sdgd[8];
    difference_function xy_of_floats, xy_of_doubles; ///< halved, into two float images
};

} // namespace Qor::Luxar::ZELT::Filters
