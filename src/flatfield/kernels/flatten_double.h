// Two exposures of one scene, corrected and merged into one image of higher dynamic range.
#pragma once

#include "flatfield/kernels/encoding_key.h"
#include "threads/thread_pool.h"

namespace Qor::Luxar::ZELT::FlatField {

/// The layouts of the images that are given; null for those that are not.
struct merge_layouts {
    const image_layout* dst;
    const image_layout* long_exposure;
    const image_layout* short_exposure;
    const image_layout* dark;
    const image_layout* gain;
};

/// Throws std::invalid_argument with the texts of IFlatFielding::FlattenDouble, in their order. The destination comes
/// before anything else is looked at.
void check_merge_destination(const image_layout& dst);
void check_merge(const merge_layouts& layouts);

/// What check_merge has accepted; the short exposure, the dark reference and the gain may be absent. ratio:
/// of the exposure times. Rows in parallel on the pool; null means the calling thread. Fails before anything
/// is written.
outcome flatten_double(const image& dst, const image& long_exposure, const image& short_exposure,
                       double ratio, const image& dark, const image& gain, int32_t scale_factor,
                       Thread::ThreadPool* pool);

} // namespace Qor::Luxar::ZELT::FlatField
