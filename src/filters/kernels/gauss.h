// The Gaussian family: smoothing by recursion, at a cost that does not depend on sigma, and what is made of
// smoothed images.
#pragma once

#include "filters/kernels/gauss_design.h"
#include "pixel/memory_2d.h"
#include "threads/thread_pool.h"

namespace Qor::Luxar::ZELT::Filters {

/// IFilters2::Gauss. The pool, used below sigma 0.5 only, may be null.
/// Throws std::invalid_argument with the texts of that method, and Cancelled.
void gauss(const memory_2d& src, double sigma, const memory_2d& dst, Thread::ThreadPool* pool);

/// The methods of IFilters2 with these names; std::invalid_argument with their texts.
void gauss_derivative(const memory_2d& src, double sigma, const memory_2d& dst);
void laplacian_gaussian(const memory_2d& src, double sigma, const memory_2d& dst);
void sdgd_gaussian(const memory_2d& src, double sigma, const memory_2d& dst);

/// The smoothed image that gauss_xy_derivatives takes differences of: an image of one of the eight real types
/// into a float image of its size. Below sigma 0.5 it is 0.
/// Throws std::invalid_argument "GaussSmooth: unsupported pixel type" or "ZELT GaussSmooth input and output
/// images must have the same size".
void gauss_smooth(const memory_2d& src, double sigma, pole_set poles, const memory_2d& dst);

/// Half the difference of the neighbours in x and in y of the smoothed image, clamped at the border, into two
/// float images of its size.
/// Throws std::invalid_argument "GaussXYDerivatives: unsupported pixel type" or "ZELT GaussXYDerivatives input
/// and output images must have the same size".
void gauss_xy_derivatives(const memory_2d& src, double sigma, pole_set poles, const memory_2d& dst_x,
                          const memory_2d& dst_y);

} // namespace Qor::Luxar::ZELT::Filters
