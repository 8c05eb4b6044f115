// The camera correction: dark reference subtracted, gain reference multiplied in.
#pragma once

#include "flatfield/kernels/encoding_key.h"
#include "threads/thread_pool.h"

namespace Qor::Luxar::ZELT::FlatField {

/// Rows in parallel on the pool; null means the calling thread. The gain may be absent.
/// dst may be one of the other images. Fails before anything is written.
outcome flatten(const image& dst, const image& src, const image& dark, const image& gain,
                int32_t scale_factor, Thread::ThreadPool* pool);

} // namespace Qor::Luxar::ZELT::FlatField
