#include "flatfield/kernels/references.h"

#include "flatfield/kernels/references.inl"
#include "pixel/memory_2d.h"

#include <type_traits>

namespace Qor::Luxar::ZELT::FlatField {
namespace {

using namespace ZELT_LEVEL;
using namespace ZELT_LEVEL::flatfield;

constexpr pixel_type pixel_types[number_count] = {
    pixel_type::unsigned_8, pixel_type::unsigned_16, pixel_type::unsigned_32, pixel_type::signed_8,
    pixel_type::signed_16,  pixel_type::signed_32,   pixel_type::float_32,    pixel_type::float_64,
};

memory_2d view(const image& i, number n)
{
    const auto& l = i.layout;
    return {pixel_types[static_cast<int>(n)], l.width, l.height, l.offset, l.x_stride, l.y_stride, i.data};
}

bool hold_their_storage(const image& dst, const image& src)
{
    return holds_its_storage(dst.layout) && holds_its_storage(src.layout);
}

double mean(const memory_2d& src)
{
    double sum = 0;
    switch_scalar(src.type, [&]<class T>(pixel<T>) {
        // Sums of narrow integers are exact in either type; those of wide ones could leave 64 bits.
        using sum_type = std::conditional_t<sizeof(T) <= 2, int64_t, double>;
        with_rows<T>(src, [&](auto rows) { sum = sum_pixels<sum_type>(rows); });
    });
    const auto count =
        static_cast<int32_t>(static_cast<uint32_t>(src.width) * static_cast<uint32_t>(src.height));
    return sum / count; // of an empty image: 0 / 0
}

template <class T>
void make_fixed_gain(const memory_2d& dst, const memory_2d& src, double norm, int32_t scale_factor)
{
    constexpr double range = static_cast<double>(static_cast<T>(-1)) + 1;
    const auto unit = static_cast<int32_t>(1u << (static_cast<uint32_t>(scale_factor) & 31));
    with_rows<T, T>(dst, src, [&](auto to, auto from) { fixed_gain<T>(to, from, norm * range, unit); });
}

} // namespace

outcome to_dark_ref(const image& dst, const image& src, int32_t offset)
{
    const number to = number_of(dst.layout);
    const number from = number_of(src.layout);
    const bool unsigned_to_signed = dst.layout.encoding == PixmatEncoding_Signed &&
                                    src.layout.encoding == PixmatEncoding_Unsigned &&
                                    storage_bytes(dst.layout.bits) == storage_bytes(src.layout.bits);
    if (to == number::none || from == number::none || (to != from && !unsigned_to_signed))
        return outcome::unsupported;
    if (!hold_their_storage(dst, src)) return outcome::unsupported;
    if (!covers(dst, src.layout) || !covers(src, src.layout)) return outcome::too_small;

    const auto subtract = [&]<class T>(pixel<T>) {
        with_rows<T, T>(view(dst, to), view(src, from), [&](auto target, auto source) {
            subtract_offset<T>(target, source, static_cast<T>(offset));
        });
    };
    switch (from) {
    case number::u8:
    case number::i8: subtract(pixel<uint8_t>{}); break;
    case number::u16:
    case number::i16: subtract(pixel<uint16_t>{}); break;
    case number::u32:
    case number::i32: subtract(pixel<uint32_t>{}); break;
    case number::f32: subtract(pixel<float>{}); break;
    default: subtract(pixel<double>{}); break;
    }
    return outcome::done;
}

outcome to_gain_ref(const image& dst, const image& src, double norm, int32_t scale_factor)
{
    const number to = number_of(dst.layout);
    const number from = number_of(src.layout);
    const bool of_mean = !(norm >= 0.0);
    const bool fixed_point =
        dst.layout.encoding == PixmatEncoding_Unsigned && to != number::none && from == to;
    const bool real_32 = to == number::f32 && from != number::none;
    const bool real_64 = to == number::f64 && storage_bytes(src.layout.bits) == 8;
    if (!fixed_point && !real_32 && !real_64) return outcome::unsupported;
    if (of_mean && from == number::none) return outcome::unsupported;
    if (!hold_their_storage(dst, src)) return outcome::unsupported;
    if (!covers(dst, src.layout) || !covers(src, src.layout)) return outcome::too_small;

    // Whatever a source of eight bytes declares, it is read as 64-bit float.
    const memory_2d source = view(src, real_64 ? number::f64 : from);
    const memory_2d target = view(dst, to);
    if (of_mean) norm = mean(source);
    if (fixed_point) {
        if (to == number::u8) make_fixed_gain<uint8_t>(target, source, norm, scale_factor);
        if (to == number::u16) make_fixed_gain<uint16_t>(target, source, norm, scale_factor);
        if (to == number::u32) make_fixed_gain<uint32_t>(target, source, norm, scale_factor);
    } else if (real_64) {
        with_rows<double, double>(target, source,
                                  [&](auto rows, auto pixels) { real_gain<double>(rows, pixels, norm); });
    } else {
        switch_scalar(source.type, [&]<class S>(pixel<S>) {
            with_rows<float, S>(target, source,
                                [&](auto rows, auto pixels) { real_gain<float>(rows, pixels, norm); });
        });
    }
    return outcome::done;
}

} // namespace Qor::Luxar::ZELT::FlatField
