#include "flatfield/kernels/flatten.h"

#include "flatfield/kernels/flatfield_levels.h"
#include "flatfield/kernels/flatten.inl"
#include "flatfield/kernels/run_rows.h"

namespace Qor::Luxar::ZELT::FlatField {
namespace {

/// The row for these images, null when there is none.
row_function choose(const flatten_table& table, const image& dst, const image& src, const image& dark,
                    const image& gain)
{
    const number to = number_of(dst.layout);
    const number from = number_of(src.layout);
    const number dark_number = number_of(dark.layout);
    const number gain_number = gain.absent() ? number::none : number_of(gain.layout);
    if (to == number::none) return nullptr;
    const auto index = static_cast<int>(to);
    if (from == to && dark_number == to && (gain.absent() || gain_number == to))
        return table.same[gain.absent() ? 0 : 1][index];

    if (from != number::u16) return nullptr;
    if (dark_number != number::u16 && dark_number != number::i16) return nullptr;
    if (!gain.absent() && gain_number != number::u16 && gain_number != number::f32) return nullptr;
    const auto& by_gain = table.mixed[dark_number == number::u16 ? dark_unsigned : dark_signed];
    return by_gain[gain.absent() ? gain_absent : gain_number == number::u16 ? gain_fixed : gain_float][index];
}

} // namespace

outcome flatten(const image& dst, const image& src, const image& dark, const image& gain,
                int32_t scale_factor, Thread::ThreadPool* pool)
{
    const bool contiguous =
        is_contiguous(dst) && is_contiguous(src) && is_contiguous(dark) && is_contiguous(gain);
    const auto& table = contiguous ? flatfield_level().flatten : v1::flatfield::flatten_rows<v1::strided_row>;
    const row_function row = choose(table, dst, src, dark, gain);
    if (!row) return outcome::unsupported;
    for (const image* i : {&dst, &src, &dark, &gain}) {
        if (i == &gain && gain.absent()) continue;
        if (!holds_its_storage(i->layout)) return outcome::unsupported;
    }
    for (const image* i : {&dst, &src, &dark, &gain}) {
        if (i == &gain && gain.absent()) continue;
        if (!covers(*i, src.layout)) return outcome::too_small;
    }

    row_job job{};
    job.dst = plane_of(dst);
    job.src = plane_of(src);
    job.dark = plane_of(dark);
    job.gain = plane_of(gain);
    job.width = src.layout.width;
    job.shift = right_shift(scale_factor);
    run_rows(pool, src.layout.height, job, row);
    return outcome::done;
}

} // namespace Qor::Luxar::ZELT::FlatField
