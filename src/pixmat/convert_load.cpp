#include "pixmat/convert_load.h"

namespace Qor::Luxar::Convert {
namespace {

template <class T>
using working_type = std::conditional_t<
    std::is_floating_point_v<T>, double,
    std::conditional_t<(sizeof(T) < 4 || std::is_same_v<T, int32_t>), int32_t,
                       std::conditional_t<std::is_same_v<T, uint64_t>, uint64_t, int64_t>>>;

template <class W>
constexpr working kind_of() noexcept
{
    if (std::is_same_v<W, int32_t>) return working::narrow;
    if (std::is_same_v<W, int64_t>) return working::wide;
    return std::is_same_v<W, uint64_t> ? working::huge : working::real;
}

template <class T>
void load_numbers(const uint8_t* __restrict from, int64_t stride, int count, void* __restrict values) noexcept
{
    using W = working_type<T>;
    W* const out = static_cast<W*>(values);
    for_each_pixel<sizeof(T)>(count, stride,
                              [=](int i, int64_t at) { out[i] = static_cast<W>(read<T>(from + at)); });
}

template <class Part>
void load_pairs(const uint8_t* __restrict from, int64_t stride, int count, void* __restrict values) noexcept
{
    double* const out = static_cast<double*>(values);
    for_each_pixel<2 * sizeof(Part)>(count, stride, [=](int i, int64_t at) {
        out[2 * i] = read<Part>(from + at);
        out[2 * i + 1] = read<Part>(from + at + sizeof(Part));
    });
}

template <int Red>
void load_luminance(const uint8_t* __restrict from, int64_t stride, int count,
                    void* __restrict values) noexcept
{
    double* const out = static_cast<double*>(values);
    for (int i = 0; i < count; ++i, from += stride)
        out[i] = 0.299 * from[Red] + 0.587 * from[1] + 0.114 * from[2 - Red];
}

template <int Red, bool Alpha>
void load_colours(const uint8_t* __restrict from, int64_t stride, int count, void* __restrict values) noexcept
{
    auto* const out = static_cast<colour_32*>(values);
    for (int i = 0; i < count; ++i, from += stride) {
        const uint8_t alpha = Alpha ? from[3] : uint8_t{255};
        out[i] = {{from[Red], from[1], from[2 - Red], alpha}};
    }
}

template <class T>
void widen(const void* values, int count, double* out) noexcept
{
    const T* const in = static_cast<const T*>(values);
    for (int i = 0; i < count; ++i) out[i] = static_cast<double>(in[i]);
}

} // namespace

loader load_value(pixel_type type) noexcept
{
    loader l;
    if (with_number(type, [&]<class T>(pixel<T>) { l = {load_numbers<T>, kind_of<working_type<T>>()}; }))
        return l;
    switch (type) {
    case pixel_type::complex_32: return {load_numbers<float>, working::real};
    case pixel_type::complex_64: return {load_numbers<double>, working::real};
    case pixel_type::rgb:
    case pixel_type::rgba: return {load_luminance<0>, working::real};
    case pixel_type::bgr:
    case pixel_type::bgra: return {load_luminance<2>, working::real};
    default: return {};
    }
}

loader load_pair(pixel_type type) noexcept
{
    if (type < pixel_type::complex_32 || type > pixel_type::half_odd_64) return {};
    return {type < pixel_type::complex_64 ? load_pairs<float> : load_pairs<double>, working::pair};
}

loader load_colour(pixel_type type) noexcept
{
    switch (type) {
    case pixel_type::rgb: return {load_colours<0, false>, working::colour};
    case pixel_type::rgba: return {load_colours<0, true>, working::colour};
    case pixel_type::bgr: return {load_colours<2, false>, working::colour};
    case pixel_type::bgra: return {load_colours<2, true>, working::colour};
    default: return {};
    }
}

void to_real(working kind, const void* values, int count, double* out) noexcept
{
    switch (kind) {
    case working::narrow: return widen<int32_t>(values, count, out);
    case working::wide: return widen<int64_t>(values, count, out);
    case working::huge: return widen<uint64_t>(values, count, out);
    default: return widen<double>(values, count, out);
    }
}

} // namespace Qor::Luxar::Convert
