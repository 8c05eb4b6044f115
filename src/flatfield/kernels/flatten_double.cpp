#include "flatfield/kernels/flatten_double.h"

#include "flatfield/kernels/flatfield_levels.h"
#include "flatfield/kernels/flatten_double.inl"
#include "flatfield/kernels/run_rows.h"

#include <stdexcept>

namespace Qor::Luxar::ZELT::FlatField {
namespace {

struct exposures {
    const image& dst;
    const image& long_exposure;
    const image& short_exposure;
    const image& dark;
    const image& gain;
};

void require(bool condition, const char* text)
{
    if (!condition) throw std::invalid_argument(text);
}

/// A destination of other widths than two and four bytes is written through these all the same.
merge_destination destination_of(const image_layout& l) { return l.bits > 16 ? merge_i32 : merge_i16; }
int64_t written_bytes(const image_layout& l) { return destination_of(l) == merge_i32 ? 4 : 2; }

/// The row for these images, null when there is none.
row_function choose(const merge_table& table, const exposures& e)
{
    const auto to = destination_of(e.dst.layout);
    if (e.dark.absent()) return e.short_exposure.absent() || !e.gain.absent() ? nullptr : table.raw[to];

    const number dark_number = number_of(e.dark.layout);
    const number gain_number = e.gain.absent() ? number::none : number_of(e.gain.layout);
    if (dark_number != number::u16 && dark_number != number::i16) return nullptr;
    if (!e.gain.absent() && gain_number != number::u16 && gain_number != number::f32) return nullptr;
    const auto dark = dark_number == number::u16 ? dark_unsigned : dark_signed;
    const auto gain = e.gain.absent() ? gain_absent : gain_number == number::u16 ? gain_fixed : gain_float;
    return e.short_exposure.absent() ? table.single[dark][gain][to] : table.references[dark][gain][to];
}

bool is_aligned(const image& i) { return reinterpret_cast<uintptr_t>(i.data) % 16 == 0; }

/// The conditions under which eight pixels at a time are computed in sixteen-bit lanes. The results differ
/// from the general ones in rounding and overflow, so these conditions are part of the operation, on every
/// processor.
bool in_lanes(const exposures& e, int32_t scale_factor)
{
    if (e.short_exposure.absent() || e.dark.absent() || e.gain.absent()) return false;
    if (scale_factor < 2 || destination_of(e.dst.layout) != merge_i16) return false;
    if (number_of(e.long_exposure.layout) != number::u16 || number_of(e.dark.layout) != number::i16 ||
        number_of(e.gain.layout) != number::u16)
        return false;
    const int64_t width = e.long_exposure.layout.width;
    if (width * e.long_exposure.layout.height % 8 != 0) return false;
    for (const image* i : {&e.long_exposure, &e.short_exposure, &e.dark, &e.gain})
        if (i->layout.x_stride != 2 || i->layout.offset != 0) return false;
    for (const image* i : {&e.long_exposure, &e.short_exposure, &e.dark, &e.gain, &e.dst})
        if (!is_aligned(*i) || i->layout.y_stride != 2 * width) return false;
    return true;
}

} // namespace

void check_merge_destination(const image_layout& dst)
{
    require(dst.encoding == PixmatEncoding_Signed, "Destination image must be signed");
}

void check_merge(const merge_layouts& m)
{
    check_merge_destination(*m.dst);
    require(m.long_exposure->encoding == PixmatEncoding_Unsigned && m.long_exposure->bits <= 16,
            "Source image must be unsigned 16 max");
    if (m.dark)
        require((m.dark->encoding == PixmatEncoding_Unsigned || m.dark->encoding == PixmatEncoding_Signed) &&
                    m.dark->bits == 16,
                "Dark reference must be 16 bit signed or unsigned");
    if (m.gain)
        require((m.gain->encoding == PixmatEncoding_Unsigned && m.gain->bits == 16) ||
                    (m.gain->encoding == PixmatEncoding_Float && m.gain->bits == 32),
                "Gain reference must be 16 bit unsigned or 32 bit float");
    if (m.short_exposure)
        require(*m.short_exposure == *m.long_exposure,
                "Short exposure must be same encoding as long exposure");
    require(!m.gain || m.dark, "Gain reference provided without dark reference");
}

outcome flatten_double(const image& dst, const image& long_exposure, const image& short_exposure,
                       double ratio, const image& dark, const image& gain, int32_t scale_factor,
                       Thread::ThreadPool* pool)
{
    const exposures e{dst, long_exposure, short_exposure, dark, gain};
    const auto& source = long_exposure.layout;
    const number from = number_of(source);
    if (from != number::u8 && from != number::u16) return outcome::unsupported;
    const bool contiguous = from == number::u16 && is_contiguous(dst, written_bytes(dst.layout)) &&
                            is_contiguous(long_exposure) && is_contiguous(short_exposure) &&
                            is_contiguous(dark) && is_contiguous(gain);
    using namespace v1;
    const auto& table = contiguous            ? flatfield_level().merge
                        : from == number::u16 ? flatfield::merge_rows<strided_row, uint16_t>
                                              : flatfield::merge_rows<strided_row, uint8_t>;
    row_function row = choose(table, e);
    if (!row || dst.layout.bits <= 0 || !holds(dst.layout, written_bytes(dst.layout)))
        return outcome::unsupported;
    for (const image* i : {&long_exposure, &short_exposure, &dark, &gain})
        if (!i->absent() && !holds_its_storage(i->layout)) return outcome::unsupported;
    if (!covers(dst, source) || !covers(long_exposure, source)) return outcome::too_small;
    for (const image* i : {&short_exposure, &dark, &gain})
        if (!i->absent() && !covers(*i, source)) return outcome::too_small;

    row_job job{};
    job.dst = plane_of(dst);
    job.src = plane_of(long_exposure);
    job.brief = plane_of(short_exposure);
    job.dark = plane_of(dark);
    job.gain = plane_of(gain);
    job.width = source.width;
    job.shift = right_shift(scale_factor);
    job.saturated = (1u << source.bits) - 1;
    job.ratio = ratio;
    if (in_lanes(e, scale_factor)) {
        row = table.lanes;
        job.left_shift = static_cast<uint32_t>(scale_factor);
        job.lane_ratio = static_cast<uint16_t>(flatfield::truncated(ratio));
    }
    run_rows(pool, source.height, job, row);
    return outcome::done;
}

} // namespace Qor::Luxar::ZELT::FlatField
