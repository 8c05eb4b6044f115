// Convolution with a kernel of any size and anchor.
#pragma once

#include "pixel/memory_2d.h"
#include "threads/thread_pool.h"

namespace Qor::Luxar::ZELT::Filters {

/// The values of a kernel, row after row.
struct kernel_view {
    const double* values;
    int32_t width;
    int32_t height;
};

/// IFilters2::Convolve. A kernel without values gives 0 everywhere. The pool may be null.
/// Throws std::invalid_argument with the texts of that method, and Cancelled.
void convolve(const memory_2d& src, const kernel_view& kernel, coordinate<int32_t> anchor,
              const memory_2d& dst, Thread::ThreadPool* pool);

} // namespace Qor::Luxar::ZELT::Filters
