// From images to row jobs: what the two fronts with parallel rows share.
#pragma once

#include "flatfield/kernels/encoding_key.h"
#include "flatfield/kernels/row_job.h"
#include "threads/run_parallel.h"

namespace Qor::Luxar::ZELT::FlatField {

inline plane plane_of(const image& i)
{
    if (i.absent()) return {};
    return {i.data + i.layout.offset, i.layout.x_stride, i.layout.y_stride};
}

/// The right shift that undoes the scale of a fixed-point gain.
inline uint32_t right_shift(int32_t scale_factor) { return (16u - static_cast<uint32_t>(scale_factor)) & 31; }

inline bool is_contiguous(const image& i, int64_t bytes) { return i.absent() || i.layout.x_stride == bytes; }
inline bool is_contiguous(const image& i) { return is_contiguous(i, storage_bytes(i.layout.bits)); }

inline void run_rows(Thread::ThreadPool* pool, int32_t height, const row_job& job, row_function row)
{
    if (job.width <= 0) return; // however many rows
    Thread::run_parallel(pool, {0, height},
                         [&job, row](int32_t y, const Thread::ThreadInformation&) { row(job, y); });
}

} // namespace Qor::Luxar::ZELT::FlatField
