#include "pixmat/conversion.h"

#include "pixmat/convert_load.h"
#include "pixmat/convert_store.h"

namespace Qor::Luxar::Convert {
namespace {

std::optional<conversion> made_of(loader from, store_pixels store)
{
    if (!from.load || !store) return {};
    conversion c;
    c.load = from.load;
    c.store = store;
    return c;
}

bool both_complex(pixel_type a, pixel_type b) noexcept
{
    const auto kind = [](pixel_type t) {
        return (static_cast<int>(t) - static_cast<int>(pixel_type::complex_32)) % 3;
    };
    const auto complex = [](pixel_type t) {
        return t >= pixel_type::complex_32 && t <= pixel_type::half_odd_64;
    };
    return complex(a) && complex(b) && kind(a) == kind(b);
}

/// Full range or no integer at all: a pixel of the same type is what it was.
bool keeps_every_value(pixel_type type, int32_t bits) noexcept
{
    return !is_number(type) || is_float(type) || bits >= GetPixmatBits(type);
}

} // namespace

std::optional<pixel_type> type_of(const image_layout& layout)
{
    try {
        return GetPixelType(layout.encoding, layout.bits);
    } catch (const std::invalid_argument&) {
        return {};
    }
}

std::optional<conversion> recode_between(const image_layout& source, const image_layout& target)
{
    const auto from = type_of(source);
    const auto to = type_of(target);
    if (!from || !to) return {};
    std::optional<conversion> c;
    if (both_complex(*from, *to)) {
        c = made_of(load_pair(*from), store_pair(*to));
    } else if (is_colour(*from) && is_colour(*to)) {
        c = made_of(load_colour(*from), store_colour(*to));
    } else if (is_colour(*from) && is_full_complex(*to)) {
        return {};
    } else if (is_full_complex(*from) && is_colour(*to)) {
        return {};
    } else {
        const loader value = load_value(*from);
        c = made_of(value, store_value(*to, value.kind));
        if (c && is_number(*to)) c->range = range_of(*to, target.bits);
        if (c) c->direct = direct_value(*from, *to);
    }
    if (c) c->copy = *from == *to && keeps_every_value(*to, target.bits);
    return c;
}

std::optional<conversion> cast_between(const image_layout& source, const image_layout& target)
{
    const auto from = type_of(source);
    const auto to = type_of(target);
    if (!from || !to) return {};
    std::optional<conversion> c;
    if (is_colour(*from) || is_colour(*to)) {
        if (*from == *to) c = made_of(load_colour(*from), store_colour(*to));
    } else if (both_complex(*from, *to)) {
        c = made_of(load_pair(*from), store_pair(*to));
    } else {
        const loader value = load_value(*from);
        c = made_of(value, store_cast(*to, value.kind));
        if (c && is_float(*to)) c->direct = direct_value(*from, *to);
    }
    if (c) c->copy = *from == *to;
    return c;
}

void run(const conversion& c, const memory_2d& from, const memory_2d& to) noexcept
{
    const int64_t from_bytes = GetPixmatBits(from.type) / 8;
    const int64_t to_bytes = GetPixmatBits(to.type) / 8;
    const bool adjacent = from.x_stride == from_bytes && to.x_stride == to_bytes;
    if (adjacent && (c.copy || c.direct)) {
        for (int64_t y = 0; y < to.height; ++y) {
            const uint8_t* const source = from.data + from.offset + y * from.y_stride;
            uint8_t* const target = to.data + to.offset + y * to.y_stride;
            if (c.copy)
                std::memmove(target, source, static_cast<size_t>(to.width * to_bytes));
            else
                c.direct(source, target, to.width, c.range);
        }
        return;
    }
    block values;
    for_each_block(from, to, [&](const uint8_t* source, uint8_t* target, int count) {
        c.load(source, from.x_stride, count, values.bytes);
        c.store(values.bytes, count, target, to.x_stride, c.range);
    });
}

} // namespace Qor::Luxar::Convert
